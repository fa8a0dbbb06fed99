// QKImage_convert and QKImage_copyAndConvert: refusals, copies, worked
// examples, and every format pair against the plain reference.
#include <gtest/gtest.h>

#include <algorithm>
#include <random>
#include <string>
#include <tuple>
#include <utility>
#include <vector>

#include "convert/reference_frame.h"
#include "qkcore/qk_image.h"
#include "support/images.h"
#include "support/log_capture.h"

namespace {

using namespace qktest;

constexpr const char* kEntryFile = "src/convert/convert.cpp";
constexpr uint32_t RGBA = QK_FORMAT_RGBA, BGRA = QK_FORMAT_BGRA, RGB8 = QK_FORMAT_RGB8, GREY = QK_FORMAT_GREY,
                   YUYV = QK_FORMAT_YUYV, NV12 = QK_FORMAT_NV12, NV21 = QK_FORMAT_NV21, YV12 = QK_FORMAT_YV12,
                   D16 = QK_FORMAT_D16, PCL = QK_FORMAT_PCL, JPEG = QK_FORMAT_JPEG;

// Each refusal logs the entry line with the dimensions as passed, and one
// report; only pairs outside the families adopt the source's dimensions.
// Nulls are refused before anything is logged.
TEST(Convert, RefusalsLeaveTheDestinationsBytesAsTheyWere) {
    constexpr int32_t PARAM = QK_ERROR_INVALID_PARAM, SIZE = QK_ERROR_INVALID_SIZE, NONE = QK_ERROR_UNSUPPORTED;
    const struct { const char* what; ImageSpec src, dst; int32_t status; } cases[] = {
        {"source without buffer", {RGBA, 4, 4, 0}, {RGBA, 4, 4, 64}, PARAM},
        {"destination without buffer", {RGBA, 4, 4, 64}, {RGBA, 4, 4, 0}, PARAM},
        {"JPEG destination", {RGBA, 4, 4, 64}, {JPEG, 4, 4, 64, 64}, PARAM},
        {"source of 0 x 5", {RGBA, 0, 5, 64}, {RGBA, 4, 4, 64}, PARAM},
        {"source past the byte range", {RGBA, 100000, 100000, 64, 64}, {RGBA, 4, 4, 64}, PARAM},
        {"NV12 of odd width", {NV12, 3, 4, 64}, {RGBA, 4, 4, 64}, SIZE},
        {"NV12 of odd height", {NV12, 4, 3, 64}, {RGBA, 4, 4, 64}, SIZE},
        {"YUYV of odd width", {YUYV, 3, 2, 64}, {RGBA, 4, 4, 64}, SIZE},
        {"NV12 destination whose own width is odd", {RGBA, 4, 4, 64}, {NV12, 3, 4, 64, 64}, SIZE},
        {"RGBA of odd width into NV12", {RGBA, 3, 4, 64}, {NV12, 4, 4, 64}, SIZE},
        {"GREY of odd width into YUYV", {GREY, 3, 2, 64}, {YUYV, 4, 2, 64}, SIZE},
        {"YUYV of odd height into YV12", {YUYV, 4, 3, 64}, {YV12, 4, 4, 64}, SIZE},
        {"destination one byte short", {RGBA, 4, 4, 64}, {BGRA, 4, 4, 64, 63}, SIZE},
        {"destination chroma past its buffer", {RGBA, 16, 8, 512}, {NV12, 16, 8, 319, 319, 256}, SIZE},
        {"source chroma past its recorded size", {NV21, 16, 8, 319, 319, 256}, {RGBA, 16, 8, 512}, SIZE},
        {"source recording fewer bytes than its picture", {RGBA, 4, 4, 64, 63}, {BGRA, 4, 4, 64}, SIZE},
        {"D16 to GREY", {D16, 4, 2, 256}, {GREY, 2, 2, 256, 256}, NONE},
        {"PCL to RGBA", {PCL, 4, 2, 256}, {RGBA, 2, 2, 256, 256}, NONE},
        {"RGBA to D16", {RGBA, 4, 2, 256}, {D16, 2, 2, 256, 256}, NONE},
        {"JPEG to NV12", {JPEG, 4, 2, 256, 100}, {NV12, 2, 2, 256, 256}, NONE}};
    auto name = [](const ImageSpec& s) {
        return std::to_string(s.width) + "x" + std::to_string(s.height) + " " + fourcc(s.format, true);
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        Frame src(c.src), dst(c.dst);
        const std::vector<uint8_t> before = dst.buffer;
        LogCapture log;
        EXPECT_EQ(QKImage_convert(&src.image, &dst.image), c.status);
        EXPECT_TRUE(HasOneFailureReport(log, c.status, kEntryFile));
        EXPECT_TRUE(log.contains(1, "[QKImage] Converting from " + name(c.src) + " to " + name(c.dst)));
        EXPECT_EQ(dst.buffer, before);
        const ImageSpec& adopted = c.status == NONE ? c.src : c.dst;
        EXPECT_EQ(std::make_pair(dst.image.width, dst.image.height), std::make_pair(adopted.width, adopted.height));
        EXPECT_TRUE(c.status != NONE || log.contains(4, "[QKImage] Can not convert " + fourcc(c.src.format, true) +
                                                            " into " + fourcc(c.dst.format, true)));
    }
    Frame image({RGBA, 2, 2, 16});
    for (auto [src, dst] : {std::pair<const QKImage*, QKImage*>{nullptr, &image.image}, {&image.image, nullptr}}) {
        LogCapture log;
        EXPECT_EQ(QKImage_convert(src, dst), QK_ERROR_NULL_PARAM);
        EXPECT_EQ(log.lines().size(), 1u);
    }
    LogCapture log;  // copies: none for no source or no size rule, silently; a report for no conversion
    EXPECT_EQ(QKImage_copyAndConvert(nullptr, RGBA) || QKImage_copyAndConvert(&image.image, JPEG), false);
    EXPECT_TRUE(log.lines().empty());
    EXPECT_EQ(QKImage_copyAndConvert(&image.image, D16), nullptr);
    EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_UNSUPPORTED, kEntryFile));
}

