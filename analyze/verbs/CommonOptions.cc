#include "verbs/CommonOptions.h"

#include <sstream>
#include <vector>

#include "boot/DotModel.h"
#include "verify/Report.h"
#include "verify/Wording.h"

namespace vantor::analyze {

namespace {

// Items between commas. Empty ones are dropped; blanks belong to their item.
std::vector<std::string> SplitList(const std::string& text) {
    std::vector<std::string> items;
    std::istringstream rest(text);
    for (std::string item; std::getline(rest, item, ',');) {
        if (!item.empty()) {
            items.push_back(item);
        }
    }
    return items;
}

// An option whose `take` is given the value of each occurrence in turn, as the boot program does.
template <typename Take>
void AddEach(CLI::App& verb, const char* name, const char* type, const char* help, Take take) {
    verb.add_option_function<std::string>(name, take, help)
        ->type_name(type)
        ->multi_option_policy(CLI::MultiOptionPolicy::TakeLast)
        ->trigger_on_parse();
}

}  // namespace

void AddBootOptions(CLI::App& verb, BootSource& source, DirectoryAs directory) {
    const char* const directoryName =
        directory == DirectoryAs::Argument ? "DIRECTORY" : "--directory";
    verb.add_option(directoryName, source.options.directory, "The plugin directory, a host's path")
        ->type_name(directory == DirectoryAs::Argument ? "" : "DIRECTORY")
        ->capture_default_str();
    AddEach(verb, "--root", "FOLDER", "Read the host whose file system lies in FOLDER",
            [&source](const std::string& text) {
                // The machine's own host would be read for a variable that nobody set.
                if (text.empty()) {
                    throw CLI::ValidationError("--root", "the folder has no name");
                }
                source.root = text;
            });
    AddEach(verb, "--plugin-flags", "FLAG,...", "The boot flags; the last occurrence counts",
            [&source](const std::string& text) {
                const std::vector<std::string> items = SplitList(text);
                source.options.flags = {items.begin(), items.end()};
            });
    AddEach(verb, "--disable-plugins", "PLUGIN,...", "Plugins that are not to run",
            [&source](const std::string& text) {
                const std::vector<std::string> items = SplitList(text);
                std::list<std::string>& disabled = source.options.disabledPlugins;
                disabled.insert(disabled.end(), items.begin(), items.end());
            });
    AddEach(verb, "--run-once", "KEY,...", "Run-once plugins that have already run",
            [&source](const std::string& text) {
                const std::vector<std::string> items = SplitList(text);
                source.options.runOncePlugins.insert(items.begin(), items.end());
            });
}

void TellUnread(const Findings& findings, const Invocation& invocation) {
    const std::size_t errors = CountFindings(findings).errors;
    if (errors > 0) {
        invocation.error << "vantor-analyze: reading the plugins found " << Counted(errors, "error")
                         << "; vantor-analyze verify tells all\n";
    }
}

BootLog LogSource::ReadLog() const {
    return ReadBootLog(log.empty() ? plugins.Image().Open(HostImage::profilingLog) : log);
}

BootModel LogSource::ReadModel(Findings& findings) const {
    return dot.empty() ? ReadPlugins(plugins.Image(), plugins.options, findings)
                       : ReadDotModel(dot);
}

BootModel LogSource::ReadModel() const {
    Findings findings;
    return ReadModel(findings);
}

BootTimeline LogSource::Read() const {
    const BootLog read = ReadLog();
    Findings findings;
    BootTimeline timeline = MakeTimeline(read, ReadModel(findings));
    SortFindings(findings);
    for (const Finding& finding : findings) {
        if (finding.severity == Severity::Error) {
            timeline.remarks.push_back(Spelled(finding.place) + ": " + finding.text);
        }
    }
    return timeline;
}

void AddLogOptions(CLI::App& verb, LogSource& source) {
    verb.add_option("LOG", source.log, "The profiling log; the host's own without it");
    verb.add_option("--dot", source.dot,
                    "Take the barriers from this drawing of vantor --dump-dependency-tree")
        ->type_name("FILE");
    AddBootOptions(verb, source.plugins, DirectoryAs::Option);
}

}  // namespace vantor::analyze
