// QKImage_convert and QKImage_copyAndConvert: validation, copies, routing,
// and every format pair against the plain reference.
#include <gtest/gtest.h>

#include <algorithm>
#include <random>
#include <string>
#include <utility>
#include <vector>

#include "convert/reference_frame.h"
#include "convert/test_image.h"
#include "qkcore/qk_image.h"
#include "support/log_capture.h"

namespace {

using qktest::HasNoErrors;
using qktest::HasOneFailureReport;
using qktest::ImageSpec;
using qktest::LogCapture;
using qktest::TestImage;

constexpr const char* kEntryFile = "src/convert/convert.cpp";
constexpr uint32_t RGBA = QK_FORMAT_RGBA, BGRA = QK_FORMAT_BGRA, ABGR = QK_FORMAT_ABGR, RGB8 = QK_FORMAT_RGB8,
                   BGR8 = QK_FORMAT_BGR8, GREY = QK_FORMAT_GREY, YUYV = QK_FORMAT_YUYV, NV12 = QK_FORMAT_NV12,
                   NV21 = QK_FORMAT_NV21, YV12 = QK_FORMAT_YV12, D16 = QK_FORMAT_D16, PCL = QK_FORMAT_PCL,
                   JPEG = QK_FORMAT_JPEG;

// A format code as "%4.4s" prints it: up to four characters, right-aligned
// (" D16").
std::string name_of(uint32_t format) {
    std::string name(reinterpret_cast<const char*>(&format), 4);
    name = name.substr(0, name.find('\0'));
    return std::string(4 - name.size(), ' ') + name;
}

TEST(Convert, NullImagesAreRefusedBeforeAnythingIsLogged) {
    TestImage image(RGBA, 2, 2, 16);
    for (auto [src, dst] : {std::pair<const QKImage*, QKImage*>{nullptr, &image.image}, {&image.image, nullptr}}) {
        LogCapture log;
        EXPECT_EQ(QKImage_convert(src, dst), QK_ERROR_NULL_PARAM);
        EXPECT_EQ(log.lines().size(), 1u);
        EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_NULL_PARAM, kEntryFile));
    }
}

TEST(Convert, RefusalsLeaveTheDestinationAsItWas) {
    constexpr int32_t PARAM = QK_ERROR_INVALID_PARAM, SIZE = QK_ERROR_INVALID_SIZE;
    const struct {
        const char* what;
        ImageSpec src, dst;
        int32_t status;
    } cases[] = {
        {"source without buffer", {RGBA, 4, 4, 0}, {RGBA, 4, 4, 64}, PARAM},
        {"destination without buffer", {RGBA, 4, 4, 64}, {RGBA, 4, 4, 0}, PARAM},
        {"JPEG destination", {RGBA, 4, 4, 64}, {JPEG, 4, 4, 64, 64}, PARAM},
        {"unknown destination format", {RGBA, 4, 4, 64}, {0x12345678, 4, 4, 64, 64}, PARAM},
        {"source of 0 x 5", {RGBA, 0, 5, 64}, {RGBA, 4, 4, 64}, PARAM},
        {"NV12 source of odd width", {NV12, 3, 4, 64}, {RGBA, 4, 4, 64}, SIZE},
        {"NV12 source of odd height", {NV12, 4, 3, 64}, {RGBA, 4, 4, 64}, SIZE},
        {"YUYV source of odd width", {YUYV, 3, 2, 64}, {RGBA, 4, 4, 64}, SIZE},
        {"NV12 destination whose own width is odd", {RGBA, 4, 4, 64}, {NV12, 3, 4, 64, 64}, SIZE},
        {"RGBA of odd width into NV12", {RGBA, 3, 4, 64}, {NV12, 4, 4, 64}, SIZE},
        {"GREY of odd width into YUYV", {GREY, 3, 2, 64}, {YUYV, 4, 2, 64}, SIZE},
        {"YUYV of odd height into YV12", {YUYV, 4, 3, 64}, {YV12, 4, 4, 64}, SIZE},
        {"NV12 destination of 0 x 0", {RGBA, 4, 4, 64}, {NV12, 0, 0, 64}, SIZE},
        {"destination one byte short", {RGBA, 4, 4, 64}, {BGRA, 4, 4, 64, 63}, SIZE},
        {"destination chroma past its buffer", {RGBA, 16, 8, 512}, {NV12, 16, 8, 319, 319, 256}, SIZE},
        {"source chroma past its recorded size", {NV21, 16, 8, 319, 319, 256}, {RGBA, 16, 8, 512}, SIZE},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        TestImage src(c.src), dst(c.dst);
        const std::vector<uint8_t> before = dst.buffer;
        LogCapture log;
        EXPECT_EQ(QKImage_convert(&src.image, &dst.image), c.status);
        EXPECT_TRUE(HasOneFailureReport(log, c.status, kEntryFile));
        EXPECT_TRUE(log.contains(1, "[QKImage] Converting from " + std::to_string(c.src.width) + "x" +
                                        std::to_string(c.src.height) + " " + name_of(c.src.format) + " to " +
                                        std::to_string(c.dst.width) + "x" + std::to_string(c.dst.height) + " " +
                                        name_of(c.dst.format)));
        EXPECT_EQ(dst.buffer, before);
        EXPECT_EQ(dst.image.width, c.dst.width);
        EXPECT_EQ(dst.image.height, c.dst.height);
    }
}

