// What a JSON plugin does when it is run.

#include <gmock/gmock.h>
#include <syslog.h>

#include <stdexcept>

#include "json/BaseKitDouble.h"
#include "json/JSONPluginFixture.h"
#include "support/SyslogCapture.h"

namespace vantor {

namespace {

using support::BaseKitDouble;
using support::DocumentText;
using support::ErrorText;
using support::GivenCommand;
using support::LogEntry;
using support::ParsedLine;
using support::SyslogCapture;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

class JSONPluginMethodsTest : public support::JSONPluginFixture {
protected:
    std::unique_ptr<JSONPlugin> LoadCommands(const std::string& version, const std::string& start,
                                             const std::string& hostProfile) const {
        DocumentText document;
        document.metadata["version"] = version;
        document.operations["start"] = start;
        document.operations["apply_host_profile"] = hostProfile;
        return Load(document);
    }

    // The command words that the framework was given, in order.
    std::vector<std::string> Executed() const {
        std::vector<std::string> words;
        for (const GivenCommand& command : framework.Executed()) {
            words.push_back(command.path.front());
        }
        return words;
    }

    BaseKitDouble framework;
    const SyslogCapture log;
};

TEST_F(JSONPluginMethodsTest, StartRunsItsCommandsInDocumentOrder) {
    LoadCommands("3", R"(["c", "a", "b", "a"])", R"(["other"])")->Start();
    EXPECT_THAT(Executed(), ElementsAre("c", "a", "b", "a"));
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(JSONPluginMethodsTest, StartWithoutCommandsDoesNothing) {
    LoadCommands("3", "[]", R"(["other"])")->Start();
    EXPECT_THAT(framework.Calls(), IsEmpty());
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(JSONPluginMethodsTest, StartRunsEveryCommandEachTime) {
    const auto plugin = LoadCommands("1", R"(["a"])", "[]");
    plugin->Start();
    plugin->Start();
    EXPECT_THAT(Executed(), ElementsAre("a", "a"));
}

TEST_F(JSONPluginMethodsTest, FailedCommandKeepsNoOtherFromRunning) {
    framework.execute = [](const GivenCommand& command) {
        return command.path.front() == "b" ? std::vector<std::string>{"one", "two"}
                                           : std::vector<std::string>();
    };
    LoadCommands("3", R"(["a", "b", "c"])", "[]")->Start();
    EXPECT_THAT(Executed(), ElementsAre("a", "b", "c"));
    EXPECT_THAT(
        log.Entries(),
        ElementsAre(LogEntry{LOG_ERR, "execution of 'b' failed in context netcfg[start]': one"},
                    LogEntry{LOG_ERR, "execution of 'b' failed in context netcfg[start]': two"}));
}

TEST_F(JSONPluginMethodsTest, CommandThatDoesNotParseKeepsNoOtherFromRunning) {
    framework.parse = [](const std::string& line) {
        ParsedLine parsed;
        parsed.path = {line};
        parsed.errors =
            line == "b" ? std::vector<std::string>{"one", "two"} : std::vector<std::string>();
        return parsed;
    };
    LoadCommands("3", R"(["a", "b", "c"])", "[]")->Start();
    EXPECT_THAT(Executed(), ElementsAre("a", "c"));
    EXPECT_THAT(
        log.Entries(),
        ElementsAre(
            LogEntry{LOG_ERR, "unable to parse 'start' commands in context 'netcfg': one"},
            LogEntry{LOG_ERR, "unable to parse 'start' commands in context 'netcfg': two"}));
}

TEST_F(JSONPluginMethodsTest, CommandWithNothingToExecuteIsPassedOver) {
    framework.parse = [](const std::string& line) {
        ParsedLine parsed;
        parsed.path = {line};
        parsed.nothingToExecute = line.empty();
        return parsed;
    };
    LoadCommands("3", R"(["a", "", "c"])", "[]")->Start();
    EXPECT_THAT(Executed(), ElementsAre("a", "c"));
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(JSONPluginMethodsTest, ExceptionOfTheFrameworkSkipsTheCommandsThatAreLeft) {
    framework.onCall = [](const std::string& call) {
        if (call == "dispatcher: execute b") {
            throw std::runtime_error("the framework's own");
        }
    };
    const auto plugin = LoadCommands("3", R"(["a", "b", "c"])", R"(["b", "d"])");
    EXPECT_EQ(ErrorText<std::runtime_error>([&plugin] { plugin->Start(); }), "the framework's own");
    EXPECT_THAT(Executed(), ElementsAre("a", "b"));
    EXPECT_EQ(ErrorText<std::runtime_error>([&plugin] { plugin->ApplyHostProfile(); }),
              "the framework's own");
    EXPECT_THAT(Executed(), ElementsAre("a", "b", "b"));
    EXPECT_EQ(framework.LiveObjects(), 0);
}

TEST_F(JSONPluginMethodsTest, ApplyHostProfileRunsItsOwnCommandsInDocumentOrder) {
    for (const std::string version : {"2", "3", "4"}) {
        LoadCommands(version, R"(["other"])", R"(["b", "a"])")->ApplyHostProfile();
    }
    EXPECT_THAT(Executed(), ElementsAre("b", "a", "b", "a", "b", "a"));
}

TEST_F(JSONPluginMethodsTest, ApplyHostProfileIsNamedInTheMessages) {
    framework.parse = [](const std::string& line) {
        ParsedLine parsed;
        parsed.path = {line};
        parsed.errors = line == "b" ? std::vector<std::string>{"one"} : std::vector<std::string>();
        return parsed;
    };
    framework.execute = [](const GivenCommand&) { return std::vector<std::string>{"two"}; };
    LoadCommands("2", "[]", R"(["a", "b"])")->ApplyHostProfile();
    EXPECT_THAT(
        log.Entries(),
        ElementsAre(
            LogEntry{LOG_ERR,
                     "execution of 'a' failed in context netcfg[apply host profile]': two"},
            LogEntry{LOG_ERR,
                     "unable to parse 'apply host profile' commands in context 'netcfg': one"}));
}

TEST_F(JSONPluginMethodsTest, ApplyHostProfileOfVersionOneIsNotImplemented) {
    const auto plugin = LoadCommands("1", "[]", R"(["a"])");
    EXPECT_EQ(ErrorText<NotImplementedException>([&plugin] { plugin->ApplyHostProfile(); }),
              "method `json_plugin::ApplyHostProfile' is not implemented");
    EXPECT_THAT(framework.Calls(), IsEmpty());
}

TEST_F(JSONPluginMethodsTest, ApplyHostProfileWithoutCommandsDoesNothing) {
    DocumentText document;
    document.metadata["version"] = "2";
    document.operations.erase("apply_host_profile");
    Load(document)->ApplyHostProfile();
    LoadCommands("3", "[]", "[]")->ApplyHostProfile();
    EXPECT_THAT(framework.Calls(), IsEmpty());
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(JSONPluginMethodsTest, HostProfileIsSupportedFromVersionTwoWithACommand) {
    EXPECT_FALSE(LoadCommands("1", "[]", R"(["a"])")->SupportsHostProfile());
    for (const std::string version : {"2", "3", "4"}) {
        EXPECT_TRUE(LoadCommands(version, "[]", R"(["a"])")->SupportsHostProfile()) << version;
        EXPECT_FALSE(LoadCommands(version, R"(["a"])", "[]")->SupportsHostProfile()) << version;
    }
    DocumentText document;
    document.operations.erase("apply_host_profile");
    EXPECT_FALSE(Load(document)->SupportsHostProfile());
}

}  // namespace

}  // namespace vantor
