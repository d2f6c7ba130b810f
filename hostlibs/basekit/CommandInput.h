#ifndef VANTOR_BASEKIT_COMMANDINPUT_H
#define VANTOR_BASEKIT_COMMANDINPUT_H

#include <list>
#include <string>
#include <utility>
#include <vector>

#include "platform/BaseKit.h"

namespace BaseKit::impl {

// The input that CommandInput::New makes, and what ExecuteCommand reads of it. The caller's name is
// for those who ask; the commands are not told.
class RecordedInput final : public AutoCli::CommandInput {
public:
    void AddParameter(const std::string& name, const std::string& value) override;
    void SetCallerName(const std::string& name) override;
    void SetCommandPath(const std::list<std::string>& path) override;

    const std::string& CallerName() const { return callerName; }
    const std::list<std::string>& CommandPath() const { return commandPath; }
    const std::vector<std::pair<std::string, std::string>>& Parameters() const {
        return parameters;
    }

private:
    std::string callerName;
    std::list<std::string> commandPath;
    std::vector<std::pair<std::string, std::string>> parameters;
};

}  // namespace BaseKit::impl

#endif
