// What the codec tests and the stand-in "libveljpeginterface.so" agree on.
// The stand-in is loaded and unloaded by the library on every call, so it
// keeps nothing itself: it records its calls in the test executable's
// `codec_standin_calls`, found by name.
#ifndef QKCORE_TESTS_CODEC_CODEC_STANDIN_H
#define QKCORE_TESTS_CODEC_CODEC_STANDIN_H

#include <stdint.h>

struct CodecCalls {
    enum Mode { kDecline, kAnswer } mode = kAnswer;
    int encodes = 0;
    int decodes = 0;
    // The latest call's arguments.
    const void* data = nullptr;
    uint32_t size = 0;
    int32_t width = 0, height = 0;
    uint32_t format = 0;
    int32_t quality = 0;
};

// Answers: a stream of this many bytes from fastJpegEncode; from
// fastJpegDecode, a kDecodedWidth x kDecodedHeight picture of the requested
// format with every byte kDecodedByte.
constexpr uint32_t kStreamBytes = 6;
constexpr int32_t kDecodedWidth = 4, kDecodedHeight = 2;
constexpr uint8_t kDecodedByte = 0x5a;

#endif  // QKCORE_TESTS_CODEC_CODEC_STANDIN_H
