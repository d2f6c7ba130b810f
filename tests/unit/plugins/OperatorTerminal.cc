#include "plugins/OperatorTerminal.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <pty.h>
#include <unistd.h>

#include <stdexcept>

namespace vantor::support {

OperatorTerminal::OperatorTerminal() {
    if (openpty(&operatorEnd, &programEnd, nullptr, nullptr, nullptr) != 0) {
        throw std::runtime_error("no pseudo-terminal");
    }
    // A shell started by the program closes its descriptors itself, but no other program would.
    fcntl(operatorEnd, F_SETFD, FD_CLOEXEC);
    fcntl(programEnd, F_SETFD, FD_CLOEXEC);
    standardInput.emplace(STDIN_FILENO, programEnd);
    calls.beforeRead = [this] { BeforeRead(); };
}

OperatorTerminal::~OperatorTerminal() {
    standardInput.reset();
    close(operatorEnd);
    close(programEnd);
}

void OperatorTerminal::Press(const std::string& text) const {
    ASSERT_EQ(write(operatorEnd, text.data(), text.size()), static_cast<ssize_t>(text.size()));
}

termios OperatorTerminal::Attributes() const {
    termios attributes{};
    EXPECT_EQ(tcgetattr(programEnd, &attributes), 0);
    return attributes;
}

void OperatorTerminal::SetAttributes(const termios& attributes) const {
    ASSERT_EQ(tcsetattr(programEnd, TCSANOW, &attributes), 0);
}

void OperatorTerminal::BeforeRead() {
    modesAtReads.push_back(Attributes().c_lflag);
    if (keys.empty()) {
        ADD_FAILURE() << "a key is read that the operator does not press";
        keys = "c";
    }
    Press(keys.substr(0, 1));
    keys.erase(0, 1);
}

}  // namespace vantor::support
