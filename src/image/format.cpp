#include "image/format.h"

namespace qk {

const FormatInfo* find_format(uint32_t code) {
    for (const FormatInfo& format : kFormats) {
        if (format.code == code) return &format;
    }
    return nullptr;
}

int rgb_format_index(uint32_t code) {
    const FormatInfo* format = find_format(code);
    if (format == nullptr || format->family != FormatFamily::kRgb) return -1;
    return static_cast<int>(format - kFormats);
}

}  // namespace qk
