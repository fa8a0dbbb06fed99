#include <gtest/gtest.h>
#include <stdlib.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <string>

#include "platform/system_log.h"
#include "qkcore/qk_log.h"

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
    std::string dir_, path_;
    int fd_ = -1;
};

// Both write "<tag> <text>\n" to standard output, the newline added even after
// one the format has; AndroidLogMsg also sends the text as formatted to the
// system log, its Android priority 3 (debug), 4 (info), 5 (warn) or 6 (error)
// as a syslog user-facility priority.
TEST(LogMessages, LevelTagsOnStandardOutputPrioritiesInTheSystemLog) {
    EXPECT_EQ(HX_LogMsg, &AndroidLogMsg);  // the hook's initial value
    FakeSystemLog system_log;
    const struct {
        int level;
        const char* tag;
        int priority;
    } cases[] = {{0, "[V]", 15}, {1, "[D]", 15}, {2, "[I]", 14}, {3, "[W]", 12},
                 {4, "[E]", 11}, {5, "[V]", 15}, {7, "[V]", 15}, {-1, "[V]", 15}};
    for (const auto& c : cases) {
        const std::string printed = std::string(c.tag) + " frame 640x480\n\n";
        CaptureStdout();
        DefaultLogMsg(c.level, "frame %dx%d\n", 640, 480);
        EXPECT_EQ(GetCapturedStdout(), printed);
        EXPECT_EQ(system_log.next(), "") << "DefaultLogMsg wrote to the system log";

        CaptureStdout();
        const int result = AndroidLogMsg(c.level, "frame %dx%d\n", 640, 480);
        EXPECT_EQ(GetCapturedStdout(), printed);
        const std::string line = system_log.next();
        EXPECT_EQ(result, static_cast<int>(line.size()));
        // "<priority>Mon dd hh:mm:ss velcamera[pid]: text"
        const std::string priority = "<" + std::to_string(c.priority) + ">";
        EXPECT_EQ(line.substr(0, priority.size()), priority);
        EXPECT_EQ(line.substr(priority.size() + 15), " velcamera[" + std::to_string(getpid()) + "]: frame 640x480\n");
    }
}

}  // namespace
