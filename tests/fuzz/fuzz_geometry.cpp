// Fuzz target: rotate, scale, crop and draw with images, offsets and angles
// from the input, over caller buffers of exactly the size they claim. A
// refusal leaves every image as it was; a success keeps the fields the call
// promises to keep, a buffer that holds the picture, and the identities that
// cost nothing to state: four quarter turns, a crop drawn back where it came
// from, a picture drawn onto itself.
//
// Input: operations until the input ends (at most 4), each a byte mod 4:
//   0 rotate: an image (Frame::make), then the angle (see take_angle);
//   1 scale:  source and destination images;
//   2 crop:   source and destination images, x and y (Input::offset);
//   3 draw:   a byte (bit 0: draw the source into itself), the source, the
//             destination unless drawing into itself, x and y.
#include <stdint.h>

#include <algorithm>
#include <vector>

#include "fuzz/fuzz_support.h"
#include "qkcore/qk_image.h"
#include "support/images.h"

namespace {

using namespace qkfuzz;

// A byte mod 4: 0 a multiple -12..12 of 90 (byte mod 25 - 12); 1 one of
// kAngles (byte mod 8); 2 a raw 32-bit value; 3 90 times a signed 16-bit value.
constexpr int32_t kAngles[8] = {2147483610, -2147483610, INT32_MIN, INT32_MAX, 810, -810, 45, 1 << 30};
int32_t take_angle(Input& in) {
    switch (in.byte() % 4) {
        case 0: return 90 * (in.byte() % 25 - 12);
        case 1: return kAngles[in.byte() % 8];
        case 2: return static_cast<int32_t>(in.u32());
        default: return 90 * static_cast<int16_t>(in.u16());
    }
}

// 4:2:0 chroma laid over the luma has no one defined result.
bool chroma_apart(const QKImage& image) {
    return !qktest::is_yuv420(image.format) || image.chromaOffset == 0 ||
           image.chromaOffset >= uint64_t(image.width) * uint64_t(image.height);
}

void rotate(Input& in) {
    Frame frame;
    frame.make(in);
    const int32_t angle = take_angle(in);
    QKImage* image = frame.image;
    // Formats other than RGBA turn through a temporary RGBA copy.
    if (image->format != QK_FORMAT_RGBA &&
        QKImage_requiredSize(image->width, image->height, QK_FORMAT_RGBA) > qkfuzz::kMaxBytes) {
        return;
    }
    const Snapshot before(frame);
    const int32_t status = QKImage_rotate(image, angle);
    const Snapshot after(frame);
    if (status != QK_OK) return check(after == before, "rotate: a refusal changed the image");
    const bool exchanged = (angle / 90) % 2 != 0;
    check(angle % 90 == 0 && after.data == before.data && after.size == before.size &&
              after.format == before.format && after.width == (exchanged ? before.height : before.width) &&
              after.height == (exchanged ? before.width : before.height),
          "rotate: fields after a turn");
    // At even sizes no turn shifts the picture.
    if (image->format != QK_FORMAT_RGBA || image->width % 2 != 0 || image->height % 2 != 0) return;
    for (int i = 0; i < 4; ++i) check(QKImage_rotate(image, 90) == QK_OK, "rotate: a quarter turn refused");
    check(Snapshot(frame) == after, "rotate: four quarter turns are not the identity");
}

// Runs a call from one frame into another (the same one for a drawing into
// itself) and checks what each of these calls keeps: the source as it was,
// the destination's fields (a destination without buffer may get one, even
// before a refusal, as documented for crop), and after a refusal its bytes.
// Returns the status and the destination's bytes before the call.
template <typename Call>
int32_t run(Frame& from, Frame& to, std::vector<uint8_t>* bytesBefore, Call call) {
    const Snapshot srcBefore(from), dstBefore(to);
    const int32_t status = call(from.image, to.image);
    const Snapshot after(to);
    const bool allocated = dstBefore.data == nullptr && after.data != nullptr;
    check((&from == &to || Snapshot(from) == srcBefore) &&
              (allocated ? std::tie(after.width, after.height, after.format) ==
                               std::tie(dstBefore.width, dstBefore.height, dstBefore.format)
                         : after.fields() == dstBefore.fields()) &&
              (status == QK_OK || allocated || after.bytes == dstBefore.bytes),
          "a call changed its source, the destination's fields, or after a refusal the destination");
    if (status == QK_OK) qkfuzz::check_holds(to, true, "success into a buffer short of the picture");
    *bytesBefore = dstBefore.bytes;
    return status;
}

void scale(Input& in) {
    Frame from, to;
    from.make(in);
    to.make(in);
    if (to.image->data == nullptr && QKImage_size(to.image) > qkfuzz::kMaxBytes) return;
    std::vector<uint8_t> before;
    const int32_t status = run(from, to, &before, QKImage_scale);
    check(status != QK_OK || (from.image->format == QK_FORMAT_RGBA && to.image->format == QK_FORMAT_RGBA),
          "scale: success for a format not RGBA");
}

void crop(Input& in) {
    Frame from, to;
    from.make(in);
    to.make(in);
    const int32_t x = in.offset(), y = in.offset();
    const QKImage *src = from.image, *dst = to.image;
    if (dst->data == nullptr && QKImage_size(dst) > qkfuzz::kMaxBytes) return;
    std::vector<uint8_t> before;
    if (run(from, to, &before, [&](const QKImage* s, QKImage* d) { return QKImage_crop(s, d, x, y); }) != QK_OK) return;
    check(src->format == dst->format && x >= 0 && y >= 0 && int64_t{x} + dst->width <= src->width &&
              int64_t{y} + dst->height <= src->height,
          "crop: success for another format or a rectangle outside the source");
    if (!chroma_apart(*src) || !chroma_apart(*dst)) return;
    // Drawn back where it came from, the crop leaves the source as it was.
    std::vector<uint8_t> copy = Snapshot(from).bytes, original = copy;
    QKImage* back = QKImage_createWrap(copy.data(), src->width, src->height, src->format,
                                       static_cast<int32_t>(src->size), src->chromaOffset);
    if (QKImage_drawImage(dst, back, x, y) == QK_OK) check(copy == original, "crop: not the source's pixels");
    QKImage_destroy(back);
}

void draw(Input& in) {
    const bool self = (in.byte() & 1) != 0;
    Frame from, to;
    from.make(in);
    if (!self) to.make(in);
    const int32_t x = in.offset(), y = in.offset();
    Frame& target = self ? from : to;
    std::vector<uint8_t> before;
    const int32_t status =
        run(from, target, &before, [&](const QKImage* s, QKImage* d) { return QKImage_drawImage(s, d, x, y); });
    check(status != QK_OK || Snapshot(target).bytes == before || from.image->format == target.image->format,
          "draw: wrote another format");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    static const bool ready = (qkfuzz::quiet_log(), true);
    (void)ready;
    Input in(data, size);
    for (int step = 0; step < 4 && !in.empty(); ++step) {
        switch (in.byte() % 4) {
            case 0: rotate(in); break;
            case 1: scale(in); break;
            case 2: crop(in); break;
            default: draw(in); break;
        }
    }
    return 0;
}
