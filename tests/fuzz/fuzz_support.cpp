#include "fuzz/fuzz_support.h"

#include <malloc.h>
#include <stdarg.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>

#include <algorithm>

#include "qkcore/qk_log.h"

namespace qkfuzz {

void check(bool ok, const char* what) {
    if (ok) return;
    fprintf(stderr, "fuzz check failed: %s\n", what);
    abort();
}

namespace {

int format_and_drop(int level, ...) {
    va_list args;
    va_start(args, level);
    const char* format = va_arg(args, const char*);
    char line[512];
    vsnprintf(line, sizeof(line), format, args);
    va_end(args);
    return 0;
}

}  // namespace

void quiet_log() { HX_LogMsg = format_and_drop; }

uint8_t Input::byte() {
    if (size_ == 0) return 0;
    --size_;
    return *data_++;
}

uint16_t Input::u16() {
    const uint16_t low = byte();
    return static_cast<uint16_t>(low | byte() << 8);
}

uint32_t Input::u32() {
    const uint32_t low = u16();
    return low | static_cast<uint32_t>(u16()) << 16;
}

int32_t Input::range(int32_t lo, int32_t hi) {
    const uint64_t span = static_cast<uint64_t>(int64_t{hi} - lo) + 1;
    const uint64_t pick = span <= 256 ? byte() % span : u32() % span;
    return static_cast<int32_t>(lo + static_cast<int64_t>(pick));
}

int32_t Input::dimension() {
    const uint8_t b = byte();
    return b < 0xC0 ? b % 65 : kHugeDimensions[(b - 0xC0) % 8];
}

uint32_t Input::format() {
    const int pick = byte() % 18;
    if (pick < 16) return kFormats[pick];
    return pick == 16 ? u32() : 0;
}

int32_t Input::offset() {
    const uint8_t b = byte();
    return b < 0xC0 ? b % 129 - 64 : kHugeOffsets[(b - 0xC0) % 8];
}

std::string Input::text(size_t max) {
    const size_t length = byte() % (max + 1);
    std::string text;
    for (size_t i = 0; i < length && !empty(); ++i) text.push_back(static_cast<char>(byte()));
    return text.substr(0, text.find('\0'));
}

std::vector<uint8_t> Input::rest() {
    std::vector<uint8_t> bytes(data_, data_ + size_);
    data_ += size_;
    size_ = 0;
    return bytes;
}

bool is_yuv420(uint32_t f) {
    return f == QK_FORMAT_NV12 || f == QK_FORMAT_NV21 || f == QK_FORMAT_YV12 || f == QK_FORMAT_YUVP;
}

bool is_rgb(uint32_t f) {
    return f == QK_FORMAT_RGBA || f == QK_FORMAT_BGRA || f == QK_FORMAT_ARGB || f == QK_FORMAT_ABGR ||
           f == QK_FORMAT_RGB8 || f == QK_FORMAT_BGR8;
}

uint64_t rule_bytes(int32_t width, int32_t height, uint32_t format) {
    if (width < 1 || height < 1) return 0;
    const unsigned __int128 pixels = static_cast<unsigned __int128>(width) * static_cast<unsigned>(height);
    unsigned __int128 bytes;
    switch (format) {
        case QK_FORMAT_RGBA:
        case QK_FORMAT_BGRA:
        case QK_FORMAT_ARGB:
        case QK_FORMAT_ABGR: bytes = 4 * pixels; break;
        case QK_FORMAT_RGB8:
        case QK_FORMAT_BGR8: bytes = 3 * pixels; break;
        case QK_FORMAT_GREY: bytes = pixels; break;
        case QK_FORMAT_YUYV:
        case QK_FORMAT_YVYU:
        case QK_FORMAT_D16: bytes = 2 * pixels; break;
        case QK_FORMAT_NV12:
        case QK_FORMAT_NV21:
        case QK_FORMAT_YV12:
        case QK_FORMAT_YUVP: bytes = (3 * pixels + 1) / 2; break;
        case QK_FORMAT_PCL: bytes = 16 * pixels + 36; break;
        default: return 0;
    }
    return bytes > INT32_MAX ? 0 : static_cast<uint64_t>(bytes);
}

uint64_t claimed_bytes(int32_t width, int32_t height, uint32_t format, uint64_t size, uint32_t chromaOffset) {
    if (size != 0) return size;
    const uint64_t rule = rule_bytes(width, height, format);
    if (rule == 0 || chromaOffset == 0 || !is_yuv420(format)) return rule;
    const uint64_t luma = static_cast<uint64_t>(width) * static_cast<uint64_t>(height);
    const uint64_t end = uint64_t{chromaOffset} + luma / 2;
    return end > rule ? end : rule;
}

void fill(uint8_t* data, size_t bytes, uint8_t seed) {
    // Eight bytes a step: this runs over every buffer of every input.
    uint64_t state = 0x9E3779B97F4A7C15u ^ (seed * 0x100000001B3u);
    for (size_t i = 0; i < bytes; i += sizeof(state)) {
        state ^= state << 13, state ^= state >> 7, state ^= state << 17;
        memcpy(data + i, &state, std::min(sizeof(state), bytes - i));
    }
}

Frame::~Frame() {
    QKImage_destroy(image);
    for (uint8_t* buffer : owned_) free(buffer);
}

uint8_t* Frame::new_buffer(size_t bytes, uint8_t seed) {
    uint8_t* buffer = static_cast<uint8_t*>(malloc(bytes != 0 ? bytes : 1));
    check(buffer != nullptr, "out of memory for a caller's buffer");
    fill(buffer, bytes, seed);
    owned_.push_back(buffer);
    return buffer;
}

uint32_t Frame::chroma(Input& in, int32_t width, int32_t height) {
    const uint32_t luma = static_cast<uint32_t>(static_cast<uint64_t>(static_cast<uint32_t>(width)) *
                                                static_cast<uint32_t>(height));
    switch (in.byte() % 6) {
        case 1: return luma;
        case 2: return luma + 2u * in.byte();
        case 3: return in.byte();
        case 4: return in.u32();
        default: return 0;
    }
}

int32_t Frame::recorded(Input& in, uint64_t claim) {
    uint64_t size;
    switch (in.byte() % 5) {
        case 0: size = claim; break;
        case 1: {
            const uint64_t cut = 1 + uint64_t{in.byte()};
            size = claim > cut ? claim - cut : 1;
            break;
        }
        case 2: size = claim + 1 + in.byte(); break;
        case 3: size = 1 + uint64_t{in.u16()}; break;
        default: return -1;
    }
    if (size == 0 || size > kMaxBytes) size = 1 + uint64_t{in.byte()};
    return static_cast<int32_t>(size);
}

void Frame::make(Input& in) {
    QKImage_destroy(image);
    image = nullptr;
    data_ = nullptr, length_ = 0;
    const int32_t width = in.dimension(), height = in.dimension();
    const uint32_t format = in.format();
    const uint64_t rule = rule_bytes(width, height, format);
    check(QKImage_requiredSize(width, height, format) == rule, "requiredSize differs from the size rule");
    switch (in.byte() % 4) {
        case 1:
            if (rule <= kMaxBytes) {
                image = QKImage_createNew(width, height, format);
                check((image != nullptr) == (rule != 0), "createNew disagrees with the size rule");
                check(image == nullptr || (image->size == rule && image->data != nullptr && image->isWrapped == 0 &&
                                           image->chromaOffset == 0),
                      "createNew made an image unlike its size rule");
            }
            break;
        case 2: {
            const uint32_t chroma = Frame::chroma(in, width, height);
            const uint64_t claim = claimed_bytes(width, height, format, 0, chroma);
            if (claim != 0 && claim <= kMaxBytes) {
                uint8_t* buffer = new_buffer(claim, 0);
                image = QKImage_createWrap(buffer, width, height, format, 0, chroma);
                adopt(buffer, claim);
            }
            break;
        }
        case 3: {
            const uint32_t chroma = Frame::chroma(in, width, height);
            const int32_t size = recorded(in, claimed_bytes(width, height, format, 0, chroma));
            const uint64_t claim = claimed_bytes(width, height, format, size > 0 ? size : 0, chroma);
            if (claim != 0 && claim <= kMaxBytes) {
                uint8_t* buffer = new_buffer(claim, 0);
                image = QKImage_createWrap(buffer, width, height, format, size, chroma);
                adopt(buffer, claim);
            }
            break;
        }
        default: break;
    }
    if (image == nullptr) image = QKImage_createEmpty(width, height, format);
    check(image != nullptr, "createEmpty failed");
    if (image->data != nullptr) fill(image->data, length(), in.byte());
}

size_t Frame::length() const {
    if (image == nullptr || image->data == nullptr) return 0;
    if (image->data == data_) return length_;
    // The library's own buffers record the bytes they were allocated with.
    return image->isWrapped == 0 ? static_cast<size_t>(image->size) : 0;
}

Snapshot::Snapshot(const QKImage* image, size_t length)
    : data(image->data),
      width(image->width),
      height(image->height),
      format(image->format),
      isWrapped(image->isWrapped),
      size(image->size),
      chromaOffset(image->chromaOffset) {
    if (data != nullptr) bytes.assign(data, data + length);
}

bool Snapshot::same_fields(const QKImage* image) const {
    return data == image->data && width == image->width && height == image->height && format == image->format &&
           isWrapped == image->isWrapped && size == image->size && chromaOffset == image->chromaOffset;
}

bool Snapshot::operator==(const Snapshot& other) const {
    return data == other.data && width == other.width && height == other.height && format == other.format &&
           isWrapped == other.isWrapped && size == other.size && chromaOffset == other.chromaOffset &&
           bytes == other.bytes;
}

void check_decoded(const Frame& frame, const Snapshot& before, int32_t status, bool decoded) {
    const QKImage* image = frame.image;
    if (status != QK_OK) {
        if (before.data != nullptr && before.isWrapped != 0) {
            check(image->data == before.data && image->isWrapped != 0, "a failed decode dropped the caller's buffer");
        }
        if (status == QK_ERROR_INVALID_SIZE && before.data != nullptr && image->data == before.data) {
            check(Snapshot(image, before.bytes.size()).bytes == before.bytes,
                  "a buffer refused as too small was written");
        }
        return;
    }
    check(image->data != nullptr && image->width > 0 && image->height > 0, "a decoded image without picture");
    const uint64_t claimed = QKImage_size(image);
    const uint64_t rule = rule_bytes(image->width, image->height, image->format);
    check(!decoded || rule == 0 || claimed >= rule, "a decoded image records less than its picture");
    // The caller's buffer has the bytes the target gave it; any other is the
    // library's, from malloc.
    const uint64_t holds = image->data == before.data && before.isWrapped != 0 ? before.bytes.size()
                                                                              : malloc_usable_size(image->data);
    check(claimed <= holds, "a decoded image claims more bytes than its buffer holds");
    volatile uint8_t sum = 0;
    for (uint64_t i = 0; i < claimed; ++i) sum = static_cast<uint8_t>(sum + image->data[i]);
    (void)sum;
}

std::vector<size_t> pixel_places(const QKImage& image, int32_t x, int32_t y) {
    const size_t w = static_cast<size_t>(image.width), h = static_cast<size_t>(image.height);
    const size_t pixel = static_cast<size_t>(y) * w + static_cast<size_t>(x);
    if (!is_yuv420(image.format)) {
        const size_t bpp = (image.format == QK_FORMAT_RGB8 || image.format == QK_FORMAT_BGR8) ? 3 : 4;
        std::vector<size_t> places;
        for (size_t i = 0; i < bpp; ++i) places.push_back(pixel * bpp + i);
        return places;
    }
    const size_t base = image.chromaOffset != 0 ? image.chromaOffset : w * h;
    const size_t pair = base + (y / 2) * w + (x / 2) * 2;
    const size_t plane = base + (y / 2) * (w / 2) + x / 2, quarter = w * h / 4;
    switch (image.format) {
        case QK_FORMAT_NV12: return {pixel, pair, pair + 1};
        case QK_FORMAT_NV21: return {pixel, pair + 1, pair};
        case QK_FORMAT_YV12: return {pixel, plane + quarter, plane};
        default: return {pixel, plane, plane + quarter};  // YUVP
    }
}

}  // namespace qkfuzz
