#ifndef VANTOR_JSON_TESTS_BASEKITDOUBLE_H
#define VANTOR_JSON_TESTS_BASEKITDOUBLE_H

#include <functional>
#include <list>
#include <string>
#include <utility>
#include <vector>

namespace vantor::support {

using StringPairs = std::vector<std::pair<std::string, std::string>>;

// What the framework makes of a command line.
struct ParsedLine {
    bool nothingToExecute = false;
    std::vector<std::string> errors;
    StringPairs parameters;
    std::list<std::string> path;
};

// What the framework is given to execute.
struct GivenCommand {
    std::string callerName;
    std::list<std::string> path;
    StringPairs parameters;
};

// The host's command framework while this object lives, one at a time. A test program that compiles
// BaseKitDouble.cc in executes no command: its definitions of the framework's operations win over
// those of the shared library. Set the functions before the framework is used.
class BaseKitDouble {
public:
    BaseKitDouble();
    ~BaseKitDouble();
    BaseKitDouble(const BaseKitDouble&) = delete;
    BaseKitDouble& operator=(const BaseKitDouble&) = delete;

    // The answer to a command line. At first: a valid command whose path are the line's words.
    std::function<ParsedLine(const std::string& line)> parse;

    // The errors of a command; none: it succeeds. At first every command succeeds.
    std::function<std::vector<std::string>(const GivenCommand& command)> execute;

    // Called on the calling thread for every call, once it has been noted; may throw.
    std::function<void(const std::string& call)> onCall;

    // Called when a dispatcher is destroyed; must not throw.
    std::function<void()> onDestruction;

    // Every call in order, as "<object>: <operation and arguments>", the object being one of
    // "parser", "input", "output" and "dispatcher".
    std::vector<std::string> Calls() const;
    // Those of one object.
    std::vector<std::string> CallsOf(const std::string& object) const;

    std::vector<GivenCommand> Executed() const;

    // Parsers, inputs and outputs that exist, of those made in this object's life.
    int LiveObjects() const;
    // All dispatchers that exist.
    int LiveDispatchers() const;
};

}  // namespace vantor::support

#endif
