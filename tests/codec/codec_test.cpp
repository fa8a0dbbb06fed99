// JPEG encoding, decoding, saving and loading against a stand-in codec
// module that records its calls (found through LD_LIBRARY_PATH), in a
// temporary folder. The same cases run with no module at all.
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
namespace fs = std::filesystem;
constexpr const char* kJpegFile = "src/codec/jpeg.cpp";
constexpr const char* kFileFile = "src/codec/file.cpp";

bool module_loaded() {
    void* handle = dlopen("libveljpeginterface.so", RTLD_NOW | RTLD_NOLOAD);
    if (handle != nullptr) dlclose(handle);
    return handle != nullptr;
}

std::vector<uint8_t> read_file(const fs::path& path) {
    std::ifstream file(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
}
void write_file(const fs::path& path, const std::vector<uint8_t>& bytes) {
    std::ofstream(path, std::ios::binary).write(reinterpret_cast<const char*>(bytes.data()), bytes.size());
}

class Codec : public ::testing::Test {
protected:
    void SetUp() override {
        codec_standin_calls = CodecCalls{};
        char pattern[] = "/tmp/qkcore-codec-XXXXXX";
        ASSERT_NE(mkdtemp(pattern), nullptr);
        dir_ = pattern;
    }
    void TearDown() override { fs::remove_all(dir_); }
    std::string path(const std::string& name) const { return (dir_ / name).string(); }
    fs::path dir_;
    CodecCalls& calls = codec_standin_calls;
};

class CodecStandIn : public Codec {};
class CodecAbsent : public Codec {};

TEST_F(CodecStandIn, EncodeHandsTheImageOverAsItIs) {
    std::vector<uint8_t> pixels(64, 7);
    const struct {
        uint32_t format;
        int32_t size, quality, passed;
    } cases[] = {{QK_FORMAT_NV21, 0, 0, 85},    {QK_FORMAT_RGBA, 64, -5, 85}, {QK_FORMAT_D16, 48, 101, 85},
                 {QK_FORMAT_GREY, 64, 1, 1},    {0x12345678, 9, 100, 100}};
    for (const auto& c : cases) {
        SCOPED_TRACE(c.quality);
        ImagePtr image(QKImage_createWrap(pixels.data(), 4, -2, c.format, c.size, 0));
        LogCapture log;
        ImagePtr jpeg(QKImage_encodeToJpeg(image.get(), c.quality));
        ASSERT_TRUE(jpeg);
        EXPECT_EQ(std::make_tuple(calls.data, calls.size, calls.width, calls.height, calls.format, calls.quality),
                  std::make_tuple(static_cast<const void*>(pixels.data()), uint32_t(c.size), 4, -2, c.format,
                                  c.passed));
        EXPECT_EQ(std::make_tuple(jpeg->width, jpeg->height, jpeg->format, jpeg->isWrapped, jpeg->size),
                  std::make_tuple(4, -2, QK_FORMAT_JPEG, 0u, uint64_t{kStreamBytes}));
        EXPECT_FALSE(module_loaded());
        EXPECT_TRUE(log.lines().empty());
    }
}

// Without a buffer nothing is said; zero dimensions or format never reach
// the codec; a codec that declines fails the call with the same message.
TEST_F(CodecStandIn, EncodeFailures) {
    std::vector<uint8_t> pixels(64);
    ImagePtr d16(QKImage_createWrap(pixels.data(), 3, 2, QK_FORMAT_D16, 0, 0));
    ImagePtr flat(QKImage_createWrap(pixels.data(), 0, 7, QK_FORMAT_RGBA, 0, 0));
    ImagePtr bare(QKImage_createEmpty(3, 2, QK_FORMAT_RGBA));
    LogCapture log;
    EXPECT_EQ(QKImage_encodeToJpeg(nullptr, 90), nullptr);
    EXPECT_EQ(QKImage_encodeToJpeg(bare.get(), 90), nullptr);
    EXPECT_TRUE(log.lines().empty());
    EXPECT_EQ(QKImage_encodeToJpeg(flat.get(), 90), nullptr);
    EXPECT_EQ(calls.encodes, 0);
    calls.mode = CodecCalls::kDecline;
    EXPECT_EQ(QKImage_encodeToJpeg(d16.get(), 90), nullptr);
    EXPECT_EQ(calls.encodes, 1);
    EXPECT_EQ(log.lines(), (std::vector<LogLine>{{4, "Encoding failed (0x7 RGBA)"}, {4, "Encoding failed (3x2  D16)"}}));
}

TEST_F(CodecAbsent, EncodeFailsWithoutTheModule) {
    std::vector<uint8_t> pixels(24);
    ImagePtr image(QKImage_createWrap(pixels.data(), 3, 2, QK_FORMAT_RGBA, 0, 0));
    LogCapture log;
    EXPECT_EQ(QKImage_encodeToJpeg(image.get(), 90), nullptr);
    EXPECT_EQ(log.lines(), (std::vector<LogLine>{{4, "Encoding failed (3x2 RGBA)"}}));
}

// The codec's buffer replaces the target's: an owned one is freed (the leak
// checker sees it otherwise), a wrapped one is only forgotten.
TEST_F(CodecStandIn, DecodeTakesTheCodecsBuffer) {
    const std::vector<uint8_t> jpeg = {0xff, 0xd8, 0xff, 0xd9};
    std::vector<uint8_t> caller(64, 1);
    ImagePtr targets[] = {ImagePtr(QKImage_createEmpty(9, 9, QK_FORMAT_NV21)),
                          ImagePtr(QKImage_createNew(9, 9, QK_FORMAT_RGBA)),
                          ImagePtr(QKImage_createWrap(caller.data(), 2, 2, QK_FORMAT_GREY, 64, 8))};
    for (ImagePtr& target : targets) {
        const int32_t width = target->width;
        LogCapture log;
        ASSERT_EQ(QKImage_decodeFromJpeg(target.get(), jpeg.data(), 1ull << 32 | jpeg.size()), QK_OK);
        EXPECT_EQ(std::make_tuple(calls.data, calls.size, calls.width, calls.format),
                  std::make_tuple(static_cast<const void*>(jpeg.data()), 4u, width, target->format));
        EXPECT_EQ(std::make_tuple(target->width, target->height, target->isWrapped, target->size, target->chromaOffset),
                  std::make_tuple(kDecodedWidth, kDecodedHeight, 0u, uint64_t{0}, 0u));
        EXPECT_EQ(target->data[QKImage_size(target.get()) - 1], kDecodedByte);
        EXPECT_FALSE(module_loaded());
        EXPECT_TRUE(log.lines().empty());
    }
    EXPECT_EQ(caller, std::vector<uint8_t>(64, 1));
}

// What never reaches the codec, and what the codec declines, goes to the
// platform decoder, which knows none of these bytes.
TEST_F(CodecStandIn, DecodeFallsBackToThePlatformDecoder) {
    const std::vector<uint8_t> jpeg = {0xff, 0xd8, 0xff, 0xd9}, other = {0x89, 'P', 'N', 'G'};
    const struct {
        const std::vector<uint8_t>& data;
        uint64_t size;
        uint32_t format;
        CodecCalls::Mode mode;
        int decodes;
    } cases[] = {{jpeg, 4, QK_FORMAT_NV21, CodecCalls::kDecline, 1},
                 {other, 4, QK_FORMAT_NV21, CodecCalls::kAnswer, 0},
                 {jpeg, 1, QK_FORMAT_NV21, CodecCalls::kAnswer, 0},
                 {jpeg, 4, 0, CodecCalls::kAnswer, 0}};
    for (const auto& c : cases) {
        calls = CodecCalls{};
        calls.mode = c.mode;
        ImagePtr target(QKImage_createNew(2, 2, c.format != 0 ? c.format : QK_FORMAT_GREY));
        target->format = c.format;
        const auto before = snapshot(target.get());
        LogCapture log;
        EXPECT_EQ(QKImage_decodeFromJpeg(target.get(), c.data.data(), c.size), QK_ERROR_CODEC_FAILED);
        EXPECT_EQ(calls.decodes, c.decodes);
        EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_CODEC_FAILED, kJpegFile));
        EXPECT_TRUE(snapshot(target.get()) == before);
    }
}

