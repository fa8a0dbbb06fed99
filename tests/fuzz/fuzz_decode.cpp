// Fuzz target: decoding a picture held in memory into an image of any
// format, size and buffer (none, the library's own, or the caller's of
// exactly its recorded size).
//
// Input: the image (Frame::make), then the encoded picture: the rest.
#include <stdint.h>

#include <vector>

#include "fuzz/fuzz_support.h"
#include "qkcore/qk_image.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    static const bool ready = qkfuzz::setup_decoding();
    (void)ready;
    qkfuzz::Input in(data, size);
    qkfuzz::Frame frame;
    frame.make(in);
    // A copy of exactly the picture's bytes: reading past them shows.
    const std::vector<uint8_t> picture = in.rest(), copy = picture;
    const qkfuzz::Snapshot before(frame);
    const int32_t status = QKImage_decodeFromJpeg(frame.image, picture.empty() ? nullptr : picture.data(), picture.size());
    qkfuzz::check(picture == copy && QKImage_decodeFromJpeg(nullptr, copy.data(), copy.size()) < 0,
                  "decode wrote to its input, or decoded into a null image");
    qkfuzz::check_decoded(frame, before, status, /*decoded=*/true);
    return 0;
}
