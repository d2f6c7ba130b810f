#include "basekit/Mistakes.h"

namespace BaseKit::AutoCli {

namespace {

std::string Join(const std::vector<std::string>& texts) {
    std::string joined;
    for (const std::string& text : texts) {
        joined += (joined.empty() ? "" : "; ") + text;
    }
    return joined;
}

}  // namespace

DescriptionError::DescriptionError(std::vector<std::string> mistakesArg)
    : std::runtime_error(Join(mistakesArg)), mistakes(std::move(mistakesArg)) {}

DescriptionError::~DescriptionError() = default;

}  // namespace BaseKit::AutoCli
