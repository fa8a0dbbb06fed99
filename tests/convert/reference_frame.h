// A plain, pixel-by-pixel reference conversion of whole images, with every
// format's byte positions spelled out here rather than taken from the
// library's layout tables.
#ifndef QKCORE_TESTS_CONVERT_REFERENCE_FRAME_H
#define QKCORE_TESTS_CONVERT_REFERENCE_FRAME_H

#include <stdint.h>

#include <vector>

#include "qkcore/qk_image.h"

namespace qktest {

// The formats that convert to each other.
extern const uint32_t kConvertibleFormats[13];

// The bytes `dst` must hold after converting `src` into it: `dst`'s current
// buffer (its first `capacity` bytes) with every byte the conversion defines
// overwritten. `dst` keeps its own format and chroma offset; the source's
// dimensions apply.
std::vector<uint8_t> reference_conversion(const QKImage& src, const QKImage& dst, uint64_t capacity);

}  // namespace qktest

#endif  // QKCORE_TESTS_CONVERT_REFERENCE_FRAME_H
