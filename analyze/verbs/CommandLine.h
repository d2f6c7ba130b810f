#ifndef VANTOR_ANALYZE_VERBS_COMMANDLINE_H
#define VANTOR_ANALYZE_VERBS_COMMANDLINE_H

#include "verbs/Invocation.h"

namespace vantor::analyze {

// The invocation that standard output and standard error make: `out` and `error` stand for them,
// and colour, width and progress are those of the terminals that they are, if they are any.
Invocation OnTerminal(std::ostream& out, std::ostream& error);

// Reads the command line, does what its verb asks and returns the exit status. Throws nothing: what
// is wrong with the line, or keeps the verb from its work, is told on `invocation.error` in a line
// and gives statusCouldNotLook; so does a result that could not be written whole.
int RunCommandLine(int argc, const char* const* argv, Invocation& invocation);

}  // namespace vantor::analyze

#endif
