// Converters of the optional module libqkcore_csc.so, and csc_run with the
// platform's libcsc.so. CTest runs each suite with one stand-in, or none, on
// the library search path, each case in a process of its own: a module that
// cannot be used is written off for the rest of the process.
#include <dlfcn.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <tuple>
#include <vector>

#include "convert/kernels.h"
#include "csc/standin.h"
#include "platform/module.h"
#include "qkcore/qk_converter.h"
#include "support/images.h"
#include "support/log_capture.h"

namespace {

using namespace qktest;

bool loaded(const char* module) {
    void* handle = dlopen(module, RTLD_NOW | RTLD_NOLOAD);
    return handle != nullptr && dlclose(handle) == 0;
}

// The test's own reference keeps a stand-in, and its record, loaded while the
// library opens and closes its own.
struct Standin {
    qk::platform::Module module;
    const StandinRecord& record() const { return *static_cast<const StandinRecord*>(module.symbol("standin_record")); }
};

// Each handle forwards its own context and the images, and returns the
// module's status unchanged; nulls never reach the module; release releases
// the context. A refused pair fails only that converter.
TEST(Converter, ForwardsToTheModule) {
    Standin csc{qk::platform::Module::open("libqkcore_csc.so")};
    ASSERT_TRUE(csc.module) << "libqkcore_csc.so not found: run through ctest, which sets LD_LIBRARY_PATH";
    LogCapture log;
    QKConverter* small = QKConverter_create(64, 48, QK_FORMAT_NV21, QK_FORMAT_NV12);
    QKConverter* large = QKConverter_create(4000, 3000, QK_FORMAT_BGRA, QK_FORMAT_D16);
    EXPECT_EQ(QKConverter_create(8, 8, QK_FORMAT_NV21, QK_FORMAT_RGBA), nullptr);
    ASSERT_TRUE(small && large);
    EXPECT_TRUE(log.contains(1, "QKConverter: Calling qk_csc_init: 64x48 NV21 --> NV12"));
    EXPECT_EQ(log.texts(4), std::vector<std::string>{"QKConverter: Could not create this converter."});
    int32_t in[4] = {12345}, out[4] = {};
    Frame src({0, 0, 0, 0}), dst({0, 0, 0, 0}), none({0, 0, 0, 0});
    src.image.data = reinterpret_cast<uint8_t*>(in), dst.image.data = reinterpret_cast<uint8_t*>(out);
    EXPECT_EQ(QKConverter_convert(small, &src.image, &dst.image), 12345);
    EXPECT_EQ(std::vector<uint32_t>(out, out + 4), (std::vector<uint32_t>{64, 48, QK_FORMAT_NV21, QK_FORMAT_NV12}));
    in[0] = -6;
    EXPECT_EQ(QKConverter_convert(large, &src.image, &dst.image), -6);
    EXPECT_EQ(out[0], 4000);
    QKImage *s = &src.image, *d = &dst.image, *n = &none.image;
    for (auto [c, from, to] : {std::tuple{(QKConverter*)nullptr, s, d}, {small, nullptr, d}, {small, s, nullptr},
                               {small, n, d}, {small, s, n}}) {
        log.clear();
        EXPECT_EQ(QKConverter_convert(c, from, to), QK_ERROR_NULL_PARAM);
        EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_NULL_PARAM, "src/csc/converter.cpp"));
    }
    QKConverter_release(small), QKConverter_release(large), QKConverter_release(nullptr);
    EXPECT_EQ(std::make_pair(csc.record().calls, csc.record().releases), std::make_pair(2, 2));
}

// The first failure is reported; later calls give up at once, never loading it.
void expect_written_off(const char* failure) {
    for (int call = 0; call < 3; ++call) {
        LogCapture log;
        EXPECT_EQ(QKConverter_create(16, 16, QK_FORMAT_YUYV, QK_FORMAT_RGBA), nullptr);
        std::vector<LogLine> expected = {{1, "QKConverter_create: 16x16 YUYV --> RGBA"}};
        if (call == 0) expected.push_back({4, failure});
        EXPECT_EQ(log.lines(), expected);
        EXPECT_FALSE(loaded("libqkcore_csc.so"));
    }
}
TEST(ConverterWithoutModule, Fails) { expect_written_off("QKConverter: Could not open the dynamic library for CSC."); }
TEST(ConverterIncomplete, Fails) { expect_written_off("QKConverter: Could not find some symbols for CSC."); }

// A BGRA source and a 320-byte NV12 destination of 0x11 whose chroma is at
// `chroma` (0: after the luma).
struct Frames {
    explicit Frames(uint32_t chroma, uint32_t from = QK_FORMAT_BGRA)
        : src({from, 16, 8, 512}), dst({QK_FORMAT_NV12, 16, 8, 320, 320, chroma}) {
        std::fill(dst.buffer.begin(), dst.buffer.end(), 0x11);
    }
    Frame src, dst;
};

