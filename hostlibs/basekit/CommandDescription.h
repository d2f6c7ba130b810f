#ifndef VANTOR_BASEKIT_COMMANDDESCRIPTION_H
#define VANTOR_BASEKIT_COMMANDDESCRIPTION_H

#include <boost/shared_ptr.hpp>
#include <cstddef>
#include <optional>
#include <string>
#include <vector>

namespace BaseKit::AutoCli {

// What an option is given on the command line.
enum class ValueKind {
    Flag,     // no value
    String,   // any text
    Integer,  // a signed 64-bit integer, decimal
    Boolean,  // "true" or "false"
    Choice,   // one of CommandOption::choices
};

struct CommandOption {
    std::string name;     // at least two characters, without the dashes
    char letter = '\0';   // the one-letter name; '\0' for none
    std::string summary;  // one line for people; may be empty
    ValueKind kind = ValueKind::String;
    bool required = false;
    bool allowEmpty = false;  // a String may be the empty text
    std::vector<std::string> choices;
};

// A piece of an argument: fixed text, and after it the value of an option.
struct ArgumentPiece {
    std::string text;
    std::optional<std::size_t> option;  // index into CommandDescription::options
};

// One argument of the program. It is left out when one of the options that it speaks of is not
// given.
struct ArgumentTemplate {
    std::optional<std::size_t> when;  // an option that must be given beside those of the pieces
    std::vector<ArgumentPiece> pieces;
};

// One command, as a description file tells it. Never changed once it is known to a dispatcher, so
// that any number of threads may read it.
class CommandDescription {
public:
    std::vector<std::string> path;  // namespace words and, last, the command word
    std::string summary;            // one line for people
    std::vector<CommandOption> options;
    std::string program;                      // absolute path of the file to execute
    std::vector<ArgumentTemplate> arguments;  // those after the program's own name
    std::string file;                         // the description file that it comes from
};

using CommandPointer = boost::shared_ptr<const CommandDescription>;

}  // namespace BaseKit::AutoCli

#endif
