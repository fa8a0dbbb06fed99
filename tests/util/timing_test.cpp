#include <gtest/gtest.h>

#include "platform/clock.h"
#include "qkcore/qk_log.h"
#include "support/log_capture.h"

namespace {

// Timing probes driven by a clock the test sets.
class TimeStatTest : public ::testing::Test {
protected:
    static int64_t fake_clock() { return now_ns; }
    void SetUp() override {
        now_ns = 1'000'000'000'123;  // an arbitrary start, not a multiple of 1000
        qk::platform::set_clock_for_testing(fake_clock);
    }
    void TearDown() override { qk::platform::set_clock_for_testing(nullptr); }
    static void advance_us(int64_t micros) { now_ns += micros * 1000; }

    static int64_t now_ns;
    qktest::LogCapture log;
};
int64_t TimeStatTest::now_ns = 0;

TEST_F(TimeStatTest, ExitMessageSwitchesToWholeMillisecondsAbove5ms) {
    const struct {
        int64_t elapsed_us;
        const char* exit;
    } cases[] = {{750, "Exit (0.750ms)"}, {5000, "Exit (5.000ms)"}, {5001, "Exit (5ms)"}, {12999, "Exit (12ms)"}};
    for (const auto& c : cases) {
        log.clear();
        {
            TimeStat probe("cam", "encode", 77, false);
            advance_us(c.elapsed_us);
        }
        EXPECT_EQ(log.lines(), (std::vector<qktest::LogLine>{{1, std::string("[cam] encode(77): ") + c.exit}}));
    }
}

TEST_F(TimeStatTest, EntryMessagesOnlyWhenEnabled) {
    {
        TimeStat probe("cam", "decode", 12, true);
        TimeStat plain("scale", true);
        EXPECT_EQ(log.texts(1), (std::vector<std::string>{"[cam] decode:12: Entry", "[velcamera] scale: Entry"}));
        log.clear();
    }
    // Exit messages in destruction order; the tagless probe shows the log tag.
    EXPECT_EQ(log.texts(1), (std::vector<std::string>{"[velcamera] scale(-1): Exit (0.000ms)",
                                                      "[cam] decode(12): Exit (0.000ms)"}));
}

TEST_F(TimeStatTest, NullNameSilencesTheExit) {
    { TimeStat probe(nullptr, false); }
    EXPECT_TRUE(log.lines().empty());
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
    EXPECT_EQ(log.texts(1), (std::vector<std::string>{"[frame] after isp: 3ms", "[frame] after jpeg: 7ms"}));
}

// The real clock: boot time in nanoseconds, never going back.
TEST(BootClock, IsMonotonic) {
    int64_t first = qk::platform::elapsed_realtime_nano();
    int64_t second = qk::platform::elapsed_realtime_nano();
    EXPECT_GT(first, 0);
    EXPECT_GE(second, first);
}

}  // namespace
