#ifndef VANTOR_SUPPORT_HOSTCALLS_H
#define VANTOR_SUPPORT_HOSTCALLS_H

#include <sys/time.h>
#include <sys/types.h>

#include <deque>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "support/FaultPoint.h"

namespace vantor::support {

// The calls by which the program reaches beyond its own process, and the clocks that it reads; one
// object at a time. A test program linked with the library test_host_calls never sends a signal,
// and never leaves its own session or working directory; its children may.
class HostCalls {
public:
    HostCalls();
    ~HostCalls();
    HostCalls(const HostCalls&) = delete;
    HostCalls& operator=(const HostCalls&) = delete;

    FaultPoint fork;
    FaultPoint setsid;
    FaultPoint chdir;
    FaultPoint kill;

    std::deque<timeval> times;        // next answers of gettimeofday(2); empty: the real time
    std::optional<long> uptime;       // answer of sysinfo(2), in seconds; none: the real one
    std::optional<int> systemStatus;  // answer of system(3) in place of running the command

    std::vector<std::string> commands;           // given to system(3)
    std::vector<std::string> directories;        // that this process meant to change to
    std::vector<std::pair<pid_t, int>> signals;  // that were to be sent: process and signal
};

}  // namespace vantor::support

#endif
