#include "driver/MainDriver.h"

#include <sys/sysinfo.h>
#include <syslog.h>
#include <unistd.h>

#include <boost/filesystem/operations.hpp>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <iostream>
#include <memory>

#include "driver/DebugConfig.h"
#include "driver/InitServices.h"
#include "driver/ProfilingLog.h"
#include "driver/RunOnceRecord.h"
#include "graph/DotWriter.h"
#include "graph/Executor.h"
#include "graph/InitBarrier.h"
#include "graph/KeepUntilExit.h"
#include "plugins/DebugPlugin.h"
#include "plugins/PluginLoader.h"

namespace vantor {

MainDriver::MainDriver(int argc, char** argv) : config(RunConfig::Instance()) {
    gettimeofday(&startTime, nullptr);
    struct sysinfo system {};
    sysinfo(&system);
    uptimeSeconds = static_cast<std::uint64_t>(system.uptime);
    earlyExit = ParseCommandLine(argc, argv, config, options);
}

int MainDriver::Run() {
    if (earlyExit) {
        return *earlyExit;
    }
    if (options.init) {
        LaunchSyslogDaemon();
        StartEventDaemon();
    }
    try {
        // A relative directory is meant from where the caller stands, so before leaving it.
        config.pluginDirectory = boost::filesystem::system_complete(options.pluginDirectory);
        DetachFromCaller();
        Work();
    } catch (const std::exception& exception) {
        ExplainFailure(exception);
    }
    timeval endTime{};
    gettimeofday(&endTime, nullptr);
    if (!config.invoke) {
        WriteProfilingLog(startTime, endTime, uptimeSeconds, nodes, config);
    }
    if (options.init) {
        ReloadSyslog();
    }
    return succeeded ? EXIT_SUCCESS : EXIT_FAILURE;
}

void MainDriver::DetachFromCaller() const {
    if (chdir("/") != 0) {
        syslog(LOG_INFO, "unable to change filesystem root: %s", std::strerror(errno));
    }
    if (setsid() < 0) {
        syslog(LOG_ERR, "unable to create session: %s", std::strerror(errno));
    }
}

void MainDriver::Work() {
    bootFlags = options.pluginFlags;
    LoadPlugins();
    nodes.insert(nodes.end(), plugins.begin(), plugins.end());
    if (options.dump) {
        succeeded = DumpGraph();
        return;
    }
    RunGraph();
    succeeded = true;
}

void MainDriver::LoadPlugins() {
    if (options.selectedPlugins.empty()) {
        LoadDirectory();
        return;
    }
    for (const std::string& fileName : options.selectedPlugins) {
        LoadFile(fileName);
    }
}

// Every debug entry yields a plugin here, whether or not a marker file of its name has yielded one
// already: the entries alone are enough to inject a command, and a marker is enough under --plugin.
void MainDriver::LoadDirectory() {
    const std::list<DebugEntry> debugEntries = ReadDebugConfig();
    for (const auto& entry : boost::filesystem::directory_iterator(config.pluginDirectory)) {
        LoadFile(entry.path().filename().string());
    }
    for (const DebugEntry& entry : debugEntries) {
        auto plugin = std::make_unique<DebugPlugin>(entry.name, entry.requiredBarriers,
                                                    entry.providedBarriers, entry.command);
        KeepUntilExit(*plugin);
        plugins.push_back(plugin.release());
    }
}

void MainDriver::LoadFile(const std::string& fileName) {
    LoadPlugin(fileName, plugins, bootFlags, config.disabledPlugins, options.runOncePlugins,
               config);
}

// Without a path the stream stays closed and swallows the drawing: callers rely on a quiet success.
bool MainDriver::DumpGraph() const {
    std::ofstream stream;
    if (options.dumpPath) {
        stream.open(*options.dumpPath, std::ios_base::out | std::ios_base::trunc);
        if (!stream.is_open()) {
            return false;
        }
    }
    stream << "digraph g {" << std::endl;
    for (const Plugin* node : nodes) {
        WriteDot(*node, stream);
    }
    for (const InitBarrier* barrier : InitBarrier::All()) {
        WriteDot(*barrier, stream);
    }
    stream << "}" << std::endl;
    return true;
}

void MainDriver::RunGraph() {
    Executor executor(config.threads, config.randomize);
    Node::RunAll(nodes, executor);
    WriteRunOnceRecord(options.runOncePlugins);
}

void MainDriver::ExplainFailure(const std::exception& exception) const {
    syslog(LOG_ERR, "unhandled exception whilst enumerating plugins: %s", exception.what());
    std::cerr << (config.invoke
                      ? "Activating plugins has failed. An unhandled error has occurred.  "
                      : "Failed to boot the system.  An unhandled error has occurred.  ")
              << "This may be caused by a bad vantor plugin being installed on your system."
              << std::endl
              << "Details:" << std::endl
              << exception.what() << std::endl;
}

}  // namespace vantor
