#include "driver/ProfilingLog.h"

#include <syslog.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <ctime>
#include <stdexcept>
#include <string>

#include "io/afstream.h"

namespace vantor {

namespace {

constexpr const char* profilingLog = "/var/log/sysboot.log";

// Many times faster than a stream that is told about widths; two times are written for each plugin.
std::string Padded(std::int64_t value, std::size_t width) {
    std::string digits = std::to_string(value);
    digits.insert(0, std::max(width, digits.size()) - digits.size(), '0');
    return digits;
}

}  // namespace

std::ostream& FormatTime(std::ostream& stream, const timeval& time) {
    std::tm utc{};
    const std::time_t seconds = time.tv_sec;
    gmtime_r(&seconds, &utc);
    std::string text = Padded(utc.tm_year + std::int64_t{1900}, 4);
    text += '-' + Padded(utc.tm_mon + 1, 2) + '-' + Padded(utc.tm_mday, 2);
    text +=
        ' ' + Padded(utc.tm_hour, 2) + ':' + Padded(utc.tm_min, 2) + ':' + Padded(utc.tm_sec, 2);
    text += '.' + Padded(time.tv_usec, 6);
    stream.fill('0');
    stream.width(0);
    return stream << text;
}

void FormatProfilingLog(std::ostream& stream, const timeval& startTime, const timeval& endTime,
                        std::uint64_t uptimeSeconds, const PluginQueue& nodes,
                        const RunConfig& config) {
    stream << "NVKernel Initialization Time: " << uptimeSeconds * 1000000U << '\n';
    for (const Plugin* node : nodes) {
        FormatTime(stream << '[', node->StartTime());
        FormatTime(stream << " - ", node->EndTime()) << "] sysboot: " << node->Name() << '\n';
    }
    stream << "=== Vantor configuration info ===\n";
    FormatTime(stream << " Start: ", startTime) << '\n';
    FormatTime(stream << " End: ", endTime) << '\n';
    stream << " Verbose: " << config.verbose << '\n'
           << " Parallel: " << config.parallel << '\n'
           << " Randomize: " << config.randomize << '\n'
           << " Interactive Mode: " << config.interactive << '\n'
           << " Random Seed: " << config.seed << '\n';
}

void WriteProfilingLog(const timeval& startTime, const timeval& endTime,
                       std::uint64_t uptimeSeconds, const PluginQueue& nodes,
                       const RunConfig& config) {
    afstream stream;
    try {
        stream.open(profilingLog);
    } catch (const std::runtime_error&) {
        const int error = errno;
        syslog(LOG_ERR, "unable to open profiling log (%s): %s", profilingLog,
               std::strerror(error));
        return;
    }
    try {
        FormatProfilingLog(stream, startTime, endTime, uptimeSeconds, nodes, config);
        stream.commit();
    } catch (const std::runtime_error& error) {
        syslog(LOG_WARNING, "unable to log profiling information: %s", error.what());
    }
}

}  // namespace vantor
