// JPEG encoding, decoding, saving and loading against a stand-in codec
// module that records its calls (found through LD_LIBRARY_PATH), or with no
// module at all.
#include <dlfcn.h>
#include <gtest/gtest.h>
#include <stdio.h>
#include <stdlib.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

#include "codec/codec_standin.h"
#include "qkcore/qk_image.h"
#include "support/images.h"
#include "support/log_capture.h"

extern "C" __attribute__((visibility("default"))) CodecCalls codec_standin_calls;
CodecCalls codec_standin_calls;

namespace {

using namespace qktest;
using Bytes = std::vector<uint8_t>;
using Lines = std::vector<LogLine>;
CodecCalls& calls = codec_standin_calls;
const struct ScratchDir {  // of this process alone, removed at exit
    std::string path = std::string(mkdtemp(std::string("/tmp/qkcore-codec-XXXXXX").data())) + "/";
    ~ScratchDir() { std::filesystem::remove_all(path); }
} kScratch;
const std::string& kDir = kScratch.path;

bool module_loaded() {
    void* handle = dlopen("libveljpeginterface.so", RTLD_NOW | RTLD_NOLOAD);
    return handle != nullptr && dlclose(handle) == 0;
}

// The image goes to the codec as it is, a quality outside 1..100 as 85; the
// stream comes back as a JPEG image, the module closed, nothing said. An
// image without buffer is refused silently; zero dimensions or format never
// reach the codec; a codec that declines fails the call.
TEST(CodecStandIn, EncodeHandsTheImageOverAsItIs) {
    Bytes pixels(64, 7);
    const struct { uint32_t format; int32_t size, quality, passed; } cases[] = {
        {QK_FORMAT_NV21, 0, 0, 85}, {QK_FORMAT_RGBA, 64, -5, 85}, {QK_FORMAT_D16, 48, 101, 85},
        {QK_FORMAT_GREY, 64, 1, 1}, {0x12345678, 9, 100, 100}};
    for (const auto& c : cases) {
        ImagePtr image(QKImage_createWrap(pixels.data(), 4, -2, c.format, c.size, 0));
        LogCapture log;
        ImagePtr jpeg(QKImage_encodeToJpeg(image.get(), c.quality));
        ASSERT_TRUE(jpeg);
        EXPECT_EQ(std::make_tuple(calls.data, calls.size, calls.width, calls.height, calls.format, calls.quality),
                  std::make_tuple((const void*)pixels.data(), uint32_t(c.size), 4, -2, c.format, c.passed));
        EXPECT_EQ(std::make_tuple(jpeg->width, jpeg->height, jpeg->format, jpeg->isWrapped, jpeg->size),
                  std::make_tuple(4, -2, QK_FORMAT_JPEG, 0u, uint64_t{6}));
        EXPECT_FALSE(module_loaded());
        EXPECT_TRUE(log.lines().empty());
    }
    ImagePtr d16(QKImage_createWrap(pixels.data(), 3, 2, QK_FORMAT_D16, 0, 0));
    ImagePtr flat(QKImage_createWrap(pixels.data(), 0, 7, QK_FORMAT_RGBA, 0, 0));
    ImagePtr bare(QKImage_createEmpty(3, 2, QK_FORMAT_RGBA));
    calls = CodecCalls{true};
    LogCapture log;
    // No image or buffer never reaches the codec; the D16 image does.
    for (QKImage* image : {static_cast<QKImage*>(nullptr), bare.get(), flat.get(), d16.get()}) {
        EXPECT_EQ(QKImage_encodeToJpeg(image, 90), nullptr);
        EXPECT_EQ(calls.encodes, image == d16.get());
    }
    EXPECT_EQ(log.lines(), (Lines{{4, "Encoding failed (0x7 RGBA)"}, {4, "Encoding failed (3x2  D16)"}}));
}

// Without the module, encoding fails as a declining codec does, and JPEG
// data goes to the platform decoder.
TEST(CodecAbsent, EncodeAndDecodeFail) {
    ImagePtr image = distinct_image(3, 2, QK_FORMAT_RGBA);
    LogCapture log;
    EXPECT_EQ(QKImage_encodeToJpeg(image.get(), 90), nullptr);
    EXPECT_EQ(log.lines(), (Lines{{4, "Encoding failed (3x2 RGBA)"}}));
    log.clear();
    EXPECT_EQ(QKImage_decodeFromJpeg(image.get(), "\xff\xd8\xff\xd9", 4), QK_ERROR_CODEC_FAILED);
    EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_CODEC_FAILED, "src/codec/jpeg.cpp"));
}

