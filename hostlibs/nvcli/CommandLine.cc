#include "nvcli/CommandLine.h"

#include <string_view>

namespace nvcli {

namespace {

constexpr std::string_view directoryOption = "--directory";

}  // namespace

CommandLine ParseCommandLine(const std::vector<std::string>& arguments) {
    CommandLine line;
    auto argument = arguments.begin();
    for (; argument != arguments.end() && !argument->empty() && argument->front() == '-';
         ++argument) {
        const std::string name = argument->substr(0, argument->find('='));
        if (name == directoryOption) {
            std::string directory;
            if (name.size() < argument->size()) {
                directory = argument->substr(name.size() + 1);
            } else if (argument + 1 != arguments.end()) {
                directory = *++argument;
            }
            if (directory.empty()) {
                line.error = "the option \"--directory\" needs a value";
                return line;
            }
            line.directories.push_back(std::move(directory));
        } else if (*argument == "--help" || *argument == "-h") {
            line.help = true;
        } else if (*argument == "--version") {
            line.version = true;
        } else {
            line.error = "nvcli itself has no option \"" + *argument +
                         "\"; those of a command stand behind its words";
            return line;
        }
    }
    line.command.assign(argument, arguments.end());
    return line;
}

}  // namespace nvcli
