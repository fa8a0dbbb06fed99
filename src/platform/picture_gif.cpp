// GIF pictures through giflib: the first frame, composited onto a
// transparent-black logical screen. The frame is read record by record
// rather than with DGifSlurp, which would read and keep every frame of an
// animation, each as large as its descriptor claims, before the first could
// be checked against the screen.
#include <string.h>

#include <algorithm>
#include <memory>
#include <vector>

#include <gif_lib.h>

#include "platform/picture_formats.h"

namespace qk::platform {

namespace {

struct GifSource {
    const uint8_t* data;
    size_t size;
    size_t offset;
};

int read_gif(GifFileType* gif, GifByteType* out, int length) {
    GifSource& source = *static_cast<GifSource*>(gif->UserData);
    const size_t count = std::min(static_cast<size_t>(std::max(length, 0)), source.size - source.offset);
    memcpy(out, source.data + source.offset, count);
    source.offset += count;
    return static_cast<int>(count);
}

struct GifClose {
    void operator()(GifFileType* gif) const {
        int error = 0;
        DGifCloseFile(gif, &error);
    }
};

// Rows of an interlaced frame come in four passes: every 8th row from row 0,
// every 8th from 4, every 4th from 2, every 2nd from 1.
constexpr int kInterlacedFirst[] = {0, 4, 2, 1};
constexpr int kInterlacedStep[] = {8, 8, 4, 2};

// Reads the frame whose descriptor is next into the bitmap, allocated as the
// screen. Pixels of the transparent index stay transparent black.
bool read_frame(GifFileType* gif, int transparent, Bitmap& bitmap) {
    if (DGifGetImageDesc(gif) == GIF_ERROR) return false;
    const GifImageDesc& frame = gif->Image;
    const ColorMapObject* colours = frame.ColorMap != nullptr ? frame.ColorMap : gif->SColorMap;
    if (colours == nullptr || frame.Width < 1 || frame.Height < 1 || frame.Left < 0 || frame.Top < 0 ||
        frame.Left + frame.Width > gif->SWidth || frame.Top + frame.Height > gif->SHeight ||
        !bitmap.allocate(gif->SWidth, gif->SHeight, /*cleared=*/true)) {
        return false;
    }
    std::vector<GifPixelType> line(static_cast<size_t>(frame.Width));
    const int passes = frame.Interlace ? 4 : 1;
    for (int pass = 0; pass < passes; ++pass) {
        const int first = frame.Interlace ? kInterlacedFirst[pass] : 0;
        const int step = frame.Interlace ? kInterlacedStep[pass] : 1;
        for (int y = first; y < frame.Height; y += step) {
            if (DGifGetLine(gif, line.data(), frame.Width) == GIF_ERROR) return false;
            uint8_t* out = bitmap.row(frame.Top + y) + static_cast<size_t>(frame.Left) * kBitmapBytesPerPixel;
            for (int x = 0; x < frame.Width; ++x, out += kBitmapBytesPerPixel) {
                const int index = line[x];
                if (index == transparent) continue;
                // The code size allows indices past a short colour map.
                if (index >= colours->ColorCount) return false;
                const GifColorType& colour = colours->Colors[index];
                out[0] = colour.Red;
                out[1] = colour.Green;
                out[2] = colour.Blue;
                out[3] = 255;
            }
        }
    }
    return true;
}

// Skips extensions up to the first frame, keeping the transparent index of
// the graphic control block that precedes it.
bool read_first_frame(GifFileType* gif, Bitmap& bitmap) {
    int transparent = NO_TRANSPARENT_COLOR;
    for (;;) {
        GifRecordType type;
        if (DGifGetRecordType(gif, &type) == GIF_ERROR) return false;
        if (type == IMAGE_DESC_RECORD_TYPE) return read_frame(gif, transparent, bitmap);
        if (type != EXTENSION_RECORD_TYPE) return false;  // the end, and no frame
        int code = 0;
        GifByteType* block = nullptr;
        if (DGifGetExtension(gif, &code, &block) == GIF_ERROR) return false;
        if (code == GRAPHICS_EXT_FUNC_CODE && block != nullptr) {
            GraphicsControlBlock control;
            if (DGifExtensionToGCB(block[0], block + 1, &control) == GIF_ERROR) return false;
            transparent = control.TransparentColor;
        }
        while (block != nullptr) {
            if (DGifGetExtensionNext(gif, &block) == GIF_ERROR) return false;
        }
    }
}

}  // namespace

bool decode_gif(const uint8_t* data, size_t size, Bitmap& bitmap) {
    GifSource source = {data, size, 0};
    int error = 0;
    std::unique_ptr<GifFileType, GifClose> gif(DGifOpen(&source, read_gif, &error));
    // The screen is the picture: checked before anything is read past it.
    if (gif == nullptr || !picture_size_allowed(gif->SWidth, gif->SHeight)) return false;
    if (!read_first_frame(gif.get(), bitmap)) {
        bitmap.release();
        return false;
    }
    return true;
}

}  // namespace qk::platform
