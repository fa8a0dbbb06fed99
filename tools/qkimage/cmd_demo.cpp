// demo: the camera road end to end through the library, on a test picture
// drawn here or on the user's own picture, with the time of every step.
#include <errno.h>
#include <math.h>
#include <stdio.h>
#include <string.h>
#include <sys/stat.h>

#include <algorithm>
#include <chrono>
#include <string>
#include <tuple>
#include <vector>

#include "args.h"
#include "commands.h"
#include "frame_io.h"
#include "qkcore/qk_image.h"

namespace {

const char* const kName = "demo";

// ---- The test picture ----

// 5x7 glyphs, a byte a row, bit 4 the left column; characters not listed
// draw as blanks.
struct Glyph {
    char c;
    uint8_t rows[7];
};
const Glyph kGlyphs[] = {
    {'A', {14, 17, 17, 31, 17, 17, 17}}, {'B', {30, 17, 17, 30, 17, 17, 30}}, {'C', {14, 17, 16, 16, 16, 17, 14}},
    {'D', {30, 17, 17, 17, 17, 17, 30}}, {'E', {31, 16, 16, 30, 16, 16, 31}}, {'F', {31, 16, 16, 30, 16, 16, 16}},
    {'G', {14, 17, 16, 23, 17, 17, 15}}, {'H', {17, 17, 17, 31, 17, 17, 17}}, {'I', {14, 4, 4, 4, 4, 4, 14}},
    {'J', {7, 2, 2, 2, 2, 18, 12}},      {'K', {17, 18, 20, 24, 20, 18, 17}}, {'L', {16, 16, 16, 16, 16, 16, 31}},
    {'M', {17, 27, 21, 21, 17, 17, 17}}, {'N', {17, 17, 25, 21, 19, 17, 17}}, {'O', {14, 17, 17, 17, 17, 17, 14}},
    {'P', {30, 17, 17, 30, 16, 16, 16}}, {'Q', {14, 17, 17, 17, 21, 18, 13}}, {'R', {30, 17, 17, 30, 20, 18, 17}},
    {'S', {15, 16, 16, 14, 1, 1, 30}},   {'T', {31, 4, 4, 4, 4, 4, 4}},       {'U', {17, 17, 17, 17, 17, 17, 14}},
    {'V', {17, 17, 17, 17, 17, 10, 4}},  {'W', {17, 17, 17, 21, 21, 21, 10}}, {'X', {17, 17, 10, 4, 10, 17, 17}},
    {'Y', {17, 17, 10, 4, 4, 4, 4}},     {'Z', {31, 1, 2, 4, 8, 16, 31}},     {'0', {14, 17, 19, 21, 25, 17, 14}},
    {'1', {4, 12, 4, 4, 4, 4, 14}},      {'2', {14, 17, 1, 2, 4, 8, 31}},     {'3', {31, 2, 4, 2, 1, 17, 14}},
    {'4', {2, 6, 10, 18, 31, 2, 2}},     {'5', {31, 16, 30, 1, 1, 17, 14}},   {'6', {6, 8, 16, 30, 17, 17, 14}},
    {'7', {31, 1, 2, 4, 8, 8, 8}},       {'8', {14, 17, 17, 14, 17, 17, 14}}, {'9', {14, 17, 17, 15, 1, 2, 12}},
    {'x', {0, 0, 17, 10, 4, 10, 17}},    {'.', {0, 0, 0, 0, 0, 12, 12}},      {'-', {0, 0, 0, 31, 0, 0, 0}},
};

// A line of blocky text: each dot is scale x scale pixels, a glyph 6 dots wide.
struct TextLine {
    int32_t x, y, scale;
    std::vector<const uint8_t*> glyphs;  // a glyph's rows for each character, null for blanks

