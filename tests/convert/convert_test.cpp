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
using qktest::LogCapture;
using qktest::TestImage;

constexpr const char* kEntryFile = "src/convert/convert.cpp";

// A format code as "%4.4s" prints it: up to four characters, right-aligned
// (" D16").
std::string name_of(uint32_t format) {
    std::string name(reinterpret_cast<const char*>(&format), 4);
    name = name.substr(0, name.find('\0'));
    return std::string(4 - name.size(), ' ') + name;
}

std::string start_line(int sw, int sh, uint32_t sf, int dw, int dh, uint32_t df) {
    return "[QKImage] Converting from " + std::to_string(sw) + "x" + std::to_string(sh) + " " + name_of(sf) +
           " to " + std::to_string(dw) + "x" + std::to_string(dh) + " " + name_of(df);
}

TEST(Convert, NullImagesAreRefusedBeforeAnythingIsLogged) {
    TestImage image(QK_FORMAT_RGBA, 2, 2, 16);
    for (auto [src, dst] : {std::pair<const QKImage*, QKImage*>{nullptr, &image.image}, {&image.image, nullptr}}) {
        LogCapture log;
        EXPECT_EQ(QKImage_convert(src, dst), QK_ERROR_NULL_PARAM);
        EXPECT_EQ(log.lines().size(), 1u);
        EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_NULL_PARAM, kEntryFile));
    }
}

struct ImageSpec {
    uint32_t format;
    int32_t width, height;
    size_t bytes;  // buffer length; 0 gives no buffer
    uint64_t size;
    uint32_t chromaOffset;
};

struct RefusalCase {
    const char* what;
    ImageSpec src, dst;
    int32_t status;
};

TEST(Convert, RefusalsLeaveTheDestinationAsItWas) {
    const RefusalCase cases[] = {
        {"source without buffer", {QK_FORMAT_RGBA, 4, 4, 0, 0, 0}, {QK_FORMAT_RGBA, 4, 4, 64, 0, 0},
         QK_ERROR_INVALID_PARAM},
        {"destination without buffer", {QK_FORMAT_RGBA, 4, 4, 64, 0, 0}, {QK_FORMAT_RGBA, 4, 4, 0, 0, 0},
         QK_ERROR_INVALID_PARAM},
        {"JPEG destination", {QK_FORMAT_RGBA, 4, 4, 64, 0, 0}, {QK_FORMAT_JPEG, 4, 4, 64, 64, 0},
         QK_ERROR_INVALID_PARAM},
        {"JPEG to JPEG", {QK_FORMAT_JPEG, 4, 4, 64, 64, 0}, {QK_FORMAT_JPEG, 4, 4, 64, 64, 0},
         QK_ERROR_INVALID_PARAM},
        {"unknown destination format", {QK_FORMAT_RGBA, 4, 4, 64, 0, 0}, {0x12345678, 4, 4, 64, 64, 0},
         QK_ERROR_INVALID_PARAM},
        {"source of 0 x 5", {QK_FORMAT_RGBA, 0, 5, 64, 0, 0}, {QK_FORMAT_RGBA, 4, 4, 64, 0, 0},
         QK_ERROR_INVALID_PARAM},
        {"NV12 source of odd width", {QK_FORMAT_NV12, 3, 4, 64, 0, 0}, {QK_FORMAT_RGBA, 4, 4, 64, 0, 0},
         QK_ERROR_INVALID_SIZE},
        {"NV12 source of odd height", {QK_FORMAT_NV12, 4, 3, 64, 0, 0}, {QK_FORMAT_RGBA, 4, 4, 64, 0, 0},
         QK_ERROR_INVALID_SIZE},
        {"YUYV source of odd width", {QK_FORMAT_YUYV, 3, 2, 64, 0, 0}, {QK_FORMAT_RGBA, 4, 4, 64, 0, 0},
         QK_ERROR_INVALID_SIZE},
        {"NV12 destination whose own width is odd", {QK_FORMAT_RGBA, 4, 4, 64, 0, 0},
         {QK_FORMAT_NV12, 3, 4, 64, 64, 0}, QK_ERROR_INVALID_SIZE},
        {"RGBA of odd width into NV12", {QK_FORMAT_RGBA, 3, 4, 64, 0, 0}, {QK_FORMAT_NV12, 4, 4, 64, 0, 0},
         QK_ERROR_INVALID_SIZE},
        {"RGB8 of odd height into NV21", {QK_FORMAT_RGB8, 4, 3, 64, 0, 0}, {QK_FORMAT_NV21, 4, 4, 64, 0, 0},
         QK_ERROR_INVALID_SIZE},
        {"GREY of odd width into YUYV", {QK_FORMAT_GREY, 3, 2, 64, 0, 0}, {QK_FORMAT_YUYV, 4, 2, 64, 0, 0},
         QK_ERROR_INVALID_SIZE},
        {"YUYV of odd height into YV12", {QK_FORMAT_YUYV, 4, 3, 64, 0, 0}, {QK_FORMAT_YV12, 4, 4, 64, 0, 0},
         QK_ERROR_INVALID_SIZE},
        {"NV12 destination of 0 x 0", {QK_FORMAT_RGBA, 4, 4, 64, 0, 0}, {QK_FORMAT_NV12, 0, 0, 64, 0, 0},
         QK_ERROR_INVALID_SIZE},
        {"destination one byte short", {QK_FORMAT_RGBA, 4, 4, 64, 0, 0}, {QK_FORMAT_BGRA, 4, 4, 64, 63, 0},
         QK_ERROR_INVALID_SIZE},
        {"destination chroma past its buffer", {QK_FORMAT_RGBA, 16, 8, 512, 0, 0},
         {QK_FORMAT_NV12, 16, 8, 319, 319, 256}, QK_ERROR_INVALID_SIZE},
        {"source chroma past its recorded size", {QK_FORMAT_NV21, 16, 8, 319, 319, 256},
         {QK_FORMAT_RGBA, 16, 8, 512, 0, 0}, QK_ERROR_INVALID_SIZE},
    };
    for (const RefusalCase& c : cases) {
        SCOPED_TRACE(c.what);
        TestImage src(c.src.format, c.src.width, c.src.height, c.src.bytes, c.src.size, c.src.chromaOffset);
        TestImage dst(c.dst.format, c.dst.width, c.dst.height, c.dst.bytes, c.dst.size, c.dst.chromaOffset);
        const std::vector<uint8_t> before = dst.buffer;
        LogCapture log;
        EXPECT_EQ(QKImage_convert(&src.image, &dst.image), c.status);
        EXPECT_TRUE(HasOneFailureReport(log, c.status, kEntryFile));
        EXPECT_TRUE(log.contains(1, start_line(c.src.width, c.src.height, c.src.format, c.dst.width, c.dst.height,
                                               c.dst.format)));
        EXPECT_EQ(dst.buffer, before);
        EXPECT_EQ(dst.image.width, c.dst.width);
        EXPECT_EQ(dst.image.height, c.dst.height);
    }
}

