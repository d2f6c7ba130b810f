#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <stdexcept>

#include "basekit/DispatcherFixture.h"
#include "support/ErrorText.h"

// What a command line can be refused for, and what can become of a program: each in its own words.
namespace BaseKit::AutoCli {

namespace {

using ::testing::ElementsAre;
using vantor::support::DispatcherFixture;
using vantor::support::ErrorText;
using vantor::support::Executed;
using vantor::support::ExecuteLine;
using vantor::support::SimpleCommand;

class DispatcherErrorsTest : public DispatcherFixture {
protected:
    // Knows the command "run", a shell that does this.
    void KnowShell(const std::string& commands) {
        Know(SimpleCommand("run", R"("/bin/sh", "-c", ")" + commands + "\""));
    }

    // Knows the command "set", which prints one line for each argument.
    void KnowOptions() {
        Know(R"({"path": "network set", "summary": "Sets", "options": [
                    {"name": "port", "letter": "p", "kind": "integer", "required": true},
                    {"name": "name", "letter": "n", "kind": "string"},
                    {"name": "note", "kind": "string", "allowEmpty": true},
                    {"name": "log", "kind": "boolean"},
                    {"name": "state", "kind": "choice", "values": ["open", "half open"]},
                    {"name": "force", "letter": "f", "kind": "flag"}],
                 "execute": ["/usr/bin/printf", "%s\\n", "port=${port}", "name=${name}",
                             "note=${note}", "log=${log}", "state=${state}",
                             {"when": "force", "arguments": ["forced"]}]})");
    }
};

TEST_F(DispatcherErrorsTest, AnUnknownCommandNamesTheNearestOne) {
    KnowOptions();
    EXPECT_THAT(ErrorsOf("netwrk set --port=1"),
                ElementsAre("unknown command \"netwrk set\"; the nearest known one is "
                            "\"network set\""));
    EXPECT_THAT(ErrorsOf("network"),
                ElementsAre("\"network\" is a namespace and needs a command word, as in "
                            "\"network set\""));
}

TEST_F(DispatcherErrorsTest, WithoutADirectoryNoCommandIsKnown) {
    EXPECT_THAT(ErrorsOf("network set"),
                ElementsAre("unknown command \"network set\"; no command is known at all"));
}

TEST_F(DispatcherErrorsTest, AnInputWithoutAPathNamesNoCommand) {
    const auto output = CommandOutput::New();
    EXPECT_FALSE(dispatcher.ExecuteCommand(CommandInput::New(), output));
    EXPECT_THAT(output->GetErrorMessages(), ElementsAre("no command is named"));
}

TEST_F(DispatcherErrorsTest, AMissingRequiredOptionIsNamed) {
    KnowOptions();
    EXPECT_THAT(ErrorsOf("network set --name=x"),
                ElementsAre("the command \"network set\" needs the option \"--port\""));
}

TEST_F(DispatcherErrorsTest, AnUnknownOptionIsNamedAsItWasTyped) {
    KnowOptions();
    EXPECT_THAT(ErrorsOf("network set --port=1 --prot=2 -x"),
                ElementsAre("the command \"network set\" has no option \"--prot\"",
                            "the command \"network set\" has no option \"-x\""));
}

TEST_F(DispatcherErrorsTest, AValueOfTheWrongKindIsNamed) {
    KnowOptions();
    const std::pair<const char*, const char*> cases[] = {
        {"--port=abc", "the value \"abc\" of the option \"--port\" is not an integer"},
        {"--port=1x", "the value \"1x\" of the option \"--port\" is not an integer"},
        {"--port=' 1'", "the value \" 1\" of the option \"--port\" is not an integer"},
        {"--port=+1", "the value \"+1\" of the option \"--port\" is not an integer"},
        {"--port=0x10", "the value \"0x10\" of the option \"--port\" is not an integer"},
        {"--port=-", "the value \"-\" of the option \"--port\" is not an integer"},
        {"-p1.5", "the value \"1.5\" of the option \"-p\" is not an integer"},
        {"--port=9223372036854775808",
         "the value \"9223372036854775808\" of the option \"--port\" is not an integer of 64 bits"},
        {"-p1 --log=yes",
         "the value \"yes\" of the option \"--log\" is neither \"true\" nor \"false\""},
        {"-p1 --state=shut",
         "the value \"shut\" of the option \"--state\" is not one of \"open\", \"half open\""},
        {"-p1 --force now", "the option \"--force\" takes no value, but is given \"now\""},
        {"-p1 -fn", "the option \"-f\" takes no value, but is given \"n\""},
        {"--port", "the option \"--port\" needs a value"},
        {"-p1 --name=", "the option \"--name\" needs a value"},
        {"-p1 --log ''", "the option \"--log\" needs a value"},
    };
    for (const auto& [options, error] : cases) {
        EXPECT_THAT(ErrorsOf(std::string("network set ") + options), ElementsAre(error));
    }
}

TEST_F(DispatcherErrorsTest, AnOptionGivenTwiceIsNamed) {
    KnowOptions();
    EXPECT_THAT(ErrorsOf("network set --port=1 -p2 --port=x"),
                ElementsAre("the option \"--port\" is given twice",
                            "the option \"--port\" is given twice"));
}

TEST_F(DispatcherErrorsTest, EveryErrorOfALineIsNamed) {
    KnowOptions();
    EXPECT_THAT(ErrorsOf("network set --log=1 --what --state=ajar"),
                ElementsAre("the value \"1\" of the option \"--log\" is neither \"true\" nor "
                            "\"false\"",
                            "the command \"network set\" has no option \"--what\"",
                            "the value \"ajar\" of the option \"--state\" is not one of \"open\", "
                            "\"half open\"",
                            "the command \"network set\" needs the option \"--port\""));
}

