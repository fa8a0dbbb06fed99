#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "platform/clock.h"
#include "qkcore/qk_log.h"
#include "support/log_capture.h"

namespace {

using Lines = std::vector<std::string>;

// Timing probes driven by a clock the test sets, starting at an arbitrary
// time that is not a multiple of 1000.
int64_t now_ns;
void advance_us(int64_t micros) { now_ns += micros * 1000; }

class TimeStatTest : public ::testing::Test {
protected:
    void SetUp() override {
        now_ns = 1'000'000'000'123;
        qk::platform::set_clock_for_testing([] { return now_ns; });
    }
    void TearDown() override { qk::platform::set_clock_for_testing(nullptr); }
    qktest::LogCapture log;
};

TEST_F(TimeStatTest, ExitMessageSwitchesToWholeMillisecondsAbove5ms) {
    for (auto [elapsed_us, exit] : {std::pair<int64_t, const char*>{750, "Exit (0.750ms)"}, {5000, "Exit (5.000ms)"},
                                    {5001, "Exit (5ms)"}, {12999, "Exit (12ms)"}}) {
        log.clear();
        {
            TimeStat probe("cam", "encode", 77, false);
            advance_us(elapsed_us);
        }
        EXPECT_EQ(log.lines(), (std::vector<qktest::LogLine>{{1, std::string("[cam] encode(77): ") + exit}}));
    }
}

TEST_F(TimeStatTest, EntryMessagesOnlyWhenEnabledAndNoExitWithoutName) {
    {
        TimeStat probe("cam", "decode", 12, true), plain("scale", true);
        TimeStat quiet("quiet", false), nameless(nullptr, false);
        EXPECT_EQ(log.texts(1), (Lines{"[cam] decode:12: Entry", "[velcamera] scale: Entry"}));
        log.clear();
    }
    // Exit messages in destruction order; the tagless probes show the log tag.
    EXPECT_EQ(log.texts(1), (Lines{"[velcamera] quiet(-1): Exit (0.000ms)", "[velcamera] scale(-1): Exit (0.000ms)",
                                   "[cam] decode(12): Exit (0.000ms)"}));
}

TEST_F(TimeStatTest, StampsAndReadingsCountFromConstruction) {
    TimeStat probe("frame", false);
    EXPECT_EQ(probe.last, 0);
    advance_us(800);
    EXPECT_EQ(probe(), 800);
    advance_us(2200);
    probe.TimeStamp("after isp");
    advance_us(4000);
    probe.TimeStamp("after jpeg");
    EXPECT_EQ(probe(), 7000);
    EXPECT_EQ(log.texts(1), (Lines{"[frame] after isp: 3ms", "[frame] after jpeg: 7ms"}));
}

// The real clock: boot time in nanoseconds, never going back.
TEST(BootClock, IsMonotonic) {
    const int64_t first = qk::platform::elapsed_realtime_nano();
    EXPECT_GT(first, 0);
    EXPECT_GE(qk::platform::elapsed_realtime_nano(), first);
}

}  // namespace
