// Image objects: buffer sizes, buffers they own or wrap, their refusals and
// clones (the field layout is held by the install consumer test, in C and
// C++). AddressSanitizer's leak check sees an owned buffer that is lost, and
// its heap checks a caller's buffer that is freed.
#include <gtest/gtest.h>
#include <string.h>

#include <vector>

#include "qkcore/qk_image.h"
#include "support/images.h"
#include "support/log_capture.h"

namespace {

using namespace qktest;

uint32_t point_count(const QKImage& image) {
    uint32_t count;
    memcpy(&count, image.data, sizeof(count));
    return count;
}

// Each convertible format's rule is held by the every-pair conversion test
// (its buffers, measured apart), D16's by the same-format copies.
TEST(SizeRule, BytesPerFormat) {
    const struct { int32_t width, height; uint32_t format; uint64_t bytes; } cases[] = {
        {16, 8, QK_FORMAT_NV12, 192}, {2, 2, QK_FORMAT_PCL, 100},
        // 4:2:0 of an odd pixel count rounds half a byte up.
        {3, 3, QK_FORMAT_NV12, 14}, {1, 1, QK_FORMAT_NV21, 2}, {5, 1, QK_FORMAT_YV12, 8},
        // No size: bad dimensions, no size rule, or past the signed 32-bit
        // byte range (where 32-bit arithmetic would wrap to a small size).
        {0, 10, QK_FORMAT_GREY, 0}, {10, -1, QK_FORMAT_GREY, 0}, {INT32_MIN, INT32_MIN, QK_FORMAT_RGBA, 0},
        {10, 10, QK_FORMAT_JPEG, 0}, {10, 10, 0, 0}, {10, 10, QK_FOURCC('X', 'Y', 'Z', 'W'), 0},
        {46341, 46341, QK_FORMAT_GREY, 0},  // 2^31 + 80621 pixels
        {65536, 65536, QK_FORMAT_RGBA, 0},  // 4 x 2^32 wraps to 0
        {32768, 16384, QK_FORMAT_RGBA, 0},  // exactly 2^31
        {INT32_MAX, INT32_MAX, QK_FORMAT_PCL, 0}, {INT32_MAX, 1, QK_FORMAT_NV12, 0},
        {1 << 30, 1 << 30, QK_FORMAT_PCL, 0},  // 16 x 2^60 + 36 wraps to 36 in 64 bits
        {INT32_MAX, 1, QK_FORMAT_GREY, INT32_MAX}, {8192, 8191, QK_FORMAT_RGBA, 268402688}};
    for (const auto& c : cases) {
        EXPECT_EQ(QKImage_requiredSize(c.width, c.height, c.format), c.bytes) << c.width << "x" << c.height;
    }
    // The recorded size wins over the rule, which has none for JPEG.
    QKImage image;
    image.width = 10, image.height = 10, image.format = QK_FORMAT_JPEG, image.size = 999;
    EXPECT_EQ(QKImage_size(&image) + QKImage_size(nullptr), 999u);
}

// Rule-sized unless a size is preset (which drops the chroma offset of the
// old buffer); an image with a buffer keeps it; PCL buffers start with their
// point count; failures to create are silent.
TEST(Image, OwnedBuffers) {
    LogCapture log;
    ImagePtr rgba(QKImage_createNew(10, 10, QK_FORMAT_RGBA)), pcl(QKImage_createNew(2, 2, QK_FORMAT_PCL));
    EXPECT_EQ(std::make_tuple(rgba->size, rgba->isWrapped, point_count(*pcl)), std::make_tuple(400ul, 0u, 4u));
    memset(rgba->data, 0xab, rgba->size);
    uint8_t* buffer = rgba->data;
    rgba->size = 0;
    EXPECT_EQ(QKImage_allocate(rgba.get()), 400);
    EXPECT_EQ(rgba->data, buffer);
    ImagePtr preset(QKImage_createEmpty(10, 10, QK_FORMAT_RGBA)), points(QKImage_createEmpty(3, 1, QK_FORMAT_PCL));
    preset->size = 1000, preset->chromaOffset = 12;
    EXPECT_EQ(QKImage_allocate(preset.get()), 1000);
    EXPECT_EQ(preset->chromaOffset, 0u);
    memset(preset->data, 0, 1000);
    EXPECT_EQ(QKImage_allocate(points.get()), 84);
    EXPECT_EQ(point_count(*points), 3u);
    EXPECT_EQ(QKImage_createNew(0, 5, QK_FORMAT_RGBA), nullptr);
    EXPECT_EQ(QKImage_createNew(5, 5, QK_FORMAT_JPEG), nullptr);
    EXPECT_EQ(QKImage_createNew(65536, 65536, QK_FORMAT_RGBA), nullptr);  // 2^34 bytes
    EXPECT_TRUE(log.lines().empty());
}

// Wrapping frees an owned buffer and never the caller's, and reports the
// recorded size (a negative one counts as 0) or else the rule size.
// Deallocation keeps the header; reset without a buffer clears only width,
// height and format.
TEST(Image, WrapDeallocateAndReset) {
    LogCapture log;
    uint8_t on_stack[64];
    QKImage_destroy(QKImage_createWrap(on_stack, 4, 4, QK_FORMAT_RGBA, 64, 0));
    std::vector<uint8_t> pixels(100);
    ImagePtr image(QKImage_createNew(4, 4, QK_FORMAT_NV12));
    EXPECT_EQ(QKImage_wrap(image.get(), pixels.data(), 0, 0), 24);
    EXPECT_EQ(QKImage_wrap(image.get(), pixels.data(), 100, 32), 100);
    EXPECT_EQ(std::make_tuple(image->isWrapped, image->chromaOffset), std::make_tuple(1u, 32u));
    EXPECT_EQ(QKImage_wrap(image.get(), pixels.data(), -5, 0), 24);
    EXPECT_EQ(image->size, 0u);
    image->chromaOffset = 16;
    QKImage_deallocate(image.get());
    EXPECT_EQ(std::make_tuple(image->data, image->width, image->size, image->chromaOffset),
              std::make_tuple(static_cast<uint8_t*>(nullptr), 4, 0ul, 0u));
    ImagePtr jpeg(QKImage_createEmpty(4, 4, QK_FORMAT_JPEG));
    EXPECT_EQ(QKImage_wrap(jpeg.get(), pixels.data(), 0, 0), 0);  // no rule size
    ImagePtr bare(QKImage_createWrap(nullptr, 10, 10, QK_FORMAT_RGBA, 500, 16));
    EXPECT_EQ(bare->isWrapped + bare->size + bare->chromaOffset, 0u);  // nothing to record without a buffer
    bare->size = 500;
    QKImage_reset(bare.get());
    EXPECT_EQ(std::make_tuple(bare->width, bare->height, bare->format, bare->size), std::make_tuple(0, 0, 0u, 500ul));
    QKImage_deallocate(nullptr);
    QKImage_reset(nullptr);
    QKImage_destroy(nullptr);
    EXPECT_TRUE(log.lines().empty());
}

uint8_t some_byte;

TEST(Image, RefusalsReportOnceAndChangeNothing) {
    using Call = int32_t (*)(QKImage*);
    const Call allocate = QKImage_allocate;
    const Call wrap_byte = [](QKImage* image) { return QKImage_wrap(image, &some_byte, 24, 0); };
    const Call wrap_nothing = [](QKImage* image) { return QKImage_wrap(image, nullptr, 24, 0); };
    // Wrapping an image's own buffer would free what it then points at.
    const Call wrap_own = [](QKImage* image) { return QKImage_wrap(image, image->data, 24, 0); };
    constexpr int32_t NUL = QK_ERROR_NULL_PARAM, PARAM = QK_ERROR_INVALID_PARAM;
    // image 0: none, 1: without buffer, with the preset size; 2: with a buffer of its own.
    const struct { Call call; int image; uint32_t format; int32_t width; uint64_t preset; int32_t status; } cases[] = {
        {allocate, 0, QK_FORMAT_RGBA, 1, 0, NUL},
        {allocate, 1, QK_FORMAT_JPEG, 10, 0, PARAM},                         // no size rule
        {allocate, 1, QK_FORMAT_RGBA, 0, 0, PARAM},                          // dimension below 1
        {allocate, 1, QK_FORMAT_RGBA, 10, 1ull << 33, PARAM},                // not a 32-bit byte count
        {allocate, 1, QK_FORMAT_PCL, 1, 3, QK_ERROR_INVALID_SIZE},           // no room for the point count
        {wrap_byte, 0, QK_FORMAT_NV12, 4, 0, NUL},
        {wrap_nothing, 2, QK_FORMAT_NV12, 4, 0, NUL},
        {wrap_own, 2, QK_FORMAT_NV12, 4, 0, PARAM}};
    for (const auto& c : cases) {
        ImagePtr image(c.image == 0   ? nullptr
                       : c.image == 1 ? QKImage_createEmpty(c.width, 1, c.format)
                                      : QKImage_createNew(c.width, 4, c.format));
        if (c.image == 1) image->size = c.preset, image->chromaOffset = 7;
        const auto before = snapshot(image.get());
        LogCapture log;
        EXPECT_EQ(c.call(image.get()), c.status);
        EXPECT_TRUE(HasOneFailureReport(log, c.status, "src/image/image.cpp"));
        EXPECT_TRUE(snapshot(image.get()) == before);
    }
}

// A clone holds exactly one image: separated 4:2:0 chroma gathered behind
// the luma, never a byte read past what the source records (the rest zero),
// never a byte written past the clone's buffer.
TEST(Image, CloneGathersTheImageWithinBothBuffers) {
    std::vector<uint8_t> pixels(1000);
    for (size_t i = 0; i < pixels.size(); ++i) pixels[i] = static_cast<uint8_t>(i);
    auto bytes = [&pixels](std::vector<std::pair<size_t, size_t>> ranges, size_t total) {  // (from, count) runs
        std::vector<uint8_t> out;
        for (auto [from, count] : ranges) out.insert(out.end(), &pixels[from], &pixels[from] + count);
        return out.resize(total), out;
    };
    const struct { uint32_t format; int32_t w, h, size; uint32_t chroma; std::vector<uint8_t> expected; } cases[] = {
        {QK_FORMAT_NV21, 8, 4, 80, 64, bytes({{0, 32}, {64, 16}}, 48)},  // chroma read at 64
        {QK_FORMAT_RGBA, 10, 10, 1000, 64, bytes({{0, 400}}, 400)},      // the rule size, whatever is recorded
        {QK_FORMAT_RGBA, 4, 4, 16, 0, bytes({{0, 16}}, 64)},             // what a short source records
        {QK_FORMAT_NV12, 8, 4, 70, 64, bytes({{0, 32}, {64, 6}}, 48)},   // chroma cut by the recorded size
    };
    LogCapture log;
    for (const auto& c : cases) {
        ImagePtr source(QKImage_createWrap(pixels.data(), c.w, c.h, c.format, c.size, c.chroma));
        ImagePtr clone(QKImage_clone(source.get()));
        ASSERT_TRUE(clone);
        EXPECT_EQ(std::make_tuple(clone->isWrapped, clone->chromaOffset), std::make_tuple(0u, 0u));
        EXPECT_EQ(std::vector<uint8_t>(clone->data, clone->data + clone->size), c.expected) << fourcc(c.format);
    }
    ImagePtr bare(QKImage_createEmpty(10, 10, QK_FORMAT_RGBA));
    ImagePtr jpeg(QKImage_createWrap(pixels.data(), 10, 10, QK_FORMAT_JPEG, 1000, 0));
    for (const QKImage* source : {bare.get(), jpeg.get(), static_cast<QKImage*>(nullptr)}) {
        EXPECT_EQ(QKImage_clone(source), nullptr);
    }
    EXPECT_EQ(log.texts(4), std::vector<std::string>());
    ImagePtr header(QKImage_cloneHeader(jpeg.get()));
    EXPECT_EQ(std::make_tuple(header->data, header->width, header->format),
              std::make_tuple(static_cast<uint8_t*>(nullptr), 10, QK_FORMAT_JPEG));
    EXPECT_EQ(QKImage_cloneHeader(nullptr), nullptr);
}

}  // namespace
