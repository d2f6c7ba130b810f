#ifndef VANTOR_ANALYZE_VERBS_OUTPUTFILE_H
#define VANTOR_ANALYZE_VERBS_OUTPUTFILE_H

#include <CLI/CLI.hpp>
#include <string>

namespace vantor::analyze {

// --output=FILE, which has a name; empty without the option.
void AddOutputOption(CLI::App& verb, std::string& path);

// Writes a result to a file that has not been read to make it. A file that is there is replaced as
// a whole or stays as it was. Throws std::runtime_error that names `path` when it has been read, or
// cannot be written.
void WriteOutput(const std::string& path, const std::string& result);

}  // namespace vantor::analyze

#endif
