// csc_run and the conversion entry's offer to it. CTest runs each suite with
// a different libcsc.so stand-in on the library search path: none (CscRun,
// CscAbsent), one without entry points (CscBare), only the plain entry point
// (CscPlain), only the NEON one (CscNeon), or both (CscBoth).
#include <gtest/gtest.h>

#include <random>
#include <vector>

#include "convert/kernels.h"
#include "csc/csc_standin.h"
#include "platform/module.h"
#include "qkcore/qk_converter.h"
#include "qkcore/qk_image.h"
#include "support/log_capture.h"

namespace {

using qk::platform::Module;
using qktest::HasNoErrors;
using qktest::HasOneFailureReport;
using qktest::LogCapture;

constexpr const char* kCscFile = "src/csc/csc_run.cpp";
constexpr const char* kOffloaded = "[QKImage] Conversion successful with external CSC module";
constexpr int32_t kWidth = 16, kHeight = 8;

// A BGRA source and an NV12 destination over test-owned buffers; the
// destination's chroma sits at `chromaOffset` (0: after the luma).
struct Frames {
    explicit Frames(uint32_t chromaOffset = 0, uint32_t from = QK_FORMAT_BGRA, uint32_t to = QK_FORMAT_NV12)
        : pixels(kWidth * kHeight * 4), planes(320, 0x11) {
        std::mt19937 random(5);
        for (uint8_t& byte : pixels) byte = static_cast<uint8_t>(random());
        src = QKImage_createWrap(pixels.data(), kWidth, kHeight, from, 0, 0);
        dst = QKImage_createWrap(planes.data(), kWidth, kHeight, to, static_cast<int32_t>(planes.size()),
                                 chromaOffset);
    }
    ~Frames() {
        QKImage_destroy(src);
        QKImage_destroy(dst);
    }
    Frames(const Frames&) = delete;
    Frames& operator=(const Frames&) = delete;

    // What the library's own kernel makes of the source.
    std::vector<uint8_t> kernel_result() const {
        std::vector<uint8_t> bytes(planes.size(), 0x11);
        QKImage image;
        image.data = bytes.data(), image.isWrapped = 1;
        image.width = kWidth, image.height = kHeight, image.format = QK_FORMAT_NV12;
        image.size = bytes.size(), image.chromaOffset = dst->chromaOffset;
        qk::convert_rgb_to_yuv(*src, image);
        return bytes;
    }

    std::vector<uint8_t> pixels, planes;
    QKImage* src;
    QKImage* dst;
};

// The stand-in on the search path, held open so that its record outlives
// csc_run's own load and unload.
class Standin {
public:
    Standin() : module_(Module::open("libcsc.so")) {}
    bool loaded() const { return static_cast<bool>(module_); }
    const CscStandinCall& last_call() const {
        return *static_cast<const CscStandinCall*>(module_.symbol(kCscStandinRecord));
    }

private:
    Module module_;
};

TEST(CscRun, DeclinesEveryOtherPairSilently) {
    const std::pair<uint32_t, uint32_t> pairs[] = {{QK_FORMAT_RGBA, QK_FORMAT_NV12},
                                                   {QK_FORMAT_BGRA, QK_FORMAT_NV21},
                                                   {QK_FORMAT_BGRA, QK_FORMAT_YV12},
                                                   {QK_FORMAT_ARGB, QK_FORMAT_GREY}};
    for (auto [from, to] : pairs) {
        Frames frames(0, from, to);
        const std::vector<uint8_t> before = frames.planes;
        LogCapture log;
        EXPECT_EQ(csc_run(frames.src, frames.dst), QK_ERROR_UNSUPPORTED);
        EXPECT_TRUE(log.lines().empty());
        EXPECT_EQ(frames.planes, before);
    }
}

TEST(CscRun, RefusesMissingImagesBuffersAndRoom) {
    Frames frames;
    {
        LogCapture log;
        EXPECT_EQ(csc_run(nullptr, frames.dst), QK_ERROR_NULL_PARAM);
        EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_NULL_PARAM, kCscFile));
    }
    {
        LogCapture log;
        EXPECT_EQ(csc_run(frames.src, nullptr), QK_ERROR_NULL_PARAM);
        EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_NULL_PARAM, kCscFile));
    }
    {
        QKImage* empty = QKImage_createEmpty(kWidth, kHeight, QK_FORMAT_NV12);
        LogCapture log;
        EXPECT_EQ(csc_run(frames.src, empty), QK_ERROR_NULL_PARAM);
        EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_NULL_PARAM, kCscFile));
        QKImage_destroy(empty);
    }
    // Chroma at 256 needs 320 bytes; a source twice as tall needs 384.
    for (auto [size, height] : {std::pair<int32_t, int32_t>{319, kHeight}, {320, 2 * kHeight}, {320, 7}}) {
        frames.dst->size = size;
        frames.dst->chromaOffset = 256;
        frames.src->height = height;
        LogCapture log;
        EXPECT_EQ(csc_run(frames.src, frames.dst), QK_ERROR_INVALID_SIZE);
        EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_INVALID_SIZE, kCscFile));
    }
}

