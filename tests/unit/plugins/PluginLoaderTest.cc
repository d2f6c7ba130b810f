#include "plugins/PluginLoader.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <syslog.h>

#include <ostream>

#include "plugins/PluginLoaderFixture.h"

namespace vantor {
namespace {

using support::LogEntry;
using support::NamesOf;
using support::PluginLoaderTest;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

TEST_F(PluginLoaderTest, AFileWithoutADotIsOfUnspecifiedTypeAndNothingElse) {
    WriteDebugConfig("malformed\n");
    Load("README");
    EXPECT_THAT(
        log.Entries(),
        ElementsAre(LogEntry{LOG_WARNING, "ignoring plugin 'README' of unspecified type..."}));
    EXPECT_THAT(alerts.Texts(), IsEmpty());
    EXPECT_THAT(plugins, IsEmpty());
}

TEST_F(PluginLoaderTest, ATrailingDotIsAnUnknownTypeWithAnEmptyExtension) {
    Load("disk.");
    EXPECT_THAT(log.Entries(), ElementsAre(LogEntry{
                                   LOG_WARNING, "ignoring plugin 'disk.' of unknown type ()..."}));
}

TEST_F(PluginLoaderTest, OnlyTheTextAfterTheLastDotIsTheExtension) {
    Load("libfoo.so.1");
    EXPECT_THAT(
        log.Entries(),
        ElementsAre(LogEntry{LOG_WARNING, "ignoring plugin 'libfoo.so.1' of unknown type (1)..."}));
}

TEST_F(PluginLoaderTest, ExtensionsAreComparedExactly) {
    Load("foo.SO");
    Load("foo.sox");
    Load("foo.Debug");
    EXPECT_THAT(
        log.Entries(),
        ElementsAre(
            LogEntry{LOG_WARNING, "ignoring plugin 'foo.SO' of unknown type (SO)..."},
            LogEntry{LOG_WARNING, "ignoring plugin 'foo.sox' of unknown type (sox)..."},
            LogEntry{LOG_WARNING, "ignoring plugin 'foo.Debug' of unknown type (Debug)..."}));
    EXPECT_THAT(plugins, IsEmpty());
    EXPECT_THAT(alerts.Texts(), IsEmpty());
}

TEST_F(PluginLoaderTest, FooSoIsANativePluginNamedFoo) {
    AddObject("foo.so", "first");
    Load("foo.so");
    EXPECT_THAT(Queue(), ElementsAre("foo"));
    EXPECT_EQ(plugins.front()->ApiVersion(), 1);
    EXPECT_EQ(plugins.front()->State(), NodeState::Idle);
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(PluginLoaderTest, LibfooJsonIsAJsonPluginNamedFoo) {
    root.Write("/plugins/libfoo.json",
               "{\"metadata\": {\"version\": 2, \"provides\": [], \"requires\": []},"
               " \"operations\": {\"start\": []}}");
    Load("libfoo.json");
    EXPECT_THAT(Queue(), ElementsAre("foo"));
    EXPECT_EQ(plugins.front()->ApiVersion(), 2);
    EXPECT_THAT(log.Entries(), IsEmpty());
}

struct NameCase {
    const char* fileName;
    const char* pluginName;
};

void PrintTo(const NameCase& value, std::ostream* stream) { *stream << value.fileName; }

class PluginNameTest : public PluginLoaderTest, public ::testing::WithParamInterface<NameCase> {};

TEST_P(PluginNameTest, IsTheFileNameWithoutExtensionAndALeadingLib) {
    AddObject(GetParam().fileName, "first");
    Load(GetParam().fileName);
    EXPECT_THAT(Queue(), ElementsAre(GetParam().pluginName));
}

INSTANTIATE_TEST_SUITE_P(Files, PluginNameTest,
                         ::testing::Values(NameCase{"libfoo.so", "foo"}, NameCase{"lib.so", ""},
                                           NameCase{"li.so", "li"}, NameCase{".so", ""},
                                           NameCase{"liblibfoo.so", "libfoo"},
                                           NameCase{"Libfoo.so", "Libfoo"},
                                           NameCase{"mylibfoo.so", "mylibfoo"},
                                           NameCase{"libfoo.1.2.so", "foo.1.2"}));

TEST_F(PluginLoaderTest, PluginsAreQueuedInTheOrderOfTheCalls) {
    AddObject("libb.so", "first");
    AddObject("liba.so", "second");
    Load("libb.so");
    Load("liba.so");
    EXPECT_THAT(Queue(), ElementsAre("b", "a"));
}

TEST_F(PluginLoaderTest, TwoDebugEntriesWithOneMarkerFileGiveTwoPluginsInFileOrder) {
    WriteDebugConfig("probe:loader-need-1:loader-give-1:exit 1\n"
                     "other:x:y:exit 2\n"
                     "probe:loader-need-2:loader-give-2:exit 3\n");
    Load("probe.debug");
    ASSERT_THAT(Queue(), ElementsAre("probe", "probe"));
    EXPECT_THAT(NamesOf(plugins[0]->Dependencies()), ElementsAre("loader-need-1"));
    EXPECT_THAT(NamesOf(plugins[0]->Dependents()), ElementsAre("loader-give-1"));
    EXPECT_THAT(NamesOf(plugins[1]->Dependencies()), ElementsAre("loader-need-2"));
    plugins[1]->Start();
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_INFO, "debug injection 'probe' returned 0x000300"}));
}

