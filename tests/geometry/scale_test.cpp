#include <gtest/gtest.h>
#include <stdint.h>
#include <string.h>

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
using qktest::set_pixel;
using qktest::Snapshot;
using qktest::Unchanged;

constexpr const char* kScaleSource = "src/geometry/scale.cpp";

ImagePtr numbered_rgba(int32_t width, int32_t height) {
    ImagePtr image(QKImage_createNew(width, height, QK_FORMAT_RGBA));
    for (int32_t i = 0; i < width * height; ++i) set_pixel(*image, i % width, i / width, rgba_pixel(i));
    return image;
}

// Each output pixel copies the source pixel under its centre: the expected
// source columns and rows are listed by hand.
TEST(Scale, NearestPixelUnderTheCentre) {
    struct Case {
        int32_t sw, sh, dw, dh;
        std::vector<int> cols, rows;
    };
    const Case cases[] = {
        {3, 3, 3, 3, {0, 1, 2}, {0, 1, 2}},                 // equal sizes: a copy
        {4, 4, 2, 2, {1, 3}, {1, 3}},                       // one pixel of each 2x2 block, no averaging
        {2, 2, 4, 4, {0, 0, 1, 1}, {0, 0, 1, 1}},           // each pixel repeated in a 2x2 block
        {3, 1, 2, 1, {0, 2}, {0}},                          // 1.5 and 2.25 after mapping back
        {2, 1, 5, 3, {0, 0, 1, 1, 1}, {0, 0, 0}},           // factor 2.5 across, 3 down
        {5, 4, 3, 7, {0, 2, 4}, {0, 0, 1, 2, 2, 3, 3}},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(::testing::Message() << c.sw << "x" << c.sh << " to " << c.dw << "x" << c.dh);
        ImagePtr src = numbered_rgba(c.sw, c.sh);
        ImagePtr dst(QKImage_createNew(c.dw, c.dh, QK_FORMAT_RGBA));
        memset(dst->data, 0x77, dst->size);
        LogCapture log;
        ASSERT_EQ(QKImage_scale(src.get(), dst.get()), QK_OK);
        EXPECT_TRUE(log.lines().empty());
        for (int32_t r = 0; r < c.dh; ++r) {
            for (int32_t x = 0; x < c.dw; ++x) {
                ASSERT_EQ(pixel_at(*dst, x, r), rgba_pixel(c.rows[r] * c.sw + c.cols[x])) << x << "," << r;
            }
        }
    }
}

TEST(Scale, TranslucentPixelsArriveUnchanged) {
    ImagePtr src(QKImage_createNew(2, 1, QK_FORMAT_RGBA));
    set_pixel(*src, 0, 0, 0x40302010);
    set_pixel(*src, 1, 0, 0x00000000);
    ImagePtr dst(QKImage_createNew(4, 1, QK_FORMAT_RGBA));
    memset(dst->data, 0xff, dst->size);  // the old content must not shine through
    ASSERT_EQ(QKImage_scale(src.get(), dst.get()), QK_OK);
    const uint32_t expected[] = {0x40302010, 0x40302010, 0, 0};
    for (int c = 0; c < 4; ++c) EXPECT_EQ(pixel_at(*dst, c, 0), expected[c]);
}

TEST(Scale, DestinationWithoutBufferGetsOne) {
    ImagePtr src = numbered_rgba(4, 4);
    ImagePtr dst(QKImage_createEmpty(2, 2, QK_FORMAT_RGBA));
    ASSERT_EQ(QKImage_scale(src.get(), dst.get()), QK_OK);
    ASSERT_NE(dst->data, nullptr);
    EXPECT_EQ(dst->isWrapped, 0u);
    EXPECT_EQ(dst->size, 16u);
    EXPECT_EQ(pixel_at(*dst, 1, 1), rgba_pixel(15));

    // A preset size that holds the picture is honoured.
    ImagePtr preset(QKImage_createEmpty(2, 2, QK_FORMAT_RGBA));
    preset->size = 64;
    ASSERT_EQ(QKImage_scale(src.get(), preset.get()), QK_OK);
    EXPECT_EQ(preset->size, 64u);
    EXPECT_EQ(pixel_at(*preset, 0, 0), rgba_pixel(5));
}

// A destination sharing memory with the source is resampled through a bitmap
// of its own: the result equals that of a separate destination.
TEST(Scale, DestinationSharingTheSourceBuffer) {
    const struct {
        int32_t dw, dh;
    } sizes[] = {{2, 2}, {3, 5}, {4, 4}};
    for (const auto& size : sizes) {
        SCOPED_TRACE(::testing::Message() << size.dw << "x" << size.dh);
        ImagePtr src = numbered_rgba(4, 4);
        ImagePtr separate(QKImage_createNew(size.dw, size.dh, QK_FORMAT_RGBA));
        ASSERT_EQ(QKImage_scale(src.get(), separate.get()), QK_OK);
        ImagePtr shared(QKImage_createWrap(src->data, size.dw, size.dh, QK_FORMAT_RGBA, 0, 0));
        ASSERT_EQ(QKImage_scale(src.get(), shared.get()), QK_OK);
        EXPECT_EQ(0, memcmp(shared->data, separate->data, separate->size));
    }
}

