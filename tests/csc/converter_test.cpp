// Converters against the stand-in module (found through LD_LIBRARY_PATH).
// No case here makes the module unavailable, so their order does not matter.
#include <gtest/gtest.h>
#include <string.h>

#include <memory>
#include <string>
#include <vector>

#include "csc/converter_stub.h"
#include "platform/module.h"
#include "qkcore/qk_converter.h"
#include "support/log_capture.h"

namespace {

using qk::platform::Module;
using qktest::LogCapture;

struct Release {
    void operator()(QKConverter* converter) const { QKConverter_release(converter); }
};
using ConverterPtr = std::unique_ptr<QKConverter, Release>;

constexpr const char* kNotFound = "libqkcore_csc.so not found: run through ctest, which sets LD_LIBRARY_PATH";

// Reads one of the stand-in's call counters. The test's own reference to the
// module keeps it, and its counters, loaded while the library closes its own.
int counter(const Module& stand_in, const char* name) {
    return stand_in.function<converter_stub::CounterFn>(name)();
}

// A small image whose buffer starts with the status the stand-in returns.
struct Frame {
    explicit Frame(int32_t status = 0) {
        memcpy(bytes, &status, sizeof(status));
        image.data = bytes;
        image.isWrapped = 1;
    }
    std::vector<int32_t> params() const {
        std::vector<int32_t> values(4);
        memcpy(values.data(), bytes, converter_stub::kParamsBytes);
        return values;
    }
    uint8_t bytes[converter_stub::kParamsBytes] = {};
    QKImage image;
};

TEST(Converter, CreatesConvertsAndReleases) {
    Module stand_in = Module::open("libqkcore_csc.so");
    ASSERT_TRUE(stand_in) << kNotFound;
    const int releases = counter(stand_in, "qk_csc_stub_releases");

    LogCapture log;
    ConverterPtr small(QKConverter_create(64, 48, QK_FORMAT_NV21, QK_FORMAT_NV12));
    ASSERT_TRUE(small);
    EXPECT_EQ(log.texts(1), (std::vector<std::string>{"QKConverter_create: 64x48 NV21 --> NV12",
                                                      "QKConverter: Calling qk_csc_init: 64x48 NV21 --> NV12"}));
    EXPECT_EQ(log.lines().size(), 2u);

    // Each handle forwards its own context and the images in their places; the
    // status comes back unchanged, positive values included.
    ConverterPtr large(QKConverter_create(4000, 3000, QK_FORMAT_BGRA, QK_FORMAT_D16));
    ASSERT_TRUE(large);
    for (int32_t status : {0, 1, 12345, -6}) {
        Frame src(status), dst;
        EXPECT_EQ(QKConverter_convert(small.get(), &src.image, &dst.image), status);
        EXPECT_EQ(dst.params(), (std::vector<int32_t>{64, 48, int32_t(QK_FORMAT_NV21), int32_t(QK_FORMAT_NV12)}));
        EXPECT_EQ(QKConverter_convert(large.get(), &src.image, &dst.image), status);
        EXPECT_EQ(dst.params(), (std::vector<int32_t>{4000, 3000, int32_t(QK_FORMAT_BGRA), int32_t(QK_FORMAT_D16)}));
    }

    small.reset();
    large.reset();
    QKConverter_release(nullptr);
    EXPECT_EQ(counter(stand_in, "qk_csc_stub_releases"), releases + 2);
    EXPECT_TRUE(qktest::HasNoErrors(log));
}

TEST(Converter, RefusedPairFailsOnlyThatConverter) {
    ASSERT_TRUE(Module::open("libqkcore_csc.so")) << kNotFound;
    {
        LogCapture log;
        EXPECT_EQ(QKConverter_create(8, 8, converter_stub::kRefusedSrc, converter_stub::kRefusedDst), nullptr);
        EXPECT_EQ(log.texts(1), (std::vector<std::string>{"QKConverter_create: 8x8 NV21 --> RGBA",
                                                          "QKConverter: Calling qk_csc_init: 8x8 NV21 --> RGBA"}));
        EXPECT_EQ(log.texts(4), std::vector<std::string>{"QKConverter: Could not create this converter."});
    }
    EXPECT_FALSE(converter_stub::module_loaded()) << "the module stayed open after a refused converter";

    // The module is not written off: another pair opens it again.
    ConverterPtr other(QKConverter_create(8, 8, QK_FORMAT_NV12, QK_FORMAT_RGBA));
    EXPECT_TRUE(other);
    other.reset();
    EXPECT_FALSE(converter_stub::module_loaded()) << "release left the module open";
}

TEST(Converter, ConvertRefusesNullsWithoutCallingTheModule) {
    Module stand_in = Module::open("libqkcore_csc.so");
    ASSERT_TRUE(stand_in) << kNotFound;
    ConverterPtr converter(QKConverter_create(4, 2, QK_FORMAT_RGBA, QK_FORMAT_RGBA));
    ASSERT_TRUE(converter);
    const int converts = counter(stand_in, "qk_csc_stub_converts");

    Frame src(7), dst;
    QKImage no_buffer;
    struct Case {
        QKConverter* converter;
        const QKImage* src;
        QKImage* dst;
    } cases[] = {
        {nullptr, &src.image, &dst.image},          {converter.get(), nullptr, &dst.image},
        {converter.get(), &src.image, nullptr},     {converter.get(), &no_buffer, &dst.image},
        {converter.get(), &src.image, &no_buffer},
    };
    for (const Case& c : cases) {
        LogCapture log;
        EXPECT_EQ(QKConverter_convert(c.converter, c.src, c.dst), QK_ERROR_NULL_PARAM);
        EXPECT_TRUE(qktest::HasOneFailureReport(log, QK_ERROR_NULL_PARAM, "src/csc/converter.cpp"));
    }
    EXPECT_EQ(counter(stand_in, "qk_csc_stub_converts"), converts);
    EXPECT_EQ(dst.params(), std::vector<int32_t>(4, 0));
}

}  // namespace
