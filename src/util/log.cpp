#include "util/log.h"

#include <stdarg.h>
#include <stdio.h>

#include "platform/system_log.h"

QKLogFn HX_LogMsg = AndroidLogMsg;

namespace qk {
namespace {

// The level tag printed on standard output ("[V]" for out-of-range levels).
const char* log_level_tag(int level) {
    static const char* const kTags[] = {"[V]", "[D]", "[I]", "[W]", "[E]"};
    unsigned index = static_cast<unsigned>(level);
    return kTags[index > 4 ? 0 : index];
}

// "<tag> <message>\n" as one locked unit, so lines of concurrent callers do
// not interleave within a line. Returns the result of writing the newline.
int print_tagged_line(int level, const char* format, va_list args) {
    flockfile(stdout);
    fputs(log_level_tag(level), stdout);
    putc_unlocked(' ', stdout);
    vfprintf(stdout, format, args);
    int result = putc_unlocked('\n', stdout);
    funlockfile(stdout);
    return result;
}

int system_log_priority(int level) {
    switch (level) {
        case QK_LOG_INFO: return platform::kLogInfo;
        case QK_LOG_WARN: return platform::kLogWarn;
        case QK_LOG_ERROR: return platform::kLogError;
        default: return platform::kLogDebug;
    }
}

}  // namespace
}  // namespace qk

int AndroidLogMsg(int level, ...) {
    va_list args;
    va_start(args, level);
    const char* format = va_arg(args, const char*);
    va_list copy;
    va_copy(copy, args);
    qk::print_tagged_line(level, format, args);
    int result = qk::platform::system_log_vprint(qk::system_log_priority(level), "velcamera", format, copy);
    va_end(copy);
    va_end(args);
    return result;
}

int DefaultLogMsg(int level, ...) {
    va_list args;
    va_start(args, level);
    const char* format = va_arg(args, const char*);
    int result = qk::print_tagged_line(level, format, args);
    va_end(args);
    return result;
}
