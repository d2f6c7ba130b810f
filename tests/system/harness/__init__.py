"""What the system tests stand on: private roots, their syslog, plugins, and runs in them."""
