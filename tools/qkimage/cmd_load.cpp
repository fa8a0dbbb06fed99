#include <stdio.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

#include <string>
#include <vector>

#include "args.h"
#include "commands.h"
#include "frame_io.h"
#include "qkcore/qk_image.h"

namespace {

// The library loads files by path; standard input is handed over as an
// anonymous in-memory file. Returns its descriptor, or -1 after a message.
int stdin_as_file(const char* command) {
    std::vector<uint8_t> bytes;
    if (!read_input(command, "-", &bytes)) return -1;
    const int fd = memfd_create("qkimage-stdin", 0);
    if (fd < 0 || write(fd, bytes.data(), bytes.size()) != static_cast<ssize_t>(bytes.size())) {
        if (fd >= 0) close(fd);
        failure(command, "cannot hold standard input in memory");
        return -1;
    }
    return fd;
}

}  // namespace

int cmd_load(int argc, char** argv) {
    const char* kName = "load";
    Options options;
    const int status = parse_options(kName, argc, argv, {"--size", "--format"}, &options);
    if (status >= 0) return status;
    uint32_t format = 0;
    int32_t width = 0, height = 0;
    if (!format_option(kName, options, "--format", &format) || !check_frame(kName, 2, 2, format) ||
        (options.has("--size") && (!size_option(kName, options, "--size", &width, &height) ||
                                   !check_frame(kName, width, height, format))) ||
        !path_count(kName, options, 2)) {
        return 2;
    }
    std::string path = options.paths[0];
    const std::string shown = path == "-" ? "standard input" : "'" + path + "'";
    int fd = -1;
    if (path == "-") {
        if ((fd = stdin_as_file(kName)) < 0) return 1;
        path = "/proc/self/fd/" + std::to_string(fd);
    }
    // A picture first (an image without size is never taken as raw pixels)...
    ImageHandle image = decode_picture(kName, format, [&](QKImage* target) {
        return QKImage_loadFromFile(target, path.c_str());
    });
    // ...then a raw frame, whose file must be exactly the frame.
    if (!image && width != 0) {
        struct stat info;
        const uint64_t expected = QKImage_requiredSize(width, height, format);
        if (stat(path.c_str(), &info) != 0 || static_cast<uint64_t>(info.st_size) != expected) {
            if (fd >= 0) close(fd);
            return failure(kName, shown + " is neither a picture the library decodes nor a " +
                                      describe(width, height, format) + " frame of " + std::to_string(expected) +
                                      " bytes");
        }
        image = hold(QKImage_createEmpty(width, height, format));
        if (image) image->size = expected;
        if (image && QKImage_loadFromFile(image.get(), path.c_str()) != QK_OK) image.reset();
    }
    if (fd >= 0) close(fd);
    if (!image) {
        return operation_failed(kName, "could not load " + shown + (width != 0 ? "" :
                                           " as a JPEG, PNG, WebP or GIF picture; for raw pixels give --size"));
    }
    if (!write_frame(kName, options.paths[1], *image)) return 1;
    fprintf(options.paths[1] == "-" ? stderr : stdout, "%s\n", describe(image->width, image->height, format).c_str());
    return 0;
}
