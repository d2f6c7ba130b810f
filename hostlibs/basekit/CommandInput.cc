#include "basekit/CommandInput.h"

#include <boost/make_shared.hpp>

namespace BaseKit {

namespace AutoCli {

CommandParameters::~CommandParameters() = default;

CommandInput::~CommandInput() = default;

boost::shared_ptr<CommandInput> CommandInput::New() {
    return boost::make_shared<impl::RecordedInput>();
}

}  // namespace AutoCli

namespace impl {

void RecordedInput::AddParameter(const std::string& name, const std::string& value) {
    parameters.emplace_back(name, value);
}

void RecordedInput::SetCallerName(const std::string& name) { callerName = name; }

void RecordedInput::SetCommandPath(const std::list<std::string>& path) { commandPath = path; }

}  // namespace impl

}  // namespace BaseKit
