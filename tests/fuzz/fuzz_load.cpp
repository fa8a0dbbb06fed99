// Fuzz target: loading a file into an image of any format, size and buffer
// (none, the library's own, or the caller's of exactly its recorded size):
// a picture, or raw pixels when it is none.
//
// Input: the image (Frame::make), then the file's contents: the rest. The
// file is this process's own under /tmp and is removed after each input.
#include <dlfcn.h>
#include <stdint.h>
#include <stdio.h>
#include <string.h>
#include <unistd.h>

#include <string>
#include <vector>

#include "codec/codec.h"
#include "fuzz/fuzz_support.h"
#include "platform/picture.h"
#include "qkcore/qk_image.h"

namespace {

std::string g_path;

bool setup() {
    qkfuzz::quiet_log();
    // Pictures past 16 MB of RGBA are refused from their header: fuzzing
    // stays small and fast.
    qk::platform::set_max_picture_bytes(16 << 20);
    // The library loads the codec module for each call and closes it after.
    // Held open here, it stays mapped for the whole run: libFuzzer keeps the
    // addresses of its coverage counters.
    dlopen(qk::kJpegModule, RTLD_NOW);
    g_path = "/tmp/qk_fuzz_load." + std::to_string(getpid());
    QKImage* image = QKImage_createEmpty(2, 2, QK_FORMAT_RGBA);
    qkfuzz::check(QKImage_loadFromFile(nullptr, "/dev/null") < 0 && QKImage_loadFromFile(image, nullptr) < 0,
                  "load with a null image or path");
    QKImage_destroy(image);
    return true;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    static const bool ready = setup();
    (void)ready;
    qkfuzz::Input in(data, size);
    qkfuzz::Frame frame;
    frame.make(in);
    const std::vector<uint8_t> contents = in.rest();
    FILE* file = fopen(g_path.c_str(), "wb");
    qkfuzz::check(file != nullptr, "cannot create the file to load");
    const size_t written = contents.empty() ? 0 : fwrite(contents.data(), 1, contents.size(), file);
    qkfuzz::check(fclose(file) == 0 && written == contents.size(), "cannot write the file to load");

    const qkfuzz::Snapshot before(frame);
    const int32_t status = QKImage_loadFromFile(frame.image, g_path.c_str());
    unlink(g_path.c_str());
    qkfuzz::check_decoded(frame, before, status, /*decoded=*/false);
    // No decoder takes a file that starts with none of their signatures'
    // first bytes: a success took it as raw pixels, all of them, in the
    // image as it was described.
    if (status != QK_OK || contents.empty()) return 0;
    const uint8_t first = contents[0];
    if (first == 0xFF || first == 0x89 || first == 'R' || first == 'G') return 0;
    const QKImage* image = frame.image;
    qkfuzz::check(image->width == before.width && image->height == before.height && image->format == before.format &&
                      image->size == before.size && image->chromaOffset == before.chromaOffset &&
                      image->isWrapped == 0,
                  "a raw load changed the image's description");
    qkfuzz::check(memcmp(image->data, contents.data(), contents.size()) == 0,
                  "a raw load does not hold the file's bytes");
    return 0;
}
