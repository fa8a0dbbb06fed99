// The platform's picture decoders and PNG writer, on pictures made with the
// codec libraries' own encoders.
#include "platform/picture.h"

#include <gif_lib.h>
#include <gtest/gtest.h>
#include <spng.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>
#include <webp/encode.h>

#include <algorithm>
#include <string>
#include <vector>

#include <jpeglib.h>  // after stdio.h

#include "qkcore/qk_image.h"
#include "support/images.h"
#include "support/log_capture.h"

namespace {

using qk::platform::Bitmap;
using qk::platform::decode_picture;
using Bytes = std::vector<uint8_t>;

Bytes taken(uint8_t* out, size_t size) {  // frees `out`
    Bytes bytes(out, out + size);
    return free(out), bytes;
}

// Test pictures, made with the codec libraries' encoders.
Bytes jpeg_of(int width, int height, const uint8_t rgb[3]) {
    jpeg_compress_struct cinfo;
    jpeg_error_mgr errors;
    cinfo.err = jpeg_std_error(&errors);
    jpeg_create_compress(&cinfo);
    unsigned char* out = nullptr;
    unsigned long size = 0;
    jpeg_mem_dest(&cinfo, &out, &size);
    cinfo.image_width = width, cinfo.image_height = height, cinfo.input_components = 3, cinfo.in_color_space = JCS_RGB;
    jpeg_set_defaults(&cinfo), jpeg_start_compress(&cinfo, TRUE);
    Bytes row;
    for (int x = 0; x < width; ++x) row.insert(row.end(), rgb, rgb + 3);
    for (JSAMPROW p = row.data(); cinfo.next_scanline < cinfo.image_height;) jpeg_write_scanlines(&cinfo, &p, 1);
    jpeg_finish_compress(&cinfo), jpeg_destroy_compress(&cinfo);
    return taken(out, size);
}

// A PNG of `pixels`, or its signature and header alone without pixels. The
// palette has entries 0 and 1, the first translucent through tRNS.
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
    return taken(reinterpret_cast<uint8_t*>(out), size);
}

// One w x h frame at (left, top) of pixels (x + y) % 4, index 3 transparent,
// in a map of `colours` greys 10 * i + 5. Interlaced frames are 6 rows high.
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
    return taken(out, size);
}

// Exactness of what it writes is tested through the library (tests/codec).
TEST(Picture, PngWriteFailsWhereItCannotWrite) {
    Bytes rgba(4 * 4 * 4, 9);
    Bitmap bitmap;
    ASSERT_TRUE(bitmap.borrow(rgba.data(), 4, 4));
    EXPECT_FALSE(qk::platform::write_png_file((testing::TempDir() + "no/such_dir.png").c_str(), bitmap));
    EXPECT_FALSE(qk::platform::write_png_file("/dev/full", bitmap));  // opens, cannot be written
    EXPECT_FALSE(qk::platform::write_png_file("/dev/null", Bitmap()));
}

// Known pixels; and every decoder keeps to the limit, a picture of exactly
// that many RGBA bytes decoding and one byte less refusing it.
TEST(Picture, DecodesEachFormatWithinTheLimit) {
    const uint8_t rgb[3] = {200, 40, 90};
    const Bytes translucent = {255, 128, 7, 1, 0, 0, 0, 0, 10, 250, 30, 128, 1, 2, 3, 255};
    Bytes screen(4 * 8 * 4, 0), jpeg_pixels;  // a 4x8 GIF screen, the 3x6 frame at (1, 2)
    for (int i = 0; i < 18; ++i) {
        uint8_t* p = &screen[((i / 3 + 2) * 4 + i % 3 + 1) * 4];
        if (const int index = (i / 3 + i % 3) % 4; index != 3) p[0] = p[1] = p[2] = uint8_t(10 * index + 5), p[3] = 255;
    }
    for (int i = 0; i < 16 * 8; ++i) jpeg_pixels.insert(jpeg_pixels.end(), {rgb[0], rgb[1], rgb[2], 255});
    const struct { const char* name; Bytes file, expected; int width, tolerance; } cases[] = {
        {"jpeg", jpeg_of(16, 8, rgb), jpeg_pixels, 16, 4},
        {"png palette+tRNS", png_of(2, 1, SPNG_COLOR_TYPE_INDEXED, {0, 1}), {10, 20, 30, 128, 200, 100, 50, 255}, 2, 0},
        {"webp lossless", webp_of(translucent, 2, 2), translucent, 2, 0},
        {"gif interlaced", gif_of(4, 8, 1, 2, 3, 6, true), screen, 4, 0},
        {"gif", gif_of(4, 8, 1, 2, 3, 6), screen, 4, 0},
    };
    for (const auto& c : cases) {
        Bitmap bitmap;
        qk::platform::set_max_picture_bytes(c.expected.size() - 1);
        EXPECT_FALSE(decode_picture(c.file.data(), c.file.size(), bitmap)) << c.name;
        qk::platform::set_max_picture_bytes(c.expected.size());
        ASSERT_TRUE(decode_picture(c.file.data(), c.file.size(), bitmap)) << c.name;
        EXPECT_EQ(bitmap.width(), c.width) << c.name;
        const Bytes got(bitmap.pixels(), bitmap.pixels() + bitmap.byte_count());
        ASSERT_EQ(got.size(), c.expected.size()) << c.name;
        for (size_t i = 0; i < got.size(); ++i) ASSERT_NEAR(got[i], c.expected[i], c.tolerance) << c.name << " " << i;
    }
    qk::platform::set_max_picture_bytes(INT32_MAX);
}

