#ifndef VANTOR_ANALYZE_VERBS_BOOTOUTPUT_H
#define VANTOR_ANALYZE_VERBS_BOOTOUTPUT_H

#include <CLI/CLI.hpp>
#include <nlohmann/json.hpp>
#include <string>
#include <vector>

#include "verbs/Invocation.h"

// What the verbs have in common that tell of a boot that has taken place.
namespace vantor::analyze {

using Json = nlohmann::ordered_json;

// --format=text|json; `format` holds the one that is chosen, or the default it came with.
void AddFormatOption(CLI::App& verb, std::string& format);

// Writes a document, indented, with all times in microseconds. Bytes that are no UTF-8 are
// replaced.
void WriteJson(const Json& document, std::ostream& stream);

// Tells on `invocation.error`, a line each, what does not fit between a log and its plugins.
void TellRemarks(const std::vector<std::string>& remarks, const Invocation& invocation);

// "1 worker", "8 workers".
std::string Count(std::size_t count, const std::string& what);

}  // namespace vantor::analyze

#endif
