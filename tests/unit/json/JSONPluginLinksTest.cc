// How a document's plugin is linked to its barriers, and what a rejected one leaves of that.

#include <gmock/gmock.h>

#include <algorithm>

#include "graph/Executor.h"
#include "graph/InitBarrier.h"
#include "json/JSONPluginFixture.h"
#include "support/AlertRecorder.h"
#include "support/GraphText.h"

namespace vantor {

namespace {

using support::AlertRecorder;
using support::DocumentText;
using support::ExpectEdgesAgree;
using support::GraphText;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

class JSONPluginLinksTest : public support::JSONPluginFixture {
protected:
    // A barrier's name that no other test of this process has used.
    std::string NewName(const std::string& text) const { return folder.Path() + "." + text; }
    static std::string List(std::initializer_list<std::string> names) {
        std::string text = "[";
        for (const std::string& name : names) {
            text += "\"" + name + "\",";
        }
        return text + "]";
    }
    static bool IsKnown(const std::string& name) {
        const std::list<InitBarrier*> all = InitBarrier::All();
        return std::any_of(all.begin(), all.end(),
                           [&name](const InitBarrier* barrier) { return barrier->Name() == name; });
    }
    static std::vector<std::string> Names(const Node::Edges& nodes) {
        std::vector<std::string> names;
        for (const Node* node : nodes) {
            names.push_back(node->Name());
        }
        return names;
    }
    // The barrier is registered, and no edge of it is left.
    static void ExpectBare(const std::string& name) {
        ASSERT_TRUE(IsKnown(name)) << name;
        EXPECT_THAT(InitBarrier::Get(name)->Dependencies(), IsEmpty()) << name;
        EXPECT_THAT(InitBarrier::Get(name)->Dependents(), IsEmpty()) << name;
    }

