#include <stdarg.h>
#include <stdio.h>
#include <string.h>

#include <string>
#include <vector>

#include "args.h"
#include "commands.h"
#include "qkcore/qk_image.h"
#include "qkcore/qk_log.h"

namespace {

constexpr const char* kUsage =
    "usage: qkimage convert --size WIDTHxHEIGHT --from FORMAT --to FORMAT INPUT OUTPUT\n"
    "  reads a raw INPUT frame and writes it converted, as a raw frame, to OUTPUT\n";

// The library's warnings and errors go to standard error; its progress lines
// are not for the tool's user.
int log_problems(int level, ...) {
    if (level < QK_LOG_WARN) return 0;
    va_list args;
    va_start(args, level);
    const char* format = va_arg(args, const char*);
    fputs("qkimage: ", stderr);
    vfprintf(stderr, format, args);
    fputc('\n', stderr);
    va_end(args);
    return 0;
}

bool read_file(const char* path, std::vector<uint8_t>* bytes) {
    FILE* file = fopen(path, "rb");
    if (file == nullptr) return false;
    uint8_t chunk[65536];
    size_t count;
    while ((count = fread(chunk, 1, sizeof(chunk), file)) > 0) bytes->insert(bytes->end(), chunk, chunk + count);
    const bool ok = ferror(file) == 0;
    fclose(file);
    return ok;
}

bool write_file(const char* path, const uint8_t* bytes, size_t count) {
    FILE* file = fopen(path, "wb");
    if (file == nullptr) return false;
    const bool written = fwrite(bytes, 1, count, file) == count;
    return fclose(file) == 0 && written;
}

// Exit status 2 for bad arguments, 1 for failures on good ones.
int fail(const std::string& message, int status = 1) {
    fprintf(stderr, "qkimage convert: %s\n", message.c_str());
    return status;
}

}  // namespace

int cmd_convert(int argc, char** argv) {
    int32_t width = 0, height = 0;
    uint32_t from = 0, to = 0;
    bool haveSize = false, haveFrom = false, haveTo = false;
    std::vector<const char*> paths;
    for (int i = 0; i < argc; ++i) {
        const bool hasValue = i + 1 < argc;
        if (strcmp(argv[i], "--size") == 0 && hasValue) {
            haveSize = parse_size(argv[++i], &width, &height);
            if (!haveSize) return fail(std::string("bad size '") + argv[i] + "' (expected WIDTHxHEIGHT)", 2);
        } else if ((strcmp(argv[i], "--from") == 0 || strcmp(argv[i], "--to") == 0) && hasValue) {
            const bool isFrom = strcmp(argv[i], "--from") == 0;
            if (!parse_format(argv[++i], isFrom ? &from : &to)) {
                return fail(std::string("unknown format '") + argv[i] + "'", 2);
            }
            (isFrom ? haveFrom : haveTo) = true;
        } else if (argv[i][0] == '-' && argv[i][1] != '\0') {
            fputs(kUsage, stderr);
            return 2;
        } else {
            paths.push_back(argv[i]);
        }
    }
    if (!haveSize || !haveFrom || !haveTo || paths.size() != 2) {
        fputs(kUsage, stderr);
        return 2;
    }

    const uint64_t expected = QKImage_requiredSize(width, height, from);
    if (expected == 0) return fail("a raw " + format_name(from) + " frame has no size to read", 2);
    std::vector<uint8_t> input;
    if (!read_file(paths[0], &input)) return fail(std::string("cannot read '") + paths[0] + "'");
    if (input.size() != expected) {
        return fail(std::string("'") + paths[0] + "' holds " + std::to_string(input.size()) + " bytes; a " +
                    std::to_string(width) + "x" + std::to_string(height) + " " + format_name(from) + " frame has " +
                    std::to_string(expected));
    }

    HX_LogMsg = log_problems;
    QKImage* source = QKImage_createWrap(input.data(), width, height, from, static_cast<int32_t>(expected), 0);
    QKImage* result = QKImage_copyAndConvert(source, to);
    QKImage_destroy(source);
    if (result == nullptr) return fail("cannot convert " + format_name(from) + " to " + format_name(to));
    const bool written = write_file(paths[1], result->data, QKImage_size(result));
    QKImage_destroy(result);
    if (!written) return fail(std::string("cannot write '") + paths[1] + "'");
    return 0;
}
