#include "verbs/CommonOptions.h"

#include <sstream>
#include <stdexcept>
#include <system_error>
#include <vector>

#include "boot/DotModel.h"
#include "boot/InputText.h"
#include "image/ImageFile.h"
#include "verbs/Progress.h"
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

std::optional<BootModel> ReadPluginsIfThere(const BootSource& source,
                                            std::vector<std::string>& remarks) {
    Findings findings;
    std::optional<BootModel> model;
    try {
        model = ReadPlugins(source.Image(), source.options, findings);
    } catch (const std::system_error& error) {
        if (source.options.directory != HostImage::pluginDirectory) {
            throw;
        }
        remarks.push_back(std::string(error.what()) +
                          ": nothing is known of the plugins' barriers");
    }
    SortFindings(findings);
    for (const Finding& finding : findings) {
        if (finding.severity == Severity::Error) {
            remarks.push_back(Spelled(finding.place) + ": " + finding.text);
        }
    }
    return model;
}

// The host's own stays within the host, also where a link of it points elsewhere.
BootLog LogSource::ReadLog() const {
    if (!log.empty()) {
        return ReadBootLog(log);
    }
    const HostImage image = plugins.Image();
    const std::string path = image.Open(HostImage::profilingLog);
    const ImageFile file = ReadImageFile(image, HostImage::profilingLog, longestInput + 1);
    if (file.content.size() > longestInput) {
        ThrowTooLong(path, longestInput);
    }
    switch (file.kind) {
    case ImageFile::Kind::Missing:
    case ImageFile::Kind::Unreadable:
        throw std::runtime_error(
            path + ": cannot be opened: " + std::generic_category().message(file.error));
    case ImageFile::Kind::Folder:
    case ImageFile::Kind::Irregular:
        throw std::runtime_error(path + ": not a regular file");
    case ImageFile::Kind::Regular:
        break;
    }
    std::istringstream stream(file.content);
    return ParseBootLog(stream, path);
}

BootModel LogSource::ReadModel(std::vector<std::string>& remarks) const {
    return dot.empty() ? ReadPluginsIfThere(plugins, remarks).value_or(BootModel())
                       : ReadDotModel(dot);
}

BootTimeline LogSource::Read(const Invocation& invocation) const {
    const Progress progress(invocation, "reading the boot");
    return Read();
}

BootTimeline LogSource::Read() const {
    const BootLog read = ReadLog();
    std::vector<std::string> remarks;
    BootTimeline timeline = MakeTimeline(read, ReadModel(remarks));
    timeline.remarks.insert(timeline.remarks.end(), remarks.begin(), remarks.end());
    return timeline;
}

CLI::Validator HasName() {
    return CLI::Validator(
        [](const std::string& text) {
            return text.empty() ? std::string("the file has no name") : std::string();
        },
        "");
}

void AddLogOptions(CLI::App& verb, LogSource& source) {
    verb.add_option("LOG", source.log, "The profiling log; the host's own without it")
        ->check(HasName());
    verb.add_option("--dot", source.dot,
                    "Take the barriers from this drawing of vantor --dump-dependency-tree")
        ->type_name("FILE")
        ->check(HasName());
    AddBootOptions(verb, source.plugins, DirectoryAs::Option);
}

}  // namespace vantor::analyze
