// Captures the library's messages by replacing the log hook for a scope.
#ifndef QKCORE_TESTS_SUPPORT_LOG_CAPTURE_H
#define QKCORE_TESTS_SUPPORT_LOG_CAPTURE_H

#include <gtest/gtest.h>
#include <stdint.h>

#include <ostream>
#include <string>
#include <vector>

#include "qkcore/qk_log.h"

namespace qktest {

struct LogLine {
    int level;
    std::string text;
    bool operator==(const LogLine& other) const { return level == other.level && text == other.text; }
};
inline void PrintTo(const LogLine& line, std::ostream* out) { *out << "[" << line.level << "] " << line.text; }

class LogCapture {
public:
    LogCapture();
    ~LogCapture();
    LogCapture(const LogCapture&) = delete;
    const std::vector<LogLine>& lines() const { return lines_; }
    std::vector<std::string> texts(int level) const;
    bool contains(int level, const std::string& text) const;
    void clear() { lines_.clear(); }

private:
    static int capture(int level, ...);
    LogCapture* previous_;
    QKLogFn saved_hook_;
    std::vector<LogLine> lines_;
};

// Succeeds when the capture holds exactly one failure report, for `status`,
// whose place is `file` (relative to the repository root) and a line number.
::testing::AssertionResult HasOneFailureReport(const LogCapture& log, int32_t status, const char* file);

}  // namespace qktest

#endif  // QKCORE_TESTS_SUPPORT_LOG_CAPTURE_H
