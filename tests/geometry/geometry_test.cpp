// Rotation, scaling, cropping and drawing that succeed. Their refusals are
// in refusals_test.cpp.
#include <gtest/gtest.h>
#include <stdint.h>
#include <string.h>

#include <string>
#include <vector>

#include "qkcore/qk_image.h"
#include "support/images.h"
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
    } angles[] = {{0, 0},   {90, 1},  {180, 2}, {270, 3}, {-90, 3}, {-180, 2},
                  {-270, 1}, {-360, 0}, {450, 1}, {900, 2}, {-810, 3}};
    // Column counts that are multiples of 4 leave a quarter turn's tiles an
    // empty tail (8x4, 7x4 and 10x16 turned by 270).
    const struct {
        int32_t w, h;
    } sizes[] = {{4, 2}, {8, 4}, {7, 4}, {10, 16}, {5, 3}, {3, 5}, {7, 9}, {1, 1}, {1, 4}, {5, 1}};
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

// Each output pixel copies the source pixel under its centre; the expected
// source columns and rows are worked out by hand.
TEST(Scale, NearestPixelUnderTheCentre) {
    const struct {
        int32_t sw, sh, dw, dh;
        std::vector<int> cols, rows;
    } cases[] = {
        {3, 3, 3, 3, {0, 1, 2}, {0, 1, 2}},        // equal sizes: a copy
        {4, 4, 2, 2, {1, 3}, {1, 3}},              // one pixel of each 2x2 block, no averaging
        {2, 2, 4, 4, {0, 0, 1, 1}, {0, 0, 1, 1}},  // each pixel repeated in a 2x2 block
        {3, 1, 2, 1, {0, 2}, {0}},                 // centres map back to 0.75 and 2.25
        {5, 4, 3, 7, {0, 2, 4}, {0, 0, 1, 2, 2, 3, 3}},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(::testing::Message() << c.sw << "x" << c.sh << " to " << c.dw << "x" << c.dh);
        ImagePtr src = numbered_rgba(c.sw, c.sh);
        ImagePtr dst(QKImage_createEmpty(c.dw, c.dh, QK_FORMAT_RGBA));
        LogCapture log;
        ASSERT_EQ(QKImage_scale(src.get(), dst.get()), QK_OK);
        EXPECT_TRUE(log.lines().empty());
        // A destination without buffer gets one of width x height x 4 bytes.
        EXPECT_EQ(dst->size, uint64_t(c.dw) * c.dh * 4);
        EXPECT_EQ(dst->isWrapped, 0u);
        for (int32_t r = 0; r < c.dh; ++r) {
            for (int32_t x = 0; x < c.dw; ++x) {
                ASSERT_EQ(pixel_at(*dst, x, r), rgba_pixel(c.rows[r] * c.sw + c.cols[x])) << x << "," << r;
            }
        }
    }
}

TEST(Scale, TranslucentPixelsArriveUnchanged) {
    uint32_t src[] = {0x40302010, 0}, dst[4];
    memset(dst, 0xff, sizeof(dst));  // the old content must not shine through
    ImagePtr source(QKImage_createWrap(src, 2, 1, QK_FORMAT_RGBA, 0, 0));
    ImagePtr target(QKImage_createWrap(dst, 4, 1, QK_FORMAT_RGBA, 0, 0));
    ASSERT_EQ(QKImage_scale(source.get(), target.get()), QK_OK);
    EXPECT_EQ(std::vector<uint32_t>(dst, dst + 4), (std::vector<uint32_t>{0x40302010, 0x40302010, 0, 0}));
}

// A destination sharing memory with the source gets what a separate one gets.
TEST(Scale, DestinationSharingTheSourceBuffer) {
    for (auto [dw, dh] : {std::pair<int32_t, int32_t>{2, 2}, {3, 5}, {4, 4}}) {
        ImagePtr src = numbered_rgba(4, 4);
        ImagePtr separate(QKImage_createNew(dw, dh, QK_FORMAT_RGBA));
        ASSERT_EQ(QKImage_scale(src.get(), separate.get()), QK_OK);
        ImagePtr shared(QKImage_createWrap(src->data, dw, dh, QK_FORMAT_RGBA, 0, 0));
        ASSERT_EQ(QKImage_scale(src.get(), shared.get()), QK_OK);
        EXPECT_EQ(0, memcmp(shared->data, separate->data, separate->size)) << dw << "x" << dh;
    }
}

