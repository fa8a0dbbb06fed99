// The platform's system log. On Android this is the Android log; elsewhere we
// write syslog datagrams ourselves, so the library never changes the host
// process's own syslog identity (openlog is process-wide).
#ifndef QKCORE_SRC_PLATFORM_SYSTEM_LOG_H
#define QKCORE_SRC_PLATFORM_SYSTEM_LOG_H

#include <stdarg.h>

namespace qk::platform {

// Android log priorities.
constexpr int kLogDebug = 3;
constexpr int kLogInfo = 4;
constexpr int kLogWarn = 5;
constexpr int kLogError = 6;

// Writes one message at an Android priority under a tag. Returns what the
// platform returns: a byte count (>= 0) or a negative error.
int system_log_vprint(int priority, const char* tag, const char* format, va_list args);

#if !defined(__ANDROID__)
// Points the syslog writer at another datagram socket (tests read from it);
// null restores "/dev/log".
void set_system_log_socket_for_testing(const char* path);
#endif

}  // namespace qk::platform

#endif  // QKCORE_SRC_PLATFORM_SYSTEM_LOG_H
