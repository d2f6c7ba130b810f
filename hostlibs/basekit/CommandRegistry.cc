#include "basekit/CommandRegistry.h"

#include <algorithm>
#include <utility>

namespace BaseKit::impl {

namespace {

// Adds the commands of a file. Those that the tree does not take leave the file, with a mistake.
void AddTo(CommandTree& tree, DescriptionFile& file) {
    std::vector<DescribedCommand> added;
    for (DescribedCommand& described : file.commands) {
        const std::string reason = tree.Add(described.command);
        if (reason.empty()) {
            added.push_back(std::move(described));
        } else {
            file.mistakes.Add(described.place, reason);
        }
    }
    file.commands = std::move(added);
}

std::vector<DescriptionFile>::iterator FindByName(std::vector<DescriptionFile>& files,
                                                  const std::string& name) {
    return std::find_if(files.begin(), files.end(),
                        [&name](const DescriptionFile& file) { return file.name == name; });
}

void ThrowIfAny(std::vector<std::string> mistakes) {
    if (!mistakes.empty()) {
        throw AutoCli::DescriptionError(std::move(mistakes));
    }
}

}  // namespace

void CommandRegistry::AddFiles(const std::vector<std::string>& names) {
    std::vector<DescriptionFile> read;
    read.reserve(names.size());
    for (const std::string& name : names) {
        read.push_back(ReadDescriptionFile(name));
    }
    Add(std::move(read));
}

void CommandRegistry::Add(std::vector<DescriptionFile> read) {
    std::vector<std::string> mistakes;
    {
        const std::lock_guard<std::mutex> guard(mutex);
        auto grown = std::make_shared<CommandTree>(*tree);
        for (DescriptionFile& file : read) {
            AddTo(*grown, file);
            mistakes.insert(mistakes.end(), file.mistakes.Texts().begin(),
                            file.mistakes.Texts().end());
            Remember(std::move(file));
        }
        tree = std::move(grown);
    }
    ThrowIfAny(std::move(mistakes));
}

// A file that is read again adds to what it brought before.
void CommandRegistry::Remember(DescriptionFile file) {
    const auto known = FindByName(files, file.name);
    if (known == files.end()) {
        if (!file.commands.empty()) {
            files.push_back(std::move(file));
        }
        return;
    }
    for (DescribedCommand& described : file.commands) {
        const auto old = std::find_if(known->commands.begin(), known->commands.end(),
                                      [&described](const auto& candidate) {
                                          return candidate.command->path == described.command->path;
                                      });
        if (old == known->commands.end()) {
            known->commands.push_back(std::move(described));
        } else {
            *old = std::move(described);
        }
    }
}

void CommandRegistry::Register(const std::string& name) {
    Mistakes mistakes(name);
    {
        const std::lock_guard<std::mutex> guard(mutex);
        const auto file = FindByName(files, name);
        if (file == files.end()) {
            mistakes.Add("", "not a known description file");
            ThrowIfAny(mistakes.Texts());
        }
        auto grown = std::make_shared<CommandTree>(*tree);
        for (const DescribedCommand& described : file->commands) {
            if (grown->Find(described.command->path) == described.command) {
                continue;
            }
            const std::string reason = grown->Add(described.command);
            if (!reason.empty()) {
                mistakes.Add(described.place, reason);
            }
        }
        tree = std::move(grown);
    }
    ThrowIfAny(mistakes.Texts());
}

void CommandRegistry::Reset() {
    const std::lock_guard<std::mutex> guard(mutex);
    tree = std::make_shared<const CommandTree>();
}

std::vector<std::string> CommandRegistry::FileNames() const {
    const std::lock_guard<std::mutex> guard(mutex);
    std::vector<std::string> names;
    names.reserve(files.size());
    for (const DescriptionFile& file : files) {
        names.push_back(file.name);
    }
    return names;
}

std::shared_ptr<const CommandTree> CommandRegistry::Commands() const {
    const std::lock_guard<std::mutex> guard(mutex);
    return tree;
}

}  // namespace BaseKit::impl
