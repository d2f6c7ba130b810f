#include "image/DirectoryReader.h"

#include <limits.h>
#include <stdlib.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <memory>
#include <new>
#include <optional>
#include <stdexcept>
#include <system_error>
#include <utility>

#include "image/Architecture.h"
#include "image/CommandDescriptions.h"
#include "image/DebugDescription.h"
#include "image/DocumentDescription.h"
#include "image/ImageFile.h"
#include "image/LinkScope.h"
#include "image/LinkerCache.h"
#include "image/NativeDescription.h"
#include "image/Ownership.h"
#include "plugins/Exceptions.h"
#include "plugins/FilterRules.h"

namespace vantor::analyze {

namespace {

// A file of the plugin directory, its name taken apart as the boot does.
struct PluginFile {
    std::string fileName;
    std::string name;       // of the plugin
    std::string extension;  // behind the last "."
};

std::string Join(const std::string& folder, const std::string& name) {
    return !folder.empty() && folder.back() == '/' ? folder + name : folder + "/" + name;
}

// As the boot does, which leaves links and dots in a relative path as they are.
std::string Absolute(const std::string& path) {
    if (!path.empty() && path.front() == '/') {
        return path;
    }
    const std::unique_ptr<char, void (*)(void*)> here(getcwd(nullptr, 0), free);
    return here == nullptr ? path : Join(here.get(), path);
}

// The reading of one plugin directory.
class Directory {
public:
    Directory(const HostImage& hostImage, const BootOptions& bootOptions, Findings& allFindings)
        : image(hostImage),
          options(bootOptions),
          findings(allFindings),
          bootFolder(Absolute(options.directory)),
          runOnceRecord(options.runOncePlugins),
          debug(image, findings),
          ownership(image),
          commands(image, ownership, findings) {}

    BootModel Read();

private:
    void CheckFolders();
    void CheckOwner(const std::string& path, const ImageFile& file);
    void DropRefused(const std::set<std::string>& paths);
    std::optional<Architecture> FindArchitecture(const std::vector<std::string>& names) const;
    void ReadFile(const std::string& fileName);
    void ReadPlugin(const PluginFile& file);
    void ReadNativeFile(const PluginFile& file, const PluginSource& source);
    void ReadDocumentFile(const PluginFile& file, const PluginSource& source);
    bool IsReadable(const ImageFile& file, const PluginSource& source);
    void Reject(const PluginSource& source, const std::string& reason);
    void Add(const PluginFile& file, PluginDescription plugin);

