#include "plugins/NativePlugin.h"

#include <dlfcn.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <syslog.h>

#include <algorithm>
#include <memory>

#include "graph/InitBarrier.h"
#include "plugins/Exceptions.h"
#include "plugins/TestObjects.h"
#include "support/ErrorText.h"
#include "support/HostCalls.h"
#include "support/RunConfigReset.h"
#include "support/SyslogCapture.h"
#include "support/TempFolder.h"

namespace vantor {
namespace {

using support::Ask;
using support::IsLoaded;
using support::LogEntry;
using support::NamesOf;
using support::ObjectPath;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

class NativePluginTest : public ::testing::Test {
protected:
    NativePluginTest() { support::ResetRunConfig(); }

    // Why the file is no plugin.
    static std::string ErrorOf(const std::string& path) {
        return support::ErrorText<InvalidPluginException>(
            [&path] { const NativePlugin plugin("broken", path); });
    }

    // What the dynamic linker has against the file, or against looking up the symbol in it.
    static std::string LinkerError(const std::string& path, const char* symbol) {
        void* const handle = dlopen(path.c_str(), RTLD_LAZY);
        if (handle == nullptr) {
            return dlerror();
        }
        dlsym(handle, symbol);
        const std::string error = dlerror();
        dlclose(handle);
        return error;
    }

    static bool BarrierExists(const std::string& name) {
        const std::list<InitBarrier*> all = InitBarrier::All();
        return std::any_of(all.begin(), all.end(),
                           [&name](const InitBarrier* barrier) { return barrier->Name() == name; });
    }

