#include "support/log_capture.h"

#include <stdarg.h>
#include <stdio.h>

#include <algorithm>
#include <map>

namespace qktest {
namespace {

LogCapture* active = nullptr;

// Whether `text` continues after `at` with one or more decimal digits only.
bool digits_from(const std::string& text, size_t at) {
    return at < text.size() && text.find_first_not_of("0123456789", at) == std::string::npos;
}

}  // namespace

LogCapture::LogCapture() : previous_(active), saved_hook_(HX_LogMsg) {
    active = this;
    HX_LogMsg = capture;
}

LogCapture::~LogCapture() {
    HX_LogMsg = saved_hook_;
    active = previous_;
}

int LogCapture::capture(int level, ...) {
    va_list args;
    va_start(args, level);
    const char* format = va_arg(args, const char*);
    char text[4096];
    vsnprintf(text, sizeof(text), format, args);
    va_end(args);
    if (active != nullptr) active->lines_.push_back({level, text});
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
    return std::find(lines_.begin(), lines_.end(), LogLine{level, text}) != lines_.end();
}

// A failure report is a level-4 line "NAME (VALUE): FILE:LINE".
::testing::AssertionResult HasOneFailureReport(const LogCapture& log, int32_t status, const char* file) {
    static const std::map<int32_t, std::string> names = {
        {-1, "UNKNOWN"},      {-2, "NULL_PARAM"},  {-3, "INVALID_PARAM"}, {-4, "INVALID_SIZE"},
        {-5, "ALLOC_FAILED"}, {-6, "UNSUPPORTED"}, {-8, "IO_FAILED"},     {-9, "CODEC_FAILED"},
        {-42, "NOT_IMPLEMENTED"}};
    const std::string wanted = "QK_ERROR_" + names.at(status) + " (" + std::to_string(status) + "): " + file + ":";
    int reports = 0, matching = 0;
    for (const std::string& text : log.texts(4)) {
        const size_t close = text.find("): "), colon = text.rfind(':');
        const bool report = text.rfind("QK_", 0) == 0 && close != std::string::npos && colon > close + 2;
        if (!report || !digits_from(text, colon + 1)) continue;
        ++reports;
        matching += text.compare(0, wanted.size(), wanted) == 0 && digits_from(text, wanted.size());
    }
    if (reports == 1 && matching == 1) return ::testing::AssertionSuccess();
    return ::testing::AssertionFailure() << "expected one failure report \"" << wanted
                                         << "LINE\", log was: " << ::testing::PrintToString(log.lines());
}

}  // namespace qktest
