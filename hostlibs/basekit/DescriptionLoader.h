#ifndef VANTOR_BASEKIT_DESCRIPTIONLOADER_H
#define VANTOR_BASEKIT_DESCRIPTIONLOADER_H

#include <string>
#include <string_view>
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

// The same for a file whose text has been read already.
DescriptionFile ParseDescriptionFile(const std::string& name, const std::string& text);

// Whether a directory's entry of that name is a description file: those that match "*.json" as a
// shell would read it.
bool IsDescriptionName(std::string_view name);

// The paths of a directory's description files in the order in which they are read: by the bytes of
// their names. Throws DescriptionError when the directory cannot be read.
std::vector<std::string> ListDescriptionFiles(const std::string& directory);

}  // namespace BaseKit::impl

#endif