    support::SyslogCapture log;
};

TEST_F(NativePluginTest, AnObjectThatIsNotThereIsInvalidForTheLinkersReason) {
    const std::string path = ObjectPath("that_nobody_built");
    EXPECT_EQ(ErrorOf(path), "plugin `" + path + "' is invalid: " + LinkerError(path, ""));
}

TEST_F(NativePluginTest, AFileThatIsNoObjectIsInvalidForTheLinkersReason) {
    const support::TempFolder folder;
    const std::string path = folder.File("libtext.so");
    support::WriteFile(path, std::string(1000, 'x'));
    EXPECT_EQ(ErrorOf(path), "plugin `" + path + "' is invalid: " + LinkerError(path, ""));
}

TEST_F(NativePluginTest, AnObjectWithoutATableIsInvalidAndClosed) {
    const std::string path = ObjectPath("no_operations");
    EXPECT_EQ(ErrorOf(path),
              "plugin `" + path + "' is invalid: " + LinkerError(path, "operations"));
    EXPECT_FALSE(IsLoaded(path));
}

TEST_F(NativePluginTest, AnObjectWithoutADescriptionIsInvalidAndClosed) {
    const std::string path = ObjectPath("no_metadata");
    EXPECT_EQ(ErrorOf(path), "plugin `" + path + "' is invalid: " + LinkerError(path, "metadata"));
    EXPECT_FALSE(IsLoaded(path));
}

class UnsupportedVersionTest : public NativePluginTest,
                               public ::testing::WithParamInterface<int> {};

TEST_P(UnsupportedVersionTest, IsRejectedClosedAndLinkedToNothing) {
    const std::string name = "version" + std::to_string(GetParam());
    EXPECT_EQ(ErrorOf(ObjectPath(name)),
              "plugin `" + ObjectPath(name) + "' is invalid: Unsupported API version");
    EXPECT_FALSE(IsLoaded(ObjectPath(name)));
    EXPECT_FALSE(BarrierExists(name + "-need-a"));
    EXPECT_FALSE(BarrierExists(name + "-give-a"));
}

INSTANTIATE_TEST_SUITE_P(Versions, UnsupportedVersionTest, ::testing::Values(0, 5));

class SupportedVersionTest : public NativePluginTest, public ::testing::WithParamInterface<int> {
protected:
    const std::string name = "version" + std::to_string(GetParam());
    const std::unique_ptr<NativePlugin> plugin =
        std::make_unique<NativePlugin>(name, ObjectPath(name));
};

TEST_P(SupportedVersionTest, IsItsApiVersion) { EXPECT_EQ(plugin->ApiVersion(), GetParam()); }

TEST_P(SupportedVersionTest, IsLinkedToItsBarriersInOrder) {
    EXPECT_THAT(NamesOf(plugin->Dependencies()), ElementsAre(name + "-need-b", name + "-need-a"));
    EXPECT_THAT(NamesOf(plugin->Dependents()), ElementsAre(name + "-give-b", name + "-give-a"));
}

TEST_P(SupportedVersionTest, HasFlagsRunOnceAndVersionTextFromVersion3OnWhateverTheRecordHolds) {
    if (GetParam() < 3) {
        EXPECT_THAT(plugin->RequiredFlags(), IsEmpty());
        EXPECT_THAT(plugin->DisablingFlags(), IsEmpty());
        EXPECT_FALSE(plugin->RunOnce());
        EXPECT_EQ(plugin->PluginVersion(), "");
    } else {
        EXPECT_THAT(plugin->RequiredFlags(), ElementsAre("alpha", "beta"));
        EXPECT_THAT(plugin->DisablingFlags(), ElementsAre("noacpi", "nousb"));
        EXPECT_TRUE(plugin->RunOnce());
        EXPECT_EQ(plugin->PluginVersion(), "7.8");
    }
}

TEST_P(SupportedVersionTest, StartCallsTheStartEntryAlone) {
    plugin->Start();
    EXPECT_EQ(Ask(ObjectPath(name), "CallsOfStart"), 1U);
    EXPECT_EQ(Ask(ObjectPath(name), "CallsOfApply"), 0U);
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_P(SupportedVersionTest, AppliesAHostProfileFromVersion2OnEvenIfItsTableHasTheEntry) {
    EXPECT_EQ(plugin->SupportsHostProfile(), GetParam() >= 2);
    if (GetParam() < 2) {
        EXPECT_EQ(
            support::ErrorText<NotImplementedException>([this] { plugin->ApplyHostProfile(); }),
            "method `NativePlugin::ApplyHostProfile' is not implemented");
        EXPECT_EQ(Ask(ObjectPath(name), "CallsOfApply"), 0U);
    } else {
        plugin->ApplyHostProfile();
        EXPECT_EQ(Ask(ObjectPath(name), "CallsOfApply"), 1U);
    }
    EXPECT_EQ(Ask(ObjectPath(name), "CallsOfStart"), 0U);
}

INSTANTIATE_TEST_SUITE_P(Versions, SupportedVersionTest, ::testing::Values(1, 2, 3, 4));

TEST_F(NativePluginTest, NullListsAreEmptyAndANullVersionIsAnEmptyText) {
    const NativePlugin plugin("lists", ObjectPath("null_lists"));
    EXPECT_THAT(NamesOf(plugin.Dependencies()), IsEmpty());
    EXPECT_THAT(NamesOf(plugin.Dependents()), IsEmpty());
    EXPECT_THAT(plugin.RequiredFlags(), IsEmpty());
    EXPECT_THAT(plugin.DisablingFlags(), IsEmpty());
    EXPECT_EQ(plugin.PluginVersion(), "");
    EXPECT_FALSE(plugin.RunOnce());
}

TEST_F(NativePluginTest, EmptyListsAreEmpty) {
    const NativePlugin plugin("lists", ObjectPath("empty_lists"));
    EXPECT_THAT(NamesOf(plugin.Dependencies()), IsEmpty());
    EXPECT_THAT(NamesOf(plugin.Dependents()), IsEmpty());
    EXPECT_THAT(plugin.RequiredFlags(), IsEmpty());
    EXPECT_THAT(plugin.DisablingFlags(), IsEmpty());
    EXPECT_EQ(plugin.PluginVersion(), "");
}

TEST_F(NativePluginTest, ANullStartEntryDoesNothing) {
    NativePlugin plugin("idle", ObjectPath("null_methods"));
    plugin.Start();
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(NativePluginTest, ANullApplyEntryIsNotImplemented) {
    NativePlugin plugin("idle", ObjectPath("null_methods"));
    EXPECT_FALSE(plugin.SupportsHostProfile());
    EXPECT_EQ(support::ErrorText<NotImplementedException>([&plugin] { plugin.ApplyHostProfile(); }),
              "method `NativePlugin::ApplyHostProfile' is not implemented");
}

TEST_F(NativePluginTest, AStartEntryThatReturns5IsLoggedAndTheBootGoesOn) {
    NativePlugin plugin("foo", ObjectPath("failing"));
    plugin.Start();
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_ERR, "execution failure in context 'foo', returncode 5"}));
}

TEST_F(NativePluginTest, AFailureOfTheApplyEntryIsLoggedAsAnUnsignedNumber) {
    NativePlugin plugin("foo", ObjectPath("failing"));
    plugin.ApplyHostProfile();
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_ERR,
                                     "execution failure in context 'foo', returncode 4294967295"}));
}