// Damaged, unknown and huge pictures, and one the target cannot hold (RGBA
// pixels into 16 bytes of YUYV), are refused through the library, silently
// but for one report, the target as it was.
TEST(Picture, RefusesBadPicturesAndLeavesTheTarget) {
    const uint8_t rgb[3] = {1, 2, 3};
    const Bytes png = png_of(2, 1, SPNG_COLOR_TYPE_INDEXED, {0, 1}), jpeg = jpeg_of(16, 16, rgb);
    const Bytes gif = gif_of(8, 8, 0, 0, 8, 8), webp = webp_of(Bytes(64, 9), 4, 4);
    Bytes bad_crc = png, huge_jpeg = jpeg, small(16, 3);
    bad_crc[bad_crc.size() - 14] ^= 1;  // the pixel data chunk's checksum
    const uint8_t sof[2] = {0xFF, 0xC0};  // then length, precision, height and width
    memcpy(&*std::search(huge_jpeg.begin(), huge_jpeg.end(), sof, sof + 2) + 5, "\xFF\xDC\xFF\xDC", 4);
    const struct { const char* name; Bytes file; int32_t status = QK_ERROR_CODEC_FAILED; } cases[] = {
        {"empty", {}, QK_ERROR_NULL_PARAM}, {"one byte", {0xFF}}, {"unknown", {'B', 'M', 0, 0, 0, 0, 0, 0, 0, 0}},
        {"png cut short", Bytes(png.begin(), png.end() - 30)}, {"png bad checksum", bad_crc},
        {"png without end", Bytes(png.begin(), png.end() - 12)},
        {"png 100000x100000", png_of(100000, 100000, SPNG_COLOR_TYPE_TRUECOLOR_ALPHA, {})},
        {"jpeg cut short", Bytes(jpeg.begin(), jpeg.end() - 8)}, {"jpeg 65500x65500", huge_jpeg},
        {"webp cut short", Bytes(webp.begin(), webp.end() - 8)}, {"gif cut short", Bytes(gif.begin(), gif.end() - 6)},
        {"gif 65535x65535", gif_of(65535, 65535, 0, 0, 4, 4)}, {"gif frame off the screen", gif_of(4, 4, 2, 0, 4, 4)},
        {"gif index past the map", gif_of(4, 4, 0, 0, 4, 4, false, 2)}, {"too small", jpeg, QK_ERROR_INVALID_SIZE},
    };
    testing::internal::CaptureStderr();
    for (const auto& c : cases) {
        qktest::ImagePtr target(c.status == QK_ERROR_INVALID_SIZE
                                    ? QKImage_createWrap(small.data(), 2, 2, QK_FORMAT_YUYV, 16, 0)
                                    : QKImage_createEmpty(0, 0, QK_FORMAT_RGBA));
        const auto before = qktest::snapshot(target.get());
        qktest::LogCapture log;
        EXPECT_EQ(QKImage_decodeFromJpeg(target.get(), c.file.data(), c.file.size()), c.status) << c.name;
        EXPECT_TRUE(qktest::HasOneFailureReport(log, c.status, "src/codec/jpeg.cpp")) << c.name;
        EXPECT_TRUE(qktest::snapshot(target.get()) == before) << c.name;
    }
    EXPECT_EQ(testing::internal::GetCapturedStderr(), "");
    EXPECT_EQ(small, Bytes(16, 3));
}

}  // namespace
