#include "verify/Explanation.h"

#include <gtest/gtest.h>

#include <sstream>
#include <stdexcept>
#include <string>

#include "analyze/model/ModelText.h"

namespace vantor::analyze {
namespace {

std::string ExplanationOf(const BootModel& model, const std::string& name) {
    std::ostringstream stream;
    Explain(model, {}, name, stream, false);
    return stream.str();
}

BootModel Host() {
    return ModelOf({"disks: > storage", "nics: > nics", "network: nics storage > network",
                    "clock: network >", "firewall: network > firewall"});
}

TEST(ExplanationTest, OfAPlugin) {
    EXPECT_EQ(ExplanationOf(Host(), "network"),
              "plugin 'network'\n"
              "  comes from        /p/network, a native plugin\n"
              "  runs              yes\n"
              "  waits for         \"nics\", provided by 'nics'\n"
              "                    \"storage\", provided by 'disks'\n"
              "  provides          \"network\", required by 'clock' and 'firewall'\n"
              "  in all            waits for 2 plugins; 2 plugins wait for it\n"
              "  were it disabled  'clock' and 'firewall' would be left waiting for nothing at "
              "\"network\"\n"
              "\n"
              "barrier \"network\"\n"
              "  provided by       'network', /p/network\n"
              "  required by       'clock' and 'firewall'\n"
              "  is reached        yes\n"
              "  in all            waits for 3 plugins; 2 plugins wait for it\n"
              "  as it is          were 'network' disabled, 'clock' and 'firewall' would be left "
              "waiting for nothing\n");
}

TEST(ExplanationTest, OfAPluginThatWaitsForNothing) {
    EXPECT_EQ(ExplanationOf(ModelOf({"a: >"}), "a"),
              "plugin 'a'\n"
              "  comes from        /p/a, a native plugin\n"
              "  runs              yes\n"
              "  waits for         nothing\n"
              "  provides          nothing\n"
              "  in all            waits for 0 plugins; 0 plugins wait for it\n"
              "  were it disabled  nobody would be left waiting for nothing\n");
}

TEST(ExplanationTest, OfAFilteredPlugin) {
    BootModel model = Host();
    Filter(model, "network");
    PluginDescription& plugin = PluginOf(model, "network");
    plugin.kind = PluginKind::Json;
    plugin.requiredFlags = {"a", "b"};
    plugin.disablingFlags = {"c"};
    plugin.runOnce = true;
    plugin.pluginVersion = "2";
    const std::string text = ExplanationOf(model, "network");
    EXPECT_EQ(text.substr(0, text.find("\n\n") + 1),
              "plugin 'network'\n"
              "  comes from        /p/network, a JSON plugin\n"
              "  is to run         only with the boot flags 'a' and 'b'\n"
              "                    not with any of the boot flags 'c'\n"
              "                    once for each of its versions, this being '2'\n"
              "  runs              no: ignoring plugin 'network' due to blacklist\n"
              "  waits for         \"nics\", provided by 'nics'\n"
              "                    \"storage\", provided by 'disks'\n"
              "  provides          \"network\", required by 'clock' and 'firewall'\n"
              "  as it is          'clock' and 'firewall' are left waiting for nothing at "
              "\"network\"\n");
}

TEST(ExplanationTest, OfWhatWaitsForACycle) {
    const BootModel model = ModelOf({"a: y > x", "b: x > y", "c: y > z", "d: z >"});
    EXPECT_NE(ExplanationOf(model, "a")
                  .find("  runs              never: it waits for itself, on a dependency cycle\n"),
              std::string::npos);
    EXPECT_NE(ExplanationOf(model, "d")
                  .find("  runs              never: it waits for 'a', which "
                        "is on a dependency cycle\n"),
              std::string::npos);
    EXPECT_NE(ExplanationOf(model, "z")
                  .find("  is reached        never: it waits for 'a', which "
                        "is on a dependency cycle\n"),
              std::string::npos);
}

TEST(ExplanationTest, OfABarrierThatNobodyProvides) {
    EXPECT_EQ(ExplanationOf(ModelOf({"a: gone >"}), "gone"),
              "barrier \"gone\"\n"
              "  provided by       nobody\n"
              "  required by       'a'\n"
              "  is reached        at once, with a system alert when somebody requires it\n"
              "  in all            waits for 0 plugins; 1 plugin waits for it\n"
              "  as it is          'a' is left waiting for nothing\n");
}

TEST(ExplanationTest, OfABarrierWithTwoProviders) {
    const BootModel model = ModelOf({"a: > x", "b: > x", "c: x >"});
    EXPECT_NE(ExplanationOf(model, "x")
                  .find("  as it is          no single plugin's disabling "
                        "would leave anybody waiting for nothing\n"),
              std::string::npos);
    EXPECT_NE(ExplanationOf(model, "a")
                  .find("  were it disabled  nobody would be left waiting for nothing\n"),
              std::string::npos);
}

TEST(ExplanationTest, OfEveryPluginOfTheName) {
    const std::string text = ExplanationOf(ModelOf({"a: >", "a: > x"}), "a");
    EXPECT_NE(text.find("plugin 'a'\n", 1), std::string::npos);
}

TEST(ExplanationTest, OfAnUnknownNameHasTheNearestNames) {
    EXPECT_EQ(UnknownName(Host(), {}, "netwrok"),
              "no plugin and no barrier has the name 'netwrok'; did you mean plugin 'network' or "
              "barrier \"network\"?");
    EXPECT_EQ(UnknownName(Host(), {}, "disk"),
              "no plugin and no barrier has the name 'disk'; did you mean plugin 'disks'?");
    EXPECT_EQ(UnknownName(Host(), {}, "xyz"), "no plugin and no barrier has the name 'xyz'");
}

TEST(ExplanationTest, OfAPluginThatWasNotLoadedIsTheReason) {
    const Findings findings = {
        {Severity::Error, "rejected", {"/p/libbad.so", 0, 0}, "no metadata"}};
    std::ostringstream stream;
    try {
        Explain(Host(), findings, "bad", stream, false);
        FAIL() << "it was explained: " << stream.str();
    } catch (const std::runtime_error& error) {
        EXPECT_STREQ(error.what(),
                     "no plugin and no barrier has the name 'bad'; /p/libbad.so: no metadata");
    }
}

}  // namespace
}  // namespace vantor::analyze
