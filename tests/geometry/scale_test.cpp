#include <gtest/gtest.h>
#include <stdint.h>
#include <string.h>

#include <vector>

#include "geometry/images.h"
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

TEST(Scale, RefusalsLeaveTheDestinationAlone) {
    constexpr uint32_t RGBA = QK_FORMAT_RGBA;
    constexpr const char* kDimensions = "QKImage_scale: invalid image dimensions (<=0)";
    constexpr const char* kFormat = "QKImage_scale supports only ANDROID_BITMAP format for now";
    std::vector<uint8_t> small(12, 0x5a);
    const struct {
        const char* what;
        int32_t sw, sh;
        uint32_t sformat;
        int32_t ssize, dw, dh;
        uint32_t dformat;
        uint8_t* dbuffer;
        int32_t dsize, status;
        const char* message;
    } cases[] = {
        {"source width 0", 0, 2, RGBA, 64, 2, 2, RGBA, nullptr, 0, QK_ERROR_INVALID_SIZE, kDimensions},
        {"destination height -1", 2, 2, RGBA, 0, 2, -1, RGBA, nullptr, 0, QK_ERROR_INVALID_SIZE, kDimensions},
        {"dimensions before format", 2, 2, RGBA, 0, 0, 2, QK_FORMAT_BGRA, nullptr, 0, QK_ERROR_INVALID_SIZE,
         kDimensions},
        {"BGRA source", 2, 2, QK_FORMAT_BGRA, 0, 2, 2, RGBA, nullptr, 0, QK_ERROR_INVALID_PARAM, kFormat},
        {"NV12 destination", 2, 2, RGBA, 0, 2, 2, QK_FORMAT_NV12, nullptr, 0, QK_ERROR_INVALID_PARAM, kFormat},
        {"destination buffer too small", 2, 2, RGBA, 0, 2, 2, RGBA, small.data(), 12, QK_ERROR_INVALID_SIZE, nullptr},
        {"preset size too small", 2, 2, RGBA, 0, 2, 2, RGBA, nullptr, 12, QK_ERROR_INVALID_SIZE, nullptr},
        {"source size below its picture", 2, 2, RGBA, 12, 2, 2, RGBA, nullptr, 0, QK_ERROR_INVALID_SIZE, nullptr},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        std::vector<uint8_t> pixels(64, 1);
        ImagePtr src(QKImage_createWrap(pixels.data(), c.sw, c.sh, c.sformat, c.ssize, 0));
        ImagePtr dst(QKImage_createWrap(c.dbuffer, c.dw, c.dh, c.dformat, c.dsize, 0));
        dst->size = static_cast<uint64_t>(c.dsize);
        const auto before = snapshot(*dst);
        LogCapture log;
        EXPECT_EQ(QKImage_scale(src.get(), dst.get()), c.status);
        EXPECT_TRUE(HasOneFailureReport(log, c.status, "src/geometry/scale.cpp"));
        EXPECT_EQ(log.lines().size(), c.message != nullptr ? 2u : 1u);
        EXPECT_TRUE(c.message == nullptr || log.contains(4, c.message));
        EXPECT_TRUE(snapshot(*dst) == before);
    }

    ImagePtr image(QKImage_createNew(2, 2, QK_FORMAT_RGBA)), empty(QKImage_createEmpty(2, 2, QK_FORMAT_RGBA));
    using Pair = std::pair<QKImage*, QKImage*>;
    for (auto [src, dst] : {Pair{nullptr, image.get()}, Pair{image.get(), nullptr}, Pair{empty.get(), image.get()}}) {
        LogCapture log;
        EXPECT_EQ(QKImage_scale(src, dst), QK_ERROR_NULL_PARAM);
        EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_NULL_PARAM, "src/geometry/scale.cpp"));
    }
}

// The allocation reports its own failure; scaling adds its message.
TEST(Scale, DestinationBufferNotObtained) {
    ImagePtr src(QKImage_createNew(2, 2, QK_FORMAT_RGBA));
    ImagePtr dst(QKImage_createEmpty(40000, 40000, QK_FORMAT_RGBA));  // past the library's byte counts
    LogCapture log;
    EXPECT_EQ(QKImage_scale(src.get(), dst.get()), QK_ERROR_INVALID_PARAM);
    EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_INVALID_PARAM, "src/image/image.cpp"));
    EXPECT_TRUE(log.contains(4, "QKImage_scale: allocation failed (0 bytes)"));
    EXPECT_EQ(dst->data, nullptr);
}

}  // namespace
