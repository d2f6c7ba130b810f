#ifndef VANTOR_ANALYZE_VERBS_OUTPUTFILE_H
#define VANTOR_ANALYZE_VERBS_OUTPUTFILE_H

#include <CLI/CLI.hpp>
#include <string>
#include <vector>

namespace vantor::analyze {

// --output=FILE, which has a name; empty without the option.
void AddOutputOption(CLI::App& verb, std::string& path);

// Writes a result to a file, which is none of the files it was made from. Throws std::runtime_error
// that names `path` when it is one of `inputs` all the same, and std::system_error when it cannot
// be written; an input is never touched.
void WriteOutput(const std::string& path, const std::string& result,
                 const std::vector<std::string>& inputs);

}  // namespace vantor::analyze

#endif
