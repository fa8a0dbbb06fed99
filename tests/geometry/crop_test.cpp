#include <gtest/gtest.h>
#include <stdint.h>
#include <string.h>

#include <vector>

#include "geometry/images.h"
#include "qkcore/qk_image.h"
#include "support/log_capture.h"

namespace {

using namespace qktest;

constexpr const char* kCropFile = "src/geometry/crop.cpp";

// Each destination pixel holds what the source pixel it was cut from holds,
// each image addressed through its own chroma base. A destination without
// buffer gets one of its rule size.
TEST(Crop, CopiesTheRectangleOutOfAnyPackedOr420Image) {
    const struct {
        int32_t x, y, w, h;
        uint32_t src_chroma, dst_chroma;  // 4:2:0 only
    } cases[] = {
        {0, 0, 8, 8, 0, 0},   // the whole frame: a byte-exact copy
        {2, 4, 4, 4, 0, 0},  {6, 6, 2, 2, 0, 0},  // touching the right and bottom edges
        {4, 2, 4, 4, 80, 0},  // padded source luma plane
        {2, 2, 4, 4, 0, 20},  // destination chroma at its own offset
        {1, 3, 5, 3, 0, 0},  {5, 0, 3, 8, 0, 0},  // odd places and sizes: packed formats only
    };
    for (uint32_t format : kDrawFormats) {
        for (const auto& c : cases) {
            const bool yuv = is_yuv420(format);
            if (yuv && (c.x % 2 != 0 || c.w % 2 != 0 || c.h % 2 != 0)) continue;
            SCOPED_TRACE(::testing::Message() << fourcc(format) << " " << c.w << "x" << c.h << " at " << c.x << ","
                                              << c.y);
            const uint32_t src_chroma = yuv ? c.src_chroma : 0, dst_chroma = yuv ? c.dst_chroma : 0;
            std::vector<uint8_t> src_bytes(src_chroma != 0 ? src_chroma + 32 : QKImage_requiredSize(8, 8, format));
            std::vector<uint8_t> dst_bytes(dst_chroma + c.w * c.h / 2);
            ImagePtr src(QKImage_createWrap(src_bytes.data(), 8, 8, format, int32_t(src_bytes.size()), src_chroma));
            fill_distinct(*src);
            ImagePtr dst(QKImage_createWrap(dst_chroma != 0 ? dst_bytes.data() : nullptr, c.w, c.h, format,
                                            int32_t(dst_bytes.size()), dst_chroma));
            LogCapture log;
            ASSERT_EQ(QKImage_crop(src.get(), dst.get(), c.x, c.y), QK_OK);
            EXPECT_TRUE(log.lines().empty());
            EXPECT_TRUE(dst_chroma != 0 || dst->size == QKImage_requiredSize(c.w, c.h, format));
            for (int32_t r = 0; r < c.h; ++r) {
                for (int32_t col = 0; col < c.w; ++col) {
                    ASSERT_EQ(pixel_bytes(*dst, col, r), pixel_bytes(*src, c.x + col, c.y + r)) << col << "," << r;
                }
            }
            EXPECT_TRUE(c.w != 8 || c.h != 8 || memcmp(dst->data, src->data, dst->size) == 0);
        }
    }
}

TEST(Crop, RefusalsInTheirOrder) {
    constexpr uint32_t RGBA = QK_FORMAT_RGBA, NV21 = QK_FORMAT_NV21;
    constexpr int32_t SIZE = QK_ERROR_INVALID_SIZE;
    const struct {
        const char* what;
        uint32_t sformat;
        int32_t sw, sh, ssize;  // ssize -1: no buffer
        uint32_t dformat;
        int32_t dw, dh, dsize;  // dsize -1: a buffer of 60 bytes, else the preset size of none
        int32_t x, y, status;
    } cases[] = {
        {"source without buffer", RGBA, 4, 4, -1, RGBA, 2, 2, 0, 0, 0, QK_ERROR_NULL_PARAM},
        {"source size 0", RGBA, 0, 4, 0, RGBA, 2, 2, 0, 0, 0, SIZE},
        {"source size below its picture", RGBA, 4, 4, 60, RGBA, 2, 2, 0, 0, 0, SIZE},
        {"formats differ", RGBA, 4, 4, 0, QK_FORMAT_BGRA, 2, 2, 0, 0, 0, QK_ERROR_INVALID_PARAM},
        {"x negative", RGBA, 4, 4, 0, RGBA, 2, 2, 0, -1, 0, SIZE},
        {"past the right edge", RGBA, 4, 4, 0, RGBA, 2, 2, 0, 3, 0, SIZE},
        {"x + width past int32", RGBA, 4, 4, 0, RGBA, 2, 2, 0, INT32_MAX, 0, SIZE},
        {"past the bottom edge", RGBA, 4, 4, 0, RGBA, 2, 2, 0, 0, 3, SIZE},
        {"destination buffer too small", RGBA, 4, 4, 0, RGBA, 4, 4, -1, 0, 0, SIZE},
        {"preset size too small", RGBA, 4, 4, 0, RGBA, 2, 2, 15, 0, 0, SIZE},
        {"destination with buffer, width 0", RGBA, 4, 4, 0, RGBA, 0, 2, -1, 0, 0, SIZE},
        {"GREY", QK_FORMAT_GREY, 4, 4, 0, QK_FORMAT_GREY, 2, 2, 0, 0, 0, QK_ERROR_UNSUPPORTED},
        {"4:2:0 x odd", NV21, 4, 4, 0, NV21, 2, 2, 0, 1, 0, SIZE},
        {"4:2:0 y odd", NV21, 4, 4, 0, NV21, 2, 2, 0, 0, 1, SIZE},
        {"4:2:0 source odd", NV21, 5, 4, 0, NV21, 2, 2, 0, 0, 0, SIZE},
        {"4:2:0 destination odd", NV21, 4, 4, 0, NV21, 3, 2, 0, 0, 0, SIZE},
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
        EXPECT_TRUE(HasOneFailureReport(log, c.status, kCropFile));
        EXPECT_EQ(log.lines().size(), 1u);
        EXPECT_TRUE(snapshot(*src) == src_before);
        // Format and parity refusals come after the destination got its buffer.
        const bool allocated = c.status == QK_ERROR_UNSUPPORTED || c.sformat == NV21;
        EXPECT_TRUE(allocated ? dst->data != nullptr : snapshot(*dst) == dst_before);
    }

    // A recorded size must also cover chroma kept at its own offset.
    ImagePtr frame = distinct_image(4, 4, NV21), image = distinct_image(2, 2, QK_FORMAT_RGBA);
    std::vector<uint8_t> bytes(24);
    ImagePtr padded(QKImage_createWrap(bytes.data(), 4, 4, NV21, 24, 20));
    ImagePtr empty(QKImage_createEmpty(0, 0, QK_FORMAT_RGBA));
    const struct {
        const QKImage* src;
        QKImage* dst;
        int32_t status;
        const char* file;
    } more[] = {{frame.get(), padded.get(), SIZE, kCropFile},
                {nullptr, image.get(), QK_ERROR_NULL_PARAM, kCropFile},
                {image.get(), nullptr, QK_ERROR_NULL_PARAM, kCropFile},
                // The destination's allocation reports its own failure.
                {image.get(), empty.get(), QK_ERROR_INVALID_PARAM, "src/image/image.cpp"}};
    for (const auto& c : more) {
        LogCapture log;
        EXPECT_EQ(QKImage_crop(c.src, c.dst, 0, 0), c.status);
        EXPECT_TRUE(HasOneFailureReport(log, c.status, c.file));
    }
}

}  // namespace
