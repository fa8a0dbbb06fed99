// JPEG encoding through the codec module, and decoding: the codec module
// first for JPEG data, the platform's picture decoder and a conversion
// otherwise.
#include <stdint.h>
#include <stdlib.h>

#include <algorithm>

#include "codec/codec.h"
#include "image/checks.h"
#include "platform/module.h"
#include "platform/picture.h"
#include "platform/raster.h"
#include "qkcore/qk_image.h"
#include "util/log.h"
#include "util/status.h"
#include "veljpeginterface.h"

QKImage* QKImage_encodeToJpeg(const QKImage* image, int32_t quality) {
    if (image == nullptr || image->data == nullptr) return nullptr;
    quality = qk::output_quality(quality);
    auto fail = [image]() -> QKImage* {
        QK_LOG(QK_LOG_ERROR, "Encoding failed (%dx%d %4.4s)", image->width, image->height,
               QK_FOURCC_STR(image->format));
        return nullptr;
    };
    // Zero only: negative dimensions are the codec's to refuse.
    if (image->format == 0 || image->width == 0 || image->height == 0) return fail();

    qk::platform::Module codec = qk::platform::Module::open(qk::kJpegModule);
    const auto encode = codec.function<FastJpegEncodeFn>("fastJpegEncode");
    if (encode == nullptr) return fail();
    uint32_t length = 0;
    void* stream = encode(image->data, static_cast<uint32_t>(image->size), image->width, image->height,
                          image->format, &length, quality);
    codec.close();
    if (stream == nullptr) return fail();

    QKImage* result = QKImage_createEmpty(image->width, image->height, QK_FORMAT_JPEG);
    if (result == nullptr) {
        free(stream);
        return fail();
    }
    result->data = static_cast<uint8_t*>(stream);
    result->size = length;
    return result;
}

namespace {

bool starts_as_jpeg(const uint8_t* data, uint64_t size) { return size >= 2 && data[0] == 0xFF && data[1] == 0xD8; }

// The codec module decodes straight into the target's format; its buffer
// replaces the target's. False, silently and with the target untouched,
// when the module is missing or declines.
bool decode_with_codec(QKImage& image, const uint8_t* data, uint64_t size) {
    qk::platform::Module codec = qk::platform::Module::open(qk::kJpegModule);
    const auto decode = codec.function<FastJpegDecodeFn>("fastJpegDecode");
    if (decode == nullptr) return false;
    void* pixels = decode(data, static_cast<uint32_t>(size), &image.width, &image.height, image.format);
    codec.close();
    if (pixels == nullptr) return false;
    QKImage_deallocate(&image);
    image.data = static_cast<uint8_t*>(pixels);
    image.isWrapped = 0;
    // The module's buffer is exactly the picture, chroma right after luma: a
    // size or chroma offset recorded for an earlier buffer no longer holds.
    image.size = 0;
    image.chromaOffset = 0;
    return true;
}

// True when the target can take a picture of these dimensions: a buffer it
// has, or a size preset for the one it will get, must hold the picture in
// the target's format, measured before the target takes the dimensions
// (whose size rule would otherwise vouch for any buffer).
bool target_fits(const QKImage& image, int32_t width, int32_t height) {
    if (image.data == nullptr && image.size == 0) return true;
    QKImage resized;  // no buffer: nothing for its destructor to free
    resized.width = width;
    resized.height = height;
    resized.format = image.format;
    resized.size = QKImage_size(&image);
    resized.chromaOffset = image.chromaOffset;
    return resized.size != 0 && qk::buffer_holds_image(resized);
}

int32_t decode_with_platform(QKImage& image, const uint8_t* data, uint64_t size) {
    qk::platform::Bitmap picture;
    if (!qk::platform::decode_picture(data, static_cast<size_t>(size), picture)) {
        return QK_FAIL(QK_ERROR_CODEC_FAILED);
    }
    if (!target_fits(image, picture.width(), picture.height())) return QK_FAIL(QK_ERROR_INVALID_SIZE);
    image.width = picture.width();
    image.height = picture.height();
    if (image.data == nullptr) {
        const int32_t allocated = QKImage_allocate(&image);
        if (allocated < 0) return allocated;
    }

    // RGBA pixels land in the target's own buffer; others come through a
    // temporary RGBA image, released (with its buffer) on every path.
    QKImage rgba;
    rgba.width = image.width;
    rgba.height = image.height;
    rgba.format = QK_FORMAT_RGBA;
    if (image.format == QK_FORMAT_RGBA) {
        const uint64_t bytes = image.size != 0 ? image.size : picture.byte_count();
        const int32_t wrapped =
            QKImage_wrap(&rgba, image.data, static_cast<int32_t>(std::min<uint64_t>(bytes, INT32_MAX)), 0);
        if (wrapped < 0) return wrapped;
    } else {
        const int32_t allocated = QKImage_allocate(&rgba);
        if (allocated < 0) return allocated;
    }
    // The decoder hands out unpremultiplied RGBA for every kind of picture.
    if (!picture.copy_to(rgba.data, QKImage_size(&rgba))) return QK_FAIL(QK_ERROR_CODEC_FAILED);
    if (rgba.data != image.data) return QKImage_convert(&rgba, &image);
    return QK_OK;
}

}  // namespace

int32_t QKImage_decodeFromJpeg(QKImage* image, const void* data, uint64_t size) {
    if (image == nullptr || data == nullptr || size == 0) return QK_FAIL(QK_ERROR_NULL_PARAM);
    const uint8_t* bytes = static_cast<const uint8_t*>(data);
    if (starts_as_jpeg(bytes, size) && static_cast<uint32_t>(size) != 0 && image->format != 0 &&
        decode_with_codec(*image, bytes, size)) {
        return QK_OK;
    }
    return decode_with_platform(*image, bytes, size);
}
