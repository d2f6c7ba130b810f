#ifndef VANTOR_SUPPORT_FORKEDCHILD_H
#define VANTOR_SUPPORT_FORKEDCHILD_H

#include <functional>
#include <string>

namespace vantor::support {

// What a forked child of a test left behind.
struct ChildReport {
    std::string text;  // what it wrote to its report descriptor
    int status = 0;    // as waitpid(2) gives it
};

// Runs `body` in a child process, for what a test cannot do to its own: closing descriptors, dying,
// leaving its session. The body is given the descriptor to write its report to; its result becomes
// the exit status, by _exit(2), and an exception status 99 with its text reported. Only for a
// process that has no other thread. Throws std::runtime_error when there is no child.
ChildReport RunForked(const std::function<int(int report)>& body);

// Writes the whole text; nothing else is done about errors.
void WriteReport(int report, const std::string& text);

}  // namespace vantor::support

#endif
