// What the tests and the stand-in "libqkcore_csc.so" modules agree on.
#ifndef QKCORE_TESTS_CSC_CONVERTER_STUB_H
#define QKCORE_TESTS_CSC_CONVERTER_STUB_H

#include <dlfcn.h>
#include <stdint.h>

#include "qkcore/qk_image.h"

namespace converter_stub {

// The stand-in's qk_csc_init refuses this pair and accepts every other.
constexpr uint32_t kRefusedSrc = QK_FORMAT_NV21;
constexpr uint32_t kRefusedDst = QK_FORMAT_RGBA;

// qk_csc_convert returns the 32-bit status stored at the start of the source
// buffer, and stores the converter's width, height, source and destination
// codes (four 32-bit values) at the start of the destination buffer.
constexpr int kParamsBytes = 16;

// Counters the stand-in exports: "qk_csc_stub_converts", "qk_csc_stub_releases".
typedef int (*CounterFn)();

// Whether the module is loaded in this process (without loading it).
inline bool module_loaded() {
    void* handle = dlopen("libqkcore_csc.so", RTLD_NOW | RTLD_NOLOAD);
    if (handle != nullptr) dlclose(handle);
    return handle != nullptr;
}

}  // namespace converter_stub

#endif  // QKCORE_TESTS_CSC_CONVERTER_STUB_H
