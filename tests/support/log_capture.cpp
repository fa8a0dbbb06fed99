#include "support/log_capture.h"

#include <stdarg.h>
#include <stdio.h>

#include <algorithm>
#include <map>
#include <regex>

namespace qktest {

LogCapture* LogCapture::active_ = nullptr;

LogCapture::LogCapture() : previous_(active_), saved_hook_(HX_LogMsg) {
    active_ = this;
    HX_LogMsg = capture;
}

LogCapture::~LogCapture() {
    HX_LogMsg = saved_hook_;
    active_ = previous_;
}

int LogCapture::capture(int level, ...) {
    va_list args;
    va_start(args, level);
    const char* format = va_arg(args, const char*);
    char text[4096];
    vsnprintf(text, sizeof(text), format, args);
    va_end(args);
    if (active_ != nullptr) active_->lines_.push_back({level, text});
    return 0;
}

std::vector<std::string> LogCapture::texts(int level) const {
    std::vector<std::string> result;
    for (const LogLine& line : lines_) {
        if (line.level == level) result.push_back(line.text);
    }
    return result;
}

bool LogCapture::contains(int level, const std::string& text) const {
    const std::vector<std::string> all = texts(level);
    return std::find(all.begin(), all.end(), text) != all.end();
}

// A failure report is a level-4 line "NAME (VALUE): FILE:LINE".
::testing::AssertionResult HasOneFailureReport(const LogCapture& log, int32_t status, const char* file) {
    static const std::map<int32_t, std::string> names = {{-2, "NULL_PARAM"},   {-3, "INVALID_PARAM"},
                                                         {-4, "INVALID_SIZE"}, {-5, "ALLOC_FAILED"},
                                                         {-6, "UNSUPPORTED"},  {-42, "NOT_IMPLEMENTED"}};
    static const std::regex report(R"(QK_[A-Z_]+ \(-?[0-9]+\): [^ ]+:[0-9]+)");
    const std::string wanted = "QK_ERROR_" + names.at(status) + " (" + std::to_string(status) + "): " + file + ":";
    int reports = 0, matching = 0;
    for (const std::string& text : log.texts(4)) {
        if (!std::regex_match(text, report)) continue;
        ++reports;
        matching += text.compare(0, wanted.size(), wanted) == 0 && text.find(':', wanted.size()) == std::string::npos;
    }
    if (reports == 1 && matching == 1) return ::testing::AssertionSuccess();
    return ::testing::AssertionFailure() << "expected one failure report \"" << wanted
                                         << "LINE\", log was: " << ::testing::PrintToString(log.lines());
}

::testing::AssertionResult HasNoErrors(const LogCapture& log) {
    if (log.texts(4).empty()) return ::testing::AssertionSuccess();
    return ::testing::AssertionFailure() << "unexpected errors: " << ::testing::PrintToString(log.lines());
}

}  // namespace qktest
