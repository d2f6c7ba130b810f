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

// The text of a time. Few of a boot's times lie in another second than the one before: only for
// those the calendar is asked.
class TimeText {
public:
    void AppendTo(std::string& text, const timeval& time) {
        if (beginning.empty() || time.tv_sec != second) {
            second = time.tv_sec;
            beginning = Beginning(second);
        }
        AppendPadded(text += beginning, time.tv_usec, 6);
    }

private:
    // All of it that is the same within a second.
    static std::string Beginning(std::time_t second) {
        std::tm utc{};
        gmtime_r(&second, &utc);
        std::string text;
        AppendPadded(text, utc.tm_year + std::int64_t{1900}, 4);
        AppendPadded(text += '-', utc.tm_mon + 1, 2);
        AppendPadded(text += '-', utc.tm_mday, 2);
        AppendPadded(text += ' ', utc.tm_hour, 2);
        AppendPadded(text += ':', utc.tm_min, 2);
        AppendPadded(text += ':', utc.tm_sec, 2);
        return text += '.';
    }

    std::time_t second = 0;
    std::string beginning;  // that of `second`; empty before the first time
};

void WriteSpans(std::ostream& stream, const PluginQueue& nodes) {
    TimeText time;
    std::string line;
    for (const Plugin* node : nodes) {
        line = '[';
        time.AppendTo(line, node->StartTime());
        time.AppendTo(line += " - ", node->EndTime());
        stream << (line += "] sysboot: ").append(node->Name()) << '\n';
    }
}

}  // namespace

std::ostream& FormatTime(std::ostream& stream, const timeval& time) {
    std::string text;
    TimeText().AppendTo(text, time);
    stream.fill('0');
    stream.width(0);
    return stream << text;
}

void FormatProfilingLog(std::ostream& stream, const timeval& startTime, const timeval& endTime,
                        std::uint64_t uptimeSeconds, const PluginQueue& nodes,
                        const RunConfig& config) {
    stream << "NVKernel Initialization Time: " << uptimeSeconds * 1000000U << '\n';
    WriteSpans(stream, nodes);
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
