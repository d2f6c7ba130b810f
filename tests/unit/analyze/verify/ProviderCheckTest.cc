#include "verify/ProviderCheck.h"

#include <gtest/gtest.h>

#include "analyze/model/ModelText.h"
#include "analyze/verify/FindingText.h"

namespace vantor::analyze {
namespace {

TEST(ProviderCheckTest, FindsNothingWhereEveryBarrierIsProvided) {
    EXPECT_EQ(LinesOf(CheckProviders, ModelOf({"a: > x", "b: x >"})), Lines{});
}

TEST(ProviderCheckTest, NamesAllThatRequireAMissingBarrier) {
    EXPECT_EQ(LinesOf(CheckProviders, ModelOf({"a: gone >", "b: > storage", "c: gone >"})),
              (Lines{"/p/a: error[no-provider]: no plugin provides barrier \"gone\", required by "
                     "'a' and 'c'"}));
}

TEST(ProviderCheckTest, NamesTheBarrierThatMayHaveBeenMeant) {
    EXPECT_EQ(LinesOf(CheckProviders, ModelOf({"a: storag >", "b: > storage"})),
              (Lines{"/p/a: error[no-provider]: no plugin provides barrier \"storag\", required by "
                     "'a'; did you mean \"storage\"?"}));
}

TEST(ProviderCheckTest, DoesNotGuessNamesThatNobodyProvidesEither) {
    EXPECT_EQ(LinesOf(CheckProviders, ModelOf({"a: storag >", "b: storage >"})),
              (Lines{"/p/a: error[no-provider]: no plugin provides barrier \"storag\", required by "
                     "'a'",
                     "/p/b: error[no-provider]: no plugin provides barrier \"storage\", required "
                     "by 'b'"}));
}

TEST(ProviderCheckTest, AMissingBarrierThatNothingRunningRequiresIsANote) {
    BootModel model = ModelOf({"a: gone >"});
    Filter(model, "a");
    EXPECT_EQ(LinesOf(CheckProviders, model),
              (Lines{"/p/a: note[no-provider]: no plugin provides barrier \"gone\", required by "
                     "'a' (which does not run)"}));
}

TEST(ProviderCheckTest, StandsWhereTheFirstRunningPluginRequiresIt) {
    BootModel model = ModelOf({"a: gone >", "b: gone >"});
    Filter(model, "a");
    model.plugins[1].required[0].place = {"/p/b.json", 7, 3};
    EXPECT_EQ(LinesOf(CheckProviders, model),
              (Lines{"/p/b.json:7:3: error[no-provider]: no plugin provides barrier \"gone\", "
                     "required by 'a' and 'b'"}));
}

TEST(ProviderCheckTest, GivesTheReasonsWhyNoProviderRuns) {
    BootModel model = ModelOf({"a: > x", "b: > x", "c: x >"});
    Filter(model, "a");
    Filter(model, "b");
    PluginOf(model, "b").fateReason = "ignoring plugin 'b', disabled due to boot flags: rescue ";
    EXPECT_EQ(LinesOf(CheckProviders, model),
              (Lines{"/p/c: warning[filtered-provider]: nothing that runs provides barrier \"x\", "
                     "required by 'c': ignoring plugin 'a' due to blacklist and ignoring plugin "
                     "'b', disabled due to boot flags: rescue"}));
}

TEST(ProviderCheckTest, OneProviderThatRunsIsEnough) {
    BootModel model = ModelOf({"a: > x", "b: > x", "c: x >"});
    Filter(model, "a");
    EXPECT_EQ(LinesOf(CheckProviders, model), Lines{});
}

TEST(ProviderCheckTest, AProviderThatHasAlreadyRunIsEnough) {
    BootModel model = ModelOf({"a: > x", "c: x >"});
    PluginOf(model, "a").fate = PluginFate::AlreadyRun;
    EXPECT_EQ(LinesOf(CheckProviders, model), Lines{});
}

TEST(ProviderCheckTest, FilteredProvidersOfWhatNothingRunningRequiresAreFine) {
    BootModel model = ModelOf({"a: > x", "c: x >"});
    Filter(model, "a");
    Filter(model, "c");
    EXPECT_EQ(LinesOf(CheckProviders, model), Lines{});
}

}  // namespace
}  // namespace vantor::analyze
