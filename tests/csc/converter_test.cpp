// Converters against the stand-in module (found through LD_LIBRARY_PATH).
// No case here makes the module unavailable, so their order does not matter.
#include <gtest/gtest.h>

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
using Strings = std::vector<std::string>;

struct Release {
    void operator()(QKConverter* converter) const { QKConverter_release(converter); }
};
using ConverterPtr = std::unique_ptr<QKConverter, Release>;

// The test's own reference to the stand-in keeps it, and its call counters,
// loaded while the library opens and closes its own.
struct StandIn {
    Module module = Module::open("libqkcore_csc.so");
    int counter(const char* name) const { return module.function<converter_stub::CounterFn>(name)(); }
};
constexpr const char* kNotFound = "libqkcore_csc.so not found: run through ctest, which sets LD_LIBRARY_PATH";

// A small image: the stand-in returns the status at its start as a source,
// and writes its converter's parameters there as a destination.
struct Frame {
    explicit Frame(int32_t status = 0) : words{status} {
        image.data = reinterpret_cast<uint8_t*>(words);
        image.isWrapped = 1;
    }
    std::vector<int32_t> params() const { return {words, words + 4}; }
    int32_t words[4] = {};
    QKImage image;
};

TEST(Converter, CreatesConvertsAndReleases) {
    StandIn stand_in;
    ASSERT_TRUE(stand_in.module) << kNotFound;
    const int releases = stand_in.counter("qk_csc_stub_releases");

    LogCapture log;
    ConverterPtr small(QKConverter_create(64, 48, QK_FORMAT_NV21, QK_FORMAT_NV12));
    ASSERT_TRUE(small);
    EXPECT_EQ(log.texts(1), (Strings{"QKConverter_create: 64x48 NV21 --> NV12",
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
    EXPECT_EQ(stand_in.counter("qk_csc_stub_releases"), releases + 2);
    EXPECT_TRUE(qktest::HasNoErrors(log));
}

TEST(Converter, RefusedPairFailsOnlyThatConverter) {
    ASSERT_TRUE(Module::open("libqkcore_csc.so")) << kNotFound;
    {
        LogCapture log;
        EXPECT_EQ(QKConverter_create(8, 8, converter_stub::kRefusedSrc, converter_stub::kRefusedDst), nullptr);
        EXPECT_EQ(log.texts(1), (Strings{"QKConverter_create: 8x8 NV21 --> RGBA",
                                         "QKConverter: Calling qk_csc_init: 8x8 NV21 --> RGBA"}));
        EXPECT_EQ(log.texts(4), Strings{"QKConverter: Could not create this converter."});
    }
    EXPECT_FALSE(converter_stub::module_loaded()) << "the module stayed open after a refused converter";

    // The module is not written off: another pair opens it again.
    ConverterPtr other(QKConverter_create(8, 8, QK_FORMAT_NV12, QK_FORMAT_RGBA));
    EXPECT_TRUE(other);
    other.reset();
    EXPECT_FALSE(converter_stub::module_loaded()) << "release left the module open";
}

TEST(Converter, ConvertRefusesNullsWithoutCallingTheModule) {
    StandIn stand_in;
    ASSERT_TRUE(stand_in.module) << kNotFound;
    ConverterPtr converter(QKConverter_create(4, 2, QK_FORMAT_RGBA, QK_FORMAT_RGBA));
    ASSERT_TRUE(converter);
    const int converts = stand_in.counter("qk_csc_stub_converts");
    Frame src(7), dst;
    QKImage none;  // no buffer
    QKConverter* c = converter.get();
    for (auto [conv, from, to] : {std::tuple<QKConverter*, const QKImage*, QKImage*>{nullptr, &src.image, &dst.image},
                                  {c, nullptr, &dst.image}, {c, &src.image, nullptr}, {c, &none, &dst.image},
                                  {c, &src.image, &none}}) {
        LogCapture log;
        EXPECT_EQ(QKConverter_convert(conv, from, to), QK_ERROR_NULL_PARAM);
        EXPECT_TRUE(qktest::HasOneFailureReport(log, QK_ERROR_NULL_PARAM, "src/csc/converter.cpp"));
    }
    EXPECT_EQ(stand_in.counter("qk_csc_stub_converts"), converts);
    EXPECT_EQ(dst.params(), std::vector<int32_t>(4, 0));
}

}  // namespace
