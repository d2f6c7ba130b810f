#include "plugins/PluginLoader.h"

#include <syslog.h>

#include <cerrno>
#include <exception>
#include <memory>

#include "driver/DebugConfig.h"
#include "graph/KeepUntilExit.h"
#include "graph/SystemAlert.h"
#include "json/JSONPlugin.h"
#include "plugins/DebugPlugin.h"
#include "plugins/NativePlugin.h"
#include "plugins/PluginFilters.h"
#include "plugins/SystemLog.h"

namespace vantor {

namespace {

// A file name taken apart: "libfoo.so" is the plugin "foo" with the extension "so".
struct PluginFile {
    std::string fileName;
    std::string name;
    std::string extension;
};

// `dot` is the position of the last "." of the file name.
PluginFile TakeApart(const std::string& fileName, std::size_t dot) {
    static const std::string libraryPrefix = "lib";
    PluginFile file{fileName, fileName.substr(0, dot), fileName.substr(dot + 1)};
    if (file.name.compare(0, libraryPrefix.size(), libraryPrefix) == 0) {
        file.name.erase(0, libraryPrefix.size());
    }
    return file;
}

// From here on the plugin lives until the process ends, whether or not it is to run.
Plugin& Keep(std::unique_ptr<Plugin> plugin) {
    KeepUntilExit(*plugin);
    return *plugin.release();
}

void QueueDebugPlugins(const PluginFile& file, const std::list<DebugEntry>& entries,
                       PluginQueue& plugins) {
    for (const DebugEntry& entry : entries) {
        if (entry.name == file.name) {
            plugins.push_back(&Keep(std::make_unique<DebugPlugin>(
                entry.name, entry.requiredBarriers, entry.providedBarriers, entry.command)));
        }
    }
}

// Null, and a word in syslog, for an extension that no kind of plugin has.
std::unique_ptr<Plugin> Construct(const PluginFile& file, const RunConfig& config) {
    const std::string path = (config.pluginDirectory / file.fileName).string();
    if (file.extension == "so") {
        return std::make_unique<NativePlugin>(file.name, path);
    }
    if (file.extension == "json") {
        return std::make_unique<JSONPlugin>(file.name, path);
    }
    syslog(LOG_WARNING, "ignoring plugin '%s' of unknown type (%s)...", file.fileName.c_str(),
           file.extension.c_str());
    return nullptr;
}

void ReportFailure(const std::string& text) {
    const int error = errno;
    RaiseSystemAlert(text);
    LogFormat(LOG_WARNING, text, error);
}

}  // namespace

void LoadPlugin(const std::string& fileName, PluginQueue& plugins,
                const std::set<std::string>& bootFlags, const std::list<std::string>& blacklist,
                std::set<std::string>& runOnceRecord, const RunConfig& config) {
    const std::size_t dot = fileName.rfind('.');
    if (dot == std::string::npos) {
        syslog(LOG_WARNING, "ignoring plugin '%s' of unspecified type...", fileName.c_str());
        return;
    }
    const PluginFile file = TakeApart(fileName, dot);
    const std::list<DebugEntry> debugEntries = ReadDebugConfig();
    try {
        if (file.extension == "debug") {
            QueueDebugPlugins(file, debugEntries, plugins);
            return;
        }
        std::unique_ptr<Plugin> constructed = Construct(file, config);
        if (constructed == nullptr) {
            return;
        }
        Plugin& plugin = Keep(std::move(constructed));
        if (IsFilteredOut(plugin, bootFlags, blacklist)) {
            plugin.MarkDone();
            return;
        }
        plugins.push_back(&plugin);
        if (HasAlreadyRun(plugin, runOnceRecord)) {
            plugin.MarkDone();
        }
    } catch (const std::exception& exception) {
        ReportFailure("exception occurred whilst loading plugin " + fileName + ": " +
                      exception.what());
    } catch (...) {
        ReportFailure("unknown exception occurred whilst loading plugin " + fileName);
    }
}

}  // namespace vantor
