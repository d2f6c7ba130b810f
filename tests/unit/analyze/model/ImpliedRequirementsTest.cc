#include "model/ImpliedRequirements.h"

#include <gtest/gtest.h>

#include <set>
#include <string>
#include <vector>

#include "analyze/model/ModelText.h"

namespace vantor::analyze {
namespace {

using Texts = std::vector<std::string>;

Texts ImpliedIn(const BootModel& model) {
    Texts texts;
    const ImpliedRequirements requirements =
        FindImpliedRequirements(BootGraph(model, GraphScope::All));
    EXPECT_EQ(requirements.endedAt, "");
    for (const ImpliedRequirement& one : requirements.found) {
        texts.push_back(model.plugins[one.plugin].name + ": " + one.barrier + " by " +
                        one.impliedBy);
    }
    return texts;
}

TEST(ImpliedRequirementsTest, AreThoseThatAnotherOneWaitsFor) {
    EXPECT_EQ(ImpliedIn(ModelOf({"a: > x", "b: x > y", "c: x y >"})), (Texts{"c: x by y"}));
}

TEST(ImpliedRequirementsTest, AreFoundOverManySteps) {
    EXPECT_EQ(ImpliedIn(ModelOf({"a: > w", "b: w > x", "c: x > y", "d: y > z", "e: w z >"})),
              (Texts{"e: w by z"}));
}

TEST(ImpliedRequirementsTest, NoneBySiblings) {
    EXPECT_EQ(ImpliedIn(ModelOf({"a: > x", "b: > y", "c: x y >"})), Texts{});
}

TEST(ImpliedRequirementsTest, AlsoByOneOfSeveralProviders) {
    EXPECT_EQ(ImpliedIn(ModelOf({"a: > x", "b: x > y", "c: > y", "d: x y >"})),
              (Texts{"d: x by y"}));
}

TEST(ImpliedRequirementsTest, NoneThroughAPluginThatOtherBootsLeaveOut) {
    BootModel model = ModelOf({"a: > x", "b: x > y", "c: x y >"});
    PluginDescription& between = PluginOf(model, "b");
    between.disablingFlags = {"rescue"};
    EXPECT_EQ(ImpliedIn(model), Texts{});
    between.disablingFlags.clear();
    between.requiredFlags = {"full"};
    EXPECT_EQ(ImpliedIn(model), Texts{});
    between.requiredFlags.clear();
    between.runOnce = true;
    EXPECT_EQ(ImpliedIn(model), Texts{});
    between.runOnce = false;
    Filter(model, "b");
    EXPECT_EQ(ImpliedIn(model), Texts{});
}

TEST(ImpliedRequirementsTest, NoneOnACycle) {
    EXPECT_EQ(ImpliedIn(ModelOf({"a: y > x", "b: x > y", "c: x y >"})), Texts{});
}

// What the requirements of a plugin wait for, by walking back from each.
std::set<std::string> Behind(const BootModel& model, const std::string& barrier) {
    std::set<std::string> found;
    Texts open{barrier};
    while (!open.empty()) {
        const Barrier& links = model.barriers.at(open.back());
        open.pop_back();
        for (const std::size_t provider : links.providers) {
            for (const BarrierName& required : model.plugins[provider].required) {
                if (found.insert(required.name).second) {
                    open.push_back(required.name);
                }
            }
        }
    }
    return found;
}

// Without cycles: barriers are provided by plugins that require lower ones.
BootModel RandomTiers(std::uint32_t seed, std::size_t barriers) {
    BootModel model = RandomModel(seed, barriers, barriers, 4);
    for (std::size_t i = 0; i < model.plugins.size(); ++i) {
        PluginDescription& plugin = model.plugins[i];
        plugin.provided = {{"b" + std::to_string(i), {}}};
        for (BarrierName& required : plugin.required) {
            const std::size_t number = std::stoul(required.name.substr(1));
            required.name = i == 0 ? "base" : "b" + std::to_string(number % i);
        }
    }
    model.LinkBarriers();
    return model;
}

void ExpectImpliedOf(const BootModel& model) {
    std::set<std::string> expected;
    for (const PluginDescription& plugin : model.plugins) {
        for (const BarrierName& later : plugin.required) {
            for (const std::string& name : Behind(model, later.name)) {
                for (const BarrierName& required : plugin.required) {
                    if (required.name == name) {
                        expected.insert(plugin.name + ": " + name);
                    }
                }
            }
        }
    }
    std::set<std::string> found;
    for (const std::string& text : ImpliedIn(model)) {
        EXPECT_TRUE(found.insert(text.substr(0, text.find(" by "))).second) << text;
        const std::string barrier =
            text.substr(text.find(": ") + 2, text.find(" by ") - text.find(": ") - 2);
        EXPECT_EQ(Behind(model, text.substr(text.find(" by ") + 4)).count(barrier), 1U) << text;
    }
    EXPECT_EQ(found, expected);
}

TEST(ImpliedRequirementsTest, AreThoseOfAnIndependentCheckOnRandomGraphs) {
    for (std::uint32_t seed = 0; seed < 100; ++seed) {
        SCOPED_TRACE("seed " + std::to_string(seed));
        ExpectImpliedOf(RandomTiers(seed, 1 + seed % 40));
    }
}

TEST(ImpliedRequirementsTest, AreFoundInGraphsThatTakeSeveralPasses) {
    ExpectImpliedOf(RandomTiers(1, 2500));
}

TEST(ImpliedRequirementsTest, AnEndedSearchSaysWhere) {
    const BootModel model = ModelOf({"a: > x", "b: x > y", "c: x y >"});
    const ImpliedRequirements requirements =
        FindImpliedRequirements(BootGraph(model, GraphScope::All), 1);
    EXPECT_TRUE(requirements.found.empty());
    EXPECT_EQ(requirements.endedAt, "x");
}

}  // namespace
}  // namespace vantor::analyze
