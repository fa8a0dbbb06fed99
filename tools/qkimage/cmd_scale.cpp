#include <stdio.h>

#include "args.h"
#include "commands.h"
#include "frame_io.h"
#include "qkcore/qk_image.h"

int cmd_scale(int argc, char** argv) {
    const FrameCommand command{"scale", "--size WxH --format RGBA --to WxH IN OUT", {"--to"}};
    FrameArgs args;
    if (!parse_frame_args(command, argc, argv, &args)) return 2;
    int32_t width = 0, height = 0;
    if (!parse_size(args.options["--to"].c_str(), &width, &height)) {
        return usage_error(command, "bad --to '" + args.options["--to"] + "' (want WIDTHxHEIGHT)");
    }
    QKImage* source = read_frame(command, args.input, args.width, args.height, args.format);
    if (source == nullptr) return 1;
    QKImage* target = QKImage_createEmpty(width, height, args.format);
    const int32_t status = QKImage_scale(source, target);
    int exit_status = 0;
    if (status != QK_OK) {
        exit_status = operation_failed(command, status);
    } else if (!write_frame(command, args.output, *target)) {
        exit_status = 1;
    }
    QKImage_destroy(target);
    QKImage_destroy(source);
    return exit_status;
}
