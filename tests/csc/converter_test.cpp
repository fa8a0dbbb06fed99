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

using qktest::HasNoErrors;
using qktest::HasOneFailureReport;
using qktest::LogCapture;

struct Release {
    void operator()(QKConverter* converter) const { QKConverter_release(converter); }
};
using ConverterPtr = std::unique_ptr<QKConverter, Release>;

// The test's own reference to the stand-in keeps it loaded, so its counters
// survive the library closing its references.
class StandIn {
public:
    StandIn() : module_(qk::platform::Module::open("libqkcore_csc.so")) {}
    bool loaded() const { return static_cast<bool>(module_); }
    int converts() const { return counter("qk_csc_stub_converts"); }
    int releases() const { return counter("qk_csc_stub_releases"); }

private:
    int counter(const char* name) const { return module_.function<converter_stub::CounterFn>(name)(); }
    qk::platform::Module module_;
};

// A small image whose buffer starts with the status the stand-in returns.
struct Frame {
    explicit Frame(int32_t status = 0) {
        memset(bytes, 0, sizeof(bytes));
        memcpy(bytes, &status, sizeof(status));
        image.data = bytes;
        image.width = 4;
        image.height = 2;
        image.format = QK_FORMAT_RGBA;
        image.isWrapped = 1;
        image.size = sizeof(bytes);
    }
    std::vector<int32_t> params() const {
        std::vector<int32_t> values(4);
        memcpy(values.data(), bytes, converter_stub::kParamsBytes);
        return values;
    }
    uint8_t bytes[32];
    QKImage image;
};

constexpr const char* kSource = "src/csc/converter.cpp";
constexpr const char* kNotFound = "libqkcore_csc.so not found: run through ctest, which sets LD_LIBRARY_PATH";

TEST(Converter, CreatesConvertsAndReleases) {
    StandIn stand_in;
    ASSERT_TRUE(stand_in.loaded()) << kNotFound;
    const int releases = stand_in.releases();

    LogCapture log;
    ConverterPtr small(QKConverter_create(64, 48, QK_FORMAT_NV21, QK_FORMAT_NV12));
    ASSERT_TRUE(small);
    const std::vector<std::string> expected = {"QKConverter_create: 64x48 NV21 --> NV12",
                                               "QKConverter: Calling qk_csc_init: 64x48 NV21 --> NV12"};
    EXPECT_EQ(log.texts(1), expected);
    EXPECT_EQ(log.lines().size(), 2u);

    // Each handle forwards its own context; the status comes back unchanged,
    // positive values included.
    ConverterPtr large(QKConverter_create(4000, 3000, QK_FORMAT_BGRA, QK_FORMAT_D16));
    ASSERT_TRUE(large);
    for (int32_t status : {0, 1, 12345, -6, -1000}) {
        SCOPED_TRACE(status);
        Frame src(status);
        Frame dst;
        EXPECT_EQ(QKConverter_convert(small.get(), &src.image, &dst.image), status);
        EXPECT_EQ(dst.params(), (std::vector<int32_t>{64, 48, int32_t(QK_FORMAT_NV21), int32_t(QK_FORMAT_NV12)}));
        EXPECT_EQ(QKConverter_convert(large.get(), &src.image, &dst.image), status);
        EXPECT_EQ(dst.params(), (std::vector<int32_t>{4000, 3000, int32_t(QK_FORMAT_BGRA), int32_t(QK_FORMAT_D16)}));
    }

    small.reset();
    EXPECT_EQ(stand_in.releases(), releases + 1);
    large.reset();
    EXPECT_EQ(stand_in.releases(), releases + 2);
    QKConverter_release(nullptr);
    EXPECT_EQ(stand_in.releases(), releases + 2);
    EXPECT_TRUE(HasNoErrors(log));
}

TEST(Converter, RefusedPairFailsOnlyThatConverter) {
    ASSERT_TRUE(StandIn().loaded()) << kNotFound;
    ASSERT_FALSE(converter_stub::module_loaded());
    {
        LogCapture log;
        EXPECT_EQ(QKConverter_create(8, 8, converter_stub::kRefusedSrc, converter_stub::kRefusedDst), nullptr);
        const std::vector<std::string> debug = {"QKConverter_create: 8x8 NV21 --> RGBA",
                                                "QKConverter: Calling qk_csc_init: 8x8 NV21 --> RGBA"};
        EXPECT_EQ(log.texts(1), debug);
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
    StandIn stand_in;
    ASSERT_TRUE(stand_in.loaded()) << kNotFound;
    ConverterPtr converter(QKConverter_create(4, 2, QK_FORMAT_RGBA, QK_FORMAT_RGBA));
    ASSERT_TRUE(converter);
    const int converts = stand_in.converts();

    Frame src(7);
    Frame dst;
    QKImage no_buffer;
    struct Case {
        const char* what;
        QKConverter* converter;
        const QKImage* src;
        QKImage* dst;
    } cases[] = {
        {"null converter", nullptr, &src.image, &dst.image},
        {"null source", converter.get(), nullptr, &dst.image},
        {"null destination", converter.get(), &src.image, nullptr},
        {"source without buffer", converter.get(), &no_buffer, &dst.image},
        {"destination without buffer", converter.get(), &src.image, &no_buffer},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.what);
        LogCapture log;
        EXPECT_EQ(QKConverter_convert(c.converter, c.src, c.dst), QK_ERROR_NULL_PARAM);
        EXPECT_TRUE(HasOneFailureReport(log, QK_ERROR_NULL_PARAM, kSource));
    }
    EXPECT_EQ(stand_in.converts(), converts);
    EXPECT_EQ(dst.params(), std::vector<int32_t>(4, 0));
}

}  // namespace
