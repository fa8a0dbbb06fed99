// A module that cannot be used is written off for the rest of the process,
// so each variant runs in an executable of its own: without any module
// (CONVERTER_MODULE_INCOMPLETE undefined) or with one lacking an entry point.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "csc/converter_stub.h"
#include "qkcore/qk_converter.h"
#include "support/log_capture.h"

namespace {

// Distinct suite names keep the two executables' CTest names apart.
#if defined(CONVERTER_MODULE_INCOMPLETE)
#define UNAVAILABLE_SUITE ConverterIncompleteModule
constexpr const char* kFailure = "QKConverter: Could not find some symbols for CSC.";
#else
#define UNAVAILABLE_SUITE ConverterWithoutModule
constexpr const char* kFailure = "QKConverter: Could not open the dynamic library for CSC.";
#endif

TEST(UNAVAILABLE_SUITE, FirstFailureIsStickyAndLaterCallsGiveUpAtOnce) {
    const std::string entry = "QKConverter_create: 16x16 YUYV --> RGBA";
    {
        qktest::LogCapture log;
        EXPECT_EQ(QKConverter_create(16, 16, QK_FORMAT_YUYV, QK_FORMAT_RGBA), nullptr);
        EXPECT_EQ(log.lines(), (std::vector<qktest::LogLine>{{1, entry}, {4, kFailure}}));
    }
    EXPECT_FALSE(converter_stub::module_loaded());
    for (int call = 0; call < 2; ++call) {
        qktest::LogCapture log;
        EXPECT_EQ(QKConverter_create(16, 16, QK_FORMAT_YUYV, QK_FORMAT_RGBA), nullptr);
        EXPECT_EQ(log.lines(), (std::vector<qktest::LogLine>{{1, entry}}));
        EXPECT_FALSE(converter_stub::module_loaded());
    }
}

}  // namespace
