// The register of a process that has registered nothing yet: the first key
// and the exact dump lines. The only case of its own executable, so that no
// other case can register before it.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "qkcore/qk_options.h"
#include "support/log_capture.h"

namespace {

using Lines = std::vector<qktest::LogLine>;

const QKOptionEnum_t kFlash[] = {{0, "auto"}, {1, "on"}, {7, "off"}, {QK_OPTION_ENUM_END, nullptr}};
const QKOptionEnum_t kNoValues[] = {{QK_OPTION_ENUM_END, "unused"}};

QKOption_t iso = {0, "iso", QK_OPTION_INTEGER, 100, 3200, nullptr};
QKOption_t ev = {-5, "ev", QK_OPTION_FLOAT, -2.0f, 2.5f, nullptr};
QKOption_t flash = {0, "flash", QK_OPTION_ENUM, 0, 0, kFlash};
QKOption_t tag = {0, "tag", QK_OPTION_STRING, 0, 0, nullptr};
QKOption_t scene = {0, "scene", QK_OPTION_ENUM, 0, 0, nullptr};
QKOption_t effect = {0, "effect", QK_OPTION_ENUM, 0, 0, kNoValues};
QKOption_t odd = {0x7fffffff, "odd", 4, 0, 0, nullptr};

TEST(FreshOptionRegister, FirstKeysAndDumpLines) {
    qktest::LogCapture log;
    ASSERT_EQ(QKOption_RegisterNew(&iso), 1);
    EXPECT_EQ(iso.key, 0x13370001);
    EXPECT_EQ(log.lines(), (Lines{{1, "DEBUG: Registering option 'iso' as key 0x13370001"},
                                    {1, "OptionsRegister[00]: 'iso' 0x13370001 INTEGER 100 - 3200"}}));

    // A fixed negative key sorts before every counter key.
    log.clear();
    ASSERT_EQ(QKOption_RegisterNew(&ev), 1);
    EXPECT_EQ(ev.key, -5);
    EXPECT_EQ(log.lines(), (Lines{{1, "OptionsRegister[00]: 'ev' 0xfffffffb FLOAT -2.000000 - 2.500000"},
                                    {1, "OptionsRegister[01]: 'iso' 0x13370001 INTEGER 100 - 3200"}}));

    for (QKOption_t* option : {&flash, &tag, &scene, &effect, &odd}) ASSERT_EQ(QKOption_RegisterNew(option), 1);
    EXPECT_EQ(flash.key, 0x13370002);
    EXPECT_EQ(effect.key, 0x13370005);

    // The dump after the last registration lists every option in key order.
    log.clear();
    static QKOption_t last = {0, "last", QK_OPTION_STRING, 0, 0, nullptr};
    ASSERT_EQ(QKOption_RegisterNew(&last), 1);
    EXPECT_EQ(log.lines(), (Lines{
                                 {1, "DEBUG: Registering option 'last' as key 0x13370006"},
                                 {1, "OptionsRegister[00]: 'ev' 0xfffffffb FLOAT -2.000000 - 2.500000"},
                                 {1, "OptionsRegister[01]: 'iso' 0x13370001 INTEGER 100 - 3200"},
                                 {1, "OptionsRegister[02]: 'flash' 0x13370002 ENUM [0] auto"},
                                 {1, "OptionsRegister[02]: 'flash' 0x13370002 ENUM [1] on"},
                                 {1, "OptionsRegister[02]: 'flash' 0x13370002 ENUM [7] off"},
                                 {1, "OptionsRegister[03]: 'tag' 0x13370003 STRING"},
                                 {4, "OptionsRegister[04]: 'scene' 0x13370004 ENUM <NO VALUES>"},
                                 {4, "OptionsRegister[05]: 'effect' 0x13370005 ENUM <NO VALUES>"},
                                 {1, "OptionsRegister[06]: 'last' 0x13370006 STRING"},
                                 {4, "OptionsRegister[07]: 'odd' 0x7fffffff INVALID TYPE (4)"},
                             }));
}

}  // namespace
