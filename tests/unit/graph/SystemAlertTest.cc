#include "graph/SystemAlert.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <utility>

#include "support/AlertRecorder.h"

namespace vantor {

namespace {

using support::AlertBehaviour;
using support::AlertRecorder;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

static_assert(noexcept(RaiseSystemAlert(std::declval<const std::string&>())),
              "an alert never stops a boot");

// The host's library is never reached from here: the recorder's definitions win over its own.
TEST(SystemAlertTest, TextsReachTheHostsLibraryUnchangedAndInOrder) {
    const AlertRecorder alerts;
    RaiseSystemAlert("first\nwith a line end");
    RaiseSystemAlert("");
    RaiseSystemAlert("100%s");
    EXPECT_THAT(alerts.Texts(), ElementsAre("first\nwith a line end", "", "100%s"));
}

class RefusedSystemAlertTest : public ::testing::TestWithParam<AlertBehaviour> {};

TEST_P(RefusedSystemAlertTest, AlertIsLostAndTheCallerGoesOn) {
    const AlertRecorder alerts(GetParam());
    RaiseSystemAlert("lost");
    EXPECT_EQ(alerts.Attempts(), 1);
    EXPECT_THAT(alerts.Texts(), IsEmpty());
}

std::string BehaviourName(const ::testing::TestParamInfo<AlertBehaviour>& test) {
    switch (test.param) {
    case AlertBehaviour::ThrowStandard:
        return "StandardException";
    case AlertBehaviour::ThrowOther:
        return "SomethingElse";
    case AlertBehaviour::ThrowOnConstruction:
        return "ExceptionOfTheConstructor";
    case AlertBehaviour::Record:
        break;
    }
    return "";
}

INSTANTIATE_TEST_SUITE_P(By, RefusedSystemAlertTest,
                         ::testing::Values(AlertBehaviour::ThrowStandard,
                                           AlertBehaviour::ThrowOther,
                                           AlertBehaviour::ThrowOnConstruction),
                         BehaviourName);

}  // namespace

}  // namespace vantor
