#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "basekit/CommandNamespace.h"
#include "basekit/CommandOutput.h"
#include "basekit/DispatcherFixture.h"
#include "basekit/Mistakes.h"
#include "basekit/OutputFormatter.h"
#include "support/ErrorText.h"

namespace BaseKit::AutoCli {

namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::Pair;
using vantor::support::DescriptionFolder;
using vantor::support::DispatcherFixture;
using vantor::support::ErrorText;
using vantor::support::ReadFile;
using vantor::support::SimpleCommand;

class DispatcherTest : public DispatcherFixture {
protected:
    // The text of the exception that adding the folder throws.
    std::string Refusal(const DescriptionFolder& added) {
        return ErrorText<DescriptionError>([&] { dispatcher.AddExternalDirectory(added.Path()); });
    }

    // A command that prints a word.
    static std::string Echo(const std::string& path, const std::string& word) {
        return SimpleCommand(path, "\"/bin/echo\", \"" + word + "\"");
    }
};

TEST_F(DispatcherTest, ExecutesACommandWithTheValuesOfItsOptions) {
    Know(R"({"path": "file write", "summary": "Writes", "options": [
                {"name": "path", "letter": "o", "kind": "string", "required": true},
                {"name": "lines", "kind": "integer"},
                {"name": "mode", "kind": "choice", "values": ["text", "raw"]},
                {"name": "sync", "kind": "boolean"},
                {"name": "note", "kind": "string", "allowEmpty": true},
                {"name": "quiet", "letter": "q", "kind": "flag"}],
             "execute": ["/usr/bin/printf", "%s|", "${path}", "${lines}", "${mode}", "${sync}",
                         "<${note}>", {"when": "quiet", "arguments": ["quiet"]}]})");
    EXPECT_EQ(OutputOf("file write -o'/a b'"), "/a b|");
    EXPECT_EQ(OutputOf("file write --path=/a --lines -9223372036854775808 --mode=raw --sync=false "
                       "--note='' -q"),
              "/a|-9223372036854775808|raw|false|<>|quiet|");
}

TEST_F(DispatcherTest, ACommandChangesTheHost) {
    const std::string made = folder.File("made");
    Know(SimpleCommand("make", "\"/bin/sh\", \"-c\", \"echo made > '" + made + "'\""));
    EXPECT_EQ(OutputOf("make"), "");
    EXPECT_EQ(ReadFile(made), "made\n");
}

TEST_F(DispatcherTest, AComplaintOfACommandThatSucceedsIsNoError) {
    Know(SimpleCommand("run", R"("/bin/sh", "-c", "echo warning >&2; echo done")"));
    EXPECT_EQ(OutputOf("run"), "done\n");
}

TEST_F(DispatcherTest, MoreThanThePipesHoldComesThroughOnBothStreams) {
    Know(SimpleCommand("run", R"("/bin/sh", "-c", "head -c 1048576 /dev/zero >&2; )"
                              R"(head -c 1048576 /dev/zero")"));
    EXPECT_EQ(OutputOf("run"), std::string(1048576, '\0'));
}

TEST_F(DispatcherTest, DirectoriesAddUp) {
    const DescriptionFolder second;
    folder.WriteCommands("a.json", Echo("one", "1"));
    folder.WriteCommands("b.json", Echo("two", "2") + "," + Echo("three", "3"));
    second.WriteCommands("a.json", Echo("four", "4"));
    dispatcher.AddExternalDirectory(folder.Path());
    dispatcher.AddExternalDirectory(second.Path());
    EXPECT_EQ(OutputOf("one") + OutputOf("two") + OutputOf("three") + OutputOf("four"),
              "1\n2\n3\n4\n");
}

TEST_F(DispatcherTest, AnEmptyDirectoryIsGood) {
    dispatcher.AddExternalDirectory(folder.Path());
    EXPECT_THAT(dispatcher.GetPluginNames(), IsEmpty());
}

TEST_F(DispatcherTest, AMissingDirectoryIsAnError) {
    const std::string missing = folder.File("missing");
    EXPECT_EQ(ErrorText<DescriptionError>([&] { dispatcher.AddExternalDirectory(missing); }),
              missing + ": cannot read the directory: No such file or directory");
}

