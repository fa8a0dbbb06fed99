#include <stdio.h>

#include "args.h"
#include "commands.h"
#include "image/format.h"
#include "qkcore/qk_image.h"

int cmd_formats(int argc, char** argv) {
    Options options;
    const int status = parse_options("formats", argc, argv, {}, &options);
    if (status >= 0) return status;
    int32_t width = 0;
    int32_t height = 0;
    if (!path_count("formats", options, 1)) return 2;
    if (!parse_size(options.paths[0].c_str(), &width, &height)) {
        return usage_error("formats", "bad size '" + options.paths[0] +
                                          "': want WIDTHxHEIGHT, both whole numbers from 1 up, e.g. 4000x3000");
    }
    // A raw format without a size at these dimensions is past the 2 GiB
    // limit of byte counts; when every one is, there is no table to show.
    bool any = false;
    for (const qk::FormatInfo& format : qk::kFormats) {
        any = any || QKImage_requiredSize(width, height, format.code) != 0;
    }
    if (!any) {
        return usage_error("formats", options.paths[0] + " is larger than 2 GiB for every format");
    }
    printf("%-6s %-10s %12s\n", "format", "code", "bytes");
    for (const qk::FormatInfo& format : qk::kFormats) {
        const uint64_t bytes = QKImage_requiredSize(width, height, format.code);
        const bool raw = QKImage_requiredSize(1, 1, format.code) != 0;
        printf("%-6s 0x%08x %12llu%s\n", format.name, format.code, static_cast<unsigned long long>(bytes),
               bytes != 0 ? "" : raw ? "  (too large: over 2 GiB)" : "  (encoded: no size rule)");
    }
    return 0;
}
