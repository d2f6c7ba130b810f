#include "verify/RequirementCheck.h"

#include <gtest/gtest.h>

#include "analyze/model/ModelText.h"
#include "analyze/verify/FindingText.h"

namespace vantor::analyze {
namespace {

TEST(RequirementCheckTest, TellsOfABarrierThatNobodyRequires) {
    EXPECT_EQ(LinesOf(CheckRequirements, ModelOf({"a: > x", "b: > x"})),
              (Lines{"/p/a: note[unused-barrier]: no plugin requires barrier \"x\", provided by "
                     "'a' and 'b'"}));
}

TEST(RequirementCheckTest, TellsWhatImpliesARequirement) {
    BootModel model = ModelOf({"a: > x", "b: x > y", "c: y x >"});
    model.plugins[2].required[1].place = {"/p/c.json", 2, 9};
    EXPECT_EQ(
        LinesOf(CheckRequirements, model),
        (Lines{"/p/c.json:2:9: note[implied-requirement]: 'c' requires \"x\", which is always "
               "done before \"y\", which it requires too"}));
}

TEST(RequirementCheckTest, TellsOnceOfARepeatedRequirement) {
    EXPECT_EQ(LinesOf(CheckRequirements, ModelOf({"a: > x", "b: x x x >"})),
              (Lines{"/p/b: note[implied-requirement]: 'b' requires \"x\" repeatedly"}));
}

}  // namespace
}  // namespace vantor::analyze
