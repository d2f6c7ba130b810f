#ifndef VANTOR_DRIVER_PROFILINGLOG_H
#define VANTOR_DRIVER_PROFILINGLOG_H

#include <sys/time.h>

#include <cstdint>
#include <ostream>

#include "driver/RunConfig.h"
#include "plugins/Plugin.h"

namespace vantor {

// Replaces "/var/log/sysboot.log" atomically by a report of the run: uptime at the start, when each
// node ran, in node order, and the configuration. `startTime` and `endTime` are the driver's own,
// `uptimeSeconds` is the kernel's uptime at the start. A failure goes to syslog and leaves the
// previous report. Called when no worker exists.
void WriteProfilingLog(const timeval& startTime, const timeval& endTime,
                       std::uint64_t uptimeSeconds, const PluginQueue& nodes,
                       const RunConfig& config);

// The text of that report.
void FormatProfilingLog(std::ostream& stream, const timeval& startTime, const timeval& endTime,
                        std::uint64_t uptimeSeconds, const PluginQueue& nodes,
                        const RunConfig& config);

// Writes a time as UTC, "2024-03-05 07:08:09.000042". The stream's fill character is '0'
// afterwards.
std::ostream& FormatTime(std::ostream& stream, const timeval& time);

}  // namespace vantor

#endif
