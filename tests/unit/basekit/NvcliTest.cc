#include "nvcli/Nvcli.h"

#include <gtest/gtest.h>

#include <sstream>

#include "basekit/DescriptionFolder.h"

namespace nvcli {

namespace {

using vantor::support::DescriptionFolder;
using vantor::support::SimpleCommand;

class NvcliTest : public ::testing::Test {
protected:
    // Runs the program with the folder of descriptions and these arguments behind it.
    ExitStatus RunHere(std::vector<std::string> arguments) {
        arguments.insert(arguments.begin(), "--directory=" + folder.Path());
        return RunWith(arguments);
    }

    ExitStatus RunWith(const std::vector<std::string>& arguments) {
        output.str("");
        errors.str("");
        return RunNvcli(arguments, output, errors);
    }

    DescriptionFolder folder;
    std::ostringstream output;
    std::ostringstream errors;
};

TEST_F(NvcliTest, ACommandThatSucceedsHasItsOutputAndStatus0) {
    folder.WriteCommands("a.json", SimpleCommand("net ping", R"("/bin/sh", "-c",
                                                 "echo pong; echo careful >&2")"));
    EXPECT_EQ(RunHere({"net", "ping"}), Success);
    EXPECT_EQ(output.str(), "pong\n");
    EXPECT_EQ(errors.str(), "careful\n");
}

TEST_F(NvcliTest, ACommandThatFailsHasItsOutputItsErrorAndStatus1) {
    folder.WriteCommands("a.json", SimpleCommand("run", R"("/bin/sh", "-c",
                                                 "echo half; echo broken >&2; exit 9")"));
    EXPECT_EQ(RunHere({"run"}), Failure);
    EXPECT_EQ(output.str(), "half\n");
    EXPECT_EQ(errors.str(), "nvcli: \"/bin/sh\" ended with exit status 9: broken\n");
}

TEST_F(NvcliTest, ACommandThatCannotBeExecutedHasStatus1) {
    folder.WriteCommands("a.json", SimpleCommand("run", "\"/nowhere/program\""));
    EXPECT_EQ(RunHere({"run"}), Failure);
    EXPECT_EQ(errors.str(),
              "nvcli: cannot execute \"/nowhere/program\": No such file or directory\n");
}

TEST_F(NvcliTest, ACommandThatTheFrameworkRefusesHasStatus2) {
    folder.WriteCommands("a.json", SimpleCommand("ping", "\"/bin/true\""));
    EXPECT_EQ(RunHere({"ping", "--force", "-x"}), BadCommandLine);
    EXPECT_EQ(errors.str(), "nvcli: the command \"ping\" has no option \"--force\"\n"
                            "nvcli: the command \"ping\" has no option \"-x\"\n");
    EXPECT_EQ(RunHere({"pong"}), BadCommandLine);
    EXPECT_EQ(errors.str(), "nvcli: unknown command \"pong\"; the nearest known one is \"ping\"\n");
    EXPECT_EQ(output.str(), "");
}

TEST_F(NvcliTest, ALineThatDoesNotParseHasStatus2) {
    EXPECT_EQ(RunHere({"net", "", "--a1=1", "x"}), BadCommandLine);
    EXPECT_EQ(errors.str(), "nvcli: the command word after \"net\" is empty\n"
                            "nvcli: the value \"x\" belongs to no option\n");
}

TEST_F(NvcliTest, EveryArgumentArrivesAsItWasTyped) {
    folder.WriteCommands("a.json", R"({"path": "say", "summary": "Says", "options": [
        {"name": "text", "letter": "t", "kind": "string"}], "execute":
        ["/usr/bin/printf", "%s", "${text}"]})");
    for (const std::string text : {"a  b", "it's", "\"quoted\"", "back\\slash", "$HOME", "a\nb",
                                   "''", "\\'", "gr\xc3\xbc\xc3\x9f"}) {
        EXPECT_EQ(RunHere({"say", "--text", text}), Success) << text << errors.str();
        EXPECT_EQ(output.str(), text);
    }
}

TEST_F(NvcliTest, DirectoriesMayBeRepeatedInBothForms) {
    const DescriptionFolder second;
    folder.WriteCommands("a.json", SimpleCommand("one", "\"/bin/echo\", \"1\""));
    second.WriteCommands("a.json", SimpleCommand("two", "\"/bin/echo\", \"2\""));
    const std::vector<std::string> both = {"--directory=" + folder.Path(), "--directory",
                                           second.Path()};
    for (const auto& [word, number] : {std::pair("one", "1\n"), {"two", "2\n"}}) {
        std::vector<std::string> arguments = both;
        arguments.emplace_back(word);
        EXPECT_EQ(RunWith(arguments), Success);
        EXPECT_EQ(output.str(), number);
    }
}

TEST_F(NvcliTest, ABadDescriptionIsReportedAndItsGoodCommandsRun) {
    folder.Write("a.json", "[]");
    folder.WriteCommands("b.json", SimpleCommand("ping", "\"/bin/echo\", \"pong\""));
    EXPECT_EQ(RunHere({"ping"}), Success);
    EXPECT_EQ(output.str(), "pong\n");
    EXPECT_EQ(errors.str(),
              "nvcli: " + folder.File("a.json") + ": must be an object, not an array\n");
}

TEST_F(NvcliTest, EveryMistakeHasItsLineAndHelpThenHasStatus1) {
    folder.WriteCommands("a.json", "{}");
    EXPECT_EQ(RunHere({}), Failure);
    EXPECT_EQ(
        errors.str(),
        "nvcli: " + folder.File("a.json") + ": /commands/0: the key \"path\" is missing\n" +
            "nvcli: " + folder.File("a.json") + ": /commands/0: the key \"summary\" is missing\n" +
            "nvcli: " + folder.File("a.json") + ": /commands/0: the key \"execute\" is missing\n");
}

TEST_F(NvcliTest, AMissingDirectoryIsReported) {
    const std::string missing = folder.File("missing");
    EXPECT_EQ(RunWith({"--directory=" + missing}), Failure);
    EXPECT_EQ(errors.str(),
              "nvcli: " + missing + ": cannot read the directory: No such file or directory\n");
}

TEST_F(NvcliTest, ABadOptionOfItsOwnHasStatus2) {
    EXPECT_EQ(RunWith({"--what", "ping"}), BadCommandLine);
    EXPECT_EQ(errors.str(), "nvcli: nvcli itself has no option \"--what\"; those of a command "
                            "stand behind its words\n");
    EXPECT_EQ(RunWith({"--directory"}), BadCommandLine);
    EXPECT_EQ(errors.str(), "nvcli: the option \"--directory\" needs a value\n");
    EXPECT_EQ(RunWith({"--directory=", "ping"}), BadCommandLine);
    EXPECT_EQ(errors.str(), "nvcli: the option \"--directory\" needs a value\n");
    EXPECT_EQ(output.str(), "");
}

TEST_F(NvcliTest, TheVersionIsShown) {
    EXPECT_EQ(RunWith({"--version"}), Success);
    EXPECT_EQ(output.str(), "nvcli " NVCLI_VERSION "\n");
}

TEST_F(NvcliTest, OutputThatCannotBeWrittenIsAFailure) {
    output.setstate(std::ios_base::badbit);
    EXPECT_EQ(RunNvcli({"--version"}, output, errors), Failure);
    EXPECT_EQ(errors.str(), "nvcli: cannot write the output\n");
}

}  // namespace

}  // namespace nvcli
