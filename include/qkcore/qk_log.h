// Logging and timing: the replaceable log hook, the library's two log
// functions, and the scoped timing probe.
#ifndef QKCORE_QK_LOG_H
#define QKCORE_QK_LOG_H

#include <stdint.h>

#include "qk_common.h"

// Log levels. Each prints a tag in front of the message on standard output:
// "[V]", "[D]", "[I]", "[W]", "[E]"; any other value prints "[V]".
QK_TYPED_ENUM(QKLogLevel, int) {
    QK_LOG_VERBOSE = 0,
    QK_LOG_DEBUG = 1,    // progress and parameters
    QK_LOG_INFO = 2,
    QK_LOG_WARN = 3,     // fell back to another path, or nothing to do
    QK_LOG_ERROR = 4,    // failure reports and other errors
};

// A log function: a level, then a printf-style format and its arguments.
// The library never uses the result.
typedef int (*QKLogFn)(int level, ...);

// The hook every message of the library goes through. It is read at each
// message, so assigning another function takes effect at the next one. It
// must always hold a valid function; its initial value is AndroidLogMsg.
QK_BEGIN_C_DECLS
extern QK_API QKLogFn HX_LogMsg;
QK_END_C_DECLS

#ifdef __cplusplus
// Writes "<tag> <message>\n" to standard output and the message to the
// system log (Android's log on Android, syslog elsewhere) under "velcamera".
QK_API int AndroidLogMsg(int level, ...);

// Writes "<tag> <message>\n" to standard output only.
QK_API int DefaultLogMsg(int level, ...);

// A scoped timing probe. Construction notes the time (and logs an entry line
// when enabled); destruction logs the time spent, whenever the name is
// non-null. The strings are not copied: they must outlive the probe.
// Times are microseconds of a monotonic clock that keeps counting in sleep.
class QK_API TimeStat {
public:
    TimeStat(const char* name, bool enabled);
    TimeStat(const char* tag, const char* name, int line, bool enabled);
    ~TimeStat();
    TimeStat(const TimeStat&) = delete;
    TimeStat& operator=(const TimeStat&) = delete;

    // Microseconds since construction.
    int64_t operator()();
    // Logs the whole milliseconds since construction under the given label.
    void TimeStamp(const char* label);

    int64_t start;     // clock at construction, microseconds
    int64_t last;      // latest clock reading, microseconds (0 until read)
    const char* name;  // null silences the exit message
    const char* tag;   // null for probes made with the two-argument constructor
    int32_t line;      // -1 for probes made with the two-argument constructor
};
#endif  // __cplusplus

#endif  // QKCORE_QK_LOG_H