    TextLine(const std::string& text, int32_t left, int32_t top, int32_t dots) : x(left), y(top), scale(dots) {
        for (char c : text) {
            const Glyph* found = std::find_if(std::begin(kGlyphs), std::end(kGlyphs), [c](const Glyph& g) { return g.c == c; });
            glyphs.push_back(found != std::end(kGlyphs) ? found->rows : nullptr);
        }
    }
    // `repeat`: the text again and again across the width.
    bool dot(int32_t px, int32_t py, bool repeat) const {
        const int32_t row = (py - y) / scale, column = (px - x) / scale;
        if (py < y || row >= 7 || px < x || column % 6 == 5) return false;
        size_t index = static_cast<size_t>(column / 6);
        if (repeat) index %= glyphs.size() + 1;
        return index < glyphs.size() && glyphs[index] != nullptr && ((glyphs[index][row] >> (4 - column % 6)) & 1);
    }
};

struct Rgb {
    int r, g, b;
};

// The drawing, top to bottom: colour bars, a grey staircase, three lines of
// text, then a checkerboard, a star of sectors (detail down to the pixel at
// its centre) and a zone plate (rings up to the finest frequency at its rim)
// over a hue and brightness gradient. Drawn a row at a time from tables made
// once, so that a 4000x3000 picture takes a fraction of a second.
class TestPicture {
public:
    TestPicture(int32_t width, int32_t height) : width_(width), height_(height), hue_(width) {
        const int32_t big = std::max(1, height / 150);
        lines_ = {
            TextLine("QKCORE TEST PICTURE", width / 20, height * 23 / 100, big),
            TextLine(std::to_string(width) + "x" + std::to_string(height) + " NV21 - FULL RANGE BT.601", width / 20,
                     height * 29 / 100, std::max(1, big / 2)),
            TextLine("THE QUICK BROWN FOX JUMPS OVER THE LAZY DOG 0123456789", 0, height * 33 / 100,
                     std::max(1, height / 1000)),
        };
        for (int32_t x = 0; x < width; ++x) {  // the hue circle across the width
            const double hue = 6.0 * x / width;
            auto channel = [&](double offset) {
                const double distance = fabs(fmod(hue + offset, 6.0) - 3.0);  // 0..3
                return static_cast<int>(255.0 * std::min(1.0, std::max(0.0, distance - 1.0)));
            };
            hue_[x] = {channel(0.0), channel(4.0), channel(2.0)};
        }
    }

    void row(int32_t y, Rgb* out) const {
        const int32_t band = static_cast<int32_t>(int64_t{y} * 100 / height_);
        if (band < 16) {  // colour bars
            static const Rgb kBars[] = {{255, 255, 255}, {255, 255, 0}, {0, 255, 255}, {0, 255, 0},
                                        {255, 0, 255},   {255, 0, 0},   {0, 0, 255},   {0, 0, 0}};
            for (int32_t x = 0; x < width_; ++x) out[x] = kBars[int64_t{x} * 8 / width_];
        } else if (band < 20) {  // 16 grey steps
            for (int32_t x = 0; x < width_; ++x) {
                const int grey = static_cast<int>(int64_t{x} * 16 / width_ * 17);
                out[x] = {grey, grey, grey};
            }
        } else if (band >= 22 && band < 35) {  // text on dark blue
            for (int32_t x = 0; x < width_; ++x) {
                const bool lit = lines_[0].dot(x, y, false) || lines_[1].dot(x, y, false) || lines_[2].dot(x, y, true);
                out[x] = lit ? Rgb{255, 255, 255} : Rgb{16, 24, 64};
            }
        } else {
            // Hue across, brightness down.
            const int light = static_cast<int>(256.0 * (1.0 - 0.7 * (y - height_ * 0.2) / (height_ * 0.8)));
            for (int32_t x = 0; x < width_; ++x) {
                out[x] = {hue_[x].r * light >> 8, hue_[x].g * light >> 8, hue_[x].b * light >> 8};
            }
            const int32_t square = std::max(1, height_ / 48);
            if (band >= 40 && band < 95) {  // checkerboard
                for (int32_t x = width_ * 4 / 100; x < width_ * 22 / 100; ++x) {
                    out[x] = ((x / square) + (y / square)) % 2 == 0 ? Rgb{240, 240, 240} : Rgb{20, 20, 20};
                }
            }
            disc(y, 0.42, out, [](float dx, float dy) { return sinf(48.0f * atan2f(dy, dx)) < 0 ? 0 : 255; });
            // Phase k r^2 with k = pi / (2 radius): a cycle every two pixels at the rim.
            const float k = static_cast<float>(M_PI) / (2.0f * radius());
            disc(y, 0.80, out, [k](float dx, float dy) {
                return static_cast<int>(127.5f + 127.5f * cosf(k * (dx * dx + dy * dy)));
            });
        }
    }

