#include <gtest/gtest.h>
#include <stdlib.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <string>

#include "image/status.h"
#include "platform/system_log.h"
#include "qkcore/qk_log.h"
#include "support/log_capture.h"

namespace {

using testing::internal::CaptureStdout;
using testing::internal::GetCapturedStdout;

// A datagram socket standing in for the system log for the life of a test.
class FakeSystemLog {
public:
    FakeSystemLog() {
        char dir_template[] = "/tmp/qk_syslog_XXXXXX";
        dir_ = mkdtemp(dir_template);
        path_ = dir_ + "/log";
        fd_ = socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0);
        sockaddr_un address{};
        address.sun_family = AF_UNIX;
        strcpy(address.sun_path, path_.c_str());
        EXPECT_EQ(bind(fd_, reinterpret_cast<sockaddr*>(&address), sizeof(address)), 0);
        qk::platform::set_system_log_socket_for_testing(path_.c_str());
    }
    ~FakeSystemLog() {
        qk::platform::set_system_log_socket_for_testing(nullptr);
        close(fd_);
        unlink(path_.c_str());
        rmdir(dir_.c_str());
    }
    // The next datagram, or "" when none is waiting.
    std::string next() {
        char buffer[2048];
        ssize_t got = recv(fd_, buffer, sizeof(buffer), MSG_DONTWAIT);
        return got > 0 ? std::string(buffer, static_cast<size_t>(got)) : std::string();
    }

private:
    std::string dir_;
    std::string path_;
    int fd_ = -1;
};

// "<priority>Mon dd hh:mm:ss velcamera[pid]: text" -> priority and text.
void expect_syslog_line(const std::string& line, int priority, const std::string& text) {
    std::string prefix = "<" + std::to_string(priority) + ">";
    EXPECT_EQ(line.compare(0, prefix.size(), prefix), 0) << line;
    std::string suffix = " velcamera[" + std::to_string(getpid()) + "]: " + text;
    ASSERT_GE(line.size(), suffix.size()) << line;
    EXPECT_EQ(line.substr(line.size() - suffix.size()), suffix) << line;
}

TEST(LogMessages, StandardOutputGetsTheLevelTagAndANewline) {
    const struct {
        int level;
        const char* tag;
    } cases[] = {{0, "[V]"}, {1, "[D]"}, {2, "[I]"}, {3, "[W]"}, {4, "[E]"}, {5, "[V]"}, {7, "[V]"}, {-1, "[V]"}};
    for (const auto& c : cases) {
        CaptureStdout();
        DefaultLogMsg(c.level, "value %d and %s", 42, "text");
        EXPECT_EQ(GetCapturedStdout(), std::string(c.tag) + " value 42 and text\n") << c.level;
    }
    // The newline is added even after one the format already has.
    CaptureStdout();
    DefaultLogMsg(1, "wrote %d bytes\n", 3);
    EXPECT_EQ(GetCapturedStdout(), "[D] wrote 3 bytes\n\n");
}

TEST(LogMessages, AndroidLogMsgAlsoWritesTheSystemLog) {
    FakeSystemLog system_log;
    // Android priorities 3 (debug), 4 (info), 5 (warn), 6 (error) as syslog
    // user-facility priorities.
    const struct {
        int level;
        const char* tag;
        int priority;
    } cases[] = {{0, "[V]", 15}, {1, "[D]", 15}, {2, "[I]", 14}, {3, "[W]", 12},
                 {4, "[E]", 11}, {7, "[V]", 15}, {-1, "[V]", 15}};
    for (const auto& c : cases) {
        CaptureStdout();
        int result = AndroidLogMsg(c.level, "frame %dx%d\n", 640, 480);
        EXPECT_EQ(GetCapturedStdout(), std::string(c.tag) + " frame 640x480\n\n");
        std::string line = system_log.next();
        EXPECT_EQ(result, static_cast<int>(line.size()));
        // The system log gets the text as formatted: no tag, no added newline.
        expect_syslog_line(line, c.priority, "frame 640x480\n");
    }
}

TEST(LogMessages, AndroidLogMsgIsTheHooksInitialValue) {
    EXPECT_EQ(HX_LogMsg, &AndroidLogMsg);
}

TEST(LogHook, EveryMessageGoesThroughTheCurrentHook) {
    {
        qktest::LogCapture log;
        qk::report_failure(QK_ERROR_NOT_IMPLEMENTED, "src/somewhere.cpp", 12);
        ASSERT_EQ(log.lines().size(), 1u);
        EXPECT_EQ(log.lines()[0].level, 4);
        EXPECT_EQ(log.lines()[0].text, "QK_ERROR_NOT_IMPLEMENTED (-42): src/somewhere.cpp:12");
    }
    // A client's choice of DefaultLogMsg sends reports to standard output only.
    FakeSystemLog system_log;
    QKLogFn saved = HX_LogMsg;
    HX_LogMsg = DefaultLogMsg;
    CaptureStdout();
    int32_t status = QK_FAIL(QK_ERROR_ALLOC_FAILED);
    std::string printed = GetCapturedStdout();
    HX_LogMsg = saved;
    EXPECT_EQ(status, QK_ERROR_ALLOC_FAILED);
    EXPECT_EQ(printed.rfind("[E] QK_ERROR_ALLOC_FAILED (-5): tests/util/log_test.cpp:", 0), 0u) << printed;
    EXPECT_EQ(system_log.next(), "");
}

}  // namespace
