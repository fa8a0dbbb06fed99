#include "platform/raster.h"

#include <gtest/gtest.h>
#include <stdint.h>
#include <string.h>

#include <vector>

namespace {

using qk::platform::Bitmap;

uint32_t rgba(int r, int g, int b, int a) {
    const uint8_t bytes[4] = {uint8_t(r), uint8_t(g), uint8_t(b), uint8_t(a)};
    uint32_t value;
    memcpy(&value, bytes, 4);
    return value;
}

// A bitmap over a copy of `pixels`, a row of `width`.
struct Pixels {
    Pixels(std::vector<uint32_t> initial, int32_t width) : values(std::move(initial)) {
        EXPECT_TRUE(bitmap.borrow(reinterpret_cast<uint8_t*>(values.data()), width, values.size() / width));
    }
    std::vector<uint32_t> values;
    Bitmap bitmap;
};

TEST(Bitmap, OwnedPixelsAndTheirLimits) {
    // Small bitmaps come from the heap, frame-sized ones are mapped: both
    // start transparent black when asked to.
    for (auto [w, h] : {std::pair<int32_t, int32_t>{5, 3}, {1024, 1025}}) {
        Bitmap owned;
        ASSERT_TRUE(owned.allocate(w, h, /*cleared=*/true));
        std::vector<uint8_t> out(owned.byte_count(), 1);
        EXPECT_FALSE(owned.copy_to(out.data(), out.size() - 1));  // too small: nothing copied
        EXPECT_EQ(std::count(out.begin(), out.end(), 1), long(out.size()));
        EXPECT_TRUE(owned.copy_to(out.data(), out.size()));
        EXPECT_EQ(std::count(out.begin(), out.end(), 0), long(out.size()));
    }
    Bitmap refused;
    EXPECT_FALSE(refused.allocate(3, -1, false));
    EXPECT_FALSE(refused.allocate(32768, 16384, false));  // 2 GiB: past the library's byte counts
    EXPECT_FALSE(refused.borrow(nullptr, 3, 2));
    EXPECT_FALSE(refused.has_pixels());
}

// Scaling copies pixels as they are, whatever the target held: translucent
// and transparent ones are not blended.
TEST(Raster, ScalingCopiesPixels) {
    for (uint32_t pixel : {rgba(10, 20, 30, 255), rgba(10, 20, 30, 40), 0u, rgba(250, 0, 0, 10)}) {
        Pixels source({pixel}, 1), scaled({rgba(200, 200, 200, 255)}, 1);
        qk::platform::draw_scaled(source.bitmap, 1.0f, 1.0f, scaled.bitmap);
        EXPECT_EQ(scaled.values[0], pixel) << std::hex << pixel;
    }
}

// Forward reference: the centre of source pixel (i, j) turned clockwise about
// the pivot lands on the centre of the pixel that shows it after the turn in
// place. Shapes and pivots that rotation never uses.
TEST(Raster, TurnsAboutAnIntegerPivot) {
    const struct {
        int32_t w, h, tw, th, px, py;
    } shapes[] = {{4, 3, 4, 3, 2, 1},  {8, 8, 8, 8, 4, 4},   {6, 4, 6, 4, 5, 0},
                  {5, 3, 3, 5, 2, 2},  {9, 13, 13, 9, 6, 5}, {6, 4, 4, 6, 5, 0},
                  {7, 2, 2, 7, -1, 3}, {258, 301, 301, 258, 129, 150}};  // more than one tile of the quarter turn
    for (const auto& s : shapes) {
        // Opaque in the top half, translucent below: blocks of either kind and mixed ones.
        std::vector<uint32_t> values;
        for (int32_t j = 0; j < s.h; ++j) {
            for (int32_t i = 0; i < s.w; ++i) values.push_back(rgba(i, j, 7, j < s.h / 2 ? 255 : 20 + i * 10 + j));
        }
        for (int turns : {0, 1, 2, 3, -1, 6}) {
            SCOPED_TRACE(::testing::Message() << s.w << "x" << s.h << " pivot " << s.px << "," << s.py << " turns "
                                              << turns);
            std::vector<uint32_t> expected(size_t(s.tw) * s.th, 0);
            for (int32_t j = 0; j < s.h; ++j) {
                for (int32_t i = 0; i < s.w; ++i) {
                    // Doubled coordinates keep the half-pixel centres integral.
                    int64_t x = 2 * i + 1 - 2 * s.px, y = 2 * j + 1 - 2 * s.py;
                    for (int k = 0; k < ((turns % 4) + 4) % 4; ++k) std::swap(x, y), x = -x;  // (x, y) -> (-y, x)
                    const int64_t tx = (x + 2 * s.px - 1) / 2, ty = (y + 2 * s.py - 1) / 2;
                    if (tx >= 0 && tx < s.tw && ty >= 0 && ty < s.th) expected[ty * s.tw + tx] = values[j * s.w + i];
                }
            }
            // Where the target has the shape the turn gives.
            const bool odd = turns % 2 != 0;
            if (std::make_pair(s.tw, s.th) == (odd ? std::make_pair(s.h, s.w) : std::make_pair(s.w, s.h))) {
                Pixels in_place(values, s.w);
                ASSERT_TRUE(qk::platform::turn_in_place(in_place.bitmap, turns, s.px, s.py));
                EXPECT_EQ(in_place.values, expected);
                EXPECT_EQ(in_place.bitmap.width(), s.tw);
                EXPECT_EQ(in_place.bitmap.height(), s.th);
            }
        }
    }
}

}  // namespace
