#include "plugins/PluginFilters.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <syslog.h>

#include "plugins/FakePlugin.h"
#include "support/SyslogCapture.h"

namespace vantor {
namespace {

using support::LogEntry;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using Names = std::set<std::string>;

class PluginFiltersTest : public ::testing::Test {
protected:
    support::SyslogCapture log;
    support::FakePlugin plugin{"disk"};
};

TEST_F(PluginFiltersTest, APluginWithoutFlagsPassesWhateverTheBootFlags) {
    EXPECT_FALSE(IsFilteredOut(plugin, {}, {}));
    EXPECT_FALSE(IsFilteredOut(plugin, {"noacpi", "nousb"}, {"storage"}));
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(PluginFiltersTest, ABlacklistedPluginIsFilteredOut) {
    EXPECT_TRUE(IsFilteredOut(plugin, {}, {"storage", "disk", "disk"}));
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_INFO, "ignoring plugin 'disk' due to blacklist"}));
}

TEST_F(PluginFiltersTest, TheBlacklistComparesWholeNamesExactly) {
    EXPECT_FALSE(IsFilteredOut(plugin, {}, {"Disk", "dis", "disks", " disk", "libdisk.so", ""}));
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(PluginFiltersTest, ADisablingFlagThatIsSetFiltersOut) {
    plugin.disablingFlags = {"noacpi", "nousb"};
    EXPECT_TRUE(IsFilteredOut(plugin, {"nousb", "other"}, {}));
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_WARNING, "ignoring plugin 'disk', disabled due to boot "
                                                  "flags: nousb "}));
}

TEST_F(PluginFiltersTest, DisablingFlagsAreListedInOrderEachWithABlankBehind) {
    plugin.disablingFlags = {"nousb", "noacpi", "noapic"};
    EXPECT_TRUE(IsFilteredOut(plugin, {"nousb", "noacpi", "zz"}, {}));
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_WARNING, "ignoring plugin 'disk', disabled due to boot "
                                                  "flags: noacpi nousb "}));
}

TEST_F(PluginFiltersTest, DisablingFlagsThatAreNotSetLetPass) {
    plugin.disablingFlags = {"noacpi"};
    EXPECT_FALSE(IsFilteredOut(plugin, {"acpi", "NOACPI"}, {}));
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(PluginFiltersTest, MissingRequiredFlagsFilterOutAndAreListedInOrder) {
    plugin.requiredFlags = {"gamma", "alpha", "beta"};
    EXPECT_TRUE(IsFilteredOut(plugin, {"beta", "other"}, {}));
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_WARNING,
                                     "ignoring plugin 'disk', disabled due to missing required "
                                     "boot flags: alpha gamma "}));
}

TEST_F(PluginFiltersTest, RequiredFlagsThatAreAllSetLetPass) {
    plugin.requiredFlags = {"alpha", "beta"};
    EXPECT_FALSE(IsFilteredOut(plugin, {"alpha", "beta", "gamma"}, {}));
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(PluginFiltersTest, TheBlacklistIsAskedFirst) {
    plugin.disablingFlags = {"off"};
    plugin.requiredFlags = {"on"};
    EXPECT_TRUE(IsFilteredOut(plugin, {"off"}, {"disk"}));
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_INFO, "ignoring plugin 'disk' due to blacklist"}));
}

TEST_F(PluginFiltersTest, DisablingFlagsAreAskedBeforeRequiredOnes) {
    plugin.disablingFlags = {"off"};
    plugin.requiredFlags = {"on"};
    EXPECT_TRUE(IsFilteredOut(plugin, {"off"}, {}));
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_WARNING,
                                     "ignoring plugin 'disk', disabled due to boot flags: off "}));
}

TEST_F(PluginFiltersTest, APluginThatIsNotRunOnceNeverCountsAsRunAndIsNotRecorded) {
    plugin.pluginVersion = "1.0";
    Names record = {"disk1.0"};
    EXPECT_FALSE(HasAlreadyRun(plugin, record));
    record.clear();
    EXPECT_FALSE(HasAlreadyRun(plugin, record));
    EXPECT_THAT(record, IsEmpty());
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(PluginFiltersTest, ARunOncePluginThatIsNotInTheRecordIsRecorded) {
    plugin.runOnce = true;
    plugin.pluginVersion = "1.0";
    Names record = {"disk0.9"};
    EXPECT_FALSE(HasAlreadyRun(plugin, record));
    EXPECT_THAT(record, ElementsAre("disk0.9", "disk1.0"));
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(PluginFiltersTest, ARecordedPluginHasAlreadyRun) {
    plugin.runOnce = true;
    plugin.pluginVersion = "1.0";
    Names record = {"disk1.0"};
    EXPECT_TRUE(HasAlreadyRun(plugin, record));
    EXPECT_THAT(record, ElementsAre("disk1.0"));
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_DEBUG, "ignoring plugin 'disk' because version '1.0' has "
                                                "already been run"}));
}

TEST_F(PluginFiltersTest, TheKeyOfAPluginWithoutAVersionIsItsName) {
    plugin.runOnce = true;
    Names record = {"disk"};
    EXPECT_TRUE(HasAlreadyRun(plugin, record));
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_DEBUG, "ignoring plugin 'disk' because version '' has "
                                                "already been run"}));
}

TEST_F(PluginFiltersTest, NameAndVersionAreNotSeparatedInTheKey) {
    support::FakePlugin other("dis");
    other.runOnce = true;
    other.pluginVersion = "k1.0";
    Names record = {"disk1.0"};
    EXPECT_TRUE(HasAlreadyRun(other, record));
}

TEST_F(PluginFiltersTest, OnlyTheCharactersOfABootOptionAreRecorded) {
    std::string everyCharacter;
    for (int c = 1; c < 256; ++c) {
        everyCharacter += static_cast<char>(c);
    }
    support::FakePlugin odd("a" + everyCharacter);
    odd.runOnce = true;
    odd.pluginVersion = "\n1:0\xc3\xa9";
    Names record;
    EXPECT_FALSE(HasAlreadyRun(odd, record));
    EXPECT_THAT(record, ElementsAre("a+-.0123456789ABCDEFGHIJKLMNOPQRSTUVWXYZ"
                                    "_abcdefghijklmnopqrstuvwxyz10"));
}

TEST_F(PluginFiltersTest, APluginWithOtherCharactersIsNeverRecognised) {
    plugin.runOnce = true;
    plugin.pluginVersion = "1:0";
    Names record;
    EXPECT_FALSE(HasAlreadyRun(plugin, record));
    EXPECT_THAT(record, ElementsAre("disk10"));
    EXPECT_FALSE(HasAlreadyRun(plugin, record));
    EXPECT_THAT(record, ElementsAre("disk10"));
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(PluginFiltersTest, TheRecordIsAskedForTheRawKey) {
    plugin.runOnce = true;
    plugin.pluginVersion = "1:0";
    Names record = {"disk1:0"};
    EXPECT_TRUE(HasAlreadyRun(plugin, record));
    EXPECT_THAT(record, ElementsAre("disk1:0"));
}

TEST_F(PluginFiltersTest, AKeyWithNoUsableCharacterIsRecordedAsEmpty) {
    support::FakePlugin odd("::");
    odd.runOnce = true;
    Names record;
    EXPECT_FALSE(HasAlreadyRun(odd, record));
    EXPECT_THAT(record, ElementsAre(""));
}

}  // namespace
}  // namespace vantor
