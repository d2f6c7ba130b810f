// What released each plugin, the chain back from the last to end, and the lanes.

#include "boot/CriticalChain.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "analyze/boot/BootText.h"
#include "boot/Lanes.h"

namespace vantor::analyze {
namespace {

using support::BootText;
using testing::ElementsAre;

// "name" for the first of the chain, "name <barrier" and "name <worker" for what follows.
std::vector<std::string> ChainText(const BootTimeline& timeline) {
    std::vector<std::string> links;
    for (const ChainLink& link : CriticalChain(timeline)) {
        const TimelineEntry& entry = timeline.entries[link.entry];
        links.push_back(entry.name + (link.release.cause == ReleaseCause::Barrier
                                          ? " <" + entry.releasedThrough
                                      : link.release.cause == ReleaseCause::Worker ? " <worker"
                                                                                   : ""));
    }
    return links;
}

TEST(CriticalChainTest, ItFollowsTheBarriersBack) {
    const BootTimeline timeline =
        BootText({"a 0 10 provides x", "b 0 30 provides y", "c 31 40 requires x y provides z",
                  "d 41 90 requires z", "e 11 60 requires x"})
            .Timeline();
    EXPECT_THAT(ChainText(timeline), ElementsAre("b", "c <y", "d <z"));
}

TEST(CriticalChainTest, InASerialBootTheWorkerIsWaitedFor) {
    BootText boot({"a 0 10 provides x", "b 10 50", "c 51 60 requires x"});
    boot.log.parallel = false;
    EXPECT_THAT(ChainText(boot.Timeline()), ElementsAre("a", "b <worker", "c <worker"));
}

TEST(CriticalChainTest, WhatABarrierReleasedAtOnceWaitedForNoWorker) {
    BootText boot({"a 0 10 provides x", "b 10 50 requires x"});
    boot.log.parallel = false;
    EXPECT_THAT(ChainText(boot.Timeline()), ElementsAre("a", "b <x"));
}

TEST(CriticalChainTest, WithAnIdleWorkerAGapIsNoWaitForOne) {
    // other ends between release and start, but seven workers were idle.
    const BootTimeline timeline =
        BootText({"a 0 10 provides x", "other 0 12", "b 15 50 requires x"}).Timeline();
    EXPECT_THAT(ChainText(timeline), ElementsAre("a", "b <x"));
}

TEST(CriticalChainTest, WithAllEightBusyTheOneThatEndedLastHandsOverItsWorker) {
    const BootTimeline timeline = BootText({"p1 0 90", "p2 0 91", "p3 0 92", "p4 0 93", "p5 0 40",
                                            "p6 0 95", "p7 0 96", "p8 0 97", "late 42 200"})
                                      .Timeline();
    EXPECT_THAT(ChainText(timeline), ElementsAre("p5", "late <worker"));
}

TEST(CriticalChainTest, RunsOfNoLengthDoNotMakeItEndless) {
    BootText boot({"a 5 5", "b 5 5", "c 5 5 requires x provides y", "d 5 5 requires y provides x"});
    boot.log.parallel = false;
    const std::vector<ChainLink> chain = CriticalChain(boot.Timeline());
    ASSERT_FALSE(chain.empty());
    EXPECT_LE(chain.size(), 4U);
    EXPECT_EQ(chain.front().release.cause, ReleaseCause::Request);
}

TEST(CriticalChainTest, ABootWithoutPluginsHasNone) {
    EXPECT_TRUE(CriticalChain(BootTimeline()).empty());
}

TEST(LanesTest, ThereAreAsManyAsRanAtOnce) {
    const Lanes lanes =
        AssignLanes(BootText({"a 0 10", "b 5 20", "c 10 15", "d 20 30", "e 21 22"}).Timeline());
    EXPECT_EQ(lanes.count, 2U);
    EXPECT_THAT(lanes.lane, ElementsAre(0, 1, 0, 1, 0));
}

TEST(LanesTest, TheLaneThatBecameFreeLastIsTaken) {
    const Lanes lanes = AssignLanes(BootText({"a 0 10", "b 0 50", "c 0 30", "d 40 60"}).Timeline());
    EXPECT_EQ(lanes.lane.at(3), lanes.lane.at(2));
}

TEST(LanesTest, NoTwoThatRanAtOnceShareOne) {
    const BootTimeline timeline =
        BootText({"a 0 10", "b 1 3", "c 2 30", "d 3 3", "e 3 60", "f 10 12", "g 10 70"}).Timeline();
    const Lanes lanes = AssignLanes(timeline);
    for (std::size_t one = 0; one < timeline.entries.size(); ++one) {
        for (std::size_t other = 0; other < one; ++other) {
            const bool together = timeline.entries[one].start < timeline.entries[other].end &&
                                  timeline.entries[other].start < timeline.entries[one].end;
            EXPECT_FALSE(together && lanes.lane[one] == lanes.lane[other]) << one << ' ' << other;
        }
    }
}

}  // namespace
}  // namespace vantor::analyze
