#include "convert/reference_frame.h"

#include <stddef.h>

#include "convert/formulas.h"

namespace qktest {

const uint32_t kConvertibleFormats[13] = {
    QK_FORMAT_RGBA, QK_FORMAT_BGRA, QK_FORMAT_ARGB, QK_FORMAT_ABGR, QK_FORMAT_RGB8, QK_FORMAT_BGR8, QK_FORMAT_GREY,
    QK_FORMAT_YUYV, QK_FORMAT_YVYU, QK_FORMAT_NV12, QK_FORMAT_NV21, QK_FORMAT_YV12, QK_FORMAT_YUVP,
};

namespace {

char letter(uint32_t format, int i) { return static_cast<char>(format >> (8 * i)); }

bool is_rgb(uint32_t format) {
    for (int i = 0; i < 6; ++i) {
        if (kConvertibleFormats[i] == format) return true;
    }
    return false;
}

// RGB family: the letters of the code are the byte order; a final '8' means
// three bytes and no alpha.
struct RgbPlaces {
    int bytes = 4;
    int r = -1, g = -1, b = -1, a = -1;
};
RgbPlaces rgb_places(uint32_t format) {
    RgbPlaces places;
    if (letter(format, 3) == '8') places.bytes = 3;
    for (int i = 0; i < places.bytes; ++i) {
        switch (letter(format, i)) {
            case 'R': places.r = i; break;
            case 'G': places.g = i; break;
            case 'B': places.b = i; break;
            case 'A': places.a = i; break;
        }
    }
    return places;
}

struct Geometry {
    size_t width, height, base;
};

size_t luma_place(uint32_t format, const Geometry& g, size_t x, size_t y) {
    const size_t pixel = y * g.width + x;
    return (format == QK_FORMAT_YUYV || format == QK_FORMAT_YVYU) ? 2 * pixel : pixel;
}

// Places of the U and V bytes that cover pixel (x, y); false for GREY.
bool chroma_places(uint32_t format, const Geometry& g, size_t x, size_t y, size_t* u, size_t* v) {
    const size_t semiPlanar = g.base + (y / 2) * g.width + (x / 2) * 2;
    const size_t planar = g.base + (y / 2) * (g.width / 2) + x / 2;
    const size_t quarter = g.width * g.height / 4;
    const size_t pair = (y * g.width + x / 2 * 2) * 2;
    switch (format) {
        case QK_FORMAT_NV12: *u = semiPlanar, *v = semiPlanar + 1; return true;
        case QK_FORMAT_NV21: *v = semiPlanar, *u = semiPlanar + 1; return true;
        case QK_FORMAT_YV12: *v = planar, *u = planar + quarter; return true;
        case QK_FORMAT_YUVP: *u = planar, *v = planar + quarter; return true;
        case QK_FORMAT_YUYV: *u = pair + 1, *v = pair + 3; return true;
        case QK_FORMAT_YVYU: *v = pair + 1, *u = pair + 3; return true;
        default: return false;
    }
}

Geometry geometry(const QKImage& image, const QKImage& src) {
    const size_t luma = static_cast<size_t>(src.width) * static_cast<size_t>(src.height);
    return {static_cast<size_t>(src.width), static_cast<size_t>(src.height),
            image.chromaOffset != 0 ? image.chromaOffset : luma};
}

}  // namespace

std::vector<uint8_t> reference_conversion(const QKImage& src, const QKImage& dst, uint64_t capacity) {
    std::vector<uint8_t> out(dst.data, dst.data + capacity);
    const Geometry in = geometry(src, src);
    const Geometry to = geometry(dst, src);
    const bool fromRgb = is_rgb(src.format);
    const bool toRgb = is_rgb(dst.format);
    const RgbPlaces inRgb = rgb_places(src.format);
    const RgbPlaces outRgb = rgb_places(dst.format);
    const bool toPacked = dst.format == QK_FORMAT_YUYV || dst.format == QK_FORMAT_YVYU;

    for (size_t y = 0; y < in.height; ++y) {
        for (size_t x = 0; x < in.width; ++x) {
            const uint8_t* s = fromRgb ? src.data + (y * in.width + x) * inRgb.bytes : nullptr;
            int luma = 0, u = 127, v = 127;
            if (!fromRgb) {
                luma = src.data[luma_place(src.format, in, x, y)];
                size_t up, vp;
                if (chroma_places(src.format, in, x, y, &up, &vp)) u = src.data[up], v = src.data[vp];
            }
            if (toRgb) {
                uint8_t* d = out.data() + (y * in.width + x) * outRgb.bytes;
                if (fromRgb) {
                    d[outRgb.r] = s[inRgb.r], d[outRgb.g] = s[inRgb.g], d[outRgb.b] = s[inRgb.b];
                    if (outRgb.a >= 0) d[outRgb.a] = inRgb.a >= 0 ? s[inRgb.a] : 255;
                } else {
                    // GREY has no chroma: its pixels are the formula at U = V = 128.
                    const bool grey = src.format == QK_FORMAT_GREY;
                    const Rgb rgb = formula_yuv_to_rgb(luma, grey ? 128 : u, grey ? 128 : v);
                    d[outRgb.r] = static_cast<uint8_t>(rgb.r), d[outRgb.g] = static_cast<uint8_t>(rgb.g);
                    d[outRgb.b] = static_cast<uint8_t>(rgb.b);
                    if (outRgb.a >= 0) d[outRgb.a] = 255;
                }
                continue;
            }
            if (fromRgb) {
                const Yuv yuv = formula_rgb_to_yuv(s[inRgb.r], s[inRgb.g], s[inRgb.b]);
                luma = yuv.y, u = yuv.u, v = yuv.v;
            }
            out[luma_place(dst.format, to, x, y)] = static_cast<uint8_t>(luma);
            // Each chroma sample comes from the top-left pixel it covers.
            size_t up, vp;
            if (x % 2 == 0 && (toPacked || y % 2 == 0) && chroma_places(dst.format, to, x, y, &up, &vp)) {
                out[up] = static_cast<uint8_t>(u), out[vp] = static_cast<uint8_t>(v);
            }
        }
    }
    return out;
}

}  // namespace qktest
