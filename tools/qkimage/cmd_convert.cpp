#include "args.h"
#include "commands.h"
#include "frame_io.h"
#include "qkcore/qk_image.h"

namespace {

bool copy_only(uint32_t format) { return format == QK_FORMAT_D16 || format == QK_FORMAT_PCL; }

}  // namespace

int cmd_convert(int argc, char** argv) {
    const char* kName = "convert";
    Options options;
    const int status = parse_options(kName, argc, argv, {"--size", "--from", "--to"}, &options);
    if (status >= 0) return status;
    int32_t width = 0, height = 0;
    uint32_t from = 0, to = 0;
    if (!frame_input(kName, options, "--from", &width, &height, &from) || !format_option(kName, options, "--to", &to)) {
        return 2;
    }
    const std::string problem = frame_problem(width, height, to);
    if (!problem.empty()) return usage_error(kName, "cannot convert to " + format_name(to) + ": " + problem);
    if ((copy_only(from) || copy_only(to)) && from != to) {
        const uint32_t only = copy_only(from) ? from : to;
        return usage_error(kName, format_name(only) + " frames convert only to " + format_name(only));
    }
    ImageHandle source = read_frame(kName, options.paths[0], width, height, from);
    if (!source) return 1;
    ImageHandle target = hold(QKImage_createNew(width, height, to));
    if (!target) return failure(kName, "no memory for a " + describe(width, height, to) + " frame");
    if (QKImage_convert(source.get(), target.get()) != QK_OK) {
        return operation_failed(kName, "could not convert the " + describe(width, height, from) + " frame to " +
                                           format_name(to));
    }
    return write_frame(kName, options.paths[1], *target) ? 0 : 1;
}
