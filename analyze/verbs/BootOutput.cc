#include "verbs/BootOutput.h"

#include <memory>

#include "verbs/CommonOptions.h"
#include "verify/Wording.h"

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
        invocation.error << "note: " << OnOneLine(remark) << '\n';
    }
}

void AddReportVerb(CLI::App& app, Invocation& invocation, const std::string& name,
                   const std::string& description, const BootReport& report) {
    struct Options {
        LogSource source;
        std::string format = "text";
    };
    auto options = std::make_shared<Options>();
    CLI::App* const verb = app.add_subcommand(name, description);
    AddLogOptions(*verb, options->source);
    AddFormatOption(*verb, options->format);
    verb->callback([options, report, &invocation] {
        invocation.action = [options, report, &invocation] {
            const BootTimeline timeline = options->source.Read(invocation);
            if (options->format == "json") {
                WriteJson(report.document(timeline), invocation.out);
            } else {
                report.text(timeline, invocation);
                TellRemarks(timeline.remarks, invocation);
            }
            return statusClean;
        };
    });
}

}  // namespace vantor::analyze
