// What the reader makes of a drawing of the graph, and what it says of a file that is none.

#include "boot/DotModel.h"

#include <gtest/gtest.h>

#include <sstream>
#include <stdexcept>

#include "support/ErrorText.h"

namespace vantor::analyze {
namespace {

BootModel ParseDot(const std::string& text) {
    std::istringstream stream(text);
    return ParseDotModel(stream, "tree.dot");
}

std::string DotErrorOf(const std::string& text) {
    return support::ErrorText<std::runtime_error>([&text] { ParseDot(text); });
}

TEST(DotModelTest, PluginsStandInTheOrderOfTheDrawing) {
    const BootModel model = ParseDot("digraph g {\n"
                                     "8 [label=\"look\"];\n"
                                     "4 [label=\"disks\"];\n"
                                     "4 -> 6;\n"
                                     "6 [label=\"storage\" shape=box];\n"
                                     "6 -> 8;\n"
                                     "}\n");
    ASSERT_EQ(model.plugins.size(), 2U);
    EXPECT_EQ(model.plugins[0].name, "look");
    ASSERT_EQ(model.plugins[0].required.size(), 1U);
    EXPECT_EQ(model.plugins[0].required[0].name, "storage");
    EXPECT_EQ(model.plugins[1].name, "disks");
    ASSERT_EQ(model.plugins[1].provided.size(), 1U);
    EXPECT_EQ(model.plugins[1].provided[0].name, "storage");
    EXPECT_EQ(model.barriers.at("storage").providers, std::vector<std::size_t>{1});
    EXPECT_EQ(model.barriers.at("storage").requirers, std::vector<std::size_t>{0});
}

TEST(DotModelTest, AnEmptyDrawingHasNoPlugins) {
    EXPECT_TRUE(ParseDot("digraph g {\n}\n").plugins.empty());
}

TEST(DotModelTest, NamesHoldQuotesAndWhatLooksLikeAnEdge) {
    const BootModel model = ParseDot("digraph g {\n"
                                     "1 [label=\"a\" -> 2;\\\"];\"];\n"
                                     "}\n");
    EXPECT_EQ(model.plugins.at(0).name, "a\" -> 2;\\\"];");
}

TEST(DotModelTest, ABarrierThatNobodyNamesBesidesIsNoPlugin) {
    EXPECT_TRUE(ParseDot("digraph g {\n1 [label=\"b\" shape=box];\n}\n").plugins.empty());
}

TEST(DotModelTest, AFilteredPluginHasNoStatementAndIsLeftOut) {
    const BootModel model = ParseDot("digraph g {\n1 [label=\"b\" shape=box];\n1 -> 77;\n}\n");
    EXPECT_TRUE(model.plugins.empty());
}

TEST(DotModelTest, AnotherFileIsRefused) {
    EXPECT_EQ(DotErrorOf("graph {\n"), "tree.dot:1: not a drawing of the boot program: it should "
                                       "begin with \"digraph g {\"");
    EXPECT_EQ(DotErrorOf(""), "tree.dot:1: the drawing ends here, before its \"}\"");
}

TEST(DotModelTest, ALineThatIsNeitherNodeNorEdgeIsRefused) {
    EXPECT_EQ(DotErrorOf("digraph g {\na -> b;\n}\n"), "tree.dot:2: expected the number of a node");
    EXPECT_EQ(DotErrorOf("digraph g {\n1 [shape=box];\n}\n"),
              "tree.dot:2: neither a node with its label nor an edge");
    EXPECT_EQ(DotErrorOf("digraph g {\n1 [label=\"];\n}\n"),
              "tree.dot:2: neither a node with its label nor an edge");
    EXPECT_EQ(DotErrorOf("digraph g {\n1 [label=\"a\"];\n1 -> 2\n}\n"),
              "tree.dot:3: expected \";\" and the end of the line after the edge");
}

TEST(DotModelTest, ADrawingThatEndsEarlyOrLateIsRefused) {
    EXPECT_EQ(DotErrorOf("digraph g {\n1 [label=\"a\"];\n"),
              "tree.dot:3: the drawing ends here, before its \"}\"");
    EXPECT_EQ(DotErrorOf("digraph g {\n}\nmore\n"),
              "tree.dot:3: the drawing should end before this line");
}

TEST(DotModelTest, ANumberStandsForOneNode) {
    EXPECT_EQ(DotErrorOf("digraph g {\n1 [label=\"a\"];\n1 [label=\"b\"];\n}\n"),
              "tree.dot:3: a node that an earlier line has named already");
    EXPECT_EQ(DotErrorOf("digraph g {\n1 -> 2;\n}\n"),
              "tree.dot:2: an edge out of a node that no line before it has named");
}

TEST(DotModelTest, AnEdgeRunsBetweenAPluginAndABarrier) {
    EXPECT_EQ(DotErrorOf("digraph g {\n1 [label=\"a\"];\n1 -> 2;\n2 [label=\"b\"];\n}\n"),
              "tree.dot: an edge from 'a' to 'b': edges run between a plugin and a barrier");
}

}  // namespace
}  // namespace vantor::analyze
