// What every fuzz target shares: a reader that takes all of a target's
// parameters from its input bytes, the check that stops the run when the
// library breaks its contract, a quiet log hook, and images over buffers of
// exactly the size they claim (so that AddressSanitizer sees the first byte
// past them). The targets drive the calls; the sanitizers and a few cheap
// invariants judge them. What each result must be byte for byte is the unit
// tests' business.
//
// Inputs are read front to back; a reader past the end yields zeros, so every
// prefix of an input is an input too. The encodings below are what the
// committed crashers are written in: change them and those files mean
// something else.
#ifndef QKCORE_TESTS_FUZZ_FUZZ_SUPPORT_H
#define QKCORE_TESTS_FUZZ_FUZZ_SUPPORT_H

#include <stddef.h>
#include <stdint.h>

#include <string>
#include <tuple>
#include <vector>

#include "qkcore/qk_image.h"

namespace qkfuzz {

// Stops the run with the message when `ok` is false: a finding.
void check(bool ok, const char* what);

// Points HX_LogMsg at a hook that drops every message.
void quiet_log();

class Input {
public:
    Input(const uint8_t* data, size_t size) : data_(data), size_(size) {}

    bool empty() const { return size_ == 0; }
    uint8_t byte();
    uint16_t u16();  // little-endian
    uint32_t u32();  // little-endian
    // One byte: below 0xC0 a dimension 0..64 (the byte mod 65), else one of
    // kHugeDimensions (0xC0 + index).
    int32_t dimension();
    // One byte mod 18: kFormats[0..15], then 16: a raw 32-bit code follows,
    // 17: the code 0.
    uint32_t format();
    // One byte: below 0xC0 an offset -64..64 (the byte mod 129, minus 64),
    // else one of kHugeOffsets (0xC0 + index).
    int32_t offset();
    // A length byte (mod max + 1), then that many bytes; a NUL ends the
    // string early, as it would in C.
    std::string text(size_t max);
    // Whatever is left, taken whole.
    std::vector<uint8_t> rest();

private:
    const uint8_t* data_;
    size_t size_;
};

constexpr uint32_t kFormats[16] = {
    QK_FORMAT_RGBA, QK_FORMAT_BGRA, QK_FORMAT_ARGB, QK_FORMAT_ABGR, QK_FORMAT_RGB8, QK_FORMAT_BGR8,
    QK_FORMAT_GREY, QK_FORMAT_YUYV, QK_FORMAT_YVYU, QK_FORMAT_NV12, QK_FORMAT_NV21, QK_FORMAT_YV12,
    QK_FORMAT_YUVP, QK_FORMAT_D16,  QK_FORMAT_PCL,  QK_FORMAT_JPEG,
};
constexpr int32_t kHugeDimensions[8] = {100000, INT32_MAX, -1, INT32_MIN, 1 << 30, 65536, 46341, -64};
constexpr int32_t kHugeOffsets[8] = {INT32_MIN, INT32_MAX, 100000, -100000, 1 << 30, -(1 << 30), 65536, -65536};

// The largest buffer a target makes or lets the library make, so that
// fuzzing stays small whatever the dimensions.
constexpr uint64_t kMaxBytes = 1 << 17;

// Bytes of the buffer a caller promises: the recorded size when there is
// one, else the size rule, stretched for 4:2:0 to the chroma at a separate
// chromaOffset (0 when the image has no rule).
uint64_t claimed_bytes(int32_t width, int32_t height, uint32_t format, uint64_t size, uint32_t chromaOffset);

// An image made from the input, and the buffers the caller (the target)
// owns for it: each malloc'ed with exactly the bytes it claims to have, kept
// until the end so that the library freeing one shows as a double free.
class Frame {
public:
    Frame() = default;
    ~Frame();
    Frame(const Frame&) = delete;
    Frame& operator=(const Frame&) = delete;

    // Replaces the image with one read from the input:
    //   width (dimension), height (dimension), format, kind (byte mod 4):
    //   0 createEmpty; 1 createNew; 2 createWrap recording no size over a
    //   buffer of the claimed bytes, then chromaOffset (chroma());
    //   3 createWrap then chromaOffset, then the recorded size (recorded());
    //   then, when the image has a buffer, one seed byte for its contents.
    // Kinds that would take more than kMaxBytes make an image without buffer.
    void make(Input& in);
    // A new caller's buffer of `bytes` (at least one byte is allocated for
    // 0, so that it is never null), filled from `seed`.
    uint8_t* new_buffer(size_t bytes, uint8_t seed);
    // The image forgets its buffer: a new one gets known by adopt().
    void adopt(uint8_t* data, size_t length) { data_ = data, length_ = length; }

    // chromaOffset: one byte mod 6: 0 and 5 give 0; 1 the luma size;
    // 2 the luma size + 2 x byte; 3 a byte; 4 a raw 32-bit value.
    static uint32_t chroma(Input& in, int32_t width, int32_t height);
    // Recorded size for a buffer that the rule (or chroma) claims `claim`
    // bytes of: one byte mod 5: 0 the claim; 1 the claim - 1 - byte (at
    // least 1); 2 the claim + 1 + byte; 3 1 + u16; 4 a negative size
    // (-1, recorded as 0). Sizes past kMaxBytes become 1 + byte.
    static int32_t recorded(Input& in, uint64_t claim);

    QKImage* image = nullptr;

    // The bytes the image's current buffer really has (0 without buffer):
    // what a snapshot covers.
    size_t length() const;

private:
    std::vector<uint8_t*> owned_;  // caller's buffers, freed at the end
    uint8_t* data_ = nullptr;      // the buffer length_ belongs to
    size_t length_ = 0;
};

// Fills `bytes` from a small generator seeded by `seed`: every input gives
// different but reproducible pixels.
void fill(uint8_t* data, size_t bytes, uint8_t seed);

// Every field of the frame's image and the bytes of its buffer.
struct Snapshot {
    explicit Snapshot(const Frame& frame);
    auto fields() const { return std::tie(data, width, height, format, isWrapped, size, chromaOffset); }
    bool operator==(const Snapshot& other) const { return fields() == other.fields() && bytes == other.bytes; }
    uint8_t* data;
    int32_t width, height;
    uint32_t format, isWrapped;
    uint64_t size;
    uint32_t chromaOffset;
    std::vector<uint8_t> bytes;
};

// The image's claim holds (its buffer has every byte of QKImage_size, which
// is read so that AddressSanitizer sees a claim past it) and, when `picture`,
// that claim covers its picture (the size rule, or for 4:2:0 chroma at an
// offset of its own the luma plane and the chroma wherever it lies).
void check_holds(const Frame& frame, bool picture, const char* what);

// For the decoding targets: a quiet log, pictures past 16 MB of RGBA refused
// from their header (fuzzing stays small and fast), and the codec module held
// open. The library loads it for each call and closes it after; held here, it
// stays mapped for the whole run, as libFuzzer keeps the addresses of its
// coverage counters.
bool setup_decoding();

// What a decoding call (from memory or a file) must leave, `before` being
// the image as it was: a failure never frees or drops the caller's buffer,
// and one refused as too small keeps its bytes; a success leaves a picture
// that its buffer holds (a file loaded as raw pixels keeps the size the
// image recorded, short or not, so `decoded` is false for loads).
void check_decoded(const Frame& frame, const Snapshot& before, int32_t status, bool decoded);

}  // namespace qkfuzz

#endif  // QKCORE_TESTS_FUZZ_FUZZ_SUPPORT_H
