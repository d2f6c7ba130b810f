#include "json/PluginDocument.h"

#include <sys/stat.h>

#include <fstream>
#include <utility>

#include "json/JsonReader.h"

namespace vantor {

namespace {

constexpr std::int32_t oldestVersion = 1;
constexpr std::int32_t newestVersion = 4;
constexpr std::int32_t flagsVersion = 3;  // first version with flags and run-once

// Truncated toward zero. Every number that no version has is as good as 0, so that none is
// converted that a 32-bit integer cannot hold.
std::int32_t ToVersion(double number) {
    const bool known = number >= oldestVersion && number < newestVersion + 1.0;
    return known ? static_cast<std::int32_t>(number) : 0;
}

// Takes one document apart, in the order in which its rejections are promised.
class DocumentReader {
public:
    DocumentReader(const std::string& documentPath, PluginDocument& result)
        : path(documentPath), document(result) {}

    void Read(JsonValue& root);

private:
    [[noreturn]] void Reject(const std::string& reason, DocumentPlace place) const {
        throw DocumentRejection(path, reason, std::move(place));
    }
    void ReadMetadata(JsonValue& metadata);
    void ReadOperations(JsonValue& operations);
    std::list<std::string> ReadNames(JsonValue& metadata, const std::string& key) const;
    std::set<std::string> ReadFlags(JsonValue& metadata, const std::string& key) const;
    // `keyText` is how messages spell the key.
    void AppendCommands(const JsonValue& commands, const std::string& key,
                        const std::string& keyText, std::list<std::string>& result) const;

    const std::string& path;
    PluginDocument& document;
};

void DocumentReader::Read(JsonValue& root) {
    if (root.kind != JsonKind::Object) {
        Reject("plugin root is not an object", {});
    }
    JsonValue& metadata = root["metadata"];
    if (metadata.kind != JsonKind::Object) {
        Reject("invalid metadata interface", {{"metadata"}, {}});
    }
    ReadMetadata(metadata);
    JsonValue& operations = root["operations"];
    if (operations.kind != JsonKind::Object) {
        Reject("invalid operations interface", {{"operations"}, {}});
    }
    ReadOperations(operations);
}

void DocumentReader::ReadMetadata(JsonValue& metadata) {
    const JsonValue& version = metadata["version"];
    if (version.kind != JsonKind::Number) {
        Reject("metadata is corrupt (unable to parse version)", {{"metadata", "version"}, {}});
    }
    document.apiVersion = ToVersion(version.number);
    if (document.apiVersion < oldestVersion) {
        Reject("Unsupported API version", {{"metadata", "version"}, {}});
    }
    document.provided = ReadNames(metadata, "provides");
    document.required = ReadNames(metadata, "requires");
    if (document.apiVersion < flagsVersion) {
        return;
    }
    document.requiredFlags = ReadFlags(metadata, "required_flags");
    document.disablingFlags = ReadFlags(metadata, "disabling_flags");
    const JsonValue& runOnce = metadata["run_once"];
    if (runOnce.kind != JsonKind::Boolean) {
        Reject("metadata is corrupt (unable to parse run_once)", {{"metadata", "run_once"}, {}});
    }
    document.runOnce = runOnce.flag;
    const JsonValue& pluginVersion = metadata["plugin_version"];
    if (pluginVersion.kind != JsonKind::String) {
        Reject("metadata is corrupt (unable to parse plugin_version)",
               {{"metadata", "plugin_version"}, {}});
    }
    document.pluginVersion = pluginVersion.text;
}

std::list<std::string> DocumentReader::ReadNames(JsonValue& metadata,
                                                 const std::string& key) const {
    const JsonValue& names = metadata[key];
    if (names.kind != JsonKind::Array) {
        Reject("metadata is corrupt (unable to parse " + key + ")", {{"metadata", key}, {}});
    }
    std::list<std::string> result;
    for (const JsonValue& name : names.elements) {
        if (name.kind != JsonKind::String) {
            Reject(key + " tag is not a string", {{"metadata", key}, result.size()});
        }
        result.push_back(name.text);
    }
    return result;
}

std::set<std::string> DocumentReader::ReadFlags(JsonValue& metadata, const std::string& key) const {
    if (metadata.Find(key) == nullptr) {
        return {};
    }
    const std::list<std::string> flags = ReadNames(metadata, key);
    return {flags.begin(), flags.end()};
}

void DocumentReader::ReadOperations(JsonValue& operations) {
    AppendCommands(operations["start"], "start", "start", document.startCommands);
    const JsonValue* const hostProfile = operations.Find("apply_host_profile");
    if (document.apiVersion >= hostProfileDocumentVersion && hostProfile != nullptr) {
        AppendCommands(*hostProfile, "apply_host_profile", "apply-host-profile",
                       document.applyHostProfileCommands);
    }
}

void DocumentReader::AppendCommands(const JsonValue& commands, const std::string& key,
                                    const std::string& keyText,
                                    std::list<std::string>& result) const {
    if (commands.kind != JsonKind::Array) {
        Reject("operations is corrupt (unable to parse " + keyText + ")",
               {{"operations", key}, {}});
    }
    for (const JsonValue& command : commands.elements) {
        if (command.kind != JsonKind::String) {
            Reject("command is not a string", {{"operations", key}, result.size()});
        }
        result.push_back(command.text);
    }
}

}  // namespace

DocumentRejection::DocumentRejection(const std::string& path, const std::string& reason,
                                     DocumentPlace where)
    : InvalidPluginException(path, reason), place(std::move(where)) {}

// Opening anything but a regular file could block for ever. Asked of the system rather than of
// Boost, whose answer on a 32-bit host is an error for a file of the time after 2038.
void ReadPluginDocument(const std::string& path, PluginDocument& document) {
    struct stat status {};
    std::ifstream stream;
    if (stat(path.c_str(), &status) == 0 && S_ISREG(status.st_mode)) {
        stream.open(path, std::ios_base::in | std::ios_base::binary);
    }
    if (!stream.is_open()) {
        throw DocumentRejection(path, "no such file or directory", {});
    }
    ReadPluginDocument(stream, path, document);
}

void ReadPluginDocument(std::istream& stream, const std::string& path, PluginDocument& document) {
    SetReaderOption(true);
    JsonValue root;
    ReadValue(stream, root);
    DocumentReader(path, document).Read(root);
}

}  // namespace vantor
