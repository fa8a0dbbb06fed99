// Our raster layer: RGBA bitmaps and the two ways geometry moves their
// pixels (a turn in place by quarter turns about a pivot, and nearest-pixel
// scaling onto another bitmap). Pixels are 4 bytes, R G B A, copied as they
// are: nothing here converts or blends them.
//
// The picture decoder and the PNG encoder of file loading and saving belong
// here as well, working on these same bitmaps.
#ifndef QKCORE_SRC_PLATFORM_RASTER_H
#define QKCORE_SRC_PLATFORM_RASTER_H

#include <stddef.h>
#include <stdint.h>

namespace qk {
namespace platform {

constexpr int kBitmapBytesPerPixel = 4;

// width x height RGBA pixels with tight rows (width x 4 bytes), either
// borrowed from the caller or owned. A bitmap without pixels is never drawn
// on or read.
class Bitmap {
public:
    Bitmap() = default;
    ~Bitmap() { release(); }
    Bitmap(const Bitmap&) = delete;
    Bitmap& operator=(const Bitmap&) = delete;

    // Uses the caller's memory, which must hold width x height x 4 bytes; it
    // is never freed here. False, and no pixels, for a dimension below 1.
    bool borrow(uint8_t* pixels, int32_t width, int32_t height);
    // Gets memory of its own: uninitialised, or transparent black when
    // `cleared` (cheaper than clearing afterwards: fresh memory comes zeroed).
    // False, and no pixels, for a dimension below 1, a size past the signed
    // 32-bit byte counts of the library, or memory that cannot be had.
    // `map_in` as for allocate_pixels.
    bool allocate(int32_t width, int32_t height, bool cleared, bool map_in = true);
    // Forgets the pixels, freeing them when owned.
    void release();

    bool has_pixels() const { return pixels_ != nullptr; }
    int32_t width() const { return width_; }
    int32_t height() const { return height_; }
    size_t row_bytes() const { return static_cast<size_t>(width_) * kBitmapBytesPerPixel; }
    uint64_t byte_count() const { return static_cast<uint64_t>(row_bytes()) * static_cast<uint64_t>(height_); }
    uint8_t* pixels() { return pixels_; }
    const uint8_t* pixels() const { return pixels_; }
    uint8_t* row(int32_t y) { return pixels_ + static_cast<size_t>(y) * row_bytes(); }
    const uint8_t* row(int32_t y) const { return pixels_ + static_cast<size_t>(y) * row_bytes(); }

    // Takes the same pixels as width x height, as a quarter turn leaves
    // them; false, and nothing changes, when the pixel count would differ.
    bool reshape(int32_t width, int32_t height);
    // Copies all pixels to `out` when `capacity` bytes hold them; otherwise
    // copies nothing and returns false.
    bool copy_to(void* out, uint64_t capacity) const;

private:
    uint8_t* pixels_ = nullptr;
    int32_t width_ = 0;
    int32_t height_ = 0;
    bool owned_ = false;
};

// Turns the bitmap in place clockwise (y pointing down) by quarter_turns x
// 90 degrees about the integer point (pivot_x, pivot_y): source point p
// lands at R(p - pivot) + pivot. Any integer number of turns, negative
// included; after an odd number it is height wide and width high. Pixels
// that no source pixel covers become transparent black. A quarter turn
// takes memory for half of one more bitmap. False, and the bitmap
// unchanged, when it has no pixels or that memory cannot be had.
bool turn_in_place(Bitmap& bitmap, int quarter_turns, int32_t pivot_x, int32_t pivot_y);

// Draws the turn of a width x height block of pixels, rows src_row_bytes
// apart, clockwise by quarter_turns x 90 degrees about its centre into dst,
// rows dst_row_bytes apart: height wide and width high after an odd number
// of turns. Every target pixel is covered. The blocks must not overlap.
void turn_copy(const uint8_t* src, size_t src_row_bytes, int32_t width, int32_t height, int quarter_turns,
               uint8_t* dst, size_t dst_row_bytes);

// Draws `source` scaled by the factors over the whole target: target pixel
// (c, r) takes the source pixel under its centre mapped back,
// ((c + 0.5) / scale_x, (r + 0.5) / scale_y), clamped into the source.
// Factors must be positive (otherwise nothing is drawn). The bitmaps must
// not overlap. On x86 a target of 8 MiB or more is written past the caches.
void draw_scaled(const Bitmap& source, float scale_x, float scale_y, Bitmap& target);

}  // namespace platform
}  // namespace qk

#endif  // QKCORE_SRC_PLATFORM_RASTER_H
