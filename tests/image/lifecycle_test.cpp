#include <gtest/gtest.h>
#include <string.h>

#include <vector>

#include "qkcore/qk_image.h"
#include "support/images.h"
#include "support/log_capture.h"

namespace {

using namespace qktest;

constexpr const char* kImageSource = "src/image/image.cpp";

uint32_t point_count(const QKImage& image) {
    uint32_t count;
    memcpy(&count, image.data, sizeof(count));
    return count;
}

TEST(Create, NewImagesOwnARuleSizedBufferOrAreRefusedSilently) {
    LogCapture log;
    ImagePtr rgba(QKImage_createNew(10, 10, QK_FORMAT_RGBA));
    ASSERT_TRUE(rgba);
    EXPECT_EQ(rgba->size, 400u);
    EXPECT_EQ(rgba->isWrapped, 0u);
    memset(rgba->data, 0xab, rgba->size);  // the whole buffer is writable
    ImagePtr pcl(QKImage_createNew(2, 2, QK_FORMAT_PCL));
    EXPECT_EQ(point_count(*pcl), 4u);

    EXPECT_EQ(QKImage_createNew(0, 5, QK_FORMAT_RGBA), nullptr);
    EXPECT_EQ(QKImage_createNew(5, 5, QK_FORMAT_JPEG), nullptr);
    EXPECT_EQ(QKImage_createNew(65536, 65536, QK_FORMAT_RGBA), nullptr);  // 2^34 bytes
    EXPECT_TRUE(log.lines().empty());
}

// The library never frees a caller's buffer: AddressSanitizer would report a
// free of a stack buffer, and the writes after destruction would be use after
// free if the heap buffer had been released. Owned buffers that were not
// freed show as leaks.
TEST(Ownership, WrappedBuffersOutliveTheirImages) {
    uint8_t on_stack[64];
    QKImage_destroy(QKImage_createWrap(on_stack, 4, 4, QK_FORMAT_RGBA, 64, 0));

    uint8_t* heap = static_cast<uint8_t*>(malloc(64));
    QKImage* image = QKImage_createWrap(heap, 4, 4, QK_FORMAT_RGBA, -1, 8);
    EXPECT_EQ(image->size, 0u);  // a negative size counts as not recorded
    EXPECT_EQ(image->chromaOffset, 8u);
    QKImage_deallocate(image);
    EXPECT_EQ(image->data, nullptr);
    EXPECT_EQ(QKImage_wrap(image, heap, 64, 0), 64);
    QKImage_reset(image);
    EXPECT_EQ(QKImage_wrap(image, heap, 64, 0), 64);
    QKImage_destroy(image);
    memset(heap, 1, 64);
    free(heap);

    // Without a buffer nothing is recorded, whatever was passed.
    ImagePtr empty(QKImage_createWrap(nullptr, 10, 10, QK_FORMAT_RGBA, 400, 16));
    EXPECT_EQ(empty->isWrapped + empty->size + empty->chromaOffset, 0u);
}

TEST(Allocate, GivesAnImageWithoutBufferAnOwnedOne) {
    LogCapture log;
    ImagePtr image(QKImage_createEmpty(10, 10, QK_FORMAT_RGBA));
    EXPECT_EQ(QKImage_allocate(image.get()), 400);
    // An image with a buffer keeps it: the call only reports its size.
    uint8_t* buffer = image->data;
    image->size = 0;
    EXPECT_EQ(QKImage_allocate(image.get()), 400);
    EXPECT_EQ(image->data, buffer);

    // A preset size is honoured, and the chroma offset goes with the old buffer.
    ImagePtr preset(QKImage_createEmpty(10, 10, QK_FORMAT_RGBA));
    preset->size = 1000;
    preset->chromaOffset = 12;
    EXPECT_EQ(QKImage_allocate(preset.get()), 1000);
    EXPECT_EQ(preset->chromaOffset, 0u);
    memset(preset->data, 0, 1000);

    ImagePtr pcl(QKImage_createEmpty(3, 1, QK_FORMAT_PCL));
    EXPECT_EQ(QKImage_allocate(pcl.get()), 84);
    EXPECT_EQ(point_count(*pcl), 3u);
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
    const struct {
        Call call;
        int image;  // 0: none, 1: without buffer, with the preset size; 2: with a buffer of its own
        uint32_t format;
        int32_t width;
        uint64_t preset;
        int32_t status;
    } cases[] = {
        {allocate, 0, QK_FORMAT_RGBA, 1, 0, NUL},
        {allocate, 1, QK_FORMAT_JPEG, 10, 0, PARAM},                         // no size rule
        {allocate, 1, QK_FORMAT_RGBA, 0, 0, PARAM},                          // dimension below 1
        {allocate, 1, QK_FORMAT_RGBA, 10, 1ull << 33, PARAM},                // not a 32-bit byte count
        {allocate, 1, QK_FORMAT_PCL, 1, 3, QK_ERROR_INVALID_SIZE},           // no room for the point count
        {wrap_byte, 0, QK_FORMAT_NV12, 4, 0, NUL},
        {wrap_nothing, 2, QK_FORMAT_NV12, 4, 0, NUL},
        {wrap_own, 2, QK_FORMAT_NV12, 4, 0, PARAM},
    };
    for (const auto& c : cases) {
        ImagePtr image(c.image == 0   ? nullptr
                       : c.image == 1 ? QKImage_createEmpty(c.width, 1, c.format)
                                      : QKImage_createNew(c.width, 4, c.format));
        if (c.image == 1) image->size = c.preset, image->chromaOffset = 7;
        const auto before = snapshot(image.get());
        LogCapture log;
        EXPECT_EQ(c.call(image.get()), c.status);
        EXPECT_TRUE(HasOneFailureReport(log, c.status, kImageSource));
        EXPECT_TRUE(snapshot(image.get()) == before);
    }
}

// Deallocation keeps the header; reset without a buffer clears only width,
// height and format; wrapping frees an owned buffer (a leak otherwise) and
// reports the recorded size or else the rule size, silently.
TEST(Release, DeallocateResetAndWrap) {
    LogCapture log;
    ImagePtr image(QKImage_createNew(4, 4, QK_FORMAT_NV12));
    image->chromaOffset = 16;
    QKImage_deallocate(image.get());
    EXPECT_EQ(image->data, nullptr);
    EXPECT_EQ(image->size + image->chromaOffset, 0u);
    EXPECT_EQ(QKImage_allocate(image.get()), 24);
    std::vector<uint8_t> pixels(100);
    EXPECT_EQ(QKImage_wrap(image.get(), pixels.data(), 0, 0), 24);
    EXPECT_EQ(image->isWrapped, 1u);
    EXPECT_EQ(QKImage_wrap(image.get(), pixels.data(), 100, 32), 100);
    EXPECT_EQ(image->chromaOffset, 32u);
    EXPECT_EQ(QKImage_wrap(image.get(), pixels.data(), -5, 0), 24);  // negative counts as 0
    EXPECT_EQ(image->size, 0u);

    ImagePtr jpeg(QKImage_createEmpty(4, 4, QK_FORMAT_JPEG));
    EXPECT_EQ(QKImage_wrap(jpeg.get(), pixels.data(), 0, 0), 0);  // no rule size
    ImagePtr bare(QKImage_createEmpty(10, 10, QK_FORMAT_RGBA));
    bare->size = 500;
    QKImage_reset(bare.get());
    EXPECT_EQ(std::make_tuple(bare->width, bare->height, bare->format, bare->size), std::make_tuple(0, 0, 0u, 500ul));
    QKImage_deallocate(nullptr);
    QKImage_reset(nullptr);
    QKImage_destroy(nullptr);
    EXPECT_TRUE(log.lines().empty());
}

// A clone holds exactly one image: separated 4:2:0 chroma gathered behind
// the luma, never a byte read past what the source records, never a byte
// written past the clone's buffer.
TEST(Clone, GathersTheImageWithinBothBuffers) {
    std::vector<uint8_t> pixels(1000);
    for (size_t i = 0; i < pixels.size(); ++i) pixels[i] = static_cast<uint8_t>(i);
    // 8x4 NV21: 32 luma bytes, then 16 chroma bytes read at offset 64.
    ImagePtr nv21(QKImage_createWrap(pixels.data(), 8, 4, QK_FORMAT_NV21, 80, 64));
    ImagePtr clone(QKImage_clone(nv21.get()));
    ASSERT_TRUE(clone);
    EXPECT_EQ(std::make_tuple(clone->isWrapped, clone->size, clone->chromaOffset), std::make_tuple(0u, 48ul, 0u));
    EXPECT_EQ(memcmp(clone->data, pixels.data(), 32), 0);
    EXPECT_EQ(memcmp(clone->data + 32, pixels.data() + 64, 16), 0);
    // Other formats: a plain copy of the rule size, whatever the offset and recorded size.
    ImagePtr padded(QKImage_createWrap(pixels.data(), 10, 10, QK_FORMAT_RGBA, 1000, 64));
    ImagePtr cut(QKImage_clone(padded.get()));
    EXPECT_EQ(cut->size, 400u);
    EXPECT_EQ(memcmp(cut->data, pixels.data(), 400), 0);

    // Sources recording fewer bytes than their picture give what they record;
    // the rest is zero.
    LogCapture log;
    ImagePtr short_rgba(QKImage_createWrap(pixels.data(), 4, 4, QK_FORMAT_RGBA, 16, 0));
    ImagePtr short_copy(QKImage_clone(short_rgba.get()));
    ASSERT_TRUE(short_copy);
    EXPECT_EQ(std::vector<uint8_t>(short_copy->data, short_copy->data + 64),
              [&] { std::vector<uint8_t> v(pixels.begin(), pixels.begin() + 16); v.resize(64); return v; }());
    ImagePtr chroma_outside(QKImage_createWrap(pixels.data(), 8, 4, QK_FORMAT_NV12, 70, 64));
    ImagePtr chroma_cut(QKImage_clone(chroma_outside.get()));
    ASSERT_TRUE(chroma_cut);
    EXPECT_EQ(memcmp(chroma_cut->data + 32, pixels.data() + 64, 6), 0);
    EXPECT_EQ(std::vector<uint8_t>(chroma_cut->data + 38, chroma_cut->data + 48), std::vector<uint8_t>(10, 0));
    ImagePtr bare(QKImage_createEmpty(10, 10, QK_FORMAT_RGBA));
    ImagePtr jpeg(QKImage_createWrap(pixels.data(), 10, 10, QK_FORMAT_JPEG, 1000, 0));
    for (const QKImage* source : {bare.get(), jpeg.get(), static_cast<QKImage*>(nullptr)}) {
        EXPECT_EQ(QKImage_clone(source), nullptr);
    }
    EXPECT_TRUE(HasNoErrors(log));

    ImagePtr header(QKImage_cloneHeader(padded.get()));
    EXPECT_EQ(std::make_tuple(header->data, header->width, header->format),
              std::make_tuple(static_cast<uint8_t*>(nullptr), 10, QK_FORMAT_RGBA));
    EXPECT_EQ(QKImage_cloneHeader(nullptr), nullptr);
}

// The field layout is a binary contract with modules built elsewhere: after
// the table of virtual operations, data, then 32-bit fields and a 64-bit size.
TEST(Layout, FieldsKeepTheirOrderAndWidths) {
    QKImage image;
    auto at = [&image](const void* field) {
        return size_t(static_cast<const char*>(field) - reinterpret_cast<const char*>(&image));
    };
    const size_t p = sizeof(void*);
    EXPECT_EQ((std::vector<size_t>{at(&image.data), at(&image.width), at(&image.height), at(&image.format),
                                   at(&image.isWrapped), at(&image.size), at(&image.chromaOffset)}),
              (std::vector<size_t>{p, 2 * p, 2 * p + 4, 2 * p + 8, 2 * p + 12, 2 * p + 16, 2 * p + 24}));
    EXPECT_EQ(sizeof(image.size), 8u);
}

}  // namespace
