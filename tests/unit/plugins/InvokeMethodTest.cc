#include "plugins/InvokeMethod.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <iostream>

#include "plugins/Exceptions.h"
#include "plugins/FakePlugin.h"
#include "support/StreamCapture.h"
#include "support/SyslogCapture.h"

namespace vantor {
namespace {

using ::testing::IsEmpty;

class InvokeMethodTest : public ::testing::Test {
protected:
    support::SyslogCapture log;
    support::StreamCapture errors{std::cerr};
    support::StreamCapture output{std::cout};
    support::FakePlugin plugin{"disk"};
};

TEST_F(InvokeMethodTest, StartCallsStart) {
    EXPECT_TRUE(InvokeMethod(plugin, "start"));
    EXPECT_EQ(plugin.starts, 1);
    EXPECT_EQ(plugin.applications, 0);
}

TEST_F(InvokeMethodTest, ApplyHostProfileIsCalledWhetherOrNotThePluginSupportsIt) {
    plugin.supportsHostProfile = false;
    EXPECT_TRUE(InvokeMethod(plugin, "apply_host_profile"));
    EXPECT_EQ(plugin.starts, 0);
    EXPECT_EQ(plugin.applications, 1);
}

TEST_F(InvokeMethodTest, AnyOtherNameDoesNothingAndSucceedsQuietly) {
    for (const char* name : {"stop", "Start", "start ", "", "apply-host-profile"}) {
        EXPECT_TRUE(InvokeMethod(plugin, name)) << name;
    }
    EXPECT_EQ(plugin.starts + plugin.applications, 0);
    EXPECT_EQ(errors.Text() + output.Text(), "");
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(InvokeMethodTest, AStandardExceptionIsExplainedOnStandardError) {
    plugin.onStart = [] { throw std::runtime_error("no disk"); };
    EXPECT_FALSE(InvokeMethod(plugin, "start"));
    EXPECT_EQ(errors.Text(), "unable to invoke method 'start' on plugin 'disk': no disk\n");
    EXPECT_EQ(output.Text(), "");
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(InvokeMethodTest, AMethodThatIsNotImplementedIsExplainedOnStandardError) {
    plugin.onApply = [] { throw NotImplementedException("DebugPlugin::ApplyHostProfile"); };
    EXPECT_FALSE(InvokeMethod(plugin, "apply_host_profile"));
    EXPECT_EQ(errors.Text(), "unable to invoke method 'apply_host_profile' on plugin 'disk': "
                             "method `DebugPlugin::ApplyHostProfile' is not implemented\n");
}

TEST_F(InvokeMethodTest, AnythingElseThrownIsUnknown) {
    plugin.onStart = [] { throw 42; };
    EXPECT_FALSE(InvokeMethod(plugin, "start"));
    EXPECT_EQ(errors.Text(),
              "unknown exception whilst attempting to execute method 'start' on plugin 'disk'\n");
    EXPECT_THAT(log.Entries(), IsEmpty());
}

}  // namespace
}  // namespace vantor
