#include <stdint.h>
#include <stdlib.h>
#include <string.h>

#include <algorithm>
#include <new>

#include "image/format.h"
#include "platform/memory.h"
#include "qkcore/qk_image.h"
#include "util/status.h"

namespace {

// A PCL buffer starts with its point count, width x height, in a native
// 32-bit word.
void write_point_count(QKImage& image) {
    uint32_t count = static_cast<uint32_t>(static_cast<int64_t>(image.width) * image.height);
    memcpy(image.data, &count, sizeof(count));
}

void forget_buffer(QKImage& image) {
    if (image.isWrapped == 0) free(image.data);
    image.data = nullptr;
    image.isWrapped = 0;
    image.size = 0;
    image.chromaOffset = 0;
}

}  // namespace

QKImage* QKImage_createEmpty(int32_t width, int32_t height, uint32_t format) {
    QKImage* image = new (std::nothrow) QKImage;
    if (image == nullptr) return nullptr;
    image->width = width;
    image->height = height;
    image->format = format;
    return image;
}

QKImage* QKImage_createNew(int32_t width, int32_t height, uint32_t format) {
    uint64_t bytes = QKImage_requiredSize(width, height, format);
    if (bytes == 0) return nullptr;
    void* buffer = qk::platform::allocate_pixels(bytes);
    if (buffer == nullptr) return nullptr;
    QKImage* image = QKImage_createEmpty(width, height, format);
    if (image == nullptr) {
        free(buffer);
        return nullptr;
    }
    image->data = static_cast<uint8_t*>(buffer);
    image->size = bytes;
    if (format == QK_FORMAT_PCL) write_point_count(*image);
    return image;
}

QKImage* QKImage_createWrap(void* data, int32_t width, int32_t height, uint32_t format, int32_t size,
                            uint32_t chroma_offset) {
    QKImage* image = QKImage_createEmpty(width, height, format);
    if (image == nullptr || data == nullptr) return image;
    image->data = static_cast<uint8_t*>(data);
    image->isWrapped = 1;
    image->size = size > 0 ? static_cast<uint64_t>(size) : 0;
    image->chromaOffset = chroma_offset;
    return image;
}

int32_t QKImage_allocate(QKImage* image) {
    if (image == nullptr) return QK_FAIL(QK_ERROR_NULL_PARAM);
    if (image->data != nullptr) {
        return static_cast<int32_t>(std::min<uint64_t>(QKImage_size(image), INT32_MAX));
    }
    uint64_t bytes = QKImage_size(image);
    // A preset size is honoured, but must be a byte count we can return.
    if (bytes == 0 || bytes > INT32_MAX) return QK_FAIL(QK_ERROR_INVALID_PARAM);
    // A point cloud needs room for the point count of its header.
    if (image->format == QK_FORMAT_PCL && bytes < sizeof(uint32_t)) return QK_FAIL(QK_ERROR_INVALID_SIZE);
    void* buffer = qk::platform::allocate_pixels(bytes);
    if (buffer == nullptr) return QK_FAIL(QK_ERROR_ALLOC_FAILED);
    image->data = static_cast<uint8_t*>(buffer);
    image->isWrapped = 0;
    image->size = bytes;
    image->chromaOffset = 0;
    if (image->format == QK_FORMAT_PCL) write_point_count(*image);
    return static_cast<int32_t>(bytes);
}

void QKImage_deallocate(QKImage* image) {
    if (image == nullptr || image->data == nullptr) return;
    forget_buffer(*image);
}

void QKImage_reset(QKImage* image) {
    if (image == nullptr) return;
    QKImage_deallocate(image);
    image->width = 0;
    image->height = 0;
    image->format = 0;
}

void QKImage_destroy(QKImage* image) { delete image; }

QKImage* QKImage_clone(const QKImage* source) {
    if (source == nullptr || source->data == nullptr) return nullptr;
    QKImage* clone = QKImage_createNew(source->width, source->height, source->format);
    if (clone == nullptr) return nullptr;

    // The clone holds exactly one image of its format. Bytes a source records
    // beyond that are not copied; a source that records fewer bytes gives
    // what it has, never a byte read past them, and the rest of the clone is
    // zero rather than whatever the allocator left there.
    const uint64_t available = source->size != 0 ? source->size : UINT64_MAX;
    auto copy = [&](uint64_t to, uint64_t from, uint64_t length) {
        const uint64_t present = from < available ? std::min(length, available - from) : 0;
        if (present != 0) qk::platform::copy_pixels(clone->data + to, source->data + from, present);
        memset(clone->data + to + present, 0, length - present);
    };
    if (source->chromaOffset != 0 && qk::is_yuv420_format(source->format)) {
        copy(0, 0, qk::yuv420_luma_bytes(source->width, source->height));
        copy(qk::chroma_base(*clone), qk::chroma_base(*source), qk::yuv420_chroma_bytes(source->width, source->height));
        return clone;
    }
    copy(0, 0, clone->size);
    return clone;
}

QKImage* QKImage_cloneHeader(const QKImage* source) {
    if (source == nullptr) return nullptr;
    return QKImage_createEmpty(source->width, source->height, source->format);
}

int32_t QKImage_wrap(QKImage* image, void* data, int32_t size, uint32_t chroma_offset) {
    if (image == nullptr) return QK_FAIL(QK_ERROR_NULL_PARAM);
    if (data == nullptr) return QK_FAIL(QK_ERROR_NULL_PARAM);
    // Wrapping the image's own buffer would free it and then point at freed memory.
    if (data == image->data && image->isWrapped == 0) return QK_FAIL(QK_ERROR_INVALID_PARAM);
    QKImage_deallocate(image);
    image->data = static_cast<uint8_t*>(data);
    image->isWrapped = 1;
    image->size = size > 0 ? static_cast<uint64_t>(size) : 0;
    image->chromaOffset = chroma_offset;
    if (image->size != 0) return size;
    return static_cast<int32_t>(QKImage_requiredSize(image->width, image->height, image->format));
}
