#include "driver/ProfilingLog.h"

#include <syslog.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <charconv>
#include <cstring>
#include <ctime>
#include <stdexcept>

#include "io/afstream.h"

namespace vantor {

namespace {

constexpr const char* profilingLog = "/var/log/sysboot.log";

// The text of one time. Two are written for each plugin, and a stream that is told about widths
// takes many times longer.
class TimeText {
public:
    TimeText& Add(std::int64_t value, std::ptrdiff_t width, char separator) {
        std::array<char, 24> digits;
        char* const digitsEnd =
            std::to_chars(digits.data(), digits.data() + digits.size(), value).ptr;
        end =
            std::fill_n(end, std::max<std::ptrdiff_t>(width - (digitsEnd - digits.data()), 0), '0');
        end = std::copy(digits.data(), digitsEnd, end);
        *end++ = separator;
        return *this;
    }

    // Without the last separator.
    std::string_view Get() const {
        return {text.data(), static_cast<std::size_t>(end - text.data() - 1)};
    }

private:
    std::array<char, 7 * 25> text;  // room for seven of the longest numbers
    char* end = text.data();
};

}  // namespace

std::ostream& FormatTime(std::ostream& stream, const timeval& time) {
    std::tm utc{};
    const std::time_t seconds = time.tv_sec;
    gmtime_r(&seconds, &utc);
    TimeText text;
    text.Add(utc.tm_year + std::int64_t{1900}, 4, '-')
        .Add(utc.tm_mon + 1, 2, '-')
        .Add(utc.tm_mday, 2, ' ');
    text.Add(utc.tm_hour, 2, ':').Add(utc.tm_min, 2, ':').Add(utc.tm_sec, 2, '.');
    text.Add(time.tv_usec, 6, ' ');
    stream.fill('0');
    stream.width(0);
    return stream << text.Get();
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
