#include <stdio.h>

#include "args.h"
#include "commands.h"
#include "qkcore/qk_image.h"

int cmd_formats(int argc, char** argv) {
    int32_t width = 0;
    int32_t height = 0;
    if (argc != 1 || !parse_size(argv[0], &width, &height)) {
        fprintf(stderr, "usage: qkimage formats WIDTHxHEIGHT\n");
        return 2;
    }
    printf("%-6s %-10s %12s\n", "format", "code", "bytes");
    for (int i = 0; i < kFormatCount; ++i) {
        uint64_t bytes = QKImage_requiredSize(width, height, kFormats[i].code);
        printf("%-6s 0x%08x %12llu%s\n", kFormats[i].name, kFormats[i].code,
               static_cast<unsigned long long>(bytes), bytes == 0 ? "  (no size rule)" : "");
    }
    return 0;
}
