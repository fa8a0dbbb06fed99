#include <stdio.h>

#include "commands.h"
#include "qkcore/qk_options.h"

// Reads each named item the way the library's readers do. A reader answers
// with the caller's default when it reads nothing, so two different defaults
// tell "no value" apart from a value that equals one of them.
int cmd_options(int argc, char** argv) {
    Options args;
    const int status = parse_options("options", argc, argv, {}, &args);
    if (status >= 0) return status;
    if (args.paths.size() < 2) return usage_error("options", "want an option string and at least one name");
    const char* options = args.paths[0].c_str();
    int missing = 0;
    for (size_t i = 1; i < args.paths.size(); ++i) {
        const char* name = args.paths[i].c_str();
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
