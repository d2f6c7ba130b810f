// Boots run again on the virtual clock.

#include "boot/Simulation.h"

#include <gtest/gtest.h>

#include <stdexcept>

#include "analyze/boot/BootText.h"
#include "analyze/boot/RandomBoot.h"
#include "support/ErrorText.h"

namespace vantor::analyze {
namespace {

using support::BootText;

Microseconds MakespanOf(const BootText& boot, std::size_t workers) {
    return Simulation(boot.Timeline()).Predict(workers).makespan;
}

TEST(SimulationTest, OneWorkerRunsEverythingInARow) {
    EXPECT_EQ(MakespanOf(BootText({"a 0 10", "b 0 20", "c 0 30"}), 1), 60);
}

TEST(SimulationTest, WorkersRunSideBySide) {
    EXPECT_EQ(MakespanOf(BootText({"a 0 10", "b 0 20", "c 0 30"}), 2), 40);
    EXPECT_EQ(MakespanOf(BootText({"a 0 10", "b 0 20", "c 0 30"}), 3), 30);
}

TEST(SimulationTest, BarriersAreWaitedForAndTakeNoTime) {
    EXPECT_EQ(MakespanOf(BootText({"a 0 10 provides x", "b 90 110 requires x y"}), 8), 30);
}

TEST(SimulationTest, TheLongestChainGoesFirst) {
    //  low 30      high 10 --> [x] --> tail 20
    const Prediction prediction =
        Simulation(
            BootText({"low 0 30", "high 0 10 provides x", "tail 10 30 requires x"}).Timeline())
            .Predict(1);
    EXPECT_EQ(prediction.starts, (std::vector<Microseconds>{10, 0, 40}));
}

TEST(SimulationTest, ABarrierThatNobodyRequiresLengthensTheChain) {
    const Prediction prediction =
        Simulation(BootText({"low 0 30", "high 0 10 provides x"}).Timeline()).Predict(1);
    EXPECT_EQ(prediction.starts, (std::vector<Microseconds>{10, 0}));
}

TEST(SimulationTest, AChainThroughAPluginThatIsNotRunCounts) {
    //  one --> [x] --> off (filtered) --> [y] --> last        two --> [z]
    const Prediction prediction =
        Simulation(BootText({"two 0 30 provides z", "one 0 10 provides x",
                             "off filtered requires x provides y", "last 40 50 requires y"})
                       .Timeline())
            .Predict(1);
    EXPECT_EQ(prediction.starts, (std::vector<Microseconds>{10, 0, 40}));
}

TEST(SimulationTest, TheLowerBoundIsTheLongestChainOrTheWork) {
    const Simulation simulation(
        BootText({"a 0 10 provides x", "b 10 30 requires x", "c 0 11"}).Timeline());
    EXPECT_EQ(simulation.Predict(1).lowerBound, 41);
    EXPECT_EQ(simulation.Predict(2).lowerBound, 30);
    EXPECT_EQ(simulation.Predict(2).criticalPath, 30);
    EXPECT_EQ(simulation.Predict(2).work, 41);
    EXPECT_DOUBLE_EQ(simulation.Predict(2).Efficiency(), 41.0 / 60);
}

TEST(SimulationTest, AnEmptyBootTakesNoTime) {
    const Prediction prediction = Simulation(BootTimeline()).Predict(8);
    EXPECT_EQ(prediction.makespan, 0);
    EXPECT_DOUBLE_EQ(prediction.Efficiency(), 1.0);
}

TEST(SimulationTest, ARunMayBeOfAnotherLength) {
    Simulation simulation(BootText({"a 0 10 provides x", "b 10 30 requires x"}).Timeline());
    simulation.SetRun("a", 100);
    EXPECT_EQ(simulation.Predict(8).makespan, 120);
    simulation.SetRun("b", 0);
    EXPECT_EQ(simulation.Predict(8).makespan, 100);
}

TEST(SimulationTest, AnUnknownPluginCannotBeChanged) {
    Simulation simulation(BootText({"a 0 10 provides x", "off filtered"}).Timeline());
    EXPECT_EQ(support::ErrorText<std::runtime_error>([&] { simulation.SetRun("off", 1); }),
              "no plugin 'off' was run by this boot");
    EXPECT_EQ(support::ErrorText<std::runtime_error>([&] { simulation.SetRun("x", 1); }),
              "no plugin 'x' was run by this boot");
}

TEST(SimulationTest, WithoutItsRequirementAPluginStartsAtOnce) {
    Simulation simulation(BootText({"a 0 10 provides x", "b 10 30 requires x"}).Timeline());
    simulation.DropEdge("x:b");
    EXPECT_EQ(simulation.Predict(8).makespan, 20);
}

TEST(SimulationTest, WithoutItsProviderABarrierWaitsForTheOthers) {
    Simulation simulation(
        BootText({"a 0 10 provides x", "c 0 5 provides x", "b 10 30 requires x"}).Timeline());
    simulation.DropEdge("a:x");
    EXPECT_EQ(simulation.Predict(8).makespan, 25);
}

TEST(SimulationTest, NamesOfAnEdgeHoldColons) {
    Simulation simulation(BootText({"a:a 0 10 provides x:x", "b 10 30 requires x:x"}).Timeline());
    simulation.DropEdge("a:a:x:x");
    EXPECT_EQ(simulation.Predict(8).makespan, 20);
}

TEST(SimulationTest, WhatIsNoEdgeCannotBeDropped) {
    Simulation simulation(BootText({"a 0 10 provides x", "b 10 30 requires x"}).Timeline());
    const auto errorOf = [&simulation](const std::string& edge) {
        return support::ErrorText<std::runtime_error>([&] { simulation.DropEdge(edge); });
    };
    EXPECT_EQ(errorOf("x:a"), "no edge 'x:a': no plugin provides or requires a barrier so");
    EXPECT_EQ(errorOf("a:b"), "no edge 'a:b': no plugin provides or requires a barrier so");
    EXPECT_EQ(errorOf("a:y"), "no edge 'a:y': it takes the names of a plugin that was run and of a "
                              "barrier, with a colon between them");
    EXPECT_EQ(errorOf("a"), "no edge 'a': it takes the names of a plugin that was run and of a "
                            "barrier, with a colon between them");
}

TEST(SimulationTest, ACircleIsAnErrorAndNoHang) {
    const Simulation simulation(
        BootText({"p 0 5 requires b provides a", "q 6 9 requires a provides b"}).Timeline());
    EXPECT_EQ(support::ErrorText<std::runtime_error>([&] { simulation.Predict(8); }),
              "the plugins wait for each other in a circle, so the log is not that of a boot with "
              "them: 'p' -> [a] -> 'q' -> [b] -> 'p'");
}

TEST(SimulationTest, ACircleWhoseEdgeIsDroppedIsNone) {
    Simulation simulation(
        BootText({"p 0 5 requires b provides a", "q 6 9 requires a provides b"}).Timeline());
    simulation.DropEdge("b:p");
    EXPECT_EQ(simulation.Predict(8).makespan, 8);
}

TEST(SimulationTest, RandomBootsTakeAsLongAsByThePlainRules) {
    for (std::uint32_t seed = 0; seed < 40; ++seed) {
        const BootTimeline timeline = support::MakeRandomBoot(seed, 3 + 4 * seed);
        const Simulation simulation(timeline);
        for (const std::size_t workers : {1U, 2U, 3U, 8U}) {
            const Prediction prediction = simulation.Predict(workers);
            EXPECT_EQ(prediction.makespan, support::PlainMakespan(timeline, workers))
                << "seed " << seed << ", " << workers << " workers";
            EXPECT_GE(prediction.makespan, prediction.lowerBound);
        }
    }
}

TEST(SimulationTest, MoreWorkersThanPluginsReachTheLongestChain) {
    for (std::uint32_t seed = 100; seed < 110; ++seed) {
        const Prediction prediction = Simulation(support::MakeRandomBoot(seed, 100)).Predict(101);
        EXPECT_EQ(prediction.makespan, prediction.criticalPath) << "seed " << seed;
    }
}

TEST(SimulationTest, TenThousandPluginsAndALongChainAreNoTrouble) {
    BootTimeline chain;
    for (std::size_t link = 0; link < 10000; ++link) {
        chain.barriers.emplace_back().name = std::to_string(link);
        TimelineEntry& entry = chain.entries.emplace_back();
        entry.end = 1;
        entry.provided = {link};
        if (link > 0) {
            entry.required = {link - 1};
        }
    }
    EXPECT_EQ(Simulation(chain).Predict(8).makespan, 10000);
}

}  // namespace
}  // namespace vantor::analyze