TEST_F(CodecStandIn, SaveChoosesTheFileKindByPath) {
    ImagePtr image = distinct_image(4, 2, QK_FORMAT_RGBA);
    const std::vector<uint8_t> pixels(image->data, image->data + 32);
    fs::create_directory(dir_ / "dir.png");
    enum Kind { kJpeg, kPng, kRaw };
    const struct {
        const char* name;
        Kind kind;
    } cases[] = {{"OUT.JPG", kJpeg}, {"a.Jpeg", kJpeg}, {"photo.jpeg.png", kJpeg}, {"dir.png/out.bin", kPng},
                 {"frame.nv21", kRaw}};
    for (const auto& c : cases) {
        SCOPED_TRACE(c.name);
        calls = CodecCalls{};
        EXPECT_EQ(QKImage_saveToFile(image.get(), path(c.name).c_str(), 150), QK_OK);
        const std::vector<uint8_t> bytes = read_file(path(c.name));
        EXPECT_EQ(calls.encodes, c.kind == kJpeg ? 1 : 0);
        const std::vector<uint8_t> expected = c.kind == kJpeg ? std::vector<uint8_t>(kStreamBytes)
                                              : c.kind == kRaw ? pixels
                                                               : std::vector<uint8_t>{0x89, 'P', 'N', 'G'};
        EXPECT_EQ(std::vector<uint8_t>(bytes.begin(), bytes.begin() + std::min(bytes.size(), expected.size())),
                  expected);
        EXPECT_EQ(c.kind != kPng || bytes.size() > 4, true);
        EXPECT_EQ(calls.quality, c.kind == kJpeg ? 85 : 0);
    }
}

