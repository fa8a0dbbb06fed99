// The real JPEG codec module, loaded from its file as libqkcore loads it; the
// platform's picture decoders; and encoding, decoding, saving and loading
// through the library with both and the PNG writer.
#include <dlfcn.h>
#include <gif_lib.h>
#include <gtest/gtest.h>
#include <math.h>
#include <spng.h>
#include <stdio.h>
#include <stdlib.h>
#include <unistd.h>
#include <webp/encode.h>

#include <algorithm>
#include <filesystem>
#include <string>
#include <tuple>
#include <vector>

#include "platform/picture.h"
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

Bytes take(void* block, size_t length) {  // a copy of a block the codec allocated, which is freed
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
// Where a stream's frame header starts; the sampling factors of its first
// component (0x22 for 4:2:0, 0x21 for 4:2:2, 0 for a stream of one
// component); the stream with a frame header claiming 65500 x 65500 pixels.
size_t frame_header(const Bytes& s) {
    const uint8_t sof[2] = {0xff, 0xc0};
    return std::min<size_t>(std::search(s.begin(), s.end(), sof, sof + 2) - s.begin(), s.size() - 12);
}
int sampling(const Bytes& s) { return s[frame_header(s) + 9] == 1 ? 0 : s[frame_header(s) + 11]; }
Bytes huge(Bytes s) { return memcpy(&s[frame_header(s) + 5], "\xff\xdc\xff\xdc", 4), s; }

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
// plane anywhere shows. Camera formats keep their sampling.
TEST(JpegModule, EveryFormatDecodesIntoEveryTarget) {
    ImagePtr rgba = picture(64, 48, QK_FORMAT_RGBA);
    for (uint32_t from : kConvertibleFormats) {
        const Bytes stream = encode(converted(*rgba, from), 64, 48, from);
        const int sub = sampling(stream);
        EXPECT_EQ(sub, from == QK_FORMAT_GREY ? 0 : is_422(from) ? 0x21 : 0x22) << fourcc(from);
        for (uint32_t to : kConvertibleFormats) {
            int w = -1, h = -1;
            const Bytes out = decode(stream, to, &w, &h), expected = converted(*rgba, to);
            const std::string pair = fourcc(from) + " into " + fourcc(to);
            if (is_422(to) || (is_yuv420(to) && sub != 0x22)) {
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

// NV12/NV21 of whole-MCU width go through libjpeg row by row, YUVP through
// TurboJPEG's planes: the same samples give the same stream, the padding of
// 30 rows to whole MCUs included.
TEST(JpegModule, InterleavedChromaCodesAsPlanes) {
    ImagePtr rgba = picture(48, 30, QK_FORMAT_RGBA);
    for (int quality : {1, 50, 100}) {
        const Bytes planes = encode(converted(*rgba, QK_FORMAT_YUVP), 48, 30, QK_FORMAT_YUVP, quality);
        EXPECT_FALSE(planes.empty());
        for (uint32_t f : {QK_FORMAT_NV12, QK_FORMAT_NV21}) {
            EXPECT_EQ(encode(converted(*rgba, f), 48, 30, f, quality), planes) << fourcc(f) << quality;
        }
    }
}

// Nothing is coded from what the module cannot read in full or does not
// know, and nothing is said; qualities outside 1..100 are the nearest end.
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
    const Bytes good = encode(converted(*picture(64, 48, QK_FORMAT_RGBA), QK_FORMAT_NV21), 64, 48, QK_FORMAT_NV21);
    const std::pair<Bytes, uint32_t> streams[] = {
        {Bytes(good.begin(), good.begin() + good.size() / 2), QK_FORMAT_NV21}, {Bytes(300, 0x5a), QK_FORMAT_RGBA},
        {Bytes(good.begin(), good.begin() + 2), QK_FORMAT_GREY}, {huge(good), QK_FORMAT_RGBA}, {good, QK_FORMAT_YVYU},
        {good, QK_FORMAT_D16}, {good, QK_FORMAT_JPEG}, {good, 0}};
    for (const auto& [stream, format] : streams) {
        int w = -7, h = -7;
        testing::internal::CaptureStdout(), testing::internal::CaptureStderr();
        const Bytes pixels = decode(stream, format, &w, &h);
        EXPECT_EQ(testing::internal::GetCapturedStdout() + testing::internal::GetCapturedStderr(), "");
        EXPECT_TRUE(pixels.empty() && w == -7 && h == -7) << stream.size() << " bytes into " << fourcc(format);
    }
    const Bytes grey(64, 99);
    EXPECT_EQ(encode(grey, 8, 8, QK_FORMAT_GREY, -5), encode(grey, 8, 8, QK_FORMAT_GREY, 1));
    EXPECT_EQ(encode(grey, 8, 8, QK_FORMAT_GREY, 1000), encode(grey, 8, 8, QK_FORMAT_GREY, 100));
}

// Test pictures from the codec libraries' own encoders: a PNG of `pixels`, or
// its signature and header alone (the palette's entry 0 translucent through
// tRNS); a GIF frame at (left, top) of pixels (x + y) % 4, index 3
// transparent, in a map of `colours` greys 10 * i + 5 (interlaced: 6 rows).
Bytes png_of(uint32_t width, uint32_t height, uint8_t colour_type, const Bytes& pixels) {
    char* out = nullptr;
    size_t size = 0;
    FILE* file = open_memstream(&out, &size);
    spng_ctx* ctx = spng_ctx_new(SPNG_CTX_ENCODER);
    spng_ihdr ihdr = {width, height, 8, colour_type, 0, 0, 0};
    spng_plte plte = {2, {{10, 20, 30, 0}, {200, 100, 50, 0}}};
    spng_trns trns = {};
    trns.n_type3_entries = 1, trns.type3_alpha[0] = 128;
    spng_set_png_file(ctx, file), spng_set_ihdr(ctx, &ihdr);
    if (colour_type == SPNG_COLOR_TYPE_INDEXED) spng_set_plte(ctx, &plte), spng_set_trns(ctx, &trns);
    pixels.empty() ? spng_encode_chunks(ctx)
                   : spng_encode_image(ctx, pixels.data(), pixels.size(), SPNG_FMT_PNG, SPNG_ENCODE_FINALIZE);
    spng_ctx_free(ctx), fclose(file);
    return take(out, size);
}
Bytes gif_of(int screen_w, int screen_h, int left, int top, int w, int h, bool interlaced = false, int colours = 4) {
    Bytes out;
    int error = 0;
    GifFileType* gif = EGifOpen(&out, [](GifFileType* g, const GifByteType* p, int n) {
        static_cast<Bytes*>(g->UserData)->insert(static_cast<Bytes*>(g->UserData)->end(), p, p + n);
        return n;
    }, &error);
    GifColorType greys[4] = {{5, 5, 5}, {15, 15, 15}, {25, 25, 25}, {35, 35, 35}};
    ColorMapObject* map = GifMakeMapObject(colours, greys);
    GraphicsControlBlock control = {DISPOSAL_UNSPECIFIED, false, 0, 3};
    GifByteType extension[4];
    EGifSetGifVersion(gif, true), EGifPutScreenDesc(gif, screen_w, screen_h, 8, 0, map);
    EGifPutExtension(gif, GRAPHICS_EXT_FUNC_CODE, EGifGCBToExtension(&control, extension), extension);
    EGifPutImageDesc(gif, left, top, w, h, interlaced, nullptr);
    for (int i = 0; i < h; ++i) {
        const int y = interlaced ? "\0\4\2\1\3\5"[i] : i;  // the interlaced order of 6 rows
        std::vector<GifPixelType> line(w);
        for (int x = 0; x < w; ++x) line[x] = GifPixelType((x + y) % 4);
        EGifPutLine(gif, line.data(), w);
    }
    EGifCloseFile(gif, &error), GifFreeMapObject(map);
    return out;
}
Bytes webp_of(const Bytes& rgba, int width, int height) {
    uint8_t* out = nullptr;
    const size_t size = WebPEncodeLosslessRGBA(rgba.data(), width, height, width * 4, &out);
    return take(out, size);
}

// Known pixels, every decoder keeping to the limit: a picture of exactly that
// many RGBA bytes decodes, one byte less refuses it.
TEST(Picture, DecodesEachFormatWithinTheLimit) {
    const Bytes translucent = {255, 128, 7, 1, 0, 0, 0, 0, 10, 250, 30, 128, 1, 2, 3, 255};
    Bytes screen(4 * 8 * 4, 0), grey(16 * 8 * 4, 255);  // a 4x8 GIF screen, the 3x6 frame at (1, 2)
    for (int i = 0; i < 18; ++i) {
        uint8_t* p = &screen[((i / 3 + 2) * 4 + i % 3 + 1) * 4];
        if (const int index = (i / 3 + i % 3) % 4; index != 3) p[0] = p[1] = p[2] = uint8_t(10 * index + 5), p[3] = 255;
    }
    for (size_t i = 0; i < grey.size(); ++i) grey[i] = i % 4 == 3 ? 255 : 90;
    const struct { const char* name; Bytes file, expected; int width, tolerance; } cases[] = {
        {"jpeg", encode(Bytes(16 * 8, 90), 16, 8, QK_FORMAT_GREY), grey, 16, 1},
        {"png palette+tRNS", png_of(2, 1, SPNG_COLOR_TYPE_INDEXED, {0, 1}), {10, 20, 30, 128, 200, 100, 50, 255}, 2, 0},
        {"webp lossless", webp_of(translucent, 2, 2), translucent, 2, 0},
        {"gif interlaced", gif_of(4, 8, 1, 2, 3, 6, true), screen, 4, 0},
        {"gif", gif_of(4, 8, 1, 2, 3, 6), screen, 4, 0}};
    for (const auto& c : cases) {
        qk::platform::Bitmap bitmap;
        qk::platform::set_max_picture_bytes(c.expected.size() - 1);
        EXPECT_FALSE(qk::platform::decode_picture(c.file.data(), c.file.size(), bitmap)) << c.name;
        qk::platform::set_max_picture_bytes(c.expected.size());
        ASSERT_TRUE(qk::platform::decode_picture(c.file.data(), c.file.size(), bitmap)) << c.name;
        const Bytes got(bitmap.pixels(), bitmap.pixels() + bitmap.byte_count());
        ASSERT_EQ(std::make_pair(bitmap.width(), got.size()), std::make_pair(c.width, c.expected.size())) << c.name;
        for (size_t i = 0; i < got.size(); ++i) ASSERT_NEAR(got[i], c.expected[i], c.tolerance) << c.name << " " << i;
    }
    qk::platform::set_max_picture_bytes(INT32_MAX);
}

// Damaged, unknown and huge pictures, and one the target cannot hold (RGBA
// pixels into 16 bytes of YUYV, which the module declines), are refused,
// silently but for one report, the target as it was.
TEST(Picture, BadPicturesAreRefusedAndLeaveTheTarget) {
    const Bytes png = png_of(2, 1, SPNG_COLOR_TYPE_INDEXED, {0, 1}), gif = gif_of(8, 8, 0, 0, 8, 8);
    const Bytes jpeg = encode(Bytes(16 * 16 * 3, 9), 16, 16, QK_FORMAT_RGB8), webp = webp_of(Bytes(64, 9), 4, 4);
    Bytes bad_crc = png, small(16, 3);
    bad_crc[bad_crc.size() - 14] ^= 1;  // the pixel data chunk's checksum
    const struct { const char* name; Bytes file; int32_t status = QK_ERROR_CODEC_FAILED; } cases[] = {
        {"empty", {}, QK_ERROR_NULL_PARAM}, {"one byte", {0xFF}}, {"unknown", {'B', 'M', 0, 0, 0, 0, 0, 0, 0, 0}},
        {"png cut short", Bytes(png.begin(), png.end() - 30)}, {"png bad checksum", bad_crc},
        {"png without end", Bytes(png.begin(), png.end() - 12)},
        {"png 100000x100000", png_of(100000, 100000, SPNG_COLOR_TYPE_TRUECOLOR_ALPHA, {})},
        {"jpeg cut short", Bytes(jpeg.begin(), jpeg.end() - 8)}, {"jpeg 65500x65500", huge(jpeg)},
        {"webp cut short", Bytes(webp.begin(), webp.end() - 8)}, {"gif cut short", Bytes(gif.begin(), gif.end() - 6)},
        {"gif 65535x65535", gif_of(65535, 65535, 0, 0, 4, 4)}, {"gif frame off the screen", gif_of(4, 4, 2, 0, 4, 4)},
        {"gif index past the map", gif_of(4, 4, 0, 0, 4, 4, false, 2)}, {"too small", jpeg, QK_ERROR_INVALID_SIZE}};
    testing::internal::CaptureStderr();
    for (const auto& c : cases) {
        const bool yuyv = c.status == QK_ERROR_INVALID_SIZE;
        ImagePtr target(yuyv ? QKImage_createWrap(small.data(), 2, 2, QK_FORMAT_YUYV, 16, 0)
                             : QKImage_createEmpty(0, 0, QK_FORMAT_RGBA));
        const auto before = snapshot(target.get());
        LogCapture log;
        EXPECT_EQ(QKImage_decodeFromJpeg(target.get(), c.file.data(), c.file.size()), c.status) << c.name;
        EXPECT_TRUE(HasOneFailureReport(log, c.status, "src/codec/jpeg.cpp")) << c.name;
        EXPECT_TRUE(snapshot(target.get()) == before) << c.name;
    }
    EXPECT_EQ(testing::internal::GetCapturedStderr(), "");
    EXPECT_EQ(small, Bytes(16, 3));
}

// In memory: camera formats through the module's planes, YUYV back through
// the platform decoder (the module declines it). As files: JPEG back into
// NV21; PNG keeps every byte, translucent colour included, on a noisy picture
// and a noise-free one, other formats saved as their RGBA conversion.
TEST(CodecReal, RoundTripsKeepThePicture) {
    const std::string dir = std::filesystem::temp_directory_path() / ("qkcore-real-" + std::to_string(getpid())) += "/";
    std::filesystem::create_directories(dir);
    const struct { uint32_t format; const char* file; uint32_t into; double floor; } cases[] = {  // no file: in memory
        {QK_FORMAT_NV21, nullptr, QK_FORMAT_NV21, 42}, {QK_FORMAT_YUYV, nullptr, QK_FORMAT_YUYV, 38},
        {QK_FORMAT_NV21, "frame.jpg", QK_FORMAT_NV21, 42}, {QK_FORMAT_NV21, "picture.PNG", QK_FORMAT_RGBA, 99}};
    for (const auto& c : cases) {
        SCOPED_TRACE(fourcc(c.format) + " " + (c.file ? c.file : ""));
        ImagePtr original = picture(64, 48, c.format), decoded(QKImage_createEmpty(0, 0, c.into));
        if (c.file != nullptr) {
            ASSERT_EQ(QKImage_saveToFile(original.get(), (dir + c.file).c_str(), 95), QK_OK);
            ASSERT_EQ(QKImage_loadFromFile(decoded.get(), (dir + c.file).c_str()), QK_OK);
        } else {
            ImagePtr jpeg(QKImage_encodeToJpeg(original.get(), 95));
            ASSERT_TRUE(jpeg);
            ASSERT_EQ(QKImage_decodeFromJpeg(decoded.get(), jpeg->data, jpeg->size), QK_OK);
        }
        EXPECT_EQ(std::make_pair(decoded->width, decoded->height), std::make_pair(64, 48));
        EXPECT_GE(psnr(bytes_of(*decoded), converted(*original, c.into)), c.floor);
    }
    for (int seed : {11, 0}) {
        ImagePtr translucent = distinct_image(37, 23, QK_FORMAT_RGBA, uint8_t(seed));
        ImagePtr loaded(QKImage_createEmpty(0, 0, QK_FORMAT_RGBA));
        if (seed == 0) memset(translucent->data + 12, 0x80, QKImage_size(translucent.get()) - 12);
        ASSERT_EQ(QKImage_saveToFile(translucent.get(), (dir + "t.png").c_str(), 0), QK_OK);
        ASSERT_EQ(QKImage_loadFromFile(loaded.get(), (dir + "t.png").c_str()), QK_OK);
        EXPECT_EQ(bytes_of(*loaded), bytes_of(*translucent));
    }
    std::filesystem::remove_all(dir);
}

}  // namespace
