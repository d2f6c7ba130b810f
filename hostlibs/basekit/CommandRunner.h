#ifndef VANTOR_BASEKIT_COMMANDRUNNER_H
#define VANTOR_BASEKIT_COMMANDRUNNER_H

#include <cstddef>
#include <string>
#include <vector>

#include "basekit/BoundedText.h"

namespace BaseKit::impl {

// How a program came to its end.
enum class ProcessEnd {
    NotStarted,  // the code is an errno value; `obstacle` says of what, when not of the program
    Exited,      // the code is its exit status
    Killed,      // the code is the signal's number
    Unknown,     // someone else has taken its status; the code is an errno value
};

// More than this is not kept of one run: it would not fit the host's memory, or a line of its log.
constexpr std::size_t outputLimit = std::size_t{64} * 1024 * 1024;
constexpr std::size_t errorHeadLimit = std::size_t{64} * 1024;
constexpr std::size_t errorTailLimit = std::size_t{64} * 1024;

struct ProcessResult {
    ProcessEnd end = ProcessEnd::NotStarted;
    int code = 0;
    const char* obstacle = nullptr;
    BoundedText standardOutput{outputLimit, 0};
    BoundedText standardError{errorHeadLimit, errorTailLimit};
};

// Executes a file, without a shell, and waits for its end: arguments[0] is its absolute path. It
// gets the null device as standard input, this process's environment and working directory, an
// empty signal mask and every signal's default action, and no other descriptor of this process.
// What it writes is read from both streams at once, so that it never waits for a reader.
//
// The run is over when the program itself has ended. What it wrote is then complete; a child that
// it left in the background may still hold the streams, and is neither waited for nor heard any
// longer (it writes to a closed pipe: one that goes on writing must be started with its output
// elsewhere).
//
// May be called by any number of threads at once; takes no lock. Throws only std::bad_alloc.
ProcessResult RunProgram(std::vector<std::string> arguments);

}  // namespace BaseKit::impl

#endif
