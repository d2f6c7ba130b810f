#ifndef VANTOR_BASEKIT_TESTS_DISPATCHERFIXTURE_H
#define VANTOR_BASEKIT_TESTS_DISPATCHERFIXTURE_H

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "basekit/DescriptionFolder.h"
#include "platform/BaseKit.h"

namespace vantor::support {

// What one execution left behind.
struct Executed {
    bool succeeded = false;
    bool hasErrors = false;
    std::vector<std::string> errors;
    std::string output;
};

// Parses a command line and executes it, as the callers of the library do. A line that does not
// parse fails the test.
inline Executed ExecuteLine(BaseKit::AutoCli::Dispatcher& dispatcher, const std::string& line) {
    BaseKit::AutoCli::OptionParser parser("nvcli");
    EXPECT_FALSE(parser.ParseString(line)) << line;
    EXPECT_EQ(parser.GetParseErrors(), std::vector<std::string>{}) << line;
    const auto input = BaseKit::AutoCli::CommandInput::New();
    const auto output = BaseKit::AutoCli::CommandOutput::New();
    input->SetCallerName("test");
    input->SetCommandPath(parser.GetCommandPath());
    for (const auto& [name, value] : parser.GetCommandParameters()) {
        input->AddParameter(name, value);
    }
    Executed executed;
    executed.succeeded = dispatcher.ExecuteCommand(input, output);
    executed.hasErrors = output->HasErrors();
    executed.errors = output->GetErrorMessages();
    executed.output = dispatcher.FormatOutput(output);
    return executed;
}

// A dispatcher, and a folder of descriptions for it.
class DispatcherFixture : public ::testing::Test {
protected:
    // Describes these commands in a file of the folder and adds the folder.
    void Know(const std::string& commands) {
        folder.WriteCommands("known.json", commands);
        dispatcher.AddExternalDirectory(folder.Path());
    }

    // The output of a line that succeeds.
    std::string OutputOf(const std::string& line) {
        const Executed executed = ExecuteLine(dispatcher, line);
        EXPECT_TRUE(executed.succeeded) << line;
        EXPECT_FALSE(executed.hasErrors) << line;
        EXPECT_EQ(executed.errors, std::vector<std::string>{}) << line;
        return executed.output;
    }

    // The errors of a line that fails.
    std::vector<std::string> ErrorsOf(const std::string& line) {
        const Executed executed = ExecuteLine(dispatcher, line);
        EXPECT_FALSE(executed.succeeded) << line;
        EXPECT_TRUE(executed.hasErrors) << line;
        return executed.errors;
    }

    DescriptionFolder folder;
    BaseKit::AutoCli::Dispatcher dispatcher;
};

}  // namespace vantor::support

#endif
