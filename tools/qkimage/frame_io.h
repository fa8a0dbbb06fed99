// Raw frames, pictures and output files. A raw frame is an image's pixel
// bytes without header, exactly the format's size at that width and height.
// "-" names standard input or output. Outputs appear only when complete.
#ifndef QKIMAGE_FRAME_IO_H
#define QKIMAGE_FRAME_IO_H

#include <stdint.h>

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "args.h"
#include "qkcore/qk_image.h"

// An image released with QKImage_destroy when it goes out of scope.
using ImageHandle = std::unique_ptr<QKImage, decltype(&QKImage_destroy)>;
inline ImageHandle hold(QKImage* image) { return ImageHandle(image, &QKImage_destroy); }

// The six RGB formats (packed, 3 or 4 bytes a pixel).
bool is_rgb(uint32_t format);
// 4:2:0 formats need an even width and height, packed 4:2:2 an even width.
bool needs_even_width(uint32_t format);
bool needs_even_height(uint32_t format);
// Why a raw frame of these dimensions and format cannot exist, in words the
// user understands ("NV21 needs an even width and height"), or "" when it can.
std::string frame_problem(int32_t width, int32_t height, uint32_t format);
// frame_problem as a usage error; false when there is one.
bool check_frame(const char* command, int32_t width, int32_t height, uint32_t format);
// "1920x1080 NV21".
std::string describe(int32_t width, int32_t height, uint32_t format);

// The input frame of a frame command: --size, the format option (usually
// --format), a frame that can exist, and IN OUT. False after a usage error.
bool frame_input(const char* command, const Options& options, const char* format_flag, int32_t* width,
                 int32_t* height, uint32_t* format);

// Reads a raw frame of the given size and format (checked with frame_problem
// first) into a new image, or prints why it could not and returns null.
ImageHandle read_frame(const char* command, const std::string& path, int32_t width, int32_t height,
                       uint32_t format);
// The whole file (or standard input) in memory; false after a message.
bool read_input(const char* command, const std::string& path, std::vector<uint8_t>* bytes);

// A file that appears only when complete: written under a temporary name
// beside the target and renamed over it by commit(). Until then the target,
// if it exists, is untouched; the temporary is removed when the object goes
// away uncommitted, and on SIGINT, SIGTERM or SIGHUP. "-" writes standard
// output directly. One is open at a time.
class OutputFile {
public:
    OutputFile() = default;
    OutputFile(const OutputFile&) = delete;
    OutputFile& operator=(const OutputFile&) = delete;
    ~OutputFile();

    // Creates the temporary; `suffix` ends its name (so the library's file
    // rule sees the same kind). False after a message.
    bool open(const char* command, const std::string& path, const char* suffix = "");
    bool write(const void* data, uint64_t size);
    // The temporary's name, for writers that take a path; empty for "-".
    const std::string& temp_path() const { return temp_; }
    // Bytes in the temporary now (after a writer that took its path).
    uint64_t temp_size() const;
    // Closes and renames the temporary over the target; false after a message.
    bool commit();

private:
    void discard();

    const char* command_ = "";
    std::string path_;
    std::string temp_;
    int fd_ = -1;
};

// Writes bytes, or an image's raw frame, to an OutputFile; false after a message.
bool write_output(const char* command, const std::string& path, const void* data, uint64_t size);
bool write_frame(const char* command, const std::string& path, const QKImage& image);
// Encodes a frame as a JPEG and writes it; the command's exit status.
int write_jpeg(const char* command, const std::string& path, const QKImage& frame, int32_t quality);

// Saves with the library's QKImage_saveToFile into a temporary whose name
// ends in `suffix` (so its path rule picks the same kind), checks that the
// file holds `expected` bytes (any number above 0 when `expected` is 0) and
// renames it over `path`. False after a message.
bool save_through_library(const char* command, const QKImage& image, const std::string& path, const char* suffix,
                          int32_t quality, uint64_t expected);

// Decodes a picture into a new image of `format` with `decode`, which fills
// the image without buffer it is given (the library's decoder or file
// loader) and returns a status. A picture of odd size that the format cannot
// hold is decoded to RGBA, cut to even with a warning, and converted.
// Returns null on failure, for the caller to say what it was decoding.
ImageHandle decode_picture(const char* command, uint32_t format, const std::function<int32_t(QKImage*)>& decode);

#endif  // QKIMAGE_FRAME_IO_H
