// Encoding, decoding, saving and loading with the real codec module and
// the platform's decoders and PNG encoder, through the library.
#include <gtest/gtest.h>
#include <math.h>
#include <stdlib.h>

#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "qkcore/qk_image.h"
#include "support/images.h"
#include "support/log_capture.h"

namespace {

using namespace qktest;
namespace fs = std::filesystem;
using Bytes = std::vector<uint8_t>;

Bytes bytes_of(const QKImage& image) { return Bytes(image.data, image.data + QKImage_size(&image)); }

double psnr(const Bytes& a, const Bytes& b) {
    if (a.size() != b.size() || a.empty()) return 0;
    double sum = 0;
    for (size_t i = 0; i < a.size(); ++i) sum += (a[i] - b[i]) * (a[i] - b[i]);
    return sum == 0 ? 99 : 10 * log10(255.0 * 255.0 * a.size() / sum);
}

// A smooth opaque picture with one sharp edge, in `format`.
ImagePtr picture(int32_t w, int32_t h, uint32_t format) {
    ImagePtr rgba(QKImage_createNew(w, h, QK_FORMAT_RGBA));
    for (int32_t i = 0; i < w * h; ++i) {
        const int32_t x = i % w, y = i / w;
        const uint8_t p[4] = {uint8_t(40 + 160 * x / w), uint8_t(x < w / 2 ? 60 : 200), uint8_t(30 + 190 * y / h), 255};
        memcpy(rgba->data + 4 * i, p, 4);
    }
    return format == QK_FORMAT_RGBA ? std::move(rgba) : ImagePtr(QKImage_copyAndConvert(rgba.get(), format));
}

class CodecReal : public ::testing::Test {
protected:
    void SetUp() override {
        char pattern[] = "/tmp/qkcore-real-XXXXXX";
        ASSERT_NE(mkdtemp(pattern), nullptr);
        dir_ = pattern;
    }
    void TearDown() override { fs::remove_all(dir_); }
    std::string path(const std::string& name) const { return (dir_ / name).string(); }
    fs::path dir_;
};

// Camera formats go through the module's own planes, YUYV back through the
// platform decoder (the module declines it), RGB straight.
TEST_F(CodecReal, JpegRoundTripsKeepThePicture) {
    const struct {
        uint32_t format;
        double floor;
    } cases[] = {{QK_FORMAT_NV21, 42}, {QK_FORMAT_YUVP, 42}, {QK_FORMAT_YUYV, 38},
                 {QK_FORMAT_GREY, 45}, {QK_FORMAT_RGBA, 36}, {QK_FORMAT_BGR8, 36}};
    for (const auto& c : cases) {
        SCOPED_TRACE(fourcc(c.format));
        ImagePtr original = picture(64, 48, c.format);
        ImagePtr jpeg(QKImage_encodeToJpeg(original.get(), 95));
        ASSERT_TRUE(jpeg);
        ImagePtr decoded(QKImage_createEmpty(0, 0, c.format));
        ASSERT_EQ(QKImage_decodeFromJpeg(decoded.get(), jpeg->data, jpeg->size), QK_OK);
        EXPECT_EQ(std::make_pair(decoded->width, decoded->height), std::make_pair(64, 48));
        EXPECT_GE(psnr(bytes_of(*decoded), bytes_of(*original)), c.floor);
    }
}

// PNG keeps every byte, translucent colour included; other formats are
// saved as their RGBA conversion.
TEST_F(CodecReal, PngRoundTripsAreExact) {
    ImagePtr translucent = distinct_image(7, 5, QK_FORMAT_RGBA);
    ImagePtr nv21 = picture(8, 6, QK_FORMAT_NV21);
    for (const QKImage* image : {translucent.get(), nv21.get()}) {
        ASSERT_EQ(QKImage_saveToFile(image, path("picture.PNG").c_str(), 0), QK_OK);
        ImagePtr loaded(QKImage_createEmpty(0, 0, QK_FORMAT_RGBA));
        ASSERT_EQ(QKImage_loadFromFile(loaded.get(), path("picture.PNG").c_str()), QK_OK);
        ImagePtr expected(QKImage_copyAndConvert(image, QK_FORMAT_RGBA));
        EXPECT_EQ(bytes_of(*loaded), bytes_of(*expected));
    }
    // A JPEG file saved by path loads back through the module into NV21.
    ImagePtr frame = picture(32, 16, QK_FORMAT_NV21);
    ASSERT_EQ(QKImage_saveToFile(frame.get(), path("frame.jpg").c_str(), 95), QK_OK);
    ImagePtr loaded(QKImage_createEmpty(0, 0, QK_FORMAT_NV21));
    ASSERT_EQ(QKImage_loadFromFile(loaded.get(), path("frame.jpg").c_str()), QK_OK);
    EXPECT_GE(psnr(bytes_of(*loaded), bytes_of(*frame)), 42);
}

// Damaged, oversized and unfitting pictures are refused with the target as
// it was.
TEST_F(CodecReal, BadPicturesAreRefused) {
    ImagePtr frame = picture(32, 16, QK_FORMAT_RGBA);
    ImagePtr jpeg(QKImage_encodeToJpeg(frame.get(), 90));
    const Bytes stream(jpeg->data, jpeg->data + jpeg->size);
    // A PNG signature and header claiming 100000 x 100000 pixels.
    const Bytes huge = {0x89, 'P',  'N',  'G',  0x0d, 0x0a, 0x1a, 0x0a, 0,    0,    0,    13,   'I',  'H',  'D',
                        'R',  0,    1,    0x86, 0xa0, 0,    1,    0x86, 0xa0, 8,    6,    0,    0,    0,    0x8b,
                        0x5f, 0x0f, 0x0d};
    std::vector<uint8_t> small(16, 3);
    const struct {
        const char* what;
        Bytes data;
        QKImage* target;
        int32_t status;
    } cases[] = {
        {"truncated JPEG", Bytes(stream.begin(), stream.begin() + stream.size() / 2), QKImage_createEmpty(0, 0, QK_FORMAT_RGBA), QK_ERROR_CODEC_FAILED},
        {"corrupt JPEG", [&] { Bytes b = stream; for (size_t i = 200; i < b.size() - 2; i += 7) b[i] ^= 0x55; return b; }(),
         QKImage_createEmpty(0, 0, QK_FORMAT_RGBA), QK_ERROR_CODEC_FAILED},
        {"huge PNG header", huge, QKImage_createEmpty(0, 0, QK_FORMAT_RGBA), QK_ERROR_CODEC_FAILED},
        {"not a picture", Bytes(64, 0x42), QKImage_createEmpty(0, 0, QK_FORMAT_NV21), QK_ERROR_CODEC_FAILED},
        // The module declines YUYV; the platform's RGBA must not land in 16 bytes.
        {"target buffer too small", stream, QKImage_createWrap(small.data(), 2, 2, QK_FORMAT_YUYV, 16, 0), QK_ERROR_INVALID_SIZE},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        ImagePtr target(c.target);
        const auto before = snapshot(target.get());
        LogCapture log;
        EXPECT_EQ(QKImage_decodeFromJpeg(target.get(), c.data.data(), c.data.size()), c.status);
        EXPECT_TRUE(HasOneFailureReport(log, c.status, "src/codec/jpeg.cpp"));
        EXPECT_TRUE(snapshot(target.get()) == before);
    }
    EXPECT_EQ(small, std::vector<uint8_t>(16, 3));
}

}  // namespace
