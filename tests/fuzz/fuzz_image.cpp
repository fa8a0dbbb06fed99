// Fuzz target: the image lifecycle and conversion. Two images (Frame::make)
// go through a sequence of operations, each checked against what the header
// promises: fields and bytes after every call, results against the plain
// reference conversion, the caller's buffers never freed by the library.
//
// Input: two images (Frame::make), then operations until the input ends (at
// most 12), each an operation byte mod 9 and a slot byte (bit 0: image 0 or
// 1; for convert bit 0 is the source and bit 1 the destination):
//   0 make again; 1 allocate (then a seed byte for the new pixels);
//   2 wrap: a byte mod 4 (0: null buffer, 1: the image's own buffer, else a
//     new caller's buffer: chroma(), recorded(), seed byte);
//   3 clone; 4 cloneHeader; 5 deallocate; 6 reset; 7 convert;
//   8 copyAndConvert into format().
#include <stdint.h>
#include <string.h>

#include <algorithm>
#include <vector>

#include "convert/reference_frame.h"
#include "fuzz/fuzz_support.h"
#include "qkcore/qk_image.h"

namespace {

using qkfuzz::check;
using qkfuzz::claimed_bytes;
using qkfuzz::Frame;
using qkfuzz::Input;
using qkfuzz::is_yuv420;
using qkfuzz::kMaxBytes;
using qkfuzz::rule_bytes;
using qkfuzz::Snapshot;

bool convertible(uint32_t format) {
    return std::find(qktest::kConvertibleFormats, qktest::kConvertibleFormats + 13, format) !=
           qktest::kConvertibleFormats + 13;
}

uint64_t luma_bytes(const QKImage& image) {
    return static_cast<uint64_t>(image.width) * static_cast<uint64_t>(image.height);
}

uint64_t chroma_base(const QKImage& image) {
    return image.chromaOffset != 0 ? image.chromaOffset : luma_bytes(image);
}

// Bytes of a buffer that a w x h picture of the format reaches,
// 4:2:0 chroma at the given base included.
uint64_t extent(uint32_t format, uint64_t base, int32_t width, int32_t height) {
    const uint64_t rule = rule_bytes(width, height, format);
    if (!is_yuv420(format)) return rule;
    return std::max(rule, base + uint64_t(width) * uint64_t(height) / 2);
}

// The bytes `dst` must hold after a successful conversion of `src` into it,
// `dst` still as it was before, the buffers `srcLength` and `capacity` bytes
// long; false when the result is not defined byte for byte (4:2:0 chroma
// laid over the luma) or either picture lies outside its buffer (the
// conversion must then fail, or show under AddressSanitizer).
bool expected_conversion(const QKImage& src, size_t srcLength, const QKImage& dst, size_t capacity,
                         std::vector<uint8_t>* out) {
    // The destination's chroma base at the source's dimensions.
    const uint64_t luma = luma_bytes(src), dstBase = dst.chromaOffset != 0 ? dst.chromaOffset : luma;
    if (is_yuv420(dst.format) && dstBase < luma) return false;
    // 4:2:0 takes even sizes, packed 4:2:2 even widths: a conversion refuses
    // others, and the reference would read past their last pair.
    for (uint32_t format : {src.format, dst.format}) {
        const bool packed = format == QK_FORMAT_YUYV || format == QK_FORMAT_YVYU;
        if ((is_yuv420(format) || packed) && src.width % 2 != 0) return false;
        if (is_yuv420(format) && src.height % 2 != 0) return false;
    }
    if (extent(src.format, chroma_base(src), src.width, src.height) > srcLength ||
        extent(dst.format, dstBase, src.width, src.height) > capacity) {
        return false;
    }
    out->assign(dst.data, dst.data + capacity);
    if (src.format != dst.format) {
        *out = qktest::reference_conversion(src, dst, capacity);
        return true;
    }
    // Same format: one block of the recorded size when both images record
    // the same size (and 4:2:0 ones the same chroma offset), else the
    // picture: 4:2:0 luma and chroma each from where its image keeps it.
    if (dst.size != 0 && dst.size == src.size && (!is_yuv420(src.format) || dst.chromaOffset == src.chromaOffset)) {
        if (dst.size > srcLength || dst.size > capacity) return false;
        std::copy_n(src.data, dst.size, out->begin());
        return true;
    }
    if (is_yuv420(src.format)) {
        std::copy_n(src.data, luma, out->begin());
        std::copy_n(src.data + chroma_base(src), luma / 2, out->begin() + dstBase);
        return true;
    }
    std::copy_n(src.data, rule_bytes(src.width, src.height, src.format), out->begin());
    return true;
}

void allocate(Input& in, Frame& frame) {
    QKImage* image = frame.image;
    const uint8_t seed = in.byte();
    const uint64_t bytes = image->size != 0 ? image->size : rule_bytes(image->width, image->height, image->format);
    if (image->data == nullptr && bytes > kMaxBytes) return;
    const Snapshot before(image, frame.length());
    const int32_t result = QKImage_allocate(image);
    if (before.data != nullptr) {
        check(result == static_cast<int32_t>(std::min<uint64_t>(QKImage_size(image), INT32_MAX)),
              "allocate: an image with a buffer must report its size");
        check(Snapshot(image, frame.length()) == before, "allocate changed an image that had a buffer");
        return;
    }
    if (bytes == 0 || (image->format == QK_FORMAT_PCL && bytes < 4)) {
        check(result < 0 && Snapshot(image, 0) == before, "allocate: an unusable size must be refused untouched");
        return;
    }
    check(result == static_cast<int32_t>(bytes), "allocate: result is not the byte count");
    check(image->data != nullptr && image->isWrapped == 0 && image->size == bytes && image->chromaOffset == 0 &&
              image->width == before.width && image->height == before.height && image->format == before.format,
          "allocate: fields of the new buffer");
    if (image->format == QK_FORMAT_PCL) {
        uint32_t count;
        memcpy(&count, image->data, sizeof(count));
        check(count == static_cast<uint32_t>(image->width) * static_cast<uint32_t>(image->height),
              "allocate: PCL header does not hold the point count");
    }
    qkfuzz::fill(image->data, bytes, seed);
}

void wrap(Input& in, Frame& frame) {
    QKImage* image = frame.image;
    const Snapshot before(image, frame.length());
    const int mode = in.byte() % 4;
    if (mode == 0 || (mode == 1 && image->data == nullptr)) {
        check(QKImage_wrap(image, nullptr, 64, 0) == QK_ERROR_NULL_PARAM, "wrap: null buffer must be refused");
        check(Snapshot(image, frame.length()) == before, "wrap: a refusal changed the image");
        return;
    }
    if (mode == 1 && image->isWrapped == 0) {
        check(QKImage_wrap(image, image->data, 0, 0) == QK_ERROR_INVALID_PARAM,
              "wrap: the image's own buffer must be refused");
        check(Snapshot(image, frame.length()) == before, "wrap: a refusal changed the image");
        return;
    }
    uint8_t* buffer = image->data;  // mode 1: the caller's buffer again
    size_t length = frame.length();
    const uint32_t chroma = mode == 1 ? image->chromaOffset : Frame::chroma(in, image->width, image->height);
    const int32_t size = Frame::recorded(in, claimed_bytes(image->width, image->height, image->format, 0, chroma));
    if (mode != 1) {
        const uint64_t claim =
            claimed_bytes(image->width, image->height, image->format, size > 0 ? size : 0, chroma);
        if (claim > kMaxBytes) return;
        buffer = frame.new_buffer(claim, in.byte());
        length = claim;
    } else if (claimed_bytes(image->width, image->height, image->format, size > 0 ? size : 0, chroma) > length) {
        return;  // the same buffer cannot claim more than it has
    }
    const int32_t result = QKImage_wrap(image, buffer, size, chroma);
    frame.adopt(buffer, length);
    const int32_t expected =
        size > 0 ? size : static_cast<int32_t>(rule_bytes(image->width, image->height, image->format));
    check(result == expected, "wrap: result is not the byte count");
    check(image->data == buffer && image->isWrapped == 1 && image->size == uint64_t(size > 0 ? size : 0) &&
              image->chromaOffset == chroma && image->width == before.width && image->height == before.height &&
              image->format == before.format,
          "wrap: fields of the wrapped buffer");
}

void clone(Frame& frame) {
    const QKImage* source = frame.image;
    const uint64_t rule = rule_bytes(source->width, source->height, source->format);
    if (rule > kMaxBytes) return;
    const Snapshot before(source, frame.length());
    QKImage* copy = QKImage_clone(source);
    check(Snapshot(source, frame.length()) == before, "clone changed its source");
    check((copy != nullptr) == (source->data != nullptr && rule != 0),
          "clone: null exactly for a source without buffer or size rule");
    if (copy == nullptr) return;
    check(copy->data != nullptr && copy->isWrapped == 0 && copy->size == rule && copy->chromaOffset == 0 &&
              copy->width == source->width && copy->height == source->height && copy->format == source->format,
          "clone: fields of the copy");
    // The source's picture as far as its recorded size (or its buffer)
    // reaches, zeros past it; 4:2:0 chroma kept elsewhere comes right behind
    // the luma.
    const uint64_t available = source->size != 0 ? std::min<uint64_t>(source->size, frame.length()) : frame.length();
    auto part = [&](uint64_t to, uint64_t from, uint64_t length) {
        const uint64_t present = from < available ? std::min(length, available - from) : 0;
        const std::vector<uint8_t> zeros(length - present + 1);
        return (present == 0 || memcmp(copy->data + to, source->data + from, present) == 0) &&
               memcmp(copy->data + to + present, zeros.data(), length - present) == 0;
    };
    bool same;
    if (is_yuv420(source->format) && source->chromaOffset != 0) {
        const uint64_t luma = luma_bytes(*source);
        same = part(0, 0, luma) && part(luma, source->chromaOffset, luma / 2);
    } else {
        same = part(0, 0, rule);
    }
    check(same, "clone: bytes differ from the source's picture");
    QKImage_destroy(copy);
}

void clone_header(const Frame& frame) {
    const QKImage* source = frame.image;
    const Snapshot before(source, frame.length());
    QKImage* header = QKImage_cloneHeader(source);
    check(Snapshot(source, frame.length()) == before, "cloneHeader changed its source");
    check(header != nullptr && header->data == nullptr && header->size == 0 && header->isWrapped == 0 &&
              header->chromaOffset == 0 && header->width == source->width && header->height == source->height &&
              header->format == source->format,
          "cloneHeader: fields of the header");
    QKImage_destroy(header);
}

void convert(Frame& from, Frame& to) {
    const QKImage* src = from.image;
    QKImage* dst = to.image;
    const bool self = &from == &to;
    const Snapshot srcBefore(src, from.length()), dstBefore(dst, to.length());
    std::vector<uint8_t> expected;
    bool defined = false;
    const bool pair = (convertible(src->format) && convertible(dst->format)) || src->format == dst->format;
    if (src->data != nullptr && dst->data != nullptr && pair &&
        rule_bytes(src->width, src->height, dst->format) != 0) {
        defined = expected_conversion(*src, from.length(), *dst, to.length(), &expected);
    }
    // Two whole pictures of one size, formats of the families, even sizes:
    // nothing to refuse.
    const bool plain = src->data != nullptr && dst->data != nullptr && convertible(src->format) &&
                       convertible(dst->format) && src->width == dst->width && src->height == dst->height &&
                       src->width > 0 && src->height > 0 && src->width % 2 == 0 && src->height % 2 == 0 &&
                       src->size == 0 && dst->size == 0 && src->chromaOffset == 0 && dst->chromaOffset == 0 &&
                       rule_bytes(src->width, src->height, src->format) != 0 &&
                       rule_bytes(dst->width, dst->height, dst->format) != 0;

    const int32_t status = QKImage_convert(src, dst);
    if (!self) check(Snapshot(src, from.length()) == srcBefore, "convert changed its source");
    const Snapshot after(dst, to.length());
    if (status != QK_OK) {
        check(!plain, "convert refused two whole pictures of the families");
        check(after.bytes == dstBefore.bytes, "convert: a refusal changed the destination's bytes");
        // Documented: a pair outside the families is refused only after the
        // destination took the source's dimensions.
        const bool taken = status == QK_ERROR_UNSUPPORTED && after.width == srcBefore.width &&
                           after.height == srcBefore.height;
        check(after.data == dstBefore.data && after.format == dstBefore.format && after.size == dstBefore.size &&
                  after.isWrapped == dstBefore.isWrapped && after.chromaOffset == dstBefore.chromaOffset &&
                  (taken || (after.width == dstBefore.width && after.height == dstBefore.height)),
              "convert: a refusal changed the destination's fields");
        return;
    }
    check(pair, "convert: success for a pair outside the families");
    check(after.data == dstBefore.data && after.format == dstBefore.format && after.size == dstBefore.size &&
              after.isWrapped == dstBefore.isWrapped && after.chromaOffset == dstBefore.chromaOffset &&
              after.width == srcBefore.width && after.height == srcBefore.height,
          "convert: fields of the destination after success");
    if (defined) check(after.bytes == expected, "convert: bytes differ from the reference conversion");
}

void copy_and_convert(Input& in, const Frame& frame) {
    const QKImage* src = frame.image;
    const uint32_t format = in.format();
    const uint64_t rule = rule_bytes(src->width, src->height, format);
    if (rule > kMaxBytes) return;
    const Snapshot before(src, frame.length());
    QKImage* copy = QKImage_copyAndConvert(src, format);
    check(Snapshot(src, frame.length()) == before, "copyAndConvert changed its source");
    if (copy == nullptr) return;
    check(copy->data != nullptr && copy->isWrapped == 0 && copy->size == rule && copy->chromaOffset == 0 &&
              copy->width == src->width && copy->height == src->height && copy->format == format,
          "copyAndConvert: fields of the copy");
    const bool pair = (convertible(src->format) && convertible(format)) || src->format == format;
    check(pair, "copyAndConvert: a copy for a pair outside the families");
    // The copy's own bytes stand for whatever the conversion leaves alone.
    std::vector<uint8_t> expected;
    if (expected_conversion(*src, frame.length(), *copy, rule, &expected)) {
        check(std::equal(expected.begin(), expected.end(), copy->data),
              "copyAndConvert: bytes differ from the reference conversion");
    }
    QKImage_destroy(copy);
}

void null_arguments() {
    check(QKImage_size(nullptr) == 0, "size(null)");
    check(QKImage_allocate(nullptr) < 0 && QKImage_wrap(nullptr, nullptr, 0, 0) < 0, "allocate or wrap of null");
    check(QKImage_clone(nullptr) == nullptr && QKImage_cloneHeader(nullptr) == nullptr, "clone of null");
    check(QKImage_convert(nullptr, nullptr) < 0 && QKImage_copyAndConvert(nullptr, QK_FORMAT_RGBA) == nullptr,
          "conversion of null");
    QKImage_deallocate(nullptr);
    QKImage_reset(nullptr);
    QKImage_destroy(nullptr);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    static const bool ready = (qkfuzz::quiet_log(), null_arguments(), true);
    (void)ready;
    Input in(data, size);
    Frame frames[2];
    frames[0].make(in);
    frames[1].make(in);
    for (int step = 0; step < 12 && !in.empty(); ++step) {
        const uint8_t op = in.byte() % 9, slot = in.byte();
        Frame& frame = frames[slot & 1];
        QKImage* image = frame.image;
        switch (op) {
            case 0: frame.make(in); break;
            case 1: allocate(in, frame); break;
            case 2: wrap(in, frame); break;
            case 3: clone(frame); break;
            case 4: clone_header(frame); break;
            case 5: {
                const Snapshot before(image, 0);
                QKImage_deallocate(image);
                check(image->data == nullptr && image->isWrapped == 0 && image->size == 0 &&
                          image->chromaOffset == 0 && image->width == before.width &&
                          image->height == before.height && image->format == before.format,
                      "deallocate: fields after");
                break;
            }
            case 6:
                QKImage_reset(image);
                check(image->data == nullptr && image->isWrapped == 0 && image->size == 0 &&
                          image->chromaOffset == 0 && image->width == 0 && image->height == 0 && image->format == 0,
                      "reset: fields after");
                break;
            case 7: convert(frame, frames[(slot >> 1) & 1]); break;
            default: copy_and_convert(in, frame); break;
        }
    }
    return 0;
}