TEST(Convert, PairsOutsideTheFamiliesAreUnsupported) {
    const std::pair<uint32_t, uint32_t> pairs[] = {{D16, GREY}, {GREY, PCL}, {PCL, RGBA}, {RGBA, D16}, {JPEG, NV12}};
    for (auto [from, to] : pairs) {
        SCOPED_TRACE(name_of(from) + " to " + name_of(to));
        TestImage src(from, 4, 2, 256, from == JPEG ? 100 : 0);
        TestImage dst(to, 2, 2, 256, 256);
        const std::vector<uint8_t> before = dst.buffer;
        LogCapture log;
        EXPECT_EQ(QKImage_convert(&src.image, &dst.image), QK_ERROR_UNSUPPORTED);
        EXPECT_TRUE(log.contains(4, "[QKImage] Can not convert " + name_of(from) + " into " + name_of(to)));
        EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_UNSUPPORTED, kEntryFile));
        EXPECT_EQ(dst.buffer, before);
        // The source's dimensions were adopted before routing.
        EXPECT_EQ(dst.image.width, 4);
        EXPECT_EQ(dst.image.height, 2);
    }
}

TEST(Convert, DestinationAdoptsTheSourceDimensionsAndTheLogShowsThemAsPassed) {
    TestImage src(RGBA, 16, 8, 512);
    TestImage dst(NV12, 8, 4, 192, 192);
    LogCapture log;
    ASSERT_EQ(QKImage_convert(&src.image, &dst.image), QK_OK);
    EXPECT_TRUE(log.contains(1, "[QKImage] Converting from 16x8 RGBA to 8x4 NV12"));
    EXPECT_EQ(dst.image.width, 16);
    EXPECT_EQ(dst.image.height, 8);
    EXPECT_EQ(dst.image.size, 192u);
}

