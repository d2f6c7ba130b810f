#ifndef VANTOR_ANALYZE_VERBS_INVOCATION_H
#define VANTOR_ANALYZE_VERBS_INVOCATION_H

#include <functional>
#include <ostream>

namespace vantor::analyze {

// The exit statuses that all verbs share.
constexpr int statusClean = 0;
constexpr int statusWarnings = 1;
constexpr int statusErrors = 2;
constexpr int statusCouldNotLook = 3;

// One call of the program. A verb's registration adds its subcommand to the command line; when that
// is the one chosen, its callback leaves here what is to be done once the whole line is read.
struct Invocation {
    std::ostream& out;      // the result
    std::ostream& error;    // what went wrong, and progress
    bool colour = false;    // `out` is a terminal that shows colours
    int width = 0;          // columns of the terminal that `out` is; 0 when it is none
    bool progress = false;  // `error` is a terminal: say so when work takes over a second

    // Returns the exit status. What it throws is told on `error` and gives statusCouldNotLook.
    std::function<int()> action;
};

}  // namespace vantor::analyze

#endif
