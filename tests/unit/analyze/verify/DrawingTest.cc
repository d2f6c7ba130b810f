#include "verify/Drawing.h"

#include <gtest/gtest.h>

#include <sstream>
#include <string>
#include <vector>

#include "analyze/model/ModelText.h"

namespace vantor::analyze {
namespace {

std::string Draw(const BootModel& model) {
    const BootGraph graph(model, GraphScope::All);
    std::ostringstream stream;
    WriteDrawing(graph, Everything(graph), stream);
    return stream.str();
}

std::vector<std::string> NamesNear(const BootModel& model, const std::string& centre,
                                   std::size_t depth) {
    const BootGraph graph(model, GraphScope::All);
    const Shown shown = Neighbourhood(graph, graph.PluginsNamed(centre), depth);
    std::vector<std::string> names;
    for (Digraph::Node node = 0; node < shown.size(); ++node) {
        if (shown[node] != 0) {
            names.push_back(graph.Name(node));
        }
    }
    return names;
}

TEST(DrawingTest, ShowsPluginsAndBarriers) {
    EXPECT_EQ(Draw(ModelOf({"a: > x", "b: x gone >"})),
              "digraph vantor {\n"
              "  \"plugin:a\" [label=\"a\" tooltip=\"/p/a\"];\n"
              "  \"plugin:b\" [label=\"b\" tooltip=\"/p/b\"];\n"
              "  \"barrier:gone\" [label=\"gone\" shape=box style=dashed];\n"
              "  \"barrier:x\" [label=\"x\" shape=box];\n"
              "  \"plugin:a\" -> \"barrier:x\";\n"
              "  \"barrier:gone\" -> \"plugin:b\";\n"
              "  \"barrier:x\" -> \"plugin:b\";\n"
              "}\n");
}

TEST(DrawingTest, ShowsPluginsThatDoNotRunInGrey) {
    BootModel model = ModelOf({"a: > x"});
    Filter(model, "a");
    EXPECT_EQ(Draw(model),
              "digraph vantor {\n"
              "  \"plugin:a\" [label=\"a\" tooltip=\"/p/a: ignoring plugin 'a' due to blacklist\" "
              "style=filled fillcolor=gray90 color=gray fontcolor=gray40];\n"
              "  \"barrier:x\" [label=\"x\" shape=box];\n"
              "  \"plugin:a\" -> \"barrier:x\" [color=gray style=dashed];\n"
              "}\n");
}

TEST(DrawingTest, ShowsCyclesInRed) {
    EXPECT_EQ(Draw(ModelOf({"a: x > x", "b: x >"})),
              "digraph vantor {\n"
              "  \"plugin:a\" [label=\"a\" tooltip=\"/p/a\" color=red fontcolor=red];\n"
              "  \"plugin:b\" [label=\"b\" tooltip=\"/p/b\"];\n"
              "  \"barrier:x\" [label=\"x\" shape=box color=red fontcolor=red];\n"
              "  \"plugin:a\" -> \"barrier:x\" [color=red];\n"
              "  \"barrier:x\" -> \"plugin:a\" [color=red];\n"
              "  \"barrier:x\" -> \"plugin:b\";\n"
              "}\n");
}

TEST(DrawingTest, TellsPluginsOfOneNameApart) {
    const std::string drawing = Draw(ModelOf({"a: >", "a: >"}));
    EXPECT_NE(drawing.find("  \"plugin:a\" ["), std::string::npos);
    EXPECT_NE(drawing.find("  \"plugin2:a\" ["), std::string::npos);
}

TEST(DrawingTest, IdsDoNotChangeWithOtherPlugins) {
    const std::string line = "  \"plugin:b\" -> \"barrier:y\";\n";
    EXPECT_NE(Draw(ModelOf({"b: > y"})).find(line), std::string::npos);
    EXPECT_NE(Draw(ModelOf({"a: > x", "b: > y"})).find(line), std::string::npos);
}

TEST(DrawingTest, EscapesWhatALabelMustNotHold) {
    EXPECT_EQ(EscapeLabel("say \"b\\n\" & <go>"), "say \\\"b\\\\n\\\" &amp; <go>");
    EXPECT_EQ(EscapeLabel("a\nb\x7f"), "a\\\\x0ab\\\\x7f");
    EXPECT_EQ(EscapeLabel("gr\xc3\xbc\xc3\x9f"), "gr\xc3\xbc\xc3\x9f");
    EXPECT_EQ(EscapeLabel("\xc3"), "\\\\xc3");
    EXPECT_EQ(EscapeLabel("\xed\xa0\x80\xc0\x80\xf5"),
              "\\\\xed\\\\xa0\\\\x80\\\\xc0\\\\x80\\\\xf5");
}

TEST(DrawingTest, ShowsOnlyWhatIsBeforeOrBehindACentre) {
    const BootModel model = ModelOf({"a: > x", "b: x > y", "c: y > z", "d: x >"});
    EXPECT_EQ(NamesNear(model, "b", 0), (std::vector<std::string>{"b"}));
    EXPECT_EQ(NamesNear(model, "b", 1), (std::vector<std::string>{"b", "x", "y"}));
    EXPECT_EQ(NamesNear(model, "b", 2), (std::vector<std::string>{"a", "b", "c", "x", "y"}));
    EXPECT_EQ(NamesNear(model, "b", 99), (std::vector<std::string>{"a", "b", "c", "x", "y", "z"}));
}

}  // namespace
}  // namespace vantor::analyze
