// WebP pictures through libwebp, decoded straight into the bitmap (its RGBA
// output is unpremultiplied already).
#include <webp/decode.h>

#include "platform/memory.h"
#include "platform/picture_formats.h"

namespace qk::platform {

bool decode_webp(const uint8_t* data, size_t size, Bitmap& bitmap) {
    WebPBitstreamFeatures features;
    // Animations are refused here, before any memory is taken: the plain
    // decoder would refuse them anyway, and a camera never makes one.
    if (WebPGetFeatures(data, size, &features) != VP8_STATUS_OK || features.has_animation ||
        !picture_size_allowed(features.width, features.height)) {
        return false;
    }
    if (!bitmap.allocate(features.width, features.height, /*cleared=*/false,
                         worth_mapping_in(uint64_t{kBitmapBytesPerPixel} * features.width * features.height, size))) {
        return false;
    }
    if (WebPDecodeRGBAInto(data, size, bitmap.pixels(), bitmap.byte_count(), static_cast<int>(bitmap.row_bytes())) ==
        nullptr) {
        bitmap.release();
        return false;
    }
    return true;
}

}  // namespace qk::platform
