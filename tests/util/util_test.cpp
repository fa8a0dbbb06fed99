// The log functions, timing probes on a clock the test sets, and sort and swap.
#include <gtest/gtest.h>
#include <string.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <algorithm>
#include <optional>
#include <string>
#include <vector>

#include "platform/clock.h"
#include "platform/system_log.h"
#include "qkcore/qk_log.h"
#include "qkcore/qk_utils.h"
#include "support/log_capture.h"

namespace {

using Lines = std::vector<std::string>;

// Both write "<tag> <text>\n" to standard output, the newline added even after
// one the format has; AndroidLogMsg, the hook's initial value, also sends the
// text to the system log (here a socket of the test's), its Android priority
// 3 (debug) to 6 (error) as a syslog user-facility priority:
// "<priority>Mon dd hh:mm:ss velcamera[pid]: text".
TEST(Log, LevelTagsOnStandardOutputPrioritiesInTheSystemLog) {
    EXPECT_EQ(HX_LogMsg, &AndroidLogMsg);
    char dir[] = "/tmp/qk_syslog_XXXXXX";
    const std::string path = std::string(mkdtemp(dir)) + "/log";
    sockaddr_un address{AF_UNIX, {}};
    strcpy(address.sun_path, path.c_str());
    const int fd = socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    ASSERT_EQ(bind(fd, reinterpret_cast<sockaddr*>(&address), sizeof(address)), 0);
    qk::platform::set_system_log_socket_for_testing(path.c_str());
    const struct { int level; const char* tag; int priority; } cases[] = {
        {0, "[V]", 15}, {1, "[D]", 15}, {2, "[I]", 14}, {3, "[W]", 12}, {4, "[E]", 11}, {7, "[V]", 15},
        {-1, "[V]", 15}};
    for (const auto& c : cases) {
        for (auto log : {DefaultLogMsg, AndroidLogMsg}) {
            testing::internal::CaptureStdout();
            const int result = log(c.level, "frame %dx%d\n", 640, 480);
            EXPECT_EQ(testing::internal::GetCapturedStdout(), std::string(c.tag) + " frame 640x480\n\n");
            char buffer[256];
            const std::string line(buffer, std::max<ssize_t>(0, recv(fd, buffer, sizeof(buffer), MSG_DONTWAIT)));
            if (log == DefaultLogMsg) {
                EXPECT_EQ(line, "") << "DefaultLogMsg wrote to the system log";
                continue;
            }
            const std::string priority = "<" + std::to_string(c.priority) + ">";
            EXPECT_EQ(result, int(line.size()));
            EXPECT_EQ(line.substr(0, priority.size()), priority);
            EXPECT_EQ(line.substr(std::min(line.size(), priority.size() + 15)),
                      " velcamera[" + std::to_string(getpid()) + "]: frame 640x480\n");
        }
    }
    qk::platform::set_system_log_socket_for_testing(nullptr);
    close(fd), unlink(path.c_str()), rmdir(dir);
}

int64_t now_ns = 1'000'000'000'123;  // not a multiple of 1000

// A probe says "Entry" when enabled, and "Exit" with its life unless
// nameless, in whole milliseconds above 5 ms; tagless probes show the log's
// tag and line -1. Stamps and readings count from construction.
TEST(TimeStat, Messages) {
    qk::platform::set_clock_for_testing([] { return now_ns; });
    qktest::LogCapture log;
    const struct { const char *tag, *name; bool entry; int64_t life_us; Lines messages; } cases[] = {
        {"cam", "encode", false, 750, {"[cam] encode(77): Exit (0.750ms)"}},
        {"cam", "encode", false, 5000, {"[cam] encode(77): Exit (5.000ms)"}},
        {"cam", "encode", false, 5001, {"[cam] encode(77): Exit (5ms)"}},
        {"cam", "encode", false, 12999, {"[cam] encode(77): Exit (12ms)"}},
        {"cam", "decode", true, 0, {"[cam] decode:77: Entry", "[cam] decode(77): Exit (0.000ms)"}},
        {nullptr, "scale", true, 2, {"[velcamera] scale: Entry", "[velcamera] scale(-1): Exit (0.002ms)"}},
        {nullptr, nullptr, false, 0, {}}};
    for (const auto& c : cases) {
        log.clear();
        {
            std::optional<TimeStat> probe;
            c.tag ? probe.emplace(c.tag, c.name, 77, c.entry) : probe.emplace(c.name, c.entry);
            now_ns += c.life_us * 1000;
        }
        EXPECT_EQ(log.texts(1), c.messages) << &c - cases;
    }
    log.clear();
    TimeStat probe("frame", false);
    EXPECT_EQ(probe.last, 0);
    now_ns += 800'000;
    EXPECT_EQ(probe(), 800);
    now_ns += 2'200'000;
    probe.TimeStamp("after isp");
    now_ns += 4'000'000;
    probe.TimeStamp("after jpeg");
    EXPECT_EQ(probe(), 7000);
    EXPECT_EQ(log.texts(1), (Lines{"[frame] after isp: 3ms", "[frame] after jpeg: 7ms"}));
    qk::platform::set_clock_for_testing(nullptr);
}

// Keys sorted descending within [first, last] only, each name moving with its
// key by content (the name pointers stay), written over the whole 256-byte
// buffer and zero-filled; swap exchanges keys and whole name buffers.
TEST(Sort, OrdersTheRangeDescendingAndMovesNamesByContent) {
    const struct { std::vector<int32_t> keys; int32_t first, last; std::vector<int32_t> sorted; } cases[] = {
        {{3, 1, 4, 1, 5, 9, 2, 6}, 1, 6, {3, 9, 5, 4, 2, 1, 1, 6}}, {{2, 2, 7, 2}, 0, 3, {7, 2, 2, 2}},
        {{5, 1, 7}, 1, 1, {5, 1, 7}}, {{5, 1, 7}, 2, 0, {5, 1, 7}}, {{-3, 8}, 0, 1, {8, -3}}};
    for (const auto& c : cases) {
        std::vector<int32_t> keys = c.keys;
        std::vector<std::vector<char>> buffers(keys.size(), std::vector<char>(256, '\x7f'));
        std::vector<char*> names;
        for (size_t i = 0; i < keys.size(); ++i) {
            names.push_back(strcpy(buffers[i].data(), std::to_string(keys[i]).c_str()));
        }
        const std::vector<char*> pointers = names;
        sort(keys.data(), names.data(), c.first, c.last);
        EXPECT_EQ(keys, c.sorted);
        EXPECT_EQ(names, pointers);
        for (size_t i = 0; i < keys.size(); ++i) {
            EXPECT_EQ(std::string(names[i]), std::to_string(keys[i]));
            const long zeros = std::count(buffers[i].begin(), buffers[i].end(), 0);
            const bool in_range = int32_t(i) >= c.first && int32_t(i) <= c.last;
            const bool rewritten = zeros == 256 - long(strlen(names[i]));  // a moved name zero-fills its buffer
            EXPECT_TRUE(keys[i] != c.keys[i] ? rewritten : zeros == 1 || (in_range && rewritten)) << i;
        }
    }
    int32_t a = 1, b = 2;
    char name_a[256] = "first", name_b[256] = "second";
    name_a[255] = name_b[255] = 'x';
    swap(&a, &b, name_a, name_b), swap(&a, &a, name_a, name_a);
    EXPECT_EQ(std::make_tuple(a, b, std::string(name_a), std::string(name_b), name_a[255] | name_b[255]),
              std::make_tuple(2, 1, std::string("second"), std::string("first"), 0));
}

}  // namespace
