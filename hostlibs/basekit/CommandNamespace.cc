#include "basekit/CommandNamespace.h"

#include "basekit/EditDistance.h"
#include "basekit/Text.h"

namespace BaseKit::AutoCli {

namespace {

// The command below `from` whose path reads most like `wanted`, the first of equals; null when
// there is none.
CommandPointer Nearest(const CommandNamespace& from, const std::string& wanted) {
    CommandPointer nearest;
    std::size_t nearestDistance = 0;
    std::vector<const CommandNamespace*> open = {&from};
    while (!open.empty()) {
        const CommandNamespace& current = *open.back();
        open.pop_back();
        for (const CommandPointer& command : current.commands) {
            const std::size_t distance = impl::EditDistance(wanted, impl::JoinPath(command->path));
            if (nearest == nullptr || distance < nearestDistance ||
                (distance == nearestDistance && command->path < nearest->path)) {
                nearest = command;
                nearestDistance = distance;
            }
        }
        for (const auto& inner : current.namespaces) {
            open.push_back(inner.get());
        }
    }
    return nearest;
}

}  // namespace

const CommandNamespace* CommandNamespace::Find(const std::list<std::string>& words) const {
    const CommandNamespace* found = this;
    for (const std::string& word : words) {
        const CommandNamespace* next = nullptr;
        for (const auto& inner : found->namespaces) {
            if (inner->path.back() == word) {
                next = inner.get();
            }
        }
        if (next == nullptr) {
            return nullptr;
        }
        found = next;
    }
    return found;
}

std::string ExplainUnknownCommand(const CommandNamespace& root,
                                  const std::list<std::string>& path) {
    if (path.empty()) {
        return "no command is named";
    }
    const std::string wanted = impl::JoinPath({path.begin(), path.end()});
    if (const CommandNamespace* found = root.Find(path); found != nullptr) {
        return impl::Quoted(wanted) + " is a namespace and needs a command word, as in " +
               impl::Quoted(impl::JoinPath(Nearest(*found, wanted)->path));
    }
    const CommandPointer nearest = Nearest(root, wanted);
    return "unknown command " + impl::Quoted(wanted) +
           (nearest == nullptr
                ? "; no command is known at all"
                : "; the nearest known one is " + impl::Quoted(impl::JoinPath(nearest->path)));
}

}  // namespace BaseKit::AutoCli
