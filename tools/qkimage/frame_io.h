// Raw frame files and the arguments shared by the subcommands that transform
// them: "--size WxH --format FMT", the operation's own options, then the input
// and output paths. A raw frame is an image's pixel bytes without header,
// exactly the format's size at that width and height.
#ifndef QKIMAGE_FRAME_IO_H
#define QKIMAGE_FRAME_IO_H

#include <stdint.h>

#include <map>
#include <memory>
#include <string>
#include <vector>

#include "qkcore/qk_image.h"

struct FrameCommand {
    const char* name;   // "rotate"
    const char* usage;  // the arguments after the name
    std::vector<std::string> options;  // the operation's own options, e.g. "--angle"
    const char* format_option = "--format";  // names the input frame's format
};

struct FrameArgs {
    int32_t width = 0;
    int32_t height = 0;
    uint32_t format = 0;
    std::map<std::string, std::string> options;  // every option given, by name
    std::string input;
    std::string output;
};

// Parses --size, the format option, the command's options (each required) and the two
// paths. On a bad argument prints a message and the usage to stderr and
// returns false.
bool parse_frame_args(const FrameCommand& command, int argc, char** argv, FrameArgs* args);
// Prints "qkimage NAME: message" and the usage; returns the exit status 2.
int usage_error(const FrameCommand& command, const std::string& message);

// An image released with QKImage_destroy when it goes out of scope.
using ImageHandle = std::unique_ptr<QKImage, decltype(&QKImage_destroy)>;
inline ImageHandle hold(QKImage* image) { return ImageHandle(image, &QKImage_destroy); }

// Reads a raw frame of the given size and format into a new image, or prints
// why it could not and returns null.
ImageHandle read_frame(const FrameCommand& command, const std::string& path, int32_t width, int32_t height,
                       uint32_t format);
// Writes the image's pixels (its format's size at its width and height).
bool write_frame(const FrameCommand& command, const std::string& path, const QKImage& image);

// The exit status of a command whose operation returned `status`: 0 once the
// result is written to `path`; 1, with a message, when the operation failed
// or the file could not be written.
int finish(const FrameCommand& command, int32_t status, const std::string& path, const QKImage* result);

// "X,Y" with any signed 32-bit values.
bool parse_point(const char* text, int32_t* x, int32_t* y);
// A signed 32-bit decimal number and nothing else.
bool parse_int(const char* text, int32_t* value);

#endif  // QKIMAGE_FRAME_IO_H
