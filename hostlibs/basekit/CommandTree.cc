#include "basekit/CommandTree.h"

#include <algorithm>
#include <boost/make_shared.hpp>

#include "basekit/Text.h"

namespace BaseKit::impl {

namespace {

using AutoCli::CommandNamespace;
using AutoCli::CommandPointer;
using Path = std::vector<std::string>;

bool LiesIn(const Path& path, const Path& space) {
    return path.size() > space.size() && std::equal(space.begin(), space.end(), path.begin());
}

std::string Named(const CommandPointer& command) {
    return Quoted(JoinPath(command->path)) + " of " + command->file;
}

}  // namespace

std::string CommandTree::Add(const CommandPointer& command) {
    const Path& path = command->path;
    const std::string subject = "the command " + Quoted(JoinPath(path));
    if (const CommandPointer known = Find(path); known != nullptr) {
        return subject + " is described already in " + known->file;
    }
    for (Path space = path; space.size() > 1;) {
        space.pop_back();
        if (const CommandPointer known = Find(space); known != nullptr) {
            return subject + " makes a namespace of the command " + Named(known);
        }
    }
    const auto next = commands.upper_bound(path);
    if (next != commands.end() && LiesIn(next->first, path)) {
        return subject + " is the namespace of the command " + Named(next->second);
    }
    commands.emplace(path, command);
    return "";
}

CommandPointer CommandTree::Find(const Path& path) const {
    const auto found = commands.find(path);
    return found == commands.end() ? nullptr : found->second;
}

boost::shared_ptr<CommandNamespace> CommandTree::Root() const {
    auto root = boost::make_shared<CommandNamespace>();
    // The namespaces from the root to that of the last command.
    std::vector<boost::shared_ptr<CommandNamespace>> open = {root};
    for (const auto& [path, command] : commands) {
        while (!LiesIn(path, open.back()->path)) {
            open.pop_back();
        }
        while (open.back()->path.size() + 1 < path.size()) {
            auto inner = boost::make_shared<CommandNamespace>();
            inner->path.assign(path.begin(),
                               path.begin() + static_cast<std::ptrdiff_t>(open.size()));
            open.back()->namespaces.push_back(inner);
            open.push_back(std::move(inner));
        }
        open.back()->commands.push_back(command);
    }
    return root;
}

}  // namespace BaseKit::impl
