#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>

#include "basekit/ArgumentTemplate.h"
#include "basekit/BaseKitFaults.h"
#include "basekit/DescriptionFolder.h"
#include "basekit/DescriptionLoader.h"
#include "support/ErrorText.h"

namespace BaseKit::impl {

namespace {

using AutoCli::CommandDescription;
using AutoCli::DescriptionError;
using AutoCli::ValueKind;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using vantor::support::DescriptionFolder;
using vantor::support::ErrorText;
using vantor::support::Faults;
using vantor::support::FaultScope;
using vantor::support::SimpleCommand;

class DescriptionFileTest : public ::testing::Test {
protected:
    // The one command of a file without a mistake.
    CommandDescription ReadOne(const std::string& command) const {
        folder.WriteCommands("one.json", command);
        const DescriptionFile file = ReadDescriptionFile(folder.File("one.json"));
        EXPECT_THAT(file.mistakes.Texts(), IsEmpty());
        EXPECT_THAT(file.commands, ::testing::SizeIs(1));
        return *file.commands.at(0).command;
    }

    std::vector<std::string> Mistakes(const std::string& name) const {
        return ReadDescriptionFile(folder.File(name)).mistakes.Texts();
    }

    const FaultScope scope;
    DescriptionFolder folder;
};

TEST_F(DescriptionFileTest, ACommandNeedsAPathASummaryAndAProgram) {
    const CommandDescription command =
        ReadOne(R"({"path": "ping", "summary": "Answers", "execute": ["/bin/echo"]})");
    EXPECT_THAT(command.path, ElementsAre("ping"));
    EXPECT_EQ(command.summary, "Answers");
    EXPECT_THAT(command.options, IsEmpty());
    EXPECT_EQ(command.program, "/bin/echo");
    EXPECT_THAT(command.arguments, IsEmpty());
    EXPECT_EQ(command.file, folder.File("one.json"));
}

TEST_F(DescriptionFileTest, EveryPartOfAnOptionIsRead) {
    const CommandDescription command = ReadOne(R"({
        "path": "network firewall.v4 set-rule_1", "summary": "Sets", "execute": ["/bin/echo"],
        "options": [
            {"name": "verbose", "letter": "V", "kind": "flag", "summary": "Says more"},
            {"name": "text", "kind": "string", "allowEmpty": true},
            {"name": "port", "letter": "p", "kind": "integer", "required": true},
            {"name": "log", "kind": "boolean"},
            {"name": "state", "kind": "choice", "values": ["open", "half open"]}]})");
    EXPECT_THAT(command.path, ElementsAre("network", "firewall.v4", "set-rule_1"));
    ASSERT_EQ(command.options.size(), 5U);
    EXPECT_EQ(command.options[0].name, "verbose");
    EXPECT_EQ(command.options[0].letter, 'V');
    EXPECT_EQ(command.options[0].kind, ValueKind::Flag);
    EXPECT_EQ(command.options[0].summary, "Says more");
    EXPECT_EQ(command.options[1].letter, '\0');
    EXPECT_EQ(command.options[1].kind, ValueKind::String);
    EXPECT_TRUE(command.options[1].allowEmpty);
    EXPECT_FALSE(command.options[1].required);
    EXPECT_EQ(command.options[2].kind, ValueKind::Integer);
    EXPECT_TRUE(command.options[2].required);
    EXPECT_FALSE(command.options[2].allowEmpty);
    EXPECT_EQ(command.options[3].kind, ValueKind::Boolean);
    EXPECT_EQ(command.options[4].kind, ValueKind::Choice);
    EXPECT_THAT(command.options[4].choices, ElementsAre("open", "half open"));
}

class ArgumentsTest : public DescriptionFileTest {
protected:
    // The argument vector that these elements of "execute" become.
    std::vector<std::string> Expand(const std::string& elements, const OptionValues& values) const {
        return ExpandArguments(ReadOne(R"({"path": "set", "summary": "Sets", "options": [
                                   {"name": "port", "kind": "integer"},
                                   {"name": "host", "kind": "string", "allowEmpty": true},
                                   {"name": "force", "kind": "flag"}],
                                   "execute": ["/x", )" +
                                       elements + "]}"),
                               values);
    }

