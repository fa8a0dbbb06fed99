// Every refusal of rotate, scale, crop and draw: its status, its one failure
// report (from the operation's own file unless a step it relies on reports),
// any message that goes with it, and the caller's images left as they were.
#include <gtest/gtest.h>
#include <stdint.h>

#include <vector>

#include "support/images.h"
#include "qkcore/qk_image.h"
#include "support/log_capture.h"

namespace {

using namespace qktest;

enum Op { kRotate, kScale, kCrop, kDraw };
const char* const kFiles[] = {"src/geometry/rotate.cpp", "src/geometry/scale.cpp", "src/geometry/crop.cpp",
                              "src/geometry/draw.cpp"};
constexpr const char* kConvertFile = "src/convert/convert.cpp";
constexpr const char* kImageFile = "src/image/image.cpp";
constexpr int kBuffer = 1, kNone = 0, kNullImage = -1;

// An image over a 64-byte buffer (or none, or no image at all) that records
// `size` (0: the size rule) and `chroma`.
struct Spec {
    uint32_t format;
    int32_t w, h;
    uint64_t size = 0;
    int buffer = kBuffer;
    uint32_t chroma = 0;
};

ImagePtr make(const Spec& spec, std::vector<uint8_t>& bytes) {
    if (spec.buffer == kNullImage) return nullptr;
    ImagePtr image(QKImage_createWrap(spec.buffer == kBuffer ? bytes.data() : nullptr, spec.w, spec.h, spec.format,
                                      0, spec.chroma));
    image->size = spec.size;
    return image;
}

TEST(GeometryRefusals, ReportOnceAndLeaveTheImagesAlone) {
    constexpr uint32_t RGBA = QK_FORMAT_RGBA, NV12 = QK_FORMAT_NV12, NV21 = QK_FORMAT_NV21, GREY = QK_FORMAT_GREY;
    constexpr int32_t NUL = QK_ERROR_NULL_PARAM, PARAM = QK_ERROR_INVALID_PARAM, SIZE = QK_ERROR_INVALID_SIZE,
                      NONE = QK_ERROR_UNSUPPORTED;
    constexpr const char* kScaleSizes = "QKImage_scale: invalid image dimensions (<=0)";
    constexpr const char* kScaleFormat = "QKImage_scale supports only ANDROID_BITMAP format for now";
    const Spec rgba4{RGBA, 4, 4}, rgba2{RGBA, 2, 2}, none2{RGBA, 2, 2, 0, kNone}, null{RGBA, 2, 2, 0, kNullImage};
    const struct {
        Op op;
        const char* what;
        Spec src, dst;  // rotate turns `src`
        int32_t x, y;   // rotate: x is the angle
        int32_t status;
        const char* file = nullptr;     // null: the operation's own
        const char* message = nullptr;  // a level-4 message before the report
        bool allocates = false;         // the destination got its buffer before the refusal
    } cases[] = {
        {kRotate, "no image", null, {}, 90, 0, NUL},
        {kRotate, "no buffer", {RGBA, 3, 2, 0, kNone}, {}, 90, 0, NUL},
        {kRotate, "angle 45", {RGBA, 3, 2}, {}, 45, 0, PARAM},
        {kRotate, "width 0", {RGBA, 0, 2}, {}, 90, 0, SIZE},
        {kRotate, "no size rule", {QK_FORMAT_JPEG, 3, 2}, {}, 90, 0, SIZE},
        {kRotate, "buffer larger than the picture", {RGBA, 2, 2, 24}, {}, 90, 0, SIZE},
        {kRotate, "buffer smaller than the picture", {RGBA, 3, 2, 20}, {}, 180, 0, SIZE},
        {kRotate, "recorded size, negative width", {RGBA, -3, 2, 24}, {}, 90, 0, SIZE},
        // Other formats turn through RGBA: conversion refusals come back.
        {kRotate, "D16: no way into RGBA", {QK_FORMAT_D16, 4, 2}, {}, 90, 0, NONE, kConvertFile,
         "[QKImage] Can not convert  D16 into RGBA"},
        {kRotate, "YUYV turned 3 pixels wide", {QK_FORMAT_YUYV, 4, 3}, {}, 90, 0, SIZE, kConvertFile},

        {kScale, "no source", null, rgba2, 0, 0, NUL},
        {kScale, "no destination", rgba2, null, 0, 0, NUL},
        {kScale, "source without buffer", none2, rgba2, 0, 0, NUL},
        {kScale, "source width 0", {RGBA, 0, 2, 64}, none2, 0, 0, SIZE, nullptr, kScaleSizes},
        {kScale, "destination height -1", rgba2, {RGBA, 2, -1, 0, kNone}, 0, 0, SIZE, nullptr, kScaleSizes},
        {kScale, "dimensions before format", rgba2, {QK_FORMAT_BGRA, 0, 2, 0, kNone}, 0, 0, SIZE, nullptr,
         kScaleSizes},
        {kScale, "BGRA source", {QK_FORMAT_BGRA, 2, 2}, none2, 0, 0, PARAM, nullptr, kScaleFormat},
        {kScale, "NV12 destination", rgba2, {NV12, 2, 2, 0, kNone}, 0, 0, PARAM, nullptr, kScaleFormat},
        {kScale, "destination buffer too small", rgba2, {RGBA, 2, 2, 12}, 0, 0, SIZE},
        {kScale, "preset size too small", rgba2, {RGBA, 2, 2, 12, kNone}, 0, 0, SIZE},
        {kScale, "source size below its picture", {RGBA, 2, 2, 12}, none2, 0, 0, SIZE},
        {kScale, "destination buffer not obtained", rgba2, {RGBA, 40000, 40000, 0, kNone}, 0, 0, PARAM, kImageFile,
         "QKImage_scale: allocation failed (0 bytes)"},

        {kCrop, "no source", null, rgba2, 0, 0, NUL},
        {kCrop, "no destination", rgba2, null, 0, 0, NUL},
        {kCrop, "source without buffer", {RGBA, 4, 4, 64, kNone}, none2, 0, 0, NUL},
        {kCrop, "source size 0", {RGBA, 0, 4}, none2, 0, 0, SIZE},
        {kCrop, "source size below its picture", {RGBA, 4, 4, 60}, none2, 0, 0, SIZE},
        {kCrop, "formats differ", rgba4, {QK_FORMAT_BGRA, 2, 2, 0, kNone}, 0, 0, PARAM},
        {kCrop, "x negative", rgba4, none2, -1, 0, SIZE},
        {kCrop, "past the right edge", rgba4, none2, 3, 0, SIZE},
        {kCrop, "x + width past int32", rgba4, none2, INT32_MAX, 0, SIZE},
        {kCrop, "past the bottom edge", rgba4, none2, 0, 3, SIZE},
        {kCrop, "destination buffer too small", rgba4, {RGBA, 4, 4, 60}, 0, 0, SIZE},
        {kCrop, "preset size too small", rgba4, {RGBA, 2, 2, 15, kNone}, 0, 0, SIZE},
        {kCrop, "destination with buffer, width 0", rgba4, {RGBA, 0, 2, 60}, 0, 0, SIZE},
        {kCrop, "chroma past the recorded size", {NV21, 4, 4}, {NV21, 4, 4, 24, kBuffer, 20}, 0, 0, SIZE},
        {kCrop, "source past the byte range", {RGBA, 100000, 100000, 16}, none2, 0, 1, SIZE},
        {kCrop, "destination buffer not obtained", rgba2, {RGBA, 0, 0, 0, kNone}, 0, 0, PARAM, kImageFile},
        // Format and parity refusals come after the destination got its buffer.
        {kCrop, "GREY", {GREY, 4, 4}, {GREY, 2, 2, 0, kNone}, 0, 0, NONE, nullptr, nullptr, true},
        {kCrop, "4:2:0 x odd", {NV21, 4, 4}, {NV21, 2, 2, 0, kNone}, 1, 0, SIZE, nullptr, nullptr, true},
        {kCrop, "4:2:0 y odd", {NV21, 4, 4}, {NV21, 2, 2, 0, kNone}, 0, 1, SIZE, nullptr, nullptr, true},
        {kCrop, "4:2:0 source odd", {NV21, 5, 4}, {NV21, 2, 2, 0, kNone}, 0, 0, SIZE, nullptr, nullptr, true},
        {kCrop, "4:2:0 destination odd", {NV21, 4, 4}, {NV21, 3, 2, 0, kNone}, 0, 0, SIZE, nullptr, nullptr, true},

        {kDraw, "no source", null, rgba4, 0, 0, NUL},
        {kDraw, "no destination", rgba2, null, 0, 0, NUL},
        {kDraw, "source without buffer", none2, rgba4, 0, 0, NUL},
        {kDraw, "destination without buffer", rgba2, {RGBA, 4, 4, 0, kNone}, 0, 0, NUL},
        {kDraw, "source size 0", {RGBA, 0, 2}, rgba4, 0, 0, SIZE},
        {kDraw, "destination size below its picture", rgba2, {RGBA, 4, 4, 60}, 0, 0, SIZE},
        {kDraw, "source past the byte range", {RGBA, 100000, 100000, 16}, rgba4, 0, 0, SIZE},
        {kDraw, "destination past the byte range", rgba2, {RGBA, 100000, 100000, 16}, 0, 0, SIZE},
        {kDraw, "formats differ", rgba2, {QK_FORMAT_ABGR, 4, 4}, 0, 0, PARAM},
        {kDraw, "4:2:0 x odd", {NV12, 2, 2}, {NV12, 4, 4}, 1, 0, NONE, nullptr,
         "Unsupported dimensions for YUV420: 2x2 offset 1,0"},
        {kDraw, "4:2:0 source odd", {NV12, 3, 2}, {NV12, 4, 4}, 0, -2, NONE, nullptr,
         "Unsupported dimensions for YUV420: 3x2 offset 0,-2"},
        {kDraw, "4:2:0 destination odd", {NV12, 2, 2}, {NV12, 4, 3}, 0, 0, SIZE},
        {kDraw, "GREY", {GREY, 2, 2}, {GREY, 4, 4}, 0, 0, NONE},
        {kDraw, "YUYV", {QK_FORMAT_YUYV, 2, 2}, {QK_FORMAT_YUYV, 4, 4}, 0, 0, NONE},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(::testing::Message() << kFiles[c.op] << ": " << c.what);
        std::vector<uint8_t> src_bytes(64, 1), dst_bytes(64, 2);
        ImagePtr src = make(c.src, src_bytes), dst = make(c.dst, dst_bytes);
        const auto src_before = snapshot(src.get()), dst_before = snapshot(dst.get());
        LogCapture log;
        const int32_t status = c.op == kRotate  ? QKImage_rotate(src.get(), c.x)
                               : c.op == kScale ? QKImage_scale(src.get(), dst.get())
                               : c.op == kCrop  ? QKImage_crop(src.get(), dst.get(), c.x, c.y)
                                                : QKImage_drawImage(src.get(), dst.get(), c.x, c.y);
        EXPECT_EQ(status, c.status);
        EXPECT_TRUE(HasOneFailureReport(log, c.status, c.file != nullptr ? c.file : kFiles[c.op]));
        EXPECT_EQ(log.texts(4).size(), c.message != nullptr ? 2u : 1u);
        EXPECT_TRUE(c.message == nullptr || log.contains(4, c.message));
        // The level-3 message of turning through RGBA comes first.
        EXPECT_EQ(log.texts(3).size(), c.file == kConvertFile ? 1u : 0u);
        EXPECT_TRUE(snapshot(src.get()) == src_before);
        EXPECT_TRUE(c.allocates ? dst->data != nullptr : snapshot(dst.get()) == dst_before);
    }
}

}  // namespace
