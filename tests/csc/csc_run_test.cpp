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

using qktest::HasNoErrors;
using qktest::HasOneFailureReport;
using qktest::LogCapture;

constexpr const char* kCscFile = "src/csc/csc_run.cpp";
constexpr int32_t kWidth = 16, kHeight = 8;

// A random BGRA source and an NV12 destination of 320 bytes over test-owned
// buffers; the destination's chroma sits at `chromaOffset` (0: after the luma).
struct Frames {
    explicit Frames(uint32_t chromaOffset = 0, uint32_t from = QK_FORMAT_BGRA, uint32_t to = QK_FORMAT_NV12)
        : pixels(kWidth * kHeight * 4), planes(320, 0x11) {
        std::mt19937 random(5);
        for (uint8_t& byte : pixels) byte = static_cast<uint8_t>(random());
        src.reset(QKImage_createWrap(pixels.data(), kWidth, kHeight, from, 0, 0));
        dst.reset(QKImage_createWrap(planes.data(), kWidth, kHeight, to, 320, chromaOffset));
    }
    // What the library's own kernel makes of the source.
    std::vector<uint8_t> kernel_result() const {
        std::vector<uint8_t> bytes(planes.size(), 0x11);
        QKImage image(*dst);
        image.data = bytes.data();
        qk::convert_rgb_to_yuv(*src, image);
        return bytes;
    }
    std::vector<uint8_t> pixels, planes;
    std::unique_ptr<QKImage> src, dst;
};

// The stand-in's record of its latest call; the test's own reference keeps
// the stand-in loaded across csc_run's load and unload.
struct Standin {
    qk::platform::Module module = qk::platform::Module::open("libcsc.so");
    const CscStandinCall& last_call() const {
        return *static_cast<const CscStandinCall*>(module.symbol(kCscStandinRecord));
    }
};

// Declined at once: no library load, which would report its failure here.
TEST(CscRun, DeclinesEveryOtherPairSilently) {
    for (auto [from, to] : {std::pair{QK_FORMAT_RGBA, QK_FORMAT_NV12}, {QK_FORMAT_BGRA, QK_FORMAT_NV21},
                            {QK_FORMAT_BGRA, QK_FORMAT_YV12}, {QK_FORMAT_ARGB, QK_FORMAT_GREY}}) {
        Frames frames(0, from, to);
        LogCapture log;
        EXPECT_EQ(csc_run(frames.src.get(), frames.dst.get()), QK_ERROR_UNSUPPORTED);
        EXPECT_TRUE(log.lines().empty());
        EXPECT_EQ(frames.planes, std::vector<uint8_t>(320, 0x11));
    }
}

TEST(CscRun, RefusesMissingImagesBuffersAndRoom) {
    constexpr int32_t NUL = QK_ERROR_NULL_PARAM, SIZE = QK_ERROR_INVALID_SIZE;
    // Chroma at 256 needs 320 bytes; a source twice as tall needs 384.
    const struct {
        bool src, dst, dst_buffer;
        int32_t size, height, status;
    } cases[] = {
        {false, true, true, 320, kHeight, NUL},  {true, false, true, 320, kHeight, NUL},
        {true, true, false, 320, kHeight, NUL},  {true, true, true, 319, kHeight, SIZE},
        {true, true, true, 320, 2 * kHeight, SIZE}, {true, true, true, 320, 7, SIZE},
    };
    for (const auto& c : cases) {
        Frames frames(256);
        frames.dst->size = c.size;
        frames.src->height = c.height;
        if (!c.dst_buffer) frames.dst->data = nullptr;
        LogCapture log;
        EXPECT_EQ(csc_run(c.src ? frames.src.get() : nullptr, c.dst ? frames.dst.get() : nullptr), c.status);
        EXPECT_TRUE(HasOneFailureReport(log, c.status, kCscFile));
    }
}

// Without the library, and with one that has no entry point: one report of
// the failure, and the kernel's result.
void expect_kernel_used() {
    Frames frames(256);
    LogCapture log;
    ASSERT_EQ(QKImage_convert(frames.src.get(), frames.dst.get()), QK_OK);
    EXPECT_EQ(frames.planes, frames.kernel_result());
    EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_UNSUPPORTED, kCscFile));
    EXPECT_EQ(log.texts(1).size(), 1u);  // the entry line, no success line
}

TEST(CscAbsent, TheKernelConvertsAndTheFailedLoadIsReported) {
    ASSERT_FALSE(Standin().module) << "a libcsc.so is on the library path";
    expect_kernel_used();
}

TEST(CscBare, ALibraryWithoutEntryPointsIsReportedAndSkipped) {
    Standin standin;
    ASSERT_TRUE(standin.module);
    expect_kernel_used();
    EXPECT_EQ(standin.last_call().calls, 0);
}

// With a stand-in offering `entry`: csc_run hands it the destination's planes
// (chroma at its chroma base), the source pixels and the source's size, and
// the conversion entry then leaves the stand-in's bytes in place.
void expect_routine_used(const char* entry) {
    Standin standin;
    ASSERT_TRUE(standin.module);
    for (uint32_t chromaOffset : {0u, 256u}) {
        SCOPED_TRACE(chromaOffset);
        const size_t chroma = chromaOffset != 0 ? chromaOffset : kWidth * kHeight;
        Frames frames(chromaOffset);
        const int callsBefore = standin.last_call().calls;
        LogCapture log;
        ASSERT_EQ(csc_run(frames.src.get(), frames.dst.get()), QK_OK);
        const CscStandinCall& call = standin.last_call();
        EXPECT_EQ(call.calls, callsBefore + 1);
        EXPECT_STREQ(call.entry, entry);
        EXPECT_EQ(call.luma, frames.planes.data());
        EXPECT_EQ(call.chroma, frames.planes.data() + chroma);
        EXPECT_EQ(call.bgra, frames.pixels.data());
        EXPECT_EQ(std::make_pair(call.width, call.height), std::make_pair(kWidth, kHeight));

        std::fill(frames.planes.begin(), frames.planes.end(), 0x11);
        frames.dst->width = 4;  // the entry gives it the source's dimensions
        frames.dst->height = 4;
        ASSERT_EQ(QKImage_convert(frames.src.get(), frames.dst.get()), QK_OK);
        EXPECT_TRUE(log.contains(1, "[QKImage] Conversion successful with external CSC module"));
        EXPECT_TRUE(HasNoErrors(log));
        EXPECT_EQ(standin.last_call().width, kWidth);
        std::vector<uint8_t> expected(320, 0x11);
        std::fill_n(expected.begin(), kWidth * kHeight, kCscStandinLuma);
        std::fill_n(expected.begin() + chroma, kWidth * kHeight / 2, kCscStandinChroma);
        EXPECT_EQ(frames.planes, expected);
    }
}

TEST(CscPlain, UsesThePlainEntryPoint) { expect_routine_used("csc_ARGB8888_to_YUV420SP"); }

TEST(CscNeon, UsesTheNeonEntryPoint) { expect_routine_used("csc_ARGB8888_to_YUV420SP_NEON"); }

TEST(CscBoth, PrefersTheNeonEntryPoint) { expect_routine_used("csc_ARGB8888_to_YUV420SP_NEON"); }

}  // namespace
