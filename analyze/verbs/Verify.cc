#include "verbs/Verify.h"

#include <memory>
#include <string>

#include "verbs/CommonOptions.h"
#include "verbs/Progress.h"
#include "verify/Checks.h"
#include "verify/Report.h"
#include "verify/Wording.h"

namespace vantor::analyze {

namespace {

struct VerifyOptions {
    BootSource source;
    std::string format = "text";
    bool strict = false;
};

Findings Look(const VerifyOptions& options, const Invocation& invocation) {
    const Progress progress(invocation, "reading and checking the plugins");
    Findings findings;
    const BootModel model = ReadPlugins(options.source.Image(), options.source.options, findings);
    CheckGraph(model, findings);
    if (options.strict) {
        MakeStrict(findings);
    }
    SortFindings(findings);
    return findings;
}

void Write(const Findings& findings, const std::string& format, const Invocation& invocation) {
    if (format == "json") {
        WriteJson(findings, invocation.out);
    } else if (format == "sarif") {
        WriteSarif(findings, invocation.out, VANTOR_VERSION);
    } else {
        WriteText(findings, invocation.out, invocation.colour);
    }
}

// For a reader at a terminal; what the result holds is the same without it.
void Summarize(const FindingCounts& counts, const Invocation& invocation) {
    if (invocation.progress) {
        invocation.error << Counted(counts.errors, "error") << ", "
                         << Counted(counts.warnings, "warning") << ", "
                         << Counted(counts.notes, "note") << '\n';
    }
}

int Verify(const VerifyOptions& options, const Invocation& invocation) {
    const Findings findings = Look(options, invocation);
    Write(findings, options.format, invocation);
    const FindingCounts counts = CountFindings(findings);
    invocation.out.flush();
    Summarize(counts, invocation);
    if (counts.errors > 0) {
        return statusErrors;
    }
    return counts.warnings > 0 ? statusWarnings : statusClean;
}

}  // namespace

void AddVerify(CLI::App& app, Invocation& invocation) {
    const auto options = std::make_shared<VerifyOptions>();
    CLI::App& verb = *app.add_subcommand(
        "verify", "Tell all that is wrong with a plugin directory, before a boot finds out");
    AddBootOptions(verb, options->source, DirectoryAs::Argument);
    verb.add_option("--format", options->format, "text, json or sarif")
        ->type_name("FORMAT")
        ->check(CLI::IsMember({"text", "json", "sarif"}))
        ->capture_default_str();
    verb.add_flag("--strict", options->strict, "Make every warning an error");
    verb.footer("Exit status: 0 clean, 1 warnings, 2 errors, 3 the directory could not be read.");
    verb.callback([options, &invocation] {
        invocation.action = [options, &invocation] { return Verify(*options, invocation); };
    });
}

}  // namespace vantor::analyze
