#ifndef VANTOR_NVCLI_HELPTEXT_H
#define VANTOR_NVCLI_HELPTEXT_H

#include <string>

#include "basekit/CommandDescription.h"
#include "basekit/CommandNamespace.h"

// The help pages. Each ends with a line end.
namespace nvcli {

// The program and every command that it knows.
std::string ProgramHelp(const BaseKit::AutoCli::CommandNamespace& root);

// The commands of one namespace.
std::string NamespaceHelp(const BaseKit::AutoCli::CommandNamespace& space);

// One command and its options.
std::string CommandHelp(const BaseKit::AutoCli::CommandDescription& command);

}  // namespace nvcli

#endif
