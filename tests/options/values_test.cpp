#include <gtest/gtest.h>
#include <limits.h>
#include <math.h>
#include <string.h>

#include <string>

#include "qkcore/qk_options.h"

namespace {

QKOption_t integer_option(int32_t min, int32_t max) { return {0, "i", QK_OPTION_INTEGER, min, max, nullptr}; }
QKOption_t float_option(float min, float max) { return {0, "f", QK_OPTION_FLOAT, min, max, nullptr}; }

const QKOptionEnum_t kModes[] = {{0, "auto"}, {1, "on"}, {2, "off"}, {QK_OPTION_ENUM_END, "never read"}};

TEST(OptionValues, IntegerRanges) {
    struct Case {
        int32_t min, max, value, passes;
    } cases[] = {
        {0, 0, -5, 1}, {0, 0, 0, 1}, {0, 0, 1000000, 1}, {0, 0, INT32_MIN, 1},  // no range
        {1, 10, 1, 1}, {1, 10, 10, 1}, {1, 10, 0, 0}, {1, 10, 11, 0},           // ends included
        {10, 1, 5, 0}, {10, 1, 10, 0}, {10, 1, 1, 0},                           // empty range
        {-10, -1, -10, 1}, {-10, -1, 0, 0},                                     // signed comparison
        {INT32_MIN, INT32_MAX, INT32_MAX, 1}, {0, 5, -1, 0},
    };
    for (const Case& c : cases) {
        QKOption_t option = integer_option(c.min, c.max);
        EXPECT_EQ(QKOption_CheckValueI(&option, c.value), c.passes) << c.min << ".." << c.max << " " << c.value;
    }
}

TEST(OptionValues, FloatRanges) {
    struct Case {
        float min, max, value;
        int32_t passes;
    } cases[] = {
        {-2.0f, 2.0f, 2.0f, 1}, {-2.0f, 2.0f, -2.0f, 1}, {-2.0f, 2.0f, 2.5f, 0}, {-2.0f, 2.0f, NAN, 0},
        {-2.0f, 2.0f, INFINITY, 0}, {0.0f, 0.0f, 1e30f, 1}, {0.0f, 0.0f, NAN, 1},  // no range: even NaN
        {-0.0f, 0.0f, 7.0f, 1},                                                   // -0 is 0
        {0.0f, 1.0f, -0.0f, 1}, {0.5f, 0.25f, 0.3f, 0},
    };
    for (const Case& c : cases) {
        QKOption_t option = float_option(c.min, c.max);
        EXPECT_EQ(QKOption_CheckValueF(&option, c.value), c.passes) << c.min << ".." << c.max << " " << c.value;
    }
}

TEST(OptionValues, ChecksOfTheWrongTypeOrNoRecordFail) {
    QKOption_t integer = integer_option(0, 0);
    QKOption_t real = float_option(0.0f, 0.0f);
    QKOption_t string = {0, "s", QK_OPTION_STRING, 0, 0, nullptr};
    QKOption_t choice = {0, "e", QK_OPTION_ENUM, 0, 0, kModes};
    QKOption_t invalid = {0, "x", 9, 0, 0, kModes};
    for (const QKOption_t* option : {&real, &string, &choice, &invalid}) {
        EXPECT_EQ(QKOption_CheckValueI(option, 0), 0) << option->name;
    }
    for (const QKOption_t* option : {&integer, &string, &choice, &invalid}) {
        EXPECT_EQ(QKOption_CheckValueF(option, 0.0f), 0) << option->name;
    }
    for (const QKOption_t* option : {&integer, &real, &invalid}) {
        EXPECT_EQ(QKOption_CheckValueS(option, "on"), 0) << option->name;
    }
    EXPECT_EQ(QKOption_CheckValueI(nullptr, 0), 0);
    EXPECT_EQ(QKOption_CheckValueF(nullptr, 0.0f), 0);
    EXPECT_EQ(QKOption_CheckValueS(nullptr, "on"), 0);
}

TEST(OptionValues, StringsAndEnumerations) {
    QKOption_t string = {0, "s", QK_OPTION_STRING, 0, 0, nullptr};
    EXPECT_EQ(QKOption_CheckValueS(&string, "anything at all"), 1);
    EXPECT_EQ(QKOption_CheckValueS(&string, ""), 1);

    QKOption_t modes = {0, "mode", QK_OPTION_ENUM, 0, 0, kModes};
    struct Case {
        const char* value;
        int32_t passes;
    } cases[] = {{"auto", 1}, {"on", 1}, {"off", 1}, {"ON", 0}, {"of", 0}, {"", 0},
                 {"never read", 0},  // the terminator's name is not a value
                 {nullptr, 0}};
    for (const Case& c : cases) {
        EXPECT_EQ(QKOption_CheckValueS(&modes, c.value), c.passes) << (c.value ? c.value : "(null)");
    }

    // Lists that hold no usable name take nothing.
    const QKOptionEnum_t empty[] = {{QK_OPTION_ENUM_END, "auto"}};
    const QKOptionEnum_t unnamed[] = {{0, nullptr}, {QK_OPTION_ENUM_END, nullptr}};
    for (const QKOptionEnum_t* list : {empty, unnamed, static_cast<const QKOptionEnum_t*>(nullptr)}) {
        QKOption_t option = {0, "mode", QK_OPTION_ENUM, 0, 0, list};
        EXPECT_EQ(QKOption_CheckValueS(&option, "auto"), 0);
    }
}

TEST(OptionStrings, ReadsTheNamedItem) {
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
        {"iso=,ev=2", "ev", 2, 2.0f},
        {"iso = 100", "iso", kNoInt, kNoFloat},  // spaces around "="
        {"exp=1, iso=5", "iso", kNoInt, kNoFloat},  // space after the comma
        {"iso= 5", "iso", 5, 5.0f},  // leading blanks of the value are skipped, as "%d" does
        {"xiso=5,iso=100", "iso", 100, 100.0f},  // inside a longer name: search on
        {"a=iso=3", "iso", kNoInt, kNoFloat},  // inside a value
        {"iso=1,iso=2", "iso", 1, 1.0f},  // the first item wins
        {"ISO=5", "iso", kNoInt, kNoFloat},  // letter case counts
        {"iso=100,", "iso", 100, 100.0f},  // trailing comma
        {",,iso=7", "iso", 7, 7.0f},
        {"iso", "iso", kNoInt, kNoFloat},  // no "="
        {"iso=auto", "iso", kNoInt, kNoFloat},
        {"iso=+8,", "iso", 8, 8.0f},
        {"iso=-2147483648", "iso", INT32_MIN, -2147483648.0f},
        {"iso=2147483648", "iso", kNoInt, 2147483648.0f},  // out of the 32-bit range
        {"iso=99999999999999999999999", "iso", kNoInt, 1e23f},
        {"ev=1e-3x", "ev", 1, 0.001f},
        {"", "iso", kNoInt, kNoFloat},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(std::string("\"") + c.options + "\" " + c.name);
        EXPECT_EQ(QKOption_ParseStringI(c.options, c.name, kNoInt), c.integer);
        EXPECT_EQ(QKOption_ParseStringF(c.options, c.name, kNoFloat), c.real);
    }
    EXPECT_TRUE(isnan(QKOption_ParseStringF("ev=nan", "ev", 0.0f)));
}

