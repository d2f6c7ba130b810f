#include "driver/Usage.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <iostream>
#include <sstream>
#include <vector>

#include "support/StreamCapture.h"

namespace vantor {
namespace {

const std::vector<std::string> expected = {
    " -h,--help                  display this help message",
    "    --init                  run in init mode (this will cause nvsyslog to be",
    "                            launched, and the start method to be invoked on the",
    "                            plugins)",
    "    --invoke                run a particular method from the plugin's function",
    "                            pointer table (requires --method)",
    "    --method=<method>       specifies the method identifier",
    "    --plugin=<plugin>[,<plugin>]",
    "                            comma separated list of plugins to load (note that ",
    "                            this will prevent the loading of all plugins, and ",
    "                            only the specified plugins will be loaded), which",
    "                            are specified by the filename (basename of the",
    "                            plugin path)",
    "    --trace                 trace execution of the plugins for debugging ",
    "                            purposes",
    "    --verbose               logs plugin execution to syslog to aid in debugging",
    "    --randomize[=seed]      evaluate the execution order randomizing the",
    "                            order of independent jobs. Only useful for testing.",
    "                            You can specify an optional seed for reproducibility",
    "    --parallel              evaluate the execution order accounting for",
    "                            parallelism between jobs which are independent",
    "    --plugin-flags=<flag>[,<flag>]",
    "                            specify flags for conditional execution of plugins.",
    "                            If there are multiple occurences of this option, the",
    "                            last one is the only one that counts. See plugin",
    "                            documentation for which plugins support flags.",
    "    --interactive           prompts before performing the action, allowing",
    "                            plugins to be skipped, executed, or to fall to a",
    "                            troubleshooting shell",
    "    --disable-plugins=<plugin>[,<plugin>]",
    "                            a comma separated list of plugins to be disabled",
    "                            during execution, which are specified by the",
    "                            filename (basename of the plugin path)",
    "    --dump-dependency-tree[=<path>]",
    "                            dump plugin dependency tree information to the file",
    "                            specified by path.  If path is not specified, the",
    "                            information will be dumped to the console",
    "    --interactive-mode-requires=<plugin>[,<plugin>]",
    "                            interactive mode requires the specified plugins to ",
    "                            be loaded before it can be activated",
};

std::string PrintedUsage() {
    const support::StreamCapture output(std::cout);
    PrintUsage();
    return output.Text();
}

TEST(UsageTest, Has40Lines) {
    const std::string text = PrintedUsage();
    EXPECT_EQ(expected.size(), 40U);
    EXPECT_EQ(std::count(text.begin(), text.end(), '\n'), 40);
}

TEST(UsageTest, EachLineIsExactlyAsScriptsKnowIt) {
    std::istringstream text(PrintedUsage());
    std::string line;
    for (std::size_t i = 0; i < expected.size(); ++i) {
        ASSERT_TRUE(std::getline(text, line)) << "line " << i + 1;
        EXPECT_EQ(line, expected[i]) << "line " << i + 1;
    }
    EXPECT_FALSE(std::getline(text, line));
}

TEST(UsageTest, TheLastLineIsEnded) { EXPECT_EQ(PrintedUsage().back(), '\n'); }

TEST(UsageTest, NothingGoesToStandardError) {
    const support::StreamCapture errors(std::cerr);
    PrintedUsage();
    EXPECT_EQ(errors.Text(), "");
}

}  // namespace
}  // namespace vantor
