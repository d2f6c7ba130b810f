#include "graph/DotWriter.h"

#include <cstdint>

#include "graph/GlobalLock.h"
#include "graph/Node.h"

namespace vantor {

namespace {

std::uint64_t Id(const Node& node) {
    return static_cast<std::uint64_t>(reinterpret_cast<std::uintptr_t>(&node));
}

}  // namespace

void WriteDot(const Node& node, std::ostream& stream) {
    stream << Id(node) << " [label=\"" << node.Name() << '"' << node.DotAttributes() << "];"
           << std::endl;
    const GlobalLockGuard guard;
    for (const Node* dependent : node.Dependents()) {
        stream << Id(node) << " -> " << Id(*dependent) << ';' << std::endl;
    }
}

}  // namespace vantor
