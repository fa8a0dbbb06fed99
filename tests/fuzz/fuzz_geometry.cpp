// Fuzz target: rotate, scale, crop and draw with images, offsets and angles
// from the input. A refusal leaves every image as it was; a success is
// checked pixel by pixel against the plain definitions of each operation.
//
// Input: operations until the input ends (at most 4), each a byte mod 4:
//   0 rotate: an image (Frame::make), then the angle (see take_angle);
//   1 scale:  source and destination images;
//   2 crop:   source and destination images, x and y (Input::offset);
//   3 draw:   a byte (bit 0: draw the source into itself), the source, the
//             destination unless drawing into itself, x and y.
#include <math.h>
#include <stdint.h>
#include <string.h>

#include <algorithm>
#include <vector>

#include "fuzz/fuzz_support.h"
#include "qkcore/qk_image.h"

namespace {

using qkfuzz::check;
using qkfuzz::Frame;
using qkfuzz::Input;
using qkfuzz::is_rgb;
using qkfuzz::is_yuv420;
using qkfuzz::kMaxBytes;
using qkfuzz::rule_bytes;
using qkfuzz::Snapshot;

// A byte mod 4: 0 a multiple -12..12 of 90 (byte mod 25 - 12); 1 one of
// kAngles (byte mod 8); 2 a raw 32-bit value; 3 90 times a signed 16-bit value.
constexpr int32_t kAngles[8] = {2147483610, -2147483610, INT32_MIN, INT32_MAX, 810, -810, 45, 1 << 30};
int32_t take_angle(Input& in) {
    switch (in.byte() % 4) {
        case 0: return 90 * (in.byte() % 25 - 12);
        case 1: return kAngles[in.byte() % 8];
        case 2: return static_cast<int32_t>(in.u32());
        default: return 90 * static_cast<int16_t>(in.u16());
    }
}

// Copies the bytes of pixel (sx, sy) of `src`, taken from `from`, over those
// of pixel (dx, dy) of `dst` in `to`. A pixel outside either buffer means the
// operation succeeded where it had to refuse.
void copy_pixel(const QKImage& src, const std::vector<uint8_t>& from, int64_t sx, int64_t sy, const QKImage& dst,
                std::vector<uint8_t>& to, int64_t dx, int64_t dy) {
    const std::vector<size_t> a = qkfuzz::pixel_places(src, static_cast<int32_t>(sx), static_cast<int32_t>(sy));
    const std::vector<size_t> b = qkfuzz::pixel_places(dst, static_cast<int32_t>(dx), static_cast<int32_t>(dy));
    for (size_t k = 0; k < a.size(); ++k) {
        check(a[k] < from.size() && b[k] < to.size(), "a pixel of a success lies outside its buffer");
        to[b[k]] = from[a[k]];
    }
}

// ---- Rotation ----

// Pixel (c, r) of the image turned by `turns` counter-clockwise quarter
// turns shows pixel (x, y) of the w x h original (even sizes: no shift).
void turned_from(int turns, int64_t w, int64_t h, int64_t c, int64_t r, int64_t* x, int64_t* y) {
    switch (turns) {
        case 1: *x = w - 1 - r, *y = c; break;
        case 2: *x = w - 1 - c, *y = h - 1 - r; break;
        case 3: *x = r, *y = h - 1 - c; break;
        default: *x = c, *y = r; break;
    }
}

void rotate(Input& in) {
    Frame frame;
    frame.make(in);
    const int32_t angle = take_angle(in);
    QKImage* image = frame.image;
    const Snapshot before(image, frame.length());
    // An RGBA buffer of exactly one picture turns by any multiple of 90.
    const bool plain = image->format == QK_FORMAT_RGBA && image->data != nullptr && image->width > 0 &&
                       image->height > 0 && angle % 90 == 0 &&
                       QKImage_size(image) == 4 * uint64_t(image->width) * uint64_t(image->height);
    // Other formats turn through a temporary RGBA copy.
    if (!plain && rule_bytes(image->width, image->height, QK_FORMAT_RGBA) > kMaxBytes) return;

    const int32_t status = QKImage_rotate(image, angle);
    const Snapshot after(image, frame.length());
    if (status != QK_OK) {
        check(!plain, "rotate refused an RGBA picture");
        check(after == before, "rotate: a refusal changed the image");
        return;
    }
    check(angle % 90 == 0, "rotate: success for an angle that is no multiple of 90");
    const int turns = ((angle / 90) % 4 + 4) % 4;
    const bool exchanged = turns % 2 == 1;
    check(after.data == before.data && after.format == before.format && after.size == before.size &&
              after.isWrapped == before.isWrapped && after.chromaOffset == before.chromaOffset &&
              after.width == (exchanged ? before.height : before.width) &&
              after.height == (exchanged ? before.width : before.height),
          "rotate: fields after a turn");
    // The RGB family and GREY come back from RGBA unchanged: at even sizes
    // every pixel has a place to go.
    const int64_t w = before.width, h = before.height;
    if ((!is_rgb(image->format) && image->format != QK_FORMAT_GREY) || w % 2 != 0 || h % 2 != 0) return;
    const size_t bpp = rule_bytes(1, 1, image->format);
    check(before.bytes.size() >= size_t(w * h) * bpp, "rotate: success for a buffer short of its picture");
    std::vector<uint8_t> expected = before.bytes;
    for (int64_t r = 0; r < after.height; ++r) {
        for (int64_t c = 0; c < after.width; ++c) {
            int64_t x, y;
            turned_from(turns, w, h, c, r, &x, &y);
            std::copy_n(before.bytes.begin() + (y * w + x) * bpp, bpp, expected.begin() + (r * after.width + c) * bpp);
        }
    }
    check(after.bytes == expected, "rotate: pixels differ from the turned picture");
    if (image->format != QK_FORMAT_RGBA) return;
    for (int i = 0; i < 4; ++i) check(QKImage_rotate(image, 90) == QK_OK, "rotate: a quarter turn refused");
    check(Snapshot(image, frame.length()) == after, "rotate: four quarter turns are not the identity");
}

// ---- Scaling ----

int32_t nearest(int64_t i, float scale, int32_t limit) {
    const float mapped = floorf((static_cast<float>(i) + 0.5f) / scale);
    if (!(mapped >= 0)) return 0;
    return mapped >= static_cast<float>(limit) ? limit - 1 : static_cast<int32_t>(mapped);
}

void scale(Input& in) {
    Frame from, to;
    from.make(in);
    to.make(in);
    const QKImage* src = from.image;
    QKImage* dst = to.image;
    if (dst->data == nullptr && QKImage_size(dst) > kMaxBytes) return;
    const Snapshot srcBefore(src, from.length()), dstBefore(dst, to.length());
    const uint64_t srcBytes = 4 * uint64_t(std::max(src->width, 0)) * uint64_t(std::max(src->height, 0));
    const uint64_t dstBytes = 4 * uint64_t(std::max(dst->width, 0)) * uint64_t(std::max(dst->height, 0));
    const bool plain = src->format == QK_FORMAT_RGBA && dst->format == QK_FORMAT_RGBA && src->data != nullptr &&
                       src->width > 0 && src->height > 0 && dst->width > 0 && dst->height > 0 &&
                       QKImage_size(src) >= srcBytes &&
                       (dst->data != nullptr ? QKImage_size(dst) >= dstBytes : dstBytes <= kMaxBytes);

    const int32_t status = QKImage_scale(src, dst);
    check(Snapshot(src, from.length()) == srcBefore, "scale changed its source");
    const Snapshot after(dst, to.length());
    if (status != QK_OK) {
        check(!plain, "scale refused two RGBA pictures");
        check(after == dstBefore, "scale: a refusal changed the destination");
        return;
    }
    check(src->format == QK_FORMAT_RGBA && dst->format == QK_FORMAT_RGBA, "scale: success for a format not RGBA");
    check(after.width == dstBefore.width && after.height == dstBefore.height && after.format == dstBefore.format,
          "scale: the destination's fields changed");
    if (dstBefore.data != nullptr) {
        check(after.data == dstBefore.data && after.size == dstBefore.size &&
                  after.isWrapped == dstBefore.isWrapped && after.chromaOffset == dstBefore.chromaOffset,
              "scale: the destination's buffer changed");
    } else {
        check(after.data != nullptr && after.isWrapped == 0 && after.size == dstBytes,
              "scale: the destination's new buffer");
    }
    check(after.bytes.size() >= dstBytes && srcBefore.bytes.size() >= srcBytes, "scale: a success outside a buffer");
    std::vector<uint8_t> expected = after.bytes;  // past the picture: as the destination had it
    if (dstBefore.data != nullptr) expected = dstBefore.bytes;
    const float sx = static_cast<float>(dst->width) / static_cast<float>(src->width);
    const float sy = static_cast<float>(dst->height) / static_cast<float>(src->height);
    for (int64_t r = 0; r < dst->height; ++r) {
        const int64_t y = nearest(r, sy, src->height);
        for (int64_t c = 0; c < dst->width; ++c) {
            const int64_t x = nearest(c, sx, src->width);
            std::copy_n(srcBefore.bytes.begin() + (y * src->width + x) * 4, 4,
                        expected.begin() + (r * dst->width + c) * 4);
        }
    }
    check(after.bytes == expected, "scale: pixels differ from the nearest source pixels");
}

// ---- Cropping and drawing ----

bool drawable(uint32_t format) { return is_rgb(format) || is_yuv420(format); }

// 4:2:0 chroma laid over the luma has no one defined result.
bool chroma_apart(const QKImage& image) {
    const uint64_t luma = uint64_t(image.width) * uint64_t(image.height);
    return !is_yuv420(image.format) || image.chromaOffset == 0 || image.chromaOffset >= luma;
}

void crop(Input& in) {
    Frame from, to;
    from.make(in);
    to.make(in);
    const int32_t x = in.offset(), y = in.offset();
    const QKImage* src = from.image;
    QKImage* dst = to.image;
    if (dst->data == nullptr && QKImage_size(dst) > kMaxBytes) return;
    const Snapshot srcBefore(src, from.length()), dstBefore(dst, to.length());

    const int32_t status = QKImage_crop(src, dst, x, y);
    check(Snapshot(src, from.length()) == srcBefore, "crop changed its source");
    const Snapshot after(dst, to.length());
    // Documented: a destination without buffer may get its buffer before a
    // refusal.
    const bool allocated = dstBefore.data == nullptr && after.data != nullptr;
    if (allocated) {
        check(after.isWrapped == 0 && after.size == rule_bytes(dst->width, dst->height, dst->format) &&
                  after.chromaOffset == 0 &&
                  after.width == dstBefore.width && after.height == dstBefore.height &&
                  after.format == dstBefore.format,
              "crop: the destination's new buffer");
    } else {
        check(dstBefore.same_fields(dst), "crop: the destination's fields changed");
    }
    if (status != QK_OK) {
        check(allocated || after.bytes == dstBefore.bytes, "crop: a refusal changed the destination's bytes");
        return;
    }
    check(src->format == dst->format && drawable(dst->format), "crop: success for formats it does not crop");
    check(x >= 0 && y >= 0 && int64_t{x} + dst->width <= src->width && int64_t{y} + dst->height <= src->height,
          "crop: success for a rectangle outside the source");
    if (is_yuv420(dst->format)) {
        check(x % 2 == 0 && y % 2 == 0 && dst->width % 2 == 0 && dst->height % 2 == 0,
              "crop: success for odd 4:2:0 coordinates");
    }
    if (!chroma_apart(*dst)) return;
    std::vector<uint8_t> expected = allocated ? after.bytes : dstBefore.bytes;
    for (int64_t j = 0; j < dst->height; ++j) {
        for (int64_t i = 0; i < dst->width; ++i) copy_pixel(*src, srcBefore.bytes, x + i, y + j, *dst, expected, i, j);
    }
    check(after.bytes == expected, "crop: pixels differ from the source's rectangle");
}

void draw(Input& in) {
    const bool self = in.flag();
    Frame from, to;
    from.make(in);
    if (!self) to.make(in);
    const int32_t x = in.offset(), y = in.offset();
    const QKImage* src = from.image;
    Frame& target = self ? from : to;
    QKImage* dst = target.image;
    const Snapshot srcBefore(src, from.length()), dstBefore(dst, target.length());

    const int32_t status = QKImage_drawImage(src, dst, x, y);
    if (!self) check(Snapshot(src, from.length()) == srcBefore, "draw changed its source");
    const Snapshot after(dst, target.length());
    check(dstBefore.same_fields(dst), "draw: the destination's fields changed");
    if (status != QK_OK) {
        check(after.bytes == dstBefore.bytes, "draw: a refusal changed the destination's bytes");
        return;
    }
    // The overlap of the source placed at (x, y) with the destination.
    const int64_t x0 = std::max<int64_t>(x, 0), x1 = std::min<int64_t>(int64_t{x} + src->width, dst->width);
    const int64_t y0 = std::max<int64_t>(y, 0), y1 = std::min<int64_t>(int64_t{y} + src->height, dst->height);
    if (x0 >= x1 || y0 >= y1) {
        check(after.bytes == dstBefore.bytes, "draw: nothing to draw, yet the destination changed");
        return;
    }
    check(src->format == dst->format && drawable(dst->format), "draw: success for formats it does not draw");
    if (is_yuv420(dst->format)) {
        check(x % 2 == 0 && y % 2 == 0 && src->width % 2 == 0 && src->height % 2 == 0 && dst->width % 2 == 0 &&
                  dst->height % 2 == 0,
              "draw: success for odd 4:2:0 coordinates");
    }
    if (!chroma_apart(*dst)) return;
    std::vector<uint8_t> expected = dstBefore.bytes;
    for (int64_t r = y0; r < y1; ++r) {
        for (int64_t c = x0; c < x1; ++c) copy_pixel(*src, srcBefore.bytes, c - x, r - y, *dst, expected, c, r);
    }
    check(after.bytes == expected, "draw: pixels differ from the placed source");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    static const bool ready = (qkfuzz::quiet_log(), true);
    (void)ready;
    Input in(data, size);
    for (int step = 0; step < 4 && !in.empty(); ++step) {
        switch (in.byte() % 4) {
            case 0: rotate(in); break;
            case 1: scale(in); break;
            case 2: crop(in); break;
            default: draw(in); break;
        }
    }
    return 0;
}
