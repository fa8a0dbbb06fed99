#include <string.h>
#include <strings.h>

#include <string>

#include "args.h"
#include "commands.h"
#include "frame_io.h"
#include "qkcore/qk_image.h"

namespace {

enum class Kind { kJpeg, kPng, kRaw };

// The library's rule: the first of ".jpeg", ".jpg", ".png" found anywhere in
// the path (letter case ignored, directories included) picks the kind.
Kind file_kind(const std::string& path) {
    if (strcasestr(path.c_str(), ".jpeg") != nullptr || strcasestr(path.c_str(), ".jpg") != nullptr) {
        return Kind::kJpeg;
    }
    return strcasestr(path.c_str(), ".png") != nullptr ? Kind::kPng : Kind::kRaw;
}

}  // namespace

// JPEG files are encoded here and written whole (the library's own JPEG save
// reports file errors only in its log); PNG and raw files are the library's
// save into a temporary of the same kind, checked and renamed.
int cmd_save(int argc, char** argv) {
    const char* kName = "save";
    Options options;
    const int status = parse_options(kName, argc, argv, {"--size", "--format", "--quality"}, &options);
    if (status >= 0) return status;
    int32_t width = 0, height = 0, quality = 0;
    uint32_t format = 0;
    if (!frame_input(kName, options, "--format", &width, &height, &format) ||
        !quality_option(kName, options, 95, &quality)) {
        return 2;
    }
    const std::string& path = options.paths[1];
    if (path == "-") {
        return usage_error(kName, "save writes a named file, whose name picks the kind (for a JPEG on standard "
                                  "output use encode)");
    }
    const Kind kind = file_kind(path);
    if (kind == Kind::kPng && (format == QK_FORMAT_D16 || format == QK_FORMAT_PCL)) {
        return usage_error(kName, "a PNG is made from RGB or YUV frames, not " + format_name(format));
    }
    ImageHandle frame = read_frame(kName, options.paths[0], width, height, format);
    if (!frame) return 1;
    if (kind == Kind::kJpeg) return write_jpeg(kName, path, *frame, quality);
    const uint64_t expected = kind == Kind::kRaw ? QKImage_requiredSize(width, height, format) : 0;
    return save_through_library(kName, *frame, path, kind == Kind::kPng ? ".png" : "", quality, expected) ? 0 : 1;
}
