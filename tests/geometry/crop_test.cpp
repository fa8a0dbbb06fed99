#include <gtest/gtest.h>
#include <stdint.h>
#include <string.h>

#include <vector>

#include "geometry/images.h"
#include "qkcore/qk_image.h"
#include "support/log_capture.h"

namespace {

using namespace qktest;

TEST(Crop, PackedRowsOfTheRectangle) {
    // RGB8 3x2 at (1, 1) of a 4x4 image: bytes 15..23 and 27..35.
    ImagePtr src = distinct_image(4, 4, QK_FORMAT_RGB8);
    ImagePtr dst(QKImage_createEmpty(3, 2, QK_FORMAT_RGB8));
    LogCapture log;
    ASSERT_EQ(QKImage_crop(src.get(), dst.get(), 1, 1), QK_OK);
    EXPECT_TRUE(log.lines().empty());
    EXPECT_EQ(dst->size, 18u);
    EXPECT_EQ(0, memcmp(dst->data, src->data + 15, 9));
    EXPECT_EQ(0, memcmp(dst->data + 9, src->data + 27, 9));

    // 4-byte pixels, up to the right and bottom edges.
    ImagePtr frame = distinct_image(8, 6, QK_FORMAT_ABGR);
    ImagePtr corner(QKImage_createNew(3, 2, QK_FORMAT_ABGR));
    ASSERT_EQ(QKImage_crop(frame.get(), corner.get(), 5, 4), QK_OK);
    EXPECT_EQ(0, memcmp(corner->data, frame->data + (4 * 8 + 5) * 4, 12));
    EXPECT_EQ(0, memcmp(corner->data + 12, frame->data + (5 * 8 + 5) * 4, 12));
}

// Each destination pixel carries the Y, U and V samples of the source pixel it
// was cut from, each image addressed through its own chroma base.
TEST(Crop, Yuv420PlanesWithEachImagesChromaBase) {
    const struct {
        int32_t x, y, w, h;
        uint32_t src_chroma, dst_chroma;
    } cases[] = {
        {0, 0, 12, 8, 0, 0},   // the whole frame: a byte-exact copy
        {2, 4, 6, 4, 0, 0},
        {10, 6, 2, 2, 0, 0},   // touching the right and bottom edges
        {4, 2, 8, 4, 112, 0},  // padded source luma plane
        {2, 2, 4, 4, 0, 20},   // destination chroma at its own offset
    };
    for (uint32_t format : kYuv420Formats) {
        for (const auto& c : cases) {
            SCOPED_TRACE(::testing::Message() << fourcc(format) << " " << c.w << "x" << c.h << " at " << c.x << ","
                                              << c.y << " chroma " << c.src_chroma << "/" << c.dst_chroma);
            const uint32_t dst_luma = c.w * c.h;
            std::vector<uint8_t> src_bytes((c.src_chroma != 0 ? c.src_chroma : 96) + 48);
            std::vector<uint8_t> dst_bytes((c.dst_chroma != 0 ? c.dst_chroma : dst_luma) + dst_luma / 2, 0xee);
            ImagePtr src(QKImage_createWrap(src_bytes.data(), 12, 8, format, int32_t(src_bytes.size()), c.src_chroma));
            fill_distinct(*src);
            ImagePtr dst(QKImage_createWrap(dst_bytes.data(), c.w, c.h, format, int32_t(dst_bytes.size()),
                                            c.dst_chroma));
            ASSERT_EQ(QKImage_crop(src.get(), dst.get(), c.x, c.y), QK_OK);
            for (int32_t r = 0; r < c.h; ++r) {
                for (int32_t col = 0; col < c.w; ++col) {
                    ASSERT_EQ(yuv_at(*dst, col, r), yuv_at(*src, c.x + col, c.y + r)) << col << "," << r;
                }
            }
            EXPECT_TRUE(c.w != 12 || dst_bytes == src_bytes);  // the whole frame: the same bytes
        }
    }
}

TEST(Crop, RefusalsInTheirOrder) {
    constexpr uint32_t RGBA = QK_FORMAT_RGBA, NV21 = QK_FORMAT_NV21;
    const struct {
        const char* what;
        uint32_t sformat;
        int32_t sw, sh, ssize;  // ssize -1: no buffer
        uint32_t dformat;
        int32_t dw, dh, dsize;  // dsize -1: a buffer of 64 bytes, else the preset size of none
        int32_t x, y, status;
    } cases[] = {
        {"source without buffer", RGBA, 4, 4, -1, RGBA, 2, 2, 0, 0, 0, QK_ERROR_NULL_PARAM},
        {"source size 0", RGBA, 0, 4, 0, RGBA, 2, 2, 0, 0, 0, QK_ERROR_INVALID_SIZE},
        {"source size below its picture", RGBA, 4, 4, 60, RGBA, 2, 2, 0, 0, 0, QK_ERROR_INVALID_SIZE},
        {"formats differ", RGBA, 4, 4, 0, QK_FORMAT_BGRA, 2, 2, 0, 0, 0, QK_ERROR_INVALID_PARAM},
        {"x negative", RGBA, 4, 4, 0, RGBA, 2, 2, 0, -1, 0, QK_ERROR_INVALID_SIZE},
        {"past the right edge", RGBA, 4, 4, 0, RGBA, 2, 2, 0, 3, 0, QK_ERROR_INVALID_SIZE},
        {"x + width past int32", RGBA, 4, 4, 0, RGBA, 2, 2, 0, INT32_MAX, 0, QK_ERROR_INVALID_SIZE},
        {"past the bottom edge", RGBA, 4, 4, 0, RGBA, 2, 2, 0, 0, 3, QK_ERROR_INVALID_SIZE},
        {"destination buffer too small", RGBA, 4, 4, 0, RGBA, 4, 4, -1, 0, 0, QK_ERROR_INVALID_SIZE},
        {"preset size too small", RGBA, 4, 4, 0, RGBA, 2, 2, 15, 0, 0, QK_ERROR_INVALID_SIZE},
        {"destination with buffer, width 0", RGBA, 4, 4, 0, RGBA, 0, 2, -1, 0, 0, QK_ERROR_INVALID_SIZE},
        {"GREY", QK_FORMAT_GREY, 4, 4, 0, QK_FORMAT_GREY, 2, 2, 0, 0, 0, QK_ERROR_UNSUPPORTED},
        {"4:2:0 x odd", NV21, 4, 4, 0, NV21, 2, 2, 0, 1, 0, QK_ERROR_INVALID_SIZE},
        {"4:2:0 y odd", NV21, 4, 4, 0, NV21, 2, 2, 0, 0, 1, QK_ERROR_INVALID_SIZE},
        {"4:2:0 source odd", NV21, 5, 4, 0, NV21, 2, 2, 0, 0, 0, QK_ERROR_INVALID_SIZE},
        {"4:2:0 destination odd", NV21, 4, 4, 0, NV21, 3, 2, 0, 0, 0, QK_ERROR_INVALID_SIZE},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        std::vector<uint8_t> src_bytes(64, 1), dst_bytes(60, 2);
        ImagePtr src(QKImage_createWrap(c.ssize < 0 ? nullptr : src_bytes.data(), c.sw, c.sh, c.sformat, 0, 0));
        src->size = c.ssize < 0 ? 64 : c.ssize;
        ImagePtr dst(QKImage_createWrap(c.dsize < 0 ? dst_bytes.data() : nullptr, c.dw, c.dh, c.dformat, 60, 0));
        if (c.dsize >= 0) dst->size = c.dsize;
        const auto src_before = snapshot(*src), dst_before = snapshot(*dst);
        LogCapture log;
        EXPECT_EQ(QKImage_crop(src.get(), dst.get(), c.x, c.y), c.status);
        EXPECT_TRUE(HasOneFailureReport(log, c.status, "src/geometry/crop.cpp"));
        EXPECT_EQ(log.lines().size(), 1u);
        EXPECT_TRUE(snapshot(*src) == src_before);
        // Format and parity refusals come after the destination got its buffer.
        if (c.status == QK_ERROR_UNSUPPORTED || c.sformat == NV21) {
            EXPECT_NE(dst->data, nullptr);
        } else {
            EXPECT_TRUE(snapshot(*dst) == dst_before);
        }
    }

    // A recorded size must also cover chroma kept at its own offset.
    ImagePtr frame = distinct_image(4, 4, NV21);
    std::vector<uint8_t> bytes(24);
    ImagePtr padded(QKImage_createWrap(bytes.data(), 4, 4, NV21, 24, 20));
    LogCapture log;
    EXPECT_EQ(QKImage_crop(frame.get(), padded.get(), 0, 0), QK_ERROR_INVALID_SIZE);
    EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_INVALID_SIZE, "src/geometry/crop.cpp"));

    ImagePtr image = distinct_image(2, 2, QK_FORMAT_RGBA);
    log.clear();
    EXPECT_EQ(QKImage_crop(nullptr, image.get(), 0, 0), QK_ERROR_NULL_PARAM);
    EXPECT_EQ(QKImage_crop(image.get(), nullptr, 0, 0), QK_ERROR_NULL_PARAM);
    EXPECT_EQ(log.texts(4).size(), 2u);
    // The destination's allocation reports its own failure.
    ImagePtr empty(QKImage_createEmpty(0, 0, QK_FORMAT_RGBA));
    log.clear();
    EXPECT_EQ(QKImage_crop(image.get(), empty.get(), 0, 0), QK_ERROR_INVALID_PARAM);
    EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_INVALID_PARAM, "src/image/image.cpp"));
}

}  // namespace
