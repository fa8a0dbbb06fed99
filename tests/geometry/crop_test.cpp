#include <gtest/gtest.h>
#include <stdint.h>
#include <string.h>

#include <vector>

#include "support/images.h"
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

}  // namespace
