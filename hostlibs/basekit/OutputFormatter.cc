#include "basekit/OutputFormatter.h"

#include "basekit/CommandOutput.h"

namespace BaseKit {

AutoCli::OutputFormatter::~OutputFormatter() = default;

std::string impl::TextFormatter::Format(const AutoCli::CommandOutput& output) const {
    return dynamic_cast<const AutoCli::CommandAnswer&>(output).standardOutput;
}

}  // namespace BaseKit
