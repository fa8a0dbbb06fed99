// Encoded pictures: recognising the format by its signature and the size
// limit every decoder applies. The decoders and the PNG encoder live in
// picture_<format>.cpp.
#include "platform/picture.h"

#include <string.h>

#include <atomic>

#include "platform/picture_formats.h"

namespace qk::platform {

namespace {

std::atomic<uint64_t> g_max_picture_bytes{INT32_MAX};

bool has_bytes_at(const uint8_t* data, size_t size, size_t offset, const char* bytes) {
    const size_t length = strlen(bytes);
    return size >= offset + length && memcmp(data + offset, bytes, length) == 0;
}

}  // namespace

bool picture_size_allowed(uint64_t width, uint64_t height) {
    // Below 2^31 each, the product of the two and 4 cannot wrap.
    if (width < 1 || height < 1 || width > INT32_MAX || height > INT32_MAX) return false;
    return uint64_t{kBitmapBytesPerPixel} * width * height <= max_picture_bytes();
}

bool decode_picture(const uint8_t* data, size_t size, Bitmap& bitmap) {
    bitmap.release();
    if (data == nullptr) return false;
    bool decoded = false;
    if (has_bytes_at(data, size, 0, "\xFF\xD8\xFF")) {
        decoded = decode_jpeg(data, size, bitmap);
    } else if (has_bytes_at(data, size, 0, "\x89PNG\r\n\x1A\n")) {
        decoded = decode_png(data, size, bitmap);
    } else if (has_bytes_at(data, size, 0, "RIFF") && has_bytes_at(data, size, 8, "WEBP")) {
        decoded = decode_webp(data, size, bitmap);
    } else if (has_bytes_at(data, size, 0, "GIF87a") || has_bytes_at(data, size, 0, "GIF89a")) {
        decoded = decode_gif(data, size, bitmap);
    }
    if (!decoded) bitmap.release();
    return decoded;
}

uint64_t max_picture_bytes() { return g_max_picture_bytes.load(std::memory_order_relaxed); }
void set_max_picture_bytes(uint64_t bytes) { g_max_picture_bytes.store(bytes, std::memory_order_relaxed); }

}  // namespace qk::platform
