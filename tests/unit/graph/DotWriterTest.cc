#include "graph/DotWriter.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdint>
#include <fstream>
#include <sstream>
#include <streambuf>

#include "graph/GlobalLock.h"
#include "graph/GraphFaults.h"
#include "support/GraphText.h"

namespace vantor {

namespace {

using support::GraphText;
using ::testing::ElementsAre;

class DotWriterTest : public support::GraphTest {};

std::string Id(const Node& node) {
    return std::to_string(static_cast<std::uint64_t>(reinterpret_cast<std::uintptr_t>(&node)));
}

std::string Dot(const Node& node) {
    std::ostringstream stream;
    WriteDot(node, stream);
    return stream.str();
}

// The whole drawing as the driver frames it: the plugins in load order, then the barriers that the
// graph made, as the registry lists them.
std::string Drawing(GraphText& graph, const std::vector<std::string>& plugins) {
    std::ostringstream stream;
    stream << "digraph g {\n";
    for (const std::string& plugin : plugins) {
        WriteDot(graph[plugin], stream);
    }
    const std::string prefix = graph.BarrierName("");
    for (const InitBarrier* barrier : InitBarrier::All()) {
        if (barrier->Name().compare(0, prefix.size(), prefix) == 0) {
            WriteDot(*barrier, stream);
        }
    }
    stream << "}\n";
    return stream.str();
}

TEST_F(DotWriterTest, RunWithoutPluginsDrawsJustTheHeaderAndTheFooter) {
    GraphText graph({});
    EXPECT_EQ(Drawing(graph, {}), "digraph g {\n}\n");
}

TEST_F(DotWriterTest, PluginIsDrawnByItsAddressAndNameWithoutAttributes) {
    GraphText graph({"a"});
    EXPECT_EQ(Dot(graph["a"]), Id(graph["a"]) + " [label=\"a\"];\n");
}

TEST_F(DotWriterTest, ProviderIsDrawnWithAnEdgeToEachBarrierInTheOrderOfItsList) {
    GraphText graph({"a provides y x"});
    const std::string a = Id(graph["a"]);
    EXPECT_EQ(Dot(graph["a"]), a + " [label=\"a\"];\n" +                          //
                                   a + " -> " + Id(graph.Barrier("y")) + ";\n" +  //
                                   a + " -> " + Id(graph.Barrier("x")) + ";\n");
}

TEST_F(DotWriterTest, EdgeAddedTwiceIsDrawnTwice) {
    GraphText graph({"a requires x x"});
    const std::string x = Id(graph.Barrier("x"));
    const std::string edge = x + " -> " + Id(graph["a"]) + ";\n";
    EXPECT_EQ(Dot(graph.Barrier("x")),
              x + " [label=\"" + graph.BarrierName("x") + "\" shape=box];\n" + edge + edge);
}

TEST_F(DotWriterTest, BarrierRequiredByTwoAndProvidedByNoneIsABoxWithTwoEdgesOutAndNoneIn) {
    GraphText graph({"b requires x", "a requires x"});
    const std::string x = Id(graph.Barrier("x"));
    const std::string a = Id(graph["a"]);
    const std::string b = Id(graph["b"]);
    EXPECT_EQ(Drawing(graph, {"b", "a"}), "digraph g {\n" +                                //
                                              b + " [label=\"b\"];\n" +                    //
                                              a + " [label=\"a\"];\n" +                    //
                                              x + " [label=\"" + graph.BarrierName("x") +  //
                                              "\" shape=box];\n" +                         //
                                              x + " -> " + b + ";\n" +                     //
                                              x + " -> " + a + ";\n" +                     //
                                              "}\n");
}

TEST_F(DotWriterTest, BarrierOnlyProvidedIsABoxWithAnEdgeInAndNoneOut) {
    GraphText graph({"a provides x"});
    const std::string x = Id(graph.Barrier("x"));
    const std::string a = Id(graph["a"]);
    EXPECT_EQ(Drawing(graph, {"a"}), "digraph g {\n" +                                //
                                         a + " [label=\"a\"];\n" +                    //
                                         a + " -> " + x + ";\n" +                     //
                                         x + " [label=\"" + graph.BarrierName("x") +  //
                                         "\" shape=box];\n" +                         //
                                         "}\n");
}

TEST_F(DotWriterTest, BarriersAreDrawnInByteOrderOfTheirNamesWhateverTheOrderOfMention) {
    GraphText graph({"a provides m z B", "b requires a Z"});
    std::istringstream lines(Drawing(graph, {"a", "b"}));
    std::vector<std::string> boxes;
    for (std::string line; std::getline(lines, line);) {
        const std::size_t end = line.find("\" shape=box];");
        if (end != std::string::npos) {
            boxes.push_back(line.substr(end - 1, 1));
        }
    }
    EXPECT_THAT(boxes, ElementsAre("B", "Z", "a", "m", "z"));
}

TEST_F(DotWriterTest, NamesAreWrittenAsTheyAre) {
    InitBarrier* const barrier = InitBarrier::Get("dot.\"\\ %s");
    EXPECT_EQ(Dot(*barrier), Id(*barrier) + " [label=\"dot.\"\\ %s\" shape=box];\n");
}

// Counts flushes, and tells of each line whether the lock was held when it was written.
class WatchingBuffer : public std::stringbuf {
public:
    int flushes = 0;
    std::vector<bool> heldAtLineEnd;

protected:
    int sync() override {
        ++flushes;
        heldAtLineEnd.push_back(GlobalLock::HeldByCurrentThread());
        return std::stringbuf::sync();
    }
};

TEST_F(DotWriterTest, EveryLineIsFlushed) {
    GraphText graph({"a provides x y"});
    WatchingBuffer buffer;
    std::ostream stream(&buffer);
    WriteDot(graph["a"], stream);
    EXPECT_EQ(buffer.flushes, 3);
}

TEST_F(DotWriterTest, LockIsTakenForTheEdgesOnly) {
    GraphText graph({"a provides x y"});
    WatchingBuffer buffer;
    std::ostream stream(&buffer);
    WriteDot(graph["a"], stream);
    EXPECT_THAT(buffer.heldAtLineEnd, ElementsAre(false, true, true));
    EXPECT_FALSE(GlobalLock::HeldByCurrentThread());
}

TEST_F(DotWriterTest, UnopenedStreamTakesEveryLineSilently) {
    GraphText graph({"a provides x"});
    std::ofstream stream;
    WriteDot(graph["a"], stream);
    EXPECT_FALSE(stream.is_open());
}

TEST_F(DotWriterTest, DrawingLeavesEveryNodeIdle) {
    GraphText graph({"a provides x", "b requires x"});
    Drawing(graph, {"a", "b"});
    EXPECT_EQ(graph["a"].State(), NodeState::Idle);
    EXPECT_EQ(graph["b"].State(), NodeState::Idle);
    EXPECT_EQ(graph.Barrier("x").State(), NodeState::Idle);
}

}  // namespace

}  // namespace vantor
