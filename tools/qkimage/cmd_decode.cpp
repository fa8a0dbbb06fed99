#include <stdio.h>

#include <vector>

#include "args.h"
#include "commands.h"
#include "frame_io.h"
#include "qkcore/qk_image.h"

int cmd_decode(int argc, char** argv) {
    const char* kName = "decode";
    Options options;
    const int status = parse_options(kName, argc, argv, {"--format"}, &options);
    if (status >= 0) return status;
    uint32_t format = 0;
    if (!format_option(kName, options, "--format", &format) || !check_frame(kName, 2, 2, format) ||
        !path_count(kName, options, 2)) {
        return 2;
    }
    std::vector<uint8_t> bytes;
    if (!read_input(kName, options.paths[0], &bytes)) return 1;
    ImageHandle image = decode_picture(kName, format, [&](QKImage* target) {
        return QKImage_decodeFromJpeg(target, bytes.data(), bytes.size());
    });
    if (!image) {
        return operation_failed(kName, "could not decode " +
                                           (options.paths[0] == "-" ? "standard input" : "'" + options.paths[0] + "'") +
                                           " as a JPEG, PNG, WebP or GIF picture");
    }
    if (!write_frame(kName, options.paths[1], *image)) return 1;
    // The size goes where it cannot mix with a frame written to standard output.
    fprintf(options.paths[1] == "-" ? stderr : stdout, "%s\n", describe(image->width, image->height, format).c_str());
    return 0;
}
