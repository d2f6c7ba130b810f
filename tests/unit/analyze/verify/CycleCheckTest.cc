#include "verify/CycleCheck.h"

#include <gtest/gtest.h>

#include "analyze/model/ModelText.h"
#include "analyze/verify/FindingText.h"

namespace vantor::analyze {
namespace {

TEST(CycleCheckTest, FindsNothingInAGraphWithoutCycles) {
    EXPECT_EQ(LinesOf(CheckCycles, ModelOf({"a: > x", "b: x > y", "c: x y >"})), Lines{});
}

TEST(CycleCheckTest, TellsEachEdgeWithThePluginThatMakesIt) {
    EXPECT_EQ(
        LinesOf(CheckCycles, ModelOf({"a: y > x", "b: x > y"})),
        (Lines{"/p/a: error[cycle]: the boot never ends: dependency cycle of 2 plugins: 'a' "
               "provides \"x\", which 'b' requires; 'b' provides \"y\", which 'a' requires"}));
}

TEST(CycleCheckTest, TellsOfAPluginThatWaitsForItself) {
    EXPECT_EQ(LinesOf(CheckCycles, ModelOf({"a: x > x"})),
              (Lines{"/p/a: error[cycle]: the boot never ends: dependency cycle of 1 plugin: 'a' "
                     "provides \"x\", which it requires itself"}));
}

TEST(CycleCheckTest, TellsHowManyPluginsAreEntangled) {
    EXPECT_EQ(LinesOf(CheckCycles, ModelOf({"a: z > x", "b: x v > y", "c: y > z v"})),
              (Lines{"/p/b: error[cycle]: the boot never ends: dependency cycle of 2 plugins, a "
                     "shortest of the cycles among 3 plugins: 'b' provides \"y\", which 'c' "
                     "requires; 'c' provides \"v\", which 'b' requires"}));
}

TEST(CycleCheckTest, StandsWhereTheFirstPluginRequiresTheLastBarrier) {
    BootModel model = ModelOf({"a: y > x", "b: x > y"});
    model.plugins[0].required[0].place = {"/p/a.json", 4, 15};
    EXPECT_EQ(LinesOf(CheckCycles, model).front().substr(0, 25), "/p/a.json:4:15: error[cyc");
}

TEST(CycleCheckTest, ACycleThroughAPluginThatDoesNotRunIsANote) {
    BootModel model = ModelOf({"a: y > x", "b: x > y"});
    Filter(model, "b");
    EXPECT_EQ(LinesOf(CheckCycles, model),
              (Lines{"/p/a: note[open-cycle]: other boots would never end: dependency cycle of 2 "
                     "plugins: 'a' provides \"x\", which 'b' requires; 'b' provides \"y\", which "
                     "'a' requires; in this one: ignoring plugin 'b' due to blacklist"}));
}

}  // namespace
}  // namespace vantor::analyze
