// qkimage: inspect and transform raw image frames with the qkcore library.
#include <stdio.h>
#include <string.h>

#include "commands.h"

namespace {

struct Command {
    const char* name;
    int (*run)(int argc, char** argv);
    const char* usage;
};

const Command kCommands[] = {
    {"formats", cmd_formats, "formats WIDTHxHEIGHT          byte size of every format at that size"},
    {"options", cmd_options, "options OPTION_STRING NAME... the named items' values, as the option readers read them"},
    {"convert", cmd_convert,
     "convert --size WxH --from FORMAT --to FORMAT IN OUT\n"
     "                                convert a raw frame file to another pixel format"},
    {"rotate", cmd_rotate, "rotate --size WxH --format FMT --angle DEGREES IN OUT\n"
                           "                                turn a raw frame by a multiple of 90 degrees"},
    {"scale", cmd_scale, "scale --size WxH --format RGBA --to WxH IN OUT\n"
                         "                                resample a raw RGBA frame (nearest pixel)"},
    {"crop", cmd_crop, "crop --size WxH --format FMT --at X,Y --to WxH IN OUT\n"
                       "                                cut a rectangle out of a raw frame"},
};

int usage() {
    fprintf(stderr, "usage: qkimage COMMAND [ARGS...]\ncommands:\n");
    for (const Command& command : kCommands) fprintf(stderr, "  %s\n", command.usage);
    return 2;
}

}  // namespace

int main(int argc, char** argv) {
    if (argc < 2) return usage();
    for (const Command& command : kCommands) {
        if (strcmp(argv[1], command.name) == 0) return command.run(argc - 2, argv + 2);
    }
    fprintf(stderr, "qkimage: unknown command '%s'\n", argv[1]);
    return usage();
}
