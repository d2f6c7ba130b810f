#include "driver/CommandLine.h"

#include <getopt.h>

#include <boost/lexical_cast.hpp>
#include <boost/tokenizer.hpp>
#include <cstdint>
#include <cstdlib>
#include <iostream>
#include <vector>

#include "driver/Usage.h"

namespace vantor {

namespace {

// Codes above any character, so that no short option can be taken for a long one.
enum OptionCode : int {
    Help = 'h',
    Init = 256,
    PluginFlags,
    TraceRun,
    Invoke,
    Method,
    SelectPlugin,
    Verbose,
    Parallel,
    Randomize,
    RunOnce,
    Interactive,
    DisablePlugins,
    PluginDirectory,
    DumpDependencyTree,
    InteractiveModeRequires,
};

const option longOptions[] = {
    {"help", no_argument, nullptr, Help},
    {"init", no_argument, nullptr, Init},
    {"plugin-flags", required_argument, nullptr, PluginFlags},
    {"trace", no_argument, nullptr, TraceRun},
    {"invoke", no_argument, nullptr, Invoke},
    {"method", required_argument, nullptr, Method},
    {"plugin", required_argument, nullptr, SelectPlugin},
    {"verbose", no_argument, nullptr, Verbose},
    {"parallel", no_argument, nullptr, Parallel},
    {"randomize", optional_argument, nullptr, Randomize},
    {"run-once", required_argument, nullptr, RunOnce},
    {"interactive", no_argument, nullptr, Interactive},
    {"disable-plugins", required_argument, nullptr, DisablePlugins},
    {"plugin-directory", required_argument, nullptr, PluginDirectory},
    {"dump-dependency-tree", optional_argument, nullptr, DumpDependencyTree},
    {"interactive-mode-requires", required_argument, nullptr, InteractiveModeRequires},
    {nullptr, 0, nullptr, 0},
};

// Items between commas. Empty ones are dropped; blanks belong to their item.
std::vector<std::string> SplitList(const std::string& text) {
    using Separator = boost::char_separator<char>;
    const Separator separator(",", "", boost::drop_empty_tokens);
    const boost::tokenizer<Separator> items(text, separator);
    return {items.begin(), items.end()};
}

void Append(std::list<std::string>& list, const char* argument) {
    const std::vector<std::string> items = SplitList(argument);
    list.insert(list.end(), items.begin(), items.end());
}

void Insert(std::set<std::string>& set, const char* argument) {
    const std::vector<std::string> items = SplitList(argument);
    set.insert(items.begin(), items.end());
}

// A seed that is no signed 32-bit number is as good as none: the run does not depend on it.
void ReadSeed(const char* argument, std::int32_t& seed) {
    std::int32_t parsed = 0;
    if (boost::conversion::try_lexical_convert(std::string(argument), parsed)) {
        seed = parsed;
    }
}

void ApplyOption(int code, RunConfig& config, DriverOptions& options) {
    switch (code) {
        case Init:
            options.init = true;
            break;
        case PluginFlags:
            options.pluginFlags.clear();
            Insert(options.pluginFlags, optarg);
            break;
        case TraceRun:
            config.trace = true;
            break;
        case Invoke:
            config.invoke = true;
            break;
        case Method:
            config.method = optarg;
            break;
        case SelectPlugin:
            Append(options.selectedPlugins, optarg);
            break;
        case Verbose:
            config.verbose = true;
            break;
        case Parallel:
            config.parallel = true;
            config.interactive = false;
            break;
        case Randomize:
            config.randomize = true;
            if (optarg != nullptr) {
                ReadSeed(optarg, config.seed);
            }
            break;
        case RunOnce:
            Insert(options.runOncePlugins, optarg);
            break;
        case Interactive:
            config.interactive = true;
            config.parallel = false;
            break;
        case DisablePlugins:
            Append(config.disabledPlugins, optarg);
            break;
        case PluginDirectory:
            options.pluginDirectory = optarg;
            break;
        case DumpDependencyTree:
            options.dump = true;
            options.dumpPath =
                optarg != nullptr ? std::optional<std::string>(optarg) : std::nullopt;
            break;
        case InteractiveModeRequires:
            Append(config.interactiveModeRequires, optarg);
            break;
        default:
            break;
    }
}

}  // namespace

std::optional<int> ParseCommandLine(int argc, char** argv, RunConfig& config,
                                    DriverOptions& options) {
    int code = 0;
    while ((code = getopt_long(argc, argv, "h", longOptions, nullptr)) != -1) {
        if (code == Help) {
            PrintUsage();
            return EXIT_SUCCESS;
        }
        if (code == '?') {
            std::cerr << "usage: " << argv[0] << " --help for usage information" << std::endl;
            return EXIT_FAILURE;
        }
        ApplyOption(code, config, options);
    }
    if (config.invoke && (config.method.empty() || options.selectedPlugins.empty())) {
        std::cerr << "invoke requires a method and plugin specified.";
        PrintUsage();
        return EXIT_FAILURE;
    }
    if (!config.parallel) {
        config.threads = 1;
    }
    return std::nullopt;
}

}  // namespace vantor
