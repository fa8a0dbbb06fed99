// Rotation, scaling, cropping and drawing, and every refusal of theirs.
#include <gtest/gtest.h>
#include <stdint.h>
#include <string.h>

#include <algorithm>
#include <random>
#include <string>
#include <vector>

#include "qkcore/qk_image.h"
#include "support/images.h"
#include "support/log_capture.h"

namespace {

using namespace qktest;

// The source pixel that output pixel (c, r) shows after `orient` quarter
// turns counter-clockwise about the integer pivots (w/2, h/2), (w/2, w/2),
// (w/2, h/2), (h/2, h/2); false for the uncovered far row or column.
bool shown_source(int orient, int32_t w, int32_t h, int32_t c, int32_t r, int32_t* sx, int32_t* sy) {
    switch (orient) {
        case 0: *sx = c, *sy = r; break;
        case 1: *sx = 2 * (w / 2) - 1 - r, *sy = c; break;
        case 2: *sx = 2 * (w / 2) - 1 - c, *sy = 2 * (h / 2) - 1 - r; break;
        default: *sx = r, *sy = 2 * (h / 2) - 1 - c; break;
    }
    return *sx >= 0 && *sx < w && *sy >= 0 && *sy < h;
}

// Translucent pixels arrive unchanged, uncovered ones are transparent black.
TEST(Rotate, EveryAngleMapsEveryPixel) {
    const struct { int32_t angle, orient; } angles[] = {{0, 0},    {90, 1},   {180, 2}, {270, 3}, {-90, 3}, {-180, 2},
                                                        {-270, 1}, {-360, 0}, {450, 1}, {900, 2}, {-810, 3}};
    // Column counts that are multiples of 4 leave a quarter turn's tiles an
    // empty tail (8x4, 7x4 and 10x16 turned by 270); 258x301 takes more than
    // one tile of the turn in place.
    const struct { int32_t w, h; } sizes[] = {{4, 2}, {8, 4}, {7, 4}, {10, 16}, {5, 3}, {3, 5},
                                              {7, 9}, {1, 1}, {1, 4}, {5, 1},  {258, 301}};
    for (const auto& size : sizes) {
        for (const auto& a : angles) {
            SCOPED_TRACE(::testing::Message() << size.w << "x" << size.h << " by " << a.angle);
            ImagePtr image = numbered_rgba(size.w, size.h);
            uint8_t* buffer = image->data;
            ASSERT_EQ(QKImage_rotate(image.get(), a.angle), QK_OK);
            const bool turned = a.orient % 2 == 1;
            ASSERT_EQ(std::make_tuple(image->data, image->width, image->height),
                      std::make_tuple(buffer, turned ? size.h : size.w, turned ? size.w : size.h));
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

// Other formats turn through RGBA: exactly converting, turning the RGBA copy
// and converting back into the same buffer. 4:2:0 images get those bytes
// from their planes turned (the top half of a quarter turn in place, in
// bands of 256 rows): sizes of whole vector blocks of the plane turns and
// not (2x2 to 290x98, past one tile of 64 rows and 256 columns; 530 wide
// turns into two bands), chroma right after the luma, further on in a
// larger buffer (bytes in between untouched) or inside the luma plane (gap
// < 0: the RGBA road's order of writes decides), every angle, 0 included
// (a round trip).
TEST(Rotate, OtherFormatsThroughRgba) {
    const struct { uint32_t format; int32_t w, h, gap; } cases[] = {
        {QK_FORMAT_NV21, 16, 8, 0},   {QK_FORMAT_NV12, 130, 66, 0},  {QK_FORMAT_YV12, 64, 192, 0},
        {QK_FORMAT_YUVP, 6, 258, 0},  {QK_FORMAT_NV12, 2, 2, 0},     {QK_FORMAT_NV21, 200, 130, 40},
        {QK_FORMAT_YV12, 34, 12, 6},  {QK_FORMAT_YUVP, 128, 66, 64}, {QK_FORMAT_YUYV, 6, 4, 0},
        {QK_FORMAT_NV12, 290, 98, 0}, {QK_FORMAT_YV12, 530, 36, 0},  {QK_FORMAT_NV21, 20, 12, -100}};
    std::mt19937 random(7);
    for (const auto& c : cases) {
        for (int32_t angle : {0, 90, 180, 270, -90}) {
            SCOPED_TRACE(::testing::Message() << fourcc(c.format) << " " << c.w << "x" << c.h << " gap " << c.gap
                                              << " by " << angle);
            const size_t luma = size_t(c.w) * c.h;
            const size_t bytes = QKImage_requiredSize(c.w, c.h, c.format) + std::max(c.gap, 0);
            const uint32_t chroma = c.gap != 0 ? uint32_t(luma + c.gap) : 0;
            Frame image({c.format, c.w, c.h, bytes, bytes, chroma}), expected({c.format, c.w, c.h, bytes, bytes, chroma});
            image.randomize(random);
            expected.buffer = image.buffer;
            ImagePtr rgba(QKImage_copyAndConvert(&image.image, QK_FORMAT_RGBA));
            ASSERT_EQ(QKImage_rotate(rgba.get(), angle) | QKImage_convert(rgba.get(), &expected.image), QK_OK);
            ASSERT_EQ(QKImage_rotate(&image.image, angle), QK_OK);
            EXPECT_EQ(std::make_tuple(image.image.width, image.image.height),
                      std::make_tuple(expected.image.width, expected.image.height));
            EXPECT_TRUE(image.buffer == expected.buffer);
        }
    }
}

// Each output pixel copies the source pixel under its centre: column i of n
// shows column (2i + 1) from / 2n of `from`, and likewise for rows. A
// destination without buffer gets one; one sharing the source's buffer gets
// what a separate one gets, nothing of its old content left.
TEST(Scale, NearestPixelUnderTheCentre) {
    // Exact doubling and halving, wide enough for whole vectors and tails (23
    // to 11 leaves the last source column unused, 3 to 5 rows are not
    // doubled); other factors through the column table, at 4200 columns in
    // two strips of it. Targets past 8 MiB are streamed: a doubling with runs
    // of three rows, a halving, a factor of 1.5. Small ones checked by hand:
    // a copy; one pixel of each 2x2 block, no averaging; each pixel repeated
    // in a 2x2 block; columns 0 and 2 of 3 (centres at 0.75 and 2.25).
    const struct { int32_t sw, sh, dw, dh; } cases[] = {
        {9, 3, 18, 6}, {22, 6, 11, 3}, {2100, 2, 4200, 4}, {8400, 2, 4200, 1}, {23, 7, 11, 3}, {7, 3, 14, 5},
        {20, 6, 30, 9}, {30, 9, 20, 6}, {2800, 2, 4200, 3}, {1024, 700, 2048, 2100}, {4096, 2050, 2048, 1025},
        {1600, 900, 2400, 1350}, {3, 3, 3, 3}, {4, 4, 2, 2}, {2, 2, 4, 4}, {3, 1, 2, 1}, {5, 4, 3, 7}, {4, 4, 3, 5}};
    auto centre = [](int64_t i, int64_t n, int64_t from) { return int32_t((2 * i + 1) * from / (2 * n)); };
    for (const auto& c : cases) {
        SCOPED_TRACE(::testing::Message() << c.sw << "x" << c.sh << " to " << c.dw << "x" << c.dh);
        ImagePtr src = numbered_rgba(c.sw, c.sh), copy = numbered_rgba(c.sw, c.sh);
        ImagePtr dst(QKImage_createEmpty(c.dw, c.dh, QK_FORMAT_RGBA));
        LogCapture log;
        ASSERT_EQ(QKImage_scale(src.get(), dst.get()), QK_OK);
        EXPECT_TRUE(log.lines().empty());
        EXPECT_EQ(std::make_tuple(dst->size, dst->isWrapped), std::make_tuple(uint64_t(c.dw) * c.dh * 4, 0u));
        for (int32_t r = 0; r < c.dh; ++r) {
            for (int32_t x = 0; x < c.dw; ++x) {
                const int32_t from = centre(r, c.dh, c.sh) * c.sw + centre(x, c.dw, c.sw);
                ASSERT_EQ(pixel_at(*dst, x, r), rgba_pixel(from)) << x << "," << r;
            }
        }
        if (c.dw * c.dh > c.sw * c.sh) continue;
        ImagePtr shared(QKImage_createWrap(copy->data, c.dw, c.dh, QK_FORMAT_RGBA, 0, 0));
        ASSERT_EQ(QKImage_scale(copy.get(), shared.get()), QK_OK);
        EXPECT_EQ(0, memcmp(shared->data, dst->data, dst->size));
    }
}

// What pixel (x, y) of a packed RGB or 4:2:0 image holds: its own bytes, or
// its Y, U and V samples, addressed from the image's chroma base.
std::vector<uint8_t> pixel_bytes(const QKImage& image, int32_t x, int32_t y) {
    const size_t w = static_cast<size_t>(image.width), at = y * w + x, bpp = QKImage_requiredSize(1, 1, image.format);
    if (!is_yuv420(image.format)) return std::vector<uint8_t>(image.data + at * bpp, image.data + (at + 1) * bpp);
    size_t u = 0, v = 0;
    chroma_places(image.format, w, image.height, image.chromaOffset != 0 ? image.chromaOffset : w * image.height, x, y,
                  &u, &v);
    return {image.data[at], image.data[u], image.data[v]};
}

// Crop cuts the destination's rectangle out of the source at (x, y); draw
// puts the source into the destination at (x, y), clipped. Each pixel holds
// what the pixel it came from holds, the others keep theirs, 4:2:0 chroma at
// each image's own offset. A crop destination without buffer gets one.
TEST(CropAndDraw, MovePixelsBetweenImagesOfOneFormat) {
    // Crops of an 8x8 frame: whole, touching the right and bottom edges, odd
    // places and sizes (packed only). Draws of a 6x8 source on an 8x4
    // destination: inside, at negative offsets, overhanging one edge or both.
    const struct { bool crop; int32_t sw, sh, dw, dh, x, y; uint32_t src_chroma, dst_chroma; } cases[] = {
        {true, 8, 8, 8, 8, 0, 0, 0, 0},     {true, 8, 8, 4, 4, 2, 4, 0, 0},     {true, 8, 8, 2, 2, 6, 6, 0, 0},
        {true, 8, 8, 4, 4, 4, 2, 80, 0},    {true, 8, 8, 4, 4, 2, 2, 0, 20},    {true, 8, 8, 5, 3, 1, 3, 0, 0},
        {true, 8, 8, 3, 8, 5, 0, 0, 0},     {false, 6, 8, 8, 4, 0, 0, 56, 0},   {false, 6, 8, 8, 4, 2, 0, 56, 40},
        {false, 6, 8, 8, 4, -2, -2, 56, 0}, {false, 6, 8, 8, 4, 4, -4, 0, 40},  {false, 6, 8, 8, 4, -4, 2, 56, 40},
        {false, 6, 8, 8, 4, 6, 2, 0, 0},    {false, 6, 8, 8, 4, 0, -4, 56, 40}, {false, 6, 8, 8, 4, 1, -1, 0, 0},
        {false, 6, 8, 8, 4, -3, 1, 0, 0},   {false, 6, 8, 8, 4, 7, 3, 0, 0}};
    for (uint32_t format : {QK_FORMAT_RGBA, QK_FORMAT_RGB8, QK_FORMAT_NV12, QK_FORMAT_NV21, QK_FORMAT_YV12,
                            QK_FORMAT_YUVP}) {
        const bool yuv = is_yuv420(format);
        for (const auto& c : cases) {
            if (yuv && (c.x % 2 != 0 || c.y % 2 != 0 || c.dw % 2 != 0 || c.dh % 2 != 0)) continue;
            SCOPED_TRACE(::testing::Message() << (c.crop ? "crop " : "draw ") << fourcc(format) << " " << c.dw << "x"
                                              << c.dh << " at " << c.x << "," << c.y);
            const uint32_t sc = yuv ? c.src_chroma : 0, dc = yuv ? c.dst_chroma : 0;
            const size_t src_bytes = sc != 0 ? sc + c.sw * c.sh / 2 : QKImage_requiredSize(c.sw, c.sh, format);
            Frame src({format, c.sw, c.sh, src_bytes, src_bytes, sc});
            const bool bare = c.crop && dc == 0;
            Frame dst({format, c.dw, c.dh, bare ? 0u : 256u, dc != 0 ? dc + c.dw * c.dh / 2 : 0, dc}, 200);
            const Frame before({format, c.dw, c.dh, 256, dst.image.size, dc}, 200);
            LogCapture log;
            auto move = c.crop ? QKImage_crop : QKImage_drawImage;
            ASSERT_EQ(move(&src.image, &dst.image, c.x, c.y), QK_OK);
            EXPECT_TRUE(log.lines().empty());
            EXPECT_TRUE(!bare || dst.image.size == QKImage_requiredSize(c.dw, c.dh, format));
            for (int32_t r = 0; r < c.dh; ++r) {
                for (int32_t col = 0; col < c.dw; ++col) {
                    const int32_t sx = c.crop ? col + c.x : col - c.x, sy = c.crop ? r + c.y : r - c.y;
                    const bool inside = sx >= 0 && sx < c.sw && sy >= 0 && sy < c.sh;
                    const auto expected = inside ? pixel_bytes(src.image, sx, sy) : pixel_bytes(before.image, col, r);
                    ASSERT_EQ(pixel_bytes(dst.image, col, r), expected) << col << "," << r;
                }
            }
            EXPECT_TRUE(!c.crop || c.dw != 8 || c.dh != 8 || memcmp(dst.image.data, src.buffer.data(), src_bytes) == 0);
        }
    }
}

// Drawing an image into itself reads every row before overwriting it.
TEST(Draw, IntoItself) {
    for (auto [x, y] : {std::pair{1, 1}, {-1, -2}, {2, -1}, {-2, 1}}) {
        ImagePtr image = distinct_image(5, 4, QK_FORMAT_RGB8);
        ImagePtr copy(QKImage_clone(image.get())), expected(QKImage_clone(image.get()));
        ASSERT_EQ(QKImage_drawImage(copy.get(), expected.get(), x, y), QK_OK);
        ASSERT_EQ(QKImage_drawImage(image.get(), image.get(), x, y), QK_OK);
        EXPECT_EQ(0, memcmp(image->data, expected->data, 60)) << x << "," << y;
    }
}

// Every refusal: its status, its one failure report (from the operation's
// own file unless a step it relies on reports), any message that goes with
// it, and the caller's images left as they were.
enum Op { kRotate, kScale, kCrop, kDraw };
const char* const kFiles[] = {"src/geometry/rotate.cpp", "src/geometry/scale.cpp", "src/geometry/crop.cpp",
                              "src/geometry/draw.cpp"};
constexpr const char *kConvertFile = "src/convert/convert.cpp", *kImageFile = "src/image/image.cpp";
constexpr int kBuffer = 1, kNone = 0, kNullImage = -1;

// An image over a 64-byte buffer (or none, or no image at all) that records
// `size` (0: the size rule) and `chroma`.
struct Spec { uint32_t format; int32_t w, h; uint64_t size = 0; int buffer = kBuffer; uint32_t chroma = 0; };

ImagePtr make(const Spec& spec, std::vector<uint8_t>& bytes) {
    if (spec.buffer == kNullImage) return nullptr;
    uint8_t* buffer = spec.buffer ? bytes.data() : nullptr;
    ImagePtr image(QKImage_createWrap(buffer, spec.w, spec.h, spec.format, 0, spec.chroma));
    image->size = spec.size;
    return image;
}

TEST(GeometryRefusals, ReportOnceAndLeaveTheImagesAlone) {
    constexpr uint32_t RGBA = QK_FORMAT_RGBA, NV12 = QK_FORMAT_NV12, NV21 = QK_FORMAT_NV21, GREY = QK_FORMAT_GREY;
    constexpr int32_t NUL = QK_ERROR_NULL_PARAM, PARAM = QK_ERROR_INVALID_PARAM, SIZE = QK_ERROR_INVALID_SIZE,
                      NONE = QK_ERROR_UNSUPPORTED;
    constexpr const char *kScaleSizes = "QKImage_scale: invalid image dimensions (<=0)",
                         *kScaleFormat = "QKImage_scale supports only ANDROID_BITMAP format for now";
    const Spec rgba4{RGBA, 4, 4}, rgba2{RGBA, 2, 2}, none2{RGBA, 2, 2, 0, kNone}, null{RGBA, 2, 2, 0, kNullImage};
    // Rotate turns `src` by x. The report comes from the operation's own file
    // unless `file` is given; `message` is a level-4 message before it;
    // `allocates`: the destination got its buffer before the refusal.
    const struct {
        Op op;
        Spec src, dst;
        int32_t x, y, status;
        const char *file = nullptr, *message = nullptr;
        bool allocates = false;
    } cases[] = {
        {kRotate, null, {}, 90, 0, NUL}, {kRotate, none2, {}, 90, 0, NUL}, {kRotate, rgba2, {}, 45, 0, PARAM},
        {kRotate, {RGBA, 0, 2}, {}, 90, 0, SIZE}, {kRotate, {QK_FORMAT_JPEG, 3, 2}, {}, 90, 0, SIZE},
        {kRotate, {RGBA, 2, 2, 24}, {}, 90, 0, SIZE}, {kRotate, {RGBA, 3, 2, 20}, {}, 180, 0, SIZE},  // larger, smaller
        {kRotate, {RGBA, -3, 2, 24}, {}, 90, 0, SIZE},
        // Other formats turn through RGBA: conversion refusals come back.
        {kRotate, {QK_FORMAT_D16, 4, 2}, {}, 90, 0, NONE, kConvertFile, "[QKImage] Can not convert  D16 into RGBA"},
        {kRotate, {QK_FORMAT_YUYV, 4, 3}, {}, 90, 0, SIZE, kConvertFile},  // turned 3 pixels wide
        // 4:2:0 turns itself, refusing what those conversions refuse.
        {kRotate, {NV21, 4, 3}, {}, 90, 0, SIZE}, {kRotate, {NV12, 4, 2, 0, kBuffer, 60}, {}, 90, 0, SIZE},

        {kScale, null, rgba2, 0, 0, NUL}, {kScale, rgba2, null, 0, 0, NUL}, {kScale, none2, rgba2, 0, 0, NUL},
        {kScale, {RGBA, 0, 2, 64}, none2, 0, 0, SIZE, nullptr, kScaleSizes},
        {kScale, rgba2, {RGBA, 2, -1, 0, kNone}, 0, 0, SIZE, nullptr, kScaleSizes},
        {kScale, rgba2, {QK_FORMAT_BGRA, 0, 2, 0, kNone}, 0, 0, SIZE, nullptr, kScaleSizes},  // before the format
        {kScale, {QK_FORMAT_BGRA, 2, 2}, none2, 0, 0, PARAM, nullptr, kScaleFormat},
        {kScale, rgba2, {NV12, 2, 2, 0, kNone}, 0, 0, PARAM, nullptr, kScaleFormat},
        {kScale, rgba2, {RGBA, 2, 2, 12}, 0, 0, SIZE}, {kScale, rgba2, {RGBA, 2, 2, 12, kNone}, 0, 0, SIZE},
        {kScale, {RGBA, 2, 2, 12}, none2, 0, 0, SIZE},
        {kScale, rgba2, {RGBA, 40000, 40000, 0, kNone}, 0, 0, PARAM, kImageFile,
         "QKImage_scale: allocation failed (0 bytes)"},

        {kCrop, null, rgba2, 0, 0, NUL}, {kCrop, rgba2, null, 0, 0, NUL},
        {kCrop, {RGBA, 4, 4, 64, kNone}, none2, 0, 0, NUL},
        {kCrop, {RGBA, 0, 4}, none2, 0, 0, SIZE}, {kCrop, {RGBA, 4, 4, 60}, none2, 0, 0, SIZE},
        {kCrop, rgba4, {QK_FORMAT_BGRA, 2, 2, 0, kNone}, 0, 0, PARAM}, {kCrop, rgba4, none2, -1, 0, SIZE},
        {kCrop, rgba4, none2, 3, 0, SIZE}, {kCrop, rgba4, none2, INT32_MAX, 0, SIZE}, {kCrop, rgba4, none2, 0, 3, SIZE},
        {kCrop, rgba4, {RGBA, 4, 4, 60}, 0, 0, SIZE}, {kCrop, rgba4, {RGBA, 2, 2, 15, kNone}, 0, 0, SIZE},
        {kCrop, rgba4, {RGBA, 0, 2, 60}, 0, 0, SIZE}, {kCrop, {NV21, 4, 4}, {NV21, 4, 4, 24, kBuffer, 20}, 0, 0, SIZE},
        {kCrop, {RGBA, 100000, 100000, 16}, none2, 0, 1, SIZE},  // past the byte range
        {kCrop, rgba2, {RGBA, 0, 0, 0, kNone}, 0, 0, PARAM, kImageFile},
        // Format and parity refusals come after the destination got its buffer.
        {kCrop, {GREY, 4, 4}, {GREY, 2, 2, 0, kNone}, 0, 0, NONE, nullptr, nullptr, true},
        {kCrop, {NV21, 4, 4}, {NV21, 2, 2, 0, kNone}, 1, 0, SIZE, nullptr, nullptr, true},
        {kCrop, {NV21, 4, 4}, {NV21, 2, 2, 0, kNone}, 0, 1, SIZE, nullptr, nullptr, true},
        {kCrop, {NV21, 5, 4}, {NV21, 2, 2, 0, kNone}, 0, 0, SIZE, nullptr, nullptr, true},
        {kCrop, {NV21, 4, 4}, {NV21, 3, 2, 0, kNone}, 0, 0, SIZE, nullptr, nullptr, true},

        {kDraw, null, rgba4, 0, 0, NUL}, {kDraw, rgba2, null, 0, 0, NUL}, {kDraw, none2, rgba4, 0, 0, NUL},
        {kDraw, rgba2, {RGBA, 4, 4, 0, kNone}, 0, 0, NUL}, {kDraw, {RGBA, 0, 2}, rgba4, 0, 0, SIZE},
        {kDraw, rgba2, {RGBA, 4, 4, 60}, 0, 0, SIZE}, {kDraw, rgba2, {QK_FORMAT_ABGR, 4, 4}, 0, 0, PARAM},
        {kDraw, {RGBA, 100000, 100000, 16}, rgba4, 0, 0, SIZE}, {kDraw, rgba2, {RGBA, 100000, 100000, 16}, 0, 0, SIZE},
        {kDraw, {NV12, 2, 2}, {NV12, 4, 4}, 1, 0, NONE, nullptr, "Unsupported dimensions for YUV420: 2x2 offset 1,0"},
        {kDraw, {NV12, 3, 2}, {NV12, 4, 4}, 0, -2, NONE, nullptr, "Unsupported dimensions for YUV420: 3x2 offset 0,-2"},
        {kDraw, {NV12, 2, 2}, {NV12, 4, 3}, 0, 0, SIZE}, {kDraw, {GREY, 2, 2}, {GREY, 4, 4}, 0, 0, NONE},
        {kDraw, {QK_FORMAT_YUYV, 2, 2}, {QK_FORMAT_YUYV, 4, 4}, 0, 0, NONE}};
    for (const auto& c : cases) {
        SCOPED_TRACE(::testing::Message() << kFiles[c.op] << ", case " << &c - cases);
        std::vector<uint8_t> src_bytes(64, 1), dst_bytes(64, 2);
        ImagePtr src = make(c.src, src_bytes), dst = make(c.dst, dst_bytes);
        const auto src_before = snapshot(src.get()), dst_before = snapshot(dst.get());
        LogCapture log;
        const int32_t status = c.op == kRotate  ? QKImage_rotate(src.get(), c.x)
                               : c.op == kScale ? QKImage_scale(src.get(), dst.get())
                               : c.op == kCrop  ? QKImage_crop(src.get(), dst.get(), c.x, c.y)
                                                : QKImage_drawImage(src.get(), dst.get(), c.x, c.y);
        EXPECT_EQ(status, c.status);
        EXPECT_TRUE(HasOneFailureReport(log, c.status, c.file != nullptr ? c.file : kFiles[c.op]));
        EXPECT_EQ(log.texts(4).size(), c.message != nullptr ? 2u : 1u);
        EXPECT_TRUE(c.message == nullptr || log.contains(4, c.message));
        // The level-3 message of turning through RGBA comes first.
        EXPECT_EQ(log.texts(3).size(), c.file == kConvertFile ? 1u : 0u);
        EXPECT_TRUE(snapshot(src.get()) == src_before);
        EXPECT_TRUE(c.allocates ? dst->data != nullptr : snapshot(dst.get()) == dst_before);
    }
}

}  // namespace
