#include "commands.h"

#include <string.h>

#include <algorithm>

#include "image/format.h"

const Command kCommands[] = {
    {"formats", cmd_formats, "WIDTHxHEIGHT", "byte size of a raw frame of every format at that size",
     "qkimage formats 4000x3000"},
    {"convert", cmd_convert, "--size WxH --from FORMAT --to FORMAT IN OUT",
     "convert a raw frame to another pixel format (full-range BT.601 between RGB and YUV)",
     "qkimage convert --size 1920x1080 --from NV21 --to RGBA in.nv21 out.rgba"},
    {"rotate", cmd_rotate, "--size WxH --format FORMAT --angle DEGREES IN OUT",
     "turn a raw frame counter-clockwise by a multiple of 90 degrees",
     "qkimage rotate --size 4000x3000 --format RGBA --angle 90 in.rgba out.rgba"},
    {"scale", cmd_scale, "--size WxH --format RGBA --to WxH IN OUT",
     "resample a raw RGBA frame to another size (nearest pixel)",
     "qkimage scale --size 4000x3000 --format RGBA --to 2000x1500 in.rgba out.rgba"},
    {"crop", cmd_crop, "--size WxH --format FORMAT --at X,Y --to WxH IN OUT",
     "cut a rectangle out of a raw RGB or 4:2:0 frame (4:2:0: even X, Y and sizes)",
     "qkimage crop --size 4000x3000 --format NV12 --at 1000,750 --to 2000x1500 in.nv12 out.nv12"},
    {"encode", cmd_encode, "--size WxH --format FORMAT [--quality 1-100] IN OUT",
     "compress a raw frame to a JPEG file (quality 95 unless given)",
     "qkimage encode --size 1920x1080 --format NV21 --quality 90 in.nv21 out.jpg"},
    {"decode", cmd_decode, "--format FORMAT IN OUT",
     "decode a picture (JPEG, PNG, WebP, GIF) to a raw frame of FORMAT and print its size",
     "qkimage decode --format NV21 in.jpg out.nv21"},
    {"save", cmd_save, "--size WxH --format FORMAT [--quality 1-100] IN OUT",
     "save a raw frame as the output name asks: the first of \".jpeg\", \".jpg\", \".png\" found\n"
     "in it (letter case ignored) gives a JPEG or PNG file, none of them the raw bytes",
     "qkimage save --size 1920x1080 --format NV21 in.nv21 out.png"},
    {"load", cmd_load, "[--size WxH] --format FORMAT IN OUT",
     "read a picture, or else a raw frame of --size and --format, into a raw frame of FORMAT",
     "qkimage load --format RGBA photo.png photo.rgba"},
    {"demo", cmd_demo, "[IN.jpg] [--out DIR]",
     "draw a 4000x3000 test picture (or take IN.jpg) and run it through the camera road:\n"
     "NV21 to RGBA, rotate, scale, crop, JPEG round trip with PSNR, PNG; outputs in DIR\n"
     "(default ./qkimage-demo), one line a step with its time",
     "qkimage demo --out /tmp/qkimage-demo"},
    {"options", cmd_options, "OPTION_STRING NAME...", "the named items' values, as the option readers read them",
     "qkimage options \"iso=100,ev=-1.5\" iso ev"},
};
const int kCommandCount = sizeof(kCommands) / sizeof(kCommands[0]);

namespace {

const char kNotes[] =
    "Options take \"--name value\" or \"--name=value\". IN and OUT may be \"-\" for standard\n"
    "input and output (save and demo want file names). Outputs appear only when complete.\n"
    "--verbose (anywhere) shows the library's own reports.\n"
    "Exit status: 0 done, 1 the operation failed, 2 a usage error.\n";

// Prints `text` with every line after the first indented by `indent`.
void print_indented(FILE* stream, const char* indent, const char* text) {
    for (const char* line = text; *line != '\0';) {
        const char* newline = strchr(line, '\n');
        const int length = newline != nullptr ? int(newline - line) : int(strlen(line));
        fprintf(stream, "%s%.*s\n", indent, length, line);
        line += length + (newline != nullptr ? 1 : 0);
    }
}

}  // namespace

const Command* find_command(const char* name) {
    for (const Command& command : kCommands) {
        if (strcmp(name, command.name) == 0) return &command;
    }
    return nullptr;
}

