// The options register as every client sees it. The register lives as long
// as the process, so each case uses names and keys of its own, no case
// assumes what other cases registered before it, and registered records are
// static, as the register keeps their addresses.
#include <gtest/gtest.h>

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

}  // namespace