TEST_F(NativePluginTest, RunCountsAFailedStartAsRun) {
    support::HostCalls calls;
    calls.times = {{10, 0}, {20, 0}};
    NativePlugin plugin("foo", ObjectPath("failing"));
    RunConfig::Instance().method = "start";  // no look at the host's profile
    plugin.Run();
    EXPECT_EQ(plugin.EndTime().tv_sec, 20);
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_ERR, "execution failure in context 'foo', returncode 5"}));
}

TEST_F(NativePluginTest, WhatAnEntryThrowsComesThrough) {
    NativePlugin plugin("foo", ObjectPath("throwing"));
    EXPECT_EQ(support::ErrorText<std::runtime_error>([&plugin] { plugin.Start(); }), "no disk");
    EXPECT_THROW(plugin.ApplyHostProfile(), int);
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(NativePluginTest, TwoPluginsWithAMethodOfTheSameNameRunTheirOwn) {
    NativePlugin first("first", ObjectPath("first"));
    NativePlugin second("second", ObjectPath("second"));
    second.Start();
    EXPECT_EQ(Ask(ObjectPath("first"), "CallsOfStart"), 0U);
    EXPECT_EQ(Ask(ObjectPath("second"), "CallsOfStart"), 1U);
    first.Start();
    EXPECT_EQ(Ask(ObjectPath("first"), "CallsOfStart"), 1U);
    EXPECT_EQ(Ask(ObjectPath("second"), "CallsOfStart"), 1U);
}

TEST_F(NativePluginTest, TheObjectIsClosedWithThePlugin) {
    {
        const NativePlugin plugin("first", ObjectPath("first"));
        EXPECT_TRUE(IsLoaded(ObjectPath("first")));
    }
    EXPECT_FALSE(IsLoaded(ObjectPath("first")));
}

TEST_F(NativePluginTest, SymbolsAreBoundWhenTheyAreNeeded) {
    NativePlugin plugin("lazy", ObjectPath("unresolved"));
    plugin.Start();
    EXPECT_EQ(Ask(ObjectPath("unresolved"), "CallsOfStart"), 1U);
}

TEST_F(NativePluginTest, ExportedSymbolsAreSeenByTheWholeProcess) {
    EXPECT_EQ(dlsym(RTLD_DEFAULT, "SeenByTheWholeProcess"), nullptr);
    const NativePlugin plugin("lazy", ObjectPath("unresolved"));
    EXPECT_NE(dlsym(RTLD_DEFAULT, "SeenByTheWholeProcess"), nullptr);
}

class LanguageTest : public NativePluginTest, public ::testing::WithParamInterface<std::string> {};

TEST_P(LanguageTest, APluginWrittenInItIsLoadedAndRun) {
    const std::string path = ObjectPath(GetParam());
    NativePlugin plugin("polyglot", path);
    EXPECT_EQ(plugin.ApiVersion(), 4);
    EXPECT_THAT(NamesOf(plugin.Dependencies()), ElementsAre("every-language-need"));
    EXPECT_THAT(NamesOf(plugin.Dependents()), ElementsAre("every-language-give"));
    EXPECT_EQ(plugin.PluginVersion(), "1.0");
    EXPECT_TRUE(plugin.RunOnce());
    EXPECT_THAT(plugin.RequiredFlags(), ElementsAre("flag"));
    EXPECT_THAT(plugin.DisablingFlags(), IsEmpty());
    plugin.Start();
    plugin.ApplyHostProfile();
    EXPECT_EQ(Ask(path, "CallsOfStart"), 1U);
    EXPECT_EQ(Ask(path, "CallsOfApply"), 1U);
}

INSTANTIATE_TEST_SUITE_P(Languages, LanguageTest,
                         ::testing::Values("in_c11", "in_cxx11", "in_cxx17", "in_cxx20"));

}  // namespace
}  // namespace vantor
