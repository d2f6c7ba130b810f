#ifndef VANTOR_BASEKIT_ARGUMENTTEMPLATE_H
#define VANTOR_BASEKIT_ARGUMENTTEMPLATE_H

#include <optional>
#include <string>
#include <vector>

#include "basekit/CommandDescription.h"

// The arguments of a program, written in a description file with placeholders for the values of
// options: "${name}" stands for a value, "$$" for one "$".
namespace BaseKit::impl {

// What the command line gives each option of a command, by its index; none for one not given, the
// empty text for a flag.
using OptionValues = std::vector<std::optional<std::string>>;

// The index of the option called `name`, of any kind.
std::optional<std::size_t> FindOption(const std::vector<AutoCli::CommandOption>& options,
                                      const std::string& name);

// Reads `text` into `pieces`. Returns why it cannot be read, or an empty text.
std::string ParseArgument(const std::string& text,
                          const std::vector<AutoCli::CommandOption>& options,
                          std::vector<AutoCli::ArgumentPiece>& pieces);

// The argument vector, the program's path first.
std::vector<std::string> ExpandArguments(const AutoCli::CommandDescription& command,
                                         const OptionValues& values);

}  // namespace BaseKit::impl

#endif
