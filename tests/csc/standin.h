// What the csc tests and the stand-ins for the optional modules agree on.
// standin.cpp builds each: libqkcore_csc.so (QK_STANDIN_CONVERTER, with
// qk_csc_release only under QK_STANDIN_RELEASE) and the platform's libcsc.so
// with the entry points QK_STANDIN_PLAIN and QK_STANDIN_NEON ask for, or none.
#ifndef QKCORE_TESTS_CSC_STANDIN_H
#define QKCORE_TESTS_CSC_STANDIN_H

#include <stdint.h>

// Exported as "standin_record": calls since the stand-in was loaded, and the
// entry point and arguments of libcsc.so's latest call.
struct StandinRecord {
    int calls, releases;
    const char* entry;
    uint8_t *luma, *chroma;
    const uint8_t* bgra;
    int32_t width, height;
};
// The converter refuses NV21 to RGBA. Its convert returns the word at the
// start of the source and writes the converter's width, height, source and
// destination codes at the start of the destination. libcsc.so's entry
// points fill luma with 0xA5, chroma with 0x5A.

#endif  // QKCORE_TESTS_CSC_STANDIN_H
