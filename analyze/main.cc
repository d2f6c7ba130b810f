#include <iostream>

#include "verbs/CommandLine.h"

int main(int argc, char** argv) {
    vantor::analyze::Invocation invocation = vantor::analyze::OnTerminal(std::cout, std::cerr);
    return vantor::analyze::RunCommandLine(argc, argv, invocation);
}
