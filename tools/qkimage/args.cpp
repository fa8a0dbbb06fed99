#include "args.h"

#include <errno.h>
#include <stdlib.h>
#include <string.h>
#include <strings.h>

#include "image/format.h"
#include "qkcore/qk_image.h"

bool g_verbose = false;

namespace {

const FormatNote kNotes[] = {
    {QK_FORMAT_RGB8, "rgb24", "R G B, 3 bytes a pixel"},
    {QK_FORMAT_BGR8, "bgr24", "B G R, 3 bytes a pixel"},
    {QK_FORMAT_RGBA, "", "R G B A, 4 bytes a pixel"},
    {QK_FORMAT_BGRA, "", "B G R A"},
    {QK_FORMAT_ARGB, "", "A R G B"},
    {QK_FORMAT_ABGR, "", "A B G R"},
    {QK_FORMAT_GREY, "gray,y8", "luma only, a byte a pixel"},
    {QK_FORMAT_YUYV, "yuyv422,YUY2", "4:2:2 packed: Y0 U Y1 V"},
    {QK_FORMAT_YVYU, "yvyu422", "4:2:2 packed: Y0 V Y1 U"},
    {QK_FORMAT_NV12, "", "4:2:0: Y plane, then U V pairs"},
    {QK_FORMAT_NV21, "", "4:2:0: Y plane, then V U pairs (camera frames)"},
    {QK_FORMAT_YV12, "yvu420p", "4:2:0: Y plane, V plane, U plane"},
    {QK_FORMAT_YUVP, "yuv420p,I420", "4:2:0: Y plane, U plane, V plane"},
    {QK_FORMAT_D16, "", "16-bit depth samples (copied only)"},
    {QK_FORMAT_PCL, "", "point cloud: 36-byte header + 16 bytes a point (copied only)"},
    {QK_FORMAT_JPEG, "", "an encoded stream, not a raw frame"},
};

// Whether `text` is one of the comma-separated words of `list`.
bool in_list(const char* text, const char* list) {
    const size_t length = strlen(text);
    for (const char* word = list; *word != '\0';) {
        const char* comma = strchr(word, ',');
        const size_t word_length = comma != nullptr ? size_t(comma - word) : strlen(word);
        if (word_length == length && strncasecmp(text, word, length) == 0) return true;
        word += word_length + (comma != nullptr ? 1 : 0);
    }
    return false;
}

}  // namespace

const FormatNote& format_note(uint32_t code) {
    static const FormatNote kNone = {0, "", ""};
    for (const FormatNote& note : kNotes) {
        if (note.code == code) return note;
    }
    return kNone;
}

bool parse_format(const char* text, uint32_t* code) {
    for (const qk::FormatInfo& format : qk::kFormats) {
        if (strcasecmp(text, format.name) == 0 || in_list(text, format_note(format.code).aliases)) {
            *code = format.code;
            return true;
        }
    }
    return false;
}

std::string format_name(uint32_t code) {
    const qk::FormatInfo* format = qk::find_format(code);
    return format != nullptr ? format->name : "????";
}

bool parse_number(const char* text, const char** end, int64_t min, int64_t max, int32_t* value) {
    const bool sign = *text == '-' || *text == '+';
    if (sign && min >= 0) return false;
    if (text[sign ? 1 : 0] < '0' || text[sign ? 1 : 0] > '9') return false;
    errno = 0;
    char* stop = nullptr;
    const long long parsed = strtoll(text, &stop, 10);
    if (errno != 0 || parsed < min || parsed > max) return false;
    *end = stop;
    *value = static_cast<int32_t>(parsed);
    return true;
}

bool parse_int(const char* text, int32_t* value) {
    const char* end = nullptr;
    return parse_number(text, &end, INT32_MIN, INT32_MAX, value) && *end == '\0';
}

bool parse_size(const char* text, int32_t* width, int32_t* height) {
    const char* end = nullptr;
    if (!parse_number(text, &end, 1, INT32_MAX, width) || (*end != 'x' && *end != 'X')) return false;
    return parse_number(end + 1, &end, 1, INT32_MAX, height) && *end == '\0';
}

bool parse_point(const char* text, int32_t* x, int32_t* y) {
    const char* end = nullptr;
    if (!parse_number(text, &end, INT32_MIN, INT32_MAX, x) || *end != ',') return false;
    return parse_number(end + 1, &end, INT32_MIN, INT32_MAX, y) && *end == '\0';
}
