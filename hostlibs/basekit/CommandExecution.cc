#include "basekit/CommandExecution.h"

#include <algorithm>

#include "basekit/CommandRunner.h"
#include "basekit/OptionBinder.h"
#include "basekit/Text.h"

namespace BaseKit::impl {

namespace {

using AutoCli::CommandAnswer;
using AutoCli::CommandOutcome;
using AutoCli::CommandPointer;

// What a program wrote on standard error, to go on with after its failure: without the line end at
// the end, and without null characters, at which a log's line would break off.
std::string Complaint(std::string written) {
    while (!written.empty() && (written.back() == '\n' || written.back() == '\r')) {
        written.pop_back();
    }
    std::replace(written.begin(), written.end(), '\0', '?');
    return written.empty() ? written : ": " + written;
}

// The sentence on a program that did not succeed; empty for one that did.
std::string Failure(const std::string& program, const ProcessResult& result) {
    const std::string quoted = Quoted(program);
    switch (result.end) {
    case ProcessEnd::NotStarted:
        return "cannot execute " + quoted + ": " +
               (result.obstacle == nullptr ? "" : std::string(result.obstacle) + ": ") +
               ErrnoText(result.code);
    case ProcessEnd::Exited:
        if (result.code == 0) {
            break;
        }
        return quoted + " ended with exit status " + std::to_string(result.code) +
               Complaint(result.standardError.Text());
    case ProcessEnd::Killed:
        return quoted + " was killed by signal " + std::to_string(result.code) +
               Complaint(result.standardError.Text());
    case ProcessEnd::Unknown:
        return "nobody can tell how " + quoted + " ended: " + ErrnoText(result.code) +
               Complaint(result.standardError.Text());
    }
    return "";
}

void Fail(CommandAnswer& answer, CommandOutcome outcome, std::vector<std::string> errors) {
    answer.outcome = outcome;
    answer.errors = std::move(errors);
}

void Run(std::vector<std::string> arguments, CommandAnswer& answer) {
    const std::string program = arguments.front();
    const ProcessResult result = RunProgram(std::move(arguments));
    answer.standardOutput = result.standardOutput.Text();
    answer.standardError = result.standardError.Text();

    std::vector<std::string> errors;
    if (std::string failure = Failure(program, result); !failure.empty()) {
        errors.push_back(std::move(failure));
    }
    if (const std::size_t leftOut = result.standardOutput.LeftOut(); leftOut > 0) {
        errors.push_back(Quoted(program) + " wrote " + std::to_string(leftOut) +
                         " bytes more on standard output than are kept");
    }
    if (!errors.empty()) {
        Fail(answer, CommandOutcome::CommandFailed, std::move(errors));
    }
}

}  // namespace

void Execute(const CommandTree& commands, const RecordedInput& input, CommandAnswer& answer) {
    Fail(answer, CommandOutcome::Succeeded, {});
    answer.standardOutput.clear();
    answer.standardError.clear();

    const std::list<std::string>& path = input.CommandPath();
    const CommandPointer command = commands.Find({path.begin(), path.end()});
    if (command == nullptr) {
        Fail(answer, CommandOutcome::BadCommand,
             {AutoCli::ExplainUnknownCommand(*commands.Root(), path)});
        return;
    }
    BoundOptions bound = BindOptions(*command, input.Parameters());
    if (!bound.errors.empty()) {
        Fail(answer, CommandOutcome::BadCommand, std::move(bound.errors));
        return;
    }
    Run(ExpandArguments(*command, bound.values), answer);
}

}  // namespace BaseKit::impl
