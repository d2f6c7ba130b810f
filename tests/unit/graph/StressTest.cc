// Thousands of random graphs, from a single node to some thousands, each run once: every node that
// is to run runs once, after all that it depends on, and one worker keeps the order of the model.
#include <gtest/gtest.h>

#include <cstdio>
#include <cstdlib>
#include <sstream>

#include "graph/OrderModel.h"
#include "graph/RandomGraph.h"
#include "graph/StressRun.h"
#include "support/Sanitizers.h"

namespace vantor {

namespace {

using support::MakeRandomGraph;
using support::OrderModel;
using support::RandomGraph;
using support::Requests;
using support::StressRun;

// How many graphs of which size; `sanitized` of them under a sanitizer. The first seed keeps the
// graphs of the batches apart.
struct Batch {
    const char* name;
    std::uint32_t firstSeed;
    std::size_t largest;
    int graphs;
    int sanitized;

    int Count() const { return support::underSanitizers ? sanitized : graphs; }
};

const Batch batches[] = {
    {"Small", 10000, 12, 2000, 1000},
    {"Middle", 20000, 150, 300, 150},
    {"Large", 30000, 3000, 20, 6},
};

class StressTest : public ::testing::TestWithParam<Batch> {
protected:
    // Calls check(graph, model) for every graph of the batch.
    template <typename Check>
    static void ForEveryGraph(Check check) {
        const Batch& batch = GetParam();
        for (int i = 0; i < batch.Count() && !HasFailure(); ++i) {
            const std::uint32_t seed = batch.firstSeed + static_cast<std::uint32_t>(i);
            SCOPED_TRACE("seed " + std::to_string(seed));
            const RandomGraph graph = MakeRandomGraph(seed, batch.largest);
            check(graph, OrderModel(graph));
        }
    }

    static void ExpectRunOnceAfterDependencies(const StressRun& run, const RandomGraph& graph,
                                               const OrderModel& model) {
        EXPECT_EQ(run.TooEarly(), 0);
        for (std::size_t node = 0; node < graph.nodes; ++node) {
            EXPECT_EQ(run.Runs(node), model.IsRun(node) ? 1 : 0) << "node " << node;
        }
    }
};

std::size_t Oldest(std::size_t) { return 0; }

TEST_P(StressTest, OneWorkerRunsTheHighestFirstAndTheOldestAmongEquals) {
    ForEveryGraph([](const RandomGraph& graph, const OrderModel& model) {
        StressRun run(graph);
        run.Run(1, false, Requests::BeforeTheWorkersBegin);
        EXPECT_EQ(run.Order(), model.SerialOrder(Oldest));
        ExpectRunOnceAfterDependencies(run, graph, model);
    });
}

TEST_P(StressTest, OneWorkerRunsEachOnceAfterItsDependenciesWhileRequestsComeIn) {
    ForEveryGraph([](const RandomGraph& graph, const OrderModel& model) {
        StressRun run(graph);
        run.Run(1, false, Requests::WhileTheyWork);
        ExpectRunOnceAfterDependencies(run, graph, model);
    });
}

TEST_P(StressTest, EightWorkersRunEachOnceAfterItsDependencies) {
    ForEveryGraph([](const RandomGraph& graph, const OrderModel& model) {
        StressRun run(graph);
        run.Run(8, false, Requests::BeforeTheWorkersBegin);
        ExpectRunOnceAfterDependencies(run, graph, model);
    });
}

TEST_P(StressTest, EightWorkersRunEachOnceAfterItsDependenciesWhileRequestsComeIn) {
    ForEveryGraph([](const RandomGraph& graph, const OrderModel& model) {
        StressRun run(graph);
        run.Run(8, true, Requests::WhileTheyWork);
        ExpectRunOnceAfterDependencies(run, graph, model);
    });
}

TEST_P(StressTest, RandomisedOrderOfOneWorkerChangesThePlacesOfEqualsOnly) {
    ForEveryGraph([](const RandomGraph& graph, const OrderModel& model) {
        StressRun run(graph);
        run.Run(1, true, Requests::BeforeTheWorkersBegin);
        EXPECT_TRUE(model.IsSerialOrder(run.Order()));
        ExpectRunOnceAfterDependencies(run, graph, model);
    });
}

TEST_P(StressTest, RandomisedOrderOfOneWorkerIsThatOfTheDrawsModuloTheEquals) {
    ForEveryGraph([](const RandomGraph& graph, const OrderModel& model) {
        std::srand(1);
        const std::vector<std::size_t> expected = model.SerialOrder(
            [](std::size_t count) { return static_cast<std::size_t>(std::rand()) % count; });
        std::srand(1);
        StressRun run(graph);
        run.Run(1, true, Requests::BeforeTheWorkersBegin);
        EXPECT_EQ(run.Order(), expected);
    });
}

INSTANTIATE_TEST_SUITE_P(On, StressTest, ::testing::ValuesIn(batches),
                         [](const auto& test) { return std::string(test.param.name) + "Graphs"; });

// What one more process of its own makes of a random graph; see RandomisedOrder.cc.
std::vector<std::size_t> OrderOfAnotherProcess(std::uint32_t seed, std::size_t largest) {
    const std::string command = std::string("'") + RANDOMISED_ORDER_PROGRAM + "' " +
                                std::to_string(seed) + " " + std::to_string(largest);
    std::FILE* const output = popen(command.c_str(), "r");
    if (output == nullptr) {
        return {};
    }
    std::string text;
    char buffer[4096];
    while (std::fgets(buffer, sizeof buffer, output) != nullptr) {
        text += buffer;
    }
    EXPECT_EQ(pclose(output), 0);
    std::istringstream numbers(text);
    return {std::istream_iterator<std::size_t>(numbers), std::istream_iterator<std::size_t>()};
}

// Where nothing has seeded it, rand() draws as after srand(1).
TEST(RandomisedOrderTest, TwoProcessesDrawTheSameOrder) {
    for (std::uint32_t seed = 1; seed <= 10; ++seed) {
        SCOPED_TRACE("seed " + std::to_string(seed));
        const RandomGraph graph = MakeRandomGraph(seed, 200);
        const std::vector<std::size_t> first = OrderOfAnotherProcess(seed, 200);
        EXPECT_EQ(OrderOfAnotherProcess(seed, 200), first);
        std::srand(1);
        EXPECT_EQ(first, OrderModel(graph).SerialOrder([](std::size_t count) {
            return static_cast<std::size_t>(std::rand()) % count;
        }));
    }
}

}  // namespace

}  // namespace vantor
