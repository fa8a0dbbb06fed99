#include "args.h"
#include "commands.h"
#include "frame_io.h"
#include "qkcore/qk_image.h"

int cmd_scale(int argc, char** argv) {
    const char* kName = "scale";
    Options options;
    const int status = parse_options(kName, argc, argv, {"--size", "--format", "--to"}, &options);
    if (status >= 0) return status;
    int32_t width = 0, height = 0, to_width = 0, to_height = 0;
    uint32_t format = 0;
    if (!frame_input(kName, options, "--format", &width, &height, &format) ||
        !size_option(kName, options, "--to", &to_width, &to_height) ||
        !check_frame(kName, to_width, to_height, format)) {
        return 2;
    }
    if (format != QK_FORMAT_RGBA) {
        return usage_error(kName, "scale works on RGBA frames only, not " + format_name(format) + " (convert first)");
    }
    ImageHandle source = read_frame(kName, options.paths[0], width, height, format);
    if (!source) return 1;
    ImageHandle target = hold(QKImage_createEmpty(to_width, to_height, format));
    if (!target || QKImage_scale(source.get(), target.get()) != QK_OK) {
        return operation_failed(kName, "could not scale the frame to " + describe(to_width, to_height, format));
    }
    return write_frame(kName, options.paths[1], *target) ? 0 : 1;
}
