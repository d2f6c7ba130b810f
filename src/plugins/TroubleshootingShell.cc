#include "plugins/TroubleshootingShell.h"

#include <syslog.h>
#include <unistd.h>

#include <array>
#include <cstring>
#include <iostream>
#include <string>

#include "io/ChildProcess.h"

namespace vantor {

void RunTroubleshootingShell() {
    std::string shell = "/bin/sh";
    const std::array<char*, 2> arguments = {shell.data(), nullptr};
    ChildSetup setup;
    setup.path = shell.c_str();
    setup.arguments = arguments.data();
    setup.environment = environ;
    setup.newSession = true;
    setup.closeFrom = STDERR_FILENO + 1;
    setup.takeTerminal = true;

    const ChildOutcome outcome = RunChild(setup);
    const char* const errorText = std::strerror(outcome.error);
    switch (outcome.step) {
    case ChildStep::Fork:
        syslog(LOG_ERR, "failed to fork: %s", errorText);
        std::cerr << std::string("unable to launch a troubleshooting shell:") + errorText + "\n";
        return;
    case ChildStep::Session:
        syslog(LOG_ERR, "unable to create new session: %s", errorText);
        break;
    case ChildStep::Exec:
        syslog(LOG_ERR, "unable to exec shell: %s", errorText);
        break;
    case ChildStep::Done:
        break;
    }
    std::cout << "\033[2K" << std::flush;
}

}  // namespace vantor