// Other pairs are declined silently; missing images, buffers and room are
// refused (chroma at 256 needs 320 bytes; a source twice as tall needs 384).
TEST(CscRun, DeclinesOtherPairsAndRefusesBadImages) {
    constexpr int32_t NUL = QK_ERROR_NULL_PARAM, SIZE = QK_ERROR_INVALID_SIZE;
    const struct { uint32_t from; bool src, dst, buffer; int32_t size, height, status; } cases[] = {
        {QK_FORMAT_RGBA, 1, 1, 1, 320, 8, QK_ERROR_UNSUPPORTED}, {QK_FORMAT_BGRA, 0, 1, 1, 320, 8, NUL},
        {QK_FORMAT_BGRA, 1, 0, 1, 320, 8, NUL}, {QK_FORMAT_BGRA, 1, 1, 0, 320, 8, NUL},
        {QK_FORMAT_BGRA, 1, 1, 1, 319, 8, SIZE}, {QK_FORMAT_BGRA, 1, 1, 1, 320, 16, SIZE},
        {QK_FORMAT_BGRA, 1, 1, 1, 320, 7, SIZE}};
    for (const auto& c : cases) {
        Frames frames(256, c.from);
        frames.dst.image.size = c.size, frames.src.image.height = c.height;
        if (!c.buffer) frames.dst.image.data = nullptr;
        LogCapture log;
        EXPECT_EQ(csc_run(c.src ? &frames.src.image : nullptr, c.dst ? &frames.dst.image : nullptr), c.status);
        EXPECT_TRUE(c.status == QK_ERROR_UNSUPPORTED ? log.lines().empty()
                                                     : HasOneFailureReport(log, c.status, "src/csc/csc_run.cpp"));
        EXPECT_EQ(frames.dst.buffer, std::vector<uint8_t>(320, 0x11));
    }
}

// Without the library, or with one that has no entry point: one report of
// the failure, and the kernel's result.
void expect_kernel_used() {
    Frames frames(256);
    std::vector<uint8_t> expected(320, 0x11);
    QKImage kernels(frames.dst.image);
    kernels.data = expected.data();
    qk::convert_rgb_to_yuv(frames.src.image, kernels);
    LogCapture log;
    ASSERT_EQ(QKImage_convert(&frames.src.image, &frames.dst.image), QK_OK);
    EXPECT_EQ(frames.dst.buffer, expected);
    EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_UNSUPPORTED, "src/csc/csc_run.cpp"));
    EXPECT_EQ(log.texts(1).size(), 1u);  // the entry line, no success line
}
TEST(CscAbsent, TheKernelConverts) { expect_kernel_used(); }
TEST(CscBare, TheKernelConverts) { expect_kernel_used(); }

// With a stand-in offering `entry`: the conversion entry gives the
// destination the source's dimensions, and csc_run hands the entry point the
// destination's planes (chroma at its chroma base), the source's pixels and
// size; the stand-in's bytes stay.
void expect_routine_used(const char* entry) {
    Standin csc{qk::platform::Module::open("libcsc.so")};
    ASSERT_TRUE(csc.module);
    for (uint32_t chroma : {0u, 256u}) {
        Frames frames(chroma);
        frames.dst.image.width = frames.dst.image.height = 4;
        uint8_t* const planes = frames.dst.buffer.data();
        LogCapture log;
        ASSERT_EQ(QKImage_convert(&frames.src.image, &frames.dst.image), QK_OK);
        EXPECT_TRUE(log.contains(1, "[QKImage] Conversion successful with external CSC module"));
        const StandinRecord& call = csc.record();
        EXPECT_EQ(std::make_tuple(std::string(call.entry), call.luma, call.chroma, call.bgra, call.width, call.height),
                  std::make_tuple(std::string(entry), planes, planes + (chroma ? chroma : 128),
                                  (const uint8_t*)frames.src.buffer.data(), 16, 8));
        std::vector<uint8_t> expected(320, 0x11);
        std::fill_n(expected.begin(), 128, 0xA5);
        std::fill_n(expected.begin() + (chroma ? chroma : 128), 64, 0x5A);
        EXPECT_EQ(frames.dst.buffer, expected);
    }
}
TEST(CscPlain, UsesThePlainEntryPoint) { expect_routine_used("csc_ARGB8888_to_YUV420SP"); }
TEST(CscNeon, UsesTheNeonEntryPoint) { expect_routine_used("csc_ARGB8888_to_YUV420SP_NEON"); }
TEST(CscBoth, PrefersTheNeonEntryPoint) { expect_routine_used("csc_ARGB8888_to_YUV420SP_NEON"); }

}  // namespace
