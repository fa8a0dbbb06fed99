// What the JPEG entry points and the file operations share.
#ifndef QKCORE_SRC_CODEC_CODEC_H
#define QKCORE_SRC_CODEC_CODEC_H

#include <stdint.h>

namespace qk {

// The JPEG codec module, loaded by this bare name for each call: beside the
// library, or wherever the dynamic loader's search finds it.
constexpr const char* kJpegModule = "libveljpeginterface.so";

// JPEG and PNG output: quality 1..100 is used as given, anything else as 85.
inline int32_t output_quality(int32_t quality) { return quality >= 1 && quality <= 100 ? quality : 85; }

}  // namespace qk

#endif  // QKCORE_SRC_CODEC_CODEC_H