TEST_F(CodecStandIn, SaveWritesWholeFilesAndOnlyLogsFileErrors) {
    std::vector<uint8_t> pixels(32, 9);
    ImagePtr rgba(QKImage_createWrap(pixels.data(), 4, 2, QK_FORMAT_RGBA, 32, 0));
    write_file(path("frame.raw"), std::vector<uint8_t>(100, 1));
    EXPECT_EQ(QKImage_saveToFile(rgba.get(), path("frame.raw").c_str(), 90), QK_OK);
    EXPECT_EQ(read_file(path("frame.raw")), pixels);  // an older, longer file is cut

    ImagePtr unsized(QKImage_createWrap(pixels.data(), 4, 2, QK_FORMAT_RGBA, 0, 0));
    LogCapture log;
    EXPECT_EQ(QKImage_saveToFile(unsized.get(), path("empty.raw").c_str(), 90), QK_OK);
    EXPECT_TRUE(fs::exists(path("empty.raw")) && fs::file_size(path("empty.raw")) == 0);
    EXPECT_EQ(log.lines(), (std::vector<LogLine>{{1, "opening file"}, {1, "done writing to file in 0 passes\n"}}));
    for (const char* name : {"missing/x.raw", "missing/x.jpg"}) {
        log.clear();
        EXPECT_EQ(QKImage_saveToFile(rgba.get(), path(name).c_str(), 90), QK_OK);
        EXPECT_TRUE(log.contains(4, "failed to create file: No such file or directory")) << name;
    }

    // PNG refusals come with a status.
    ImagePtr flat(QKImage_createWrap(pixels.data(), 0, 2, QK_FORMAT_NV21, 0, 0));
    const struct {
        const QKImage* image;
        const char* name;
        int32_t status;
        const char* message;
    } refusals[] = {{nullptr, "a.png", QK_ERROR_NULL_PARAM, nullptr},
                    {rgba.get(), nullptr, QK_ERROR_NULL_PARAM, nullptr},
                    {flat.get(), "flat.png", QK_ERROR_UNKNOWN, nullptr},
                    {rgba.get(), "missing/a.png", QK_ERROR_UNKNOWN, "Failed to save RGBA image with Skia!"}};
    for (const auto& r : refusals) {
        SCOPED_TRACE(r.name ? r.name : "(null)");
        log.clear();
        EXPECT_EQ(QKImage_saveToFile(r.image, r.name ? path(r.name).c_str() : nullptr, 90), r.status);
        EXPECT_TRUE(HasOneFailureReport(log, r.status, kFileFile));
        EXPECT_EQ(log.texts(4).size(), r.message ? 2u : 1u);
        EXPECT_FALSE(r.name && fs::exists(path(r.name)));
    }
}