    static constexpr std::nullopt_t none = std::nullopt;
};

TEST_F(ArgumentsTest, PlaceholdersBecomeValues) {
    EXPECT_THAT(Expand(R"("set", "${port}", "-h${host}:${port}!", "")", {"80", "a b", none}),
                ElementsAre("/x", "set", "80", "-ha b:80!", ""));
}

TEST_F(ArgumentsTest, AnArgumentOfAnOptionThatIsNotGivenIsLeftOut) {
    EXPECT_THAT(Expand(R"("${port}", "${host}", "${host}:${port}")", {none, "a", none}),
                ElementsAre("/x", "a"));
}

TEST_F(ArgumentsTest, AnEmptyValueIsAValue) {
    EXPECT_THAT(Expand(R"("${host}", "[${host}]")", {none, "", none}), ElementsAre("/x", "", "[]"));
}

TEST_F(ArgumentsTest, ConditionalArgumentsNeedTheirOption) {
    const std::string elements = R"({"when": "force", "arguments": ["-f", "${port}"]},
                                    {"when": "port", "arguments": ["--port", "${port}"]},
                                    {"when": "force", "arguments": []}, "end")";
    EXPECT_THAT(Expand(elements, {none, none, none}), ElementsAre("/x", "end"));
    EXPECT_THAT(Expand(elements, {"5", none, none}), ElementsAre("/x", "--port", "5", "end"));
    EXPECT_THAT(Expand(elements, {none, none, ""}), ElementsAre("/x", "-f", "end"));
    EXPECT_THAT(Expand(elements, {"5", none, ""}),
                ElementsAre("/x", "-f", "5", "--port", "5", "end"));
}

TEST_F(ArgumentsTest, ADoubledDollarIsOne) {
    EXPECT_THAT(Expand(R"("$$", "$${port}", "a$$$$b", "$$${port}")", {"80", none, none}),
                ElementsAre("/x", "$", "${port}", "a$$b", "$80"));
}

TEST_F(ArgumentsTest, AValueIsNotReadForPlaceholders) {
    EXPECT_THAT(Expand(R"("${host}")", {"80", "${port}$", none}), ElementsAre("/x", "${port}$"));
}

TEST_F(DescriptionFileTest, GoodCommandsOfABadFileCount) {
    folder.WriteCommands("mixed.json", SimpleCommand("one", "\"/x\"") + "," +
                                           SimpleCommand("two", "\"x\"") + "," +
                                           SimpleCommand("three", "\"/x\""));
    const DescriptionFile file = ReadDescriptionFile(folder.File("mixed.json"));
    ASSERT_EQ(file.commands.size(), 2U);
    EXPECT_THAT(file.commands[0].command->path, ElementsAre("one"));
    EXPECT_THAT(file.commands[1].command->path, ElementsAre("three"));
    EXPECT_EQ(file.commands[1].place, "/commands/2/path");
    EXPECT_THAT(file.mistakes.Texts(),
                ElementsAre(folder.File("mixed.json") +
                            ": /commands/1/execute/0: \"x\" is not the absolute path of a "
                            "program"));
}

TEST_F(DescriptionFileTest, AMissingFileIsAMistake) {
    EXPECT_THAT(
        Mistakes("no.json"),
        ElementsAre(folder.File("no.json") + ": cannot read the file: No such file or directory"));
}

TEST_F(DescriptionFileTest, AFileThatCannotBeOpenedIsAMistake) {
    folder.WriteCommands("shut.json", "");
    Faults().open.FailCall(1, EACCES);
    EXPECT_THAT(Mistakes("shut.json"), ElementsAre(folder.File("shut.json") +
                                                   ": cannot read the file: Permission denied"));
}

