#include <gtest/gtest.h>

#include <sstream>

#include "basekit/DescriptionFolder.h"
#include "nvcli/Nvcli.h"

// The help pages, whole.
namespace nvcli {

namespace {

using vantor::support::DescriptionFolder;

constexpr const char* programUsage =
    "Usage: nvcli [OPTION]... NAMESPACE... COMMAND [COMMAND'S OPTION]...\n"
    "\n"
    "Runs one of the management commands that this host describes.\n"
    "\n"
    "Options:\n"
    "  --directory=DIR  Know the commands described in DIR, in place of the host's; may be "
    "repeated\n"
    "  -h, --help       Show this page, or that of a namespace or a command: nvcli WORD... "
    "--help\n"
    "  --version        Show the version\n";

class NvcliHelpTest : public ::testing::Test {
protected:
    void Describe() const {
        folder.Write("host.json", R"({"commands": [
            {"path": "ping", "summary": "Answers with pong", "execute": ["/bin/echo", "pong"]},
            {"path": "network list", "summary": "Lists the links", "execute": ["/bin/true"]},
            {"path": "network firewall refresh", "summary": "Loads the rules again",
             "execute": ["/bin/true"]},
            {"path": "network firewall set", "summary": "Opens or closes a port",
             "options": [
                {"name": "port", "letter": "p", "kind": "integer", "required": true,
                 "summary": "The port's number"},
                {"name": "protocol", "kind": "choice", "values": ["tcp", "udp"], "required": true},
                {"name": "comment", "letter": "c", "kind": "string"},
                {"name": "log", "kind": "boolean", "summary": "Whether to log what is refused"},
                {"name": "force", "letter": "f", "kind": "flag", "summary": "Ask nothing"}],
             "execute": ["/bin/true"]}]})");
    }

    // The page for these arguments, which are good.
    std::string Page(std::vector<std::string> arguments) const {
        arguments.insert(arguments.begin(), "--directory=" + folder.Path());
        std::ostringstream output;
        std::ostringstream errors;
        EXPECT_EQ(RunNvcli(arguments, output, errors), Success);
        EXPECT_EQ(errors.str(), "");
        return output.str();
    }

    DescriptionFolder folder;
};

TEST_F(NvcliHelpTest, WithoutArgumentsNamespacesAndCommandsAreListed) {
    Describe();
    const std::string page = std::string(programUsage) + "\n"
                                                         "Commands without a namespace:\n"
                                                         "  ping     Answers with pong\n"
                                                         "\n"
                                                         "network:\n"
                                                         "  list     Lists the links\n"
                                                         "\n"
                                                         "network firewall:\n"
                                                         "  refresh  Loads the rules again\n"
                                                         "  set      Opens or closes a port\n";
    EXPECT_EQ(Page({}), page);
    EXPECT_EQ(Page({"--help"}), page);
    EXPECT_EQ(Page({"-h"}), page);
}

TEST_F(NvcliHelpTest, WithoutDescriptionsThereIsNothingToList) {
    EXPECT_EQ(Page({}), std::string(programUsage) + "\nNo command is described.\n");
}

TEST_F(NvcliHelpTest, ANamespaceListsWhatIsInIt) {
    Describe();
    const std::string page = "Usage: nvcli network COMMAND [COMMAND'S OPTION]...\n"
                             "\n"
                             "network:\n"
                             "  list     Lists the links\n"
                             "\n"
                             "network firewall:\n"
                             "  refresh  Loads the rules again\n"
                             "  set      Opens or closes a port\n";
    EXPECT_EQ(Page({"network", "--help"}), page);
    EXPECT_EQ(Page({"--help", "network"}), page);
}

TEST_F(NvcliHelpTest, ACommandShowsItsOptions) {
    Describe();
    const std::string page =
        "Usage: nvcli network firewall set --port=INTEGER --protocol=tcp|udp [OPTION]...\n"
        "\n"
        "Opens or closes a port\n"
        "\n"
        "Options:\n"
        "  -p, --port=INTEGER      The port's number (required)\n"
        "      --protocol=tcp|udp  (required)\n"
        "  -c, --comment=TEXT\n"
        "      --log=true|false    Whether to log what is refused\n"
        "  -f, --force             Ask nothing\n"
        "  -h, --help              Show this page\n"
        "\n"
        "Described in " +
        folder.File("host.json") + "\n";
    EXPECT_EQ(Page({"network", "firewall", "set", "--help"}), page);
    EXPECT_EQ(Page({"network", "firewall", "set", "--port=x", "-h"}), page);
}

TEST_F(NvcliHelpTest, ACommandWithoutOptionsSaysSo) {
    Describe();
    EXPECT_EQ(Page({"ping", "--help"}), "Usage: nvcli ping\n"
                                        "\n"
                                        "Answers with pong\n"
                                        "\n"
                                        "Options:\n"
                                        "  -h, --help  Show this page\n"
                                        "\n"
                                        "Described in " +
                                            folder.File("host.json") + "\n");
}

TEST_F(NvcliHelpTest, ThereIsNoHelpForAnUnknownCommand) {
    Describe();
    std::ostringstream output;
    std::ostringstream errors;
    EXPECT_EQ(RunNvcli({"--directory=" + folder.Path(), "pin", "--help"}, output, errors),
              BadCommandLine);
    EXPECT_EQ(output.str(), "");
    EXPECT_EQ(errors.str(), "nvcli: unknown command \"pin\"; the nearest known one is \"ping\"\n");
}

}  // namespace

}  // namespace nvcli
