#include <stdint.h>

#include "platform/clock.h"
#include "util/log.h"

namespace {

constexpr const char* kLogTag = "velcamera";

int64_t now_micros() { return qk::platform::elapsed_realtime_nano() / 1000; }

}  // namespace

TimeStat::TimeStat(const char* name, bool enabled)
    : start(now_micros()), last(0), name(name), tag(nullptr), line(-1) {
    if (enabled) QK_LOG(QK_LOG_DEBUG, "[%s] %s: Entry", kLogTag, name);
}

TimeStat::TimeStat(const char* tag, const char* name, int line, bool enabled)
    : start(now_micros()), last(0), name(name), tag(tag), line(line) {
    if (enabled) QK_LOG(QK_LOG_DEBUG, "[%s] %s:%d: Entry", tag, name, line);
}

TimeStat::~TimeStat() {
    last = now_micros();
    if (name == nullptr) return;
    int64_t elapsed = last - start;
    // Probes made without a tag print the log tag in its place.
    const char* shown_tag = tag != nullptr ? tag : kLogTag;
    if (elapsed < 5001) {
        float millis = static_cast<float>(elapsed) / 1000.0f;
        QK_LOG(QK_LOG_DEBUG, "[%s] %s(%d): Exit (%0.3fms)", shown_tag, name, line, static_cast<double>(millis));
    } else {
        QK_LOG(QK_LOG_DEBUG, "[%s] %s(%d): Exit (%ldms)", shown_tag, name, line, static_cast<long>(elapsed / 1000));
    }
}

int64_t TimeStat::operator()() {
    last = now_micros();
    return last - start;
}

void TimeStat::TimeStamp(const char* label) {
    last = now_micros();
    QK_LOG(QK_LOG_DEBUG, "[%s] %s: %ldms", name, label, static_cast<long>((last - start) / 1000));
}
