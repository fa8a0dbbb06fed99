#include "platform/system_log.h"

#if defined(__ANDROID__)
#include <android/log.h>

namespace qk::platform {

int system_log_vprint(int priority, const char* tag, const char* format, va_list args) {
    return __android_log_vprint(priority, tag, format, args);
}

}  // namespace qk::platform

#else
#include <errno.h>
#include <fcntl.h>
#include <stdio.h>
#include <string.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <syslog.h>
#include <time.h>
#include <unistd.h>

#include <atomic>
#include <string>

namespace qk::platform {
namespace {

std::atomic<const char*> g_socket_path{"/dev/log"};

int syslog_severity(int priority) {
    switch (priority) {
        case kLogInfo: return LOG_INFO;
        case kLogWarn: return LOG_WARNING;
        case kLogError: return LOG_ERR;
        default: return LOG_DEBUG;
    }
}

// One connectionless send per message: no descriptor outlives the call, so
// nothing is shared between threads and nothing leaks across fork.
int send_datagram(const char* path, const std::string& line) {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    if (strlen(path) >= sizeof(address.sun_path)) return -ENAMETOOLONG;
    strcpy(address.sun_path, path);
    int fd = socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    if (fd < 0) return -errno;
    ssize_t sent = sendto(fd, line.data(), line.size(), MSG_NOSIGNAL,
                          reinterpret_cast<const sockaddr*>(&address), sizeof(address));
    int result = sent < 0 ? -errno : static_cast<int>(sent);
    close(fd);
    return result;
}

}  // namespace

int system_log_vprint(int priority, const char* tag, const char* format, va_list args) {
    char message[1024];
    int length = vsnprintf(message, sizeof(message), format, args);
    if (length < 0) return -EINVAL;

    // The classic BSD syslog line, as the C library's syslog() sends it.
    char header[128];
    time_t now = time(nullptr);
    struct tm local {};
    localtime_r(&now, &local);
    char stamp[32];
    strftime(stamp, sizeof(stamp), "%b %e %H:%M:%S", &local);
    snprintf(header, sizeof(header), "<%d>%s %s[%d]: ", LOG_USER | syslog_severity(priority), stamp,
             tag, static_cast<int>(getpid()));
    return send_datagram(g_socket_path.load(), std::string(header) + message);
}

void set_system_log_socket_for_testing(const char* path) {
    g_socket_path.store(path != nullptr ? path : "/dev/log");
}

}  // namespace qk::platform
#endif
