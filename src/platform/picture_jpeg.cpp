// JPEG pictures through libjpeg-turbo's libjpeg API, decoded to RGBA rows of
// the bitmap. libjpeg reports errors by calling error_exit, which must not
// return: ours longjmps back to the decoding function, which then frees
// everything libjpeg holds. libjpeg's own handlers print to stderr (and
// exit), so every message goes to handlers of ours that print nothing.
#include <limits.h>
#include <setjmp.h>
#include <stdio.h>
#include <string.h>

#include <algorithm>

#include <jerror.h>
#include <jpeglib.h>

#include "platform/picture.h"
#include "platform/memory.h"
#include "platform/picture_formats.h"

namespace qk::platform {

namespace {

// Real encoders write a handful of scans; a progressive picture of thousands
// of empty ones would take minutes to go through.
constexpr int kMaxScans = 1000;

// Everything the decoding function changes lives here, outside its own stack
// frame: after a longjmp, locals of the function that called setjmp and were
// changed since hold indeterminate values.
struct JpegDecode {
    jpeg_decompress_struct cinfo;
    jpeg_error_mgr errors;
    jpeg_progress_mgr progress;
    jmp_buf jump;
};

JpegDecode& decode_of(j_common_ptr cinfo) { return *static_cast<JpegDecode*>(cinfo->client_data); }

[[noreturn]] void jump_out(j_common_ptr cinfo) { longjmp(decode_of(cinfo).jump, 1); }

void print_nothing(j_common_ptr) {}

// Level -1 is a warning: libjpeg has met corrupt or missing data and carries
// on, padding the picture with grey. A damaged frame is not a picture, so
// warnings end decoding, except the two about markers that leave the pixels
// alone. Higher levels are trace messages.
void on_message(j_common_ptr cinfo, int level) {
    const int code = cinfo->err->msg_code;
    if (level < 0 && code != JWRN_JFIF_MAJOR && code != JWRN_ADOBE_XFORM) jump_out(cinfo);
}

void count_scans(j_common_ptr cinfo) {
    if (reinterpret_cast<j_decompress_ptr>(cinfo)->input_scan_number > kMaxScans) jump_out(cinfo);
}

// The calls that can fail; any failure lands back at setjmp.
bool run(JpegDecode& d, const uint8_t* data, size_t size, Bitmap& bitmap) {
    j_decompress_ptr cinfo = &d.cinfo;
    if (setjmp(d.jump) != 0) {
        jpeg_destroy_decompress(cinfo);
        bitmap.release();
        return false;
    }
    jpeg_create_decompress(cinfo);
    cinfo->progress = &d.progress;
    // A progressive picture keeps all its coefficients until the last scan,
    // 2 bytes a sample: up to twice its RGBA size and some. libjpeg has no
    // backing store and fails past this budget.
    const uint64_t budget = 2 * max_picture_bytes() + (uint64_t{16} << 20);
    cinfo->mem->max_memory_to_use = static_cast<long>(budget < uint64_t{LONG_MAX} ? budget : uint64_t{LONG_MAX});
    jpeg_mem_src(cinfo, data, static_cast<unsigned long>(size));
    jpeg_read_header(cinfo, TRUE);
    // CMYK has no conversion to RGB without the printer's profile: refused.
    if (cinfo->jpeg_color_space == JCS_CMYK || cinfo->jpeg_color_space == JCS_YCCK ||
        !picture_size_allowed(cinfo->image_width, cinfo->image_height)) {
        jump_out(reinterpret_cast<j_common_ptr>(cinfo));
    }
    cinfo->out_color_space = JCS_EXT_RGBA;
    jpeg_start_decompress(cinfo);
    if (!bitmap.allocate(cinfo->output_width, cinfo->output_height, /*cleared=*/false,
                         worth_mapping_in(uint64_t{kBitmapBytesPerPixel} * cinfo->output_width * cinfo->output_height, size))) {
        jump_out(reinterpret_cast<j_common_ptr>(cinfo));
    }
    while (cinfo->output_scanline < cinfo->output_height) {
        JSAMPROW rows[4];
        const JDIMENSION count = std::min<JDIMENSION>(4, cinfo->output_height - cinfo->output_scanline);
        for (JDIMENSION i = 0; i < count; ++i) rows[i] = bitmap.row(static_cast<int32_t>(cinfo->output_scanline + i));
        jpeg_read_scanlines(cinfo, rows, count);
    }
    // Reads on to the end marker: a picture cut short of it is refused too.
    jpeg_finish_decompress(cinfo);
    jpeg_destroy_decompress(cinfo);
    return true;
}

}  // namespace

bool decode_jpeg(const uint8_t* data, size_t size, Bitmap& bitmap) {
    JpegDecode d;
    memset(&d, 0, sizeof(d));
    d.cinfo.err = jpeg_std_error(&d.errors);
    d.errors.error_exit = jump_out;
    d.errors.output_message = print_nothing;
    d.errors.emit_message = on_message;
    d.progress.progress_monitor = count_scans;
    d.cinfo.client_data = &d;  // kept by jpeg_create_decompress, as err is
    return run(d, data, size, bitmap);
}

}  // namespace qk::platform
