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
    ImageHandle image = read_frame(command, args.input, args.width, args.height, args.format);
    if (!image) return 1;
    return finish(command, QKImage_rotate(image.get(), angle), args.output, image.get());
}
