#include <gtest/gtest.h>
#include <stdint.h>
#include <string.h>

#include <string>
#include <vector>

#include "support/images.h"
#include "qkcore/qk_image.h"
#include "support/log_capture.h"

namespace {

using namespace qktest;

// The source pixel that output pixel (c, r) shows after `orient`
// counter-clockwise quarter turns of a w x h picture about the integer pivots
// (w/2, h/2), (w/2, w/2), (w/2, h/2), (h/2, h/2). False where nothing lands:
// the far row or column when a dimension is odd.
bool shown_source(int orient, int32_t w, int32_t h, int32_t c, int32_t r, int32_t* sx, int32_t* sy) {
    switch (orient) {
        case 0: *sx = c, *sy = r; break;
        case 1: *sx = 2 * (w / 2) - 1 - r, *sy = c; break;
        case 2: *sx = 2 * (w / 2) - 1 - c, *sy = 2 * (h / 2) - 1 - r; break;
        default: *sx = r, *sy = 2 * (h / 2) - 1 - c; break;
    }
    return *sx >= 0 && *sx < w && *sy >= 0 && *sy < h;
}

TEST(Rotate, EveryAngleMapsEveryPixel) {
    const struct {
        int32_t angle;
        int orient;
    } angles[] = {{0, 0}, {90, 1}, {180, 2}, {270, 3}, {-90, 3}, {-180, 2}, {-270, 1}, {-360, 0}, {450, 1}, {900, 2}};
    const struct {
        int32_t w, h;
    } sizes[] = {{4, 2}, {8, 4}, {5, 3}, {3, 5}, {7, 9}, {1, 1}, {1, 4}, {5, 1}};
    for (const auto& size : sizes) {
        for (const auto& a : angles) {
            SCOPED_TRACE(::testing::Message() << size.w << "x" << size.h << " by " << a.angle);
            ImagePtr image = numbered_rgba(size.w, size.h);
            uint8_t* buffer = image->data;
            ASSERT_EQ(QKImage_rotate(image.get(), a.angle), QK_OK);
            EXPECT_EQ(image->data, buffer);
            const bool exchanged = a.orient % 2 == 1;
            ASSERT_EQ(image->width, exchanged ? size.h : size.w);
            ASSERT_EQ(image->height, exchanged ? size.w : size.h);
            for (int32_t r = 0; r < image->height; ++r) {
                for (int32_t c = 0; c < image->width; ++c) {
                    int32_t sx, sy;
                    const bool shown = shown_source(a.orient, size.w, size.h, c, r, &sx, &sy);
                    ASSERT_EQ(pixel_at(*image, c, r), shown ? rgba_pixel(sy * size.w + sx) : 0) << c << "," << r;
                }
            }
        }
    }
}

// Odd width: the last output row of a quarter turn stays transparent black.
TEST(Rotate, TranslucentPixelsArriveUnchangedOverTheClearedOutput) {
    uint32_t pixels[] = {0x00000000, 0x40302010, 0x80808080, 0x01010101, 0xff0000ff, 0x7f00007f};
    const std::vector<uint32_t> expected = {pixels[1], pixels[4], pixels[0], pixels[3], 0, 0};
    ImagePtr image(QKImage_createWrap(pixels, 3, 2, QK_FORMAT_RGBA, 0, 0));
    LogCapture log;
    ASSERT_EQ(QKImage_rotate(image.get(), 90), QK_OK);
    EXPECT_EQ(std::vector<uint32_t>(pixels, pixels + 6), expected);
    EXPECT_EQ(log.texts(1), std::vector<std::string>{"Rotation parameters: angle = 90, orient = 1, in w/h = 3x2, "
                                                     "out w/h = 2x3, pivot = 1,1"});
}

// Other formats turn through RGBA: the result is exactly converting to RGBA,
// turning that, and converting back into the same buffer.
TEST(RotateThroughRgba, EqualsConvertTurnConvertBack) {
    const struct {
        uint32_t format;
        int32_t width, height, angle;
    } cases[] = {
        {QK_FORMAT_NV21, 16, 8, 270}, {QK_FORMAT_NV12, 6, 4, 90},  {QK_FORMAT_YV12, 8, 4, -90},
        {QK_FORMAT_YUVP, 4, 4, 180},  {QK_FORMAT_YUYV, 8, 4, 90},  {QK_FORMAT_GREY, 5, 3, 90},
        {QK_FORMAT_BGR8, 7, 2, 270},  {QK_FORMAT_ABGR, 3, 3, 180},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(::testing::Message() << fourcc(c.format) << " " << c.width << "x" << c.height << " by "
                                          << c.angle);
        ImagePtr image = distinct_image(c.width, c.height, c.format);
        ImagePtr expected(QKImage_clone(image.get()));
        ImagePtr rgba(QKImage_copyAndConvert(image.get(), QK_FORMAT_RGBA));
        ASSERT_TRUE(rgba);
        ASSERT_EQ(QKImage_rotate(rgba.get(), c.angle), QK_OK);
        ASSERT_EQ(QKImage_convert(rgba.get(), expected.get()), QK_OK);

        const std::string warning = "Rotation is supported on RGBA images only for now: using temporary RGBA copy of "
                                    "this " + std::to_string(c.width) + "x" + std::to_string(c.height) + " '" +
                                    fourcc(c.format) + "' image";
        LogCapture log;
        ASSERT_EQ(QKImage_rotate(image.get(), c.angle), QK_OK);
        EXPECT_TRUE(HasNoErrors(log));
        EXPECT_EQ(log.texts(3), std::vector<std::string>{warning});
        EXPECT_EQ(std::make_tuple(image->format, image->width, image->height),
                  std::make_tuple(c.format, expected->width, expected->height));
        EXPECT_EQ(memcmp(image->data, expected->data, QKImage_size(expected.get())), 0);
    }
}

}  // namespace
