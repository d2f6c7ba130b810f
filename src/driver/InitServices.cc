#include "driver/InitServices.h"

#include <syslog.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <iostream>
#include <optional>
#include <string>
#include <typeinfo>

#include "io/ChildProcess.h"

namespace vantor {

namespace {

constexpr const char* syslogDaemon = "/usr/lib/nuvex/nvsyslog/bin/nvsyslogd";
constexpr const char* eventDaemonScript = "/etc/init.d/nvevtd";
constexpr const char* oldSyslogConfig = "/etc/syslog.conf";
constexpr const char* upgradeScript = "/usr/lib/nuvex/nvsyslog/bin/upgrade-syslog.conf.sh";
constexpr const char* syslogPidFile = "/var/run/nuvex/nvsyslogd.pid";

// Runs the service program with one argument and waits for it. Returns the errno of a failed exec;
// 0 otherwise, a failed fork included, which nobody is told of.
int RunService(const char* path, const char* argument) {
    std::string program = path;
    std::string word = argument;
    const std::array<char*, 3> arguments = {program.data(), word.data(), nullptr};
    const std::array<char*, 1> environment = {nullptr};
    ChildSetup setup;
    setup.path = program.c_str();
    setup.arguments = arguments.data();
    setup.environment = environment.data();
    for (std::FILE* stream : {stdin, stdout, stderr}) {
        setup.kept.Add(fileno(stream));
    }
    const ChildOutcome outcome = RunChild(setup);
    return outcome.step == ChildStep::Exec ? outcome.error : 0;
}

// The process id in the pid file; nothing for text that is none. Only a positive number names one
// process: kill(2) takes the others for groups of processes.
std::optional<pid_t> ReadPid(std::istream& stream) {
    pid_t pid = 0;
    try {
        if (!(stream >> pid) || pid <= 0) {
            return std::nullopt;
        }
    } catch (const std::bad_cast&) {
        return std::nullopt;
    }
    return pid;
}

}  // namespace

void LaunchSyslogDaemon() {
    if (const int error = RunService(syslogDaemon, "-i"); error != 0) {
        std::cerr << "execve(" << syslogDaemon << ", ...) failure: " << std::strerror(error)
                  << std::endl;
    }
}

void StartEventDaemon() {
    if (const int error = RunService(eventDaemonScript, "start"); error != 0) {
        syslog(LOG_ERR, "execve(%s) failure: %s", eventDaemonScript, std::strerror(error));
    }
}

void ReloadSyslog() {
    if (access(oldSyslogConfig, F_OK) == 0 && std::system(upgradeScript) == -1) {
        syslog(LOG_ERR, "failed to call %s", upgradeScript);
    }
    std::ifstream pidFile(syslogPidFile);
    if (!pidFile.is_open()) {
        syslog(LOG_WARNING, "%s", "unable to open nvksyslogd pid file");
        return;
    }
    const std::optional<pid_t> pid = ReadPid(pidFile);
    if (!pid) {
        syslog(LOG_ERR, "%s", "unable to read nvsyslogd pid");
        return;
    }
    if (kill(*pid, SIGUSR1) != 0) {
        syslog(LOG_WARNING, "failed to reload nvsyslogd: %s", std::strerror(errno));
    }
}

}  // namespace vantor
