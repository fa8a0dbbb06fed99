#include <gtest/gtest.h>
#include <stdint.h>

#include <vector>

#include "geometry/images.h"
#include "qkcore/qk_image.h"
#include "support/log_capture.h"

namespace {

using qktest::HasNoErrors;
using qktest::HasOneFailureReport;
using qktest::ImagePtr;
using qktest::LogCapture;
using qktest::pixel_at;
using qktest::rgba_pixel;
using qktest::Snapshot;
using qktest::Unchanged;

constexpr const char* kRotateSource = "src/geometry/rotate.cpp";

ImagePtr numbered_rgba(int32_t width, int32_t height) {
    ImagePtr image(QKImage_createNew(width, height, QK_FORMAT_RGBA));
    for (int32_t i = 0; i < width * height; ++i) qktest::set_pixel(*image, i % width, i / width, rgba_pixel(i));
    return image;
}

// The source pixel that output pixel (c, r) shows after `orient`
// counter-clockwise quarter turns of a w x h picture, with the integer pivots
// (w/2, h/2), (w/2, w/2), (w/2, h/2), (h/2, h/2). False where no source pixel
// lands (the far row or column of an odd dimension).
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
    } angles[] = {{0, 0},   {90, 1},   {180, 2},   {270, 3},  {-90, 3}, {-180, 2},
                  {-270, 1}, {360, 0}, {-360, 0}, {450, 1}, {-450, 3}, {900, 2}};
    const struct {
        int32_t w, h;
    } sizes[] = {{4, 2}, {6, 4}, {2, 2}, {5, 3}, {3, 5}, {7, 7}, {1, 1}, {1, 4}, {5, 1}};
    for (const auto& size : sizes) {
        for (const auto& a : angles) {
            SCOPED_TRACE(::testing::Message() << size.w << "x" << size.h << " by " << a.angle);
            ImagePtr image = numbered_rgba(size.w, size.h);
            uint8_t* buffer = image->data;
            LogCapture log;
            ASSERT_EQ(QKImage_rotate(image.get(), a.angle), QK_OK);
            EXPECT_TRUE(HasNoErrors(log));
            EXPECT_EQ(image->data, buffer);
            EXPECT_EQ(image->format, QK_FORMAT_RGBA);
            const bool exchanged = a.orient % 2 == 1;
            ASSERT_EQ(image->width, exchanged ? size.h : size.w);
            ASSERT_EQ(image->height, exchanged ? size.w : size.h);
            for (int32_t r = 0; r < image->height; ++r) {
                for (int32_t c = 0; c < image->width; ++c) {
                    int32_t sx, sy;
                    const uint32_t expected =
                        shown_source(a.orient, size.w, size.h, c, r, &sx, &sy) ? rgba_pixel(sy * size.w + sx) : 0;
                    ASSERT_EQ(pixel_at(*image, c, r), expected) << "output pixel " << c << "," << r;
                }
            }
        }
    }
}

// Independent of the table above: a quarter turn counter-clockwise puts the
// source's last column, top to bottom, into the output's first row.
TEST(Rotate, QuarterTurnPutsTheLastColumnFirst) {
    ImagePtr image = numbered_rgba(4, 2);
    ASSERT_EQ(QKImage_rotate(image.get(), 90), QK_OK);
    EXPECT_EQ(pixel_at(*image, 0, 0), rgba_pixel(3));
    EXPECT_EQ(pixel_at(*image, 1, 0), rgba_pixel(7));
    EXPECT_EQ(pixel_at(*image, 0, 3), rgba_pixel(0));
    EXPECT_EQ(pixel_at(*image, 1, 3), rgba_pixel(4));
}

TEST(Rotate, TranslucentPixelsArriveUnchangedAndUncoveredPixelsAreTransparent) {
    // Odd width: the last output row of a quarter turn is not covered.
    ImagePtr image(QKImage_createNew(3, 2, QK_FORMAT_RGBA));
    const uint32_t pixels[] = {0x00000000, 0x40302010, 0x80808080, 0x01010101, 0xff0000ff, 0x7f00007f};
    for (int i = 0; i < 6; ++i) qktest::set_pixel(*image, i % 3, i / 3, pixels[i]);
    ASSERT_EQ(QKImage_rotate(image.get(), 90), QK_OK);
    // Output (c, r) shows source (1 - r, c); row 2 is uncovered.
    const uint32_t expected[3][2] = {{pixels[1], pixels[4]}, {pixels[0], pixels[3]}, {0, 0}};
    for (int r = 0; r < 3; ++r) {
        for (int c = 0; c < 2; ++c) EXPECT_EQ(pixel_at(*image, c, r), expected[r][c]) << c << "," << r;
    }
}

