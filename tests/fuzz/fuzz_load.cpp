// Fuzz target: loading a file into an image of any format, size and buffer
// (none, the library's own, or the caller's of exactly its recorded size):
// a picture, or raw pixels when it is none.
//
// Input: the image (Frame::make), then the file's contents: the rest. The
// file is this process's own under /tmp and is removed after each input.
#include <stdint.h>
#include <stdio.h>
#include <string.h>
#include <unistd.h>

#include <string>
#include <vector>

#include "fuzz/fuzz_support.h"
#include "qkcore/qk_image.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    static const bool ready = qkfuzz::setup_decoding();
    static const std::string path = "/tmp/qk_fuzz_load." + std::to_string(getpid());
    (void)ready;
    qkfuzz::Input in(data, size);
    qkfuzz::Frame frame;
    frame.make(in);
    const std::vector<uint8_t> contents = in.rest();
    FILE* file = fopen(path.c_str(), "wb");
    qkfuzz::check(file != nullptr && (contents.empty() || fwrite(contents.data(), 1, contents.size(), file) == contents.size()) &&
                      fclose(file) == 0,
                  "cannot write the file to load");
    const qkfuzz::Snapshot before(frame);
    const int32_t status = QKImage_loadFromFile(frame.image, path.c_str());
    unlink(path.c_str());
    qkfuzz::check(QKImage_loadFromFile(nullptr, path.c_str()) < 0 && QKImage_loadFromFile(frame.image, nullptr) < 0,
                  "load with a null image or path");
    qkfuzz::check_decoded(frame, before, status, /*decoded=*/false);
    // No decoder takes a file that starts with none of their signatures'
    // first bytes: a success took it as raw pixels, all of them, in the
    // image as it was described.
    if (status != QK_OK || contents.empty() || memchr("\xFF\x89RG", contents[0], 4) != nullptr) return 0;
    const QKImage* image = frame.image;
    qkfuzz::check(image->width == before.width && image->height == before.height && image->format == before.format &&
                      image->size == before.size && image->chromaOffset == before.chromaOffset &&
                      image->isWrapped == 0 && memcmp(image->data, contents.data(), contents.size()) == 0,
                  "a raw load changed the image's description or does not hold the file's bytes");
    return 0;
}
