#include "args.h"
#include "commands.h"
#include "frame_io.h"
#include "qkcore/qk_image.h"

int cmd_crop(int argc, char** argv) {
    const FrameCommand command{"crop", "--size WxH --format FMT --at X,Y --to WxH IN OUT", {"--at", "--to"}};
    FrameArgs args;
    if (!parse_frame_args(command, argc, argv, &args)) return 2;
    int32_t x = 0, y = 0, width = 0, height = 0;
    if (!parse_point(args.options["--at"].c_str(), &x, &y)) {
        return usage_error(command, "bad --at '" + args.options["--at"] + "' (want X,Y)");
    }
    if (!parse_size(args.options["--to"].c_str(), &width, &height)) {
        return usage_error(command, "bad --to '" + args.options["--to"] + "' (want WIDTHxHEIGHT)");
    }
    ImageHandle source = read_frame(command, args.input, args.width, args.height, args.format);
    if (!source) return 1;
    ImageHandle target = hold(QKImage_createEmpty(width, height, args.format));
    return finish(command, QKImage_crop(source.get(), target.get(), x, y), args.output, target.get());
}
