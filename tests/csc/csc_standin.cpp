// A stand-in for the platform's libcsc.so, built once per set of entry points
// it offers (QK_STANDIN_NEON, QK_STANDIN_PLAIN, both or neither). Each entry
// point records its call and fills the destination with a pattern no
// conversion produces, so tests can tell that the library's kernel was
// skipped.
#include <stdint.h>
#include <string.h>

#include "csc/csc_standin.h"

#define QK_STANDIN_EXPORT extern "C" __attribute__((visibility("default")))

extern "C" {
__attribute__((visibility("default"))) CscStandinCall csc_standin_last_call = {};
}

namespace {

// Unused in the stand-in that offers no entry point.
[[maybe_unused]] int record(const char* entry, uint8_t* luma, uint8_t* chroma, const uint8_t* bgra, int32_t width, int32_t height) {
    csc_standin_last_call = {csc_standin_last_call.calls + 1, entry, luma, chroma, bgra, width, height};
    const size_t pixels = static_cast<size_t>(width) * static_cast<size_t>(height);
    memset(luma, kCscStandinLuma, pixels);
    memset(chroma, kCscStandinChroma, pixels / 2);
    return 0;
}

}  // namespace

#ifdef QK_STANDIN_NEON
QK_STANDIN_EXPORT int csc_ARGB8888_to_YUV420SP_NEON(uint8_t* luma, uint8_t* chroma, const uint8_t* bgra,
                                                    int32_t width, int32_t height) {
    return record("csc_ARGB8888_to_YUV420SP_NEON", luma, chroma, bgra, width, height);
}
#endif

#ifdef QK_STANDIN_PLAIN
QK_STANDIN_EXPORT int csc_ARGB8888_to_YUV420SP(uint8_t* luma, uint8_t* chroma, const uint8_t* bgra, int32_t width,
                                               int32_t height) {
    return record("csc_ARGB8888_to_YUV420SP", luma, chroma, bgra, width, height);
}
#endif
