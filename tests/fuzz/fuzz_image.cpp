// Fuzz target: the image lifecycle and conversion. Two images (Frame::make)
// go through a sequence of operations over caller buffers of exactly the
// size they claim. A refusal leaves the images as they were; a success
// leaves a buffer that holds its picture, and a conversion gives what the
// reference conversion of the unit tests gives (a copy for one format).
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

#include <algorithm>
#include <tuple>
#include <vector>

#include "convert/reference_frame.h"
#include "fuzz/fuzz_support.h"
#include "qkcore/qk_image.h"
#include "support/images.h"

namespace {

using namespace qkfuzz;
using qktest::is_yuv420;

bool convertible(uint32_t format) {
    return std::count(qktest::kConvertibleFormats, qktest::kConvertibleFormats + 13, format) != 0;
}
bool pair(uint32_t from, uint32_t to) { return from == to || (convertible(from) && convertible(to)); }

// The bytes `dst` (a buffer of `capacity` bytes) must hold after a
// conversion from `src` (`srcLength` bytes): the reference conversion, or for
// one format a copy (one block of the recorded size where both images record
// the same one, and 4:2:0 ones the same chroma offset; else the picture, 4:2:0
// planes each from where its image keeps it). None where the result is not
// defined byte for byte (4:2:0 chroma laid over the luma, sizes that split no
// chroma block) or either picture lies outside its buffer.
std::vector<uint8_t> expected_conversion(const QKImage& src, size_t srcLength, const QKImage& dst, size_t capacity) {
    const uint64_t luma = uint64_t(src.width) * uint64_t(src.height);
    const uint64_t srcBase = src.chromaOffset != 0 ? src.chromaOffset : luma;
    const uint64_t dstBase = dst.chromaOffset != 0 ? dst.chromaOffset : luma;
    if (src.data == nullptr || dst.data == nullptr || !pair(src.format, dst.format) ||
        QKImage_requiredSize(src.width, src.height, src.format) == 0 || (is_yuv420(dst.format) && dstBase < luma)) {
        return {};
    }
    for (uint32_t format : {src.format, dst.format}) {
        const bool packed = format == QK_FORMAT_YUYV || format == QK_FORMAT_YVYU;
        if ((is_yuv420(format) || packed) && src.width % 2 != 0) return {};
        if (is_yuv420(format) && src.height % 2 != 0) return {};
    }
    if (qkfuzz::claimed_bytes(src.width, src.height, src.format, 0, src.chromaOffset) > srcLength ||
        qkfuzz::claimed_bytes(src.width, src.height, dst.format, 0, dst.chromaOffset) > capacity) {
        return {};
    }
    if (src.format != dst.format) return qktest::reference_conversion(src, dst, capacity);
    std::vector<uint8_t> out(dst.data, dst.data + capacity);
    if (dst.size != 0 && dst.size == src.size && (!is_yuv420(src.format) || dst.chromaOffset == src.chromaOffset)) {
        if (dst.size > srcLength || dst.size > capacity) return {};
        std::copy_n(src.data, dst.size, out.begin());
    } else if (is_yuv420(src.format)) {
        std::copy_n(src.data, luma, out.begin());
        std::copy_n(src.data + srcBase, luma / 2, out.begin() + dstBase);
    } else {
        std::copy_n(src.data, QKImage_requiredSize(src.width, src.height, src.format), out.begin());
    }
    return out;
}

// Allocating gives an image without buffer one that holds its picture, or
// its recorded size; an image with a buffer keeps it. Either way the result
// is the byte count, or a refusal that changed nothing.
void allocate(Input& in, Frame& frame) {
    QKImage* image = frame.image;
    const uint8_t seed = in.byte();
    if (image->data == nullptr && QKImage_size(image) > qkfuzz::kMaxBytes) return;
    const Snapshot before(frame);
    const int32_t result = QKImage_allocate(image);
    check(result < 0 ? Snapshot(frame) == before : QKImage_size(image) == uint64_t(result) && image->data != nullptr,
          "allocate: a refusal that changed the image, or a result that is not the byte count");
    if (before.data == nullptr && result >= 0) {
        check_holds(frame, before.size == 0, "allocate: a buffer that does not hold the picture");
        qkfuzz::fill(image->data, image->size, seed);
    }
}

// Wrapping takes a caller's buffer, never a null one or the image's own.
void wrap(Input& in, Frame& frame) {
    QKImage* image = frame.image;
    const Snapshot before(frame);
    const int mode = in.byte() % 4;
    if (mode == 0 || (mode == 1 && image->isWrapped == 0)) {  // no buffer, or the image's own
        const int32_t status = QKImage_wrap(image, mode == 0 ? nullptr : image->data, 0, 0);
        return check(status < 0 && Snapshot(frame) == before, "wrap: a null or owned buffer must be refused untouched");
    }
    uint8_t* buffer = image->data;  // mode 1: the caller's buffer again
    size_t length = frame.length();
    const int32_t width = image->width, height = image->height;
    const uint32_t chroma = mode == 1 ? image->chromaOffset : Frame::chroma(in, width, height);
    const int32_t size = Frame::recorded(in, qkfuzz::claimed_bytes(width, height, image->format, 0, chroma));
    const uint64_t claim = qkfuzz::claimed_bytes(width, height, image->format, std::max(size, 0), chroma);
    if (claim > (mode == 1 ? length : qkfuzz::kMaxBytes)) return;  // the same buffer cannot claim more than it has
    if (mode != 1) buffer = frame.new_buffer(length = claim, in.byte());
    const int32_t result = QKImage_wrap(image, buffer, size, chroma);
    frame.adopt(buffer, length);
    check(result == int32_t(QKImage_size(image)) && image->data == buffer && image->isWrapped != 0 &&
              image->chromaOffset == chroma,
          "wrap: fields of the wrapped buffer");
}

// A clone of a source with buffer and size rule is a buffer of its own that
// holds the picture; a header clone has none.
void clone(const Frame& frame, bool header) {
    const QKImage* source = frame.image;
    const uint64_t rule = QKImage_requiredSize(source->width, source->height, source->format);
    if (rule > qkfuzz::kMaxBytes) return;
    const Snapshot before(frame);
    Frame copy;
    copy.image = header ? QKImage_cloneHeader(source) : QKImage_clone(source);
    check(Snapshot(frame) == before, "clone changed its source");
    check((copy.image != nullptr) == (header || (source->data != nullptr && rule != 0)), "clone: null, or not null");
    if (copy.image == nullptr) return;
    check(copy.image->width == source->width && copy.image->height == source->height &&
              copy.image->format == source->format && (copy.image->data == nullptr) == header,
          "clone: fields of the copy");
    if (!header) check_holds(copy, true, "clone: a copy that does not hold the picture");
}

void convert(Frame& from, Frame& to) {
    const QKImage* src = from.image;
    QKImage* dst = to.image;
    const Snapshot srcBefore(from), dstBefore(to);
    const std::vector<uint8_t> expected = expected_conversion(*src, from.length(), *dst, to.length());
    const int32_t status = QKImage_convert(src, dst);
    if (&from != &to) check(Snapshot(from) == srcBefore, "convert changed its source");
    const Snapshot after(to);
    check(std::tie(after.data, after.format, after.isWrapped, after.size, after.chromaOffset) ==
              std::tie(dstBefore.data, dstBefore.format, dstBefore.isWrapped, dstBefore.size, dstBefore.chromaOffset),
          "convert: the destination's buffer or format changed");
    const bool taken = after.width == srcBefore.width && after.height == srcBefore.height;
    if (status != QK_OK) {
        // Documented: a pair outside the families is refused only after the
        // destination took the source's dimensions.
        const bool kept = after.width == dstBefore.width && after.height == dstBefore.height;
        return check(after.bytes == dstBefore.bytes && (kept || (taken && status == QK_ERROR_UNSUPPORTED)),
                     "convert: a refusal changed the destination");
    }
    check(taken && pair(srcBefore.format, dstBefore.format), "convert: success outside the families or its size");
    check_holds(to, true, "convert: success into a buffer short of the picture");
    check(expected.empty() || after.bytes == expected, "convert: bytes differ from the reference conversion or copy");
}

void copy_and_convert(Input& in, const Frame& frame) {
    const QKImage* src = frame.image;
    const uint32_t format = in.format();
    const uint64_t rule = QKImage_requiredSize(src->width, src->height, format);
    if (rule > qkfuzz::kMaxBytes) return;
    const Snapshot before(frame);
    Frame copy;
    copy.image = QKImage_copyAndConvert(src, format);
    check(Snapshot(frame) == before, "copyAndConvert changed its source");
    if (copy.image == nullptr) return;
    check(copy.image->isWrapped == 0 && copy.image->width == src->width && copy.image->height == src->height &&
              copy.image->format == format && pair(src->format, format),
          "copyAndConvert: fields of the copy");
    check_holds(copy, true, "copyAndConvert: a copy that does not hold the picture");
    // The copy's own bytes stand for whatever the conversion leaves alone.
    const std::vector<uint8_t> expected = expected_conversion(*src, frame.length(), *copy.image, rule);
    check(std::equal(expected.begin(), expected.end(), copy.image->data),
          "copyAndConvert: bytes differ from the reference conversion or copy");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    static const bool ready = (qkfuzz::quiet_log(), true);
    (void)ready;
    Input in(data, size);
    Frame frames[2];
    frames[0].make(in);
    frames[1].make(in);
    for (int step = 0; step < 12 && !in.empty(); ++step) {
        const uint8_t op = in.byte() % 9, slot = in.byte();
        Frame& frame = frames[slot & 1];
        const int32_t width = frame.image->width, height = frame.image->height;
        const uint32_t format = frame.image->format;
        switch (op) {
            case 0: frame.make(in); break;
            case 1: allocate(in, frame); break;
            case 2: wrap(in, frame); break;
            case 3: case 4: clone(frame, op == 4); break;
            case 5:
                QKImage_deallocate(frame.image);
                check(Snapshot(frame).fields() == std::make_tuple(nullptr, width, height, format, 0u, uint64_t{0}, 0u),
                      "deallocate: fields after");
                break;
            case 6:
                QKImage_reset(frame.image);
                check(Snapshot(frame).fields() == std::make_tuple(nullptr, 0, 0, 0u, 0u, uint64_t{0}, 0u),
                      "reset: fields after");
                break;
            case 7: convert(frame, frames[(slot >> 1) & 1]); break;
            default: copy_and_convert(in, frame); break;
        }
    }
    return 0;
}
