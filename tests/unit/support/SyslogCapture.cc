#include "support/SyslogCapture.h"

#include <cstdarg>
#include <cstdio>
#include <mutex>
#include <ostream>

namespace vantor::support {

namespace {

struct Recording {
    std::mutex mutex;
    bool active = false;
    std::vector<LogEntry> entries;
};

Recording& TheRecording() {
    // Never destroyed: threads may log until the very end.
    static auto* const recording = new Recording;
    return *recording;
}

void SetActive(bool active) {
    Recording& recording = TheRecording();
    const std::lock_guard<std::mutex> guard(recording.mutex);
    recording.active = active;
    recording.entries.clear();
}

// "%m" is formatted here too, so nothing before may change errno.
__attribute__((format(printf, 2, 0))) void Record(int priority, const char* format, va_list rest) {
    char text[8192] = "";
    std::vsnprintf(text, sizeof text, format, rest);
    Recording& recording = TheRecording();
    const std::lock_guard<std::mutex> guard(recording.mutex);
    if (recording.active) {
        recording.entries.push_back({priority, text});
    }
}

}  // namespace

bool operator==(const LogEntry& left, const LogEntry& right) {
    return left.priority == right.priority && left.text == right.text;
}

void PrintTo(const LogEntry& entry, std::ostream* stream) {
    *stream << "priority " << entry.priority << ": \"" << entry.text << '"';
}

SyslogCapture::SyslogCapture() { SetActive(true); }

SyslogCapture::~SyslogCapture() { SetActive(false); }

std::vector<LogEntry> SyslogCapture::Entries() const {
    Recording& recording = TheRecording();
    const std::lock_guard<std::mutex> guard(recording.mutex);
    return recording.entries;
}

}  // namespace vantor::support

extern "C" {

__attribute__((format(printf, 2, 3))) void __wrap_syslog(int priority, const char* format, ...) {
    va_list rest;
    va_start(rest, format);
    vantor::support::Record(priority, format, rest);
    va_end(rest);
}

// What syslog() becomes in a fortified build.
__attribute__((format(printf, 3, 4))) void __wrap___syslog_chk(int priority, int /*flag*/,
                                                               const char* format, ...) {
    va_list rest;
    va_start(rest, format);
    vantor::support::Record(priority, format, rest);
    va_end(rest);
}

}  // extern "C"
