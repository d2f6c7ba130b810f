#include "verify/NameCheck.h"

#include <gtest/gtest.h>

#include "analyze/model/ModelText.h"
#include "analyze/verify/FindingText.h"

namespace vantor::analyze {
namespace {

BootModel TwoOfOneName() {
    BootModel model = ModelOf({"a: >", "a: >", "b: >"});
    model.plugins[0].place.path = "/p/a.json";
    model.plugins[1].place.path = "/p/liba.so";
    return model;
}

TEST(NameCheckTest, FindsNothingAmongDifferentNames) {
    EXPECT_EQ(LinesOf(CheckNames, ModelOf({"a: >", "b: >"})), Lines{});
}

TEST(NameCheckTest, TellsWhereThePluginsOfOneNameAre) {
    EXPECT_EQ(LinesOf(CheckNames, TwoOfOneName()),
              (Lines{"/p/a.json: warning[duplicate-name]: 2 plugins of the name 'a': /p/a.json and "
                     "/p/liba.so"}));
}

TEST(NameCheckTest, RunOncePluginsOfOneNameAndVersionAreAnError) {
    BootModel model = TwoOfOneName();
    model.plugins[0].runOnce = model.plugins[1].runOnce = true;
    EXPECT_EQ(LinesOf(CheckNames, model),
              (Lines{"/p/a.json: error[duplicate-name]: 2 plugins of the name 'a': /p/a.json and "
                     "/p/liba.so; of run-once plugins of one name and version the boot runs only "
                     "the first that the directory lists"}));
    model.plugins[1].pluginVersion = "2";
    EXPECT_EQ(LinesOf(CheckNames, model).front().substr(0, 34),
              "/p/a.json: warning[duplicate-name]");
}

TEST(NameCheckTest, OneDebugEntryReadTwiceIsOnePlugin) {
    BootModel model = TwoOfOneName();
    for (PluginDescription& plugin : model.plugins) {
        plugin.kind = PluginKind::Debug;
        plugin.place = {"/etc/debug.conf", 3, 0};
    }
    EXPECT_EQ(LinesOf(CheckNames, model), Lines{});
    model.plugins[1].place.line = 4;
    EXPECT_EQ(LinesOf(CheckNames, model),
              (Lines{"/etc/debug.conf:3: warning[duplicate-name]: 2 plugins of the name 'a': "
                     "/etc/debug.conf:3 and /etc/debug.conf:4"}));
}

}  // namespace
}  // namespace vantor::analyze