    // NV21, full-range BT.601; each 2x2 block's chroma from its top-left pixel.
    ImageHandle draw() const {
        ImageHandle image = hold(QKImage_createNew(width_, height_, QK_FORMAT_NV21));
        if (!image) return image;
        std::vector<Rgb> pixels(width_);
        auto clamp = [](int value) { return static_cast<uint8_t>(std::min(255, std::max(0, value))); };
        for (int32_t y = 0; y < height_; ++y) {
            row(y, pixels.data());
            uint8_t* luma = image->data + static_cast<size_t>(y) * width_;
            uint8_t* vu = image->data + static_cast<size_t>(width_) * (height_ + y / 2);
            for (int32_t x = 0; x < width_; ++x) {
                const Rgb c = pixels[x];
                luma[x] = clamp((77 * c.r + 150 * c.g + 29 * c.b + 128) >> 8);
                if ((x | y) % 2 != 0) continue;
                vu[x] = clamp((128 * c.r - 107 * c.g - 21 * c.b + 32896) >> 8);
                vu[x + 1] = clamp((-43 * c.r - 85 * c.g + 128 * c.b + 32896) >> 8);
            }
        }
        return image;
    }

private:
    float radius() const { return height_ / 4.0f; }

    // Paints the row's span of a disc centred at (across x width, 68% down) in grey.
    template <typename Grey>
    void disc(int32_t y, double across, Rgb* out, Grey grey) const {
        const float r = radius(), cx = static_cast<float>(width_ * across), dy = y - height_ * 0.68f;
        if (fabsf(dy) >= r) return;
        const float half = sqrtf(r * r - dy * dy);
        const int32_t from = std::max(0, static_cast<int32_t>(ceilf(cx - half)));
        const int32_t to = std::min(width_, static_cast<int32_t>(cx + half));
        for (int32_t x = from; x < to; ++x) {
            const int value = grey(x - cx, dy);
            out[x] = {value, value, value};
        }
    }

    int32_t width_, height_;
    std::vector<Rgb> hue_;
    std::vector<TextLine> lines_;
};

// ---- The road ----

using Clock = std::chrono::steady_clock;

double ms_since(Clock::time_point start) {
    return std::chrono::duration<double, std::milli>(Clock::now() - start).count();
}

void report(const char* step, const std::string& result, double ms, const std::string& note = "") {
    printf("  %-24s %-20s %8.1f ms%s%s\n", step, result.c_str(), ms, note.empty() ? "" : "   ", note.c_str());
    fflush(stdout);
}

// Peak signal-to-noise ratio of `count` bytes, in dB ("identical" as inf).
double psnr(const uint8_t* a, const uint8_t* b, size_t count) {
    double sum = 0;
    for (size_t i = 0; i < count; ++i) {
        const double difference = double(a[i]) - double(b[i]);
        sum += difference * difference;
    }
    return sum == 0 ? INFINITY : 10.0 * log10(255.0 * 255.0 * count / sum);
}

std::string megabytes(uint64_t bytes) {
    char text[32];
    snprintf(text, sizeof(text), "%.2f MB", bytes / 1e6);
    return text;
}

// Creates the folder and its parents as needed.
bool make_folder(const std::string& path) {
    for (size_t slash = path.find('/', 1);; slash = path.find('/', slash + 1)) {
        const std::string part = path.substr(0, slash);
        struct stat info;
        if (mkdir(part.c_str(), 0777) != 0 && (errno != EEXIST || stat(part.c_str(), &info) != 0 ||
                                               !S_ISDIR(info.st_mode))) {
            return failure(kName, "cannot make the folder '" + part + "': " + strerror(errno ? errno : ENOTDIR)),
                   false;
        }
        if (slash == std::string::npos) return true;
    }
}

int step_failed(const char* step) { return operation_failed(kName, std::string("the step '") + step + "' failed"); }

}  // namespace

