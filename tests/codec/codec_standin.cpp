// A stand-in "libveljpeginterface.so": records each call and answers as the
// test asks.
#include <dlfcn.h>
#include <stdlib.h>
#include <string.h>

#include <type_traits>

#include "codec/codec_standin.h"
#include "qkcore/qk_image.h"
#include "veljpeginterface.h"

namespace {

CodecCalls& calls() { return *static_cast<CodecCalls*>(dlsym(RTLD_DEFAULT, "codec_standin_calls")); }

}  // namespace

extern "C" {

void* fastJpegEncode(const void* pixels, uint32_t size, int32_t width, int32_t height, uint32_t format,
                     uint32_t* length, int32_t quality) {
    CodecCalls& c = calls();
    ++c.encodes;
    c.data = pixels, c.size = size, c.width = width, c.height = height, c.format = format, c.quality = quality;
    if (c.mode == CodecCalls::kDecline) return nullptr;
    *length = kStreamBytes;
    return calloc(kStreamBytes, 1);
}

void* fastJpegDecode(const void* data, uint32_t size, int32_t* width, int32_t* height, uint32_t format) {
    CodecCalls& c = calls();
    ++c.decodes;
    c.data = data, c.size = size, c.width = *width, c.height = *height, c.format = format;
    if (c.mode == CodecCalls::kDecline) return nullptr;
    const uint64_t bytes = QKImage_requiredSize(kDecodedWidth, kDecodedHeight, format);
    void* pixels = malloc(bytes);
    memset(pixels, kDecodedByte, bytes);
    *width = kDecodedWidth;
    *height = kDecodedHeight;
    return pixels;
}

}  // extern "C"

static_assert(std::is_same_v<decltype(&fastJpegEncode), FastJpegEncodeFn>);
static_assert(std::is_same_v<decltype(&fastJpegDecode), FastJpegDecodeFn>);
