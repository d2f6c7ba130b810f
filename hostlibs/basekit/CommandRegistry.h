#ifndef VANTOR_BASEKIT_COMMANDREGISTRY_H
#define VANTOR_BASEKIT_COMMANDREGISTRY_H

#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "basekit/CommandTree.h"
#include "basekit/DescriptionLoader.h"

namespace BaseKit::impl {

// The description files that a dispatcher has been given, and the commands of those that are
// registered. May be used by any number of threads at once: a change builds a new tree beside the
// one that is being read. Its lock is held for that only, never while a file is read or a command
// runs.
class CommandRegistry {
public:
    // Reads the files and registers their commands. What is good counts even when some is not;
    // then throws DescriptionError with every mistake.
    void AddFiles(const std::vector<std::string>& names);

    // The same for files that have been read.
    void Add(std::vector<DescriptionFile> read);

    // Registers the commands of a file once more after a Reset. Throws DescriptionError when the
    // file is not known or a path is another file's by now.
    void Register(const std::string& name);

    // Forgets every command, but not the files.
    void Reset();

    // The files that brought at least one command, in the order in which they were read.
    std::vector<std::string> FileNames() const;

    // The commands as they are now; they do not change any more.
    std::shared_ptr<const CommandTree> Commands() const;

private:
    // With the lock held.
    void Remember(DescriptionFile file);

    mutable std::mutex mutex;
    std::shared_ptr<const CommandTree> tree = std::make_shared<const CommandTree>();
    std::vector<DescriptionFile> files;  // one of a name
};

}  // namespace BaseKit::impl

#endif