TEST_F(PluginLoaderTest, AMarkerFileWithoutAMatchingEntryYieldsNoPluginAndNoMessage) {
    WriteDebugConfig("other:x:y:exit 2\n");
    Load("probe.debug");
    EXPECT_THAT(plugins, IsEmpty());
    EXPECT_THAT(log.Entries(), IsEmpty());
    EXPECT_THAT(alerts.Texts(), IsEmpty());
}

TEST_F(PluginLoaderTest, AMarkerFileWithoutADebugConfigurationYieldsNothing) {
    Load("probe.debug");
    EXPECT_THAT(plugins, IsEmpty());
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(PluginLoaderTest, AMarkerFileYieldsNoneOfTheOtherEntries) {
    WriteDebugConfig("other:x:y:exit 2\nprobe:x:y:exit 3\n");
    Load("probe.debug");
    EXPECT_THAT(Queue(), ElementsAre("probe"));
}

TEST_F(PluginLoaderTest, ALeadingLibIsDroppedFromAMarkerFileToo) {
    WriteDebugConfig("probe:x:y:true\nlibprobe:x:y:true\n");
    Load("libprobe.debug");
    EXPECT_THAT(Queue(), ElementsAre("probe"));
}

TEST_F(PluginLoaderTest, AMarkerFileNeedNotExist) {
    WriteDebugConfig("probe:x:y:true\n");
    Load("probe.debug");
    EXPECT_THAT(Queue(), ElementsAre("probe"));
}

TEST_F(PluginLoaderTest, DebugPluginsPassNoFilter) {
    WriteDebugConfig("probe:x:y:true\n");
    blacklist = {"probe"};
    runOnceRecord = {"probe"};
    Load("probe.debug");
    EXPECT_THAT(Queue(), ElementsAre("probe"));
    EXPECT_EQ(plugins.front()->State(), NodeState::Idle);
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(PluginLoaderTest, TheDebugConfigurationIsReadAfreshForEveryFileWithAnExtension) {
    const LogEntry malformed{LOG_INFO, "ignoring malformed debug entry at line 1: malformed"};
    WriteDebugConfig("malformed\n");
    AddObject("libfoo.so", "first");
    Load("libfoo.so");
    Load("foo.debug");
    Load("foo.txt");
    EXPECT_THAT(
        log.Entries(),
        ElementsAre(malformed, malformed, malformed,
                    LogEntry{LOG_WARNING, "ignoring plugin 'foo.txt' of unknown type (txt)..."}));
    WriteDebugConfig("foo:x:y:true\n");
    Load("foo.debug");
    EXPECT_THAT(Queue(), ElementsAre("foo", "foo"));
}

TEST_F(PluginLoaderTest, ABlacklistedPluginIsMarkedDoneAndLeftOutOfTheQueue) {
    AddObject("libversion1.so", "version1");
    blacklist = {"version1"};
    InitBarrier& barrier = *InitBarrier::Get("version1-give-a");
    const std::size_t before = barrier.Dependencies().size();
    Load("libversion1.so");
    EXPECT_THAT(plugins, IsEmpty());
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_INFO, "ignoring plugin 'version1' due to blacklist"}));
    // Its barrier counts as provided, and does not wait for it.
    ASSERT_EQ(barrier.Dependencies().size(), before + 1);
    EXPECT_EQ(barrier.Dependencies().back()->State(), NodeState::Done);
}

