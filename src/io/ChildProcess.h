#ifndef VANTOR_IO_CHILDPROCESS_H
#define VANTOR_IO_CHILDPROCESS_H

#include "io/CloseDescriptors.h"

namespace vantor {

// What a child does between fork and exec, and which program it becomes. Everything is prepared by
// the caller and outlives the call: the child itself only makes async-signal-safe calls, because
// other threads may hold any lock at the moment of the fork.
struct ChildSetup {
    const char* path = nullptr;          // program to execute
    char* const* arguments = nullptr;    // argument vector, ended by a null pointer
    char* const* environment = nullptr;  // environment, ended by a null pointer
    bool newSession = false;             // become the leader of a session of its own
    int closeFrom = 0;                   // close every descriptor from here on but the kept ones
    KeptDescriptors kept;
    bool takeTerminal = false;  // make standard input the controlling terminal, taking
                                // it from any other session; a refusal is ignored
};

// How far a child came.
enum class ChildStep {
    Fork,     // there was no child
    Session,  // it got no session of its own
    Exec,     // the program could not be executed
    Done,     // the program ran and has ended
};

struct ChildOutcome {
    ChildStep step = ChildStep::Done;  // the step that failed, or Done
    int error = 0;                     // errno of the step that failed
};

// Runs the program in a child and waits for its end, whatever its exit status. The child tells
// this process which step failed and why, over a pipe that a successful exec closes, so that the
// report is made here, where every call is allowed; it then exits with status 1.
ChildOutcome RunChild(const ChildSetup& setup);

}  // namespace vantor

#endif
