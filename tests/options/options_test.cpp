// The options register as every client sees it, value checks and option
// string readers. The register lives as long as the process, so each case
// uses names and keys of its own and registered records are static, as the
// register keeps their addresses.
#include <gtest/gtest.h>
#include <math.h>

#include <string>
#include <vector>

#include "options/registry.h"
#include "qkcore/qk_options.h"
#include "support/log_capture.h"

namespace {

using Lines = std::vector<qktest::LogLine>;

const QKOptionEnum_t kFlash[] = {{0, "auto"}, {1, "on"}, {7, "off"}, {QK_OPTION_ENUM_END, nullptr}};
const QKOptionEnum_t kNoValues[] = {{QK_OPTION_ENUM_END, "unused"}};
QKOption_t iso = {0, "iso", QK_OPTION_INTEGER, 100, 3200, nullptr}, ev = {-5, "ev", QK_OPTION_FLOAT, -2.f, 2.5f, 0};
QKOption_t iso_again = {0, "iso", QK_OPTION_INTEGER, 5, 6, nullptr}, clash = {-5, "clash", QK_OPTION_STRING, 0, 0, 0};
QKOption_t nameless = {0, nullptr, QK_OPTION_INTEGER, 0, 0, 0}, flash = {0, "flash", QK_OPTION_ENUM, 0, 0, kFlash};
QKOption_t tag = {0, "tag", QK_OPTION_STRING, 0, 0, nullptr}, scene = {0, "scene", QK_OPTION_ENUM, 0, 0, nullptr};
QKOption_t effect = {0, "effect", QK_OPTION_ENUM, 0, 0, kNoValues}, odd = {0x7fffffff, "odd", 4, 0, 0, nullptr};
QKOption_t last = {0, "last", QK_OPTION_STRING, 0, 0, nullptr};

// First, so that it meets a register nobody has used even when the whole
// executable runs in one process (ctest runs each case in one of its own).
// Each registration in turn: its result, the record's key after it, and its
// messages (not compared where empty). A fixed negative key sorts first; a
// duplicate shares the earlier key; refusals draw no key and dump nothing.
TEST(OptionRegister, FreshKeysAndMessages) {
    const struct { QKOption_t* option; int result; int32_t key; Lines log; } steps[] = {
        {&iso, 1, 0x13370001, {{1, "DEBUG: Registering option 'iso' as key 0x13370001"},
                               {1, "OptionsRegister[00]: 'iso' 0x13370001 INTEGER 100 - 3200"}}},
        {&ev, 1, -5, {{1, "OptionsRegister[00]: 'ev' 0xfffffffb FLOAT -2.000000 - 2.500000"},
                      {1, "OptionsRegister[01]: 'iso' 0x13370001 INTEGER 100 - 3200"}}},
        {&iso_again, 1, 0x13370001, {{1, "DEBUG: Duplicate option found: 'iso' with type 0. Key = 322371585"}}},
        {&clash, 0, -5, {{4, "ERROR: Trying to register new option with an already existing key! [key = 0xfffffffb]"}}},
        {&nameless, 0, 0, {{4, "ERROR: Trying to register an option without a name! [key = 0x00000000]"}}},
        {&flash, 1, 0x13370002, {}}, {&tag, 1, 0x13370003, {}}, {&scene, 1, 0x13370004, {}},
        {&effect, 1, 0x13370005, {}}, {&odd, 1, 0x7fffffff, {}},
        {&last, 1, 0x13370006, {{1, "DEBUG: Registering option 'last' as key 0x13370006"},
                                {1, "OptionsRegister[00]: 'ev' 0xfffffffb FLOAT -2.000000 - 2.500000"},
                                {1, "OptionsRegister[01]: 'iso' 0x13370001 INTEGER 100 - 3200"},
                                {1, "OptionsRegister[02]: 'flash' 0x13370002 ENUM [0] auto"},
                                {1, "OptionsRegister[02]: 'flash' 0x13370002 ENUM [1] on"},
                                {1, "OptionsRegister[02]: 'flash' 0x13370002 ENUM [7] off"},
                                {1, "OptionsRegister[03]: 'tag' 0x13370003 STRING"},
                                {4, "OptionsRegister[04]: 'scene' 0x13370004 ENUM <NO VALUES>"},
                                {4, "OptionsRegister[05]: 'effect' 0x13370005 ENUM <NO VALUES>"},
                                {1, "OptionsRegister[06]: 'last' 0x13370006 STRING"},
                                {4, "OptionsRegister[07]: 'odd' 0x7fffffff INVALID TYPE (4)"}}}};
    for (const auto& s : steps) {
        SCOPED_TRACE(s.option->name ? s.option->name : "(no name)");
        qktest::LogCapture log;
        EXPECT_EQ(QKOption_RegisterNew(s.option), s.result);
        EXPECT_EQ(s.option->key, s.key);
        if (!s.log.empty()) {
            EXPECT_EQ(log.lines(), s.log);
        }
    }
    EXPECT_EQ(QKOption_FindById(-5), &ev);
    EXPECT_EQ(QKOption_FindByName("iso"), &iso);
}

// Keys count up; another type gets a key and record of its own, lookups by
// name finding the smaller key; a fixed key skips the name check; a drawn key
// already present is refused (a duplicate and a fixed key present are the
// first case's). Lookups that find nothing, and a null record, say nothing.
TEST(OptionRegister, KeysDuplicatesAndLookups) {
    static QKOption_t first = {0, "reg.sharp", QK_OPTION_INTEGER, 0, 10, nullptr},
                      second = {0, "reg.contrast", QK_OPTION_INTEGER, 0, 10, nullptr},
                      as_float = {0, "reg.sharp", QK_OPTION_FLOAT, 0.0f, 1.0f, nullptr},
                      fixed = {0x51000010, "reg.fixed", QK_OPTION_STRING, 0, 0, nullptr},
                      twin = {0x51000012, "reg.fixed", QK_OPTION_STRING, 0, 0, nullptr};
    ASSERT_EQ(QKOption_RegisterNew(&first) + QKOption_RegisterNew(&second) + QKOption_RegisterNew(&fixed), 3);
    EXPECT_EQ(QKOption_RegisterNew(&as_float) + QKOption_RegisterNew(&twin), 2);
    EXPECT_EQ(std::make_pair(second.key, as_float.key), std::make_pair(first.key + 1, first.key + 2));
    const int32_t next = qk::options::draw_key() + 1;
    static QKOption_t taken = {next, "reg.taken", QK_OPTION_STRING, 0, 0, nullptr}, unlucky = {};
    unlucky.name = "reg.unlucky";
    EXPECT_EQ(QKOption_RegisterNew(&taken) * 10 + QKOption_RegisterNew(&unlucky), 10);
    EXPECT_EQ(unlucky.key, next);
    const struct { int32_t key; const QKOption_t* record; } by_key[] = {
        {first.key, &first}, {as_float.key, &as_float}, {0x51000010, &fixed}, {0x51000012, &twin}, {next, &taken},
        {0x0badf00d, nullptr}};
    for (const auto& k : by_key) EXPECT_EQ(QKOption_FindById(k.key), k.record) << std::hex << k.key;
    EXPECT_EQ(QKOption_FindByName("reg.sharp"), &first);
    EXPECT_EQ(QKOption_FindByName("reg.fixed"), &fixed);
    EXPECT_EQ(QKOption_FindIdByName("reg.sharp"), first.key);
    EXPECT_STREQ(QKOption_FindNameById(second.key), "reg.contrast");
    qktest::LogCapture log;
    EXPECT_EQ(QKOption_RegisterNew(nullptr), 0);
    EXPECT_EQ(QKOption_FindByName("reg.SHARP"), nullptr);  // letter case counts
    EXPECT_EQ(QKOption_FindIdByName("reg.unknown") + QKOption_FindIdByName(nullptr), 0);
    EXPECT_EQ(QKOption_FindNameById(0x0badf00d), nullptr);
    EXPECT_TRUE(log.lines().empty());
}

// Integers and floats: both bounds 0 take every value (-0 counting as 0),
// otherwise min <= value <= max, and NaN fails. Enumerations: a name of the
// list before its end; none without list, or from entries without names.
TEST(OptionValues, EachCheckOnItsOwnType) {
    constexpr uint32_t I = QK_OPTION_INTEGER, F = QK_OPTION_FLOAT;
    const struct { uint32_t type; QKOptionBound_t min, max; double value; int32_t passes; } ranges[] = {
        {I, 0, 0, -5, 1},   {I, 0, 0, INT32_MIN, 1}, {I, 1, 10, 1, 1},     {I, 1, 10, 10, 1},   {I, 1, 10, 0, 0},
        {I, 1, 10, 11, 0},  {I, 10, 1, 5, 0},        {I, -10, -1, -10, 1}, {I, -10, -1, 0, 0},  {I, 0, 5, -1, 0},
        {F, -2.0f, 2.0f, 2, 1},   {F, -2.0f, 2.0f, -2, 1},  {F, -2.0f, 2.0f, 2.5, 0}, {F, -2.0f, 2.0f, NAN, 0},
        {F, 0.0f, 0.0f, NAN, 1},  {F, -0.0f, 0.0f, 7, 1},   {F, 0.5f, 0.25f, 0.3, 0}};
    for (const auto& c : ranges) {
        const QKOption_t o = {0, "o", c.type, c.min, c.max, nullptr};
        EXPECT_EQ(c.type == I ? QKOption_CheckValueI(&o, int32_t(c.value)) : QKOption_CheckValueF(&o, float(c.value)),
                  c.passes)
            << "case " << &c - ranges;
    }
    const QKOptionEnum_t modes[] = {{0, "auto"}, {1, "on"}, {2, "off"}, {QK_OPTION_ENUM_END, "never read"}};
    const QKOptionEnum_t empty[] = {{QK_OPTION_ENUM_END, "auto"}};
    const QKOptionEnum_t unnamed[] = {{0, nullptr}, {QK_OPTION_ENUM_END, nullptr}};
    QKOption_t choice = {0, "e", QK_OPTION_ENUM, 0, 0, modes};
    for (const char* value : {"auto", "on", "off"}) EXPECT_EQ(QKOption_CheckValueS(&choice, value), 1) << value;
    for (const char* value : {"ON", "of", "", "never read", static_cast<const char*>(nullptr)}) {
        EXPECT_EQ(QKOption_CheckValueS(&choice, value), 0) << (value ? value : "(null)");
    }
    // Which type each check takes, null records included, the fuzz target
    // holds on every record it makes; these lists are what it never makes.
    for (const QKOptionEnum_t* list : {static_cast<const QKOptionEnum_t*>(nullptr), empty, unnamed}) {
        const QKOption_t option = {0, "e", QK_OPTION_ENUM, 0, 0, list};
        EXPECT_EQ(QKOption_CheckValueS(&option, "auto"), 0);
    }
}

// Where an item is found, and values the fuzz target's corpus does not read
// (it holds the readers to sscanf: empty and unreadable values, the top of
// the 32-bit range, strtof's prefixes that "%f" refuses).
TEST(OptionStrings, ReadsTheNamedItemOrGivesTheDefault) {
    constexpr int32_t kNoInt = 42;
    constexpr float kNoFloat = 7.25f;
    const struct { const char *options, *name; int32_t integer; float real; } cases[] = {
        {"iso=100,ev=-1.5", "iso", 100, 100.0f},
        {"iso=100,ev=-1.5", "ev", -1, -1.5f},  // the integer stops at the point
        {"iso=100,ev=-1.5", "wb", kNoInt, kNoFloat},
        {"iso = 100", "iso", kNoInt, kNoFloat},  // spaces around "="
        {"exp=1, iso=5", "iso", kNoInt, kNoFloat},  // space after the comma
        {"xiso=5,iso=100", "iso", 100, 100.0f},  // inside a longer name: search on
        {"a=iso=3", "iso", kNoInt, kNoFloat},  // inside a value
        {"iso=1,iso=2", "iso", 1, 1.0f},  // the first item wins
        {"ISO=5", "iso", kNoInt, kNoFloat},  // letter case counts
        {"iso=100,", "iso", 100, 100.0f},  // trailing comma
        {"iso", "iso", kNoInt, kNoFloat},  // no "="
        {"ev=0x1p1", "ev", 0, 2.0f}, {"ev=-infinity", "ev", kNoInt, -INFINITY},
        {"iso=-2147483648", "iso", INT32_MIN, -2147483648.0f},
        // Unusable arguments; names cannot hold the separators.
        {nullptr, "iso", kNoInt, kNoFloat}, {"iso=1", nullptr, kNoInt, kNoFloat}, {"=1", "", kNoInt, kNoFloat},
        {"a=b=3", "a=b", kNoInt, kNoFloat}, {"x=1,a,b=2", "a,b", kNoInt, kNoFloat}};
    for (const auto& c : cases) {
        SCOPED_TRACE(std::string(c.options ? c.options : "(null)") + " " + (c.name ? c.name : "(null)"));
        EXPECT_EQ(QKOption_ParseStringI(c.options, c.name, kNoInt), c.integer);
        EXPECT_EQ(QKOption_ParseStringF(c.options, c.name, kNoFloat), c.real);
    }
    // A long string is searched to its end and left as it was.
    std::string options;
    for (int i = 0; i < 20000; ++i) options += "xiso=1,iso_" + std::to_string(i) + "=2,";
    options += "iso=321";
    const std::string original = options;
    EXPECT_EQ(QKOption_ParseStringI(options.c_str(), "iso", 0), 321);
    EXPECT_EQ(QKOption_ParseStringF(options.c_str(), "wb", -1.0f), -1.0f);
    EXPECT_EQ(options, original);
}

}  // namespace