TEST_F(PluginLoaderTest, APluginWithADisablingFlagIsMarkedDoneAndLeftOutOfTheQueue) {
    AddObject("libversion3.so", "version3");
    bootFlags = {"alpha", "beta", "nousb"};
    Load("libversion3.so");
    EXPECT_THAT(plugins, IsEmpty());
    EXPECT_THAT(
        log.Entries(),
        ElementsAre(LogEntry{LOG_WARNING,
                             "ignoring plugin 'version3', disabled due to boot flags: nousb "}));
    EXPECT_EQ(InitBarrier::Get("version3-give-a")->Dependencies().back()->State(), NodeState::Done);
    EXPECT_THAT(runOnceRecord, IsEmpty());
}

TEST_F(PluginLoaderTest, APluginWithoutItsRequiredFlagsIsMarkedDoneAndLeftOutOfTheQueue) {
    AddObject("libversion3.so", "version3");
    bootFlags = {"gamma"};
    Load("libversion3.so");
    EXPECT_THAT(plugins, IsEmpty());
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_WARNING,
                                     "ignoring plugin 'version3', disabled due to missing required "
                                     "boot flags: alpha beta "}));
    EXPECT_EQ(InitBarrier::Get("version3-give-a")->Dependencies().back()->State(), NodeState::Done);
    EXPECT_THAT(runOnceRecord, IsEmpty());
}

TEST_F(PluginLoaderTest, APluginWithItsRequiredFlagsIsQueuedAndRecorded) {
    AddObject("libversion4.so", "version4");
    bootFlags = {"alpha", "beta", "gamma"};
    Load("libversion4.so");
    EXPECT_THAT(Queue(), ElementsAre("version4"));
    EXPECT_THAT(runOnceRecord, ElementsAre("version47.8"));
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(PluginLoaderTest, APluginThatRequiresNoFlagsIsLoadedWhateverTheBootFlags) {
    AddObject("libfoo.so", "null_lists");
    bootFlags = {"alpha", "nousb"};
    Load("libfoo.so");
    bootFlags.clear();
    Load("libfoo.so");
    EXPECT_THAT(Queue(), ElementsAre("foo", "foo"));
}

TEST_F(PluginLoaderTest, ARecordedRunOncePluginIsInTheQueueAndDisabled) {
    AddObject("libfoo.so", "run_once");
    runOnceRecord = {"foo1.0"};
    Load("libfoo.so");
    ASSERT_THAT(Queue(), ElementsAre("foo"));
    EXPECT_EQ(plugins.front()->State(), NodeState::Done);
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_DEBUG, "ignoring plugin 'foo' because version '1.0' has "
                                                "already been run"}));
    EXPECT_THAT(runOnceRecord, ElementsAre("foo1.0"));
}

TEST_F(PluginLoaderTest, OfTwoRunOncePluginsOfOneNameAndVersionOnlyTheFirstRuns) {
    AddObject("libtwin.so", "run_once");
    AddObject("twin.so", "run_once");
    Load("libtwin.so");
    EXPECT_THAT(runOnceRecord, ElementsAre("twin1.0"));
    Load("twin.so");
    ASSERT_THAT(Queue(), ElementsAre("twin", "twin"));
    EXPECT_EQ(plugins[0]->State(), NodeState::Idle);
    EXPECT_EQ(plugins[1]->State(), NodeState::Done);
}

TEST_F(PluginLoaderTest, OfTwoRunOncePluginsWithAnUncleanKeyBothRun) {
    AddObject("libtwin.so", "run_once_unclean");
    AddObject("twin.so", "run_once_unclean");
    Load("libtwin.so");
    Load("twin.so");
    ASSERT_THAT(Queue(), ElementsAre("twin", "twin"));
    EXPECT_EQ(plugins[0]->State(), NodeState::Idle);
    EXPECT_EQ(plugins[1]->State(), NodeState::Idle);
    EXPECT_THAT(runOnceRecord, ElementsAre("twin10b"));
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(PluginLoaderTest, ABlacklistedRunOncePluginIsNotRecorded) {
    AddObject("libfoo.so", "run_once");
    blacklist = {"foo"};
    Load("libfoo.so");
    EXPECT_THAT(runOnceRecord, IsEmpty());
}

}  // namespace
}  // namespace vantor
