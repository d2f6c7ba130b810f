#include "verbs/Explain.h"

#include <memory>
#include <string>

#include "verbs/CommonOptions.h"
#include "verbs/Progress.h"
#include "verify/Explanation.h"

namespace vantor::analyze {

namespace {

struct ExplainOptions {
    BootSource source;
    std::string name;
};

BootModel Read(const ExplainOptions& options, const Invocation& invocation, Findings& findings) {
    const Progress progress(invocation, "reading the plugins");
    return ReadPlugins(options.source.Image(), options.source.options, findings);
}

int ExplainName(const ExplainOptions& options, const Invocation& invocation) {
    Findings findings;
    const BootModel model = Read(options, invocation, findings);
    Explain(model, findings, options.name, invocation.out, invocation.colour);
    TellUnread(findings, invocation);
    return statusClean;
}

}  // namespace

void AddExplain(CLI::App& app, Invocation& invocation) {
    const auto options = std::make_shared<ExplainOptions>();
    CLI::App& verb = *app.add_subcommand(
        "explain", "Tell in words what a plugin or barrier waits for, and who waits for it");
    verb.add_option("NAME", options->name, "A plugin or a barrier")->required();
    AddBootOptions(verb, options->source, DirectoryAs::Argument);
    verb.callback([options, &invocation] {
        invocation.action = [options, &invocation] { return ExplainName(*options, invocation); };
    });
}

}  // namespace vantor::analyze