TEST(Rotate, LogsItsParameters) {
    const struct {
        int32_t angle;
        const char* text;
    } cases[] = {
        {-270, "Rotation parameters: angle = -270, orient = 1, in w/h = 5x3, out w/h = 3x5, pivot = 2,2"},
        {180, "Rotation parameters: angle = 180, orient = 2, in w/h = 5x3, out w/h = 5x3, pivot = 2,1"},
        {-90, "Rotation parameters: angle = -90, orient = 3, in w/h = 5x3, out w/h = 3x5, pivot = 1,1"},
        {720, "Rotation parameters: angle = 720, orient = 0, in w/h = 5x3, out w/h = 5x3, pivot = 2,1"},
    };
    for (const auto& c : cases) {
        ImagePtr image = numbered_rgba(5, 3);
        LogCapture log;
        ASSERT_EQ(QKImage_rotate(image.get(), c.angle), QK_OK);
        EXPECT_EQ(log.texts(1), std::vector<std::string>{c.text});
        EXPECT_EQ(log.lines().size(), 1u);
    }
}

TEST(Rotate, WrappedBufferStaysTheCallers) {
    std::vector<uint8_t> pixels(4 * 6 * 4, 0xff);
    ImagePtr image(QKImage_createWrap(pixels.data(), 6, 4, QK_FORMAT_RGBA, 96, 0));
    ASSERT_EQ(QKImage_rotate(image.get(), 270), QK_OK);
    EXPECT_EQ(image->data, pixels.data());
    EXPECT_EQ(image->isWrapped, 1u);
    EXPECT_EQ(image->size, 96u);
    EXPECT_EQ(image->width, 4);
    EXPECT_EQ(image->height, 6);
}

TEST(Rotate, RefusalsLeaveTheImageAlone) {
    std::vector<uint8_t> pixels(4 * 3 * 2, 0x5a);
    struct Case {
        const char* what;
        int32_t width, height;
        uint32_t format;
        int32_t size;
        int32_t angle;
        int32_t status;
    };
    const Case cases[] = {
        {"angle 45", 3, 2, QK_FORMAT_RGBA, 0, 45, QK_ERROR_INVALID_PARAM},
        {"angle -1", 3, 2, QK_FORMAT_RGBA, 0, -1, QK_ERROR_INVALID_PARAM},
        {"width 0", 0, 2, QK_FORMAT_RGBA, 0, 90, QK_ERROR_INVALID_SIZE},
        {"no size rule", 3, 2, QK_FORMAT_JPEG, 0, 90, QK_ERROR_INVALID_SIZE},
        {"buffer larger than the picture", 2, 2, QK_FORMAT_RGBA, 24, 90, QK_ERROR_INVALID_SIZE},
        {"buffer smaller than the picture", 3, 2, QK_FORMAT_RGBA, 20, 180, QK_ERROR_INVALID_SIZE},
        {"recorded size, negative width", -3, 2, QK_FORMAT_RGBA, 24, 90, QK_ERROR_INVALID_SIZE},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.what);
        ImagePtr image(QKImage_createWrap(pixels.data(), c.width, c.height, c.format, c.size, 0));
        Snapshot before(*image);
        LogCapture log;
        EXPECT_EQ(QKImage_rotate(image.get(), c.angle), c.status);
        EXPECT_TRUE(HasOneFailureReport(log, c.status, kRotateSource));
        EXPECT_TRUE(Unchanged(*image, before));
    }

    LogCapture log;
    EXPECT_EQ(QKImage_rotate(nullptr, 90), QK_ERROR_NULL_PARAM);
    EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_NULL_PARAM, kRotateSource));
    ImagePtr empty(QKImage_createEmpty(3, 2, QK_FORMAT_RGBA));
    log.clear();
    EXPECT_EQ(QKImage_rotate(empty.get(), 90), QK_ERROR_NULL_PARAM);
    EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_NULL_PARAM, kRotateSource));
    EXPECT_EQ(empty->width, 3);
}

}  // namespace
