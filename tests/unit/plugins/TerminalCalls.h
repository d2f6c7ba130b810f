#ifndef VANTOR_PLUGINS_TESTS_TERMINALCALLS_H
#define VANTOR_PLUGINS_TESTS_TERMINALCALLS_H

#include <functional>
#include <utility>
#include <vector>

#include "support/FaultPoint.h"

namespace vantor::support {

// The calls by which the program uses terminals; one object at a time. The machine's virtual
// terminals are never switched.
class TerminalCalls {
public:
    TerminalCalls();
    ~TerminalCalls();
    TerminalCalls(const TerminalCalls&) = delete;
    TerminalCalls& operator=(const TerminalCalls&) = delete;

    // Requests about virtual terminals, in order: the request's code and the terminal's number.
    std::vector<std::pair<unsigned long, int>> requests;
    FaultPoint activate;  // VT_ACTIVATE

    std::function<void()> beforeRead;  // called before each read of standard input
    std::function<void()> onPause;     // called in place of each wait without a descriptor
};

// Puts another open file in the place of a descriptor while this object lives.
class DescriptorReplacement {
public:
    DescriptorReplacement(int number, int replacement);
    ~DescriptorReplacement();
    DescriptorReplacement(const DescriptorReplacement&) = delete;
    DescriptorReplacement& operator=(const DescriptorReplacement&) = delete;

private:
    int replaced;
    int saved;  // a duplicate of what stood there; -1 when nothing did
};

}  // namespace vantor::support

#endif
