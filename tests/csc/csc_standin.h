// What the libcsc.so stand-in records about its latest call, exported under
// the name kCscStandinRecord.
#ifndef QKCORE_TESTS_CSC_CSC_STANDIN_H
#define QKCORE_TESTS_CSC_CSC_STANDIN_H

#include <stdint.h>

struct CscStandinCall {
    int calls;          // calls since the stand-in was loaded
    const char* entry;  // name of the entry point called
    uint8_t* luma;
    uint8_t* chroma;
    const uint8_t* bgra;
    int32_t width, height;
};

constexpr const char* kCscStandinRecord = "csc_standin_last_call";
// The stand-in's fill bytes for luma and chroma.
constexpr uint8_t kCscStandinLuma = 0xA5, kCscStandinChroma = 0x5A;

#endif  // QKCORE_TESTS_CSC_CSC_STANDIN_H
