#include <stdio.h>

#include "commands.h"
#include "frame_io.h"
#include "qkcore/qk_image.h"

int cmd_rotate(int argc, char** argv) {
    const FrameCommand command{"rotate", "--size WxH --format FMT --angle DEGREES IN OUT", {"--angle"}};
    FrameArgs args;
    if (!parse_frame_args(command, argc, argv, &args)) return 2;
    int32_t angle = 0;
    if (!parse_int(args.options["--angle"].c_str(), &angle) || angle % 90 != 0) {
        return usage_error(command, "--angle must be a multiple of 90 degrees");
    }
    QKImage* image = read_frame(command, args.input, args.width, args.height, args.format);
    if (image == nullptr) return 1;
    const int32_t status = QKImage_rotate(image, angle);
    int exit_status = 0;
    if (status != QK_OK) {
        exit_status = operation_failed(command, status);
    } else if (!write_frame(command, args.output, *image)) {
        exit_status = 1;
    }
    QKImage_destroy(image);
    return exit_status;
}
