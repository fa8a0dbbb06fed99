// The platform's colour-conversion fast path: BGRA to NV12 through
// libcsc.so, loaded for each call so that the library works without it.
#include <stdint.h>

#include "image/checks.h"
#include "image/format.h"
#include "platform/module.h"
#include "qkcore/qk_converter.h"
#include "util/status.h"

namespace {

// Both entry points share this signature: luma start, interleaved chroma
// start, source pixels (B, G, R, A bytes), width, height. The result tells
// us nothing we use.
using CscRoutine = int (*)(uint8_t* luma, uint8_t* chroma, const uint8_t* bgra, int32_t width, int32_t height);

constexpr const char* kLibrary = "libcsc.so";
constexpr const char* kRoutines[] = {"csc_ARGB8888_to_YUV420SP_NEON", "csc_ARGB8888_to_YUV420SP"};

// Whether the routine's writes, sized by the source, stay in the destination.
bool destination_fits(const QKImage& src, const QKImage& dst) {
    if (src.width < 1 || src.height < 1 || !qk::on_chroma_grid(dst.format, src.width, src.height)) return false;
    return qk::yuv420_extent(qk::chroma_base(dst), src.width, src.height) <= QKImage_size(&dst);
}

}  // namespace

int32_t csc_run(const QKImage* src, QKImage* dst) {
    if (src == nullptr || dst == nullptr) return QK_FAIL(QK_ERROR_NULL_PARAM);
    // Offered every RGB-to-YUV conversion; the platform routine takes one.
    if (src->format != QK_FORMAT_BGRA || dst->format != QK_FORMAT_NV12) return QK_ERROR_UNSUPPORTED;
    // The conversion entry has checked all of this already; direct callers
    // get the same protection for their buffers.
    if (src->data == nullptr || dst->data == nullptr) return QK_FAIL(QK_ERROR_NULL_PARAM);
    if (!destination_fits(*src, *dst)) return QK_FAIL(QK_ERROR_INVALID_SIZE);

    qk::platform::Module library = qk::platform::Module::open(kLibrary);
    if (!library) return QK_FAIL(QK_ERROR_UNSUPPORTED);
    CscRoutine routine = nullptr;
    for (const char* name : kRoutines) {
        routine = library.function<CscRoutine>(name);
        if (routine != nullptr) break;
    }
    if (routine == nullptr) {
        library.close();
        return QK_FAIL(QK_ERROR_UNSUPPORTED);
    }
    routine(dst->data, dst->data + qk::chroma_base(*dst), src->data, src->width, src->height);
    return QK_OK;
}
