#include "nvcli/Nvcli.h"

#include "basekit/CommandDescription.h"
#include "basekit/CommandNamespace.h"
#include "basekit/CommandOutput.h"
#include "basekit/Mistakes.h"
#include "nvcli/CommandLine.h"
#include "nvcli/HelpText.h"
#include "platform/BaseKit.h"

namespace nvcli {

namespace {

using BaseKit::AutoCli::CommandAnswer;
using BaseKit::AutoCli::CommandInput;
using BaseKit::AutoCli::CommandOutcome;
using BaseKit::AutoCli::CommandOutput;
using BaseKit::AutoCli::DescriptionError;
using BaseKit::AutoCli::Dispatcher;
using BaseKit::AutoCli::OptionParser;

// A line that the parser splits into exactly these words: within single quotes all stands for
// itself, and a single quote is put between two quoted parts.
std::string LineOf(const std::vector<std::string>& words) {
    std::string line;
    for (const std::string& word : words) {
        line += line.empty() ? "'" : " '";
        for (const char c : word) {
            if (c == '\'') {
                line += "'\\''";
            } else {
                line += c;
            }
        }
        line += '\'';
    }
    return line;
}

class Program {
public:
    Program(std::ostream& outputArg, std::ostream& errorsArg)
        : output(outputArg), errors(errorsArg) {}

    ExitStatus Run(const CommandLine& line) {
        AddDirectories(line.directories);
        OptionParser parser("nvcli");
        const bool nothingToExecute = parser.ParseString(LineOf(line.command));
        if (nothingToExecute || line.help) {
            return ShowHelp(parser.GetCommandPath());
        }
        const std::vector<std::string> parseErrors = parser.GetParseErrors();
        if (!parseErrors.empty()) {
            Report(parseErrors);
            return BadCommandLine;
        }
        return Execute(parser);
    }

private:
    void Report(const std::vector<std::string>& sentences) {
        for (const std::string& sentence : sentences) {
            errors << "nvcli: " << sentence << '\n';
        }
    }

    void AddDirectories(const std::vector<std::string>& directories) {
        if (directories.empty()) {
            Add([this] { dispatcher.AddDefaultDirectories(); });
        }
        for (const std::string& directory : directories) {
            Add([this, &directory] { dispatcher.AddExternalDirectory(directory); });
        }
    }

    template <typename Adding>
    void Add(Adding adding) {
        try {
            adding();
        } catch (const DescriptionError& error) {
            badDescriptions = true;
            Report(error.Mistakes());
        }
    }

    ExitStatus ShowHelp(const std::list<std::string>& path) {
        const auto root = dispatcher.GetRootNamespace();
        if (path.empty()) {
            output << ProgramHelp(*root);
        } else if (const auto command = dispatcher.GetCommand(path); command != nullptr) {
            output << CommandHelp(*command);
        } else if (const auto* const space = root->Find(path); space != nullptr) {
            output << NamespaceHelp(*space);
        } else {
            Report({ExplainUnknownCommand(*root, path)});
            return BadCommandLine;
        }
        return badDescriptions ? Failure : Success;
    }

    ExitStatus Execute(const OptionParser& parser) {
        const auto input = CommandInput::New();
        const auto answer = CommandOutput::New();
        input->SetCallerName("nvcli");
        input->SetCommandPath(parser.GetCommandPath());
        for (const auto& [name, value] : parser.GetCommandParameters()) {
            input->AddParameter(name, value);
        }
        dispatcher.ExecuteCommand(input, answer);

        output << dispatcher.FormatOutput(answer);
        const auto& details = dynamic_cast<const CommandAnswer&>(*answer);
        if (!answer->HasErrors()) {
            errors << details.standardError;
            return Success;
        }
        Report(answer->GetErrorMessages());
        return details.outcome == CommandOutcome::BadCommand ? BadCommandLine : Failure;
    }

    std::ostream& output;
    std::ostream& errors;
    Dispatcher dispatcher;
    bool badDescriptions = false;
};

}  // namespace

ExitStatus RunNvcli(const std::vector<std::string>& arguments, std::ostream& output,
                    std::ostream& errors) {
    const CommandLine line = ParseCommandLine(arguments);
    ExitStatus status = BadCommandLine;
    if (!line.error.empty()) {
        errors << "nvcli: " << line.error << '\n';
    } else if (line.version) {
        output << "nvcli " << NVCLI_VERSION << '\n';
        status = Success;
    } else {
        status = Program(output, errors).Run(line);
    }
    if (!output.flush()) {
        errors << "nvcli: cannot write the output\n";
        return status == Success ? Failure : status;
    }
    return status;
}

}  // namespace nvcli
