// What the codec tests and the stand-in "libveljpeginterface.so" agree on.
// The library loads and unloads the stand-in on every call, so it keeps
// nothing itself: it records its calls in the test executable's
// `codec_standin_calls`, found by name, and answers a stream of 6 zero bytes,
// or a 4x2 picture of the requested format, every byte 0x5a.
#ifndef QKCORE_TESTS_CODEC_CODEC_STANDIN_H
#define QKCORE_TESTS_CODEC_CODEC_STANDIN_H

#include <stdint.h>

struct CodecCalls {
    bool decline = false;
    int encodes = 0, decodes = 0;
    const void* data = nullptr;  // the latest call's arguments
    uint32_t size = 0;
    int32_t width = 0, height = 0;
    uint32_t format = 0;
    int32_t quality = 0;
};

#endif  // QKCORE_TESTS_CODEC_CODEC_STANDIN_H
