#include "args.h"
#include "commands.h"
#include "frame_io.h"
#include "qkcore/qk_image.h"

int cmd_rotate(int argc, char** argv) {
    const char* kName = "rotate";
    Options options;
    const int status = parse_options(kName, argc, argv, {"--size", "--format", "--angle"}, &options);
    if (status >= 0) return status;
    int32_t width = 0, height = 0, angle = 0;
    uint32_t format = 0;
    if (!frame_input(kName, options, "--format", &width, &height, &format)) return 2;
    if (!options.has("--angle")) return usage_error(kName, "missing option '--angle'");
    if (!parse_int(options.get("--angle"), &angle) || angle % 90 != 0) {
        return usage_error(kName, "--angle must be a multiple of 90 degrees, e.g. 90, 180, -90");
    }
    if (format == QK_FORMAT_D16 || format == QK_FORMAT_PCL) {
        return usage_error(kName, "rotate turns RGB and YUV frames, not " + format_name(format));
    }
    const bool quarter = (angle / 90) % 2 != 0;
    if (quarter && !frame_problem(height, width, format).empty()) {
        return usage_error(kName, "a quarter turn of a " + describe(width, height, format) + " frame gives " +
                                      std::to_string(height) + "x" + std::to_string(width) + ", but " +
                                      frame_problem(height, width, format));
    }
    // The library turns about an integer pivot.
    if (angle % 360 != 0 && (width % 2 != 0 || height % 2 != 0)) {
        warning(kName, "the frame has an odd width or height, so the turned picture moves by one pixel and the "
                       "uncovered row or column becomes transparent black");
    }
    ImageHandle image = read_frame(kName, options.paths[0], width, height, format);
    if (!image) return 1;
    if (QKImage_rotate(image.get(), angle) != QK_OK) {
        return operation_failed(kName, "could not turn the " + describe(width, height, format) + " frame");
    }
    return write_frame(kName, options.paths[1], *image) ? 0 : 1;
}
