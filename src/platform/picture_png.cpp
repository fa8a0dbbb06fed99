// PNG pictures through libspng, both ways. libspng rather than libpng: a
// small API that reports errors by return value (no setjmp/longjmp through
// C++ frames) and limits of its own on dimensions, chunk sizes and the memory
// ancillary chunks may hold.
#include <stdio.h>

#include <algorithm>
#include <memory>
#include <vector>

#include <spng.h>
#include <zlib.h>

#include "platform/picture.h"
#include "platform/memory.h"
#include "platform/picture_formats.h"

namespace qk::platform {

namespace {

// Limits on the chunks besides the pixel data (text, profiles and the
// like), which decoding never uses but libspng reads and keeps: one such
// chunk, and the memory all of them hold together, past which the picture
// is refused. Neither applies to the pixel data.
constexpr size_t kMaxChunkBytes = size_t{8} << 20;
constexpr size_t kMaxAncillaryBytes = size_t{32} << 20;

struct ContextFree {
    void operator()(spng_ctx* ctx) const { spng_ctx_free(ctx); }
};
using Context = std::unique_ptr<spng_ctx, ContextFree>;

// Bytes that zlib's fastest level makes of some Up-filtered rows from the
// middle of the picture with this strategy: a trial worth a fraction of a
// percent of the whole encoding.
uint64_t trial_bytes(const Bitmap& bitmap, int strategy) {
    const int32_t rows = std::min<int32_t>(16, bitmap.height());
    const int32_t first = (bitmap.height() - rows) / 2;
    std::vector<uint8_t> filtered;
    filtered.reserve(static_cast<size_t>(rows) * (bitmap.row_bytes() + 1));
    for (int32_t y = first; y < first + rows; ++y) {
        filtered.push_back(2);  // Up
        const uint8_t* row = bitmap.row(y);
        for (size_t i = 0; i < bitmap.row_bytes(); ++i) {
            filtered.push_back(static_cast<uint8_t>(row[i] - (y > 0 ? bitmap.row(y - 1)[i] : 0)));
        }
    }
    z_stream z = {};
    if (deflateInit2(&z, 1, Z_DEFLATED, 15, 8, strategy) != Z_OK) return UINT64_MAX;
    std::vector<uint8_t> out(deflateBound(&z, filtered.size()));
    z.next_in = filtered.data();
    z.avail_in = static_cast<uInt>(filtered.size());
    z.next_out = out.data();
    z.avail_out = static_cast<uInt>(out.size());
    const bool done = deflate(&z, Z_FINISH) == Z_STREAM_END;
    const uint64_t bytes = z.total_out;
    deflateEnd(&z);
    return done ? bytes : UINT64_MAX;
}

bool encode(FILE* file, const Bitmap& bitmap) {
    Context ctx(spng_ctx_new(SPNG_CTX_ENCODER));
    if (!ctx) return false;
    spng_ihdr ihdr = {};
    ihdr.width = static_cast<uint32_t>(bitmap.width());
    ihdr.height = static_cast<uint32_t>(bitmap.height());
    ihdr.bit_depth = 8;
    ihdr.color_type = SPNG_COLOR_TYPE_TRUECOLOR_ALPHA;
    // Fast settings, measured on 4000x3000 pictures: zlib's fastest level with
    // the Up filter alone (trying every filter on every row costs twice the
    // time for a few percent). Which match search wins depends on the
    // picture: on strong sensor noise run-length matching is both faster and
    // smaller (about 1.05x of libpng's default settings, where the full
    // search gives 1.1x); on smooth or noise-free pictures it misses patterns
    // the full search finds (2.1x against 1.2x). A trial on a few rows decides.
    const int strategy =
        trial_bytes(bitmap, Z_RLE) <= trial_bytes(bitmap, Z_DEFAULT_STRATEGY) ? Z_RLE : Z_DEFAULT_STRATEGY;
    if (spng_set_png_file(ctx.get(), file) != 0 || spng_set_ihdr(ctx.get(), &ihdr) != 0 ||
        spng_set_option(ctx.get(), SPNG_IMG_COMPRESSION_LEVEL, 1) != 0 ||
        spng_set_option(ctx.get(), SPNG_IMG_COMPRESSION_STRATEGY, strategy) != 0 ||
        spng_set_option(ctx.get(), SPNG_FILTER_CHOICE, SPNG_FILTER_CHOICE_UP) != 0) {
        return false;
    }
    // Encoded a row at a time into libspng's small buffers, written out as
    // they fill: no second copy of the picture.
    return spng_encode_image(ctx.get(), bitmap.pixels(), bitmap.byte_count(), SPNG_FMT_PNG, SPNG_ENCODE_FINALIZE) == 0;
}

}  // namespace

bool decode_png(const uint8_t* data, size_t size, Bitmap& bitmap) {
    Context ctx(spng_ctx_new(0));
    if (!ctx) return false;
    // libspng refuses a longer side itself; the area is checked below.
    const uint64_t longest_side = std::min<uint64_t>(max_picture_bytes() / kBitmapBytesPerPixel, INT32_MAX);
    spng_ihdr ihdr;
    size_t bytes = 0;
    if (spng_set_image_limits(ctx.get(), static_cast<uint32_t>(longest_side), static_cast<uint32_t>(longest_side)) != 0 ||
        spng_set_chunk_limits(ctx.get(), kMaxChunkBytes, kMaxAncillaryBytes) != 0 ||
        spng_set_crc_action(ctx.get(), SPNG_CRC_ERROR, SPNG_CRC_ERROR) != 0 ||
        spng_set_png_buffer(ctx.get(), data, size) != 0 || spng_get_ihdr(ctx.get(), &ihdr) != 0 ||
        !picture_size_allowed(ihdr.width, ihdr.height) ||
        spng_decoded_image_size(ctx.get(), SPNG_FMT_RGBA8, &bytes) != 0 ||
        !bitmap.allocate(static_cast<int32_t>(ihdr.width), static_cast<int32_t>(ihdr.height), /*cleared=*/false,
                         worth_mapping_in(bytes, size))) {
        return false;
    }
    // 16-bit samples come out as their high bytes; gamma stays as stored. The
    // chunks after the pixels are read too, to the end chunk: a picture cut
    // short of it, or with a damaged checksum anywhere, is refused.
    if (bytes != bitmap.byte_count() ||
        spng_decode_image(ctx.get(), bitmap.pixels(), bytes, SPNG_FMT_RGBA8, SPNG_DECODE_TRNS) != 0 ||
        spng_decode_chunks(ctx.get()) != 0) {
        bitmap.release();
        return false;
    }
    return true;
}

bool write_png_file(const char* path, const Bitmap& bitmap) {
    if (path == nullptr || !bitmap.has_pixels()) return false;
    FILE* file = fopen(path, "wb");
    if (file == nullptr) return false;
    const bool encoded = encode(file, bitmap);
    // The last bytes leave the stdio buffer in fclose: only its success says
    // the whole file reached the system.
    const bool closed = fclose(file) == 0;
    return encoded && closed;
}

}  // namespace qk::platform