// Same-format pairs the every-pair test does not make: copy-only formats,
// equal recorded sizes, chroma at offset 0 and at w*h (one place, yet the
// recorded 400 bytes are not copied whole), both chromas at 300 (one block of
// the needed size would stop short of the chroma); the rest stays.
TEST(Convert, SameFormatIsCopiedInOneOrTwoBlocks) {
    struct Block { size_t srcAt, dstAt, length; };
    const struct { ImageSpec src, dst; Block blocks[2]; } cases[] = {
        {{D16, 16, 8, 300}, {D16, 16, 8, 300}, {{0, 0, 256}, {}}},
        {{PCL, 2, 2, 120}, {PCL, 2, 2, 120}, {{0, 0, 100}, {}}},
        {{NV12, 16, 8, 400, 400}, {NV12, 16, 8, 400, 400}, {{0, 0, 400}, {}}},
        {{NV12, 16, 8, 400, 400}, {NV12, 16, 8, 400, 400, 128}, {{0, 0, 128}, {128, 128, 64}}},
        {{YV12, 16, 8, 364, 0, 300}, {YV12, 16, 8, 370, 370, 300}, {{0, 0, 128}, {300, 300, 64}}},
        // Chroma inside the luma plane: the source holds 128 bytes, not the rule's 192.
        {{NV12, 16, 8, 128, 128, 32}, {NV12, 16, 8, 200, 0, 32}, {{0, 0, 128}, {32, 32, 64}}}};
    std::mt19937 random(7);
    for (const auto& c : cases) {
        Frame src(c.src), dst(c.dst, 200);
        src.randomize(random);
        std::vector<uint8_t> expected = dst.buffer;
        for (const Block& b : c.blocks) std::copy_n(src.buffer.begin() + b.srcAt, b.length, expected.begin() + b.dstAt);
        LogCapture log;
        EXPECT_EQ(QKImage_convert(&src.image, &dst.image), QK_OK);
        EXPECT_EQ(log.texts(4), std::vector<std::string>());
        EXPECT_EQ(dst.buffer, expected) << &c - cases;
        const std::vector<uint8_t> own = dst.buffer;  // converted into itself: unchanged
        EXPECT_EQ(QKImage_convert(&dst.image, &dst.image), QK_OK);
        EXPECT_EQ(dst.buffer, own);
    }
}

// Frames of 4 MB and more are written past the caches, whole vectors at a
// time from the first aligned byte: every byte still arrives, from and to
// buffers at any alignment, and none past the frame.
TEST(Convert, LargeFramesMoveWholeAtAnyAlignment) {
    const int32_t w = 2000, h = 1400;
    const size_t bytes = size_t(w) * h * 3 / 2, luma = size_t(w) * h;
    for (size_t shift : {0, 1, 9}) {
        for (uint32_t to : {NV12, NV21}) {
            Frame src({NV12, w, h, bytes + 16}), dst({to, w, h, bytes + 16}, 5);
            src.image.data += shift, dst.image.data += 16 - shift;
            std::vector<uint8_t> expected = dst.buffer;
            uint8_t* out = expected.data() + 16 - shift;
            std::copy_n(src.image.data, bytes, out);
            for (size_t i = luma; to == NV21 && i < bytes; i += 2) std::swap(out[i], out[i + 1]);
            EXPECT_EQ(QKImage_convert(&src.image, &dst.image), QK_OK);
            EXPECT_TRUE(dst.buffer == expected) << "shift " << shift << " to " << fourcc(to);
        }
    }
}

