"""Texts that many cases share."""

from harness.private_root import PLUGINS
from harness.syslog_recorder import ERR, INFO, WARNING

NO_PID_FILE = (WARNING, "unable to open nvksyslogd pid file")
UNREADABLE_PID = (ERR, "unable to read nvsyslogd pid")
BLAME = "This may be caused by a bad vantor plugin being installed on your system.\n"
BOOT_FAILED = "Failed to boot the system.  An unhandled error has occurred.  " + BLAME
INVOKE_FAILED = "Activating plugins has failed. An unhandled error has occurred.  " + BLAME

IRREGULAR = "not a regular file"
TRUNCATED = "file is truncated (a loadable segment lies beyond its end)"
NOT_ELF = "This is no shared object, whatever its name may promise.\n" * 4


def starting(*names):
    """The notices of plugins whose start method is run, in this order."""
    return [(INFO, f"executing start plugin: {name}") for name in names]


def invalid(file_name, reason, folder=PLUGINS):
    """The text of a file that cannot be loaded, as it is alerted and logged."""
    return (f"exception occurred whilst loading plugin {file_name}: "
            f"plugin `{folder}/{file_name}' is invalid: {reason}")


def linker_says(file_name, what, folder=PLUGINS):
    """As invalid(), with a reason of the dynamic linker's."""
    return invalid(file_name, f"{folder}/{file_name}: {what}", folder)

NVCLI_USAGE = """\
Usage: nvcli [OPTION]... NAMESPACE... COMMAND [COMMAND'S OPTION]...

Runs one of the management commands that this host describes.

Options:
  --directory=DIR  Know the commands described in DIR, in place of the host's; may be repeated
  -h, --help       Show this page, or that of a namespace or a command: nvcli WORD... --help
  --version        Show the version
"""
