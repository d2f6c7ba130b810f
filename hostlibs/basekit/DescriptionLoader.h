#ifndef VANTOR_BASEKIT_DESCRIPTIONLOADER_H
#define VANTOR_BASEKIT_DESCRIPTIONLOADER_H

#include <string>
#include <vector>

#include "basekit/CommandDescription.h"
#include "basekit/Mistakes.h"

// Reading of description files; docs/command-descriptions.md tells their format.
namespace BaseKit::impl {

struct DescribedCommand {
    AutoCli::CommandPointer command;
    std::string place;  // of its path in the file, as a JSON pointer
};

// One description file: the commands that are good, and what is wrong with the others.
struct DescriptionFile {
    std::string name;  // its path
    std::vector<DescribedCommand> commands;
    Mistakes mistakes;
};

DescriptionFile ReadDescriptionFile(const std::string& name);

// The paths of a directory's description files in the order in which they are read: those of its
// entries that match "*.json" as a shell would read it, by the bytes of their names. Throws
// DescriptionError when the directory cannot be read.
std::vector<std::string> ListDescriptionFiles(const std::string& directory);

}  // namespace BaseKit::impl

#endif
