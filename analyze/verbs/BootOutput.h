#ifndef VANTOR_ANALYZE_VERBS_BOOTOUTPUT_H
#define VANTOR_ANALYZE_VERBS_BOOTOUTPUT_H

#include <CLI/CLI.hpp>
#include <functional>
#include <nlohmann/json.hpp>
#include <string>
#include <vector>

#include "boot/BootTimeline.h"
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

// What a verb tells of one boot in either format. The text leaves the remarks to the caller.
struct BootReport {
    std::function<Json(const BootTimeline&)> document;
    std::function<void(const BootTimeline&, const Invocation&)> text;
};

// Adds a verb that takes the options of a log and --format and writes the report, the remarks of a
// text on `invocation.error`.
void AddReportVerb(CLI::App& app, Invocation& invocation, const std::string& name,
                   const std::string& description, const BootReport& report);

}  // namespace vantor::analyze

#endif
