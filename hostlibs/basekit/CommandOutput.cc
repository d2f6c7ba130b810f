#include "basekit/CommandOutput.h"

#include <boost/make_shared.hpp>

namespace BaseKit::AutoCli {

CommandResult::~CommandResult() = default;

CommandOutput::~CommandOutput() = default;

boost::shared_ptr<CommandOutput> CommandOutput::New() {
    return boost::make_shared<CommandAnswer>();
}

CommandAnswer::~CommandAnswer() = default;

bool CommandAnswer::HasErrors() const { return outcome != CommandOutcome::Succeeded; }

std::vector<std::string> CommandAnswer::GetErrorMessages() const { return errors; }

}  // namespace BaseKit::AutoCli
