#include <gtest/gtest.h>
#include <stdint.h>
#include <string.h>

#include <string>
#include <vector>

#include "geometry/images.h"
#include "qkcore/qk_image.h"
#include "support/log_capture.h"

namespace {

using namespace qktest;

struct Offset {
    int32_t x, y;
};

TEST(Draw, PackedOverlapIsOverwritten) {
    // A 4x4 source in a 5x3 destination: inside, negative, overhanging.
    const Offset offsets[] = {{0, 0}, {1, 0}, {-2, -2}, {3, 0}, {4, 2}, {-3, 1}, {1, -3}, {2, 1}};
    for (uint32_t format : {QK_FORMAT_RGBA, QK_FORMAT_RGB8}) {
        const int bpp = format == QK_FORMAT_RGBA ? 4 : 3;
        ImagePtr src = distinct_image(4, 4, format, 11);
        for (const Offset& o : offsets) {
            SCOPED_TRACE(::testing::Message() << fourcc(format) << " at " << o.x << "," << o.y);
            ImagePtr dst = distinct_image(5, 3, format, 200);
            ImagePtr before(QKImage_clone(dst.get()));
            LogCapture log;
            ASSERT_EQ(QKImage_drawImage(src.get(), dst.get(), o.x, o.y), QK_OK);
            EXPECT_TRUE(log.lines().empty());
            for (int32_t r = 0; r < 3; ++r) {
                for (int32_t c = 0; c < 5; ++c) {
                    const int32_t sx = c - o.x, sy = r - o.y;
                    const bool inside = sx >= 0 && sx < 4 && sy >= 0 && sy < 4;
                    const uint8_t* expected = inside ? src->data + (sy * 4 + sx) * bpp : before->data + (r * 5 + c) * bpp;
                    ASSERT_EQ(0, memcmp(dst->data + (r * 5 + c) * bpp, expected, bpp)) << c << "," << r;
                }
            }
        }
    }
}

TEST(Draw, Yuv420PlanesWithEachImagesChromaBase) {
    const Offset offsets[] = {{0, 0}, {2, 2}, {-2, 0}, {6, 6}, {4, -2}, {-4, -2}};
    for (uint32_t format : kYuv420Formats) {
        for (uint32_t dst_chroma : {0u, 70u}) {
            for (const Offset& o : offsets) {
                SCOPED_TRACE(::testing::Message() << fourcc(format) << " at " << o.x << "," << o.y << " chroma "
                                                  << dst_chroma);
                // A 6x4 source whose chroma sits past a padded luma plane, an
                // 8x8 destination with its chroma right after the luma or apart.
                std::vector<uint8_t> src_bytes(52), dst_bytes(102);
                ImagePtr src(QKImage_createWrap(src_bytes.data(), 6, 4, format, 52, 40));
                fill_distinct(*src, 11);
                ImagePtr dst(QKImage_createWrap(dst_bytes.data(), 8, 8, format, dst_chroma != 0 ? 102 : 0, dst_chroma));
                fill_distinct(*dst, 200);
                ImagePtr before(QKImage_clone(dst.get()));
                ASSERT_EQ(QKImage_drawImage(src.get(), dst.get(), o.x, o.y), QK_OK);
                for (int32_t r = 0; r < 8; ++r) {
                    for (int32_t c = 0; c < 8; ++c) {
                        const int32_t sx = c - o.x, sy = r - o.y;
                        const bool inside = sx >= 0 && sx < 6 && sy >= 0 && sy < 4;
                        ASSERT_EQ(yuv_at(*dst, c, r), inside ? yuv_at(*src, sx, sy) : yuv_at(*before, c, r))
                            << c << "," << r;
                    }
                }
            }
        }
    }
}

TEST(Draw, NothingToDrawIsNotAFailure) {
    const struct {
        int32_t x, y;
        const char* message;
    } cases[] = {
        {5, 0, "In QKImage_drawImage, the source image 4x4 is completely out of the destination 5x3 at 5,0"},
        {0, 3, "In QKImage_drawImage, the source image 4x4 is completely out of the destination 5x3 at 0,3"},
        {-5, 0, "In QKImage_drawImage, the source image 4x4 is completely out of the destination 5x3 at -5,0"},
        {INT32_MIN, 0,
         "In QKImage_drawImage, the source image 4x4 is completely out of the destination 5x3 at -2147483648,0"},
        {-4, 0, "Nothing to draw (lines = 3, cols = 0)"},
        {0, -4, "Nothing to draw (lines = 0, cols = 4)"},
    };
    ImagePtr src = distinct_image(4, 4, QK_FORMAT_RGBA);
    for (const auto& c : cases) {
        ImagePtr dst = distinct_image(5, 3, QK_FORMAT_RGBA, 200);
        const auto before = snapshot(*dst);
        LogCapture log;
        EXPECT_EQ(QKImage_drawImage(src.get(), dst.get(), c.x, c.y), QK_OK);
        EXPECT_EQ(log.texts(3), std::vector<std::string>{c.message});
        EXPECT_EQ(log.lines().size(), 1u);
        EXPECT_TRUE(snapshot(*dst) == before);
    }
    // Being outside is decided before the format is looked at.
    ImagePtr grey = distinct_image(4, 4, QK_FORMAT_GREY);
    LogCapture log;
    EXPECT_EQ(QKImage_drawImage(grey.get(), grey.get(), 4, 0), QK_OK);
    EXPECT_TRUE(HasNoErrors(log));
}

// Drawing an image into itself reads every row before overwriting it.
TEST(Draw, IntoItself) {
    for (const Offset& o : {Offset{1, 1}, Offset{-1, -2}, Offset{2, -1}, Offset{-2, 1}}) {
        ImagePtr image = distinct_image(5, 4, QK_FORMAT_RGB8);
        ImagePtr copy(QKImage_clone(image.get()));
        ImagePtr expected(QKImage_clone(image.get()));
        ASSERT_EQ(QKImage_drawImage(copy.get(), expected.get(), o.x, o.y), QK_OK);
        ASSERT_EQ(QKImage_drawImage(image.get(), image.get(), o.x, o.y), QK_OK);
        EXPECT_EQ(0, memcmp(image->data, expected->data, 60)) << o.x << "," << o.y;
    }
}

TEST(Draw, RefusalsLeaveTheDestinationAlone) {
    constexpr uint32_t RGBA = QK_FORMAT_RGBA, NV12 = QK_FORMAT_NV12;
    const struct {
        const char* what;
        uint32_t sformat;
        int32_t sw, sh;
        bool sbuffer;
        uint32_t dformat;
        int32_t dw, dh, dsize;  // dsize -1: no buffer
        int32_t x, y, status;
        const char* message;
    } cases[] = {
        {"source without buffer", RGBA, 2, 2, false, RGBA, 4, 4, 0, 0, 0, QK_ERROR_NULL_PARAM, nullptr},
        {"destination without buffer", RGBA, 2, 2, true, RGBA, 4, 4, -1, 0, 0, QK_ERROR_NULL_PARAM, nullptr},
        {"source size 0", RGBA, 0, 2, true, RGBA, 4, 4, 0, 0, 0, QK_ERROR_INVALID_SIZE, nullptr},
        {"destination size below its picture", RGBA, 2, 2, true, RGBA, 4, 4, 60, 0, 0, QK_ERROR_INVALID_SIZE,
         nullptr},
        {"formats differ", RGBA, 2, 2, true, QK_FORMAT_ABGR, 4, 4, 0, 0, 0, QK_ERROR_INVALID_PARAM, nullptr},
        {"4:2:0 x odd", NV12, 2, 2, true, NV12, 4, 4, 0, 1, 0, QK_ERROR_UNSUPPORTED,
         "Unsupported dimensions for YUV420: 2x2 offset 1,0"},
        {"4:2:0 source odd", NV12, 3, 2, true, NV12, 4, 4, 0, 0, -2, QK_ERROR_UNSUPPORTED,
         "Unsupported dimensions for YUV420: 3x2 offset 0,-2"},
        {"4:2:0 destination odd", NV12, 2, 2, true, NV12, 4, 3, 0, 0, 0, QK_ERROR_INVALID_SIZE, nullptr},
        {"GREY", QK_FORMAT_GREY, 2, 2, true, QK_FORMAT_GREY, 4, 4, 0, 0, 0, QK_ERROR_UNSUPPORTED, nullptr},
        {"YUYV", QK_FORMAT_YUYV, 2, 2, true, QK_FORMAT_YUYV, 4, 4, 0, 0, 0, QK_ERROR_UNSUPPORTED, nullptr},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        std::vector<uint8_t> src_bytes(64, 1), dst_bytes(64, 2);
        ImagePtr src(QKImage_createWrap(c.sbuffer ? src_bytes.data() : nullptr, c.sw, c.sh, c.sformat, 0, 0));
        ImagePtr dst(QKImage_createWrap(c.dsize < 0 ? nullptr : dst_bytes.data(), c.dw, c.dh, c.dformat, c.dsize, 0));
        const auto before = snapshot(*dst);
        LogCapture log;
        EXPECT_EQ(QKImage_drawImage(src.get(), dst.get(), c.x, c.y), c.status);
        EXPECT_TRUE(HasOneFailureReport(log, c.status, "src/geometry/draw.cpp"));
        EXPECT_EQ(log.lines().size(), c.message != nullptr ? 2u : 1u);
        EXPECT_TRUE(c.message == nullptr || log.contains(4, c.message));
        EXPECT_TRUE(snapshot(*dst) == before);
    }
    ImagePtr image = distinct_image(2, 2, QK_FORMAT_RGBA);
    LogCapture log;
    EXPECT_EQ(QKImage_drawImage(nullptr, image.get(), 0, 0), QK_ERROR_NULL_PARAM);
    EXPECT_EQ(QKImage_drawImage(image.get(), nullptr, 0, 0), QK_ERROR_NULL_PARAM);
    EXPECT_EQ(log.texts(4).size(), 2u);
}

}  // namespace
