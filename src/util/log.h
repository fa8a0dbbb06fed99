// Internal logging: every message of the library goes through QK_LOG, which
// calls the hook HX_LogMsg afresh for each message.
#ifndef QKCORE_SRC_UTIL_LOG_H
#define QKCORE_SRC_UTIL_LOG_H

#include "qkcore/qk_log.h"

namespace qk {

// Never called: it only lets the compiler check QK_LOG's format against its
// arguments, which the hook's (int, ...) signature cannot express.
[[gnu::format(printf, 1, 2)]] inline void check_log_format(const char*, ...) {}

}  // namespace qk

#define QK_LOG(level, ...)                                \
    do {                                                  \
        if (false) ::qk::check_log_format(__VA_ARGS__);   \
        HX_LogMsg((level), __VA_ARGS__);                  \
    } while (0)

// Argument for "%4.4s": the four characters of a format code held in an
// lvalue (a field or a local), first character first.
#define QK_FOURCC_STR(code) (reinterpret_cast<const char*>(&(code)))

#endif  // QKCORE_SRC_UTIL_LOG_H