TEST(OptionStrings, UnusableArgumentsGiveTheDefault) {
    struct Case {
        const char* options;
        const char* name;
    } cases[] = {
        {nullptr, "iso"}, {"iso=1", nullptr}, {"=1", ""},
        {"a=b=3", "a=b"},    // names cannot hold the separators
        {"x=1,a,b=2", "a,b"},
    };
    for (const Case& c : cases) {
        EXPECT_EQ(QKOption_ParseStringI(c.options, c.name, -9), -9);
        EXPECT_EQ(QKOption_ParseStringF(c.options, c.name, -9.0f), -9.0f);
    }
}

TEST(OptionStrings, LongStringsAreOnlyRead) {
    std::string options;
    for (int i = 0; i < 20000; ++i) options += "xiso=1,iso_" + std::to_string(i) + "=2,";
    options += "iso=321";
    const std::string original = options;
    EXPECT_EQ(QKOption_ParseStringI(options.c_str(), "iso", 0), 321);
    EXPECT_EQ(QKOption_ParseStringF(options.c_str(), "iso", 0.0f), 321.0f);
    EXPECT_EQ(QKOption_ParseStringI(options.c_str(), "wb", -1), -1);
    EXPECT_EQ(options, original);

    // A value running to the end of a long string, without a closing comma.
    std::string digits = "ev=" + std::string(100000, '0') + "5";
    EXPECT_EQ(QKOption_ParseStringI(digits.c_str(), "ev", -1), 5);
}

}  // namespace
