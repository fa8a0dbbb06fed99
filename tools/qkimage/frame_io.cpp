#include "frame_io.h"

#include <errno.h>
#include <stdio.h>
#include <stdlib.h>

#include <algorithm>

#include "args.h"

namespace {

bool parse_long(const char* text, char** end, int32_t* value) {
    if (!((*text >= '0' && *text <= '9') || *text == '-' || *text == '+')) return false;
    errno = 0;
    long parsed = strtol(text, end, 10);
    if (errno != 0 || *end == text || parsed < INT32_MIN || parsed > INT32_MAX) return false;
    *value = static_cast<int32_t>(parsed);
    return true;
}

}  // namespace

bool parse_int(const char* text, int32_t* value) {
    char* end = nullptr;
    return parse_long(text, &end, value) && *end == '\0';
}

bool parse_point(const char* text, int32_t* x, int32_t* y) {
    char* end = nullptr;
    if (!parse_long(text, &end, x) || *end != ',') return false;
    return parse_long(end + 1, &end, y) && *end == '\0';
}

int usage_error(const FrameCommand& command, const std::string& message) {
    fprintf(stderr, "qkimage %s: %s\nusage: qkimage %s %s\n", command.name, message.c_str(), command.name,
            command.usage);
    return 2;
}

bool parse_frame_args(const FrameCommand& command, int argc, char** argv, FrameArgs* args) {
    std::vector<std::string> known = command.options;
    known.push_back("--size");
    known.push_back(command.format_option);
    std::vector<std::string> paths;
    for (int i = 0; i < argc; ++i) {
        const std::string arg = argv[i];
        if (arg.size() < 2 || arg.compare(0, 2, "--") != 0) {
            paths.push_back(arg);
            continue;
        }
        if (std::find(known.begin(), known.end(), arg) == known.end()) {
            usage_error(command, "unknown option '" + arg + "'");
            return false;
        }
        if (i + 1 == argc) {
            usage_error(command, "option '" + arg + "' needs a value");
            return false;
        }
        args->options[arg] = argv[++i];
    }
    for (const std::string& name : known) {
        if (args->options.count(name) == 0) {
            usage_error(command, "missing option '" + name + "'");
            return false;
        }
    }
    if (!parse_size(args->options["--size"].c_str(), &args->width, &args->height)) {
        usage_error(command, "bad --size '" + args->options["--size"] + "' (want WIDTHxHEIGHT)");
        return false;
    }
    const std::string& format = args->options[command.format_option];
    if (!parse_format(format.c_str(), &args->format)) {
        usage_error(command, std::string("unknown ") + command.format_option + " '" + format + "'");
        return false;
    }
    if (paths.size() != 2) {
        usage_error(command, "want an input and an output file");
        return false;
    }
    args->input = paths[0];
    args->output = paths[1];
    return true;
}

ImageHandle read_frame(const FrameCommand& command, const std::string& path, int32_t width, int32_t height,
                       uint32_t format) {
    const uint64_t expected = QKImage_requiredSize(width, height, format);
    if (expected == 0) {
        fprintf(stderr, "qkimage %s: a %dx%d %s frame has no raw size\n", command.name, width, height,
                format_name(format).c_str());
        return hold(nullptr);
    }
    FILE* file = fopen(path.c_str(), "rb");
    if (file == nullptr) {
        fprintf(stderr, "qkimage %s: cannot open '%s'\n", command.name, path.c_str());
        return hold(nullptr);
    }
    ImageHandle image = hold(QKImage_createNew(width, height, format));
    const size_t got = image ? fread(image->data, 1, expected, file) : 0;
    const bool longer = fgetc(file) != EOF;
    fclose(file);
    if (!image) {
        fprintf(stderr, "qkimage %s: no memory for a %dx%d frame\n", command.name, width, height);
    } else if (got != expected || longer) {
        fprintf(stderr, "qkimage %s: '%s' is not a %dx%d %s frame of %llu bytes\n", command.name, path.c_str(), width,
                height, format_name(format).c_str(), static_cast<unsigned long long>(expected));
        image.reset();
    }
    return image;
}

bool write_frame(const FrameCommand& command, const std::string& path, const QKImage& image) {
    const uint64_t bytes = QKImage_requiredSize(image.width, image.height, image.format);
    FILE* file = fopen(path.c_str(), "wb");
    bool written = file != nullptr && fwrite(image.data, 1, bytes, file) == bytes;
    if (file != nullptr && fclose(file) != 0) written = false;
    if (!written) fprintf(stderr, "qkimage %s: cannot write '%s'\n", command.name, path.c_str());
    return written;
}

int finish(const FrameCommand& command, int32_t status, const std::string& path, const QKImage* result) {
    if (status != QK_OK) {
        fprintf(stderr, "qkimage %s: the operation failed with status %d\n", command.name, status);
        return 1;
    }
    return write_frame(command, path, *result) ? 0 : 1;
}