// The codec's buffer replaces the target's: an owned one is freed (the leak
// checker sees it otherwise), a wrapped one only forgotten. What never
// reaches the codec (not JPEG, one byte, no format), and what it declines,
// goes to the platform decoder, which knows none of it: the target stays.
TEST(CodecStandIn, DecodeTakesTheCodecsBufferOrFallsBack) {
    const char* jpeg = "\xff\xd8\xff\xd9";
    Bytes caller(64, 1);
    for (QKImage* target : {QKImage_createEmpty(9, 9, QK_FORMAT_NV21), QKImage_createNew(9, 9, QK_FORMAT_RGBA),
                            QKImage_createWrap(caller.data(), 2, 2, QK_FORMAT_GREY, 64, 8)}) {
        ImagePtr owner(target);
        const int32_t width = target->width;
        LogCapture log;
        ASSERT_EQ(QKImage_decodeFromJpeg(target, jpeg, 1ull << 32 | 4), QK_OK);
        EXPECT_EQ(std::make_tuple(calls.data, calls.size, calls.width, calls.format),
                  std::make_tuple((const void*)jpeg, 4u, width, target->format));
        EXPECT_EQ(std::make_tuple(target->width, target->height, target->isWrapped, target->size, target->chromaOffset),
                  std::make_tuple(4, 2, 0u, uint64_t{0}, 0u));
        EXPECT_EQ(target->data[QKImage_size(target) - 1], 0x5a);
        EXPECT_FALSE(module_loaded());
        EXPECT_TRUE(log.lines().empty());
    }
    EXPECT_EQ(caller, Bytes(64, 1));
    const struct { const char* data; uint64_t size; uint32_t format; bool decline; int decodes; } fallbacks[] = {
        {jpeg, 4, QK_FORMAT_NV21, true, 1}, {"\x89PNG", 4, QK_FORMAT_NV21, false, 0},
        {jpeg, 1, QK_FORMAT_NV21, false, 0}, {jpeg, 4, 0, false, 0}};
    for (const auto& c : fallbacks) {
        calls = CodecCalls{c.decline};
        ImagePtr target = distinct_image(2, 2, QK_FORMAT_NV21);
        target->format = c.format;
        const auto before = snapshot(target.get());
        LogCapture log;
        EXPECT_EQ(QKImage_decodeFromJpeg(target.get(), c.data, c.size), QK_ERROR_CODEC_FAILED);
        EXPECT_EQ(calls.decodes, c.decodes);
        EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_CODEC_FAILED, "src/codec/jpeg.cpp"));
        EXPECT_TRUE(snapshot(target.get()) == before);
    }
}

