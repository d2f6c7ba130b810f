// Plugin::Run(), the execution wrapper common to all kinds of plugin.

#include <syslog.h>

#include <exception>
#include <iostream>

#include "driver/RunConfig.h"
#include "plugins/HostProfile.h"
#include "plugins/InteractivePrompt.h"
#include "plugins/InvokeMethod.h"
#include "plugins/Plugin.h"

namespace vantor {

namespace {

timeval Now() {
    timeval now{};
    gettimeofday(&now, nullptr);
    return now;
}

// One write a line, so that the lines of parallel workers stay whole.
void Trace(const std::string& line) { std::cout << line + "\n" << std::flush; }

}  // namespace

void Plugin::Run() {
    const RunConfig& config = RunConfig::Instance();
    const timeval begin = Now();
    if (config.interactive && !PassInteractiveGate(Name())) {
        return;
    }
    startTime = begin;
    if (config.trace) {
        Trace("starting execution of plugin: " + Name());
    }
    try {
        RunMethod();
    } catch (const std::exception& exception) {
        syslog(LOG_ERR, "unhandled exception whilst processing %s: %s", Name().c_str(),
               exception.what());
    } catch (...) {
        syslog(LOG_ERR, "ignoring unknown exception whilst processing %s ...", Name().c_str());
    }
    endTime = Now();
    if (config.trace) {
        Trace("completed execution of plugin: " + Name() + " (took " +
              std::to_string(static_cast<std::uint64_t>(ElapsedMicroseconds())) + " us)");
    }
}

void Plugin::RunMethod() {
    const RunConfig& config = RunConfig::Instance();
    if (!config.method.empty()) {
        InvokeMethod(*this, config.method);
    } else if (SupportsHostProfile() && HostProfilePresent()) {
        syslog(LOG_INFO, "executing host profile plugin: %s", Name().c_str());
        ApplyHostProfile();
    } else {
        syslog(LOG_INFO, "executing start plugin: %s", Name().c_str());
        Start();
    }
}

}  // namespace vantor
