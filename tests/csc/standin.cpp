// The stand-ins for the optional modules (see standin.h). A context the
// library never releases shows as a leak.
#include "csc/standin.h"

#include <string.h>

#include "qkcore/qk_converter.h"

#define QK_EXPORT extern "C" __attribute__((visibility("default")))
extern "C" {
__attribute__((visibility("default"))) StandinRecord standin_record = {};
}

#ifdef QK_STANDIN_CONVERTER
QK_EXPORT void* qk_csc_init(int32_t width, int32_t height, uint32_t srcFormat, uint32_t dstFormat) {
    if (srcFormat == QK_FORMAT_NV21 && dstFormat == QK_FORMAT_RGBA) return nullptr;
    return new int32_t[4]{width, height, int32_t(srcFormat), int32_t(dstFormat)};
}
QK_EXPORT int32_t qk_csc_convert(void* context, const QKImage* src, QKImage* dst) {
    ++standin_record.calls;
    memcpy(dst->data, context, 16);
    return *reinterpret_cast<const int32_t*>(src->data);
}
#ifdef QK_STANDIN_RELEASE
QK_EXPORT void qk_csc_release(void* context) {
    ++standin_record.releases;
    delete[] static_cast<int32_t*>(context);
}
#endif
#endif

#define QK_CSC_ENTRY(name)                                                                                   \
    QK_EXPORT int name(uint8_t* luma, uint8_t* chroma, const uint8_t* bgra, int32_t width, int32_t height) { \
        standin_record = {standin_record.calls + 1, 0, #name, luma, chroma, bgra, width, height};           \
        memset(luma, 0xA5, size_t(width) * height);                                                         \
        memset(chroma, 0x5A, size_t(width) * height / 2);                                                   \
        return 0;                                                                                            \
    }
#ifdef QK_STANDIN_NEON
QK_CSC_ENTRY(csc_ARGB8888_to_YUV420SP_NEON)
#endif
#ifdef QK_STANDIN_PLAIN
QK_CSC_ENTRY(csc_ARGB8888_to_YUV420SP)
#endif
