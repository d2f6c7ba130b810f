#include "json/JSONPlugin.h"

#include <utility>

#include "json/PluginDocument.h"
#include "json/RunCommand.h"
#include "plugins/Exceptions.h"

namespace vantor {

JSONPlugin::JSONPlugin(std::string pluginName, const std::string& path)
    : Plugin(std::move(pluginName)) {
    PluginDocument document;
    try {
        ReadPluginDocument(path, document);
    } catch (...) {
        // Barriers that a document mentions before its fault come into being all the same.
        Link(document);
        throw;
    }
    Link(document);
    apiVersion = document.apiVersion;
    requiredFlags = std::move(document.requiredFlags);
    disablingFlags = std::move(document.disablingFlags);
    runOnce = document.runOnce;
    pluginVersion = std::move(document.pluginVersion);
    startCommands = std::move(document.startCommands);
    applyHostProfileCommands = std::move(document.applyHostProfileCommands);
}

void JSONPlugin::Link(const PluginDocument& document) {
    Provide(document.provided);
    Require(document.required);
}

void JSONPlugin::Start() {
    for (const std::string& command : startCommands) {
        RunCommand(command, "start", Name());
    }
}

bool JSONPlugin::SupportsHostProfile() const {
    return apiVersion >= hostProfileDocumentVersion && !applyHostProfileCommands.empty();
}

void JSONPlugin::ApplyHostProfile() {
    if (apiVersion < hostProfileDocumentVersion) {
        // Logs are searched for this spelling, which is not that of the other kinds.
        throw NotImplementedException("json_plugin::ApplyHostProfile");
    }
    for (const std::string& command : applyHostProfileCommands) {
        RunCommand(command, "apply host profile", Name());
    }
}

}  // namespace vantor
