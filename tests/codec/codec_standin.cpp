// A stand-in "libveljpeginterface.so" (see codec_standin.h).
#include <dlfcn.h>
#include <stdlib.h>
#include <string.h>

#include "codec/codec_standin.h"
#include "qkcore/qk_image.h"
#include "veljpeginterface.h"

static CodecCalls& calls() { return *static_cast<CodecCalls*>(dlsym(RTLD_DEFAULT, "codec_standin_calls")); }

void* fastJpegEncode(const void* pixels, uint32_t size, int32_t width, int32_t height, uint32_t format,
                     uint32_t* length, int32_t quality) {
    CodecCalls& c = calls();
    ++c.encodes;
    c.data = pixels, c.size = size, c.width = width, c.height = height, c.format = format, c.quality = quality;
    if (c.decline) return nullptr;
    *length = 6;
    return calloc(6, 1);
}

void* fastJpegDecode(const void* data, uint32_t size, int32_t* width, int32_t* height, uint32_t format) {
    CodecCalls& c = calls();
    ++c.decodes;
    c.data = data, c.size = size, c.width = *width, c.height = *height, c.format = format;
    if (c.decline) return nullptr;
    *width = 4, *height = 2;
    return memset(malloc(QKImage_requiredSize(4, 2, format)), 0x5a, QKImage_requiredSize(4, 2, format));
}
