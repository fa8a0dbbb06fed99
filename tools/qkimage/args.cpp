#include "args.h"

#include <errno.h>
#include <stdlib.h>
#include <strings.h>

#include "qkcore/qk_image.h"

const FormatName kFormats[] = {
    {"RGBA", QK_FORMAT_RGBA}, {"BGRA", QK_FORMAT_BGRA}, {"ARGB", QK_FORMAT_ARGB}, {"ABGR", QK_FORMAT_ABGR},
    {"RGB8", QK_FORMAT_RGB8}, {"BGR8", QK_FORMAT_BGR8}, {"GREY", QK_FORMAT_GREY}, {"YUYV", QK_FORMAT_YUYV},
    {"YVYU", QK_FORMAT_YVYU}, {"NV12", QK_FORMAT_NV12}, {"NV21", QK_FORMAT_NV21}, {"YV12", QK_FORMAT_YV12},
    {"YUVP", QK_FORMAT_YUVP}, {"D16", QK_FORMAT_D16},   {"PCL", QK_FORMAT_PCL},   {"JPEG", QK_FORMAT_JPEG},
};
const int kFormatCount = sizeof(kFormats) / sizeof(kFormats[0]);

bool parse_format(const char* text, uint32_t* code) {
    for (const FormatName& format : kFormats) {
        if (strcasecmp(text, format.name) == 0) {
            *code = format.code;
            return true;
        }
    }
    return false;
}

std::string format_name(uint32_t code) {
    for (const FormatName& format : kFormats) {
        if (format.code == code) return format.name;
    }
    return "????";
}

namespace {

bool parse_dimension(const char* text, char** end, int32_t* value) {
    if (*text < '0' || *text > '9') return false;
    errno = 0;
    long parsed = strtol(text, end, 10);
    if (errno != 0 || parsed < 1 || parsed > INT32_MAX) return false;
    *value = static_cast<int32_t>(parsed);
    return true;
}

}  // namespace

bool parse_size(const char* text, int32_t* width, int32_t* height) {
    char* end = nullptr;
    if (!parse_dimension(text, &end, width) || (*end != 'x' && *end != 'X')) return false;
    return parse_dimension(end + 1, &end, height) && *end == '\0';
}
