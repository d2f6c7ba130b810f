#ifndef VANTOR_PLUGINS_TROUBLESHOOTINGSHELL_H
#define VANTOR_PLUGINS_TROUBLESHOOTINGSHELL_H

namespace vantor {

// Runs "/bin/sh" in a session of its own, with standard input as its controlling terminal and no
// descriptor but the standard ones, and waits for it to end. Failures go to syslog (LOG_ERR); that
// of the fork to standard error as well. The shell's exit status is not looked at.
void RunTroubleshootingShell();

}  // namespace vantor

#endif
