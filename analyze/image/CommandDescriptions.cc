#include "image/CommandDescriptions.h"

#include <algorithm>
#include <list>
#include <system_error>
#include <utility>
#include <vector>

#include "basekit/CommandNamespace.h"
#include "basekit/CommandRegistry.h"
#include "basekit/DescriptionLoader.h"
#include "basekit/OptionBinder.h"
#include "image/ImageFile.h"
#include "platform/BaseKit.h"

namespace vantor::analyze {

namespace {

using BaseKit::impl::DescriptionFile;

// Below the folder of the descriptions, in the order in which they are read.
constexpr const char* folders[] = {"", "/int", "/int/ext", "/ext"};

// Reads one file of a folder as the boot would, but for links that leave the image.
DescriptionFile ReadFile(const HostImage& image, const std::string& path, Ownership& ownership,
                         Findings& findings) {
    const ImageFile file = ReadImageFile(image, path);
    if (file.kind != ImageFile::Kind::Missing) {
        ownership.Check(path, file.status, findings);
    }
    if (file.kind == ImageFile::Kind::Regular) {
        return BaseKit::impl::ParseDescriptionFile(path, file.content);
    }
    const bool unread =
        file.kind == ImageFile::Kind::Missing || file.kind == ImageFile::Kind::Unreadable;
    DescriptionFile none{path, {}, BaseKit::impl::Mistakes(path)};
    none.mistakes.Add("", unread ? "cannot read the file: " +
                                       std::generic_category().message(file.error)
                                 : "not a regular file");
    return none;
}

// Each mistake begins with the path of its file.
void Tell(const std::vector<std::string>& mistakes, const std::vector<std::string>& paths,
          Findings& findings) {
    for (const std::string& mistake : mistakes) {
        const auto path = std::find_if(paths.begin(), paths.end(), [&](const std::string& one) {
            return mistake.compare(0, one.size() + 2, one + ": ") == 0;
        });
        findings.push_back({Severity::Warning,
                            "bad-description",
                            {path == paths.end() ? std::string() : *path, 0, 0},
                            path == paths.end() ? mistake : mistake.substr(path->size() + 2)});
    }
}

}  // namespace

struct CommandDescriptions::Known {
    BaseKit::impl::CommandRegistry registry;
    bool anyFolder = false;
    // Made once: a copy of all commands, to explain unknown ones with.
    boost::shared_ptr<BaseKit::AutoCli::CommandNamespace> root;
};

CommandDescriptions::CommandDescriptions(const HostImage& image, Ownership& ownership,
                                         Findings& findings)
    : known(std::make_unique<Known>()) {
    for (const char* const below : folders) {
        const std::string folder = std::string(HostImage::commandDescriptions) + below;
        if (ReadImageFile(image, folder, 0).kind != ImageFile::Kind::Folder) {
            continue;
        }
        known->anyFolder = true;
        ownership.CheckFoldersOf(folder + "/.", findings);
        std::vector<std::string> paths;
        std::vector<DescriptionFile> files;
        for (const std::string& name : ListImageFolder(image, folder)) {
            if (BaseKit::impl::IsDescriptionName(name)) {
                paths.push_back(folder);
                paths.back().append("/").append(name);
                files.push_back(ReadFile(image, paths.back(), ownership, findings));
            }
        }
        try {
            known->registry.Add(std::move(files));
        } catch (const BaseKit::AutoCli::DescriptionError& error) {
            Tell(error.Mistakes(), paths, findings);
        }
    }
    known->root = known->registry.Commands()->Root();
}

CommandDescriptions::~CommandDescriptions() = default;

void CommandDescriptions::CheckFolders(const BootModel& model, Findings& findings) const {
    const bool anyCommand =
        std::any_of(model.plugins.begin(), model.plugins.end(),
                    [](const PluginDescription& plugin) { return !plugin.commands.empty(); });
    if (anyCommand && !known->anyFolder) {
        findings.push_back({Severity::Warning,
                            "no-descriptions",
                            {HostImage::commandDescriptions, 0, 0},
                            "there are no command descriptions here: no command of a JSON plugin "
                            "is known"});
    }
}

void CommandDescriptions::Check(const Command& command, Findings& findings) const {
    if (!known->anyFolder) {
        return;
    }
    BaseKit::AutoCli::OptionParser parser("nvcli");
    if (parser.ParseString(command.text)) {
        return;  // there is nothing to execute
    }
    const auto report = [&command, &findings](const std::string& code, const std::string& text) {
        findings.push_back(
            {Severity::Warning, code, command.place, "\"" + command.text + "\": " + text});
    };
    const std::vector<std::string> errors = parser.GetParseErrors();
    for (const std::string& error : errors) {
        report("bad-command", error);
    }
    if (!errors.empty()) {
        return;
    }
    const std::list<std::string> path = parser.GetCommandPath();
    const auto found = known->registry.Commands()->Find({path.begin(), path.end()});
    if (found == nullptr) {
        report("unknown-command", BaseKit::AutoCli::ExplainUnknownCommand(*known->root, path));
        return;
    }
    for (const std::string& error :
         BaseKit::impl::BindOptions(*found, parser.GetCommandParameters()).errors) {
        report("bad-command", error);
    }
}

}  // namespace vantor::analyze
