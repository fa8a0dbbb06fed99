// Placeholder until the decoders land: recognises nothing, writes nothing.
#include "platform/picture.h"

namespace qk::platform {

namespace {
uint64_t g_max_picture_bytes = INT32_MAX;
}

bool decode_picture(const uint8_t*, size_t, Bitmap& bitmap) {
    bitmap.release();
    return false;
}

bool write_png_file(const char*, const Bitmap&) { return false; }

uint64_t max_picture_bytes() { return g_max_picture_bytes; }
void set_max_picture_bytes(uint64_t bytes) { g_max_picture_bytes = bytes; }

}  // namespace qk::platform
