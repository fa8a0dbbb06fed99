#include "support/log_capture.h"

#include <stdarg.h>
#include <stdio.h>


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
    for (const LogLine& line : lines_) {
        if (line.level == level && line.text == text) return true;
    }
    return false;
}

namespace {

const char* name_of(int32_t status) {
    switch (status) {
        case -1: return "QK_ERROR_UNKNOWN";
        case -2: return "QK_ERROR_NULL_PARAM";
        case -3: return "QK_ERROR_INVALID_PARAM";
        case -4: return "QK_ERROR_INVALID_SIZE";
        case -5: return "QK_ERROR_ALLOC_FAILED";
        case -6: return "QK_ERROR_UNSUPPORTED";
        case -8: return "QK_ERROR_IO_FAILED";
        case -9: return "QK_ERROR_CODEC_FAILED";
        case -42: return "QK_ERROR_NOT_IMPLEMENTED";
        default: return "?";
    }
}

std::string dump(const LogCapture& log) {
    std::string all;
    for (const LogLine& line : log.lines()) all += "\n  [" + std::to_string(line.level) + "] " + line.text;
    return all.empty() ? " (nothing logged)" : all;
}

}  // namespace

// A failure report reads "NAME (VALUE): FILE:LINE". Returns false for any
// other text; otherwise sets the status name, value text and file.
bool parse_report(const std::string& text, std::string* name, std::string* value, std::string* file) {
    size_t open = text.find(" (");
    size_t close = text.find("): ", open);
    size_t colon = text.rfind(':');
    if (text.compare(0, 3, "QK_") != 0 || open == std::string::npos || close == std::string::npos ||
        colon <= close + 2 || colon + 1 == text.size()) {
        return false;
    }
    for (size_t i = colon + 1; i < text.size(); ++i) {
        if (text[i] < '0' || text[i] > '9') return false;
    }
    *name = text.substr(0, open);
    *value = text.substr(open + 2, close - open - 2);
    *file = text.substr(close + 3, colon - close - 3);
    return true;
}

::testing::AssertionResult HasOneFailureReport(const LogCapture& log, int32_t status, const char* file) {
    int reports = 0;
    int matching = 0;
    for (const std::string& text : log.texts(4)) {
        std::string name, value, place;
        if (!parse_report(text, &name, &value, &place)) continue;
        ++reports;
        if (name == name_of(status) && value == std::to_string(status) && place == file) ++matching;
    }
    if (reports == 1 && matching == 1) return ::testing::AssertionSuccess();
    return ::testing::AssertionFailure() << "expected one failure report of " << name_of(status) << " at " << file
                                         << ", log was:" << dump(log);
}

::testing::AssertionResult HasNoErrors(const LogCapture& log) {
    if (log.texts(4).empty()) return ::testing::AssertionSuccess();
    return ::testing::AssertionFailure() << "unexpected errors:" << dump(log);
}

}  // namespace qktest