TEST_F(DispatcherTest, APathDescribedTwiceIsAnErrorOfTheLaterFile) {
    folder.WriteCommands("a.json", Echo("net set", "first"));
    folder.WriteCommands("b.json", Echo("net get", "get") + "," + Echo("net set", "second"));
    EXPECT_EQ(Refusal(folder), folder.File("b.json") +
                                   ": /commands/1/path: the command \"net set\" is described "
                                   "already in " +
                                   folder.File("a.json"));
    EXPECT_EQ(OutputOf("net set") + OutputOf("net get"), "first\nget\n");
}

TEST_F(DispatcherTest, APathDescribedTwiceInOneFileIsAnErrorOfIt) {
    folder.WriteCommands("a.json", Echo("set", "first") + "," + Echo("set", "second"));
    EXPECT_EQ(Refusal(folder), folder.File("a.json") +
                                   ": /commands/1/path: the command \"set\" is described already "
                                   "in " +
                                   folder.File("a.json"));
    EXPECT_EQ(OutputOf("set"), "first\n");
}

TEST_F(DispatcherTest, APathDescribedTwiceInTwoDirectoriesIsAnErrorOfTheLaterFile) {
    const DescriptionFolder second;
    folder.WriteCommands("z.json", Echo("set", "first"));
    second.WriteCommands("a.json", Echo("set", "second") + "," + Echo("get", "get"));
    dispatcher.AddExternalDirectory(folder.Path());
    EXPECT_EQ(Refusal(second), second.File("a.json") +
                                   ": /commands/0/path: the command \"set\" is described already "
                                   "in " +
                                   folder.File("z.json"));
    EXPECT_EQ(OutputOf("set") + OutputOf("get"), "first\nget\n");
}

TEST_F(DispatcherTest, AllMistakesOfADirectoryAreToldAndItsGoodCommandsAreKnown) {
    folder.Write("a.json", "{");
    folder.WriteCommands("b.json", Echo("one", "1") + ", {\"path\": \"two\"}");
    folder.WriteCommands("c.json", Echo("three", "3"));
    EXPECT_EQ(Refusal(folder),
              folder.File("a.json") +
                  ": line 1, column 2: syntax error while parsing object key - unexpected end of "
                  "input; expected string literal; " +
                  folder.File("b.json") + ": /commands/1: the key \"summary\" is missing; " +
                  folder.File("b.json") + ": /commands/1: the key \"execute\" is missing");
    EXPECT_EQ(OutputOf("one") + OutputOf("three"), "1\n3\n");
}

TEST_F(DispatcherTest, TheOneFormatterIsText) {
    Know(Echo("ping", "pong"));
    EXPECT_THAT(dispatcher.GetFormatters(), ElementsAre("text"));
    EXPECT_TRUE(dispatcher.HasFormatter("text"));
    EXPECT_FALSE(dispatcher.HasFormatter("xml"));
    EXPECT_EQ(dispatcher.GetFormatter("xml"), nullptr);
    EXPECT_THAT(dispatcher.GetDefaultOutputFormatParameters(),
                ElementsAre(Pair("formatter", "text")));

    const auto input = CommandInput::New();
    const auto output = CommandOutput::New();
    input->SetCommandPath({"ping"});
    dispatcher.ExecuteCommand(input, output);
    EXPECT_EQ(dispatcher.GetFormatter("text")->Format(*output), "pong\n");
    EXPECT_EQ(dispatcher.FormatOutput(output), "pong\n");
}

TEST_F(DispatcherTest, AnOutputBeforeAnyExecutionIsEmpty) {
    const auto output = CommandOutput::New();
    EXPECT_FALSE(output->HasErrors());
    EXPECT_THAT(output->GetErrorMessages(), IsEmpty());
    EXPECT_EQ(dispatcher.FormatOutput(output), "");
}

TEST_F(DispatcherTest, CommandsAndNamespacesCanBeLookedUp) {
    Know(Echo("net set", "1"));
    const auto command = dispatcher.GetCommand({"net", "set"});
    ASSERT_NE(command, nullptr);
    EXPECT_EQ(command->summary, "Does it");
    EXPECT_EQ(dispatcher.GetCommand({"net"}), nullptr);
    const auto root = dispatcher.GetRootNamespace();
    ASSERT_EQ(root->namespaces.size(), 1U);
    EXPECT_THAT(root->namespaces[0]->path, ElementsAre("net"));
}