TEST(Scale, RefusalsLeaveTheDestinationAlone) {
    std::vector<uint8_t> small(12, 0x5a);
    struct Case {
        const char* what;
        int32_t sw, sh;
        uint32_t sformat;
        uint64_t ssize;
        int32_t dw, dh;
        uint32_t dformat;
        uint8_t* dbuffer;
        int32_t dsize;
        int32_t status;
        const char* message;
    };
    const Case cases[] = {
        {"source width 0", 0, 2, QK_FORMAT_RGBA, 64, 2, 2, QK_FORMAT_RGBA, nullptr, 0, QK_ERROR_INVALID_SIZE,
         "QKImage_scale: invalid image dimensions (<=0)"},
        {"destination height -1", 2, 2, QK_FORMAT_RGBA, 0, 2, -1, QK_FORMAT_RGBA, nullptr, 0,
         QK_ERROR_INVALID_SIZE, "QKImage_scale: invalid image dimensions (<=0)"},
        {"dimensions before format", 2, 2, QK_FORMAT_RGBA, 0, 0, 2, QK_FORMAT_BGRA, nullptr, 0,
         QK_ERROR_INVALID_SIZE, "QKImage_scale: invalid image dimensions (<=0)"},
        {"BGRA source", 2, 2, QK_FORMAT_BGRA, 0, 2, 2, QK_FORMAT_RGBA, nullptr, 0, QK_ERROR_INVALID_PARAM,
         "QKImage_scale supports only ANDROID_BITMAP format for now"},
        {"NV12 destination", 2, 2, QK_FORMAT_RGBA, 0, 2, 2, QK_FORMAT_NV12, nullptr, 0, QK_ERROR_INVALID_PARAM,
         "QKImage_scale supports only ANDROID_BITMAP format for now"},
        {"destination buffer too small", 2, 2, QK_FORMAT_RGBA, 0, 2, 2, QK_FORMAT_RGBA, small.data(), 12,
         QK_ERROR_INVALID_SIZE, nullptr},
        {"preset size too small", 2, 2, QK_FORMAT_RGBA, 0, 2, 2, QK_FORMAT_RGBA, nullptr, 12,
         QK_ERROR_INVALID_SIZE, nullptr},
        {"source size below the picture", 2, 2, QK_FORMAT_RGBA, 12, 2, 2, QK_FORMAT_RGBA, nullptr, 0,
         QK_ERROR_INVALID_SIZE, nullptr},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.what);
        std::vector<uint8_t> pixels(64, 1);
        ImagePtr src(QKImage_createWrap(pixels.data(), c.sw, c.sh, c.sformat, static_cast<int32_t>(c.ssize), 0));
        ImagePtr dst(QKImage_createWrap(c.dbuffer, c.dw, c.dh, c.dformat, c.dsize, 0));
        if (c.dbuffer == nullptr) dst->size = static_cast<uint64_t>(c.dsize);
        Snapshot before(*dst);
        LogCapture log;
        EXPECT_EQ(QKImage_scale(src.get(), dst.get()), c.status);
        EXPECT_TRUE(HasOneFailureReport(log, c.status, kScaleSource));
        if (c.message != nullptr) {
            EXPECT_TRUE(log.contains(4, c.message));
        }
        EXPECT_EQ(log.lines().size(), c.message != nullptr ? 2u : 1u);
        EXPECT_TRUE(Unchanged(*dst, before));
    }

    ImagePtr image(QKImage_createNew(2, 2, QK_FORMAT_RGBA));
    ImagePtr empty(QKImage_createEmpty(2, 2, QK_FORMAT_RGBA));
    for (auto [src, dst] : {std::pair<const QKImage*, QKImage*>{nullptr, image.get()}, {image.get(), nullptr},
                            {empty.get(), image.get()}}) {
        LogCapture log;
        EXPECT_EQ(QKImage_scale(src, dst), QK_ERROR_NULL_PARAM);
        EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_NULL_PARAM, kScaleSource));
    }
}

// The allocation's own report names the image code; scaling adds its message.
TEST(Scale, DestinationBufferNotObtained) {
    ImagePtr src(QKImage_createNew(2, 2, QK_FORMAT_RGBA));
    ImagePtr dst(QKImage_createEmpty(40000, 40000, QK_FORMAT_RGBA));  // past the library's byte counts
    LogCapture log;
    EXPECT_EQ(QKImage_scale(src.get(), dst.get()), QK_ERROR_INVALID_PARAM);
    EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_INVALID_PARAM, "src/image/image.cpp"));
    EXPECT_TRUE(log.contains(4, "QKImage_scale: allocation failed (0 bytes)"));
    EXPECT_EQ(dst->data, nullptr);
}

}  // namespace
