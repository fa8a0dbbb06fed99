#include <gtest/gtest.h>
#include <stdint.h>
#include <string.h>

#include <string>
#include <vector>

#include "support/images.h"
#include "qkcore/qk_image.h"
#include "support/log_capture.h"

namespace {

using namespace qktest;

struct Offset {
    int32_t x, y;
};

// A 6x8 source on an 8x4 destination: inside, at negative offsets, and
// overhanging one edge or both. Pixels under the source show its pixels, the
// others keep theirs, each image addressed through its own chroma base.
TEST(Draw, OverlapIsOverwritten) {
    const Offset offsets[] = {{0, 0}, {2, 0}, {-2, -2}, {4, -4}, {-4, 2}, {6, 2}, {0, -4}, {1, -1}, {-3, 1}, {7, 3}};
    for (uint32_t format : kDrawFormats) {
        const bool yuv = is_yuv420(format);
        for (uint32_t dst_chroma : {0u, 40u}) {
            for (const Offset& o : offsets) {
                if (yuv ? (o.x % 2 != 0 || o.y % 2 != 0) : dst_chroma != 0) continue;
                SCOPED_TRACE(::testing::Message() << fourcc(format) << " at " << o.x << "," << o.y << " chroma "
                                                  << dst_chroma);
                // 4:2:0 sources keep their chroma past a padded luma plane.
                std::vector<uint8_t> src_bytes(QKImage_requiredSize(6, 8, format) + 8), dst_bytes(256);
                ImagePtr src(QKImage_createWrap(src_bytes.data(), 6, 8, format, int32_t(src_bytes.size()),
                                                yuv ? 56 : 0));
                fill_distinct(*src, 11);
                ImagePtr dst(QKImage_createWrap(dst_bytes.data(), 8, 4, format, dst_chroma != 0 ? 56 : 0, dst_chroma));
                fill_distinct(*dst, 200);
                ImagePtr before(QKImage_clone(dst.get()));
                LogCapture log;
                ASSERT_EQ(QKImage_drawImage(src.get(), dst.get(), o.x, o.y), QK_OK);
                EXPECT_TRUE(log.lines().empty());
                for (int32_t r = 0; r < 4; ++r) {
                    for (int32_t c = 0; c < 8; ++c) {
                        const int32_t sx = c - o.x, sy = r - o.y;
                        const bool inside = sx >= 0 && sx < 6 && sy >= 0 && sy < 8;
                        const QKImage& shown = inside ? *src : *before;
                        ASSERT_EQ(pixel_bytes(*dst, c, r), pixel_bytes(shown, inside ? sx : c, inside ? sy : r))
                            << c << "," << r;
                    }
                }
            }
        }
    }
}

// Drawing an image into itself reads every row before overwriting it.
TEST(Draw, IntoItself) {
    for (const Offset& o : {Offset{1, 1}, Offset{-1, -2}, Offset{2, -1}, Offset{-2, 1}}) {
        ImagePtr image = distinct_image(5, 4, QK_FORMAT_RGB8);
        ImagePtr copy(QKImage_clone(image.get()));
        ImagePtr expected(QKImage_clone(image.get()));
        ASSERT_EQ(QKImage_drawImage(copy.get(), expected.get(), o.x, o.y), QK_OK);
        ASSERT_EQ(QKImage_drawImage(image.get(), image.get(), o.x, o.y), QK_OK);
        EXPECT_EQ(0, memcmp(image->data, expected->data, 60)) << o.x << "," << o.y;
    }
}

TEST(Draw, NothingToDrawIsNotAFailure) {
    const std::string out = "In QKImage_drawImage, the source image 4x4 is completely out of the destination 5x3 at ";
    const struct {
        int32_t x, y;
        std::string message;
    } cases[] = {
        {5, 0, out + "5,0"}, {0, 3, out + "0,3"}, {-5, 0, out + "-5,0"}, {INT32_MIN, 0, out + "-2147483648,0"},
        {-4, 0, "Nothing to draw (lines = 3, cols = 0)"}, {0, -4, "Nothing to draw (lines = 0, cols = 4)"},
    };
    ImagePtr src = distinct_image(4, 4, QK_FORMAT_RGBA);
    for (const auto& c : cases) {
        ImagePtr dst = distinct_image(5, 3, QK_FORMAT_RGBA, 200);
        const auto before = snapshot(dst.get());
        LogCapture log;
        EXPECT_EQ(QKImage_drawImage(src.get(), dst.get(), c.x, c.y), QK_OK);
        EXPECT_EQ(log.lines(), (std::vector<LogLine>{{3, c.message}}));
        EXPECT_TRUE(snapshot(dst.get()) == before);
    }
    // Being outside is decided before the format is looked at.
    ImagePtr grey = distinct_image(4, 4, QK_FORMAT_GREY);
    LogCapture log;
    EXPECT_EQ(QKImage_drawImage(grey.get(), grey.get(), 4, 0), QK_OK);
    EXPECT_TRUE(HasNoErrors(log));
}

}  // namespace
