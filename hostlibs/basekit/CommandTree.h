#ifndef VANTOR_BASEKIT_COMMANDTREE_H
#define VANTOR_BASEKIT_COMMANDTREE_H

#include <boost/shared_ptr.hpp>
#include <map>
#include <string>
#include <vector>

#include "basekit/CommandDescription.h"
#include "basekit/CommandNamespace.h"

namespace BaseKit::impl {

// Commands by their paths. A namespace is whatever stands before the last word of some path, so a
// command cannot have the path of a namespace. Readable by many threads while none changes it.
class CommandTree {
public:
    // Adds a command. Returns why it cannot be added, or an empty text.
    std::string Add(const AutoCli::CommandPointer& command);

    // Null when there is none.
    AutoCli::CommandPointer Find(const std::vector<std::string>& path) const;

    // The root namespace, as a copy with all that is in it.
    boost::shared_ptr<AutoCli::CommandNamespace> Root() const;

private:
    // Sorted word by word: what lies in a namespace stands together, right behind the
    // place of the namespace's own path.
    std::map<std::vector<std::string>, AutoCli::CommandPointer> commands;
};

}  // namespace BaseKit::impl

#endif
