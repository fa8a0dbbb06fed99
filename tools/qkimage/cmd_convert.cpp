#include "args.h"
#include "commands.h"
#include "frame_io.h"
#include "qkcore/qk_image.h"

int cmd_convert(int argc, char** argv) {
    const FrameCommand command{"convert", "--size WxH --from FORMAT --to FORMAT IN OUT", {"--to"}, "--from"};
    FrameArgs args;
    if (!parse_frame_args(command, argc, argv, &args)) return 2;
    uint32_t to = 0;
    if (!parse_format(args.options["--to"].c_str(), &to)) {
        return usage_error(command, "unknown --to '" + args.options["--to"] + "'");
    }
    ImageHandle source = read_frame(command, args.input, args.width, args.height, args.format);
    if (!source) return 1;
    ImageHandle target = hold(QKImage_createNew(args.width, args.height, to));
    if (!target) return usage_error(command, "a raw " + format_name(to) + " frame has no size to write");
    return finish(command, QKImage_convert(source.get(), target.get()), args.output, target.get());
}
