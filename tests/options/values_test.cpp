#include <gtest/gtest.h>
#include <limits.h>
#include <math.h>

#include <string>

#include "qkcore/qk_options.h"

namespace {

const QKOptionEnum_t kModes[] = {{0, "auto"}, {1, "on"}, {2, "off"}, {QK_OPTION_ENUM_END, "never read"}};

// Both bounds 0 take every value (-0 counting as 0); otherwise min <= value
// <= max, compared as signed integers or floats, and NaN fails.
TEST(OptionValues, Ranges) {
    constexpr uint32_t I = QK_OPTION_INTEGER, F = QK_OPTION_FLOAT;
    const struct {
        uint32_t type;
        QKOptionBound_t min, max;
        double value;
        int32_t passes;
    } cases[] = {
        {I, 0, 0, -5, 1},   {I, 0, 0, INT32_MIN, 1}, {I, 1, 10, 1, 1},     {I, 1, 10, 10, 1},   {I, 1, 10, 0, 0},
        {I, 1, 10, 11, 0},  {I, 10, 1, 5, 0},        {I, -10, -1, -10, 1}, {I, -10, -1, 0, 0},  {I, 0, 5, -1, 0},
        {F, -2.0f, 2.0f, 2, 1},   {F, -2.0f, 2.0f, -2, 1},  {F, -2.0f, 2.0f, 2.5, 0}, {F, -2.0f, 2.0f, NAN, 0},
        {F, 0.0f, 0.0f, NAN, 1},  {F, -0.0f, 0.0f, 7, 1},   {F, 0.5f, 0.25f, 0.3, 0},
    };
    for (const auto& c : cases) {
        const QKOption_t o = {0, "o", c.type, c.min, c.max, nullptr};
        EXPECT_EQ(c.type == I ? QKOption_CheckValueI(&o, int32_t(c.value)) : QKOption_CheckValueF(&o, float(c.value)),
                  c.passes)
            << "case " << &c - cases;
    }
}

TEST(OptionValues, Enumerations) {
    QKOption_t modes = {0, "mode", QK_OPTION_ENUM, 0, 0, kModes};
    for (const char* value : {"auto", "on", "off"}) EXPECT_EQ(QKOption_CheckValueS(&modes, value), 1) << value;
    for (const char* value : {"ON", "of", "", "never read", static_cast<const char*>(nullptr)}) {
        EXPECT_EQ(QKOption_CheckValueS(&modes, value), 0) << (value ? value : "(null)");
    }
    // Lists that hold no usable name take nothing.
    const QKOptionEnum_t empty[] = {{QK_OPTION_ENUM_END, "auto"}};
    const QKOptionEnum_t unnamed[] = {{0, nullptr}, {QK_OPTION_ENUM_END, nullptr}};
    for (const QKOptionEnum_t* list : {empty, unnamed, static_cast<const QKOptionEnum_t*>(nullptr)}) {
        QKOption_t option = {0, "mode", QK_OPTION_ENUM, 0, 0, list};
        EXPECT_EQ(QKOption_CheckValueS(&option, "auto"), 0);
    }
}

// Each check passes only records of its own type (strings take anything).
TEST(OptionValues, ChecksOfTheWrongTypeOrNoRecordFail) {
    QKOption_t integer = {0, "i", QK_OPTION_INTEGER, 0, 0, nullptr}, real = {0, "f", QK_OPTION_FLOAT, 0, 0, nullptr};
    QKOption_t choice = {0, "e", QK_OPTION_ENUM, 0, 0, kModes}, text = {0, "s", QK_OPTION_STRING, 0, 0, nullptr};
    QKOption_t invalid = {0, "x", 9, 0, 0, kModes};
    for (const QKOption_t* option : {&integer, &real, &choice, &text, &invalid, static_cast<QKOption_t*>(nullptr)}) {
        EXPECT_EQ(QKOption_CheckValueI(option, 0), option == &integer ? 1 : 0);
        EXPECT_EQ(QKOption_CheckValueF(option, 0.0f), option == &real ? 1 : 0);
        EXPECT_EQ(QKOption_CheckValueS(option, "on"), option == &choice || option == &text ? 1 : 0);
    }
}

TEST(OptionStrings, ReadsTheNamedItemOrGivesTheDefault) {
    constexpr int32_t kNoInt = 42;
    constexpr float kNoFloat = 7.25f;
    struct Case {
        const char* options;
        const char* name;
        int32_t integer;
        float real;
    } cases[] = {
        {"iso=100,ev=-1.5", "iso", 100, 100.0f},
        {"iso=100,ev=-1.5", "ev", -1, -1.5f},  // the integer stops at the point
        {"iso=100,ev=-1.5", "wb", kNoInt, kNoFloat},
        {"iso=,ev=2", "iso", kNoInt, kNoFloat},  // empty value
        {"iso = 100", "iso", kNoInt, kNoFloat},  // spaces around "="
        {"exp=1, iso=5", "iso", kNoInt, kNoFloat},  // space after the comma
        {"xiso=5,iso=100", "iso", 100, 100.0f},  // inside a longer name: search on
        {"a=iso=3", "iso", kNoInt, kNoFloat},  // inside a value
        {"iso=1,iso=2", "iso", 1, 1.0f},  // the first item wins
        {"ISO=5", "iso", kNoInt, kNoFloat},  // letter case counts
        {"iso=100,", "iso", 100, 100.0f},  // trailing comma
        {"iso", "iso", kNoInt, kNoFloat},  // no "="
        {"iso=auto", "iso", kNoInt, kNoFloat},
        {"iso=-2147483648", "iso", INT32_MIN, -2147483648.0f},
        {"iso=2147483648", "iso", kNoInt, 2147483648.0f},  // out of the 32-bit range
        // Unusable arguments; names cannot hold the separators.
        {nullptr, "iso", kNoInt, kNoFloat}, {"iso=1", nullptr, kNoInt, kNoFloat}, {"=1", "", kNoInt, kNoFloat},
        {"a=b=3", "a=b", kNoInt, kNoFloat}, {"x=1,a,b=2", "a,b", kNoInt, kNoFloat},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(std::string(c.options ? c.options : "(null)") + " " + (c.name ? c.name : "(null)"));
        EXPECT_EQ(QKOption_ParseStringI(c.options, c.name, kNoInt), c.integer);
        EXPECT_EQ(QKOption_ParseStringF(c.options, c.name, kNoFloat), c.real);
    }
}

TEST(OptionStrings, LongStringsAreOnlyRead) {
    std::string options;
    for (int i = 0; i < 20000; ++i) options += "xiso=1,iso_" + std::to_string(i) + "=2,";
    options += "iso=321";
    const std::string original = options;
    EXPECT_EQ(QKOption_ParseStringI(options.c_str(), "iso", 0), 321);
    EXPECT_EQ(QKOption_ParseStringF(options.c_str(), "wb", -1.0f), -1.0f);
    EXPECT_EQ(options, original);
}

}  // namespace
