#include "chart/Chart.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <limits>
#include <string>
#include <vector>

#include "analyze/boot/BootText.h"

namespace vantor::analyze {
namespace {

using support::BootText;
using testing::HasSubstr;
using testing::Not;
using testing::StartsWith;

//   disks 100..600 -> [storage] -> vaults 610..900, guests 620..700
BootTimeline SmallBoot() {
    return BootText({"disks 100 600 provides storage", "vaults 610 900 requires storage",
                     "guests 620 700 requires storage"})
        .Timeline();
}

BootTimeline Boot(const std::vector<TimelineEntry>& entries, Microseconds end) {
    BootTimeline timeline;
    timeline.entries = entries;
    timeline.end = end;
    return timeline;
}

TimelineEntry Entry(const std::string& name, Microseconds start, Microseconds end) {
    TimelineEntry entry;
    entry.name = name;
    entry.released = start;
    entry.start = start;
    entry.end = end;
    return entry;
}

std::size_t Count(const std::string& text, const std::string& part) {
    std::size_t count = 0;
    for (std::size_t at = text.find(part); at != std::string::npos; at = text.find(part, at + 1)) {
        ++count;
    }
    return count;
}

// What keeps the text from being well-formed, as far as elements and characters go; empty for
// nothing. Comments and sections of raw text are not expected.
std::string Malformed(const std::string& text) {
    std::vector<std::string> open;
    for (std::size_t at = 0; at < text.size();) {
        if (static_cast<unsigned char>(text[at]) < 0x20 && text[at] != '\n') {
            return "a control character";
        }
        if (text[at] != '<') {
            ++at;
            continue;
        }
        const std::size_t end = text.find('>', at);
        if (end == std::string::npos) {
            return "a tag without an end";
        }
        const std::string tag = text.substr(at + 1, end - at - 1);
        if (tag.find('<') != std::string::npos || Count(tag, "\"") % 2 != 0) {
            return "a broken tag: " + tag;
        }
        const std::string name = tag.substr(0, tag.find_first_of(" /", 1));
        if (tag.front() == '/') {
            if (open.empty() || "/" + open.back() != tag) {
                return "a wrong end: " + tag;
            }
            open.pop_back();
        } else if (tag.back() != '/' && tag.front() != '?') {
            open.push_back(name);
        }
        at = end + 1;
    }
    return open.empty() ? "" : "not closed: " + open.back();
}

TEST(ChartTest, SaysWhatItShows) {
    const std::string svg = ChartAsSvg(SmallBoot(), "/var/log/boot.log");
    EXPECT_THAT(svg, StartsWith("<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
                                "<svg xmlns=\"http://www.w3.org/2000/svg\" "));
    EXPECT_THAT(svg,
                HasSubstr("<title id=\"chart-title\">3 plugins in 900 µs on 8 workers</title>"));
    EXPECT_THAT(svg, HasSubstr("<desc id=\"chart-text\">/var/log/boot.log; critical chain: "
                               "2 plugins, 790 µs running and 10 µs between them: "
                               "disks, vaults</desc>"));
    EXPECT_EQ(Malformed(svg), "");
}

TEST(ChartTest, HasABarInALaneAndABarInARowForEveryRun) {
    const std::string svg = ChartAsSvg(SmallBoot(), "log");
    EXPECT_EQ(Count(svg, "<g class=\"run\">"), 1U);
    EXPECT_EQ(Count(svg, "<g class=\"run chain\">"), 2U);
    EXPECT_EQ(Count(svg, "<g class=\"plugin\">"), 1U);
    EXPECT_EQ(Count(svg, "<g class=\"plugin chain\">"), 2U);
    EXPECT_EQ(Count(svg, ">worker 1</text>"), 1U);
    EXPECT_EQ(Count(svg, ">worker 3</text>"), 0U);  // two ran at once at most
}

TEST(ChartTest, TellsAPluginsFiguresInItsTooltip) {
    const std::string svg = ChartAsSvg(SmallBoot(), "log");
    EXPECT_EQ(Count(svg, "<title>vaults\nran 0.290 ms, from 0.610 ms to 0.900 ms\n"
                         "waited 0.500 ms for its barriers, last for storage, until disks had "
                         "ended\nwaited 0.010 ms for a worker\non the critical chain</title>"),
              2U);
    EXPECT_EQ(Count(svg, "<title>disks\nran 0.500 ms, from 0.100 ms to 0.600 ms\n"
                         "waited 0.000 ms for its barriers\nwaited 0.000 ms for a worker\n"
                         "on the critical chain</title>"),
              2U);
}

TEST(ChartTest, MarksABarrierAndTellsWhoNamesIt) {
    const std::string svg = ChartAsSvg(SmallBoot(), "log");
    EXPECT_THAT(svg, HasSubstr("<g class=\"barrier chain\"><title>barrier storage\n"
                               "reached at 0.600 ms\nprovided by disks\n"
                               "required by vaults, guests</title>"));
    EXPECT_EQ(Count(svg, "class=\"name flag\""), 1U);
}

TEST(ChartTest, TellsWaitsForBarriersFromWaitsForAWorker) {
    const std::string none = ChartAsSvg(Boot({Entry("a", 0, 100)}, 100), "log");
    TimelineEntry waiting = Entry("b", 80, 100);
    waiting.released = 30;
    const std::string both = ChartAsSvg(Boot({waiting}, 100), "log");
    EXPECT_EQ(Count(both, "class=\"barrier-wait\""), Count(none, "class=\"barrier-wait\"") + 1);
    EXPECT_EQ(Count(both, "class=\"worker-wait\""), Count(none, "class=\"worker-wait\"") + 1);
}

TEST(ChartTest, IsWellFormedWhateverTheNames) {
    const std::string bad = "<&\"'>\xff\x01\u202e]]>";
    const BootTimeline timeline = Boot({Entry(bad, 0, 100), Entry("", 0, 50)}, 100);
    for (const std::string& chart : {ChartAsSvg(timeline, bad), ChartAsHtml(timeline, bad)}) {
        EXPECT_THAT(chart, HasSubstr("&lt;&amp;&quot;&#39;&gt;\\xff\\x01\\u202e]]&gt;"));
        EXPECT_THAT(chart, Not(HasSubstr("\xff")));
    }
    EXPECT_EQ(Malformed(ChartAsSvg(timeline, bad)), "");
}

TEST(ChartTest, FixesTheWidthOfNamesWhoseCharactersMayBeOfAnyWidth) {
    const std::string svg = ChartAsSvg(Boot({Entry("Gerät", 0, 100)}, 100), "log");
    EXPECT_EQ(Count(svg, "textLength=\"40.26\" lengthAdjust=\"spacingAndGlyphs\""), 2U);
}

TEST(ChartTest, SurvivesAClockThatWasSet) {
    const Microseconds far = std::numeric_limits<Microseconds>::max() / 4;
    const std::string svg = ChartAsSvg(Boot({Entry("back", 500, 20), Entry("before", -900, -800),
                                             Entry("far", 600, far), Entry("instant", 700, 700)},
                                            800),
                                       "log");
    EXPECT_THAT(svg, Not(HasSubstr("width=\"-")));
    EXPECT_THAT(svg, Not(HasSubstr("nan")));
    EXPECT_THAT(svg, Not(HasSubstr("inf\"")));
    EXPECT_THAT(svg, HasSubstr("ended before it began: the clock was set back"));
    EXPECT_EQ(Malformed(svg), "");
}

TEST(ChartTest, DrawsABootWithoutPlugins) {
    for (const Microseconds end : {Microseconds{0}, Microseconds{5}}) {
        const std::string svg = ChartAsSvg(Boot({}, end), "log");
        EXPECT_THAT(svg, HasSubstr(">no plugin was run</text>"));
        EXPECT_EQ(Malformed(svg), "");
    }
}

TEST(ChartTest, GivesManyPluginsBlocksWithAxesOfTheirOwn) {
    std::vector<TimelineEntry> entries;
    for (int i = 0; i < 100; ++i) {
        entries.push_back(Entry("p" + std::to_string(i), i * 1000, i * 1000 + 500));
    }
    const std::string note = "blocks of 40 plugins, each with a time axis of its own";
    EXPECT_THAT(ChartAsSvg(Boot(entries, 200000), "log"), Not(HasSubstr(note)));
    entries.push_back(Entry("last", 100000, 200000));
    const std::string svg = ChartAsSvg(Boot(entries, 200000), "log");
    EXPECT_THAT(svg, HasSubstr(note));
    EXPECT_EQ(Count(svg, "<g class=\"plugin"), 101U);
    EXPECT_EQ(Malformed(svg), "");
}

TEST(ChartTest, MarksARunThatGoesOnBeyondItsBlock) {
    std::vector<TimelineEntry> entries{Entry("long", 0, 200000)};
    for (int i = 0; i < 110; ++i) {
        entries.push_back(Entry("p" + std::to_string(i), i * 1000, i * 1000 + 500));
    }
    EXPECT_EQ(Count(ChartAsSvg(Boot(entries, 200000), "log"), "class=\"more\""), 1U);
}

TEST(ChartTest, NeedsNothingFromElsewhere) {
    for (const std::string& chart :
         {ChartAsSvg(SmallBoot(), "log"), ChartAsHtml(SmallBoot(), "log")}) {
        for (const char* const word : {"href", "src=", "@import", "<script", "onload"}) {
            EXPECT_THAT(chart, Not(HasSubstr(word)));
        }
        EXPECT_EQ(Count(chart, "http"),
                  Count(chart, "http://www.w3.org/2000/svg") + Count(chart, "http-equiv"));
        EXPECT_EQ(Count(chart, "url("), Count(chart, "url(#worker-wait)"));
    }
}

TEST(ChartTest, ShowsTheRemarksOnAPage) {
    BootTimeline timeline = SmallBoot();
    timeline.remarks = {"a & b are not in the log", "c\x1b is there twice"};
    const std::string html = ChartAsHtml(timeline, "log");
    EXPECT_THAT(html, StartsWith("<!DOCTYPE html>\n<html lang=\"en\">\n"));
    EXPECT_THAT(html, HasSubstr("<ul>\n<li>a &amp; b are not in the log</li>\n"
                                "<li>c\\x1b is there twice</li>\n</ul>\n"));
    EXPECT_THAT(html, Not(HasSubstr("<?xml")));
    EXPECT_THAT(html, HasSubstr("content=\"default-src 'none'; style-src 'unsafe-inline'\""));
}

}  // namespace
}  // namespace vantor::analyze
