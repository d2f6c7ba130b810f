#include "image/CommandDescriptions.h"

#include <sys/stat.h>

#include <list>
#include <vector>

#include "basekit/CommandNamespace.h"
#include "basekit/CommandRegistry.h"
#include "basekit/OptionBinder.h"
#include "platform/BaseKit.h"

namespace vantor::analyze {

namespace {

// Below the folder of the descriptions, in the order in which they are read.
constexpr const char* folders[] = {"", "/int", "/int/ext", "/ext"};

bool IsFolder(const std::string& path) {
    struct stat status {};
    return stat(path.c_str(), &status) == 0 && S_ISDIR(status.st_mode);
}

}  // namespace

struct CommandDescriptions::Known {
    BaseKit::impl::CommandRegistry registry;
    bool anyFolder = false;
    // Made once: a copy of all commands, to explain unknown ones with.
    boost::shared_ptr<BaseKit::AutoCli::CommandNamespace> root;
};

CommandDescriptions::CommandDescriptions(const HostImage& image, Findings& findings)
    : known(std::make_unique<Known>()) {
    for (const char* const folder : folders) {
        const std::string hostPath = std::string(HostImage::commandDescriptions) + folder;
        const std::string path = image.Open(hostPath);
        if (!IsFolder(path)) {
            continue;
        }
        known->anyFolder = true;
        try {
            known->registry.AddFiles(BaseKit::impl::ListDescriptionFiles(path));
        } catch (const BaseKit::AutoCli::DescriptionError& error) {
            for (const std::string& mistake : error.Mistakes()) {
                // Each begins with a path as it was opened; the host knows it by another.
                findings.push_back({Severity::Warning,
                                    "bad-description",
                                    {hostPath, 0, 0},
                                    hostPath + mistake.substr(path.size())});
            }
        }
    }
    known->root = known->registry.Commands()->Root();
}

CommandDescriptions::~CommandDescriptions() = default;

void CommandDescriptions::Check(const Command& command, Findings& findings) const {
    if (!known->anyFolder) {
        return;
    }
    BaseKit::AutoCli::OptionParser parser("nvcli");
    if (parser.ParseString(command.text)) {
        return;  // there is nothing to execute
    }
    const auto report = [&command, &findings](const std::string& code, const std::string& text) {
        findings.push_back(
            {Severity::Warning, code, command.place, "\"" + command.text + "\": " + text});
    };
    const std::vector<std::string> errors = parser.GetParseErrors();
    for (const std::string& error : errors) {
        report("bad-command", error);
    }
    if (!errors.empty()) {
        return;
    }
    const std::list<std::string> path = parser.GetCommandPath();
    const auto found = known->registry.Commands()->Find({path.begin(), path.end()});
    if (found == nullptr) {
        report("unknown-command", BaseKit::AutoCli::ExplainUnknownCommand(*known->root, path));
        return;
    }
    for (const std::string& error :
         BaseKit::impl::BindOptions(*found, parser.GetCommandParameters()).errors) {
        report("bad-command", error);
    }
}

}  // namespace vantor::analyze
