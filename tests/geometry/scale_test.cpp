#include <gtest/gtest.h>
#include <stdint.h>
#include <string.h>

#include <vector>

#include "support/images.h"
#include "qkcore/qk_image.h"
#include "support/log_capture.h"

namespace {

using namespace qktest;

// Each output pixel copies the source pixel under its centre; the expected
// source columns and rows are worked out by hand.
TEST(Scale, NearestPixelUnderTheCentre) {
    const struct {
        int32_t sw, sh, dw, dh;
        std::vector<int> cols, rows;
    } cases[] = {
        {3, 3, 3, 3, {0, 1, 2}, {0, 1, 2}},        // equal sizes: a copy
        {4, 4, 2, 2, {1, 3}, {1, 3}},              // one pixel of each 2x2 block, no averaging
        {2, 2, 4, 4, {0, 0, 1, 1}, {0, 0, 1, 1}},  // each pixel repeated in a 2x2 block
        {3, 1, 2, 1, {0, 2}, {0}},                 // centres map back to 0.75 and 2.25
        {5, 4, 3, 7, {0, 2, 4}, {0, 0, 1, 2, 2, 3, 3}},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(::testing::Message() << c.sw << "x" << c.sh << " to " << c.dw << "x" << c.dh);
        ImagePtr src = numbered_rgba(c.sw, c.sh);
        ImagePtr dst(QKImage_createEmpty(c.dw, c.dh, QK_FORMAT_RGBA));
        LogCapture log;
        ASSERT_EQ(QKImage_scale(src.get(), dst.get()), QK_OK);
        EXPECT_TRUE(log.lines().empty());
        // A destination without buffer gets one of width x height x 4 bytes.
        EXPECT_EQ(dst->size, uint64_t(c.dw) * c.dh * 4);
        EXPECT_EQ(dst->isWrapped, 0u);
        for (int32_t r = 0; r < c.dh; ++r) {
            for (int32_t x = 0; x < c.dw; ++x) {
                ASSERT_EQ(pixel_at(*dst, x, r), rgba_pixel(c.rows[r] * c.sw + c.cols[x])) << x << "," << r;
            }
        }
    }
}

TEST(Scale, TranslucentPixelsArriveUnchanged) {
    uint32_t src[] = {0x40302010, 0}, dst[4];
    memset(dst, 0xff, sizeof(dst));  // the old content must not shine through
    ImagePtr source(QKImage_createWrap(src, 2, 1, QK_FORMAT_RGBA, 0, 0));
    ImagePtr target(QKImage_createWrap(dst, 4, 1, QK_FORMAT_RGBA, 0, 0));
    ASSERT_EQ(QKImage_scale(source.get(), target.get()), QK_OK);
    EXPECT_EQ(std::vector<uint32_t>(dst, dst + 4), (std::vector<uint32_t>{0x40302010, 0x40302010, 0, 0}));
}

// A destination sharing memory with the source gets what a separate one gets.
TEST(Scale, DestinationSharingTheSourceBuffer) {
    for (auto [dw, dh] : {std::pair<int32_t, int32_t>{2, 2}, {3, 5}, {4, 4}}) {
        ImagePtr src = numbered_rgba(4, 4);
        ImagePtr separate(QKImage_createNew(dw, dh, QK_FORMAT_RGBA));
        ASSERT_EQ(QKImage_scale(src.get(), separate.get()), QK_OK);
        ImagePtr shared(QKImage_createWrap(src->data, dw, dh, QK_FORMAT_RGBA, 0, 0));
        ASSERT_EQ(QKImage_scale(src.get(), shared.get()), QK_OK);
        EXPECT_EQ(0, memcmp(shared->data, separate->data, separate->size)) << dw << "x" << dh;
    }
}

}  // namespace