// Crop cuts the destination's rectangle out of the source at (x, y); draw
// puts the source into the destination at (x, y), clipped. Each pixel then
// holds what the pixel it came from holds, the others keep theirs, each image
// addressed through its own chroma base (4:2:0 chroma past a padded luma
// plane where an offset is given). A crop destination without buffer gets
// one of its rule size.
TEST(CropAndDraw, MovePixelsBetweenImagesOfOneFormat) {
    const struct {
        bool crop;
        int32_t sw, sh, dw, dh, x, y;
        uint32_t src_chroma, dst_chroma;  // 4:2:0 only
    } cases[] = {
        {true, 8, 8, 8, 8, 0, 0, 0, 0},  // the whole frame: a byte-exact copy
        {true, 8, 8, 4, 4, 2, 4, 0, 0},   {true, 8, 8, 2, 2, 6, 6, 0, 0},  // touching the right and bottom edges
        {true, 8, 8, 4, 4, 4, 2, 80, 0},  {true, 8, 8, 4, 4, 2, 2, 0, 20},
        {true, 8, 8, 5, 3, 1, 3, 0, 0},   {true, 8, 8, 3, 8, 5, 0, 0, 0},  // odd places and sizes: packed only
        // A 6x8 source on an 8x4 destination: inside, at negative offsets,
        // overhanging one edge or both.
        {false, 6, 8, 8, 4, 0, 0, 56, 0},  {false, 6, 8, 8, 4, 2, 0, 56, 40},  {false, 6, 8, 8, 4, -2, -2, 56, 0},
        {false, 6, 8, 8, 4, 4, -4, 0, 40}, {false, 6, 8, 8, 4, -4, 2, 56, 40}, {false, 6, 8, 8, 4, 6, 2, 0, 0},
        {false, 6, 8, 8, 4, 0, -4, 56, 40}, {false, 6, 8, 8, 4, 1, -1, 0, 0},  {false, 6, 8, 8, 4, -3, 1, 0, 0},
        {false, 6, 8, 8, 4, 7, 3, 0, 0},
    };
    for (uint32_t format : kDrawFormats) {
        const bool yuv = is_yuv420(format);
        for (const auto& c : cases) {
            if (yuv && (c.x % 2 != 0 || c.y % 2 != 0 || c.dw % 2 != 0 || c.dh % 2 != 0)) continue;
            SCOPED_TRACE(::testing::Message() << (c.crop ? "crop " : "draw ") << fourcc(format) << " " << c.dw << "x"
                                              << c.dh << " at " << c.x << "," << c.y);
            const uint32_t sc = yuv ? c.src_chroma : 0, dc = yuv ? c.dst_chroma : 0;
            std::vector<uint8_t> src_bytes(sc != 0 ? sc + c.sw * c.sh / 2 : QKImage_requiredSize(c.sw, c.sh, format));
            std::vector<uint8_t> dst_bytes(256);
            ImagePtr src(QKImage_createWrap(src_bytes.data(), c.sw, c.sh, format, int32_t(src_bytes.size()), sc));
            fill_distinct(*src, 11);
            const bool bare = c.crop && dc == 0;
            ImagePtr dst(QKImage_createWrap(bare ? nullptr : dst_bytes.data(), c.dw, c.dh, format,
                                            dc != 0 ? dc + c.dw * c.dh / 2 : 0, dc));
            if (!bare) fill_distinct(*dst, 200);
            ImagePtr before(bare ? nullptr : QKImage_clone(dst.get()));
            LogCapture log;
            ASSERT_EQ(c.crop ? QKImage_crop(src.get(), dst.get(), c.x, c.y)
                             : QKImage_drawImage(src.get(), dst.get(), c.x, c.y),
                      QK_OK);
            EXPECT_TRUE(log.lines().empty());
            EXPECT_TRUE(!bare || dst->size == QKImage_requiredSize(c.dw, c.dh, format));
            for (int32_t r = 0; r < c.dh; ++r) {
                for (int32_t col = 0; col < c.dw; ++col) {
                    const int32_t sx = c.crop ? col + c.x : col - c.x, sy = c.crop ? r + c.y : r - c.y;
                    const bool inside = sx >= 0 && sx < c.sw && sy >= 0 && sy < c.sh;
                    const auto expected = inside ? pixel_bytes(*src, sx, sy) : pixel_bytes(*before, col, r);
                    ASSERT_EQ(pixel_bytes(*dst, col, r), expected) << col << "," << r;
                }
            }
            EXPECT_TRUE(!c.crop || c.dw != 8 || c.dh != 8 || memcmp(dst->data, src->data, dst->size) == 0);
        }
    }
}

// Drawing an image into itself reads every row before overwriting it.
TEST(Draw, IntoItself) {
    for (auto [x, y] : {std::pair{1, 1}, {-1, -2}, {2, -1}, {-2, 1}}) {
        ImagePtr image = distinct_image(5, 4, QK_FORMAT_RGB8);
        ImagePtr copy(QKImage_clone(image.get()));
        ImagePtr expected(QKImage_clone(image.get()));
        ASSERT_EQ(QKImage_drawImage(copy.get(), expected.get(), x, y), QK_OK);
        ASSERT_EQ(QKImage_drawImage(image.get(), image.get(), x, y), QK_OK);
        EXPECT_EQ(0, memcmp(image->data, expected->data, 60)) << x << "," << y;
    }
}

TEST(Draw, NothingToDrawIsNotAFailure) {
    const std::string out = "In QKImage_drawImage, the source image 4x4 is completely out of the destination 5x3 at ";
    const struct {
        int32_t x, y;
        std::string message;
    } cases[] = {
        {5, 0, out + "5,0"}, {0, 3, out + "0,3"}, {-5, 0, out + "-5,0"}, {INT32_MIN, 0, out + "-2147483648,0"},
        {-4, 0, "Nothing to draw (lines = 3, cols = 0)"}, {0, -4, "Nothing to draw (lines = 0, cols = 4)"},
    };
    ImagePtr src = distinct_image(4, 4, QK_FORMAT_RGBA);
    for (const auto& c : cases) {
        ImagePtr dst = distinct_image(5, 3, QK_FORMAT_RGBA, 200);
        const auto before = snapshot(dst.get());
        LogCapture log;
        EXPECT_EQ(QKImage_drawImage(src.get(), dst.get(), c.x, c.y), QK_OK);
        EXPECT_EQ(log.lines(), (std::vector<LogLine>{{3, c.message}}));
        EXPECT_TRUE(snapshot(dst.get()) == before);
    }
    // Being outside is decided before the format is looked at.
    ImagePtr grey = distinct_image(4, 4, QK_FORMAT_GREY);
    LogCapture log;
    EXPECT_EQ(QKImage_drawImage(grey.get(), grey.get(), 4, 0), QK_OK);
    EXPECT_TRUE(HasNoErrors(log));
}

}  // namespace
