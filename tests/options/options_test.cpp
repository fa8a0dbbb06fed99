// The options register as every client sees it, value checks and option
// string readers. The register lives as long as the process, so each case
// uses names and keys of its own, no case assumes what other cases registered
// before it, and registered records are static, as the register keeps their
// addresses.
#include <gtest/gtest.h>
#include <limits.h>
#include <math.h>

#include <string>
#include <vector>

#include "options/registry.h"
#include "qkcore/qk_options.h"
#include "support/log_capture.h"

namespace {


using qktest::LogCapture;

TEST(OptionRegister, AssignsKeysAndSharesThemWithDuplicates) {
    static QKOption_t first = {0, "reg.sharpness", QK_OPTION_INTEGER, 0, 10, nullptr};
    static QKOption_t second = {0, "reg.contrast", QK_OPTION_INTEGER, 0, 10, nullptr};
    ASSERT_EQ(QKOption_RegisterNew(&first), 1);
    ASSERT_EQ(QKOption_RegisterNew(&second), 1);
    EXPECT_NE(first.key, 0);
    EXPECT_EQ(second.key, first.key + 1);

    // Same name and type: the earlier record's key, and nothing is added.
    static QKOption_t again = {0, "reg.sharpness", QK_OPTION_INTEGER, 5, 6, nullptr};
    const size_t registered = qk::options::option_register().size();
    {
        LogCapture log;
        EXPECT_EQ(QKOption_RegisterNew(&again), 1);
        EXPECT_EQ(again.key, first.key);
        EXPECT_EQ(log.lines(), (std::vector<qktest::LogLine>{  // no dump
                                   {1, "DEBUG: Duplicate option found: 'reg.sharpness' with type 0. Key = " +
                                           std::to_string(first.key)}}));
    }
    EXPECT_EQ(qk::options::option_register().size(), registered);
    EXPECT_EQ(QKOption_FindById(first.key), &first);

    // Same name, another type: a new key and a record of its own. Lookups by
    // name find the one with the smaller key.
    static QKOption_t as_float = {0, "reg.sharpness", QK_OPTION_FLOAT, 0.0f, 1.0f, nullptr};
    EXPECT_EQ(QKOption_RegisterNew(&as_float), 1);
    EXPECT_EQ(as_float.key, second.key + 1);
    EXPECT_EQ(QKOption_FindById(as_float.key), &as_float);
    EXPECT_EQ(QKOption_FindByName("reg.sharpness"), &first);
    EXPECT_EQ(QKOption_FindIdByName("reg.sharpness"), first.key);
    EXPECT_STREQ(QKOption_FindNameById(second.key), "reg.contrast");
}

TEST(OptionRegister, RefusesKeysAlreadyPresent) {
    static QKOption_t fixed = {0x51000010, "reg.fixed", QK_OPTION_STRING, 0, 0, nullptr};
    static QKOption_t clash = {0x51000010, "reg.clash", QK_OPTION_STRING, 0, 0, nullptr};
    ASSERT_EQ(QKOption_RegisterNew(&fixed), 1);
    {
        LogCapture log;
        EXPECT_EQ(QKOption_RegisterNew(&clash), 0);
        EXPECT_EQ(log.lines(), (std::vector<qktest::LogLine>{  // no dump
                                   {4, "ERROR: Trying to register new option with an already existing key! "
                                       "[key = 0x51000010]"}}));
    }
    EXPECT_EQ(clash.key, 0x51000010);
    EXPECT_EQ(QKOption_FindById(0x51000010), &fixed);
    EXPECT_EQ(QKOption_FindByName("reg.clash"), nullptr);

    // With a key of its own it goes in; a fixed key skips the name check, so
    // a second record of the same name and type is added as well.
    clash.key = 0x51000011;
    EXPECT_EQ(QKOption_RegisterNew(&clash), 1);
    static QKOption_t twin = {0x51000012, "reg.fixed", QK_OPTION_STRING, 0, 0, nullptr};
    EXPECT_EQ(QKOption_RegisterNew(&twin), 1);
    EXPECT_EQ(QKOption_FindById(0x51000012), &twin);
    EXPECT_EQ(QKOption_FindByName("reg.fixed"), &fixed);

    // A new key that a caller has already fixed is refused like any other,
    // and the record keeps the key it was given.
    const int32_t next = qk::options::draw_key() + 1;
    static QKOption_t taken = {next, "reg.taken", QK_OPTION_STRING, 0, 0, nullptr};
    static QKOption_t unlucky = {0, "reg.unlucky", QK_OPTION_STRING, 0, 0, nullptr};
    ASSERT_EQ(QKOption_RegisterNew(&taken), 1);
    EXPECT_EQ(QKOption_RegisterNew(&unlucky), 0);
    EXPECT_EQ(unlucky.key, next);
    EXPECT_EQ(QKOption_FindById(next), &taken);
}

TEST(OptionRegister, BadRecordsAndUnknownLookups) {
    const size_t registered = qk::options::option_register().size();
    LogCapture log;
    EXPECT_EQ(QKOption_RegisterNew(nullptr), 0);
    EXPECT_TRUE(log.lines().empty());
    static QKOption_t nameless = {0, nullptr, QK_OPTION_INTEGER, 0, 0, nullptr};
    EXPECT_EQ(QKOption_RegisterNew(&nameless), 0);
    EXPECT_EQ(nameless.key, 0);  // no key was drawn
    EXPECT_EQ(log.texts(4).size(), 1u);
    EXPECT_EQ(log.lines().size(), 1u);
    EXPECT_EQ(qk::options::option_register().size(), registered);

    // Lookups that find nothing say nothing.
    log.clear();
    EXPECT_EQ(QKOption_FindByName("reg.SHARPNESS"), nullptr);  // letter case counts
    EXPECT_EQ(QKOption_FindIdByName("reg.unknown"), 0);
    EXPECT_EQ(QKOption_FindIdByName(nullptr), 0);
    EXPECT_EQ(QKOption_FindById(0x0badf00d), nullptr);
    EXPECT_EQ(QKOption_FindNameById(0x0badf00d), nullptr);
    EXPECT_TRUE(log.lines().empty());
}


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
        {"ev=0x", "ev", 0, kNoFloat}, {"ev=infin", "ev", kNoInt, kNoFloat},  // "%f" fails where strtof reads a prefix
        {"ev=0x1p1", "ev", 0, 2.0f}, {"ev=-infinity", "ev", kNoInt, -INFINITY},
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
