#ifndef VANTOR_BASEKIT_COMMANDNAMESPACE_H
#define VANTOR_BASEKIT_COMMANDNAMESPACE_H

#include <boost/shared_ptr.hpp>
#include <list>
#include <string>
#include <vector>

#include "basekit/CommandDescription.h"

namespace BaseKit::AutoCli {

// A namespace with all that lies in it, as it was when the dispatcher was asked for the root: a
// copy of its own, in the order of the words.
class CommandNamespace {
public:
    std::vector<std::string> path;  // empty for the root
    std::vector<boost::shared_ptr<CommandNamespace>> namespaces;
    std::vector<CommandPointer> commands;

    // The namespace at `words` below this one, this one itself for no words, null for none.
    const CommandNamespace* Find(const std::list<std::string>& words) const;
};

// The sentence for a path that is not a command's: it names the nearest command below `root`, or
// says that the path is a namespace's.
std::string ExplainUnknownCommand(const CommandNamespace& root, const std::list<std::string>& path);

}  // namespace BaseKit::AutoCli

#endif
