#include "verbs/BootOutput.h"

#include "verbs/TextTable.h"

namespace vantor::analyze {

void AddFormatOption(CLI::App& verb, std::string& format) {
    verb.add_option("--format", format, "How to write the result: text or json")
        ->type_name("FORMAT")
        ->check(CLI::IsMember({"text", "json"}))
        ->capture_default_str();
}

void WriteJson(const Json& document, std::ostream& stream) {
    stream << document.dump(2, ' ', false, Json::error_handler_t::replace) << '\n';
}

void TellRemarks(const std::vector<std::string>& remarks, const Invocation& invocation) {
    for (const std::string& remark : remarks) {
        invocation.error << "note: " << OneLine(remark) << '\n';
    }
}

std::string Count(std::size_t count, const std::string& what) {
    return std::to_string(count) + " " + what + (count == 1 ? "" : "s");
}

}  // namespace vantor::analyze