TEST_F(DispatcherTest, FilesAreThePluginsOfTheDispatcher) {
    const DescriptionFolder single;
    single.WriteCommands("extra.txt", Echo("extra", "x"));
    folder.WriteCommands("b.json", Echo("two", "2"));
    folder.WriteCommands("a.json", Echo("one", "1"));
    folder.WriteCommands("none.json", "");
    dispatcher.AddExternalDirectory(folder.Path());
    dispatcher.AddPlugin(single.File("extra.txt"));
    EXPECT_THAT(
        dispatcher.GetPluginNames(),
        ElementsAre(folder.File("a.json"), folder.File("b.json"), single.File("extra.txt")));
    EXPECT_EQ(OutputOf("extra"), "x\n");
    EXPECT_EQ(ErrorText<DescriptionError>([&] { dispatcher.AddPlugin(single.File("no")); }),
              single.File("no") + ": cannot read the file: No such file or directory");
}

TEST_F(DispatcherTest, AResetForgetsCommandsUntilTheirFileIsRegisteredAgain) {
    folder.WriteCommands("a.json", Echo("one", "1"));
    folder.WriteCommands("b.json", Echo("two", "2"));
    dispatcher.AddExternalDirectory(folder.Path());
    dispatcher.ResetRegistrations();
    EXPECT_EQ(dispatcher.GetCommand({"one"}), nullptr);
    EXPECT_THAT(dispatcher.GetPluginNames(),
                ElementsAre(folder.File("a.json"), folder.File("b.json")));

    dispatcher.RegisterPlugin(folder.File("b.json"));
    dispatcher.RegisterPlugin(folder.File("b.json"));
    EXPECT_EQ(OutputOf("two"), "2\n");
    EXPECT_EQ(dispatcher.GetCommand({"one"}), nullptr);
}

TEST_F(DispatcherTest, AFileReadAgainAfterAResetReplacesItself) {
    folder.WriteCommands("a.json", Echo("one", "old") + "," + Echo("two", "2"));
    dispatcher.AddExternalDirectory(folder.Path());
    dispatcher.ResetRegistrations();
    folder.WriteCommands("a.json", Echo("one", "new") + "," + Echo("three", "3"));
    dispatcher.AddExternalDirectory(folder.Path());
    EXPECT_EQ(OutputOf("one") + OutputOf("three"), "new\n3\n");
    EXPECT_EQ(dispatcher.GetCommand({"two"}), nullptr);
    dispatcher.RegisterPlugin(folder.File("a.json"));
    EXPECT_EQ(OutputOf("one") + OutputOf("two") + OutputOf("three"), "new\n2\n3\n");
    EXPECT_THAT(dispatcher.GetPluginNames(), ElementsAre(folder.File("a.json")));
}

TEST_F(DispatcherTest, AFileCannotBeRegisteredOverAnother) {
    folder.WriteCommands("a.json", Echo("one", "1"));
    dispatcher.AddExternalDirectory(folder.Path());
    dispatcher.ResetRegistrations();
    const DescriptionFolder second;
    second.WriteCommands("b.json", Echo("one", "2"));
    dispatcher.AddExternalDirectory(second.Path());
    EXPECT_EQ(
        ErrorText<DescriptionError>([&] { dispatcher.RegisterPlugin(folder.File("a.json")); }),
        folder.File("a.json") + ": /commands/0/path: the command \"one\" is described already in " +
            second.File("b.json"));
    EXPECT_EQ(ErrorText<DescriptionError>([&] { dispatcher.RegisterPlugin("unread.json"); }),
              "unread.json: not a known description file");
}

// As the program's own dispatcher does it.
class DerivedDispatcher : public Dispatcher {
public:
    explicit DerivedDispatcher(bool& destroyedArg) : destroyed(destroyedArg) {}
    ~DerivedDispatcher() override { destroyed = true; }
    DerivedDispatcher(const DerivedDispatcher&) = delete;
    DerivedDispatcher& operator=(const DerivedDispatcher&) = delete;

private:
    bool& destroyed;
};

TEST_F(DispatcherTest, ADispatcherMayBeDerivedFrom) {
    Know(Echo("ping", "pong"));
    bool destroyed = false;
    {
        const boost::shared_ptr<Dispatcher> derived(new DerivedDispatcher(destroyed));
        derived->AddExternalDirectory(folder.Path());
        EXPECT_EQ(vantor::support::ExecuteLine(*derived, "ping").output, "pong\n");
    }
    EXPECT_TRUE(destroyed);
}

}  // namespace

}  // namespace BaseKit::AutoCli
