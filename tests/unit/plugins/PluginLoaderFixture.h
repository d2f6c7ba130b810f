#ifndef VANTOR_PLUGINS_TESTS_PLUGINLOADERFIXTURE_H
#define VANTOR_PLUGINS_TESTS_PLUGINLOADERFIXTURE_H

#include <gtest/gtest.h>

#include <list>
#include <set>
#include <string>
#include <vector>

#include "graph/InitBarrier.h"
#include "plugins/PluginLoader.h"
#include "plugins/TestObjects.h"
#include "support/AlertRecorder.h"
#include "support/PrivateRoot.h"
#include "support/RunConfigReset.h"
#include "support/SyslogCapture.h"

namespace vantor::support {

// A host with an empty plugin directory, and what the loader is given and leaves behind.
class PluginLoaderTest : public ::testing::Test {
protected:
    PluginLoaderTest() {
        OpenFault().Reset();
        root.MakeFolder("/plugins");
        config.pluginDirectory = root.Path("/plugins");
    }

    std::string PluginPath(const std::string& fileName) const {
        return root.Path("/plugins/" + fileName);
    }

    // Puts a copy of the built object of that name into the plugin directory.
    void AddObject(const std::string& fileName, const std::string& object) const {
        root.Write("/plugins/" + fileName, ReadFile(ObjectPath(object)));
    }

    void WriteDebugConfig(const std::string& content) const {
        root.Write("/etc/nuvex/vantor/debug.conf", content);
    }

    void Load(const std::string& fileName) {
        LoadPlugin(fileName, plugins, bootFlags, blacklist, runOnceRecord, config);
    }

    // The names of the plugins in the queue.
    std::vector<std::string> Queue() const {
        std::vector<std::string> names;
        for (const Plugin* plugin : plugins) {
            names.push_back(plugin->Name());
        }
        return names;
    }

    PrivateRoot root;
    AlertRecorder alerts;
    SyslogCapture log;
    RunConfig& config = ResetRunConfig();
    PluginQueue plugins;
    std::set<std::string> bootFlags;
    std::list<std::string> blacklist;
    std::set<std::string> runOnceRecord;
};

}  // namespace vantor::support

#endif