    const std::string a = NewName("a");
    const std::string b = NewName("b");
    const std::string c = NewName("c");
};

TEST_F(JSONPluginLinksTest, PluginIsLinkedInDocumentOrder) {
    DocumentText document;
    document.metadata["provides"] = List({b, a});
    document.metadata["requires"] = List({c, a});
    const auto plugin = Load(document);
    EXPECT_THAT(Names(plugin->Dependents()), ElementsAre(b, a));
    EXPECT_THAT(Names(plugin->Dependencies()), ElementsAre(c, a));
    EXPECT_THAT(InitBarrier::Get(b)->Dependencies(), ElementsAre(plugin.get()));
    EXPECT_THAT(InitBarrier::Get(c)->Dependents(), ElementsAre(plugin.get()));
    ExpectEdgesAgree(*plugin);
}

TEST_F(JSONPluginLinksTest, RepeatedNameIsLinkedEachTime) {
    DocumentText document;
    document.metadata["provides"] = List({a, a});
    const auto plugin = Load(document);
    EXPECT_THAT(Names(plugin->Dependents()), ElementsAre(a, a));
    ExpectEdgesAgree(*plugin);
}

TEST_F(JSONPluginLinksTest, BarrierIsTheOneThatOthersKnow) {
    InitBarrier* const known = InitBarrier::Get(a);
    DocumentText document;
    document.metadata["provides"] = List({a});
    const auto plugin = Load(document);
    EXPECT_THAT(plugin->Dependents(), ElementsAre(known));
}

TEST_F(JSONPluginLinksTest, RejectedDocumentLeavesItsBarriersKnownAndBare) {
    DocumentText document;
    document.metadata["provides"] = List({a, b, a});
    document.metadata["requires"] = List({c, a});
    document.operations["start"] = "7";
    EXPECT_EQ(RejectionOf(document), Invalid("operations is corrupt (unable to parse start)"));
    ExpectBare(a);
    ExpectBare(b);
    ExpectBare(c);
}

TEST_F(JSONPluginLinksTest, BarriersOfProvidesAreKnownWhateverComesAfterThem) {
    const auto slips = {
        +[](DocumentText& document) { document.metadata["requires"] = "7"; },
        +[](DocumentText& document) { document.metadata["required_flags"] = "7"; },
        +[](DocumentText& document) { document.metadata["disabling_flags"] = "[7]"; },
        +[](DocumentText& document) { document.metadata["run_once"] = "7"; },
        +[](DocumentText& document) { document.metadata["plugin_version"] = "7"; },
        +[](DocumentText& document) { document.operationsText = "7"; },
        +[](DocumentText& document) { document.operations["start"] = "[7]"; },
        +[](DocumentText& document) { document.operations["apply_host_profile"] = "7"; },
    };
    int number = 0;
    for (const auto& slip : slips) {
        const std::string name = NewName(std::to_string(++number));
        DocumentText document;
        document.metadata["provides"] = List({name});
        slip(document);
        EXPECT_NE(RejectionOf(document), "(no exception)");
        ExpectBare(name);
    }
}

TEST_F(JSONPluginLinksTest, NoBarrierIsMadeBeforeItsWholeListHasPassed) {
    DocumentText document;
    document.metadata["provides"] = "[\"" + a + "\", 7, \"" + b + "\"]";
    EXPECT_EQ(RejectionOf(document), Invalid("provides tag is not a string"));
    EXPECT_FALSE(IsKnown(a));
    EXPECT_FALSE(IsKnown(b));
}

TEST_F(JSONPluginLinksTest, NoBarrierOfRequiresIsMadeBeforeItsWholeListHasPassed) {
    DocumentText document;
    document.metadata["provides"] = List({a});
    document.metadata["requires"] = "[\"" + b + "\", 7]";
    EXPECT_EQ(RejectionOf(document), Invalid("requires tag is not a string"));
    ExpectBare(a);
    EXPECT_FALSE(IsKnown(b));
}

TEST_F(JSONPluginLinksTest, NoBarrierIsMadeByADocumentRejectedBeforeItsLists) {
    DocumentText document;
    document.metadata["provides"] = List({a});
    document.metadata["version"] = "5";
    EXPECT_EQ(RejectionOf(document), Invalid("Unsupported API version"));
    document.metadata["version"] = "3";
    EXPECT_EQ(RejectionOf(document.Text().substr(0, 150)), Invalid("plugin root is not an object"));
    EXPECT_FALSE(IsKnown(a));
}

TEST_F(JSONPluginLinksTest, LinksOfOtherPluginsStay) {
    DocumentText good;
    good.metadata["provides"] = List({a});
    good.metadata["requires"] = List({b});
    const auto before = Load(good);
    DocumentText bad = good;
    bad.metadata["run_once"] = "7";
    EXPECT_NE(RejectionOf(bad), "(no exception)");
    const auto after = Load(good);

    EXPECT_THAT(InitBarrier::Get(a)->Dependencies(), ElementsAre(before.get(), after.get()));
    EXPECT_THAT(InitBarrier::Get(b)->Dependents(), ElementsAre(before.get(), after.get()));
}

// Whoever requires the barrier of a rejected document runs, and the operator is told.
TEST_F(JSONPluginLinksTest, BarrierOfARejectedDocumentHasNoProvider) {
    GraphText graph({"waiting requires ready"});
    DocumentText document;
    document.metadata["provides"] = List({graph.BarrierName("ready")});
    document.operationsText = "7";
    EXPECT_EQ(RejectionOf(document), Invalid("invalid operations interface"));

    const AlertRecorder alerts;
    EXPECT_THAT(graph.Run(8), ElementsAre("waiting"));
    EXPECT_THAT(alerts.Texts(),
                ElementsAre("Vantor dependency error: Initialization barrier \"" +
                            graph.BarrierName("ready") +
                            "\" is not provided by any plugin but the following plugins require "
                            "it: \"waiting\""));
}

}  // namespace

}  // namespace vantor
