#include <stdio.h>

#include "commands.h"
#include "qkcore/qk_options.h"

// Reads each named item the way the library's readers do. A reader answers
// with the caller's default when it reads nothing, so two different defaults
// tell "no value" apart from a value that equals one of them.
int cmd_options(int argc, char** argv) {
    if (argc < 2) {
        fprintf(stderr, "usage: qkimage options OPTION_STRING NAME...\n");
        return 2;
    }
    const char* options = argv[0];
    int missing = 0;
    for (int i = 1; i < argc; ++i) {
        const char* name = argv[i];
        const int32_t integer = QKOption_ParseStringI(options, name, 0);
        const bool has_integer = integer != 0 || QKOption_ParseStringI(options, name, 1) != 1;
        const float real = QKOption_ParseStringF(options, name, 0.0f);
        const bool has_real = real != 0.0f || QKOption_ParseStringF(options, name, 1.0f) != 1.0f;
        if (!has_integer && !has_real) {
            printf("%s: no value\n", name);
            ++missing;
            continue;
        }
        char integer_text[16] = "-";
        char real_text[32] = "-";
        if (has_integer) snprintf(integer_text, sizeof(integer_text), "%d", integer);
        if (has_real) snprintf(real_text, sizeof(real_text), "%g", static_cast<double>(real));
        printf("%s: integer %s, float %s\n", name, integer_text, real_text);
    }
    return missing == 0 ? 0 : 1;
}