TEST_F(DispatcherErrorsTest, ARefusedLineExecutesNothing) {
    folder.Write("witness", "");
    Know(SimpleCommand("run", "\"/bin/rm\", \"" + folder.File("witness") + "\""));
    ErrorsOf("run --what");
    EXPECT_EQ(vantor::support::ReadFile(folder.File("witness")), "");
}

// A caller of the library is not bound to what a command line can hold.
TEST_F(DispatcherErrorsTest, AParameterWithANullCharacterIsRefused) {
    KnowOptions();
    const auto input = CommandInput::New();
    const auto output = CommandOutput::New();
    input->SetCommandPath({"network", "set"});
    input->AddParameter("port", "1");
    input->AddParameter("name", std::string("a\0b", 3));
    EXPECT_FALSE(dispatcher.ExecuteCommand(input, output));
    EXPECT_THAT(output->GetErrorMessages(),
                ElementsAre("the value \"" + std::string("a\0b", 3) +
                            "\" of the option \"--name\" has a null character"));
}

TEST_F(DispatcherErrorsTest, AMissingProgramCannotBeExecuted) {
    Know(SimpleCommand("run", "\"/nowhere/program\""));
    EXPECT_THAT(ErrorsOf("run"),
                ElementsAre("cannot execute \"/nowhere/program\": No such file or directory"));
}

TEST_F(DispatcherErrorsTest, AFileThatIsNoProgramCannotBeExecuted) {
    const std::string data = folder.File("data");
    folder.Write("data", "data");
    Know(SimpleCommand("run", "\"" + data + "\""));
    EXPECT_THAT(ErrorsOf("run"), ElementsAre("cannot execute \"" + data + "\": Permission denied"));
}

TEST_F(DispatcherErrorsTest, AnExitStatusIsNamedWithWhatWasWrittenOnStandardError) {
    KnowShell("echo result; echo 'first line' >&2; echo 'second line' >&2; exit 3");
    const Executed executed = ExecuteLine(dispatcher, "run");
    EXPECT_THAT(executed.errors,
                ElementsAre("\"/bin/sh\" ended with exit status 3: first line\nsecond line"));
    EXPECT_EQ(executed.output, "result\n");
}

TEST_F(DispatcherErrorsTest, ASilentFailureIsNamedAllTheSame) {
    KnowShell("exit 1");
    EXPECT_THAT(ErrorsOf("run"), ElementsAre("\"/bin/sh\" ended with exit status 1"));
}

TEST_F(DispatcherErrorsTest, AKillingSignalIsNamed) {
    KnowShell("echo dying >&2; kill -TERM $$$$");
    EXPECT_THAT(ErrorsOf("run"), ElementsAre("\"/bin/sh\" was killed by signal 15: dying"));
}

// A log would break the line off at a null character.
TEST_F(DispatcherErrorsTest, NullCharactersOfAComplaintAreReplaced) {
    KnowShell(R"(printf 'a\\0b' >&2; exit 1)");
    EXPECT_THAT(ErrorsOf("run"), ElementsAre("\"/bin/sh\" ended with exit status 1: a?b"));
}

TEST_F(DispatcherErrorsTest, ALongComplaintIsShortenedInTheMiddle) {
    KnowShell("head -c 1048576 /dev/zero | tr '\\\\000' x >&2; echo end >&2; exit 1");
    const std::vector<std::string> errors = ErrorsOf("run");
    ASSERT_THAT(errors, ::testing::SizeIs(1));
    EXPECT_EQ(errors[0], "\"/bin/sh\" ended with exit status 1: " + std::string(65536, 'x') +
                             "\n[917508 bytes left out]\n" + std::string(65532, 'x') + "end");
}

TEST_F(DispatcherErrorsTest, MoreOutputThanIsKeptIsAnError) {
    KnowShell("head -c 68157440 /dev/zero");
    const Executed executed = ExecuteLine(dispatcher, "run");
    EXPECT_FALSE(executed.succeeded);
    EXPECT_THAT(executed.errors, ElementsAre("\"/bin/sh\" wrote 1048576 bytes more on standard "
                                             "output than are kept"));
    EXPECT_EQ(executed.output,
              std::string(std::size_t{64} * 1024 * 1024, '\0') + "\n[1048576 bytes left out]\n");
}

TEST_F(DispatcherErrorsTest, AnOutputTellsOfItsLastExecutionOnly) {
    KnowShell("echo fine");
    const auto output = CommandOutput::New();
    EXPECT_FALSE(dispatcher.ExecuteCommand(CommandInput::New(), output));
    const auto input = CommandInput::New();
    input->SetCommandPath({"run"});
    EXPECT_TRUE(dispatcher.ExecuteCommand(input, output));
    EXPECT_FALSE(output->HasErrors());
    EXPECT_THAT(output->GetErrorMessages(), ::testing::IsEmpty());
    EXPECT_EQ(dispatcher.FormatOutput(output), "fine\n");
}

TEST_F(DispatcherErrorsTest, WithoutAnInputOrAnOutputNothingIsExecuted) {
    const char* const inputText = "the input of a command comes from CommandInput::New";
    const char* const outputText = "the output of a command comes from CommandOutput::New";
    EXPECT_EQ(ErrorText<std::invalid_argument>(
                  [this] { dispatcher.ExecuteCommand(nullptr, CommandOutput::New()); }),
              inputText);
    EXPECT_EQ(ErrorText<std::invalid_argument>(
                  [this] { dispatcher.ExecuteCommand(CommandInput::New(), nullptr); }),
              outputText);
    EXPECT_EQ(ErrorText<std::invalid_argument>([this] { dispatcher.FormatOutput(nullptr); }),
              outputText);
}

}  // namespace

}  // namespace BaseKit::AutoCli
