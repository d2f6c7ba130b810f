#include "support/HostCalls.h"

#include <sys/sysinfo.h>
#include <unistd.h>

namespace vantor::support {

namespace {

HostCalls* current = nullptr;
const pid_t testProcess = getpid();

bool InTestProcess() { return getpid() == testProcess; }

}  // namespace

HostCalls::HostCalls() { current = this; }

HostCalls::~HostCalls() { current = nullptr; }

}  // namespace vantor::support

using vantor::support::current;
using vantor::support::InTestProcess;

extern "C" {

pid_t __real_fork();
pid_t __real_setsid();
int __real_chdir(const char* path);
int __real_gettimeofday(timeval* time, void* zone);
int __real_sysinfo(struct sysinfo* info);
int __real_system(const char* command);

pid_t __wrap_fork() { return current != nullptr && current->fork.Fails() ? -1 : __real_fork(); }

pid_t __wrap_setsid() {
    if (current != nullptr && current->setsid.Fails()) {
        return -1;
    }
    return InTestProcess() ? getpid() : __real_setsid();
}

int __wrap_chdir(const char* path) {
    if (current != nullptr && current->chdir.Fails()) {
        return -1;
    }
    if (!InTestProcess()) {
        return __real_chdir(path);
    }
    if (current != nullptr) {
        current->directories.emplace_back(path);
    }
    return 0;
}

// Nothing here ever calls the real one.
int __wrap_kill(pid_t process, int signal) {
    if (current != nullptr) {
        current->signals.emplace_back(process, signal);
    }
    return current != nullptr && current->kill.Fails() ? -1 : 0;
}

int __wrap_gettimeofday(timeval* time, void* zone) {
    if (current == nullptr || current->times.empty()) {
        return __real_gettimeofday(time, zone);
    }
    *time = current->times.front();
    current->times.pop_front();
    return 0;
}

int __wrap_sysinfo(struct sysinfo* info) {
    const int result = __real_sysinfo(info);
    if (current != nullptr && current->uptime) {
        info->uptime = *current->uptime;
    }
    return result;
}

int __wrap_system(const char* command) {
    if (current != nullptr) {
        current->commands.emplace_back(command);
        if (current->systemStatus) {
            return *current->systemStatus;
        }
    }
    return __real_system(command);
}

}  // extern "C"
