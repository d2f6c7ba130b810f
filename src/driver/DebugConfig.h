#ifndef VANTOR_DRIVER_DEBUGCONFIG_H
#define VANTOR_DRIVER_DEBUGCONFIG_H

#include <functional>
#include <istream>
#include <list>
#include <string>

namespace vantor {

// One debug entry: a shell command and its place in the dependency graph. Written as one line
// "name:requires:provides:command", the middle two being comma-separated lists.
struct DebugEntry {
    std::string name;
    std::list<std::string> requiredBarriers;
    std::list<std::string> providedBarriers;
    std::string command;
    int line = 0;  // of the file, counted from 1
};

// Reads "/etc/nuvex/vantor/debug.conf" and returns its entries in file order. A file that cannot be
// read has none. Malformed lines are reported to syslog (LOG_INFO) and skipped.
std::list<DebugEntry> ReadDebugConfig();

// The same from an open stream.
std::list<DebugEntry> ParseDebugConfig(std::istream& stream);

// The same, with the text on each malformed line given to `report` in place of syslog.
using MalformedLineReport = std::function<void(int line, const std::string& text)>;
std::list<DebugEntry> ParseDebugConfig(std::istream& stream, const MalformedLineReport& report);

}  // namespace vantor

#endif
