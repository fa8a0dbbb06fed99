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
    ImageHandle source = read_frame(command, args.input, args.width, args.height, args.format);
    if (!source) return 1;
    ImageHandle target = hold(QKImage_createEmpty(width, height, args.format));
    return finish(command, QKImage_scale(source.get(), target.get()), args.output, target.get());
}
