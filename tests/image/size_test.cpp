#include <gtest/gtest.h>

#include "qkcore/qk_image.h"

namespace {

TEST(SizeRule, BytesPerFormat) {
    struct Case {
        int32_t width, height;
        uint32_t format;
        uint64_t bytes;
    } cases[] = {
        {16, 8, QK_FORMAT_RGBA, 512}, {16, 8, QK_FORMAT_BGRA, 512}, {16, 8, QK_FORMAT_ARGB, 512},
        {16, 8, QK_FORMAT_ABGR, 512}, {16, 8, QK_FORMAT_RGB8, 384}, {16, 8, QK_FORMAT_BGR8, 384},
        {16, 8, QK_FORMAT_GREY, 128}, {16, 8, QK_FORMAT_YUYV, 256}, {16, 8, QK_FORMAT_YVYU, 256},
        {16, 8, QK_FORMAT_D16, 256},  {16, 8, QK_FORMAT_NV12, 192}, {16, 8, QK_FORMAT_NV21, 192},
        {16, 8, QK_FORMAT_YV12, 192}, {16, 8, QK_FORMAT_YUVP, 192}, {2, 2, QK_FORMAT_PCL, 100},
        // 4:2:0 of an odd pixel count rounds half a byte up.
        {3, 3, QK_FORMAT_NV12, 14}, {1, 1, QK_FORMAT_NV21, 2}, {5, 1, QK_FORMAT_YV12, 8},
        // No size: bad dimensions, no size rule, or past the signed 32-bit
        // byte range (where 32-bit arithmetic would wrap to a small size).
        {0, 10, QK_FORMAT_GREY, 0}, {10, -1, QK_FORMAT_GREY, 0}, {INT32_MIN, INT32_MIN, QK_FORMAT_RGBA, 0},
        {10, 10, QK_FORMAT_JPEG, 0}, {10, 10, 0, 0}, {10, 10, QK_FOURCC('X', 'Y', 'Z', 'W'), 0},
        {46341, 46341, QK_FORMAT_GREY, 0},  // 2^31 + 80621 pixels
        {65536, 65536, QK_FORMAT_RGBA, 0},  // 4 x 2^32 wraps to 0
        {32768, 16384, QK_FORMAT_RGBA, 0},  // exactly 2^31
        {INT32_MAX, INT32_MAX, QK_FORMAT_PCL, 0}, {INT32_MAX, 1, QK_FORMAT_NV12, 0},
        {1 << 30, 1 << 30, QK_FORMAT_PCL, 0},  // 16 x 2^60 + 36 wraps to 36 in 64 bits
        {INT32_MAX, 1, QK_FORMAT_GREY, INT32_MAX}, {8192, 8191, QK_FORMAT_RGBA, 268402688},
    };
    for (const Case& c : cases) {
        EXPECT_EQ(QKImage_requiredSize(c.width, c.height, c.format), c.bytes)
            << c.width << "x" << c.height << " " << std::string(reinterpret_cast<const char*>(&c.format), 4);
    }
}

TEST(ImageSize, RecordedSizeWinsOverTheRule) {
    EXPECT_EQ(QKImage_size(nullptr), 0u);
    QKImage image;
    image.width = 10, image.height = 10, image.format = QK_FORMAT_RGBA;
    EXPECT_EQ(QKImage_size(&image), 400u);
    image.size = 999;
    EXPECT_EQ(QKImage_size(&image), 999u);
    image.format = QK_FORMAT_JPEG;
    EXPECT_EQ(QKImage_size(&image), 999u);
}

}  // namespace