int cmd_demo(int argc, char** argv) {
    Options options;
    // --size WxH (the drawn picture's size) is for quick tests, not in the usage.
    const int status = parse_options(kName, argc, argv, {"--out", "--size"}, &options);
    if (status >= 0) return status;
    int32_t width = 4000, height = 3000;
    if (options.has("--size") && (!size_option(kName, options, "--size", &width, &height) ||
                                  !check_frame(kName, width, height, QK_FORMAT_NV21))) {
        return 2;
    }
    if (options.paths.size() > 1) return usage_error(kName, "want at most one input picture");
    const std::string input = options.paths.empty() ? "" : options.paths[0];
    if (input == "-") return usage_error(kName, "demo reads a named picture file, not standard input");
    if (!input.empty() && options.has("--size")) return usage_error(kName, "--size is for the drawn picture only");
    std::string out = options.has("--out") ? options.get("--out") : "qkimage-demo";
    while (out.size() > 1 && out.back() == '/') out.pop_back();
    if (out.empty()) return usage_error(kName, "--out needs a folder name");
    if (!make_folder(out)) return 1;
    const Clock::time_point road_start = Clock::now();

    // The NV21 frame a camera would hand over.
    Clock::time_point start = Clock::now();
    ImageHandle frame = hold(nullptr);
    if (input.empty()) {
        frame = TestPicture(width, height).draw();
        if (!frame) return failure(kName, "no memory for a " + describe(width, height, QK_FORMAT_NV21) + " frame");
    } else {
        frame = decode_picture(kName, QK_FORMAT_NV21,
                               [&](QKImage* target) { return QKImage_loadFromFile(target, input.c_str()); });
        if (!frame) return operation_failed(kName, "could not load '" + input + "' as a JPEG, PNG, WebP or GIF picture");
    }
    width = frame->width;
    height = frame->height;
    printf("qkimage demo: the camera road on %s %s; outputs in %s/\n",
           input.empty() ? "a drawn" : ("'" + input + "', a").c_str(), describe(width, height, QK_FORMAT_NV21).c_str(),
           out.c_str());
    report(input.empty() ? "draw test picture" : "load picture", describe(width, height, QK_FORMAT_NV21),
           ms_since(start), "-> picture.nv21");
    if (!write_frame(kName, out + "/picture.nv21", *frame)) return 1;

    // Geometry on RGBA: convert, turn, halve, cut the centre out.
    // A frame-sized image's first memory can take the system far longer to
    // hand out than the conversion takes: timed on its own.
    start = Clock::now();
    ImageHandle rgba = hold(QKImage_createNew(width, height, QK_FORMAT_RGBA));
    if (!rgba) return step_failed("create");
    report("new RGBA image", describe(width, height, QK_FORMAT_RGBA), ms_since(start));
    start = Clock::now();
    if (QKImage_convert(frame.get(), rgba.get()) != QK_OK) return step_failed("convert");
    report("convert NV21 -> RGBA", describe(width, height, QK_FORMAT_RGBA), ms_since(start));

    start = Clock::now();
    if (QKImage_rotate(rgba.get(), 90) != QK_OK) return step_failed("rotate");
    report("rotate 90 degrees", describe(rgba->width, rgba->height, QK_FORMAT_RGBA), ms_since(start));

    start = Clock::now();
    ImageHandle half = hold(QKImage_createEmpty(std::max(1, rgba->width / 2), std::max(1, rgba->height / 2),
                                                QK_FORMAT_RGBA));
    if (!half || QKImage_scale(rgba.get(), half.get()) != QK_OK) return step_failed("scale");
    report("scale to half", describe(half->width, half->height, QK_FORMAT_RGBA), ms_since(start));
    rgba.reset();

    start = Clock::now();
    const int32_t crop_width = std::max(1, half->width / 2), crop_height = std::max(1, half->height / 2);
    const int32_t crop_x = (half->width - crop_width) / 2, crop_y = (half->height - crop_height) / 2;
    ImageHandle centre = hold(QKImage_createEmpty(crop_width, crop_height, QK_FORMAT_RGBA));
    if (!centre || QKImage_crop(half.get(), centre.get(), crop_x, crop_y) != QK_OK) return step_failed("crop");
    report("crop the centre",
           std::to_string(crop_width) + "x" + std::to_string(crop_height) + " at " + std::to_string(crop_x) + "," +
               std::to_string(crop_y),
           ms_since(start));

    for (const auto& [step, image, file] : {std::make_tuple("save PNG (turned, half)", half.get(), "/turned-half.png"),
                                            std::make_tuple("save PNG (centre)", centre.get(), "/centre.png")}) {
        start = Clock::now();
        if (!save_through_library(kName, *image, out + file, ".png", 95, 0)) return 1;
        report(step, std::to_string(image->width) + "x" + std::to_string(image->height), ms_since(start),
               std::string("-> ") + (file + 1));
    }

    // The JPEG round trip of the NV21 frame.
    start = Clock::now();
    ImageHandle jpeg = hold(QKImage_encodeToJpeg(frame.get(), 95));
    if (!jpeg) return step_failed("encode JPEG");
    const double encode_ms = ms_since(start);
    const uint64_t raw_bytes = QKImage_requiredSize(width, height, QK_FORMAT_NV21);
    char ratio[32];
    snprintf(ratio, sizeof(ratio), "%.1fx smaller", double(raw_bytes) / double(std::max<uint64_t>(jpeg->size, 1)));
    report("encode JPEG, quality 95", megabytes(jpeg->size), encode_ms, std::string(ratio) + " -> picture.jpg");
    if (!write_output(kName, out + "/picture.jpg", jpeg->data, jpeg->size)) return 1;

    start = Clock::now();
    ImageHandle decoded = hold(QKImage_createEmpty(0, 0, QK_FORMAT_NV21));
    if (!decoded || QKImage_decodeFromJpeg(decoded.get(), jpeg->data, jpeg->size) != QK_OK) {
        return step_failed("decode JPEG -> NV21");
    }
    const double decode_ms = ms_since(start);
    if (decoded->width != width || decoded->height != height) {
        return failure(kName, "the decoded picture is " + describe(decoded->width, decoded->height, QK_FORMAT_NV21) +
                                  ", not " + describe(width, height, QK_FORMAT_NV21));
    }
    const size_t luma = static_cast<size_t>(width) * height;
    char quality[96];
    snprintf(quality, sizeof(quality), "PSNR Y %.1f dB, chroma %.1f dB", psnr(frame->data, decoded->data, luma),
             psnr(frame->data + luma, decoded->data + luma, raw_bytes - luma));
    report("decode JPEG -> NV21", describe(width, height, QK_FORMAT_NV21), decode_ms, quality);

    start = Clock::now();
    ImageHandle decoded_rgba = hold(QKImage_createEmpty(0, 0, QK_FORMAT_RGBA));
    if (!decoded_rgba || QKImage_decodeFromJpeg(decoded_rgba.get(), jpeg->data, jpeg->size) != QK_OK) {
        return step_failed("decode JPEG -> RGBA");
    }
    report("decode JPEG -> RGBA", describe(decoded_rgba->width, decoded_rgba->height, QK_FORMAT_RGBA),
           ms_since(start));

    printf("  done in %.0f ms; the pictures: %s/picture.jpg, %s/turned-half.png, %s/centre.png\n",
           ms_since(road_start), out.c_str(), out.c_str(), out.c_str());
    return 0;
}