TEST(Convert, PairsOutsideTheFamiliesAreUnsupported) {
    const std::pair<uint32_t, uint32_t> pairs[] = {
        {QK_FORMAT_D16, QK_FORMAT_GREY}, {QK_FORMAT_GREY, QK_FORMAT_PCL}, {QK_FORMAT_PCL, QK_FORMAT_RGBA},
        {QK_FORMAT_RGBA, QK_FORMAT_D16}, {QK_FORMAT_D16, QK_FORMAT_PCL},  {QK_FORMAT_JPEG, QK_FORMAT_NV12},
    };
    for (auto [from, to] : pairs) {
        SCOPED_TRACE(name_of(from) + " to " + name_of(to));
        TestImage src(from, 4, 2, 256, from == QK_FORMAT_JPEG ? 100 : 0);
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
    TestImage src(QK_FORMAT_RGBA, 16, 8, 512);
    TestImage dst(QK_FORMAT_NV12, 8, 4, 192, 192);
    LogCapture log;
    ASSERT_EQ(QKImage_convert(&src.image, &dst.image), QK_OK);
    EXPECT_TRUE(log.contains(1, "[QKImage] Converting from 16x8 RGBA to 8x4 NV12"));
    EXPECT_EQ(dst.image.width, 16);
    EXPECT_EQ(dst.image.height, 8);
    EXPECT_EQ(dst.image.size, 192u);
    EXPECT_EQ(dst.image.chromaOffset, 0u);
}

struct CopyCase {
    const char* what;
    ImageSpec src, dst;
    // Expected destination: ranges [dstAt, dstAt + length) copied from the
    // source at srcAt; every other byte untouched.
    struct Block {
        size_t srcAt, dstAt, length;
    } blocks[2];
};

TEST(Convert, SameFormatIsCopiedInOneOrTwoBlocks) {
    const CopyCase cases[] = {
        {"D16", {QK_FORMAT_D16, 16, 8, 300, 0, 0}, {QK_FORMAT_D16, 16, 8, 300, 0, 0}, {{0, 0, 256}, {}}},
        {"PCL", {QK_FORMAT_PCL, 2, 2, 120, 0, 0}, {QK_FORMAT_PCL, 2, 2, 120, 0, 0}, {{0, 0, 100}, {}}},
        {"RGBA into a larger buffer", {QK_FORMAT_RGBA, 4, 2, 32, 0, 0}, {QK_FORMAT_RGBA, 2, 2, 48, 48, 0},
         {{0, 0, 32}, {}}},
        {"NV12 into chroma at 256", {QK_FORMAT_NV12, 16, 8, 192, 0, 0}, {QK_FORMAT_NV12, 16, 8, 330, 320, 256},
         {{0, 0, 128}, {128, 256, 64}}},
        {"NV21 from chroma at 200", {QK_FORMAT_NV21, 16, 8, 264, 264, 200}, {QK_FORMAT_NV21, 16, 8, 200, 0, 0},
         {{0, 0, 128}, {200, 128, 64}}},
        {"NV12 of equal recorded sizes", {QK_FORMAT_NV12, 16, 8, 400, 400, 0}, {QK_FORMAT_NV12, 16, 8, 400, 400, 0},
         {{0, 0, 400}, {}}},
        // Same chroma offset but a block of the needed size would stop short
        // of the chroma: luma and chroma are copied separately.
        {"YV12 with both chromas at 300", {QK_FORMAT_YV12, 16, 8, 364, 0, 300},
         {QK_FORMAT_YV12, 16, 8, 370, 370, 300}, {{0, 0, 128}, {300, 300, 64}}},
    };
    for (const CopyCase& c : cases) {
        SCOPED_TRACE(c.what);
        TestImage src(c.src.format, c.src.width, c.src.height, c.src.bytes, c.src.size, c.src.chromaOffset);
        TestImage dst(c.dst.format, c.dst.width, c.dst.height, c.dst.bytes, c.dst.size, c.dst.chromaOffset);
        std::mt19937 random(7);
        src.randomize(random);
        std::vector<uint8_t> expected = dst.buffer;
        for (const CopyCase::Block& block : c.blocks) {
            std::copy_n(src.buffer.begin() + block.srcAt, block.length, expected.begin() + block.dstAt);
        }
        LogCapture log;
        EXPECT_EQ(QKImage_convert(&src.image, &dst.image), QK_OK);
        EXPECT_TRUE(HasNoErrors(log));
        EXPECT_EQ(dst.buffer, expected);
    }
}

struct Example {
    const char* what;
    uint32_t from;
    int32_t width, height;
    std::vector<uint8_t> in;
    uint32_t to;
    std::vector<uint8_t> out;
};

// Small hand-checked conversions, one per kind of layout move.
TEST(Convert, WorkedExamples) {
    const std::vector<uint8_t> rgbSquare = {255, 0, 0, 0, 255, 0, 0, 0, 255, 255, 255, 255};
    const std::vector<uint8_t> nv12 = {76, 149, 29, 255, 85, 255};
    const std::vector<uint8_t> small = {1, 2, 3, 4, 50, 60};
    const std::vector<uint8_t> yuyv = {1, 10, 2, 20, 3, 30, 4, 40};
    const Example examples[] = {
        {"RGB8 to NV12", QK_FORMAT_RGB8, 2, 2, rgbSquare, QK_FORMAT_NV12, {76, 149, 29, 255, 85, 255}},
        {"RGB8 to NV21", QK_FORMAT_RGB8, 2, 2, rgbSquare, QK_FORMAT_NV21, {76, 149, 29, 255, 255, 85}},
        {"RGB8 to YV12", QK_FORMAT_RGB8, 2, 2, rgbSquare, QK_FORMAT_YV12, {76, 149, 29, 255, 255, 85}},
        {"RGB8 to YUVP", QK_FORMAT_RGB8, 2, 2, rgbSquare, QK_FORMAT_YUVP, {76, 149, 29, 255, 85, 255}},
        {"BGR8 to YUYV", QK_FORMAT_BGR8, 2, 1, {0, 0, 255, 255, 255, 255}, QK_FORMAT_YUYV, {76, 85, 255, 255}},
        {"RGB8 to GREY, odd width", QK_FORMAT_RGB8, 3, 1, {255, 0, 0, 0, 255, 0, 10, 20, 30}, QK_FORMAT_GREY,
         {76, 149, 18}},
        {"RGB8 to RGBA", QK_FORMAT_RGB8, 1, 1, {10, 20, 30}, QK_FORMAT_RGBA, {10, 20, 30, 255}},
        {"BGRA to ARGB", QK_FORMAT_BGRA, 1, 1, {1, 2, 3, 4}, QK_FORMAT_ARGB, {4, 3, 2, 1}},
        {"ARGB to BGR8", QK_FORMAT_ARGB, 1, 1, {9, 1, 2, 3}, QK_FORMAT_BGR8, {3, 2, 1}},
        {"ABGR to RGBA", QK_FORMAT_ABGR, 1, 1, {7, 1, 2, 3}, QK_FORMAT_RGBA, {3, 2, 1, 7}},
        {"NV12 to RGBA", QK_FORMAT_NV12, 2, 2, nv12, QK_FORMAT_RGBA,
         {254, 0, 0, 255, 255, 73, 72, 255, 207, 0, 0, 255, 255, 179, 178, 255}},
        {"NV21 to RGBA", QK_FORMAT_NV21, 2, 2, nv12, QK_FORMAT_RGBA,
         {15, 63, 255, 255, 88, 136, 255, 255, 0, 16, 254, 255, 194, 242, 255, 255}},
        {"YUYV to RGB8", QK_FORMAT_YUYV, 2, 1, {16, 128, 235, 128}, QK_FORMAT_RGB8, {16, 16, 16, 235, 235, 235}},
        {"GREY to BGRA, odd width", QK_FORMAT_GREY, 3, 1, {0, 128, 255}, QK_FORMAT_BGRA,
         {0, 0, 0, 255, 128, 128, 128, 255, 255, 255, 255, 255}},
        {"NV12 to NV21", QK_FORMAT_NV12, 2, 2, small, QK_FORMAT_NV21, {1, 2, 3, 4, 60, 50}},
        {"NV12 to YV12", QK_FORMAT_NV12, 2, 2, small, QK_FORMAT_YV12, {1, 2, 3, 4, 60, 50}},
        {"NV12 to YUVP", QK_FORMAT_NV12, 2, 2, small, QK_FORMAT_YUVP, {1, 2, 3, 4, 50, 60}},
        {"NV12 to YUYV", QK_FORMAT_NV12, 2, 2, small, QK_FORMAT_YUYV, {1, 50, 2, 60, 3, 50, 4, 60}},
        {"YUYV to NV12", QK_FORMAT_YUYV, 2, 2, yuyv, QK_FORMAT_NV12, {1, 2, 3, 4, 10, 20}},
        {"YUYV to YVYU", QK_FORMAT_YUYV, 2, 2, yuyv, QK_FORMAT_YVYU, {1, 20, 2, 10, 3, 40, 4, 30}},
        {"GREY to NV12", QK_FORMAT_GREY, 2, 2, {1, 2, 3, 4}, QK_FORMAT_NV12, {1, 2, 3, 4, 127, 127}},
        {"GREY to YUYV", QK_FORMAT_GREY, 2, 2, {1, 2, 3, 4}, QK_FORMAT_YUYV, {1, 127, 2, 127, 3, 127, 4, 127}},
        {"NV21 to GREY", QK_FORMAT_NV21, 2, 2, small, QK_FORMAT_GREY, {1, 2, 3, 4}},
    };
    for (const Example& e : examples) {
        SCOPED_TRACE(e.what);
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

bool needs_even_width(uint32_t f) {
    return f == QK_FORMAT_YUYV || f == QK_FORMAT_YVYU || f == QK_FORMAT_NV12 || f == QK_FORMAT_NV21 ||
           f == QK_FORMAT_YV12 || f == QK_FORMAT_YUVP;
}
bool is_420(uint32_t f) {
    return f == QK_FORMAT_NV12 || f == QK_FORMAT_NV21 || f == QK_FORMAT_YV12 || f == QK_FORMAT_YUVP;
}

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
    TestImage nv21(QK_FORMAT_NV21, 4, 2, 12);
    {
        LogCapture log;
        EXPECT_EQ(QKImage_copyAndConvert(nullptr, QK_FORMAT_RGBA), nullptr);
        EXPECT_EQ(QKImage_copyAndConvert(&nv21.image, QK_FORMAT_JPEG), nullptr);
        EXPECT_TRUE(log.lines().empty());
    }
    {
        TestImage grey(QK_FORMAT_GREY, 4, 2, 8);
        LogCapture log;
        EXPECT_EQ(QKImage_copyAndConvert(&grey.image, QK_FORMAT_D16), nullptr);
        EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_UNSUPPORTED, kEntryFile));
    }
    LogCapture log;
    QKImage* copy = QKImage_copyAndConvert(&nv21.image, QK_FORMAT_RGBA);
    ASSERT_NE(copy, nullptr);
    EXPECT_EQ(copy->width, 4);
    EXPECT_EQ(copy->height, 2);
    EXPECT_EQ(copy->format, QK_FORMAT_RGBA);
    EXPECT_EQ(copy->isWrapped, 0u);
    TestImage expected(QK_FORMAT_RGBA, 4, 2, 32);
    EXPECT_EQ(std::vector<uint8_t>(copy->data, copy->data + 32), qktest::reference_conversion(nv21.image, expected.image, 32));
    QKImage_destroy(copy);
}

}  // namespace
