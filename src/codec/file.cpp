// Saving images as JPEG, PNG or raw files chosen by the path, and loading
// files back: decoded when they are pictures, else taken as raw pixels.
#include <errno.h>
#include <fcntl.h>
#include <stdint.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>
#include <unistd.h>

#include <algorithm>
#include <cctype>
#include <string>

#include "codec/codec.h"
#include "image/checks.h"
#include "image/format.h"
#include "platform/picture.h"
#include "platform/raster.h"
#include "qkcore/qk_image.h"
#include "util/log.h"
#include "util/status.h"

void save_to_file(const char* path, unsigned char* data, unsigned int size) {
    QK_LOG(QK_LOG_DEBUG, "opening file");
    // An older, longer file is cut to the new length: nothing stale behind
    // the new contents.
    const int fd = path != nullptr ? open(path, O_RDWR | O_CREAT | O_TRUNC | O_CLOEXEC, 0777) : -1;
    if (fd < 0) {
        QK_LOG(QK_LOG_ERROR, "failed to create file: %s", strerror(path != nullptr ? errno : EFAULT));
        return;
    }
    unsigned int offset = 0;
    int passes = 0;
    while (offset < size) {
        const ssize_t written = write(fd, data + offset, size - offset);
        if (written < 0 && errno == EINTR) continue;
        if (written <= 0) {
            // A write that moves nothing would repeat forever.
            QK_LOG(QK_LOG_ERROR, "failed to write to file: %s", strerror(written < 0 ? errno : EIO));
            break;
        }
        offset += static_cast<unsigned int>(written);
        ++passes;
    }
    QK_LOG(QK_LOG_DEBUG, "done writing to file in %d passes\n", passes);
    close(fd);
}

