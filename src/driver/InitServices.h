#ifndef VANTOR_DRIVER_INITSERVICES_H
#define VANTOR_DRIVER_INITSERVICES_H

namespace vantor {

// The services of init mode. None of them can stop a boot: what goes wrong is reported and the run
// goes on.

// Runs the system log daemon "/usr/lib/nuvex/nvsyslog/bin/nvsyslogd -i", with an empty environment
// and the standard descriptors alone, and waits until it has put itself in the background. That it
// cannot be executed is said on standard error, since no log daemon is there to hear it.
void LaunchSyslogDaemon();

// Runs "/etc/init.d/nvevtd start" in the same way. That it cannot be executed goes to syslog
// (LOG_ERR).
void StartEventDaemon();

// Brings the log daemon up to date with the configuration that the plugins may have changed: runs
// the upgrade script where there is an old-style "/etc/syslog.conf", and sends SIGUSR1 to the
// process whose number is in "/var/run/nuvex/nvsyslogd.pid". Failures go to syslog.
void ReloadSyslog();

}  // namespace vantor

#endif
