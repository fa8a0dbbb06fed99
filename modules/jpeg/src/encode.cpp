// fastJpegEncode: packed pixels go to TurboJPEG as they are, camera formats
// as the YCbCr planes they already hold, without a detour through RGB.
#include <stdint.h>
#include <stdlib.h>
#include <turbojpeg.h>

#include <utility>

#include "image/format.h"
#include "planes.h"
#include "platform/memory.h"
#include "qkcore/qk_image.h"
#include "raw420.h"
#include "turbo.h"
#include "veljpeginterface.h"

namespace {

using qk::jpeg::Block;
using qk::jpeg::Handle;

int clamp_quality(int32_t quality) { return quality < 1 ? 1 : quality > 100 ? 100 : quality; }

// Runs `compress` (handle, &stream, &length) with TurboJPEG growing the
// stream's buffer as it goes, then hands the unused tail back. Its buffers
// come from malloc and are small enough to be reused from the heap: a block
// of the worst-case length (36 MB at 4000x3000) would come fresh from the
// system on every call, and each page the stream then wrote would fault in
// (about 2 ms a 12-megapixel frame, measured).
template <typename Compress>
void* compress_to_stream(uint32_t* length, Compress compress) {
    Handle handle = qk::jpeg::take_handle(qk::jpeg::g_compressor, tjInitCompress);
    if (!handle) return nullptr;
    unsigned char* stream = nullptr;
    unsigned long written = 0;
    const int failed = compress(handle.get(), &stream, &written);
    Block block(stream);  // TurboJPEG's buffer, also when it failed
    if (failed != 0 || written == 0 || written > UINT32_MAX) return nullptr;
    qk::jpeg::keep_handle(qk::jpeg::g_compressor, std::move(handle));
    uint8_t* whole = block.release();
    void* trimmed = realloc(whole, written);
    *length = static_cast<uint32_t>(written);
    return trimmed != nullptr ? trimmed : whole;
}

void* encode_packed(const uint8_t* pixels, int32_t width, int32_t height, int pixel_format, int quality,
                    uint32_t* length) {
    // Colour pictures are coded 4:2:0, the camera's own sampling, so that
    // they also decode straight into the 4:2:0 formats.
    const int subsamp = pixel_format == TJPF_GRAY ? TJSAMP_GRAY : TJSAMP_420;
    return compress_to_stream(length, [&](tjhandle handle, unsigned char** stream, unsigned long* written) {
        return tjCompress2(handle, pixels, width, 0, height, pixel_format, stream, written, subsamp, quality, 0);
    });
}

// Compresses YCbCr planes in TurboJPEG's geometry for the sampling.
void* encode_planes(const uint8_t** planes, const int* strides, int32_t width, int32_t height, int subsamp,
                    int quality, uint32_t* length) {
    return compress_to_stream(length, [&](tjhandle handle, unsigned char** stream, unsigned long* written) {
        return tjCompressFromYUVPlanes(handle, planes, width, strides, height, subsamp, stream, written, quality, 0);
    });
}

void* encode_420(const uint8_t* pixels, int32_t width, int32_t height, uint32_t format, int quality,
                 uint32_t* length) {
    const qk::jpeg::Chroma420 chroma = qk::jpeg::chroma420(width, height, format);
    // NV12/NV21 at whole-MCU widths skip the frame-sized chroma planes.
    if (qk::jpeg::raw420_fits(width, height, chroma)) {
        return qk::jpeg::compress_raw420(pixels, width, height, chroma, quality, length);
    }
    const qk::jpeg::TurboPlanes turbo = qk::jpeg::turbo_planes(width, height, true);
    const bool even = width % 2 == 0 && height % 2 == 0;
    const uint8_t* planes[3] = {pixels, pixels + chroma.u, pixels + chroma.v};
    int strides[3] = {width, static_cast<int>(turbo.chromaWidth), static_cast<int>(turbo.chromaWidth)};
    Block scratch;
    // At even sizes TurboJPEG reads the luma, and planar chroma, where they
    // lie: NV12/NV21 chroma costs one de-interleaving pass. Odd sizes take
    // copies padded to TurboJPEG's planes, which reach past the picture.
    if (!even || chroma.step != 1) {
        const size_t luma_bytes = even ? 0 : turbo.lumaWidth * turbo.lumaHeight;
        const size_t chroma_bytes = turbo.chromaWidth * turbo.chromaHeight;
        // Frame-sized scratch is mapped in with one system call, not faulted
        // in a page at a time by the de-interleaving pass.
        scratch.reset(static_cast<uint8_t*>(qk::platform::allocate_pixels(luma_bytes + 2 * chroma_bytes)));
        if (!scratch) return nullptr;
        uint8_t* luma = scratch.get();
        if (!even) {
            const size_t w = static_cast<size_t>(width), h = static_cast<size_t>(height);
            qk::jpeg::copy_plane(pixels, w, luma, turbo.lumaWidth, w, h);
            qk::jpeg::pad_edges(luma, turbo.lumaWidth, w, h, turbo.lumaWidth, turbo.lumaHeight);
            planes[0] = luma;
            strides[0] = static_cast<int>(turbo.lumaWidth);
        }
        uint8_t* u = luma + luma_bytes;
        qk::jpeg::gather420(pixels, chroma, u, u + chroma_bytes, turbo.chromaWidth, turbo.chromaHeight);
        planes[1] = u;
        planes[2] = u + chroma_bytes;
    }
    return encode_planes(planes, strides, width, height, TJSAMP_420, quality, length);
}

// Packed 4:2:2 is split into planes in one pass, the least its layout
// allows.
void* encode_422(const uint8_t* pixels, int32_t width, int32_t height, uint32_t format, int quality,
                 uint32_t* length) {
    const qk::jpeg::TurboPlanes turbo = qk::jpeg::turbo_planes(width, height, false);
    const size_t luma_bytes = turbo.lumaWidth * turbo.lumaHeight;
    const size_t chroma_bytes = turbo.chromaWidth * turbo.chromaHeight;
    Block scratch = qk::jpeg::allocate(luma_bytes + 2 * chroma_bytes);
    if (!scratch) return nullptr;
    uint8_t* y = scratch.get();
    const qk::YuvLayout& layout = qk::yuv_layout(format);
    qk::jpeg::split422(pixels, width, height, layout.uOffset < layout.vOffset, y, y + luma_bytes,
                       y + luma_bytes + chroma_bytes);
    const uint8_t* planes[3] = {y, y + luma_bytes, y + luma_bytes + chroma_bytes};
    const int strides[3] = {static_cast<int>(turbo.lumaWidth), static_cast<int>(turbo.chromaWidth),
                            static_cast<int>(turbo.chromaWidth)};
    return encode_planes(planes, strides, width, height, TJSAMP_422, quality, length);
}

}  // namespace

extern "C" __attribute__((visibility("default"))) void* fastJpegEncode(const void* pixels, uint32_t size,
                                                                       int32_t width, int32_t height,
                                                                       uint32_t format, uint32_t* length,
                                                                       int32_t quality) {
    if (pixels == nullptr || length == nullptr) return nullptr;
    // The size rule also refuses dimensions below 1 and the formats without
    // pixels (D16 and PCL have a rule but no encoding: refused below).
    const uint64_t needed = QKImage_requiredSize(width, height, format);
    if (needed == 0 || (size != 0 && size < needed)) return nullptr;
    if (width > qk::jpeg::kMaxSide || height > qk::jpeg::kMaxSide) return nullptr;
    const auto* bytes = static_cast<const uint8_t*>(pixels);
    const int q = clamp_quality(quality);
    const int pixel_format = qk::jpeg::tj_pixel_format(format);
    if (pixel_format >= 0) return encode_packed(bytes, width, height, pixel_format, q, length);
    if (qk::is_yuv420_format(format)) return encode_420(bytes, width, height, format, q, length);
    if (qk::is_packed422_format(format)) return encode_422(bytes, width, height, format, q, length);
    return nullptr;
}