// Files that do not decode become the image's buffer when the image
// describes them, never when they are shorter than what it describes.
TEST_F(CodecStandIn, LoadTakesRawFilesTheImageDescribes) {
    const struct {
        int bytes;  // -1: no file
        int32_t w, h;
        uint32_t format;
        uint64_t size;
        int32_t status;
    } cases[] = {
        {-1, 16, 8, QK_FORMAT_NV21, 0, QK_ERROR_IO_FAILED},      {0, 16, 8, QK_FORMAT_NV21, 0, QK_ERROR_IO_FAILED},
        {192, 16, 8, QK_FORMAT_NV21, 0, QK_OK},                  {191, 16, 8, QK_FORMAT_NV21, 0, QK_ERROR_INVALID_SIZE},
        {300, 16, 8, QK_FORMAT_NV21, 250, QK_OK},                {249, 16, 8, QK_FORMAT_NV21, 250, QK_ERROR_INVALID_SIZE},
        {192, 0, 8, QK_FORMAT_NV21, 0, QK_ERROR_CODEC_FAILED},   {50, 4, 4, QK_FORMAT_JPEG, 0, QK_ERROR_CODEC_FAILED},
        {50, 4, 4, QK_FORMAT_JPEG, 50, QK_OK},                   {100, 2, 2, QK_FORMAT_PCL, 0, QK_OK},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(::testing::Message() << c.bytes << " bytes into " << c.w << "x" << c.h << " " << fourcc(c.format));
        std::vector<uint8_t> bytes(std::max(c.bytes, 0));
        for (size_t i = 0; i < bytes.size(); ++i) bytes[i] = static_cast<uint8_t>(i * 3 + 1);
        if (c.bytes >= 0) write_file(path("frame"), bytes);
        // An owned earlier buffer (as large as any case claims) is freed when
        // the file's takes its place.
        ImagePtr image(QKImage_createNew(16, 16, QK_FORMAT_GREY));
        image->width = c.w, image->height = c.h, image->format = c.format, image->size = c.size;
        const auto before = snapshot(image.get());
        LogCapture log;
        EXPECT_EQ(QKImage_loadFromFile(image.get(), path(c.bytes >= 0 ? "frame" : "none").c_str()), c.status);
        if (c.status == QK_OK) {
            EXPECT_EQ(std::vector<uint8_t>(image->data, image->data + bytes.size()), bytes);
            EXPECT_EQ(std::make_tuple(image->size, image->isWrapped), std::make_tuple(c.size, 0u));
            EXPECT_TRUE(log.contains(1, "Decoding as raw image: " + std::to_string(c.w) + "x" + std::to_string(c.h) +
                                            " '" + std::string(4 - fourcc(c.format).size(), ' ') + fourcc(c.format) + "'"));
        } else {
            EXPECT_TRUE(snapshot(image.get()) == before);
        }
        // Decoding reports its failure first whenever the file was read.
        EXPECT_EQ(log.texts(4).size(), c.status == QK_ERROR_INVALID_SIZE ? 2u : 1u);
        fs::remove(path("frame"));
    }
    LogCapture log;
    EXPECT_EQ(QKImage_loadFromFile(nullptr, path("frame").c_str()), QK_ERROR_NULL_PARAM);
    EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_NULL_PARAM, kFileFile));
}

TEST(Fsize, LeavesTheStreamWhereItWas) {
    FILE* file = tmpfile();
    fwrite("0123456789", 1, 10, file);
    fseek(file, 3, SEEK_SET);
    EXPECT_EQ(fsize(file), 10);
    EXPECT_EQ(ftell(file), 3);
    fclose(file);
}

}  // namespace
