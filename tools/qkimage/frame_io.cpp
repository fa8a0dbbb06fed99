#include "frame_io.h"

#include <errno.h>
#include <fcntl.h>
#include <signal.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>

#include "args.h"
#include "commands.h"
#include "image/format.h"

namespace {

// The temporary being written, for the signal handler: a fixed buffer and a
// flag, the only things a handler may touch.
char g_temp[4096];
volatile sig_atomic_t g_have_temp = 0;

void remove_temp_and_stop(int signal_number) {
    if (g_have_temp) unlink(g_temp);
    raise(signal_number);  // SA_RESETHAND restored the default action
}

void install_handlers() {
    static bool installed = false;
    if (installed) return;
    installed = true;
    struct sigaction action = {};
    action.sa_handler = remove_temp_and_stop;
    action.sa_flags = SA_RESETHAND;
    sigemptyset(&action.sa_mask);
    for (int signal_number : {SIGINT, SIGTERM, SIGHUP}) sigaction(signal_number, &action, nullptr);
    // Past a file size limit, a write fails (and the temporary goes) rather
    // than the process being killed with the temporary left behind.
    signal(SIGXFSZ, SIG_IGN);
}

std::string shown(const std::string& path) { return path == "-" ? "standard input" : "'" + path + "'"; }

}  // namespace

bool is_rgb(uint32_t format) { return qk::is_rgb_format(format); }

bool needs_even_width(uint32_t format) { return qk::chroma_pairs_columns(format); }

bool needs_even_height(uint32_t format) { return qk::chroma_pairs_rows(format); }

std::string describe(int32_t width, int32_t height, uint32_t format) {
    return std::to_string(width) + "x" + std::to_string(height) + " " + format_name(format);
}

std::string frame_problem(int32_t width, int32_t height, uint32_t format) {
    const std::string name = format_name(format);
    if (QKImage_requiredSize(1, 1, format) == 0) return name + " is an encoded format, not a raw frame";
    if (QKImage_requiredSize(width, height, format) == 0) return describe(width, height, format) + " is larger than 2 GiB";
    const std::string size = std::to_string(width) + "x" + std::to_string(height);
    if (needs_even_height(format) && (width % 2 != 0 || height % 2 != 0)) {
        return name + " needs an even width and height, not " + size;
    }
    if (needs_even_width(format) && width % 2 != 0) return name + " needs an even width, not " + size;
    return "";
}

bool check_frame(const char* command, int32_t width, int32_t height, uint32_t format) {
    const std::string problem = frame_problem(width, height, format);
    return problem.empty() || usage_error(command, problem) == 0;
}

bool frame_input(const char* command, const Options& options, const char* format_flag, int32_t* width,
                 int32_t* height, uint32_t* format) {
    return size_option(command, options, "--size", width, height) &&
           format_option(command, options, format_flag, format) && check_frame(command, *width, *height, *format) &&
           path_count(command, options, 2);
}

ImageHandle read_frame(const char* command, const std::string& path, int32_t width, int32_t height,
                       uint32_t format) {
    const uint64_t expected = QKImage_requiredSize(width, height, format);
    FILE* file = path == "-" ? stdin : fopen(path.c_str(), "rb");
    if (file == nullptr) {
        failure(command, "cannot read '" + path + "': " + strerror(errno));
        return hold(nullptr);
    }
    ImageHandle image = hold(QKImage_createNew(width, height, format));
    const size_t got = image ? fread(image->data, 1, expected, file) : 0;
    const bool longer = image && got == expected && fgetc(file) != EOF;
    if (file != stdin) fclose(file);
    if (!image) {
        failure(command, "no memory for a " + describe(width, height, format) + " frame");
    } else if (got != expected || longer) {
        failure(command, shown(path) + " is not a " + describe(width, height, format) + " frame of " +
                             std::to_string(expected) + " bytes (it is " +
                             (longer ? "longer)" : std::to_string(got) + " bytes)"));
        image.reset();
    }
    return image;
}

