#include "args.h"
#include "commands.h"
#include "frame_io.h"
#include "qkcore/qk_image.h"

int cmd_crop(int argc, char** argv) {
    const char* kName = "crop";
    Options options;
    const int status = parse_options(kName, argc, argv, {"--size", "--format", "--at", "--to"}, &options);
    if (status >= 0) return status;
    int32_t width = 0, height = 0, x = 0, y = 0, to_width = 0, to_height = 0;
    uint32_t format = 0;
    if (!frame_input(kName, options, "--format", &width, &height, &format) ||
        !size_option(kName, options, "--to", &to_width, &to_height)) {
        return 2;
    }
    if (!options.has("--at")) return usage_error(kName, "missing option '--at'");
    if (!parse_point(options.get("--at"), &x, &y)) {
        return usage_error(kName, std::string("bad --at '") + options.get("--at") + "': want X,Y, e.g. 100,50");
    }
    const std::string rectangle = std::to_string(to_width) + "x" + std::to_string(to_height) + " at " +
                                  std::to_string(x) + "," + std::to_string(y);
    if (x < 0 || y < 0 || int64_t{x} + to_width > width || int64_t{y} + to_height > height) {
        return usage_error(kName, "crop rectangle " + rectangle + " does not fit " + std::to_string(width) + "x" +
                                      std::to_string(height));
    }
    const bool yuv420 = needs_even_height(format);
    if (!is_rgb(format) && !yuv420) {
        return usage_error(kName, "crop cuts RGB and 4:2:0 frames, not " + format_name(format));
    }
    if (yuv420 && (x % 2 != 0 || y % 2 != 0 || to_width % 2 != 0 || to_height % 2 != 0)) {
        return usage_error(kName, format_name(format) + " needs even coordinates and sizes, not " + rectangle);
    }
    ImageHandle source = read_frame(kName, options.paths[0], width, height, format);
    if (!source) return 1;
    ImageHandle target = hold(QKImage_createEmpty(to_width, to_height, format));
    if (!target || QKImage_crop(source.get(), target.get(), x, y) != QK_OK) {
        return operation_failed(kName, "could not cut " + rectangle + " out of the " +
                                           describe(width, height, format) + " frame");
    }
    return write_frame(kName, options.paths[1], *target) ? 0 : 1;
}
