#include "convert/reference_frame.h"

#include <stddef.h>

#include <algorithm>

#include "support/images.h"

namespace qktest {

namespace {

// RGB family (the first six formats): the letters of the code are the byte
// order; a final '8' means three bytes and no alpha.
struct RgbPlaces {
    bool rgb = false;
    int bytes = 4;
    int r = -1, g = -1, b = -1, a = -1;
};
RgbPlaces rgb_places(uint32_t format) {
    RgbPlaces places;
    places.rgb = std::find(kConvertibleFormats, kConvertibleFormats + 6, format) != kConvertibleFormats + 6;
    if (!places.rgb) return places;
    if (static_cast<char>(format >> 24) == '8') places.bytes = 3;
    for (int i = 0; i < places.bytes; ++i) {
        switch (static_cast<char>(format >> (8 * i))) {
            case 'R': places.r = i; break;
            case 'G': places.g = i; break;
            case 'B': places.b = i; break;
            case 'A': places.a = i; break;
        }
    }
    return places;
}

bool packed(uint32_t format) { return format == QK_FORMAT_YUYV || format == QK_FORMAT_YVYU; }

}  // namespace

std::vector<uint8_t> reference_conversion(const QKImage& src, const QKImage& dst, uint64_t capacity) {
    std::vector<uint8_t> out(dst.data, dst.data + capacity);
    const size_t width = static_cast<size_t>(src.width), height = static_cast<size_t>(src.height);
    const size_t inBase = src.chromaOffset != 0 ? src.chromaOffset : width * height;
    const size_t outBase = dst.chromaOffset != 0 ? dst.chromaOffset : width * height;
    const RgbPlaces in = rgb_places(src.format), to = rgb_places(dst.format);

    for (size_t y = 0; y < height; ++y) {
        for (size_t x = 0; x < width; ++x) {
            const size_t pixel = y * width + x;
            const uint8_t* s = in.rgb ? src.data + pixel * in.bytes : nullptr;
            int luma = 0, u = 127, v = 127;
            size_t up, vp;
            if (!in.rgb) {
                luma = src.data[packed(src.format) ? 2 * pixel : pixel];
                if (chroma_places(src.format, width, height, inBase, x, y, &up, &vp)) {
                    u = src.data[up], v = src.data[vp];
                }
            }
            if (to.rgb) {
                uint8_t* d = out.data() + pixel * to.bytes;
                if (to.a >= 0) d[to.a] = in.a >= 0 ? s[in.a] : 255;
                if (in.rgb) {
                    d[to.r] = s[in.r], d[to.g] = s[in.g], d[to.b] = s[in.b];
                } else {
                    // GREY has no chroma: its pixels are the formula at U = V = 128.
                    const bool grey = src.format == QK_FORMAT_GREY;
                    const Rgb rgb = formula_yuv_to_rgb(luma, grey ? 128 : u, grey ? 128 : v);
                    d[to.r] = static_cast<uint8_t>(rgb.r), d[to.g] = static_cast<uint8_t>(rgb.g);
                    d[to.b] = static_cast<uint8_t>(rgb.b);
                }
                continue;
            }
            if (in.rgb) {
                const Yuv yuv = formula_rgb_to_yuv(s[in.r], s[in.g], s[in.b]);
                luma = yuv.y, u = yuv.u, v = yuv.v;
            }
            out[packed(dst.format) ? 2 * pixel : pixel] = static_cast<uint8_t>(luma);
            // Each chroma sample comes from the top-left pixel it covers.
            if (x % 2 == 0 && (packed(dst.format) || y % 2 == 0) &&
                chroma_places(dst.format, width, height, outBase, x, y, &up, &vp)) {
                out[up] = static_cast<uint8_t>(u), out[vp] = static_cast<uint8_t>(v);
            }
        }
    }
    return out;
}

}  // namespace qktest