bool read_input(const char* command, const std::string& path, std::vector<uint8_t>* bytes) {
    FILE* file = path == "-" ? stdin : fopen(path.c_str(), "rb");
    if (file == nullptr) return failure(command, "cannot read '" + path + "': " + strerror(errno)), false;
    size_t got = 0;
    do {
        bytes->resize(std::max<size_t>(bytes->size() * 2, 1 << 20));
        got += fread(bytes->data() + got, 1, bytes->size() - got, file);
    } while (got == bytes->size());
    const bool failed = ferror(file) != 0;
    if (file != stdin) fclose(file);
    bytes->resize(got);
    if (failed) return failure(command, "cannot read " + shown(path)), false;
    if (got == 0) return failure(command, shown(path) + " is empty"), false;
    return true;
}

OutputFile::~OutputFile() { discard(); }

bool OutputFile::open(const char* command, const std::string& path, const char* suffix) {
    command_ = command;
    path_ = path;
    if (path == "-") {
        fd_ = STDOUT_FILENO;
        return true;
    }
    struct stat target;
    const bool exists = stat(path.c_str(), &target) == 0;
    if (exists && S_ISDIR(target.st_mode)) return failure(command, "'" + path + "' is a directory"), false;
    const size_t slash = path.rfind('/');
    std::string base = path.substr(slash == std::string::npos ? 0 : slash + 1);
    // The library's path rule looks for ".jpg" and the like anywhere: the
    // name's only dots are the leading one, followed by a fixed word, and
    // those of `suffix` (so "jpg.png" cannot become ".jpg_png", nor random
    // letters after a dot ".jpgQ3x").
    std::replace(base.begin(), base.end(), '.', '_');
    base.resize(std::min<size_t>(base.size(), 64));
    const std::string dir = slash == std::string::npos ? "" : path.substr(0, slash + 1);
    const std::string temp = dir + ".qkimage-" + base + "-XXXXXX" + suffix;
    if (temp.size() >= sizeof(g_temp)) return failure(command, "the path '" + path + "' is too long"), false;

    install_handlers();
    memcpy(g_temp, temp.c_str(), temp.size() + 1);
    g_have_temp = 1;
    fd_ = mkstemps(g_temp, static_cast<int>(strlen(suffix)));
    if (fd_ < 0) {
        g_have_temp = 0;
        return failure(command, "cannot write '" + path + "': " + strerror(errno)), false;
    }
    temp_ = g_temp;
    // The file gets the mode a new file would (or the target's own), not
    // the private mode of a temporary.
    mode_t mode = 0;
    if (exists) {
        mode = target.st_mode & 07777;
    } else {
        const mode_t mask = umask(0);
        umask(mask);
        mode = 0666 & ~mask;
    }
    fchmod(fd_, mode);
    return true;
}

bool OutputFile::write(const void* data, uint64_t size) {
    const uint8_t* bytes = static_cast<const uint8_t*>(data);
    while (size > 0) {
        const ssize_t written = ::write(fd_, bytes, std::min<uint64_t>(size, 1 << 30));
        if (written < 0 && errno == EINTR) continue;
        if (written <= 0) {
            failure(command_, "cannot write " + (path_ == "-" ? "standard output" : "'" + path_ + "'") + ": " +
                                  strerror(written < 0 ? errno : EIO));
            return false;
        }
        bytes += written;
        size -= static_cast<uint64_t>(written);
    }
    return true;
}

uint64_t OutputFile::temp_size() const {
    struct stat info;
    return !temp_.empty() && stat(temp_.c_str(), &info) == 0 ? static_cast<uint64_t>(info.st_size) : 0;
}

bool OutputFile::commit() {
    if (path_ == "-") {
        fd_ = -1;
        return true;
    }
    const int fd = fd_;
    fd_ = -1;
    if (close(fd) != 0 || rename(temp_.c_str(), path_.c_str()) != 0) {
        failure(command_, "cannot write '" + path_ + "': " + strerror(errno));
        discard();
        return false;
    }
    g_have_temp = 0;
    temp_.clear();
    return true;
}