TEST(CscAbsent, TheKernelConvertsAndTheFailedLoadIsReported) {
    ASSERT_FALSE(Standin().loaded()) << "a libcsc.so is on the library path";
    Frames frames(256);
    {
        LogCapture log;
        EXPECT_EQ(csc_run(frames.src, frames.dst), QK_ERROR_UNSUPPORTED);
        EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_UNSUPPORTED, kCscFile));
    }
    LogCapture log;
    ASSERT_EQ(QKImage_convert(frames.src, frames.dst), QK_OK);
    EXPECT_EQ(frames.planes, frames.kernel_result());
    // One report of the failed load, no other error, no success line.
    EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_UNSUPPORTED, kCscFile));
    EXPECT_FALSE(log.contains(1, kOffloaded));
}

TEST(CscBare, ALibraryWithoutEntryPointsIsReportedAndSkipped) {
    Standin standin;
    ASSERT_TRUE(standin.loaded());
    Frames frames;
    LogCapture log;
    ASSERT_EQ(QKImage_convert(frames.src, frames.dst), QK_OK);
    EXPECT_EQ(frames.planes, frames.kernel_result());
    EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_UNSUPPORTED, kCscFile));
    EXPECT_EQ(standin.last_call().calls, 0);
}

// With a stand-in offering `entry`: csc_run hands it the destination's planes
// (chroma at its chroma base), the source pixels and the source's size, and
// the conversion entry then leaves the stand-in's bytes in place.
void expect_routine_used(const char* entry) {
    Standin standin;
    ASSERT_TRUE(standin.loaded());
    for (uint32_t chromaOffset : {0u, 256u}) {
        SCOPED_TRACE(chromaOffset);
        Frames frames(chromaOffset);
        const int callsBefore = standin.last_call().calls;
        LogCapture log;
        ASSERT_EQ(csc_run(frames.src, frames.dst), QK_OK);
        EXPECT_TRUE(HasNoErrors(log));
        const CscStandinCall& call = standin.last_call();
        EXPECT_EQ(call.calls, callsBefore + 1);
        EXPECT_STREQ(call.entry, entry);
        EXPECT_EQ(call.luma, frames.planes.data());
        EXPECT_EQ(call.chroma, frames.planes.data() + (chromaOffset != 0 ? chromaOffset : kWidth * kHeight));
        EXPECT_EQ(call.bgra, frames.pixels.data());
        EXPECT_EQ(call.width, kWidth);
        EXPECT_EQ(call.height, kHeight);

        std::fill(frames.planes.begin(), frames.planes.end(), 0x11);
        frames.dst->width = 4;  // the entry gives it the source's dimensions
        frames.dst->height = 4;
        log.clear();
        ASSERT_EQ(QKImage_convert(frames.src, frames.dst), QK_OK);
        EXPECT_TRUE(log.contains(1, kOffloaded));
        EXPECT_TRUE(HasNoErrors(log));
        EXPECT_EQ(standin.last_call().width, kWidth);
        const size_t chroma = chromaOffset != 0 ? chromaOffset : kWidth * kHeight;
        for (size_t i = 0; i < frames.planes.size(); ++i) {
            const uint8_t want = i < kWidth * kHeight ? kCscStandinLuma
                                 : (i >= chroma && i < chroma + kWidth * kHeight / 2) ? kCscStandinChroma
                                                                                        : 0x11;
            ASSERT_EQ(frames.planes[i], want) << "byte " << i;
        }
    }
}

TEST(CscPlain, UsesThePlainEntryPoint) { expect_routine_used("csc_ARGB8888_to_YUV420SP"); }

TEST(CscNeon, UsesTheNeonEntryPoint) { expect_routine_used("csc_ARGB8888_to_YUV420SP_NEON"); }

TEST(CscBoth, PrefersTheNeonEntryPoint) { expect_routine_used("csc_ARGB8888_to_YUV420SP_NEON"); }

TEST(CscBoth, DeclinedPairsLeaveTheLibraryUncalled) {
    Standin standin;
    ASSERT_TRUE(standin.loaded());
    Frames frames(0, QK_FORMAT_RGBA, QK_FORMAT_NV12);
    LogCapture log;
    ASSERT_EQ(QKImage_convert(frames.src, frames.dst), QK_OK);
    EXPECT_EQ(standin.last_call().calls, 0);
    EXPECT_EQ(frames.planes, frames.kernel_result());
    EXPECT_TRUE(HasNoErrors(log));
}

}  // namespace
