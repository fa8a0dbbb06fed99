// Fuzz target: decoding a picture held in memory into an image of any
// format, size and buffer (none, the library's own, or the caller's of
// exactly its recorded size).
//
// Input: the image (Frame::make), then the encoded picture: the rest.
#include <dlfcn.h>
#include <stdint.h>

#include <vector>

#include "codec/codec.h"
#include "fuzz/fuzz_support.h"
#include "platform/picture.h"
#include "qkcore/qk_image.h"

namespace {

bool setup() {
    qkfuzz::quiet_log();
    // Pictures past 16 MB of RGBA are refused from their header: fuzzing
    // stays small and fast.
    qk::platform::set_max_picture_bytes(16 << 20);
    // The library loads the codec module for each call and closes it after.
    // Held open here, it stays mapped for the whole run: libFuzzer keeps the
    // addresses of its coverage counters.
    dlopen(qk::kJpegModule, RTLD_NOW);
    const uint8_t byte = 0;
    qkfuzz::check(QKImage_decodeFromJpeg(nullptr, &byte, 1) < 0, "decode into a null image");
    return true;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    static const bool ready = setup();
    (void)ready;
    qkfuzz::Input in(data, size);
    qkfuzz::Frame frame;
    frame.make(in);
    // A copy of exactly the picture's bytes: reading past them shows.
    const std::vector<uint8_t> rest = in.rest();
    std::vector<uint8_t> picture(rest.begin(), rest.end());
    const qkfuzz::Snapshot before(frame);
    const int32_t status = QKImage_decodeFromJpeg(frame.image, picture.empty() ? nullptr : picture.data(),
                                                  picture.size());
    qkfuzz::check(picture == rest, "decode wrote to its input");
    qkfuzz::check_decoded(frame, before, status, /*decoded=*/true);
    return 0;
}