void OutputFile::discard() {
    if (fd_ >= 0 && fd_ != STDOUT_FILENO) close(fd_);
    fd_ = -1;
    if (!temp_.empty()) unlink(temp_.c_str());
    temp_.clear();
    g_have_temp = 0;
}

bool write_output(const char* command, const std::string& path, const void* data, uint64_t size) {
    OutputFile file;
    return file.open(command, path) && file.write(data, size) && file.commit();
}

int write_jpeg(const char* command, const std::string& path, const QKImage& frame, int32_t quality) {
    ImageHandle jpeg = hold(QKImage_encodeToJpeg(&frame, quality));
    if (!jpeg) {
        return operation_failed(command, "the JPEG codec could not encode the " +
                                             describe(frame.width, frame.height, frame.format) + " frame");
    }
    return write_output(command, path, jpeg->data, jpeg->size) ? 0 : 1;
}

bool write_frame(const char* command, const std::string& path, const QKImage& image) {
    const uint64_t bytes = QKImage_requiredSize(image.width, image.height, image.format);
    if (image.data == nullptr || bytes == 0 || QKImage_size(&image) < bytes) {
        return failure(command, "the result is not a whole raw frame"), false;
    }
    return write_output(command, path, image.data, bytes);
}

bool save_through_library(const char* command, const QKImage& image, const std::string& path, const char* suffix,
                          int32_t quality, uint64_t expected) {
    OutputFile file;
    if (!file.open(command, path, suffix)) return false;
    if (QKImage_saveToFile(&image, file.temp_path().c_str(), quality) != QK_OK) {
        return operation_failed(command, "could not save the " + describe(image.width, image.height, image.format) +
                                             " frame as '" + path + "'"), false;
    }
    // The library reports some file errors only in its log: the file tells.
    const uint64_t written = file.temp_size();
    if (expected != 0 ? written != expected : written == 0) {
        return operation_failed(command, "nothing complete was written to '" + path + "'"), false;
    }
    return file.commit();
}

ImageHandle decode_picture(const char* command, uint32_t format, const std::function<int32_t(QKImage*)>& decode) {
    ImageHandle image = hold(QKImage_createEmpty(0, 0, format));
    // A decoder that "succeeds" with a frame the format cannot have (a file
    // loader taking an odd-sized picture's bytes as raw pixels) failed.
    if (image && decode(image.get()) == QK_OK && frame_problem(image->width, image->height, format).empty()) {
        return image;
    }
    if (format == QK_FORMAT_RGBA || !needs_even_width(format)) return hold(nullptr);
    ImageHandle rgba = hold(QKImage_createEmpty(0, 0, QK_FORMAT_RGBA));
    if (!rgba || decode(rgba.get()) != QK_OK) return hold(nullptr);
    const int32_t width = rgba->width & ~1;
    const int32_t height = needs_even_height(format) ? rgba->height & ~1 : rgba->height;
    if (width == rgba->width && height == rgba->height) return hold(nullptr);  // odd size was not the reason
    if (width < 2 || height < 1) return hold(nullptr);
    warning(command, "the picture is " + std::to_string(rgba->width) + "x" + std::to_string(rgba->height) + ", but " +
                         format_name(format) + " needs an even " +
                         (needs_even_height(format) ? "width and height" : "width") + ": cut to " +
                         std::to_string(width) + "x" + std::to_string(height));
    ImageHandle cut = hold(QKImage_createEmpty(width, height, QK_FORMAT_RGBA));
    image = hold(QKImage_createNew(width, height, format));
    if (!cut || !image || QKImage_crop(rgba.get(), cut.get(), 0, 0) != QK_OK ||
        QKImage_convert(cut.get(), image.get()) != QK_OK) {
        return hold(nullptr);
    }
    return image;
}
