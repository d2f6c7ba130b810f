"""What the system tests stand on: a private root, its syslog, its plugins, and runs of the program."""
