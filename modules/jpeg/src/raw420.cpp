#include "raw420.h"

#include <setjmp.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>

#include <algorithm>

#include <jerror.h>
#include <jpeglib.h>

namespace qk::jpeg {
namespace {

// Rows of one iMCU row at 4:2:0: 16 of luma, 8 of each chroma.
constexpr int kLumaRows = 16;
constexpr int kChromaRows = 8;

// The stream grows in a malloc'ed block of our own, so that on failure we
// know exactly what to free, and on success the block is the stream.
struct GrowingDestination {
    jpeg_destination_mgr mgr;
    uint8_t* block;
    size_t capacity;
};

// Everything the compressing function changes lives here, outside its own
// stack frame: after a longjmp, locals of the function that called setjmp
// and were changed since hold indeterminate values.
struct RawEncode {
    jpeg_compress_struct cinfo;
    jpeg_error_mgr errors;
    GrowingDestination destination;
    JSAMPROW luma[kLumaRows];
    JSAMPROW u[kChromaRows];
    JSAMPROW v[kChromaRows];
    jmp_buf jump;
};

RawEncode& encode_of(j_common_ptr cinfo) { return *static_cast<RawEncode*>(cinfo->client_data); }

[[noreturn]] void jump_out(j_common_ptr cinfo) { longjmp(encode_of(cinfo).jump, 1); }
void print_nothing(j_common_ptr) {}
void ignore_message(j_common_ptr, int) {}

void start_destination(j_compress_ptr) {}

boolean grow_destination(j_compress_ptr cinfo) {
    GrowingDestination& d = encode_of(reinterpret_cast<j_common_ptr>(cinfo)).destination;
    // libjpeg calls this only when the block is full.
    const size_t capacity = d.capacity * 2;
    auto* grown = static_cast<uint8_t*>(realloc(d.block, capacity));
    if (grown == nullptr) ERREXIT(cinfo, JERR_OUT_OF_MEMORY);
    d.block = grown;
    d.mgr.next_output_byte = grown + d.capacity;
    d.mgr.free_in_buffer = capacity - d.capacity;
    d.capacity = capacity;
    return TRUE;
}

void end_destination(j_compress_ptr) {}

// The calls that can fail; any failure lands back at setjmp.
bool run(RawEncode& e, const uint8_t* pixels, int32_t width, int32_t height, const Chroma420& chroma,
         uint8_t* scratch, int quality) {
    j_compress_ptr cinfo = &e.cinfo;
    if (setjmp(e.jump) != 0) {
        jpeg_destroy_compress(cinfo);
        return false;
    }
    jpeg_create_compress(cinfo);
    cinfo->dest = &e.destination.mgr;
    cinfo->image_width = static_cast<JDIMENSION>(width);
    cinfo->image_height = static_cast<JDIMENSION>(height);
    // TurboJPEG's own settings for compressing from 4:2:0 planes, so that
    // the stream is the one it would write.
    cinfo->in_color_space = JCS_YCbCr;
    cinfo->input_components = 3;
    jpeg_set_defaults(cinfo);
    jpeg_set_quality(cinfo, quality, TRUE);
    cinfo->dct_method = quality >= 96 ? JDCT_ISLOW : JDCT_FASTEST;
    jpeg_set_colorspace(cinfo, JCS_YCbCr);
    cinfo->comp_info[0].h_samp_factor = 2;
    cinfo->comp_info[0].v_samp_factor = 2;
    for (int c = 1; c < 3; ++c) cinfo->comp_info[c].h_samp_factor = cinfo->comp_info[c].v_samp_factor = 1;
    cinfo->raw_data_in = TRUE;
    jpeg_start_compress(cinfo, TRUE);

    const size_t w = static_cast<size_t>(width), h = static_cast<size_t>(height);
    const size_t samples = chroma.samples;
    JSAMPARRAY planes[3] = {e.luma, e.u, e.v};
    Chroma420 rows = chroma;
    for (size_t top = 0; top < h; top += kLumaRows) {
        // Rows past the picture repeat its last one, as TurboJPEG pads its
        // planes.
        for (size_t r = 0; r < kLumaRows; ++r) {
            e.luma[r] = const_cast<JSAMPROW>(pixels + std::min(top + r, h - 1) * w);
        }
        const size_t first = top / 2;
        rows.u = chroma.u + first * chroma.rowBytes;
        rows.v = chroma.v + first * chroma.rowBytes;
        rows.rows = std::min<size_t>(kChromaRows, chroma.rows - first);
        gather420(pixels, rows, scratch, scratch + kChromaRows * samples, samples, kChromaRows);
        for (size_t r = 0; r < kChromaRows; ++r) {
            e.u[r] = scratch + r * samples;
            e.v[r] = scratch + (kChromaRows + r) * samples;
        }
        jpeg_write_raw_data(cinfo, planes, kLumaRows);
    }
    jpeg_finish_compress(cinfo);
    jpeg_destroy_compress(cinfo);
    return true;
}

}  // namespace

void* compress_raw420(const uint8_t* pixels, int32_t width, int32_t height, const Chroma420& chroma, int quality,
                      uint32_t* length) {
    // Both chroma planes of one iMCU row: 15 KB at 1920 wide.
    auto* scratch = static_cast<uint8_t*>(malloc(2 * kChromaRows * chroma.samples));
    if (scratch == nullptr) return nullptr;
    RawEncode e;
    memset(&e, 0, sizeof(e));
    e.cinfo.err = jpeg_std_error(&e.errors);
    e.errors.error_exit = jump_out;
    e.errors.output_message = print_nothing;
    e.errors.emit_message = ignore_message;
    e.cinfo.client_data = &e;  // kept by jpeg_create_compress, as err is
    // A quarter of a byte a pixel holds most camera frames at usual
    // qualities; the block doubles when it does not.
    GrowingDestination& d = e.destination;
    d.capacity = static_cast<size_t>(width) * static_cast<size_t>(height) / 4 + 4096;
    d.block = static_cast<uint8_t*>(malloc(d.capacity));
    d.mgr.next_output_byte = d.block;
    d.mgr.free_in_buffer = d.capacity;
    d.mgr.init_destination = start_destination;
    d.mgr.empty_output_buffer = grow_destination;
    d.mgr.term_destination = end_destination;
    const bool done = d.block != nullptr && run(e, pixels, width, height, chroma, scratch, quality);
    free(scratch);
    const size_t written = d.capacity - d.mgr.free_in_buffer;
    if (!done || written == 0 || written > UINT32_MAX) {
        free(d.block);
        return nullptr;
    }
    void* trimmed = realloc(d.block, written);
    *length = static_cast<uint32_t>(written);
    return trimmed != nullptr ? trimmed : d.block;
}

}  // namespace qk::jpeg
