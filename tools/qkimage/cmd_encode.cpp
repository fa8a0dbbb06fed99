#include "args.h"
#include "commands.h"
#include "frame_io.h"
#include "qkcore/qk_image.h"

int cmd_encode(int argc, char** argv) {
    const char* kName = "encode";
    Options options;
    const int status = parse_options(kName, argc, argv, {"--size", "--format", "--quality"}, &options);
    if (status >= 0) return status;
    int32_t width = 0, height = 0, quality = 0;
    uint32_t format = 0;
    if (!frame_input(kName, options, "--format", &width, &height, &format) ||
        !quality_option(kName, options, 95, &quality)) {
        return 2;
    }
    ImageHandle frame = read_frame(kName, options.paths[0], width, height, format);
    if (!frame) return 1;
    return write_jpeg(kName, options.paths[1], *frame, quality);
}
