// fastJpegDecode: RGB and GREY through TurboJPEG's colour conversion, the
// 4:2:0 formats straight from a 4:2:0 stream's own planes.
#include <stdint.h>
#include <string.h>
#include <turbojpeg.h>

#include <utility>

#include "image/format.h"
#include "planes.h"
#include "platform/memory.h"
#include "qkcore/qk_image.h"
#include "turbo.h"
#include "veljpeginterface.h"

namespace {

using qk::jpeg::Block;
using qk::jpeg::Handle;

// Any warning ends the decoding as a failure: a truncated frame, corrupt
// entropy data or stray bytes between markers would otherwise come back as
// a picture partly made up (grey). Progressive streams with an absurd
// number of scans are refused too rather than decoded for ages.
constexpr int kDecodeFlags = TJFLAG_STOPONWARNING | TJFLAG_LIMITSCANS;

// At even sizes TurboJPEG writes the luma, and planar chroma, in place;
// NV12/NV21 chroma is interleaved from two small planes. Odd sizes decode
// into padded planes first, TurboJPEG's reaching past the picture.
bool decode_420(tjhandle handle, const unsigned char* stream, unsigned long size, int width, int height,
                uint32_t format, uint8_t* out, uint64_t out_bytes) {
    const qk::jpeg::Chroma420 chroma = qk::jpeg::chroma420(width, height, format);
    const qk::jpeg::TurboPlanes turbo = qk::jpeg::turbo_planes(width, height, true);
    const bool even = width % 2 == 0 && height % 2 == 0;
    unsigned char* planes[3] = {out, out + chroma.u, out + chroma.v};
    int strides[3] = {width, static_cast<int>(turbo.chromaWidth), static_cast<int>(turbo.chromaWidth)};
    if (even && chroma.step == 1) {
        return tjDecompressToYUVPlanes(handle, stream, size, planes, width, strides, height, kDecodeFlags) == 0;
    }
    const size_t luma_bytes = even ? 0 : turbo.lumaWidth * turbo.lumaHeight;
    const size_t chroma_bytes = turbo.chromaWidth * turbo.chromaHeight;
    Block scratch = qk::jpeg::allocate(luma_bytes + 2 * chroma_bytes);
    if (!scratch) return false;
    if (!even) {
        planes[0] = scratch.get();
        strides[0] = static_cast<int>(turbo.lumaWidth);
    }
    planes[1] = scratch.get() + luma_bytes;
    planes[2] = planes[1] + chroma_bytes;
    if (tjDecompressToYUVPlanes(handle, stream, size, planes, width, strides, height, kDecodeFlags) != 0) {
        return false;
    }
    if (!even) {
        const size_t w = static_cast<size_t>(width), h = static_cast<size_t>(height);
        qk::jpeg::copy_plane(planes[0], turbo.lumaWidth, out, w, w, h);
        // Some bytes of an odd-sized buffer belong to no sample: neutral
        // chroma rather than whatever malloc left there.
        memset(out + w * h, qk::jpeg::kNeutralChroma, out_bytes - w * h);
    }
    qk::jpeg::scatter420(planes[1], planes[2], turbo.chromaWidth, chroma, out);
    return true;
}

}  // namespace

extern "C" __attribute__((visibility("default"))) void* fastJpegDecode(const void* data, uint32_t size,
                                                                       int32_t* width, int32_t* height,
                                                                       uint32_t format) {
    if (data == nullptr || size == 0 || width == nullptr || height == nullptr) return nullptr;
    const int pixel_format = qk::jpeg::tj_pixel_format(format);
    const bool yuv420 = qk::is_yuv420_format(format);
    if (pixel_format < 0 && !yuv420) return nullptr;

    Handle handle = qk::jpeg::take_handle(qk::jpeg::g_decompressor, tjInitDecompress);
    if (!handle) return nullptr;
    const auto* stream = static_cast<const unsigned char*>(data);
    int w = 0, h = 0, subsamp = 0, colorspace = 0;
    if (tjDecompressHeader3(handle.get(), stream, size, &w, &h, &subsamp, &colorspace) != 0) return nullptr;
    // The 4:2:0 formats take a stream's planes as they are: only a 4:2:0
    // YCbCr stream has the right ones. Others are the caller's to convert.
    if (yuv420 && (subsamp != TJSAMP_420 || colorspace != TJCS_YCbCr)) return nullptr;
    // Too large a picture is refused on its header, before any allocation.
    const uint64_t bytes = QKImage_requiredSize(w, h, format);
    if (bytes == 0) return nullptr;
    // The library's pixel memory: frame-sized blocks are mapped in with one
    // system call rather than a page fault at a time while decoding, unless
    // the stream is far too short for the picture it claims.
    Block out(static_cast<uint8_t*>(
        qk::platform::allocate_pixels(bytes, false, qk::platform::worth_mapping_in(bytes, size))));
    if (!out) return nullptr;

    const bool decoded = yuv420 ? decode_420(handle.get(), stream, size, w, h, format, out.get(), bytes)
                                : tjDecompress2(handle.get(), stream, size, out.get(), w, 0, h, pixel_format,
                                                kDecodeFlags) == 0;
    if (!decoded) return nullptr;
    qk::jpeg::keep_handle(qk::jpeg::g_decompressor, std::move(handle));
    *width = w;
    *height = h;
    return out.release();
}
