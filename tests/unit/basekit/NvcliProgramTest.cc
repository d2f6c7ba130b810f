#include <gtest/gtest.h>

#include "basekit/CommandRunner.h"
#include "basekit/DescriptionFolder.h"

// The program itself, with the shared library as others link it.
namespace nvcli {

namespace {

using BaseKit::impl::ProcessEnd;
using BaseKit::impl::ProcessResult;
using BaseKit::impl::RunProgram;
using vantor::support::DescriptionFolder;
using vantor::support::SimpleCommand;

class NvcliProgramTest : public ::testing::Test {
protected:
    NvcliProgramTest() {
        folder.WriteCommands("a.json", SimpleCommand("ping", "\"/bin/echo\", \"pong\"") + "," +
                                           SimpleCommand("fail", "\"/bin/false\""));
    }

    ProcessResult RunHere(const std::string& word) const {
        return RunProgram({NVCLI_PROGRAM, "--directory=" + folder.Path(), word});
    }

    DescriptionFolder folder;
};

TEST_F(NvcliProgramTest, Status0IsForACommandThatSucceeds) {
    const ProcessResult result = RunHere("ping");
    EXPECT_EQ(result.end, ProcessEnd::Exited);
    EXPECT_EQ(result.code, 0);
    EXPECT_EQ(result.standardOutput.Text(), "pong\n");
    EXPECT_EQ(result.standardError.Text(), "");
}

TEST_F(NvcliProgramTest, Status1IsForACommandThatFails) {
    const ProcessResult result = RunHere("fail");
    EXPECT_EQ(result.code, 1);
    EXPECT_EQ(result.standardOutput.Text(), "");
    EXPECT_EQ(result.standardError.Text(), "nvcli: \"/bin/false\" ended with exit status 1\n");
}

TEST_F(NvcliProgramTest, Status2IsForABadCommandLine) {
    const ProcessResult result = RunHere("--what");
    EXPECT_EQ(result.code, 2);
    EXPECT_EQ(result.standardError.Text(), "nvcli: nvcli itself has no option \"--what\"; those "
                                           "of a command stand behind its words\n");
}

TEST_F(NvcliProgramTest, AFullDeviceIsAFailure) {
    const ProcessResult result =
        RunProgram({"/bin/sh", "-c", "exec \"$0\" --directory=\"$1\" > /dev/full", NVCLI_PROGRAM,
                    folder.Path()});
    EXPECT_EQ(result.code, 1);
    EXPECT_EQ(result.standardError.Text(), "nvcli: cannot write the output\n");
}

}  // namespace

}  // namespace nvcli
