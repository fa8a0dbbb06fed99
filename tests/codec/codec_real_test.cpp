// The real JPEG codec module, loaded from its file as libqkcore loads it:
// every format through a stream and back, camera planes kept as they are at
// any size, refusals that stay quiet. Then encoding, decoding, saving and
// loading through the library with that module and the platform's decoders
// and PNG encoder.
#include <dlfcn.h>
#include <gtest/gtest.h>
#include <math.h>
#include <stdlib.h>
#include <turbojpeg.h>

#include <filesystem>
#include <string>
#include <tuple>
#include <vector>

#include "qkcore/qk_image.h"
#include "support/images.h"
#include "support/log_capture.h"
#include "veljpeginterface.h"

namespace {

using namespace qktest;
using Bytes = std::vector<uint8_t>;

const struct Module {
    void* handle = dlopen(QK_JPEG_MODULE_FILE, RTLD_NOW | RTLD_LOCAL);
    FastJpegEncodeFn encode = reinterpret_cast<FastJpegEncodeFn>(dlsym(handle, "fastJpegEncode"));
    FastJpegDecodeFn decode = reinterpret_cast<FastJpegDecodeFn>(dlsym(handle, "fastJpegDecode"));
    ~Module() { dlclose(handle); }
} kModule;

Bytes take(void* block, size_t length) {  // a copy of the module's block, which is freed
    Bytes bytes(static_cast<uint8_t*>(block), static_cast<uint8_t*>(block) + (block ? length : 0));
    return free(block), bytes;
}
Bytes encode(const Bytes& pixels, int w, int h, uint32_t format, int quality = 95) {
    uint32_t length = 0;
    void* stream = kModule.encode(pixels.data(), uint32_t(pixels.size()), w, h, format, &length, quality);
    return take(stream, length);
}
Bytes decode(const Bytes& stream, uint32_t format, int* w, int* h) {
    void* out = kModule.decode(stream.data(), uint32_t(stream.size()), w, h, format);
    return take(out, out ? QKImage_requiredSize(*w, *h, format) : 0);
}
Bytes bytes_of(const QKImage& image) { return Bytes(image.data, image.data + QKImage_size(&image)); }
Bytes converted(const QKImage& image, uint32_t format) {
    return bytes_of(*ImagePtr(QKImage_copyAndConvert(&image, format)));
}
bool is_422(uint32_t f) { return f == QK_FORMAT_YUYV || f == QK_FORMAT_YVYU; }
double psnr(const Bytes& a, const Bytes& b, size_t from = 0, size_t to = SIZE_MAX) {  // bytes [from, to)
    double sum = 0, n = double(std::min(to, a.size()) - from);
    for (size_t i = from; i < std::min(to, a.size()) && a.size() == b.size(); ++i) sum += (a[i] - b[i]) * (a[i] - b[i]);
    return a.size() != b.size() ? 0 : sum == 0 ? 99 : 10 * log10(255 * 255 * n / sum);
}

// The stream's sampling and, when asked, its own Y, U and V planes.
int sampling(const Bytes& s, std::vector<Bytes>* planes = nullptr) {
    tjhandle tj = tjInitDecompress();
    int w = 0, h = 0, sub = -1, colorspace = 0;
    tjDecompressHeader3(tj, s.data(), s.size(), &w, &h, &sub, &colorspace);
    unsigned char* p[3] = {};
    for (int i = 0; planes && i < 3; ++i) p[i] = planes->emplace_back(tjPlaneSizeYUV(i, w, 0, h, sub)).data();
    EXPECT_EQ(planes ? tjDecompressToYUVPlanes(tj, s.data(), s.size(), p, w, nullptr, h, 0) : 0, 0);
    return tjDestroy(tj), sub;
}

constexpr uint32_t kFormats[] = {QK_FORMAT_RGBA, QK_FORMAT_BGRA, QK_FORMAT_ARGB, QK_FORMAT_ABGR, QK_FORMAT_RGB8,
                                 QK_FORMAT_BGR8, QK_FORMAT_GREY, QK_FORMAT_NV12, QK_FORMAT_NV21, QK_FORMAT_YV12,
                                 QK_FORMAT_YUVP, QK_FORMAT_YUYV, QK_FORMAT_YVYU};

// A smooth opaque picture, made by the library in `format`.
ImagePtr picture(int32_t w, int32_t h, uint32_t format) {
    ImagePtr rgba(QKImage_createNew(w, h, QK_FORMAT_RGBA));
    for (int32_t i = 0; i < w * h; ++i) {
        const int32_t x = i % w, y = i / w;
        const uint8_t p[4] = {uint8_t(x * 256 / w), uint8_t(y * 240 / h), uint8_t(200 - x * 128 / w + y * 48 / h), 255};
        memcpy(rgba->data + 4 * i, p, 4);
    }
    return format == QK_FORMAT_RGBA ? std::move(rgba) : ImagePtr(QKImage_copyAndConvert(rgba.get(), format));
}

// Each format coded, then decoded into every target and compared with the
// library's own conversion, luma and chroma apart: a swapped channel or
// plane anywhere shows.
TEST(JpegModule, EveryFormatDecodesIntoEveryTarget) {
    ImagePtr rgba = picture(64, 48, QK_FORMAT_RGBA);
    for (uint32_t from : kFormats) {
        const Bytes stream = encode(converted(*rgba, from), 64, 48, from);
        const int sub = sampling(stream);
        EXPECT_EQ(sub, from == QK_FORMAT_GREY ? TJSAMP_GRAY : is_422(from) ? TJSAMP_422 : TJSAMP_420) << fourcc(from);
        for (uint32_t to : kFormats) {
            int w = -1, h = -1;
            const Bytes out = decode(stream, to, &w, &h), expected = converted(*rgba, to);
            const std::string pair = fourcc(from) + " into " + fourcc(to);
            if (is_422(to) || (is_yuv420(to) && sub != TJSAMP_420)) {
                EXPECT_TRUE(out.empty() && w == -1 && h == -1) << pair;
            } else if (from != QK_FORMAT_GREY || to == QK_FORMAT_GREY) {  // grey has lost the colour
                EXPECT_TRUE(w == 64 && h == 48) << pair;
                // 4:2:0 back into itself keeps luma all but exactly; other pairs meet colour conversion.
                const size_t luma = is_yuv420(to) ? 64 * 48 : out.size();
                EXPECT_GE(psnr(out, expected, 0, luma), to == from && is_yuv420(to) ? 55 : 40) << pair;
                EXPECT_GE(psnr(out, expected, luma), 44) << pair;
            }
        }
    }
}

// White, or for the camera formats Y 40, U 230, V 220 placed by the
// library's layout (128 in bytes no sample owns): a colour outside every RGB
// picture, which only a coder that never goes through RGB gives back.
Bytes flat(int w, int h, uint32_t f) {
    Bytes b(QKImage_requiredSize(w, h, f), is_422(f) || is_yuv420(f) ? 40 : 255);
    const bool uFirst = f == QK_FORMAT_YUYV || f == QK_FORMAT_NV12 || f == QK_FORMAT_YUVP;
    const uint8_t first = uFirst ? 230 : 220, second = uFirst ? 220 : 230;
    for (size_t k = 1; is_422(f) && k < b.size(); k += 2) b[k] = k % (2 * w) % 4 == 1 ? first : second;
    if (!is_yuv420(f)) return b;
    const size_t n = size_t(w) * h, nv = f == QK_FORMAT_NV12 || f == QK_FORMAT_NV21;
    std::fill(b.begin() + n, b.end(), 128);
    for (size_t j = 0; j < size_t(w / 2) * (h / 2); ++j) {  // the chroma rows follow without gaps
        b[n + (nv ? 2 * j : j)] = first;
        b[n + (nv ? 2 * j + 1 : n / 4 + j)] = second;
    }
    return b;
}

TEST(JpegModule, AnySizeKeepsTheLayoutAndTheColour) {
    for (uint32_t format : kFormats) {
        for (auto [w, h] : {std::pair{1, 1}, {3, 5}, {17, 9}, {16, 2}}) {
            const std::string name = fourcc(format) + " " + std::to_string(w) + "x" + std::to_string(h);
            const Bytes source = flat(w, h, format), stream = encode(source, w, h, format);
            std::vector<Bytes> planes;
            ASSERT_NE(sampling(stream, is_422(format) || is_yuv420(format) ? &planes : nullptr), -1) << name;
            const bool both = is_422(format) ? w > 1 : w > 1 && h > 1;  // else neutral where no sample
            const int want[3] = {40, both || format == QK_FORMAT_YUYV ? 230 : 128,
                                 both || format == QK_FORMAT_YVYU ? 220 : 128};
            for (size_t i = 0; i < planes.size(); ++i) {
                EXPECT_GE(psnr(planes[i], Bytes(planes[i].size(), want[i])), 42) << name << " plane " << i;
            }
            int dw = 0, dh = 0;  // packed 4:2:2 is never decoded into
            EXPECT_GE(is_422(format) ? 99 : psnr(decode(stream, format, &dw, &dh), source), 40) << name;
        }
    }
}

TEST(JpegModule, RefusesQuietlyWhatItCannotCode) {
    const std::tuple<int, int, uint32_t, uint32_t> pictures[] = {  // width, height, format, size
        {8, 8, QK_FORMAT_D16, 0},    {8, 8, QK_FORMAT_PCL, 0},   {8, 8, QK_FORMAT_JPEG, 0},   {8, 8, 0x5a595857, 0},
        {8, 8, QK_FORMAT_RGBA, 255}, {8, 8, QK_FORMAT_NV21, 95}, {8, 8, QK_FORMAT_YUYV, 127}, {0, 8, QK_FORMAT_RGBA, 0},
        {8, -1, QK_FORMAT_GREY, 0},  {65536, 65536, QK_FORMAT_RGBA, 0}, {65501, 1, QK_FORMAT_GREY, 0}};
    for (const auto& [w, h, format, size] : pictures) {
        const Bytes pixels(size > 0 ? size : 1);  // a read past them shows under ASan
        uint32_t length = 7;
        EXPECT_EQ(kModule.encode(pixels.data(), size, w, h, format, &length, 90), nullptr) << fourcc(format) << w;
        EXPECT_EQ(length, 7u);
    }
    const Bytes good = encode(flat(64, 48, QK_FORMAT_NV21), 64, 48, QK_FORMAT_NV21);
    Bytes huge = good;  // a frame header that claims 65500 x 65500 pixels
    for (size_t i = 0; i + 9 < huge.size(); ++i) {
        if (huge[i] == 0xff && huge[i + 1] == 0xc0) memcpy(&huge[i + 5], "\xff\xdc\xff\xdc", 4);
    }
    const std::pair<Bytes, uint32_t> streams[] = {
        {Bytes(good.begin(), good.begin() + good.size() / 2), QK_FORMAT_NV21},
        {Bytes(good.begin(), good.end() - 2), QK_FORMAT_RGBA}, {Bytes(300, 0x5a), QK_FORMAT_RGBA},
        {Bytes(good.begin(), good.begin() + 2), QK_FORMAT_GREY}, {huge, QK_FORMAT_RGBA}, {huge, QK_FORMAT_GREY},
        {good, QK_FORMAT_YVYU}, {good, QK_FORMAT_D16}, {good, QK_FORMAT_PCL}, {good, QK_FORMAT_JPEG}, {good, 0}};
    for (const auto& [stream, format] : streams) {
        int w = -7, h = -7;
        testing::internal::CaptureStdout(), testing::internal::CaptureStderr();
        const Bytes pixels = decode(stream, format, &w, &h);
        EXPECT_EQ(testing::internal::GetCapturedStdout() + testing::internal::GetCapturedStderr(), "");
        EXPECT_TRUE(pixels.empty() && w == -7 && h == -7) << stream.size() << " bytes into " << fourcc(format);
    }
    const Bytes grey(64, 99);  // qualities outside 1..100 are the nearest end, not a failure
    EXPECT_EQ(encode(grey, 8, 8, QK_FORMAT_GREY, -5), encode(grey, 8, 8, QK_FORMAT_GREY, 1));
    EXPECT_EQ(encode(grey, 8, 8, QK_FORMAT_GREY, 1000), encode(grey, 8, 8, QK_FORMAT_GREY, 100));
    EXPECT_NE(encode(grey, 8, 8, QK_FORMAT_GREY, 1), encode(grey, 8, 8, QK_FORMAT_GREY, 100));
}

const struct ScratchDir {  // of this process alone, removed at exit
    std::string path = std::string(mkdtemp(std::string("/tmp/qkcore-real-XXXXXX").data())) + "/";
    ~ScratchDir() { std::filesystem::remove_all(path); }
} kScratch;

// In memory: camera formats through the module's planes, YUYV back through
// the platform decoder (the module declines it). As files: JPEG back into
// NV21; PNG keeps every byte, translucent colour included, on noisy pictures
// and noise-free ones, other formats saved as their RGBA conversion.
TEST(CodecReal, RoundTripsKeepThePicture) {
    const struct { uint32_t format; const char* file; uint32_t into; double floor; } cases[] = {  // file null: in memory{QK_FORMAT_NV21, nullptr, QK_FORMAT_NV21, 42},      {QK_FORMAT_YUYV, nullptr, QK_FORMAT_YUYV, 38},
                 {QK_FORMAT_BGR8, nullptr, QK_FORMAT_BGR8, 36},      {QK_FORMAT_NV21, "frame.jpg", QK_FORMAT_NV21, 42},
                 {QK_FORMAT_NV21, "picture.PNG", QK_FORMAT_RGBA, 99}};
    for (const auto& c : cases) {
        SCOPED_TRACE(fourcc(c.format) + " " + (c.file ? c.file : ""));
        ImagePtr original = picture(64, 48, c.format), decoded(QKImage_createEmpty(0, 0, c.into));
        if (c.file != nullptr) {
            ASSERT_EQ(QKImage_saveToFile(original.get(), (kScratch.path + c.file).c_str(), 95), QK_OK);
            ASSERT_EQ(QKImage_loadFromFile(decoded.get(), (kScratch.path + c.file).c_str()), QK_OK);
        } else {
            ImagePtr jpeg(QKImage_encodeToJpeg(original.get(), 95));
            ASSERT_TRUE(jpeg);
            ASSERT_EQ(QKImage_decodeFromJpeg(decoded.get(), jpeg->data, jpeg->size), QK_OK);
        }
        EXPECT_EQ(std::make_pair(decoded->width, decoded->height), std::make_pair(64, 48));
        EXPECT_GE(psnr(bytes_of(*decoded), converted(*original, c.into)), c.floor);
    }
    for (int seed : {11, 0}) {  // distinct bytes, then all but the first pixels alike
        ImagePtr translucent = distinct_image(37, 23, QK_FORMAT_RGBA, uint8_t(seed));
        if (seed == 0) memset(translucent->data + 12, 0x80, QKImage_size(translucent.get()) - 12);
        ASSERT_EQ(QKImage_saveToFile(translucent.get(), (kScratch.path + "t.png").c_str(), 0), QK_OK);
        ImagePtr loaded(QKImage_createEmpty(0, 0, QK_FORMAT_RGBA));
        ASSERT_EQ(QKImage_loadFromFile(loaded.get(), (kScratch.path + "t.png").c_str()), QK_OK);
        EXPECT_EQ(bytes_of(*loaded), bytes_of(*translucent));
    }
}

}  // namespace
