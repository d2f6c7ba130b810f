#include "json/JSONPlugin.h"

#include <sys/stat.h>

#include <fstream>
#include <utility>

#include "json/JsonReader.h"
#include "json/RunCommand.h"
#include "plugins/Exceptions.h"

namespace vantor {

namespace {

constexpr std::int32_t oldestVersion = 1;
constexpr std::int32_t newestVersion = 4;
constexpr std::int32_t hostProfileVersion = 2;  // first version with "apply_host_profile"
constexpr std::int32_t flagsVersion = 3;        // first version with flags and run-once

// Opening anything but a regular file could block for ever. Asked of the system rather than of
// Boost, whose answer on a 32-bit host is an error for a file of the time after 2038.
JsonValue ReadDocument(const std::string& path) {
    struct stat status {};
    std::ifstream stream;
    if (stat(path.c_str(), &status) == 0 && S_ISREG(status.st_mode)) {
        stream.open(path, std::ios_base::in | std::ios_base::binary);
    }
    if (!stream.is_open()) {
        throw InvalidPluginException(path, "no such file or directory");
    }
    SetReaderOption(true);
    JsonValue root;
    ReadValue(stream, root);
    if (root.kind != JsonKind::Object) {
        throw InvalidPluginException(path, "plugin root is not an object");
    }
    return root;
}

// Truncated toward zero. Every number that no version has is as good as 0, so that none is
// converted that a 32-bit integer cannot hold.
std::int32_t ToVersion(double number) {
    const bool known = number >= oldestVersion && number < newestVersion + 1.0;
    return known ? static_cast<std::int32_t>(number) : 0;
}

std::list<std::string> ReadNames(JsonValue& metadata, const std::string& key,
                                 const std::string& path) {
    const JsonValue& names = metadata[key];
    if (names.kind != JsonKind::Array) {
        throw InvalidPluginException(path, "metadata is corrupt (unable to parse " + key + ")");
    }
    std::list<std::string> result;
    for (const JsonValue& name : names.elements) {
        if (name.kind != JsonKind::String) {
            throw InvalidPluginException(path, key + " tag is not a string");
        }
        result.push_back(name.text);
    }
    return result;
}

std::set<std::string> ReadFlags(JsonValue& metadata, const std::string& key,
                                const std::string& path) {
    if (metadata.Find(key) == nullptr) {
        return {};
    }
    const std::list<std::string> flags = ReadNames(metadata, key, path);
    return {flags.begin(), flags.end()};
}

// `keyText` is how messages spell the key that `commands` was found under.
void AppendCommands(const JsonValue& commands, const std::string& keyText, const std::string& path,
                    std::list<std::string>& result) {
    if (commands.kind != JsonKind::Array) {
        throw InvalidPluginException(path,
                                     "operations is corrupt (unable to parse " + keyText + ")");
    }
    for (const JsonValue& command : commands.elements) {
        if (command.kind != JsonKind::String) {
            throw InvalidPluginException(path, "command is not a string");
        }
        result.push_back(command.text);
    }
}

}  // namespace

JSONPlugin::JSONPlugin(std::string pluginName, const std::string& path)
    : Plugin(std::move(pluginName)) {
    JsonValue root = ReadDocument(path);
    JsonValue& metadata = root["metadata"];
    if (metadata.kind != JsonKind::Object) {
        throw InvalidPluginException(path, "invalid metadata interface");
    }
    ReadMetadata(metadata, path);
    JsonValue& operations = root["operations"];
    if (operations.kind != JsonKind::Object) {
        throw InvalidPluginException(path, "invalid operations interface");
    }
    ReadOperations(operations, path);
}

void JSONPlugin::ReadMetadata(JsonValue& metadata, const std::string& path) {
    const JsonValue& version = metadata["version"];
    if (version.kind != JsonKind::Number) {
        throw InvalidPluginException(path, "metadata is corrupt (unable to parse version)");
    }
    apiVersion = ToVersion(version.number);
    if (apiVersion < oldestVersion) {
        throw InvalidPluginException(path, "Unsupported API version");
    }
    Provide(ReadNames(metadata, "provides", path));
    Require(ReadNames(metadata, "requires", path));
    if (apiVersion < flagsVersion) {
        return;
    }
    requiredFlags = ReadFlags(metadata, "required_flags", path);
    disablingFlags = ReadFlags(metadata, "disabling_flags", path);
    const JsonValue& runOnceValue = metadata["run_once"];
    if (runOnceValue.kind != JsonKind::Boolean) {
        throw InvalidPluginException(path, "metadata is corrupt (unable to parse run_once)");
    }
    runOnce = runOnceValue.flag;
    const JsonValue& pluginVersionValue = metadata["plugin_version"];
    if (pluginVersionValue.kind != JsonKind::String) {
        throw InvalidPluginException(path, "metadata is corrupt (unable to parse plugin_version)");
    }
    pluginVersion = pluginVersionValue.text;
}

void JSONPlugin::ReadOperations(JsonValue& operations, const std::string& path) {
    AppendCommands(operations["start"], "start", path, startCommands);
    const JsonValue* const hostProfile = operations.Find("apply_host_profile");
    if (apiVersion >= hostProfileVersion && hostProfile != nullptr) {
        AppendCommands(*hostProfile, "apply-host-profile", path, applyHostProfileCommands);
    }
}

void JSONPlugin::Start() {
    for (const std::string& command : startCommands) {
        RunCommand(command, "start", Name());
    }
}

bool JSONPlugin::SupportsHostProfile() const {
    return apiVersion >= hostProfileVersion && !applyHostProfileCommands.empty();
}

void JSONPlugin::ApplyHostProfile() {
    if (apiVersion < hostProfileVersion) {
        // Logs are searched for this spelling, which is not that of the other kinds.
        throw NotImplementedException("json_plugin::ApplyHostProfile");
    }
    for (const std::string& command : applyHostProfileCommands) {
        RunCommand(command, "apply host profile", Name());
    }
}

}  // namespace vantor
