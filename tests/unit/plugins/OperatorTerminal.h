#ifndef VANTOR_PLUGINS_TESTS_OPERATORTERMINAL_H
#define VANTOR_PLUGINS_TESTS_OPERATORTERMINAL_H

#include <termios.h>

#include <optional>
#include <string>
#include <vector>

#include "plugins/TerminalCalls.h"

namespace vantor::support {

// A pseudo-terminal in the place of standard input, and the operator who sits at it.
class OperatorTerminal {
public:
    OperatorTerminal();
    ~OperatorTerminal();
    OperatorTerminal(const OperatorTerminal&) = delete;
    OperatorTerminal& operator=(const OperatorTerminal&) = delete;

    // The operator's next keys: one is pressed each time that the program reads. A program that
    // reads more fails the test.
    void WillPress(const std::string& text) { keys += text; }

    // Keys that were not yet asked for.
    const std::string& KeysLeft() const { return keys; }

    // Presses keys at once.
    void Press(const std::string& text) const;

    termios Attributes() const;
    void SetAttributes(const termios& attributes) const;

    // The local modes of the terminal at each read.
    const std::vector<tcflag_t>& ModesAtReads() const { return modesAtReads; }

    TerminalCalls calls;

private:
    void BeforeRead();

    int operatorEnd = -1;
    int programEnd = -1;
    std::string keys;
    std::vector<tcflag_t> modesAtReads;
    std::optional<DescriptorReplacement> standardInput;
};

}  // namespace vantor::support

#endif
