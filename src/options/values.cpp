// Value checks against option records, and readers of option strings.
#include <limits.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>

#include "qkcore/qk_options.h"

namespace {

// Where the value of the item `name` begins in a "name=value,name=value"
// string, or null when there is no such item. The first item whose name
// matches counts, wherever "name=" occurs inside other items: "iso" is found
// in "xiso=5,iso=100" at the second item. A name that could not be an item's
// name finds nothing.
const char* find_item_value(const char* options, const char* name) {
    if (options == nullptr || name == nullptr || name[0] == '\0' || strpbrk(name, "=,") != nullptr) return nullptr;
    const size_t length = strlen(name);
    for (const char* item = options;; ++item) {
        if (strncmp(item, name, length) == 0 && item[length] == '=') return item + length + 1;
        while (*item != ',' && *item != '\0') ++item;
        if (*item == '\0') return nullptr;
    }
}

// "%d" semantics (leading white space, a sign, decimal digits; reading stops
// at the first other character, the item's closing comma included), except
// that a value outside the 32-bit range is unreadable rather than wrapped.
bool read_int(const char* text, int32_t* value) {
    char* end = nullptr;
    const long long read = strtoll(text, &end, 10);
    if (end == text || read < INT32_MIN || read > INT32_MAX) return false;
    *value = static_cast<int32_t>(read);
    return true;
}

// "%f" itself: strtof reads a longest valid prefix ("0" of "0x", "inf" of
// "infin") where "%f" fails on the whole item it consumed.
bool read_float(const char* text, float* value) { return sscanf(text, "%f", value) == 1; }

bool in_range(int32_t value, int32_t min, int32_t max) {
    return (min == 0 && max == 0) || (min <= value && value <= max);
}

bool in_range(float value, float min, float max) {
    // -0.0 counts as 0; NaN fails every range.
    return (min == 0.0f && max == 0.0f) || (min <= value && value <= max);
}

}  // namespace

int32_t QKOption_CheckValueI(const QKOption_t* option, int32_t value) {
    if (option == nullptr || option->type != QK_OPTION_INTEGER) return 0;
    return in_range(value, option->min.i, option->max.i) ? 1 : 0;
}

int32_t QKOption_CheckValueF(const QKOption_t* option, float value) {
    if (option == nullptr || option->type != QK_OPTION_FLOAT) return 0;
    return in_range(value, option->min.f, option->max.f) ? 1 : 0;
}

int32_t QKOption_CheckValueS(const QKOption_t* option, const char* value) {
    if (option == nullptr) return 0;
    if (option->type == QK_OPTION_STRING) return 1;  // any string, not even looked at
    if (option->type != QK_OPTION_ENUM || option->enumValues == nullptr || value == nullptr) return 0;
    for (const QKOptionEnum_t* entry = option->enumValues; entry->value != QK_OPTION_ENUM_END; ++entry) {
        if (entry->name != nullptr && strcmp(entry->name, value) == 0) return 1;
    }
    return 0;
}

int32_t QKOption_ParseStringI(const char* options, const char* name, int32_t default_value) {
    const char* text = find_item_value(options, name);
    int32_t value = default_value;
    return text != nullptr && read_int(text, &value) ? value : default_value;
}

float QKOption_ParseStringF(const char* options, const char* name, float default_value) {
    const char* text = find_item_value(options, name);
    float value = default_value;
    return text != nullptr && read_float(text, &value) ? value : default_value;
}
