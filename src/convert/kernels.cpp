// The conversion kernels: resolve both layouts and the row kernels once, then
// walk the rows.
#include "convert/kernels.h"

#include <stddef.h>

#include "convert/row.h"
#include "image/format.h"
#include "platform/memory.h"

namespace qk {
namespace {

// Byte offset, from the first U (or V) sample, of the chroma row that serves
// image row y.
ptrdiff_t chroma_row_offset(const YuvLayout& layout, ptrdiff_t y, ptrdiff_t width) {
    return (layout.subsampledRows ? y / 2 : y) * (width / 2) * layout.chromaStep;
}

// Whether a destination of this many bytes is written with streaming stores.
bool streamed(ptrdiff_t bytes) { return static_cast<uint64_t>(bytes) >= platform::kStreamBytes; }

// Whether image row y writes a chroma row of this destination layout: every
// row of a packed 4:2:2 image, the even rows of a 4:2:0 image.
bool row_carries_chroma(const YuvLayout& layout, ptrdiff_t y) {
    return layout.chromaStep != 0 && (!layout.subsampledRows || y % 2 == 0);
}

}  // namespace

void convert_rgb_to_rgb(const QKImage& src, QKImage& dst) {
    const int s = rgb_format_index(src.format);
    const int d = rgb_format_index(dst.format);
    const ptrdiff_t width = src.width;
    const RgbToRgbShape shape{kFormats[s].rgb, kFormats[d].rgb,
                              streamed(width * src.height * kFormats[d].rgb.bytesPerPixel)};
    const RgbToRgbRow row = select_rgb_to_rgb_row(s, d);
    for (ptrdiff_t y = 0; y < src.height; ++y) {
        row(src.data + y * width * shape.src.bytesPerPixel, dst.data + y * width * shape.dst.bytesPerPixel,
            src.width, shape);
    }
    if (shape.stream) finish_streaming();
}

void convert_rgb_to_yuv(const QKImage& src, QKImage& dst) {
    const int s = rgb_format_index(src.format);
    const YuvLayout out = yuv_layout(dst.format);
    const ChromaStart out_chroma = chroma_start(dst);
    const RgbToYuvShape shape{kFormats[s].rgb, out.lumaStep, out.chromaStep};
    const RgbToLumaRow luma = select_rgb_to_luma_row(s, out.lumaStep);
    const RgbToChromaRow chroma = select_rgb_to_chroma_row(s, out.chromaStep);
    const ptrdiff_t width = src.width;
    for (ptrdiff_t y = 0; y < src.height; ++y) {
        const uint8_t* in = src.data + y * width * shape.src.bytesPerPixel;
        luma(in, dst.data + y * width * out.lumaStep, src.width, shape);
        if (row_carries_chroma(out, y)) {
            const ptrdiff_t offset = chroma_row_offset(out, y, width);
            chroma(in, dst.data + out_chroma.u + offset, dst.data + out_chroma.v + offset, src.width / 2, shape);
        }
    }
}

void convert_yuv_to_rgb(const QKImage& src, QKImage& dst) {
    const YuvLayout in = yuv_layout(src.format);
    const ChromaStart in_chroma = chroma_start(src);
    const int d = rgb_format_index(dst.format);
    const RgbLayout& out = kFormats[d].rgb;
    const ptrdiff_t width = src.width;
    const ptrdiff_t row_bytes = width * out.bytesPerPixel;
    if (in.chromaStep == 0) {
        const GreyToRgbRow row = select_grey_to_rgb_row(d);
        for (ptrdiff_t y = 0; y < src.height; ++y) row(src.data + y * width, dst.data + y * row_bytes, src.width, out);
        return;
    }
    // A 4:2:0 source converts two rows per chroma row.
    const int rows = in.subsampledRows ? 2 : 1;
    const YuvToRgbShape shape{in.lumaStep, in.chromaStep, rows, out, streamed(row_bytes * src.height)};
    const YuvToRgbRow row = select_yuv_to_rgb_row(d, in.lumaStep, in.chromaStep, rows);
    const ptrdiff_t luma_row_bytes = width * in.lumaStep;
    for (ptrdiff_t y = 0; y < src.height; y += rows) {
        const ptrdiff_t offset = chroma_row_offset(in, y, width);
        const uint8_t* luma = src.data + y * luma_row_bytes;
        uint8_t* pixels = dst.data + y * row_bytes;
        row(luma, rows == 2 ? luma + luma_row_bytes : nullptr, src.data + in_chroma.u + offset,
            src.data + in_chroma.v + offset, pixels, rows == 2 ? pixels + row_bytes : nullptr, src.width, shape);
    }
    if (shape.stream) finish_streaming();
}

void convert_yuv_to_yuv(const QKImage& src, QKImage& dst) {
    const YuvLayout in = yuv_layout(src.format);
    const YuvLayout out = yuv_layout(dst.format);
    const ChromaStart in_chroma = chroma_start(src);
    const ChromaStart out_chroma = chroma_start(dst);
    const ptrdiff_t width = src.width;
    // Planar luma and chroma into packed 4:2:2: each row in one pass.
    if (in.lumaStep == 1 && out.chromaStep == 4 && (in.chromaStep == 1 || in.chromaStep == 2)) {
        const PackRow pack = select_pack_row(in.chromaStep);
        for (ptrdiff_t y = 0; y < src.height; ++y) {
            const ptrdiff_t in_offset = chroma_row_offset(in, y, width);
            const ptrdiff_t out_offset = chroma_row_offset(out, y, width);
            pack(src.data + y * width, src.data + in_chroma.u + in_offset, src.data + in_chroma.v + in_offset,
                 in.chromaStep, dst.data + y * width * out.lumaStep, dst.data + out_chroma.u + out_offset,
                 dst.data + out_chroma.v + out_offset, src.width);
        }
        return;
    }
    // Packed 4:2:2 into semi-planar 4:2:0: the rows that carry chroma in one
    // pass over the packed row, the others their luma only.
    if (in.lumaStep == 2 && in.chromaStep == 4 && out.lumaStep == 1 && out.chromaStep == 2) {
        const UnpackRow unpack = select_unpack_row();
        const SampleRow luma = select_sample_row(2, 1);
        for (ptrdiff_t y = 0; y < src.height; ++y) {
            const uint8_t* in_row = src.data + y * width * 2;
            uint8_t* out_luma = dst.data + y * width;
            if (row_carries_chroma(out, y)) {
                const ptrdiff_t in_offset = chroma_row_offset(in, y, width);
                const ptrdiff_t out_offset = chroma_row_offset(out, y, width);
                unpack(in_row, src.data + in_chroma.u + in_offset, src.data + in_chroma.v + in_offset, out_luma,
                       dst.data + out_chroma.u + out_offset, dst.data + out_chroma.v + out_offset, src.width);
            } else {
                luma(in_row, 2, out_luma, 1, src.width);
            }
        }
        return;
    }
    // Planar luma on both sides is one block; otherwise luma moves row by
    // row together with the chroma of the same rows, while they are cached.
    const size_t pixels = static_cast<size_t>(width) * static_cast<size_t>(src.height);
    const bool block_luma = in.lumaStep == 1 && out.lumaStep == 1;
    if (block_luma) platform::copy_pixels(dst.data, src.data, pixels);
    const bool stream = streamed(static_cast<ptrdiff_t>(find_format(dst.format)->size.bytes(pixels)));
    const SampleRow luma = select_sample_row(in.lumaStep, out.lumaStep);
    const ChromaRow chroma = select_chroma_row(in.chromaStep, out.chromaStep);
    for (ptrdiff_t y = 0; y < src.height; ++y) {
        if (!block_luma) {
            luma(src.data + y * width * in.lumaStep, in.lumaStep, dst.data + y * width * out.lumaStep, out.lumaStep,
                 src.width);
        }
        if (!row_carries_chroma(out, y)) continue;
        uint8_t* u = dst.data + out_chroma.u + chroma_row_offset(out, y, width);
        uint8_t* v = dst.data + out_chroma.v + chroma_row_offset(out, y, width);
        if (in.chromaStep == 0) {
            // Chroma made from GREY is 127, not the neutral 128.
            fill_chroma_row(u, v, out.chromaStep, src.width / 2, 127);
        } else {
            const ptrdiff_t offset = chroma_row_offset(in, y, width);
            chroma(src.data + in_chroma.u + offset, src.data + in_chroma.v + offset, in.chromaStep, u, v,
                   out.chromaStep, src.width / 2, stream);
        }
    }
    if (stream) finish_streaming();
}

}  // namespace qk
