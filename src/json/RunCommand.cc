#include "json/RunCommand.h"

#include <syslog.h>

#include <boost/shared_ptr.hpp>
#include <list>
#include <vector>

#include "json/NvcliDispatcher.h"
#include "platform/BaseKit.h"

namespace vantor {

using BaseKit::AutoCli::CommandInput;
using BaseKit::AutoCli::CommandOutput;
using BaseKit::AutoCli::OptionParser;

void RunCommand(const std::string& command, const std::string& operation,
                const std::string& pluginName) {
    OptionParser parser("nvcli");
    if (parser.ParseString(command)) {
        return;
    }
    const std::vector<std::string> parseErrors = parser.GetParseErrors();
    for (const std::string& error : parseErrors) {
        syslog(LOG_ERR, "unable to parse '%s' commands in context '%s': %s", operation.c_str(),
               pluginName.c_str(), error.c_str());
    }
    if (!parseErrors.empty()) {
        return;
    }
    const boost::shared_ptr<CommandInput> input = CommandInput::New();
    const boost::shared_ptr<CommandOutput> output = CommandOutput::New();
    const auto parameters = parser.GetCommandParameters();
    const std::list<std::string> path = parser.GetCommandPath();
    input->SetCallerName("vantor");
    input->SetCommandPath(path);
    for (const auto& [name, value] : parameters) {
        input->AddParameter(name, value);
    }
    NvcliDispatcher::Instance()->ExecuteCommand(input, output);
    if (!output->HasErrors()) {
        return;
    }
    for (const std::string& message : output->GetErrorMessages()) {
        // The apostrophe without a partner is part of the text that log readers know.
        syslog(LOG_ERR, "execution of '%s' failed in context %s[%s]': %s", command.c_str(),
               pluginName.c_str(), operation.c_str(), message.c_str());
    }
}

}  // namespace vantor