// Same-format pairs with chroma offsets on one side are in the every-pair
// test below; these are the cases that pair test does not make.
TEST(Convert, SameFormatIsCopiedInOneOrTwoBlocks) {
    struct Block {
        size_t srcAt, dstAt, length;
    };
    const struct {
        const char* what;
        ImageSpec src, dst;
        Block blocks[2];  // copied ranges; every other byte stays
    } cases[] = {
        {"D16", {D16, 16, 8, 300}, {D16, 16, 8, 300}, {{0, 0, 256}, {}}},
        {"PCL", {PCL, 2, 2, 120}, {PCL, 2, 2, 120}, {{0, 0, 100}, {}}},
        {"NV12 of equal recorded sizes", {NV12, 16, 8, 400, 400}, {NV12, 16, 8, 400, 400}, {{0, 0, 400}, {}}},
        // One block of the needed size would stop short of the chroma.
        {"YV12 with both chromas at 300", {YV12, 16, 8, 364, 0, 300}, {YV12, 16, 8, 370, 370, 300},
         {{0, 0, 128}, {300, 300, 64}}},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        TestImage src(c.src), dst(c.dst);
        std::mt19937 random(7);
        src.randomize(random);
        std::vector<uint8_t> expected = dst.buffer;
        for (const Block& block : c.blocks) {
            std::copy_n(src.buffer.begin() + block.srcAt, block.length, expected.begin() + block.dstAt);
        }
        LogCapture log;
        EXPECT_EQ(QKImage_convert(&src.image, &dst.image), QK_OK);
        EXPECT_TRUE(HasNoErrors(log));
        EXPECT_EQ(dst.buffer, expected);
    }
    // An image converted into itself stays as it is.
    TestImage image(NV21, 16, 8, 192);
    const std::vector<uint8_t> before = image.buffer;
    LogCapture log;
    EXPECT_EQ(QKImage_convert(&image.image, &image.image), QK_OK);
    EXPECT_EQ(image.buffer, before);
}

// Small hand-checked conversions, one per kind of move, as a check on the
// plain reference as much as on the library.
TEST(Convert, WorkedExamples) {
    const std::vector<uint8_t> rgbSquare = {255, 0, 0, 0, 255, 0, 0, 0, 255, 255, 255, 255};
    const std::vector<uint8_t> nv12 = {76, 149, 29, 255, 85, 255};
    const std::vector<uint8_t> small = {1, 2, 3, 4, 50, 60};
    const struct {
        uint32_t from;
        int32_t width, height;
        std::vector<uint8_t> in;
        uint32_t to;
        std::vector<uint8_t> out;
    } examples[] = {
        {RGB8, 2, 2, rgbSquare, NV12, {76, 149, 29, 255, 85, 255}},
        {RGB8, 2, 2, rgbSquare, YV12, {76, 149, 29, 255, 255, 85}},
        {BGR8, 2, 1, {0, 0, 255, 255, 255, 255}, YUYV, {76, 85, 255, 255}},
        {ABGR, 1, 1, {7, 1, 2, 3}, RGBA, {3, 2, 1, 7}},
        {RGB8, 1, 1, {10, 20, 30}, RGBA, {10, 20, 30, 255}},
        {NV12, 2, 2, nv12, RGBA, {254, 0, 0, 255, 255, 73, 72, 255, 207, 0, 0, 255, 255, 179, 178, 255}},
        {NV21, 2, 2, nv12, RGBA, {15, 63, 255, 255, 88, 136, 255, 255, 0, 16, 254, 255, 194, 242, 255, 255}},
        {GREY, 3, 1, {0, 128, 255}, BGRA, {0, 0, 0, 255, 128, 128, 128, 255, 255, 255, 255, 255}},
        {NV12, 2, 2, small, YUYV, {1, 50, 2, 60, 3, 50, 4, 60}},
        {YUYV, 2, 2, {1, 10, 2, 20, 3, 30, 4, 40}, NV12, {1, 2, 3, 4, 10, 20}},
        {GREY, 2, 2, {1, 2, 3, 4}, NV12, {1, 2, 3, 4, 127, 127}},
    };
    for (const auto& e : examples) {
        SCOPED_TRACE(name_of(e.from) + " to " + name_of(e.to));
        QKImage* src = QKImage_createWrap(const_cast<uint8_t*>(e.in.data()), e.width, e.height, e.from, 0, 0);
        // One spare byte shows that nothing is written past the result.
        std::vector<uint8_t> out(e.out.size() + 1, 0xEE);
        QKImage* dst = QKImage_createWrap(out.data(), e.width, e.height, e.to, static_cast<int32_t>(out.size()), 0);
        LogCapture log;
        EXPECT_EQ(QKImage_convert(src, dst), QK_OK);
        std::vector<uint8_t> expected = e.out;
        expected.push_back(0xEE);
        EXPECT_EQ(out, expected);
        QKImage_destroy(src);
        QKImage_destroy(dst);
    }
}

