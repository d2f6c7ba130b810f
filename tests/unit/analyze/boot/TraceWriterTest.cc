// The boot as trace events.

#include "boot/TraceWriter.h"

#include <gtest/gtest.h>

#include <nlohmann/json.hpp>
#include <sstream>

#include "analyze/boot/BootText.h"

namespace vantor::analyze {
namespace {

using support::BootText;
using Json = nlohmann::json;

Json EventsOf(const BootTimeline& timeline, const std::string& phase) {
    std::ostringstream stream;
    WriteTrace(timeline, stream);
    Json chosen = Json::array();
    const Json document = Json::parse(stream.str());
    for (const Json& event : document.at("traceEvents")) {
        if (event.at("ph") == phase) {
            chosen.push_back(event);
        }
    }
    return chosen;
}

BootTimeline TwoPlugins() {
    return BootText({"disks 10 50 provides storage alone", "look 60 90 requires storage"})
        .Timeline();
}

TEST(TraceWriterTest, EachPluginIsASliceOnItsLane) {
    EXPECT_EQ(EventsOf(TwoPlugins(), "X"), Json::parse(R"json([
        {"ph": "X", "pid": 1, "tid": 1, "ts": 10, "dur": 40, "name": "disks", "cat": "plugin",
         "args": {"waited for barriers (us)": 0, "waited for a worker (us)": 0
}
},
        {"ph": "X", "pid": 1, "tid": 1, "ts": 60, "dur": 30, "name": "look", "cat": "plugin",
         "args": {"waited for barriers (us)": 40, "waited for a worker (us)": 10,
                  "released by": "disks", "through barrier": "storage"}}])json"));
}

TEST(TraceWriterTest, AnArrowLeadsFromTheReleasingPlugin) {
    EXPECT_EQ(EventsOf(TwoPlugins(), "s"), Json::parse(R"json([
        {"ph": "s", "pid": 1, "tid": 1, "ts": 49, "id": 2, "name": "storage",
         "cat": "barrier"}])json"));
    EXPECT_EQ(EventsOf(TwoPlugins(), "f"), Json::parse(R"json([
        {"ph": "f", "bp": "e", "pid": 1, "tid": 1, "ts": 60, "id": 2, "name": "storage",
         "cat": "barrier"}])json"));
}

TEST(TraceWriterTest, AnArrowOfItsOwnKindTellsAWaitForAWorker) {
    BootText boot({"a 0 10", "b 10 30"});
    boot.log.parallel = false;
    EXPECT_EQ(EventsOf(boot.Timeline(), "s").at(0).at("cat"), "worker");
}

TEST(TraceWriterTest, ABarrierThatIsRequiredIsAMark) {
    EXPECT_EQ(EventsOf(TwoPlugins(), "i"), Json::parse(R"json([
        {"ph": "i", "pid": 1, "tid": 0, "ts": 50, "s": "p", "name": "storage",
         "cat": "barrier"}])json"));
}

TEST(TraceWriterTest, LanesHaveNames) {
    const Json names = EventsOf(TwoPlugins(), "M");
    ASSERT_EQ(names.size(), 3U);
    EXPECT_EQ(names[0].at("args").at("name"), "boot");
    EXPECT_EQ(names[1].at("args").at("name"), "lane 1");
}

TEST(TraceWriterTest, NamesAreEscapedAndMendedToUtf8) {
    BootText boot({"a 0 10"});
    boot.log.entries[0].name = "\"\\\n\xff";
    EXPECT_EQ(EventsOf(boot.Timeline(), "X").at(0).at("name"), "\"\\\n\xef\xbf\xbd");
}

TEST(TraceWriterTest, ABootWithoutPluginsIsATraceToo) {
    EXPECT_TRUE(EventsOf(BootTimeline(), "X").empty());
}

}  // namespace
}  // namespace vantor::analyze
