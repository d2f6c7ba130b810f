// Files that are no plugins: each is skipped, becomes a system alert and is logged.

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <syslog.h>
#include <unistd.h>

#include <functional>

#include "graph/SystemAlert.h"
#include "plugins/PluginLoaderFixture.h"

namespace vantor {
namespace {

using support::LogEntry;
using support::ObjectPath;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

class PluginLoaderFailureTest : public support::PluginLoaderTest {
protected:
    // Loads the file and expects that nothing comes of it but one alert and one warning, both with
    // the text that belongs to this reason.
    void ExpectFailure(const std::string& fileName, const std::string& reason) {
        Load(fileName);
        const std::string text = "exception occurred whilst loading plugin " + fileName +
                                 ": plugin `" + PluginPath(fileName) + "' is invalid: " + reason;
        EXPECT_THAT(alerts.Texts(), ElementsAre(text));
        EXPECT_THAT(log.Entries(), ElementsAre(LogEntry{LOG_WARNING, text}));
        EXPECT_THAT(plugins, IsEmpty());
    }

    // The debug configuration is what is opened before the plugin's own file.
    static void BeforeTheObjectIsOpened(const std::function<void()>& action) {
        support::OpenFault().Before([action] {
            if (support::OpenFault().Calls() == 2) {
                action();
            }
        });
    }
};

TEST_F(PluginLoaderFailureTest, AlertsReachTheDoubleAndNeverTheMachine) {
    RaiseSystemAlert("text");
    EXPECT_THAT(alerts.Texts(), ElementsAre("text"));
}

TEST_F(PluginLoaderFailureTest, AMissingFileIsSkipped) {
    ExpectFailure("libgone.so", PluginPath("libgone.so") + ": cannot open shared object file: No "
                                                           "such file or directory");
}

TEST_F(PluginLoaderFailureTest, ADanglingLinkIsSkipped) {
    ASSERT_EQ(symlink("nowhere", PluginPath("x.so").c_str()), 0);
    ExpectFailure("x.so", PluginPath("x.so") +
                              ": cannot open shared object file: No such file or directory");
}

TEST_F(PluginLoaderFailureTest, AFileThatIsNoObjectIsSkipped) {
    root.Write("/plugins/x.so", std::string(1000, 'x'));
    ExpectFailure("x.so", PluginPath("x.so") + ": invalid ELF header");
}

TEST_F(PluginLoaderFailureTest, AFolderIsSkipped) {
    root.MakeFolder("/plugins/x.so");
    ExpectFailure("x.so", PluginPath("x.so") + ": cannot read file data: Is a directory");
}

TEST_F(PluginLoaderFailureTest, ANamedPipeIsSkippedAtOnce) {
    ASSERT_EQ(mkfifo(PluginPath("y.so").c_str(), 0600), 0);
    ExpectFailure("y.so", "not a regular file");
}

TEST_F(PluginLoaderFailureTest, AnObjectCutShortIsSkipped) {
    root.Write("/plugins/x.so", support::ReadFile(ObjectPath("first")).substr(0, 4096));
    ExpectFailure("x.so", "file is truncated (a loadable segment lies beyond its end)");
}

TEST_F(PluginLoaderFailureTest, AnObjectWithoutATableIsSkipped) {
    AddObject("x.so", "no_operations");
    ExpectFailure("x.so", PluginPath("x.so") + ": undefined symbol: operations");
}

TEST_F(PluginLoaderFailureTest, AnUnsupportedVersionIsSkipped) {
    AddObject("libnew.so", "version5");
    ExpectFailure("libnew.so", "Unsupported API version");
}

TEST_F(PluginLoaderFailureTest, ABlacklistedFileStillRaisesItsLoadError) {
    AddObject("libold.so", "version0");
    blacklist = {"old"};
    ExpectFailure("libold.so", "Unsupported API version");
}

TEST_F(PluginLoaderFailureTest, TheNextFileIsLoadedAfterABrokenOne) {
    AddObject("libold.so", "version0");
    AddObject("libgood.so", "first");
    Load("libold.so");
    Load("libgood.so");
    EXPECT_THAT(Queue(), ElementsAre("good"));
}

TEST_F(PluginLoaderFailureTest, SomethingElseThrownIsAnUnknownException) {
    AddObject("libfoo.so", "first");
    BeforeTheObjectIsOpened([] { throw 42; });
    Load("libfoo.so");
    support::OpenFault().Reset();
    const std::string text = "unknown exception occurred whilst loading plugin libfoo.so";
    EXPECT_THAT(alerts.Texts(), ElementsAre(text));
    EXPECT_THAT(log.Entries(), ElementsAre(LogEntry{LOG_WARNING, text}));
    EXPECT_THAT(plugins, IsEmpty());
}

TEST_F(PluginLoaderFailureTest, AnyStandardExceptionIsExplained) {
    AddObject("libfoo.so", "first");
    BeforeTheObjectIsOpened([] { throw std::runtime_error("odd"); });
    Load("libfoo.so");
    support::OpenFault().Reset();
    const std::string text = "exception occurred whilst loading plugin libfoo.so: odd";
    EXPECT_THAT(alerts.Texts(), ElementsAre(text));
    EXPECT_THAT(log.Entries(), ElementsAre(LogEntry{LOG_WARNING, text}));
}

TEST_F(PluginLoaderFailureTest, TheLogTakesTheTextForAFormatAndTheAlertDoesNot) {
    const std::string fileName = "lib100%%-%s-%n.so";
    AddObject(fileName, "version0");
    Load(fileName);
    const std::string middle = ": plugin `" + root.Path("/plugins/");
    EXPECT_THAT(alerts.Texts(),
                ElementsAre("exception occurred whilst loading plugin " + fileName + middle +
                            fileName + "' is invalid: Unsupported API version"));
    const std::string logged = "lib100%-%s-%n.so";
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_WARNING, "exception occurred whilst loading plugin " +
                                                      logged + middle + logged +
                                                      "' is invalid: Unsupported API version"}));
}

TEST_F(PluginLoaderFailureTest, PercentMInAFileNameIsTheTextOfAnError) {
    AddObject("lib%m.so", "version0");
    Load("lib%m.so");
    ASSERT_EQ(log.Entries().size(), 1U);
    EXPECT_THAT(log.Entries()[0].text, Not(HasSubstr("%m")));
    EXPECT_THAT(alerts.Texts()[0], HasSubstr("lib%m.so"));
}

TEST_F(PluginLoaderFailureTest, OtherMessagesTakeAFileNameAsItIs) {
    Load("100%s");
    Load("100%s.%n");
    EXPECT_THAT(
        log.Entries(),
        ElementsAre(LogEntry{LOG_WARNING, "ignoring plugin '100%s' of unspecified type..."},
                    LogEntry{LOG_WARNING, "ignoring plugin '100%s.%n' of unknown type (%n)..."}));
}

// A host whose library refuses alerts.
TEST_F(PluginLoaderFailureTest, ARefusedAlertIsLostAndTheRestGoesOn) {
    for (const support::AlertBehaviour behaviour :
         {support::AlertBehaviour::ThrowStandard, support::AlertBehaviour::ThrowOther,
          support::AlertBehaviour::ThrowOnConstruction}) {
        const support::AlertRecorder refusing(behaviour);
        Load("libgone.so");
    }
    EXPECT_EQ(log.Entries().size(), 3U);
}

}  // namespace
}  // namespace vantor