// The first of ".jpeg", ".jpg", ".png" anywhere in the path decides, letter
// case ignored; else the buffer is written as it is, over an older, longer
// file. PNG refusals come with a status and leave no file.
TEST(CodecStandIn, SaveChoosesTheFileKindByPath) {
    ImagePtr image = distinct_image(4, 2, QK_FORMAT_RGBA);
    const Bytes pixels(image->data, image->data + 32), png = {0x89, 'P', 'N', 'G'}, stream(6);
    std::filesystem::create_directory(kDir + "dir.png");
    std::ofstream(kDir + "frame.nv21") << std::string(100, 'x');
    const struct { const char* name; const Bytes& starts; int encodes; } cases[] = {
        {"OUT.JPG", stream, 1}, {"a.Jpeg", stream, 1}, {"photo.jpeg.png", stream, 1}, {"dir.png/out.bin", png, 0},
        {"frame.nv21", pixels, 0}};
    for (const auto& c : cases) {
        calls = CodecCalls{};
        EXPECT_EQ(QKImage_saveToFile(image.get(), (kDir + c.name).c_str(), 150), QK_OK);
        std::ifstream file(kDir + c.name, std::ios::binary);
        const Bytes bytes{std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
        EXPECT_EQ(Bytes(bytes.begin(), bytes.begin() + std::min(bytes.size(), c.starts.size())), c.starts) << c.name;
        EXPECT_TRUE(&c.starts != &pixels || bytes.size() == 32);
        EXPECT_EQ(std::make_pair(calls.encodes, calls.quality), std::make_pair(c.encodes, c.encodes * 85));
    }
    LogCapture log;  // a file that cannot be made is only logged, but for PNG
    EXPECT_EQ(QKImage_saveToFile(image.get(), (kDir + "missing/x.jpg").c_str(), 90), QK_OK);
    EXPECT_TRUE(log.contains(4, "failed to create file: No such file or directory"));
    ImagePtr flat(QKImage_createWrap(image->data, 0, 2, QK_FORMAT_NV21, 0, 0));
    const struct { const QKImage* image; const char* name; int32_t status; int errors; } refusals[] = {
        {nullptr, "a.png", QK_ERROR_NULL_PARAM, 1}, {image.get(), nullptr, QK_ERROR_NULL_PARAM, 1},
        {flat.get(), "flat.png", QK_ERROR_UNKNOWN, 1}, {image.get(), "missing/a.png", QK_ERROR_UNKNOWN, 2}};
    for (const auto& r : refusals) {
        log.clear();
        EXPECT_EQ(QKImage_saveToFile(r.image, r.name ? (kDir + r.name).c_str() : nullptr, 90), r.status);
        EXPECT_TRUE(HasOneFailureReport(log, r.status, "src/codec/file.cpp"));
        EXPECT_EQ(log.texts(4).size(), size_t(r.errors));  // the PNG writer's failure is logged too
        EXPECT_FALSE(r.name && std::filesystem::exists(kDir + r.name));
    }
}

// Files that do not decode become the image's buffer when the image
// describes them, never when they are shorter than what it describes. An
// owned earlier buffer is freed when the file's takes its place.
TEST(CodecStandIn, LoadTakesRawFilesTheImageDescribes) {
    // bytes -1: no file.
    const struct { int bytes; int32_t w; uint32_t format; uint64_t size; int32_t status; } cases[] = {
        {-1, 16, QK_FORMAT_NV21, 0, QK_ERROR_IO_FAILED},     {0, 16, QK_FORMAT_NV21, 0, QK_ERROR_IO_FAILED},
        {192, 16, QK_FORMAT_NV21, 0, QK_OK},                 {191, 16, QK_FORMAT_NV21, 0, QK_ERROR_INVALID_SIZE},
        {300, 16, QK_FORMAT_NV21, 250, QK_OK},               {249, 16, QK_FORMAT_NV21, 250, QK_ERROR_INVALID_SIZE},
        {192, 0, QK_FORMAT_NV21, 0, QK_ERROR_CODEC_FAILED},  {50, 16, QK_FORMAT_JPEG, 0, QK_ERROR_CODEC_FAILED},
        {50, 16, QK_FORMAT_JPEG, 50, QK_OK},                 {200, 1, QK_FORMAT_PCL, 0, QK_OK}};
    const std::string path = kDir + "frame";
    for (const auto& c : cases) {
        SCOPED_TRACE(::testing::Message() << c.bytes << " bytes into " << c.w << "x8 " << fourcc(c.format));
        Bytes bytes(std::max(c.bytes, 0));
        fill_distinct(bytes.data(), bytes.size());
        std::filesystem::remove(path);
        if (c.bytes >= 0) std::ofstream(path).write(reinterpret_cast<const char*>(bytes.data()), bytes.size());
        ImagePtr image(QKImage_createNew(16, 16, QK_FORMAT_GREY));
        image->width = c.w, image->height = 8, image->format = c.format, image->size = c.size;
        const auto before = snapshot(image.get());
        LogCapture log;
        EXPECT_EQ(QKImage_loadFromFile(image.get(), path.c_str()), c.status);
        if (c.status == QK_OK) {
            EXPECT_EQ(Bytes(image->data, image->data + bytes.size()), bytes);
            EXPECT_EQ(std::make_tuple(image->size, image->isWrapped), std::make_tuple(c.size, 0u));
            EXPECT_TRUE(log.contains(1, "Decoding as raw image: " + std::to_string(c.w) + "x8 '" +
                                            fourcc(c.format, true) + "'"));
        } else {
            EXPECT_TRUE(snapshot(image.get()) == before);
        }
        // Decoding reports its failure first whenever the file was read.
        EXPECT_EQ(log.texts(4).size(), c.status == QK_ERROR_INVALID_SIZE ? 2u : 1u);
    }
    LogCapture log;
    EXPECT_EQ(QKImage_loadFromFile(nullptr, path.c_str()), QK_ERROR_NULL_PARAM);
    EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_NULL_PARAM, "src/codec/file.cpp"));
    FILE* file = fopen(path.c_str(), "rb");  // fsize leaves the stream where it was
    fseek(file, 3, SEEK_SET);
    EXPECT_EQ(std::make_pair(fsize(file), ftell(file)), std::make_pair(int64_t{200}, 3L));
    fclose(file);
}

}  // namespace
