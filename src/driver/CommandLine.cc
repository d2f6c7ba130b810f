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

// One long option: its argument as getopt_long(3) counts it, and what it does. `argument` is null
// where none was given. Without an action: the help, which ends the parsing.
struct OptionRule {
    const char* name;
    int argumentKind;
    void (*apply)(RunConfig& config, DriverOptions& options, const char* argument);
};

const OptionRule rules[] = {
    {"help", no_argument, nullptr},
    {"init", no_argument,
     [](RunConfig&, DriverOptions& options, const char*) { options.init = true; }},
    {"plugin-flags", required_argument,
     [](RunConfig&, DriverOptions& options, const char* argument) {
         options.pluginFlags.clear();
         Insert(options.pluginFlags, argument);
     }},
    {"trace", no_argument,
     [](RunConfig& config, DriverOptions&, const char*) { config.trace = true; }},
    {"invoke", no_argument,
     [](RunConfig& config, DriverOptions&, const char*) { config.invoke = true; }},
    {"method", required_argument,
     [](RunConfig& config, DriverOptions&, const char* argument) { config.method = argument; }},
    {"plugin", required_argument,
     [](RunConfig&, DriverOptions& options, const char* argument) {
         Append(options.selectedPlugins, argument);
     }},
    {"verbose", no_argument,
     [](RunConfig& config, DriverOptions&, const char*) { config.verbose = true; }},
    {"parallel", no_argument,
     [](RunConfig& config, DriverOptions&, const char*) {
         config.parallel = true;
         config.interactive = false;
     }},
    {"randomize", optional_argument,
     [](RunConfig& config, DriverOptions&, const char* argument) {
         config.randomize = true;
         if (argument != nullptr) {
             ReadSeed(argument, config.seed);
         }
     }},
    {"run-once", required_argument,
     [](RunConfig&, DriverOptions& options, const char* argument) {
         Insert(options.runOncePlugins, argument);
     }},
    {"interactive", no_argument,
     [](RunConfig& config, DriverOptions&, const char*) {
         config.interactive = true;
         config.parallel = false;
     }},
    {"disable-plugins", required_argument,
     [](RunConfig& config, DriverOptions&, const char* argument) {
         Append(config.disabledPlugins, argument);
     }},
    {"plugin-directory", required_argument,
     [](RunConfig&, DriverOptions& options, const char* argument) {
         options.pluginDirectory = argument;
     }},
    {"dump-dependency-tree", optional_argument,
     [](RunConfig&, DriverOptions& options, const char* argument) {
         options.dump = true;
         options.dumpPath =
             argument != nullptr ? std::optional<std::string>(argument) : std::nullopt;
     }},
    {"interactive-mode-requires", required_argument,
     [](RunConfig& config, DriverOptions&, const char* argument) {
         Append(config.interactiveModeRequires, argument);
     }},
};

// The code that getopt_long(3) returns for the first rule; above any character, so that no short
// option can be taken for a long one.
constexpr int firstCode = 256;

std::vector<option> LongOptions() {
    std::vector<option> result;
    int code = firstCode;
    for (const OptionRule& rule : rules) {
        result.push_back({rule.name, rule.argumentKind, nullptr, code});
        ++code;
    }
    result.push_back({nullptr, 0, nullptr, 0});
    return result;
}

}  // namespace

std::optional<int> ParseCommandLine(int argc, char** argv, RunConfig& config,
                                    DriverOptions& options) {
    // A leading "-" hands over words that are no options, as code 1, instead of letting the
    // environment decide whether they end the parsing.
    constexpr const char* shortOptions = "-h";
    constexpr int plainWord = 1;
    const std::vector<option> longOptions = LongOptions();
    int code = 0;
    while ((code = getopt_long(argc, argv, shortOptions, longOptions.data(), nullptr)) != -1) {
        if (code == '?') {
            std::cerr << "usage: " << argv[0] << " --help for usage information" << std::endl;
            return EXIT_FAILURE;
        }
        if (code == plainWord) {
            continue;
        }
        const OptionRule& rule = code == 'h' ? rules[0] : rules[code - firstCode];
        if (rule.apply == nullptr) {
            PrintUsage();
            return EXIT_SUCCESS;
        }
        rule.apply(config, options, optarg);
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
