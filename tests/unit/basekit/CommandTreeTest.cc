#include "basekit/CommandTree.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <boost/make_shared.hpp>

namespace BaseKit::impl {

namespace {

using AutoCli::CommandDescription;
using AutoCli::CommandNamespace;
using AutoCli::CommandPointer;
using AutoCli::ExplainUnknownCommand;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

CommandPointer Command(const std::vector<std::string>& path, const std::string& file = "a.json") {
    const auto command = boost::make_shared<CommandDescription>();
    command->path = path;
    command->file = file;
    return command;
}

class CommandTreeTest : public ::testing::Test {
protected:
    CommandTreeTest() {
        for (const auto& path : {std::vector<std::string>{"network", "firewall", "set"},
                                 {"network", "firewall", "refresh"},
                                 {"network", "list"},
                                 {"network2", "set"},
                                 {"ping"}}) {
            EXPECT_EQ(tree.Add(Command(path)), "");
        }
    }

    std::string Explain(const std::list<std::string>& path) const {
        return ExplainUnknownCommand(*tree.Root(), path);
    }

    CommandTree tree;
};

TEST_F(CommandTreeTest, FindsACommandByItsWholePathOnly) {
    ASSERT_NE(tree.Find({"network", "list"}), nullptr);
    EXPECT_THAT(tree.Find({"network", "list"})->path, ElementsAre("network", "list"));
    EXPECT_EQ(tree.Find({"network"}), nullptr);
    EXPECT_EQ(tree.Find({"network", "list", "all"}), nullptr);
    EXPECT_EQ(tree.Find({"network list"}), nullptr);
    EXPECT_EQ(tree.Find({}), nullptr);
}

TEST_F(CommandTreeTest, RefusesAPathThatIsTaken) {
    EXPECT_EQ(tree.Add(Command({"network", "list"}, "b.json")),
              "the command \"network list\" is described already in a.json");
    EXPECT_EQ(tree.Find({"network", "list"})->file, "a.json");
}

TEST_F(CommandTreeTest, RefusesToMakeANamespaceOfACommand) {
    EXPECT_EQ(tree.Add(Command({"network", "list", "all", "now"}, "b.json")),
              "the command \"network list all now\" makes a namespace of the command "
              "\"network list\" of a.json");
}

TEST_F(CommandTreeTest, RefusesToMakeACommandOfANamespace) {
    EXPECT_EQ(tree.Add(Command({"network"}, "b.json")),
              "the command \"network\" is the namespace of the command "
              "\"network firewall refresh\" of a.json");
}

TEST_F(CommandTreeTest, TheRootHoldsAllNamespacesAndCommandsInOrder) {
    const auto root = tree.Root();
    EXPECT_THAT(root->path, IsEmpty());
    ASSERT_THAT(root->commands, SizeIs(1));
    EXPECT_THAT(root->commands[0]->path, ElementsAre("ping"));
    ASSERT_THAT(root->namespaces, SizeIs(2));

    const CommandNamespace& network = *root->namespaces[0];
    EXPECT_THAT(network.path, ElementsAre("network"));
    ASSERT_THAT(network.commands, SizeIs(1));
    EXPECT_THAT(network.commands[0]->path, ElementsAre("network", "list"));
    ASSERT_THAT(network.namespaces, SizeIs(1));
    EXPECT_THAT(network.namespaces[0]->path, ElementsAre("network", "firewall"));
    ASSERT_THAT(network.namespaces[0]->commands, SizeIs(2));
    EXPECT_THAT(network.namespaces[0]->commands[0]->path.back(), "refresh");
    EXPECT_THAT(network.namespaces[0]->commands[1]->path.back(), "set");

    EXPECT_THAT(root->namespaces[1]->path, ElementsAre("network2"));
    EXPECT_THAT(root->namespaces[1]->commands, SizeIs(1));
}

TEST_F(CommandTreeTest, FindsANamespaceByItsWords) {
    const auto root = tree.Root();
    EXPECT_EQ(root->Find({}), root.get());
    ASSERT_NE(root->Find({"network", "firewall"}), nullptr);
    EXPECT_THAT(root->Find({"network", "firewall"})->path, ElementsAre("network", "firewall"));
    EXPECT_EQ(root->Find({"firewall"}), nullptr);
    EXPECT_EQ(root->Find({"network", "list"}), nullptr);
}

TEST_F(CommandTreeTest, AnUnknownCommandIsExplainedByTheNearestOne) {
    EXPECT_EQ(Explain({"network", "firewal", "refersh"}),
              "unknown command \"network firewal refersh\"; the nearest known one is "
              "\"network firewall refresh\"");
    EXPECT_EQ(Explain({"pong"}), "unknown command \"pong\"; the nearest known one is \"ping\"");
}

TEST_F(CommandTreeTest, OfCommandsEquallyNearTheFirstIsNamed) {
    tree.Add(Command({"king"}));
    EXPECT_EQ(Explain({"ring"}), "unknown command \"ring\"; the nearest known one is \"king\"");
}

TEST_F(CommandTreeTest, ABlankWithinAWordIsSeen) {
    EXPECT_EQ(Explain({"network list"}),
              "unknown command \"'network list'\"; the nearest known one is \"network list\"");
}

TEST_F(CommandTreeTest, ANamespaceIsSaidToBeOne) {
    EXPECT_EQ(Explain({"network", "firewall"}),
              "\"network firewall\" is a namespace and needs a command word, as in "
              "\"network firewall set\"");
}

TEST_F(CommandTreeTest, WithoutAnyCommandNoneIsNear) {
    EXPECT_EQ(ExplainUnknownCommand(*CommandTree().Root(), {"ping"}),
              "unknown command \"ping\"; no command is known at all");
}

TEST_F(CommandTreeTest, WithoutAPathNoCommandIsNamed) {
    EXPECT_EQ(Explain({}), "no command is named");
}

}  // namespace

}  // namespace BaseKit::impl