void print_help(FILE* stream) {
    fprintf(stream,
            "qkimage %s: raw camera frames and pictures through the qkcore library\n\n"
            "usage: qkimage [--verbose] COMMAND [ARGS...]\n"
            "       qkimage COMMAND --help     (or: qkimage help COMMAND)\n"
            "       qkimage --version\n\ncommands:\n",
            QKIMAGE_VERSION);
    for (const Command& command : kCommands) {
        fprintf(stream, "  %s %s\n", command.name, command.args);
        print_indented(stream, "      ", command.summary);
        fprintf(stream, "      e.g. %s\n", command.example);
    }
    fprintf(stream, "\nformats (letter case ignored; the names after them are accepted too):\n");
    for (const qk::FormatInfo& format : qk::kFormats) {
        const FormatNote& note = format_note(format.code);
        std::string aliases = note.aliases;
        std::replace(aliases.begin(), aliases.end(), ',', '/');
        fprintf(stream, "  %-5s %-14s %s\n", format.name, aliases.c_str(), note.about);
    }
    fprintf(stream, "\nA raw frame is the pixel bytes of one image without header.\n%s", kNotes);
}

void print_usage(const Command& command, FILE* stream) {
    fprintf(stream, "usage: qkimage %s %s\n\n", command.name, command.args);
    print_indented(stream, "", command.summary);
    fprintf(stream, "\nexample:\n  %s\n\n%s", command.example, kNotes);
}

int parse_options(const char* command, int argc, char** argv, std::initializer_list<const char*> takes_value,
                  Options* options) {
    for (int i = 0; i < argc; ++i) {
        const std::string arg = argv[i];
        if (arg == "--help" || arg == "-h") {
            print_usage(*find_command(command), stdout);
            return 0;
        }
        if (arg == "--verbose") {
            g_verbose = true;
            continue;
        }
        if (arg.size() < 2 || arg.compare(0, 2, "--") != 0) {
            options->paths.push_back(arg);
            continue;
        }
        const size_t equals = arg.find('=');
        const std::string name = arg.substr(0, equals);
        if (std::find_if(takes_value.begin(), takes_value.end(),
                         [&](const char* known) { return name == known; }) == takes_value.end()) {
            return usage_error(command, "unknown option '" + name + "'");
        }
        if (equals == std::string::npos && i + 1 == argc) {
            return usage_error(command, "option '" + name + "' needs a value");
        }
        options->values[name] = equals != std::string::npos ? arg.substr(equals + 1) : argv[++i];
    }
    return -1;
}

int usage_error(const char* command, const std::string& message) {
    const Command* known = find_command(command);
    fprintf(stderr, "qkimage %s: %s\n", command, message.c_str());
    if (known != nullptr) fprintf(stderr, "usage: qkimage %s %s   (--help for more)\n", command, known->args);
    return 2;
}

int failure(const char* command, const std::string& message) {
    fprintf(stderr, "qkimage %s: %s\n", command, message.c_str());
    return 1;
}

int operation_failed(const char* command, const std::string& what) {
    return failure(command, what + (g_verbose ? "" : " (--verbose shows the library's report)"));
}

void warning(const char* command, const std::string& message) {
    fprintf(stderr, "qkimage %s: warning: %s\n", command, message.c_str());
}

bool size_option(const char* command, const Options& options, const char* name, int32_t* width, int32_t* height) {
    if (!options.has(name)) return usage_error(command, std::string("missing option '") + name + "'"), false;
    if (parse_size(options.get(name), width, height)) return true;
    usage_error(command, std::string("bad ") + name + " '" + options.get(name) +
                             "': want WIDTHxHEIGHT, both whole numbers from 1 up, e.g. 1920x1080");
    return false;
}

bool format_option(const char* command, const Options& options, const char* name, uint32_t* format) {
    if (!options.has(name)) return usage_error(command, std::string("missing option '") + name + "'"), false;
    if (parse_format(options.get(name), format)) return true;
    usage_error(command, std::string("unknown ") + name + " '" + options.get(name) +
                             "' (qkimage --help lists the formats)");
    return false;
}

bool quality_option(const char* command, const Options& options, int32_t fallback, int32_t* quality) {
    *quality = fallback;
    const char* end = nullptr;
    if (!options.has("--quality")) return true;
    if (parse_number(options.get("--quality"), &end, 1, 100, quality) && *end == '\0') return true;
    usage_error(command, "--quality must be a whole number from 1 to 100");
    return false;
}

bool path_count(const char* command, const Options& options, size_t count) {
    if (options.paths.size() == count) return true;
    usage_error(command, count == 2 ? "want an input and an output file" : "want " + std::to_string(count) + " files");
    return false;
}