namespace {

enum class FileKind { kJpeg, kPng, kRaw };

// The first of ".jpeg", ".jpg", ".png" found anywhere in the path, letter
// case ignored, decides; directories count too.
FileKind file_kind(const char* path) {
    std::string lower(path);
    std::transform(lower.begin(), lower.end(), lower.begin(),
                   [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
    if (lower.find(".jpeg") != std::string::npos || lower.find(".jpg") != std::string::npos) {
        return FileKind::kJpeg;
    }
    return lower.find(".png") != std::string::npos ? FileKind::kPng : FileKind::kRaw;
}

int32_t save_png(const QKImage& image, const char* path) {
    qk::platform::Bitmap bitmap;
    QKImage* copy = nullptr;
    if (image.format == QK_FORMAT_RGBA) {
        // The encoder reads the whole picture from the image's own buffer.
        if (image.data != nullptr && !qk::buffer_holds_image(image)) return QK_FAIL(QK_ERROR_INVALID_SIZE);
        bitmap.borrow(image.data, image.width, image.height);
    } else {
        copy = QKImage_createNew(image.width, image.height, QK_FORMAT_RGBA);
        if (copy == nullptr) return QK_FAIL(QK_ERROR_UNKNOWN);
        // A copy the conversion could not fill is not saved.
        const int32_t converted = QKImage_convert(&image, copy);
        if (converted != QK_OK) {
            QKImage_destroy(copy);
            return converted;
        }
        bitmap.borrow(copy->data, copy->width, copy->height);
    }
    int32_t status = QK_OK;
    if (!qk::platform::write_png_file(path, bitmap)) {
        QK_LOG(QK_LOG_ERROR, "Failed to save RGBA image with Skia!");
        status = QK_FAIL(QK_ERROR_UNKNOWN);
    }
    QKImage_destroy(copy);
    return status;
}

}  // namespace

int32_t QKImage_saveToFile(const QKImage* image, const char* path, int32_t quality) {
    if (image == nullptr) return QK_FAIL(QK_ERROR_NULL_PARAM);
    if (path == nullptr) return QK_FAIL(QK_ERROR_NULL_PARAM);
    quality = qk::output_quality(quality);
    switch (file_kind(path)) {
        case FileKind::kJpeg: {
            // Encoding and file errors are only logged.
            QKImage* jpeg = QKImage_encodeToJpeg(image, quality);
            if (jpeg != nullptr) {
                save_to_file(path, jpeg->data, static_cast<unsigned int>(jpeg->size));
                QKImage_destroy(jpeg);
            }
            return QK_OK;
        }
        case FileKind::kPng: return save_png(*image, path);
        case FileKind::kRaw:
            save_to_file(path, image->data, static_cast<unsigned int>(image->size));
            return QK_OK;
    }
    return QK_OK;
}

int64_t fsize(FILE* stream) {
    const long position = ftell(stream);
    if (position < 0) return -1;
    if (fseek(stream, 0, SEEK_END) != 0) return -1;
    const long length = ftell(stream);
    if (fseek(stream, position, SEEK_SET) != 0) return -1;
    return length;
}

namespace {

// Bytes a raw file must hold to be the image's buffer: all that the image
// claims (its recorded size, else the size rule) and all its picture
// reaches, 4:2:0 chroma at a separate offset included.
uint64_t raw_bytes_needed(const QKImage& image) {
    uint64_t needed = QKImage_size(&image);
    if (image.chromaOffset != 0 && qk::is_yuv420_format(image.format)) {
        needed = std::max(needed, qk::yuv420_extent(qk::chroma_base(image), image.width, image.height));
    }
    return needed;
}

// Whether a file that did not decode is taken as the image's raw pixels.
bool raw_accepted(const QKImage& image) {
    if (image.width < 1 || image.height < 1) return false;
    if (image.size != 0) return true;
    return image.format == QK_FORMAT_PCL ||
           QKImage_requiredSize(image.width, image.height, image.format) != 0;
}

}  // namespace

int32_t QKImage_loadFromFile(QKImage* image, const char* path) {
    if (image == nullptr || path == nullptr) return QK_FAIL(QK_ERROR_NULL_PARAM);
    FILE* file = fopen(path, "rb");
    if (file == nullptr) return QK_FAIL(QK_ERROR_IO_FAILED);
    const int32_t length = static_cast<int32_t>(fsize(file));
    if (length < 1) {
        fclose(file);
        return QK_FAIL(QK_ERROR_IO_FAILED);
    }
    uint8_t* buffer = static_cast<uint8_t*>(malloc(static_cast<size_t>(length)));
    if (buffer == nullptr) {
        fclose(file);
        return QK_FAIL(QK_ERROR_ALLOC_FAILED);
    }
    size_t got = 0;
    while (got < static_cast<size_t>(length)) {
        const size_t read = fread(buffer + got, 1, static_cast<size_t>(length) - got, file);
        if (read < 1) break;
        got += read;
    }
    fclose(file);
    // A file that shrank while it was read would leave the buffer's tail
    // unwritten: that is a failed read, not a picture.
    if (got != static_cast<size_t>(length)) {
        free(buffer);
        return QK_FAIL(QK_ERROR_IO_FAILED);
    }

    const int32_t decoded = QKImage_decodeFromJpeg(image, buffer, static_cast<uint64_t>(length));
    if (decoded == QK_OK) {
        free(buffer);
        return QK_OK;
    }
    if (!raw_accepted(*image)) {
        free(buffer);
        return decoded;
    }
    // A file shorter than what the image describes would leave later
    // operations reading past the buffer.
    if (static_cast<uint64_t>(length) < raw_bytes_needed(*image)) {
        free(buffer);
        return QK_FAIL(QK_ERROR_INVALID_SIZE);
    }
    QK_LOG(QK_LOG_DEBUG, "Decoding as raw image: %dx%d '%4.4s'", image->width, image->height,
           QK_FOURCC_STR(image->format));
    // An owned earlier buffer is freed, never lost; the recorded size and
    // chroma offset describe the file's contents and stay.
    if (image->data != nullptr && image->isWrapped == 0) free(image->data);
    image->data = buffer;
    image->isWrapped = 0;
    return QK_OK;
}
