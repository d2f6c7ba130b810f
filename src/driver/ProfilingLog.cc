#include "driver/ProfilingLog.h"

#include <syslog.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <charconv>
#include <cstring>
#include <ctime>
#include <limits>
#include <stdexcept>
#include <string>

#include "io/afstream.h"

namespace vantor {

namespace {

constexpr const char* profilingLog = "/var/log/sysboot.log";

// Many times faster than a stream that is told about widths; two times are written for each plugin.
void AppendPadded(std::string& text, std::int64_t value, std::size_t width) {
    std::array<char, std::numeric_limits<std::int64_t>::digits10 + 2> digits;  // one more; a sign
    const auto written = std::to_chars(digits.data(), digits.data() + digits.size(), value);
    const auto count = static_cast<std::size_t>(written.ptr - digits.data());
    text.append(std::max(width, count) - count, '0').append(digits.data(), count);
}

}  // namespace

std::ostream& FormatTime(std::ostream& stream, const timeval& time) {
    std::tm utc{};
    const std::time_t seconds = time.tv_sec;
    gmtime_r(&seconds, &utc);
    std::string text;
    AppendPadded(text, utc.tm_year + std::int64_t{1900}, 4);
    AppendPadded(text += '-', utc.tm_mon + 1, 2);
    AppendPadded(text += '-', utc.tm_mday, 2);
    AppendPadded(text += ' ', utc.tm_hour, 2);
    AppendPadded(text += ':', utc.tm_min, 2);
    AppendPadded(text += ':', utc.tm_sec, 2);
    AppendPadded(text += '.', time.tv_usec, 6);
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