TEST_F(DescriptionFileTest, AFileThatCannotBeReadToItsEndIsAMistake) {
    folder.Write("worn.json", std::string(100000, ' ') + "{}");
    Faults().read.FailCall(3, EIO);
    EXPECT_THAT(Mistakes("worn.json"), ElementsAre(folder.File("worn.json") +
                                                   ": cannot read the file: Input/output error"));
}

TEST_F(DescriptionFileTest, AnInterruptedReadGoesOn) {
    folder.WriteCommands("one.json", SimpleCommand("one", "\"/x\""));
    Faults().read.FailCall(1, EINTR);
    EXPECT_THAT(Mistakes("one.json"), IsEmpty());
}

// Opening a FIFO would wait for a writer for ever.
TEST_F(DescriptionFileTest, WhatIsNoRegularFileIsAMistake) {
    ASSERT_EQ(mkfifo(folder.File("fifo.json").c_str(), 0600), 0);
    ASSERT_EQ(mkdir(folder.File("folder.json").c_str(), 0700), 0);
    EXPECT_THAT(Mistakes("fifo.json"),
                ElementsAre(folder.File("fifo.json") + ": not a regular file"));
    EXPECT_THAT(Mistakes("folder.json"),
                ElementsAre(folder.File("folder.json") + ": not a regular file"));
}

TEST_F(DescriptionFileTest, ALinkToAFileIsRead) {
    folder.WriteCommands("real", SimpleCommand("one", "\"/x\""));
    ASSERT_EQ(symlink("real", folder.File("link.json").c_str()), 0);
    EXPECT_THAT(Mistakes("link.json"), IsEmpty());
}

// Deep nesting must not use up the stack.
TEST_F(DescriptionFileTest, AMillionLevelsAreAMistakeLikeAnyOther) {
    const std::string opening(1000000, '[');
    const std::string closing(1000000, ']');
    folder.Write("deep.json", opening + closing);
    EXPECT_THAT(Mistakes("deep.json"),
                ElementsAre(folder.File("deep.json") + ": must be an object, not an array"));
}

TEST_F(DescriptionFileTest, AFolderListsItsDescriptionsByName) {
    for (const char* name : {"b.json", "a.json", "B.json", "10.json", "9.json", ".hidden.json",
                             "c.json~", "d.JSON", "json", ".json", "README"}) {
        folder.Write(name, "");
    }
    EXPECT_THAT(ListDescriptionFiles(folder.Path()),
                ElementsAre(folder.File("10.json"), folder.File("9.json"), folder.File("B.json"),
                            folder.File("a.json"), folder.File("b.json")));
    EXPECT_EQ(ListDescriptionFiles(folder.Path() + "/").front(), folder.File("10.json"));
}

TEST_F(DescriptionFileTest, AFolderThatCannotBeListedIsAnError) {
    const std::string missing = folder.File("missing");
    EXPECT_EQ(ErrorText<DescriptionError>([&] { ListDescriptionFiles(missing); }),
              missing + ": cannot read the directory: No such file or directory");
    EXPECT_EQ(ErrorText<DescriptionError>([&] { ListDescriptionFiles(""); }),
              ": cannot read the directory: No such file or directory");
    folder.Write("file", "");
    EXPECT_EQ(ErrorText<DescriptionError>([&] { ListDescriptionFiles(folder.File("file")); }),
              folder.File("file") + ": cannot read the directory: Not a directory");
}

TEST_F(DescriptionFileTest, AFolderThatCannotBeListedToItsEndIsAnError) {
    folder.Write("a.json", "");
    Faults().readdir.FailCall(2, EIO);
    EXPECT_EQ(ErrorText<DescriptionError>([&] { ListDescriptionFiles(folder.Path()); }),
              folder.Path() + ": cannot read the directory: Input/output error");
}

}  // namespace

}  // namespace BaseKit::impl
