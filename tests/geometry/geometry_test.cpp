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

struct Offset {
    int32_t x, y;
};

// A 6x8 source on an 8x4 destination: inside, at negative offsets, and
// overhanging one edge or both. Pixels under the source show its pixels, the
// others keep theirs, each image addressed through its own chroma base.
TEST(Draw, OverlapIsOverwritten) {
    const Offset offsets[] = {{0, 0}, {2, 0}, {-2, -2}, {4, -4}, {-4, 2}, {6, 2}, {0, -4}, {1, -1}, {-3, 1}, {7, 3}};
    for (uint32_t format : kDrawFormats) {
        const bool yuv = is_yuv420(format);
        for (uint32_t dst_chroma : {0u, 40u}) {
            for (const Offset& o : offsets) {
                if (yuv ? (o.x % 2 != 0 || o.y % 2 != 0) : dst_chroma != 0) continue;
                SCOPED_TRACE(::testing::Message() << fourcc(format) << " at " << o.x << "," << o.y << " chroma "
                                                  << dst_chroma);
                // 4:2:0 sources keep their chroma past a padded luma plane.
                std::vector<uint8_t> src_bytes(QKImage_requiredSize(6, 8, format) + 8), dst_bytes(256);
                ImagePtr src(QKImage_createWrap(src_bytes.data(), 6, 8, format, int32_t(src_bytes.size()),
                                                yuv ? 56 : 0));
                fill_distinct(*src, 11);
                ImagePtr dst(QKImage_createWrap(dst_bytes.data(), 8, 4, format, dst_chroma != 0 ? 56 : 0, dst_chroma));
                fill_distinct(*dst, 200);
                ImagePtr before(QKImage_clone(dst.get()));
                LogCapture log;
                ASSERT_EQ(QKImage_drawImage(src.get(), dst.get(), o.x, o.y), QK_OK);
                EXPECT_TRUE(log.lines().empty());
                for (int32_t r = 0; r < 4; ++r) {
                    for (int32_t c = 0; c < 8; ++c) {
                        const int32_t sx = c - o.x, sy = r - o.y;
                        const bool inside = sx >= 0 && sx < 6 && sy >= 0 && sy < 8;
                        const QKImage& shown = inside ? *src : *before;
                        ASSERT_EQ(pixel_bytes(*dst, c, r), pixel_bytes(shown, inside ? sx : c, inside ? sy : r))
                            << c << "," << r;
                    }
                }
            }
        }
    }
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
