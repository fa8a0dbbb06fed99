// qkimage: inspect and transform raw image frames with the qkcore library.
#include <stdarg.h>
#include <stdio.h>
#include <string.h>

#include "commands.h"
#include "qkcore/qk_log.h"

namespace {

// The library's warnings and errors go to standard error; its progress lines
// are not for the tool's user.
int log_problems(int level, ...) {
    if (level < QK_LOG_WARN || level > QK_LOG_ERROR) return 0;
    va_list args;
    va_start(args, level);
    const char* format = va_arg(args, const char*);
    fputs("qkimage: ", stderr);
    vfprintf(stderr, format, args);
    fputc('\n', stderr);
    va_end(args);
    return 0;
}

struct Command {
    const char* name;
    int (*run)(int argc, char** argv);
    const char* usage;
};

const Command kCommands[] = {
    {"formats", cmd_formats, "formats WIDTHxHEIGHT\n      byte size of every format at that size"},
    {"convert", cmd_convert, "convert --size WxH --from FORMAT --to FORMAT IN OUT\n      convert a raw frame to another pixel format"},
    {"rotate", cmd_rotate, "rotate --size WxH --format FORMAT --angle DEGREES IN OUT\n      turn a raw frame by a multiple of 90 degrees"},
    {"scale", cmd_scale, "scale --size WxH --format RGBA --to WxH IN OUT\n      resample a raw RGBA frame (nearest pixel)"},
    {"crop", cmd_crop, "crop --size WxH --format FORMAT --at X,Y --to WxH IN OUT\n      cut a rectangle out of a raw frame"},
    {"options", cmd_options, "options OPTION_STRING NAME...\n      the named items' values, as the option readers read them"},
};

int usage() {
    fprintf(stderr, "usage: qkimage COMMAND [ARGS...]\ncommands:\n");
    for (const Command& command : kCommands) fprintf(stderr, "  %s\n", command.usage);
    return 2;
}

}  // namespace

int main(int argc, char** argv) {
    if (argc < 2) return usage();
    HX_LogMsg = log_problems;
    for (const Command& command : kCommands) {
        if (strcmp(argv[1], command.name) == 0) return command.run(argc - 2, argv + 2);
    }
    fprintf(stderr, "qkimage: unknown command '%s'\n", argv[1]);
    return usage();
}
