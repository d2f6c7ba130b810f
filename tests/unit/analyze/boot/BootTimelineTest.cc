// A log and the plugins it came from, put together; and what is said when they do not fit.

#include "boot/BootTimeline.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "analyze/boot/BootText.h"

namespace vantor::analyze {
namespace {

using support::BootText;
using support::EntryOf;
using testing::ElementsAre;
using testing::IsEmpty;

TEST(BootTimelineTest, TheLastProviderOfTheLastBarrierReleasesAPlugin) {
    const BootTimeline timeline = BootText({"early 10 40 provides a", "late 12 70 provides b",
                                            "other 11 60 provides b", "last 75 90 requires a b"})
                                      .Timeline();
    const TimelineEntry& last = timeline.entries.at(3);
    EXPECT_EQ(last.releasedBy, EntryOf(timeline, "late"));
    EXPECT_EQ(last.releasedThrough, "b");
    EXPECT_EQ(last.released, 70);
    EXPECT_EQ(last.WaitedForBarriers(), 60);  // loading ended when the first plugin started
    EXPECT_EQ(last.WaitedForWorker(), 5);
    EXPECT_EQ(last.Ran(), 15);
    EXPECT_THAT(timeline.remarks, IsEmpty());
}

TEST(BootTimelineTest, APluginWithoutBarriersWaitsForAWorkerFromTheFirstStartOn) {
    const BootTimeline timeline = BootText({"first 30 40", "second 41 50"}).Timeline();
    const TimelineEntry& second = timeline.entries.at(1);
    EXPECT_EQ(second.releasedBy, TimelineEntry::none);
    EXPECT_EQ(second.WaitedForBarriers(), 0);
    EXPECT_EQ(second.WaitedForWorker(), 11);
}

TEST(BootTimelineTest, BarriersStandByNameWithTheirPlugins) {
    const BootTimeline timeline =
        BootText({"p 0 5 provides z a z", "q 6 9 requires z", "r 6 7 requires nobodys"}).Timeline();
    ASSERT_EQ(timeline.barriers.size(), 3U);
    EXPECT_EQ(timeline.barriers[0].name, "a");
    EXPECT_THAT(timeline.barriers[0].requirers, IsEmpty());
    EXPECT_EQ(timeline.barriers[1].name, "nobodys");
    EXPECT_EQ(timeline.barriers[1].done, 0);
    EXPECT_EQ(timeline.barriers[2].name, "z");
    EXPECT_EQ(timeline.barriers[2].done, 5);
    EXPECT_THAT(timeline.barriers[2].providers, ElementsAre(0));
    EXPECT_THAT(timeline.barriers[2].requirers, ElementsAre(1));
    EXPECT_THAT(timeline.entries[0].provided, ElementsAre(2, 0));
}

TEST(BootTimelineTest, WorkersAreThoseOfTheMode) {
    BootText boot({"p 0 5"});
    EXPECT_EQ(boot.Timeline().workers, 8U);
    boot.log.parallel = false;
    EXPECT_EQ(boot.Timeline().workers, 1U);
}

TEST(BootTimelineTest, WorkAndMakespanCountFromTheFirstStart) {
    const BootTimeline timeline = BootText({"p 20 50", "q 30 70"}).Timeline();
    EXPECT_EQ(timeline.Work(), 70);
    EXPECT_EQ(timeline.Makespan(), 50);
    EXPECT_EQ(timeline.end, 70);
    EXPECT_EQ(BootTimeline().Makespan(), 0);
}

TEST(BootTimelineTest, PluginsThatWereNotRunStandByWithoutReleasingAnybody) {
    const BootTimeline timeline =
        BootText({"again idle provides a", "off filtered provides a", "p 3 5 requires a"})
            .Timeline();
    ASSERT_EQ(timeline.entries.size(), 1U);
    EXPECT_EQ(timeline.entries[0].releasedBy, TimelineEntry::none);
    ASSERT_EQ(timeline.bystanders.size(), 2U);
    EXPECT_EQ(timeline.bystanders[0].name, "off");
    EXPECT_EQ(timeline.bystanders[1].name, "again");
    EXPECT_THAT(timeline.remarks, IsEmpty());
}

TEST(BootTimelineTest, PluginsThatOnlyOneSideKnowsAreTold) {
    const BootTimeline timeline =
        BootText({"p 0 5", "old 6 7 unknown", "new unlogged requires a"}).Timeline();
    EXPECT_EQ(timeline.entries.size(), 2U);
    EXPECT_THAT(timeline.remarks,
                ElementsAre("'old': only in the log, taken to provide and require nothing",
                            "'new': not in the log, left out"));
}

TEST(BootTimelineTest, ARemarkNamesFiveAndCountsTheRest) {
    const BootTimeline timeline = BootText({"a unlogged", "b unlogged", "c unlogged", "d unlogged",
                                            "e unlogged", "f unlogged", "g unlogged"})
                                      .Timeline();
    EXPECT_THAT(timeline.remarks,
                ElementsAre("'a', 'b', 'c', 'd', 'e' and 2 more: not in the log, left out"));
}

TEST(BootTimelineTest, TwoOfOneNameAreToldApartByTheirOrder) {
    const BootTimeline timeline =
        BootText({"twin 0 5 provides a", "twin 1 9 provides b", "p 6 8 requires a"}).Timeline();
    EXPECT_EQ(timeline.entries[2].releasedBy, 0U);
    EXPECT_THAT(timeline.remarks,
                ElementsAre("'twin': more than one plugin of this name, told apart by their order "
                            "alone"));
}

TEST(BootTimelineTest, AFilteredTwinIsTakenLast) {
    BootText boot({"twin filtered provides a", "twin 0 5 provides b", "p 6 8 requires b"});
    EXPECT_EQ(boot.Timeline().entries[1].releasedBy, 0U);
}

TEST(BootTimelineTest, APluginThatRanThoughTheOptionsFilterItIsTold) {
    BootText boot({"p 0 5"});
    boot.model.plugins[0].fate = PluginFate::Filtered;
    EXPECT_THAT(boot.Timeline().remarks,
                ElementsAre("'p': run by the boot, but filtered by the options given here"));
}

TEST(BootTimelineTest, AnEndBeforeItsStartIsNoRunAtAll) {
    const BootTimeline timeline = BootText({"p 50 20", "q 60 70"}).Timeline();
    EXPECT_EQ(timeline.entries[0].Ran(), 0);
    EXPECT_THAT(timeline.remarks,
                ElementsAre("'p': ended before it started by the log, as the clock was set: taken "
                            "to have lasted no time"));
}

TEST(BootTimelineTest, AClockThatWasSetBackGivesNoNegativeMoment) {
    BootText boot({"p 10 20", "q -500 -400"});
    boot.log.end = boot.log.start - 390;
    const BootTimeline timeline = boot.Timeline();
    EXPECT_EQ(timeline.entries[1].start, 0);
    EXPECT_EQ(timeline.entries[0].start, 510);
    EXPECT_EQ(timeline.end, 520);
    EXPECT_THAT(timeline.remarks,
                ElementsAre("some plugin ran outside the time from the start of the boot to its "
                            "end by the log, as the clock was set: waits and gaps may be wrong"));
}

TEST(BootTimelineTest, AProviderThatEndedTooLateReleasedNobody) {
    const BootTimeline timeline =
        BootText({"first 0 5 provides a", "p 0 50 provides b", "q 10 20 requires a b"}).Timeline();
    EXPECT_EQ(timeline.entries[2].releasedBy, 0U);
    EXPECT_EQ(timeline.entries[2].released, 5);
    EXPECT_THAT(timeline.remarks,
                ElementsAre("'q': started before a barrier that it requires was done, as the clock "
                            "was set or the plugins have changed since"));
}

TEST(BootTimelineTest, ACircleOfPluginsIsTakenAsTheLogTellsIt) {
    const BootTimeline timeline =
        BootText({"p 0 5 requires b provides a", "q 6 9 requires a provides b"}).Timeline();
    EXPECT_EQ(timeline.entries[0].releasedBy, TimelineEntry::none);
    EXPECT_EQ(timeline.entries[1].releasedBy, 0U);
    EXPECT_EQ(timeline.remarks.size(), 1U);
}

TEST(BootTimelineTest, APluginThatProvidesWhatItRequiresDoesNotReleaseItself) {
    const BootTimeline timeline = BootText({"p 5 5 requires a provides a"}).Timeline();
    EXPECT_EQ(timeline.entries[0].releasedBy, TimelineEntry::none);
    EXPECT_EQ(timeline.remarks.size(), 1U);
}

TEST(BootTimelineTest, ALogWithoutPluginsMakesAnEmptyTimeline) {
    const BootTimeline timeline = BootText({}).Timeline();
    EXPECT_TRUE(timeline.entries.empty());
    EXPECT_EQ(timeline.end, 0);
}

}  // namespace
}  // namespace vantor::analyze
