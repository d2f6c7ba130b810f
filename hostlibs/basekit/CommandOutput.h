#ifndef VANTOR_BASEKIT_COMMANDOUTPUT_H
#define VANTOR_BASEKIT_COMMANDOUTPUT_H

#include <string>
#include <vector>

#include "platform/BaseKit.h"

namespace BaseKit::AutoCli {

// How far the execution of a command came.
enum class CommandOutcome {
    Succeeded,      // also before any execution
    BadCommand,     // the command or its options are wrong; nothing was executed
    CommandFailed,  // its program could not be executed, or failed
};

// The output that CommandOutput::New makes, with what the tools of this library ask of it beyond
// errors.
class CommandAnswer final : public CommandOutput {
public:
    ~CommandAnswer() override;
    bool HasErrors() const override;
    std::vector<std::string> GetErrorMessages() const override;

    CommandOutcome outcome = CommandOutcome::Succeeded;
    std::vector<std::string> errors;
    std::string standardOutput;  // what the command wrote
    std::string standardError;   // the same, shortened when it is long
};

}  // namespace BaseKit::AutoCli

#endif
