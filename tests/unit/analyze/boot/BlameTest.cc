// What each run meant for the length of the boot.

#include "boot/Blame.h"

#include <gtest/gtest.h>

#include <map>

#include "analyze/boot/BootText.h"

namespace vantor::analyze {
namespace {

using support::BootText;

struct Figures {
    std::vector<std::string> names;  // in the order of the rows
    std::map<std::string, Microseconds> slack;
    std::map<std::string, Microseconds> saves;
};

Figures FiguresOf(const BootTimeline& timeline) {
    Figures figures;
    for (const BlameRow& row : Blame(timeline)) {
        const std::string& name = timeline.entries[row.entry].name;
        figures.names.push_back(name);
        figures.slack[name] = row.slack;
        figures.saves[name] = row.savesAtMost;
    }
    return figures;
}

TEST(BlameTest, ByDependenciesAloneSlackIsTheTimeUpToTheLatestEnd) {
    //  a 0-10 --> [x] --> c 10-60
    //  b 0-40 --> [y] --> d 40-50      e 0-5
    const Figures figures =
        FiguresOf(BootText({"a 0 10 provides x", "b 0 40 provides y", "c 10 60 requires x",
                            "d 40 50 requires y", "e 0 5"})
                      .Timeline());
    EXPECT_EQ(figures.slack, (std::map<std::string, Microseconds>{
                                 {"a", 0}, {"b", 10}, {"c", 0}, {"d", 10}, {"e", 55}}));
}

TEST(BlameTest, ThroughAWaitForAWorkerNoRunHasSlack) {
    BootText boot({"a 0 10", "b 10 30", "c 30 35"});
    boot.log.parallel = false;
    EXPECT_EQ(FiguresOf(boot.Timeline()).slack,
              (std::map<std::string, Microseconds>{{"a", 0}, {"b", 0}, {"c", 0}}));
}

TEST(BlameTest, WhatIsSavedIsBoundByTheLongestChainThatIsLeft) {
    const Figures figures = FiguresOf(
        BootText({"a 0 10 provides x", "b 0 40", "c 10 60 requires x", "e 0 5"}).Timeline());
    EXPECT_EQ(figures.saves,
              (std::map<std::string, Microseconds>{{"a", 10}, {"b", 0}, {"c", 20}, {"e", 0}}));
    EXPECT_EQ(figures.names, (std::vector<std::string>{"c", "a", "b", "e"}));
}

TEST(BlameTest, WhatIsSavedIsBoundByTheWorkThatIsLeft) {
    BootText boot({"b 0 10", "a 10 30", "c 30 35"});
    boot.log.parallel = false;
    const Figures figures = FiguresOf(boot.Timeline());
    EXPECT_EQ(figures.saves, (std::map<std::string, Microseconds>{{"b", 10}, {"a", 20}, {"c", 5}}));
}

TEST(BlameTest, AmongEqualsNamesDecide) {
    BootText boot({"c 0 10", "a 10 20", "b 20 30"});
    boot.log.parallel = false;
    EXPECT_EQ(FiguresOf(boot.Timeline()).names, (std::vector<std::string>{"a", "b", "c"}));
}

TEST(BlameTest, SlackIsNeverNegativeHoweverOddTheTimes) {
    const BootTimeline timeline =
        BootText({"late 0 90 provides x", "early 5 10 requires x provides y",
                  "zero 10 10 requires y provides z", "none 10 10 requires z", "back 30 20"})
            .Timeline();
    for (const BlameRow& row : Blame(timeline)) {
        EXPECT_GE(row.slack, 0) << timeline.entries[row.entry].name;
        EXPECT_GE(row.savesAtMost, 0) << timeline.entries[row.entry].name;
    }
}

TEST(BlameTest, ABootWithoutPluginsHasNoRows) { EXPECT_TRUE(Blame(BootTimeline()).empty()); }

}  // namespace
}  // namespace vantor::analyze
