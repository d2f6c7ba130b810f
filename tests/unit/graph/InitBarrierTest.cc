#include "graph/InitBarrier.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <cerrno>
#include <thread>
#include <vector>

#include "driver/RunConfig.h"
#include "graph/GraphFaults.h"
#include "plugins/Exceptions.h"
#include "support/AlertRecorder.h"
#include "support/ErrorText.h"
#include "support/GraphText.h"

namespace vantor {

namespace {

using support::AlertBehaviour;
using support::AlertRecorder;
using support::GraphText;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

class InitBarrierTest : public support::GraphTest {};

// The text of the alert for a barrier; `plugins` are the quoted names.
std::string MissingProvider(const std::string& barrier, const std::string& plugins) {
    return "Vantor dependency error: Initialization barrier \"" + barrier +
           "\" is not provided by any plugin but the following plugins require it: " + plugins;
}

// The names of all barriers that start with the prefix, in the registry's order.
std::vector<std::string> NamesWith(const std::string& prefix) {
    std::vector<std::string> names;
    for (const InitBarrier* barrier : InitBarrier::All()) {
        if (barrier->Name().compare(0, prefix.size(), prefix) == 0) {
            names.push_back(barrier->Name());
        }
    }
    return names;
}

TEST_F(InitBarrierTest, GetReturnsTheSameBarrierForTheSameName) {
    InitBarrier* const barrier = InitBarrier::Get("same.name");
    EXPECT_EQ(InitBarrier::Get(std::string("same.") + "name"), barrier);
    EXPECT_EQ(barrier->Name(), "same.name");
    EXPECT_THAT(NamesWith("same.name"), ElementsAre("same.name"));
}

TEST_F(InitBarrierTest, NamesAreComparedByteByByte) {
    EXPECT_NE(InitBarrier::Get("bytes.a"), InitBarrier::Get("bytes.A"));
    EXPECT_NE(InitBarrier::Get("bytes.a"), InitBarrier::Get("bytes.a "));
    EXPECT_NE(InitBarrier::Get("bytes.a"), InitBarrier::Get(std::string("bytes.a\0", 8)));
}

TEST_F(InitBarrierTest, AllAreSortedByNameInByteOrderWhateverTheOrderOfCreation) {
    for (const char* const name :
         {"sort.a", "sort.\xc3\xa4", "sort.Z", "sort.", "sort.a1", "sort.B"}) {
        InitBarrier::Get(name);
    }
    EXPECT_THAT(NamesWith("sort."),
                ElementsAre("sort.", "sort.B", "sort.Z", "sort.a", "sort.a1", "sort.\xc3\xa4"));
}

TEST_F(InitBarrierTest, AllIsANewListEachTime) {
    const GraphText graph({"a provides x"});
    const std::list<InitBarrier*> before = InitBarrier::All();
    graph.Barrier("y");
    EXPECT_EQ(InitBarrier::All().size(), before.size() + 1);
}

TEST_F(InitBarrierTest, ThreadsThatMentionOneNameGetOneBarrier) {
    constexpr int names = 50;
    std::vector<std::vector<InitBarrier*>> seen(8);
    std::vector<std::thread> threads;
    for (std::vector<InitBarrier*>& mine : seen) {
        threads.emplace_back([&mine] {
            for (int i = 0; i < names; ++i) {
                mine.push_back(InitBarrier::Get("threads." + std::to_string(i)));
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    EXPECT_TRUE(std::all_of(seen.begin(), seen.end(),
                            [&](const auto& barriers) { return barriers == seen.front(); }));
    EXPECT_EQ(NamesWith("threads.").size(), static_cast<std::size_t>(names));
}

TEST_F(InitBarrierTest, BarrierThatCannotBeMadeIsNotRegistered) {
    const std::string name = GraphText({}).BarrierName("unmade");
    support::Faults().condInit.FailCall(1, EAGAIN);
    EXPECT_EQ(support::ErrorText<Exception>([&] { InitBarrier::Get(name); }),
              "Condition variable for Node could not be initialized");
    EXPECT_THAT(NamesWith(name), IsEmpty());
    EXPECT_EQ(InitBarrier::Get(name)->Name(), name);
}

TEST_F(InitBarrierTest, IsDrawnAsABox) {
    EXPECT_EQ(InitBarrier::Get("drawn")->DotAttributes(), " shape=box");
}

//   a --.
//        +-> x -> c
//   b --'
TEST_F(InitBarrierTest, TwoProvidersOfOneNameShareOneBarrierThatRunsAfterBoth) {
    for (const int workers : {1, 2, 8}) {
        const AlertRecorder alerts;
        GraphText graph({"c requires x", "a provides x", "b provides x"});
        EXPECT_THAT(graph.Barrier("x").Dependencies(), ElementsAre(&graph["a"], &graph["b"]));
        std::vector<NodeState> seen;
        graph["c"].onRun = [&] {
            seen = {graph["a"].State(), graph["b"].State(), graph.Barrier("x").State()};
        };
        graph.Run(workers);
        EXPECT_THAT(seen, ElementsAre(NodeState::Done, NodeState::Done, NodeState::Done));
        EXPECT_THAT(alerts.Texts(), IsEmpty());
    }
}

TEST_F(InitBarrierTest, WithoutProviderItNamesEveryRequirerInOrderOfConstructionAndLetsThemRun) {
    const AlertRecorder alerts;
    GraphText graph({"zeta requires x", "alpha requires x", "mid requires x"});
    EXPECT_THAT(graph.Run(1), ElementsAre("zeta", "alpha", "mid"));
    EXPECT_THAT(alerts.Texts(), ElementsAre(MissingProvider(graph.BarrierName("x"),
                                                            "\"zeta\", \"alpha\", \"mid\"")));
}

TEST_F(InitBarrierTest, AlertIsRaisedOnceABarrier) {
    const AlertRecorder alerts;
    GraphText graph({"a requires x y", "b requires y x"});
    graph.Run(8);
    EXPECT_THAT(alerts.Texts(), ::testing::UnorderedElementsAre(
                                    MissingProvider(graph.BarrierName("x"), "\"a\", \"b\""),
                                    MissingProvider(graph.BarrierName("y"), "\"a\", \"b\"")));
}

TEST_F(InitBarrierTest, AlertNamesAPluginAsOftenAsItRequiresTheBarrier) {
    const AlertRecorder alerts;
    GraphText graph({"a requires x x"});
    graph.Run(1);
    EXPECT_THAT(alerts.Texts(),
                ElementsAre(MissingProvider(graph.BarrierName("x"), "\"a\", \"a\"")));
}

TEST_F(InitBarrierTest, AlertOfABarrierThatNobodyRequiresEndsAfterTheColon) {
    const AlertRecorder alerts;
    InitBarrier::Get("unrequired")->Run();
    EXPECT_THAT(alerts.Texts(), ElementsAre(MissingProvider("unrequired", "")));
}

TEST_F(InitBarrierTest, ProviderThatIsOnlyMarkedDoneRaisesNoAlert) {
    const AlertRecorder alerts;
    GraphText graph({"a provides x", "b requires x"});
    graph["a"].MarkDone();
    EXPECT_THAT(graph.Run(1), ElementsAre("b"));
    EXPECT_EQ(alerts.Attempts(), 0);
}

TEST_F(InitBarrierTest, BarrierWithoutProviderIsSilentInInvokeMode) {
    const AlertRecorder alerts;
    GraphText graph({"a requires x"});
    RunConfig::Instance().invoke = true;
    const std::vector<std::string> order = graph.Run(1);
    RunConfig::Instance().invoke = false;
    EXPECT_THAT(order, ElementsAre("a"));
    EXPECT_EQ(alerts.Attempts(), 0);
}

TEST_F(InitBarrierTest, AlertIsRaisedWithTheLockHeld) {
    const AlertRecorder alerts;
    GraphText graph({"a requires x"});
    graph.Run(1);
    EXPECT_EQ(alerts.Attempts(), 1);
    EXPECT_TRUE(alerts.LockHeld());
}

TEST_F(InitBarrierTest, RequirersRunThoughTheHostsLibraryThrows) {
    for (const AlertBehaviour behaviour :
         {AlertBehaviour::ThrowStandard, AlertBehaviour::ThrowOther,
          AlertBehaviour::ThrowOnConstruction}) {
        const AlertRecorder alerts(behaviour);
        GraphText graph({"a requires x", "b requires x"});
        EXPECT_THAT(graph.Run(1), ElementsAre("a", "b"));
        EXPECT_EQ(alerts.Attempts(), 1);
        EXPECT_EQ(graph.Barrier("x").State(), NodeState::Done);
    }
}

}  // namespace

}  // namespace vantor
