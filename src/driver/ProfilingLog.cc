#include "driver/ProfilingLog.h"

#include <syslog.h>

#include <cerrno>
#include <cstring>
#include <ctime>
#include <iomanip>
#include <stdexcept>

#include "io/afstream.h"

namespace vantor {

namespace {

constexpr const char* profilingLog = "/var/log/sysboot.log";

}  // namespace

std::ostream& FormatTime(std::ostream& stream, const timeval& time) {
    std::tm utc{};
    const std::time_t seconds = time.tv_sec;
    gmtime_r(&seconds, &utc);
    return stream << std::setfill('0') << std::setw(4) << utc.tm_year + 1900 << '-'  //
                  << std::setw(2) << utc.tm_mon + 1 << '-'                           //
                  << std::setw(2) << utc.tm_mday << ' '                              //
                  << std::setw(2) << utc.tm_hour << ':'                              //
                  << std::setw(2) << utc.tm_min << ':'                               //
                  << std::setw(2) << utc.tm_sec << '.'                               //
                  << std::setw(6) << time.tv_usec;
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
