#ifndef VANTOR_DRIVER_TESTS_MAINDRIVERFIXTURE_H
#define VANTOR_DRIVER_TESTS_MAINDRIVERFIXTURE_H

#include <gtest/gtest.h>

#include <iostream>
#include <string>
#include <vector>

#include "support/AlertRecorder.h"
#include "support/FaultPoint.h"
#include "support/HostCalls.h"
#include "support/PrivateRoot.h"
#include "support/RunConfigReset.h"
#include "support/StreamCapture.h"
#include "support/SyslogCapture.h"

namespace vantor::support {

// Asked once for each thread that the program starts.
FaultPoint& ThreadFault();

// A host with an empty plugin directory and places for the reports, on which the whole program is
// run, but for its main().
class MainDriverTest : public ::testing::Test {
protected:
    MainDriverTest();
    ~MainDriverTest() override;

    // Runs the program with these words behind its name and returns its exit status.
    static int Run(std::vector<std::string> words);

    // As Run(), on the plugin directory of the host.
    int RunDirectory(std::vector<std::string> words = {}) const;

    void AddFile(const std::string& fileName) const { root.Write("/plugins/" + fileName, ""); }

    void WriteDebugConfig(const std::string& content) const {
        root.Write("/etc/nuvex/vantor/debug.conf", content);
    }

    bool HasRecord() const { return root.Has("/bootbank/vantorbk.gz"); }
    bool HasReport() const { return root.Has("/var/log/sysboot.log"); }

    // The lines of the report that begin with this text.
    std::vector<std::string> ReportLines(const std::string& beginning) const;

    PrivateRoot root;
    HostCalls calls;
    AlertRecorder alerts;
    SyslogCapture log;
    StreamCapture output{std::cout};
    StreamCapture errors{std::cerr};
    RunConfig& config = ResetRunConfig();
};

}  // namespace vantor::support

#endif
