// A stand-in for the platform's libcsc.so, built once per set of entry points
// it offers (QK_STANDIN_NEON, QK_STANDIN_PLAIN, both or neither). Each entry
// point records its call and fills the destination with a pattern no
// conversion produces, so tests can tell that the library's kernel was
// skipped.
#include <stdint.h>
#include <string.h>

#include "csc/csc_standin.h"

extern "C" {

__attribute__((visibility("default"))) CscStandinCall csc_standin_last_call = {};

// Unused in the stand-in that offers no entry point.
[[maybe_unused]] static int record(const char* entry, uint8_t* luma, uint8_t* chroma, const uint8_t* bgra,
                                   int32_t width, int32_t height) {
    csc_standin_last_call = {csc_standin_last_call.calls + 1, entry, luma, chroma, bgra, width, height};
    memset(luma, kCscStandinLuma, static_cast<size_t>(width) * height);
    memset(chroma, kCscStandinChroma, static_cast<size_t>(width) * height / 2);
    return 0;
}

#define QK_STANDIN_ENTRY(name)                                                                                \
    __attribute__((visibility("default"))) int name(uint8_t* luma, uint8_t* chroma, const uint8_t* bgra,   \
                                                    int32_t width, int32_t height) {                        \
        return record(#name, luma, chroma, bgra, width, height);                                             \
    }
#ifdef QK_STANDIN_NEON
QK_STANDIN_ENTRY(csc_ARGB8888_to_YUV420SP_NEON)
#endif
#ifdef QK_STANDIN_PLAIN
QK_STANDIN_ENTRY(csc_ARGB8888_to_YUV420SP)
#endif

}  // extern "C"
