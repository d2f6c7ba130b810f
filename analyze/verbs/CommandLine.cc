#include "verbs/CommandLine.h"

#include <fmt/format.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <CLI/CLI.hpp>
#include <algorithm>
#include <cstdlib>
#include <exception>
#include <string>
#include <string_view>
#include <vector>

#include "verbs/Blame.h"
#include "verbs/Chain.h"
#include "verbs/Diff.h"
#include "verbs/Explain.h"
#include "verbs/Graph.h"
#include "verbs/Plot.h"
#include "verbs/Simulate.h"
#include "verbs/Trace.h"
#include "verbs/Verify.h"
#include "verify/Wording.h"

namespace vantor::analyze {

namespace {

constexpr const char* programName = "vantor-analyze";

bool ShowsColours() {
    const char* const terminal = std::getenv("TERM");
    const char* const refused = std::getenv("NO_COLOR");
    return terminal != nullptr && std::string_view(terminal) != "dumb" &&
           (refused == nullptr || *refused == '\0');
}

// The words of the line, last first, as the parser takes them. An option's empty value would be
// taken for a missing one as long as it is attached to its name, so it becomes a word of its own.
std::vector<std::string> Words(int argc, const char* const* argv) {
    std::vector<std::string> words;
    bool options = true;
    for (int i = 1; i < argc; ++i) {
        std::string word = argv[i];
        options = options && word != "--";
        if (options && word.size() > 3 && word.compare(0, 2, "--") == 0 &&
            word.find('=') == word.size() - 1) {
            word.pop_back();
            words.push_back(std::move(word));
            words.emplace_back();
        } else {
            words.push_back(std::move(word));
        }
    }
    std::reverse(words.begin(), words.end());
    return words;
}

void AddVerbs(CLI::App& app, Invocation& invocation) {
    AddVerify(app, invocation);
    AddGraph(app, invocation);
    AddExplain(app, invocation);
    AddBlame(app, invocation);
    AddChain(app, invocation);
    AddPlot(app, invocation);
    AddTrace(app, invocation);
    AddSimulate(app, invocation);
    AddDiff(app, invocation);
}

std::string VerbNames(const CLI::App& app) {
    std::string names;
    for (const CLI::App* verb : app.get_subcommands({})) {
        names += (names.empty() ? "" : ", ") + verb->get_name();
    }
    return names;
}

// What is wrong with a line that the parser has refused, in a sentence.
std::string DescribeMistake(const CLI::App& app, const CLI::ParseError& error) {
    const std::vector<std::string> rest = app.remaining();
    if (!app.get_subcommands().empty()) {
        return error.what();
    }
    const auto word = std::find_if(rest.begin(), rest.end(), [](const std::string& candidate) {
        return !candidate.empty() && candidate.front() != '-';
    });
    if (!rest.empty() && rest.front().compare(0, 1, "-") == 0) {
        return fmt::format("unknown option '{}' before the verb", rest.front());
    }
    if (word != rest.end()) {
        return fmt::format("unknown verb '{}'; the verbs are: {}", *word, VerbNames(app));
    }
    return fmt::format("no verb; the verbs are: {}", VerbNames(app));
}

int Fail(const Invocation& invocation, std::string_view what) {
    invocation.error << programName << ": " << OnOneLine(std::string(what)) << '\n';
    return statusCouldNotLook;
}

// The status of what has been done, once its result is out.
int Flushed(int status, const Invocation& invocation) {
    invocation.out.flush();
    return invocation.out ? status : Fail(invocation, "the result could not be written");
}

// Has the parser answer the line itself (help, version) or refuse it.
int Answer(const CLI::App& app, const CLI::ParseError& error, const Invocation& invocation) {
    if (error.get_exit_code() == 0) {
        app.exit(error, invocation.out, invocation.error);
        return Flushed(statusClean, invocation);
    }
    Fail(invocation, DescribeMistake(app, error));
    invocation.error << "usage: " << programName << " --help for usage information\n";
    return statusCouldNotLook;
}

int Act(const Invocation& invocation) { return Flushed(invocation.action(), invocation); }

}  // namespace

Invocation OnTerminal(std::ostream& out, std::ostream& error) {
    Invocation invocation{out, error, false, 0, false, {}};
    if (isatty(STDOUT_FILENO) == 1) {
        invocation.colour = ShowsColours();
        winsize size{};
        if (ioctl(STDOUT_FILENO, TIOCGWINSZ, &size) == 0) {
            invocation.width = size.ws_col;
        }
    }
    invocation.progress = isatty(STDERR_FILENO) == 1;
    return invocation;
}

int RunCommandLine(int argc, const char* const* argv, Invocation& invocation) {
    CLI::App app("Shows what a boot will do before it runs, and where its time went afterwards.",
                 programName);
    app.set_version_flag("--version", std::string(programName) + " " VANTOR_VERSION,
                         "Print the version and exit");
    app.require_subcommand(1);
    try {
        AddVerbs(app, invocation);
        app.parse(Words(argc, argv));
        return Act(invocation);
    } catch (const CLI::ParseError& error) {
        return Answer(app, error, invocation);
    } catch (const std::exception& error) {
        return Fail(invocation, error.what());
    }
}

}  // namespace vantor::analyze
