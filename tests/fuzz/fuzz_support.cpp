#include "fuzz/fuzz_support.h"

#include <dlfcn.h>
#include <malloc.h>
#include <stdarg.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>

#include <algorithm>

#include "codec/codec.h"
#include "platform/picture.h"
#include "qkcore/qk_log.h"
#include "support/images.h"

namespace qkfuzz {

void check(bool ok, const char* what) {
    if (ok) return;
    fprintf(stderr, "fuzz check failed: %s\n", what);
    abort();
}

// Each message is formatted (so that a bad log argument still shows under the
// sanitizers) and dropped.
static int format_and_drop(int level, ...) {
    va_list args;
    va_start(args, level);
    const char* format = va_arg(args, const char*);
    char line[512];
    vsnprintf(line, sizeof(line), format, args);
    return va_end(args), 0;
}
void quiet_log() { HX_LogMsg = format_and_drop; }

uint8_t Input::byte() { return size_ == 0 ? 0 : (--size_, *data_++); }
// Low byte first: each read is a statement of its own, so the order is fixed.
uint16_t Input::u16() {
    const uint16_t low = byte();
    return static_cast<uint16_t>(low | byte() << 8);
}
uint32_t Input::u32() {
    const uint32_t low = u16();
    return low | static_cast<uint32_t>(u16()) << 16;
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
    data_ += size_, size_ = 0;
    return bytes;
}

uint64_t claimed_bytes(int32_t width, int32_t height, uint32_t format, uint64_t size, uint32_t chromaOffset) {
    if (size != 0) return size;
    const uint64_t rule = QKImage_requiredSize(width, height, format);
    if (rule == 0 || chromaOffset == 0 || !qktest::is_yuv420(format)) return rule;
    const uint64_t end = uint64_t{chromaOffset} + uint64_t(width) * uint64_t(height) / 2;
    return std::max(end, rule);
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
    std::for_each(owned_.begin(), owned_.end(), free);
}

uint8_t* Frame::new_buffer(size_t bytes, uint8_t seed) {
    uint8_t* buffer = static_cast<uint8_t*>(malloc(bytes != 0 ? bytes : 1));
    check(buffer != nullptr, "out of memory for a caller's buffer");
    fill(buffer, bytes, seed);
    owned_.push_back(buffer);
    return buffer;
}

uint32_t Frame::chroma(Input& in, int32_t width, int32_t height) {
    const uint32_t luma = static_cast<uint32_t>(width) * static_cast<uint32_t>(height);
    switch (in.byte() % 6) {
        case 1: return luma;
        case 2: return luma + 2u * in.byte();
        case 3: return in.byte();
        case 4: return in.u32();
        default: return 0;
    }
}

int32_t Frame::recorded(Input& in, uint64_t claim) {
    uint64_t size = claim, cut;
    switch (in.byte() % 5) {
        case 0: break;
        case 1: size = claim > (cut = 1 + uint64_t{in.byte()}) ? claim - cut : 1; break;
        case 2: size = claim + 1 + in.byte(); break;
        case 3: size = 1 + uint64_t{in.u16()}; break;
        default: return -1;
    }
    if (size == 0 || size > kMaxBytes) size = 1 + uint64_t{in.byte()};
    return static_cast<int32_t>(size);
}

void Frame::make(Input& in) {
    QKImage_destroy(image);
    image = nullptr, data_ = nullptr, length_ = 0;
    const int32_t width = in.dimension(), height = in.dimension();
    const uint32_t format = in.format();
    // Every format with a rule takes at least a byte a pixel: a smaller
    // answer is a size computed past its type's range.
    const uint64_t rule = QKImage_requiredSize(width, height, format);
    check(rule == 0 || (width > 0 && height > 0 && rule >= uint64_t(width) * uint64_t(height) && rule <= INT32_MAX),
          "requiredSize is too small for the picture or past INT32_MAX");
    const int kind = in.byte() % 4;
    if (kind == 1 && rule <= kMaxBytes) {
        image = QKImage_createNew(width, height, format);
        check(image == nullptr ? rule == 0 : (image->size == rule && image->data != nullptr),
              "createNew: a buffer unlike the size rule");
    } else if (kind >= 2) {
        const uint32_t chroma = Frame::chroma(in, width, height);
        const int32_t size = kind == 3 ? recorded(in, claimed_bytes(width, height, format, 0, chroma)) : 0;
        const uint64_t claim = claimed_bytes(width, height, format, size > 0 ? size : 0, chroma);
        if (claim != 0 && claim <= kMaxBytes) {
            uint8_t* buffer = new_buffer(claim, 0);
            image = QKImage_createWrap(buffer, width, height, format, size, chroma);
            adopt(buffer, claim);
        }
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

Snapshot::Snapshot(const Frame& frame) {
    const QKImage& i = *frame.image;
    data = i.data, width = i.width, height = i.height, format = i.format, isWrapped = i.isWrapped, size = i.size,
    chromaOffset = i.chromaOffset;
    if (data != nullptr) bytes.assign(data, data + frame.length());
}

void check_holds(const Frame& frame, bool picture, const char* what) {
    const QKImage* image = frame.image;
    check(image->data != nullptr, what);
    const uint64_t claimed = QKImage_size(image);
    // A caller's buffer has the bytes the target gave it; any other is the
    // library's, from malloc.
    const uint64_t holds = image->isWrapped != 0 ? frame.length() : malloc_usable_size(image->data);
    uint64_t needed = QKImage_requiredSize(image->width, image->height, image->format);
    // 4:2:0 chroma at an offset of its own ends where it ends: inside the
    // luma plane or past the size rule.
    if (needed != 0 && image->size != 0 && image->chromaOffset != 0 && qktest::is_yuv420(image->format)) {
        const uint64_t luma = uint64_t(image->width) * uint64_t(image->height);
        needed = std::max(luma, image->chromaOffset + luma / 2);
    }
    check(claimed <= holds && (!picture || claimed >= needed), what);
    volatile uint8_t sum = 0;
    for (uint64_t i = 0; i < claimed; ++i) sum = static_cast<uint8_t>(sum + image->data[i]);
    (void)sum;
}

bool setup_decoding() {
    quiet_log();
    qk::platform::set_max_picture_bytes(16 << 20);
    return dlopen(qk::kJpegModule, RTLD_NOW) != nullptr;
}

void check_decoded(const Frame& frame, const Snapshot& before, int32_t status, bool decoded) {
    const QKImage* image = frame.image;
    if (status == QK_OK) {
        check(image->width > 0 && image->height > 0, "a decoded image without picture");
        return check_holds(frame, decoded, "a decoded image claims more than its buffer or less than its picture");
    }
    check(before.isWrapped == 0 || (image->data == before.data && image->isWrapped != 0),
          "a failed decode dropped the caller's buffer");
    check(status != QK_ERROR_INVALID_SIZE || image->data != before.data || Snapshot(frame).bytes == before.bytes,
          "a buffer refused as too small was written");
}

}  // namespace qkfuzz