bool is_420(uint32_t f) { return f == NV12 || f == NV21 || f == YV12 || f == QK_FORMAT_YUVP; }
bool needs_even_width(uint32_t f) { return f == YUYV || f == QK_FORMAT_YVYU || is_420(f); }

// Every ordered pair of the 13 convertible formats (same-format copies
// included), random frames of several sizes, and 4:2:0 chroma moved away from
// the luma on the source side, the destination side, or both.
TEST(Convert, EveryPairMatchesThePlainReference) {
    const std::pair<int32_t, int32_t> sizes[] = {{2, 2}, {6, 4}, {34, 10}, {64, 6}, {5, 3}};
    std::mt19937 random(2024);
    int conversions = 0;
    for (uint32_t from : qktest::kConvertibleFormats) {
        for (uint32_t to : qktest::kConvertibleFormats) {
            for (auto [width, height] : sizes) {
                const bool odd = width % 2 != 0 || height % 2 != 0;
                if (odd && (needs_even_width(from) || needs_even_width(to))) continue;
                for (int gaps = 0; gaps < 4; ++gaps) {
                    const bool srcGap = (gaps & 1) != 0, dstGap = (gaps & 2) != 0;
                    if ((srcGap && !is_420(from)) || (dstGap && !is_420(to))) continue;
                    SCOPED_TRACE(name_of(from) + " to " + name_of(to) + " at " + std::to_string(width) + "x" +
                                 std::to_string(height) + ", chroma gaps " + std::to_string(gaps));
                    const uint32_t luma = static_cast<uint32_t>(width * height);
                    const uint32_t srcOffset = srcGap ? luma + 24 : 0;
                    const uint32_t dstOffset = dstGap ? luma + 40 : 0;
                    const uint64_t srcBytes = srcGap ? srcOffset + luma / 2 : QKImage_requiredSize(width, height, from);
                    const uint64_t dstBytes =
                        (dstGap ? dstOffset + luma / 2 : QKImage_requiredSize(width, height, to)) + 16;
                    TestImage src(from, width, height, srcBytes, srcGap ? srcBytes : 0, srcOffset);
                    TestImage dst(to, width, height, dstBytes, dstBytes, dstOffset);
                    src.randomize(random);
                    dst.randomize(random);
                    const std::vector<uint8_t> expected = qktest::reference_conversion(src.image, dst.image, dstBytes);
                    LogCapture log;  // BGRA to NV12 reports the missing vendor library
                    ASSERT_EQ(QKImage_convert(&src.image, &dst.image), QK_OK);
                    ASSERT_EQ(dst.buffer, expected);
                    ++conversions;
                }
            }
        }
    }
    EXPECT_GT(conversions, 13 * 13 * 4);
}

TEST(CopyAndConvert, ReturnsANewConvertedImageOrNull) {
    TestImage nv21(NV21, 4, 2, 12);
    TestImage grey(GREY, 4, 2, 8);
    {
        LogCapture log;
        EXPECT_EQ(QKImage_copyAndConvert(nullptr, RGBA), nullptr);
        EXPECT_EQ(QKImage_copyAndConvert(&nv21.image, JPEG), nullptr);
        EXPECT_TRUE(log.lines().empty());
        EXPECT_EQ(QKImage_copyAndConvert(&grey.image, D16), nullptr);
        EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_UNSUPPORTED, kEntryFile));
    }
    LogCapture log;
    QKImage* copy = QKImage_copyAndConvert(&nv21.image, RGBA);
    ASSERT_NE(copy, nullptr);
    EXPECT_EQ(copy->width, 4);
    EXPECT_EQ(copy->height, 2);
    EXPECT_EQ(copy->format, RGBA);
    EXPECT_EQ(copy->isWrapped, 0u);
    TestImage expected(RGBA, 4, 2, 32);
    EXPECT_EQ(std::vector<uint8_t>(copy->data, copy->data + 32),
              qktest::reference_conversion(nv21.image, expected.image, 32));
    QKImage_destroy(copy);
}

}  // namespace
