// What the encoder and the decoder share: TurboJPEG handles and malloc'ed
// blocks that release themselves, and how qkcore's packed formats map to
// TurboJPEG's pixel formats.
#ifndef QKCORE_MODULES_JPEG_SRC_TURBO_H
#define QKCORE_MODULES_JPEG_SRC_TURBO_H

#include <stdint.h>
#include <stdlib.h>
#include <turbojpeg.h>

#include <atomic>
#include <memory>

#include "qkcore/qk_image.h"

namespace qk::jpeg {

// The largest width or height a JPEG stream can describe to the codec.
// Checked before TurboJPEG sees a dimension: its worst-case size arithmetic
// is done in int and would overflow far beyond it.
constexpr int32_t kMaxSide = 65500;

struct HandleCloser {
    void operator()(void* handle) const { tjDestroy(handle); }
};
using Handle = std::unique_ptr<void, HandleCloser>;

// One handle of each kind is kept between calls: making one costs a tenth
// of a millisecond or more, a few percent of a 1080p frame. The module is
// linked "nodelete", so it stays loaded after the library's dlclose and what
// it keeps stays valid. A call takes the kept handle, or makes its own when
// another call holds it, and gives it back only after a success.
inline std::atomic<void*> g_compressor{nullptr};
inline std::atomic<void*> g_decompressor{nullptr};

inline Handle take_handle(std::atomic<void*>& kept, tjhandle (*make)()) {
    void* handle = kept.exchange(nullptr);
    return Handle(handle != nullptr ? handle : make());
}
inline void keep_handle(std::atomic<void*>& kept, Handle handle) {
    void* none = nullptr;
    if (kept.compare_exchange_strong(none, handle.get())) handle.release();
}

// Blocks come from malloc: the stream and the pixels handed to the library
// outlive the module, and the library frees them with free().
struct BlockFree {
    void operator()(uint8_t* block) const { free(block); }
};
using Block = std::unique_ptr<uint8_t, BlockFree>;

inline Block allocate(uint64_t bytes) { return Block(static_cast<uint8_t*>(malloc(bytes))); }

// TurboJPEG's pixel format for qkcore's RGB family and GREY; -1 otherwise.
// TJPF_*A formats ignore alpha when compressing and set it to 255 when
// decompressing, which is what an opaque picture needs.
inline int tj_pixel_format(uint32_t format) {
    switch (format) {
        case QK_FORMAT_RGBA: return TJPF_RGBA;
        case QK_FORMAT_BGRA: return TJPF_BGRA;
        case QK_FORMAT_ARGB: return TJPF_ARGB;
        case QK_FORMAT_ABGR: return TJPF_ABGR;
        case QK_FORMAT_RGB8: return TJPF_RGB;
        case QK_FORMAT_BGR8: return TJPF_BGR;
        case QK_FORMAT_GREY: return TJPF_GRAY;
        default: return -1;
    }
}

}  // namespace qk::jpeg

#endif  // QKCORE_MODULES_JPEG_SRC_TURBO_H
