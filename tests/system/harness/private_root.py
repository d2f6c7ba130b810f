"""A private root: a temporary folder that a run of the program takes for "/"."""

import glob
import gzip
import os
import shutil
import signal
import socket

from harness.isolation import DEVICES
from harness.native_plugin import PluginFactory, write_native_plugin
from harness.syslog_recorder import SyslogRecorder
from harness.waiting import wait_until

PLUGINS = "/usr/libexec/vantor/plugins"
DEBUG_CONFIGURATION = "/etc/nuvex/vantor/debug.conf"
HOST_PROFILE = "/etc/nuvex/hostprofile.xml"
PROFILING_LOG = "/var/log/sysboot.log"
RUN_ONCE_RECORD = "/bootbank/vantorbk.gz"
SYSTEM_ALERTS = "/var/run/nuvex/system-alerts"


class PrivateRoot:
    """One test's host: lay files out with absolute names, run the program, look at what is left.

    Names are those inside the root, with or without the leading slash.
    """

    def __init__(self, base, isolation, folder):
        self.folder, self.isolation, self.base = folder, isolation, base
        base.clone(folder)
        self.devices = {
            name for name in DEVICES
            if isolation.make_device(self.path("/dev/" + name), name)
        }
        if isolation.has_proc:
            isolation.mount_proc(folder)
        self.syslog = SyslogRecorder(self.path("/dev"))
        self.runs = []

    def path(self, name):
        """The name outside the root of a name inside it."""
        return os.path.join(self.folder, name.lstrip("/"))

    def exists(self, name):
        return os.path.lexists(self.path(name))

    def write(self, name, content="", mode=0o644):
        """Makes a file of its own, even where a hard link to the base root's file stands."""
        path = self.path(name)
        os.makedirs(os.path.dirname(path), exist_ok=True)
        if os.path.lexists(path):
            os.unlink(path)
        data = content if isinstance(content, bytes) else content.encode()
        with open(path, "wb") as file:
            file.write(data)
        os.chmod(path, mode)

    def script(self, name, *lines):
        """Makes a shell script that can be executed."""
        self.write(name, "#!/bin/sh\n" + "".join(line + "\n" for line in lines), 0o755)

    def link_program(self, program, name):
        """Puts one of the root's programs under a further name."""
        self.remove(name)
        os.makedirs(os.path.dirname(self.path(name)), exist_ok=True)
        os.link(self.path(program), self.path(name))

    def symlink(self, target, name):
        os.symlink(target, self.path(name))

    def fifo(self, name):
        os.mkfifo(self.path(name))

    def folder_at(self, name):
        os.makedirs(self.path(name))

    def remove(self, name):
        """Removes a file, or a folder with all it holds, if it is there."""
        path = self.path(name)
        if os.path.isdir(path) and not os.path.islink(path):
            shutil.rmtree(path)
        elif os.path.lexists(path):
            os.unlink(path)

    def read(self, name):
        """The text of a file, "" when there is no such file."""
        try:
            with open(self.path(name), encoding="utf-8", newline="") as file:
                return file.read()
        except (FileNotFoundError, NotADirectoryError, IsADirectoryError):
            return ""

    def mode(self, name):
        return os.stat(self.path(name)).st_mode & 0o7777

    def native(self, name, file_name=None, **description):
        """Writes lib<name>.so into the plugin directory; see write_native_plugin()."""
        file_name = file_name or f"lib{name}.so"
        write_native_plugin(self.path(f"{PLUGINS}/{file_name}"), name, **description)

    def compiled(self, name, text, language="c", *options):
        """Compiles the text into lib<name>.so of the plugin directory."""
        content = PluginFactory.compile(text, language, *options)
        self.write(f"{PLUGINS}/lib{name}.so", content, 0o755)

    def odd_entry(self, name, kind):
        """Makes something that is no regular file; False where that is not allowed."""
        if kind == "device":
            return self.device(name, "zero")
        if kind == "link to a fifo":
            self.fifo("/tmp/fifo")
        {
            "fifo": lambda: self.fifo(name),
            "socket": lambda: self.socket(name),
            "folder": lambda: self.folder_at(name),
            "dangling link": lambda: self.symlink("nowhere", name),
            "link to itself": lambda: self.symlink(os.path.basename(name), name),
            "link to a fifo": lambda: self.symlink("/tmp/fifo", name),
        }[kind]()
        return True

    def device(self, name, kind):
        """Makes a device file; False where that is not allowed."""
        return self.isolation.make_device(self.path(name), kind)

    def socket(self, name):
        """Makes a socket that nobody listens at."""
        folder = os.open(os.path.dirname(self.path(name)), os.O_PATH | os.O_DIRECTORY)
        with socket.socket(socket.AF_UNIX, socket.SOCK_STREAM) as made:
            made.bind(f"/proc/self/fd/{folder}/{os.path.basename(name)}")
        os.close(folder)

    def debug_configuration(self, *lines):
        self.write(DEBUG_CONFIGURATION, "".join(line + "\n" for line in lines))

    def listing(self, folder=PLUGINS):
        """The names of a folder in the order in which its listing yields them."""
        with os.scandir(self.path(folder)) as entries:
            return [entry.name for entry in entries]

    def all_files(self):
        """The names of all files, but for those of the kernel."""
        found = set()
        for folder, folders, files in os.walk(self.folder):
            if folder == self.folder:
                folders.remove("proc")
            place = "/" + os.path.relpath(folder, self.folder)
            found |= {os.path.normpath(os.path.join(place, name)) for name in files}
        return found

    def plugins_in_order(self):
        """The native plugins' names in load order."""
        return [name[3:-3] for name in self.listing() if name.endswith(".so")]

    def ran(self):
        """What plugins and scripts noted in /tmp/ran, a line each."""
        return self.read("/tmp/ran").splitlines()

    def started(self):
        """The names of the native plugins whose start method ran, in that order."""
        lines = [line for line in self.ran() if line.startswith("start ")]
        return [line[len("start "):].rpartition(" ")[0] for line in lines]

    def alerts(self):
        """The texts of the system alerts, without their times."""
        return [line.partition(" ")[2] for line in self.read(SYSTEM_ALERTS).splitlines()]

    def run_once_record(self):
        """The content of the run-once record; fails when it is no whole gzip file."""
        with gzip.open(self.path(RUN_ONCE_RECORD), "rt", encoding="utf-8", newline="") as file:
            return file.read()

    def profiling_log(self):
        return self.read(PROFILING_LOG).splitlines()

    def temporary_files(self):
        """What an unfinished profiling log would leave behind."""
        return [os.path.basename(name) for name in glob.glob(self.path(PROFILING_LOG) + ".*")]

    def processes(self):
        """The ids of the processes that have this folder for their "/"."""
        found = []
        for entry in filter(str.isdigit, os.listdir("/proc")):
            try:
                if os.readlink(f"/proc/{entry}/root") == os.path.realpath(self.folder):
                    found.append(int(entry))
            except OSError:
                pass  # gone meanwhile, or another user's
        return found

    def remove_all(self):
        """Ends what still runs inside, undoes the mounts and removes the folder."""

        def nobody_left():
            for process in self.processes():
                try:
                    os.kill(process, signal.SIGKILL)
                except ProcessLookupError:
                    pass
            return not self.processes()

        wait_until(nobody_left, "the root's last process ends")
        self.syslog.close()
        self.isolation.remove_tree(self.folder)
