#ifndef VANTOR_JSON_JSONPLUGIN_H
#define VANTOR_JSON_JSONPLUGIN_H

#include <list>
#include <string>

#include "plugins/Plugin.h"

namespace vantor {

struct PluginDocument;

// A plugin made from a JSON document: command lines of the host's management tool for each of its
// two methods. A command that fails is logged and keeps neither the next one from running nor the
// plugin from succeeding.
class JSONPlugin : public Plugin {
public:
    // Reads and checks the document at `path` and links the plugin to its barriers. Throws
    // InvalidPluginException with `path` and the first thing that is wrong; the barriers mentioned
    // until then stay known, without a link to this plugin.
    JSONPlugin(std::string pluginName, const std::string& path);

    // Runs the "start" commands, in document order. Throws what the command framework throws.
    void Start() override;

    bool SupportsHostProfile() const override;

    // Runs the "apply_host_profile" commands, if any. Throws NotImplementedException for a document
    // of version 1, or what the command framework throws.
    void ApplyHostProfile() override;

    const std::list<std::string>& StartCommands() const { return startCommands; }
    const std::list<std::string>& ApplyHostProfileCommands() const {
        return applyHostProfileCommands;
    }

private:
    void Link(const PluginDocument& document);

    std::list<std::string> startCommands;
    std::list<std::string> applyHostProfileCommands;  // empty below version 2
};

}  // namespace vantor

#endif
