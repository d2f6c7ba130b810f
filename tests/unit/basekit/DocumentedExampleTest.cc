#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <stdexcept>

#include "basekit/CommandTree.h"
#include "basekit/DescriptionFolder.h"
#include "basekit/DescriptionLoader.h"
#include "basekit/OptionBinder.h"
#include "platform/BaseKit.h"

// docs/command-descriptions.md, held against what the library does.
namespace BaseKit::impl {

namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using vantor::support::DescriptionFolder;
using vantor::support::ReadFile;

// The text of the page between the first `from` and the next `to`.
std::string Between(const std::string& page, const std::string& from, const std::string& to) {
    const std::size_t start = page.find(from);
    const std::size_t end = page.find(to, start + from.size());
    if (start == std::string::npos || end == std::string::npos) {
        throw std::runtime_error("the page has no " + from + "..." + to);
    }
    return page.substr(start + from.size(), end - start - from.size());
}

TEST(DocumentedExampleTest, TheCommandLineBecomesTheArgumentsThatThePageNames) {
    const std::string page = ReadFile(COMMAND_DESCRIPTIONS_PAGE);
    DescriptionFolder folder;
    folder.Write("example.json", Between(page, "```json\n", "```"));
    const DescriptionFile file = ReadDescriptionFile(folder.File("example.json"));
    ASSERT_THAT(file.mistakes.Texts(), IsEmpty());
    CommandTree tree;
    for (const DescribedCommand& described : file.commands) {
        ASSERT_EQ(tree.Add(described.command), "");
    }

    AutoCli::OptionParser parser("nvcli");
    ASSERT_FALSE(parser.ParseString(Between(page, "the command line `", "`")));
    const std::list<std::string> path = parser.GetCommandPath();
    const AutoCli::CommandPointer command = tree.Find({path.begin(), path.end()});
    ASSERT_NE(command, nullptr);
    const BoundOptions bound = BindOptions(*command, parser.GetCommandParameters());
    ASSERT_THAT(bound.errors, IsEmpty());
    EXPECT_THAT(ExpandArguments(*command, bound.values),
                ElementsAre("/usr/sbin/firewall-rule", "open", "tcp/443", "--note", "for the web",
                            "--even-if-open"));
}

}  // namespace

}  // namespace BaseKit::impl
