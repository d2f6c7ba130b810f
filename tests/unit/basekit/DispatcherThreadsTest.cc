#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <thread>

#include "basekit/CommandNamespace.h"
#include "basekit/DispatcherFixture.h"

// Eight plugins run their commands at once on the one dispatcher of the process.
namespace BaseKit::AutoCli {

namespace {

using ::testing::Each;
using ::testing::ElementsAre;
using vantor::support::DescriptionFolder;
using vantor::support::DispatcherFixture;
using vantor::support::Executed;
using vantor::support::ExecuteLine;
using vantor::support::SimpleCommand;

constexpr int threadCount = 8;
constexpr int rounds = 10;

class DispatcherThreadsTest : public DispatcherFixture {
protected:
    // Calls `body` with the numbers from 0 on in a thread each, and waits for them all.
    template <typename Body>
    static void InEightThreads(Body body) {
        std::vector<std::thread> threads;
        threads.reserve(threadCount);
        for (int number = 0; number < threadCount; ++number) {
            threads.emplace_back([body, number] { body(number); });
        }
        for (std::thread& thread : threads) {
            thread.join();
        }
    }

    void MakeFifo(const std::string& name) const {
        ASSERT_EQ(mkfifo(folder.File(name).c_str(), 0600), 0);
    }

    std::string Quoted(const std::string& name) const { return "\"" + folder.File(name) + "\""; }
};

TEST_F(DispatcherThreadsTest, EachThreadHearsOfItsOwnCommand) {
    Know(R"({"path": "run", "summary": "Runs", "options": [
                {"name": "number", "kind": "integer"}], "execute":
                ["/bin/sh", "-c", "echo out $$1; echo error $$1 >&2; exit $$1", "sh",
                 "${number}"]})");
    std::vector<std::vector<Executed>> results(threadCount);
    InEightThreads([&](int number) {
        for (int round = 0; round < rounds; ++round) {
            results[static_cast<std::size_t>(number)].push_back(
                ExecuteLine(dispatcher, "run --number=" + std::to_string(number)));
        }
    });
    for (int number = 0; number < threadCount; ++number) {
        const std::string text = std::to_string(number);
        std::vector<std::string> expected;
        if (number != 0) {
            expected.push_back("\"/bin/sh\" ended with exit status " + text + ": error " + text);
        }
        for (const Executed& executed : results[static_cast<std::size_t>(number)]) {
            EXPECT_EQ(executed.output, "out " + text + "\n");
            EXPECT_EQ(executed.errors, expected);
        }
    }
}

// Every run has pipes open while others start theirs.
TEST_F(DispatcherThreadsTest, NoCommandInheritsTheDescriptorsOfAnother) {
    Know(SimpleCommand("list", "\"/bin/ls\", \"/proc/self/fd\""));
    std::vector<std::vector<std::string>> outputs(threadCount);
    InEightThreads([&](int number) {
        for (int round = 0; round < rounds; ++round) {
            outputs[static_cast<std::size_t>(number)].push_back(
                ExecuteLine(dispatcher, "list").output);
        }
    });
    EXPECT_THAT(outputs, Each(Each("0\n1\n2\n3\n")));
}

// Seven commands wait for what the eighth brings: with a lock around them nobody would go on.
TEST_F(DispatcherThreadsTest, ACommandThatWaitsKeepsNoOtherFromRunning) {
    std::string commands;
    for (int number = 1; number < threadCount; ++number) {
        const std::string name = std::to_string(number);
        MakeFifo(name);
        commands += SimpleCommand("wait" + name, "\"/bin/cat\", " + Quoted(name)) + ",";
    }
    Know(commands +
         SimpleCommand("release", R"("/bin/sh", "-c",
        "for fifo do echo go > $$fifo; done", "sh", )" +
                                      Quoted("1") + "," + Quoted("2") + "," + Quoted("3") + "," +
                                      Quoted("4") + "," + Quoted("5") + "," + Quoted("6") + "," +
                                      Quoted("7")));
    std::vector<std::string> outputs(threadCount);
    InEightThreads([&](int number) {
        const std::string line = number == 0 ? "release" : "wait" + std::to_string(number);
        outputs[static_cast<std::size_t>(number)] = ExecuteLine(dispatcher, line).output;
    });
    EXPECT_THAT(outputs, ElementsAre("", "go\n", "go\n", "go\n", "go\n", "go\n", "go\n", "go\n"));
}

TEST_F(DispatcherThreadsTest, ADirectoryMayBeAddedWhileACommandRuns) {
    MakeFifo("1");
    Know(SimpleCommand("wait", "\"/bin/cat\", " + Quoted("1")));
    const DescriptionFolder second;
    second.WriteCommands("release.json", SimpleCommand("release", R"("/bin/sh", "-c",
        "echo go > $$0", )" + Quoted("1")));

    std::string waited;
    std::thread waiting([&] { waited = ExecuteLine(dispatcher, "wait").output; });
    dispatcher.AddExternalDirectory(second.Path());
    OutputOf("release");
    waiting.join();
    EXPECT_EQ(waited, "go\n");
}

// A host may be asked for help while it boots.
TEST_F(DispatcherThreadsTest, CommandsMayBeForgottenAndListedWhileOthersExecute) {
    Know(SimpleCommand("ping", "\"/bin/echo\", \"pong\""));
    InEightThreads([this](int number) {
        for (int round = 0; round < rounds; ++round) {
            if (number == 0) {
                dispatcher.ResetRegistrations();
                dispatcher.RegisterPlugin(folder.File("known.json"));
            } else if (number == 1) {
                EXPECT_LE(dispatcher.GetRootNamespace()->commands.size(), 1U);
            } else {
                const Executed executed = ExecuteLine(dispatcher, "ping");
                EXPECT_TRUE(executed.output == "pong\n" ||
                            executed.errors.at(0) ==
                                "unknown command \"ping\"; no command is known at all");
            }
        }
    });
    EXPECT_EQ(OutputOf("ping"), "pong\n");
}

}  // namespace

}  // namespace BaseKit::AutoCli
