#ifndef VANTOR_ANALYZE_BOOT_BOOTLOG_H
#define VANTOR_ANALYZE_BOOT_BOOTLOG_H

#include <cstdint>
#include <istream>
#include <stdexcept>
#include <string>
#include <vector>

namespace vantor::analyze {

// Microseconds since the epoch, or between two moments.
using Microseconds = std::int64_t;

// One run of one plugin. Both times are 0 for a plugin that was not run.
struct LogEntry {
    std::string name;
    Microseconds start = 0;
    Microseconds end = 0;

    bool WasRun() const { return start != 0 || end != 0; }
};

// A boot profiling log, as the boot program writes it: one boot, its plugins in the order in which
// they were requested.
struct BootLog {
    Microseconds kernelTime = 0;  // how long the kernel had been up
    std::vector<LogEntry> entries;
    Microseconds start = 0;  // of the whole run
    Microseconds end = 0;
    bool verbose = false;
    bool parallel = false;
    bool randomize = false;
    bool interactive = false;
    std::int64_t seed = 0;
};

// Reads a profiling log. Throws std::runtime_error that names `path`, the line and the reason for
// whatever is not one.
BootLog ReadBootLog(const std::string& path);
BootLog ParseBootLog(std::istream& stream, const std::string& path);

}  // namespace vantor::analyze

#endif
