#ifndef VANTOR_SUPPORT_SYSLOGCAPTURE_H
#define VANTOR_SUPPORT_SYSLOGCAPTURE_H

#include <iosfwd>
#include <string>
#include <vector>

namespace vantor::support {

// One message to the system log, as it would stand there.
struct LogEntry {
    int priority = 0;
    std::string text;
};

bool operator==(const LogEntry& left, const LogEntry& right);
void PrintTo(const LogEntry& entry, std::ostream* stream);

// What was logged while this object lives; one at a time. A test program linked with the library
// test_syslog logs here and never on the machine: without a capture its messages are dropped.
class SyslogCapture {
public:
    SyslogCapture();
    ~SyslogCapture();
    SyslogCapture(const SyslogCapture&) = delete;
    SyslogCapture& operator=(const SyslogCapture&) = delete;

    // In the order of the calls. May be asked by any thread.
    std::vector<LogEntry> Entries() const;
};

}  // namespace vantor::support

#endif
