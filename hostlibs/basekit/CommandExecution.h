#ifndef VANTOR_BASEKIT_COMMANDEXECUTION_H
#define VANTOR_BASEKIT_COMMANDEXECUTION_H

#include "basekit/CommandInput.h"
#include "basekit/CommandOutput.h"
#include "basekit/CommandTree.h"

namespace BaseKit::impl {

// Finds the command of the input, holds the parameters against its options and runs its program.
// `answer` gets the outcome, the errors and what the program wrote; whatever it held is gone. May
// be called by any number of threads at once, and takes no lock. Throws only std::bad_alloc.
void Execute(const CommandTree& commands, const RecordedInput& input,
             AutoCli::CommandAnswer& answer);

}  // namespace BaseKit::impl

#endif