// Hand-checked conversions, as a check on the plain reference as much as on
// the library: both formulas and the chroma orders of semi-planar and planar
// 4:2:0. One spare byte stays.
TEST(Convert, WorkedExamples) {
    const std::vector<uint8_t> rgb = {255, 0, 0, 0, 255, 0, 0, 0, 255, 255, 255, 255}, nv = {76, 149, 29, 255, 85, 255};
    const struct { uint32_t from; std::vector<uint8_t> in; uint32_t to; std::vector<uint8_t> out; } examples[] = {
        {RGB8, rgb, NV12, nv}, {RGB8, rgb, YV12, {76, 149, 29, 255, 255, 85}},
        {NV21, nv, RGBA, {15, 63, 255, 255, 88, 136, 255, 255, 0, 16, 254, 255, 194, 242, 255, 255}}};
    for (const auto& e : examples) {
        Frame src({e.from, 2, 2, e.in.size()}), dst({e.to, 2, 2, e.out.size() + 1});
        std::copy(e.in.begin(), e.in.end(), src.buffer.begin());
        std::vector<uint8_t> expected = e.out;
        expected.push_back(dst.buffer.back());
        EXPECT_EQ(QKImage_convert(&src.image, &dst.image), QK_OK);
        EXPECT_EQ(dst.buffer, expected) << fourcc(e.from) << " to " << fourcc(e.to);
    }
}

// Every ordered pair of the 13 convertible formats (same-format copies
// included), random frames of several sizes, and 4:2:0 chroma moved away from
// the luma on the source side, the destination side, or both. The destination
// starts with the source's dimensions exchanged and must take them over.
TEST(Convert, EveryPairMatchesThePlainReference) {
    auto needs_even = [](uint32_t f) { return f == YUYV || f == QK_FORMAT_YVYU || is_yuv420(f); };
    std::mt19937 random(2024);
    int conversions = 0;
    for (uint32_t from : kConvertibleFormats) {
        for (uint32_t to : kConvertibleFormats) {
            for (auto [width, height] : {std::pair{2, 2}, {6, 4}, {34, 10}, {64, 6}, {5, 3}}) {
                if ((width % 2 != 0 || height % 2 != 0) && (needs_even(from) || needs_even(to))) continue;
                for (int gaps = 0; gaps < 4; ++gaps) {
                    const bool srcGap = (gaps & 1) != 0, dstGap = (gaps & 2) != 0;
                    if ((srcGap && !is_yuv420(from)) || (dstGap && !is_yuv420(to))) continue;
                    SCOPED_TRACE(::testing::Message() << fourcc(from) << " to " << fourcc(to) << " at " << width
                                                      << "x" << height << ", chroma gaps " << gaps);
                    const uint32_t luma = static_cast<uint32_t>(width * height);
                    const uint32_t srcOffset = srcGap ? luma + 24 : 0, dstOffset = dstGap ? luma + 40 : 0;
                    const uint64_t srcBytes = srcGap ? srcOffset + luma / 2 : QKImage_requiredSize(width, height, from);
                    const uint64_t dstBytes =
                        (dstGap ? dstOffset + luma / 2 : QKImage_requiredSize(width, height, to)) + 16;
                    Frame src({from, width, height, srcBytes, srcGap ? srcBytes : 0, srcOffset});
                    Frame dst({to, height, width, dstBytes, dstBytes, dstOffset});
                    src.randomize(random);
                    dst.randomize(random);
                    const std::vector<uint8_t> expected = reference_conversion(src.image, dst.image, dstBytes);
                    LogCapture log;  // BGRA to NV12 reports the missing vendor library
                    ASSERT_EQ(QKImage_convert(&src.image, &dst.image), QK_OK);
                    ASSERT_EQ(dst.buffer, expected);
                    ASSERT_EQ(std::make_pair(dst.image.width, dst.image.height), std::make_pair(width, height));
                    ++conversions;
                }
            }
        }
    }
    EXPECT_GT(conversions, 13 * 13 * 4);
}

}  // namespace
