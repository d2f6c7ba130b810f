#ifndef VANTOR_NVCLI_COMMANDLINE_H
#define VANTOR_NVCLI_COMMANDLINE_H

#include <string>
#include <vector>

namespace nvcli {

// What the program is asked to do: its own options, which stand before the first word of the
// command, and all from that word on.
struct CommandLine {
    std::vector<std::string> directories;  // empty: the default ones
    bool help = false;
    bool version = false;
    std::vector<std::string> command;
    std::string error;  // a sentence; with one, the rest is not to be used
};

// `arguments` without the program's name.
CommandLine ParseCommandLine(const std::vector<std::string>& arguments);

}  // namespace nvcli

#endif
