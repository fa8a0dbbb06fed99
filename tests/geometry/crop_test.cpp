#include <gtest/gtest.h>
#include <stdint.h>
#include <string.h>

#include <array>
#include <vector>

#include "geometry/images.h"
#include "qkcore/qk_image.h"
#include "support/log_capture.h"

namespace {

using qktest::distinct_image;
using qktest::HasNoErrors;
using qktest::HasOneFailureReport;
using qktest::ImagePtr;
using qktest::kYuv420Formats;
using qktest::LogCapture;
using qktest::Snapshot;
using qktest::Unchanged;
using qktest::yuv_at;

constexpr const char* kCropSource = "src/geometry/crop.cpp";

TEST(Crop, PackedRowsFromTheRectangle) {
    // RGB8 3x2 at (1, 1) of a 4x4 image: bytes 15..23 and 27..35.
    ImagePtr src = distinct_image(4, 4, QK_FORMAT_RGB8);
    ImagePtr dst(QKImage_createEmpty(3, 2, QK_FORMAT_RGB8));
    LogCapture log;
    ASSERT_EQ(QKImage_crop(src.get(), dst.get(), 1, 1), QK_OK);
    EXPECT_TRUE(log.lines().empty());
    ASSERT_NE(dst->data, nullptr);
    EXPECT_EQ(dst->size, 18u);
    EXPECT_EQ(0, memcmp(dst->data, src->data + 15, 9));
    EXPECT_EQ(0, memcmp(dst->data + 9, src->data + 27, 9));

    // Every 4-byte format, rectangles up to the right and bottom edges.
    for (uint32_t format : {QK_FORMAT_RGBA, QK_FORMAT_BGRA, QK_FORMAT_ARGB, QK_FORMAT_ABGR}) {
        ImagePtr frame = distinct_image(8, 6, format);
        for (auto [x, y, w, h] : {std::array<int32_t, 4>{0, 0, 8, 6}, {5, 3, 3, 3}, {0, 5, 8, 1}, {7, 0, 1, 6}}) {
            SCOPED_TRACE(::testing::Message() << w << "x" << h << " at " << x << "," << y);
            ImagePtr part(QKImage_createNew(w, h, format));
            ASSERT_EQ(QKImage_crop(frame.get(), part.get(), x, y), QK_OK);
            for (int32_t r = 0; r < h; ++r) {
                ASSERT_EQ(0, memcmp(part->data + r * w * 4, frame->data + ((y + r) * 8 + x) * 4, w * 4));
            }
        }
    }
}

// Each pixel of the destination carries the Y, U and V samples of the source
// pixel it was cut from, each image addressed through its own chroma base.
TEST(Crop, Yuv420PlanesWithEachImagesChromaBase) {
    struct Case {
        int32_t x, y, w, h;
        uint32_t src_chroma, dst_chroma;
    };
    const Case cases[] = {
        {0, 0, 12, 8, 0, 0},     // the whole frame: a byte-exact copy
        {2, 4, 6, 4, 0, 0},
        {10, 6, 2, 2, 0, 0},     // touching the right and bottom edges
        {4, 2, 8, 4, 112, 0},    // padded source luma plane
        {2, 2, 4, 4, 0, 20},     // destination chroma at its own offset
    };
    for (uint32_t format : kYuv420Formats) {
        for (const Case& c : cases) {
            SCOPED_TRACE(::testing::Message() << qktest::fourcc(format) << " " << c.w << "x" << c.h << " at " << c.x
                                              << "," << c.y << " chroma " << c.src_chroma << "/" << c.dst_chroma);
            const size_t dst_luma = static_cast<size_t>(c.w * c.h);
            std::vector<uint8_t> src_bytes((c.src_chroma != 0 ? c.src_chroma : 96) + 48);
            std::vector<uint8_t> dst_bytes((c.dst_chroma != 0 ? c.dst_chroma : dst_luma) + dst_luma / 2, 0xee);
            ImagePtr src(QKImage_createWrap(src_bytes.data(), 12, 8, format, 0, c.src_chroma));
            src->size = src_bytes.size();
            qktest::fill_distinct(*src);
            ImagePtr dst(QKImage_createWrap(dst_bytes.data(), c.w, c.h, format, static_cast<int32_t>(dst_bytes.size()),
                                            c.dst_chroma));
            ASSERT_EQ(QKImage_crop(src.get(), dst.get(), c.x, c.y), QK_OK);
            for (int32_t r = 0; r < c.h; ++r) {
                for (int32_t col = 0; col < c.w; ++col) {
                    ASSERT_TRUE(yuv_at(*dst, col, r) == yuv_at(*src, c.x + col, c.y + r)) << col << "," << r;
                }
            }
            if (c.src_chroma == 0 && c.dst_chroma == 0 && c.w == 12 && c.h == 8) {
                EXPECT_EQ(0, memcmp(dst->data, src->data, 144));
            }
        }
    }
}

TEST(Crop, RefusalsInTheirOrder) {
    struct Case {
        const char* what;
        uint32_t sformat;
        int32_t sw, sh;
        uint64_t ssize;
        bool sbuffer;
        uint32_t dformat;
        int32_t dw, dh;
        uint64_t dsize;
        bool dbuffer;
        int32_t x, y;
        int32_t status;
        bool allocates;  // the destination owns a buffer afterwards
    };
    const uint32_t RGBA = QK_FORMAT_RGBA, NV21 = QK_FORMAT_NV21;
    const Case cases[] = {
        {"source without buffer", RGBA, 4, 4, 64, false, RGBA, 2, 2, 0, false, 0, 0, QK_ERROR_NULL_PARAM, false},
        {"source size 0", RGBA, 0, 4, 0, true, RGBA, 2, 2, 0, false, 0, 0, QK_ERROR_INVALID_SIZE, false},
        {"source size below its picture", RGBA, 4, 4, 60, true, RGBA, 2, 2, 0, false, 0, 0, QK_ERROR_INVALID_SIZE,
         false},
        {"formats differ", RGBA, 4, 4, 0, true, QK_FORMAT_BGRA, 2, 2, 0, false, 0, 0, QK_ERROR_INVALID_PARAM, false},
        {"x negative", RGBA, 4, 4, 0, true, RGBA, 2, 2, 0, false, -1, 0, QK_ERROR_INVALID_SIZE, false},
        {"past the right edge", RGBA, 4, 4, 0, true, RGBA, 2, 2, 0, false, 3, 0, QK_ERROR_INVALID_SIZE, false},
        {"y negative", RGBA, 4, 4, 0, true, RGBA, 2, 2, 0, false, 0, -2, QK_ERROR_INVALID_SIZE, false},
        {"past the bottom edge", RGBA, 4, 4, 0, true, RGBA, 2, 2, 0, false, 0, 3, QK_ERROR_INVALID_SIZE, false},
        {"x + width wraps", RGBA, 4, 4, 0, true, RGBA, 2, 2, 0, false, INT32_MAX, 0, QK_ERROR_INVALID_SIZE, false},
        {"destination buffer too small", RGBA, 4, 4, 0, true, RGBA, 2, 2, 15, true, 0, 0, QK_ERROR_INVALID_SIZE,
         false},
        {"preset size too small", RGBA, 4, 4, 0, true, RGBA, 2, 2, 15, false, 0, 0, QK_ERROR_INVALID_SIZE, false},
        {"destination with buffer, width 0", RGBA, 4, 4, 0, true, RGBA, 0, 2, 16, true, 0, 0, QK_ERROR_INVALID_SIZE,
         false},
        {"GREY", QK_FORMAT_GREY, 4, 4, 0, true, QK_FORMAT_GREY, 2, 2, 0, false, 0, 0, QK_ERROR_UNSUPPORTED, true},
        {"4:2:0 x odd", NV21, 4, 4, 0, true, NV21, 2, 2, 0, false, 1, 0, QK_ERROR_INVALID_SIZE, true},
        {"4:2:0 y odd", NV21, 4, 4, 0, true, NV21, 2, 2, 0, false, 0, 1, QK_ERROR_INVALID_SIZE, true},
        {"4:2:0 source odd", NV21, 5, 4, 0, true, NV21, 2, 2, 0, false, 0, 0, QK_ERROR_INVALID_SIZE, true},
        {"4:2:0 destination odd", NV21, 4, 4, 0, true, NV21, 3, 2, 0, false, 0, 0, QK_ERROR_INVALID_SIZE, true},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.what);
        std::vector<uint8_t> src_bytes(64, 1), dst_bytes(64, 2);
        ImagePtr src(QKImage_createWrap(c.sbuffer ? src_bytes.data() : nullptr, c.sw, c.sh, c.sformat, 0, 0));
        src->size = c.ssize;
        ImagePtr dst(QKImage_createWrap(c.dbuffer ? dst_bytes.data() : nullptr, c.dw, c.dh, c.dformat, 0, 0));
        dst->size = c.dsize;
        Snapshot src_before(*src), dst_before(*dst);
        LogCapture log;
        EXPECT_EQ(QKImage_crop(src.get(), dst.get(), c.x, c.y), c.status);
        EXPECT_TRUE(HasOneFailureReport(log, c.status, kCropSource));
        EXPECT_EQ(log.lines().size(), 1u);
        EXPECT_TRUE(Unchanged(*src, src_before));
        if (c.allocates) {
            EXPECT_NE(dst->data, nullptr);
            EXPECT_EQ(dst->isWrapped, 0u);
        } else {
            EXPECT_TRUE(Unchanged(*dst, dst_before));
        }
    }

    ImagePtr image = distinct_image(2, 2, QK_FORMAT_RGBA);
    LogCapture log;
    EXPECT_EQ(QKImage_crop(nullptr, image.get(), 0, 0), QK_ERROR_NULL_PARAM);
    EXPECT_EQ(QKImage_crop(image.get(), nullptr, 0, 0), QK_ERROR_NULL_PARAM);
    EXPECT_EQ(log.texts(4).size(), 2u);
}

// The destination's allocation reports on its own; crop adds nothing.
TEST(Crop, DestinationBufferNotObtained) {
    ImagePtr src = distinct_image(4, 4, QK_FORMAT_RGBA);
    ImagePtr dst(QKImage_createEmpty(0, 0, QK_FORMAT_RGBA));
    LogCapture log;
    EXPECT_EQ(QKImage_crop(src.get(), dst.get(), 0, 0), QK_ERROR_INVALID_PARAM);
    EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_INVALID_PARAM, "src/image/image.cpp"));
    EXPECT_EQ(dst->data, nullptr);
}

}  // namespace