    const HostImage& image;
    const BootOptions& options;
    Findings& findings;
    const std::string bootFolder;  // the directory as the boot's messages name it
    std::set<std::string> runOnceRecord;
    DebugDescription debug;
    Ownership ownership;
    CommandDescriptions commands;
    std::optional<LinkScope> scope;  // made for the first native plugin
    std::optional<Architecture> boot;
    BootModel model;
};

BootModel Directory::Read() {
    if (image.IsElsewhere() && (options.directory.empty() || options.directory.front() != '/')) {
        throw std::runtime_error(options.directory +
                                 ": the directory of a host in a folder begins with \"/\"");
    }
    const std::vector<std::string> names = ListImageFolder(image, options.directory);
    CheckFolders();
    boot = FindArchitecture(names);
    for (const std::string& name : names) {
        ReadFile(name);
    }
    commands.CheckFolders(model, findings);
    if (scope) {
        DropRefused(scope->Report(findings));
        for (const std::string& library : scope->Libraries()) {
            CheckOwner(library, ReadImageFile(image, library, 0));
        }
    }
    for (PluginDescription& plugin : debug.OfConfiguration(findings)) {
        model.plugins.push_back(std::move(plugin));
    }
    model.LinkBarriers();
    return std::move(model);
}

// What the linker refuses is known only when all is there.
void Directory::DropRefused(const std::set<std::string>& paths) {
    const auto isRefused = [&](const PluginDescription& plugin) {
        return paths.count(plugin.place.path) != 0;
    };
    model.plugins.erase(std::remove_if(model.plugins.begin(), model.plugins.end(), isRefused),
                        model.plugins.end());
    model.notLoaded.insert(model.notLoaded.end(), paths.begin(), paths.end());
}

void Directory::CheckFolders() {
    ownership.CheckFoldersOf(Join(options.directory, "."), findings);
    for (const char* const path :
         {HostImage::debugConfiguration, HostImage::program, LinkerCache::path}) {
        CheckOwner(path, ReadImageFile(image, path, 0));
    }
}

// Of a file with the folders that it lies in, under its own name and where that leads.
void Directory::CheckOwner(const std::string& path, const ImageFile& file) {
    ownership.CheckFoldersOf(path, findings);
    if (file.kind != ImageFile::Kind::Missing) {
        ownership.Check(path, file.status, findings);
        ownership.CheckFoldersOf(ResolveInImage(image, path), findings);
    }
}

std::optional<Architecture>
Directory::FindArchitecture(const std::vector<std::string>& names) const {
    if (const std::optional<Architecture> program = ProgramArchitecture(image)) {
        return program;
    }
    constexpr std::string_view objectExtension = ".so";
    ArchitectureVote vote;
    for (const std::string& name : names) {
        if (name.size() < objectExtension.size() ||
            name.compare(name.size() - objectExtension.size(), std::string::npos,
                         objectExtension) != 0) {
            continue;
        }
        const ImageFile file =
            ReadImageFile(image, Join(options.directory, name), architectureBytes);
        if (const std::optional<Architecture> kind = ArchitectureOf(file.content)) {
            vote.Count(*kind);
        }
    }
    return vote.Winner();
}

void Directory::ReadFile(const std::string& fileName) {
    static const std::string libraryPrefix = "lib";
    const std::size_t dot = fileName.rfind('.');
    const auto ignore = [this, &fileName](const std::string& type) {
        findings.push_back({Severity::Warning,
                            "ignored-file",
                            {Join(options.directory, fileName), 0, 0},
                            "ignoring plugin '" + fileName + "' of " + type + "..."});
    };
    if (dot == std::string::npos) {
        ignore("unspecified type");
        return;
    }
    PluginFile file{fileName, fileName.substr(0, dot), fileName.substr(dot + 1)};
    if (file.name.compare(0, libraryPrefix.size(), libraryPrefix) == 0) {
        file.name.erase(0, libraryPrefix.size());
    }
    if (file.extension == "so" || file.extension == "json" || file.extension == "debug") {
        try {
            ReadPlugin(file);
        } catch (const std::bad_alloc&) {
            findings.push_back({Severity::Error,
                                "unreadable",
                                {Join(options.directory, fileName), 0, 0},
                                "cannot be read: " + std::generic_category().message(ENOMEM)});
        }
    } else {
        ignore("unknown type (" + file.extension + ")");
    }
}

void Directory::ReadPlugin(const PluginFile& file) {
    const PluginSource source{{Join(options.directory, file.fileName), 0, 0},
                              Join(bootFolder, file.fileName)};
    const std::size_t before = model.plugins.size();
    if (file.extension == "so") {
        ReadNativeFile(file, source);
    } else if (file.extension == "json") {
        ReadDocumentFile(file, source);
    } else {
        for (PluginDescription& plugin : debug.OfMarker(file.name, source.place, findings)) {
            model.plugins.push_back(std::move(plugin));
        }
        return;
    }
    if (model.plugins.size() == before) {
        model.notLoaded.push_back(source.place.path);
    }
}

void Directory::Reject(const PluginSource& source, const std::string& reason) {
    findings.push_back({Severity::Error, "rejected", source.place,
                        InvalidPluginException(source.bootPath, reason).what()});
}

// Tells of a file that only root can read.
bool Directory::IsReadable(const ImageFile& file, const PluginSource& source) {
    if (file.kind == ImageFile::Kind::Unreadable) {
        findings.push_back({Severity::Error, "unreadable", source.place,
                            "cannot be read: " + std::generic_category().message(file.error)});
        return false;
    }
    return true;
}

void Directory::ReadNativeFile(const PluginFile& file, const PluginSource& source) {
    const ImageFile object = ReadImageFile(image, source.place.path);
    if (!IsReadable(object, source)) {
        return;
    }
    CheckOwner(source.place.path, object);
    if (object.kind == ImageFile::Kind::Missing) {
        Reject(source, source.bootPath + ": cannot open shared object file: " +
                           std::generic_category().message(object.error));
    } else if (object.kind == ImageFile::Kind::Folder) {
        Reject(source, source.bootPath + ": cannot read file data: Is a directory");
    } else if (object.kind == ImageFile::Kind::Irregular) {
        Reject(source, "not a regular file");
    } else {
        // Without any ELF file in the directory every architecture refuses this one alike.
        const Architecture architecture = boot.value_or(Architecture{});
        if (!scope) {
            scope.emplace(image, architecture);
        }
        PluginSource identified = source;
        identified.file = {object.status.st_dev, object.status.st_ino};
        std::optional<NativeReading> reading =
            ReadNative(object.content, architecture, identified, findings, &*scope);
        if (reading) {
            scope->Keep(reading->opened, std::move(reading->sharedParts));
            Add(file, std::move(reading->plugin));
        }
    }
}

void Directory::ReadDocumentFile(const PluginFile& file, const PluginSource& source) {
    const ImageFile document = ReadImageFile(image, source.place.path);
    if (!IsReadable(document, source)) {
        return;
    }
    CheckOwner(source.place.path, document);
    if (document.kind != ImageFile::Kind::Regular) {
        RejectMissingDocument(source, findings);
        return;
    }
    std::optional<PluginDescription> plugin = ReadDocument(document.content, source, findings);
    if (!plugin) {
        return;
    }
    for (const Command& command : plugin->commands) {
        commands.Check(command, findings);
    }
    Add(file, std::move(*plugin));
}

void Directory::Add(const PluginFile& file, PluginDescription plugin) {
    plugin.name = file.name;
    const FilteredPlugin facts{plugin.name, plugin.pluginVersion, plugin.runOnce,
                               plugin.requiredFlags, plugin.disablingFlags};
    FilterVerdict verdict = JudgeFlags(facts, options.flags, options.disabledPlugins);
    if (verdict.KeepsOut()) {
        plugin.fate = PluginFate::Filtered;
    } else {
        verdict = JudgeRunOnce(facts, runOnceRecord);
        if (verdict.KeepsOut()) {
            plugin.fate = PluginFate::AlreadyRun;
        }
    }
    plugin.fateReason = std::move(verdict.message);
    model.plugins.push_back(std::move(plugin));
}

}  // namespace

BootModel ReadPlugins(const HostImage& image, const BootOptions& options, Findings& findings) {
    return Directory(image, options, findings).Read();
}

}  // namespace vantor::analyze
