"""A host: a copy of a Debian root, in which commands run as they would on a machine."""

import os
import shutil
import subprocess

from harness.isolation import Isolation
from harness.syslog_recorder import SyslogRecorder

PLUGINS = "/usr/libexec/vantor/plugins"
RECORD = "/bootbank/vantorbk.gz"
# What the package manager itself keeps, of whatever packages come and go.
MANAGERS_OWN = (
    "/var/lib/dpkg/", "/var/lib/apt/", "/var/cache/apt/", "/var/cache/ldconfig/",
    "/var/cache/debconf/", "/var/log/", "/etc/ld.so.cache", "/var/lib/systemd/",
)


class CommandFailed(Exception):
    """A command on the host that had to succeed."""


class Host:
    """Names are those inside the host, with the leading slash."""

    def __init__(self, pristine, folder, isolation):
        self.folder, self.has_proc, self._syslog = folder, isolation.has_proc, None
        # A copied host may have something mounted; that is not copied.
        subprocess.run(["cp", "-a", "--one-file-system", pristine, folder], check=True)
        if isolation.has_proc:
            isolation.mount_proc(folder)

    def path(self, name):
        """The name outside of a name inside."""
        # On the host this is a link that, followed from outside, leads to this machine's own.
        if name.startswith("/var/run/"):
            name = name[len("/var"):]
        return os.path.join(self.folder, name.lstrip("/"))

    def reach_mirrors(self):
        """Name servers and proxy are this machine's."""
        for name in ("/etc/resolv.conf", "/etc/hosts"):
            shutil.copyfile(name, self.path(name))
        settings = subprocess.run(
            ["apt-config", "dump"], capture_output=True, text=True, check=True).stdout
        self.write("/etc/apt/apt.conf.d/90proxy", "".join(
            line + "\n" for line in settings.splitlines() if line.startswith("Acquire::http")))

    def write(self, name, content="", mode=0o644):
        os.makedirs(os.path.dirname(self.path(name)), exist_ok=True)
        data = content if isinstance(content, bytes) else content.encode()
        with open(self.path(name), "wb") as file:
            file.write(data)
        os.chmod(self.path(name), mode)

    def script(self, name, *lines):
        self.write(name, "#!/bin/sh\n" + "".join(line + "\n" for line in lines), 0o755)

    def read(self, name):
        """The text of a file, "" when there is none."""
        try:
            with open(self.path(name), encoding="utf-8") as file:
                return file.read()
        except FileNotFoundError:
            return ""

    def exists(self, name):
        return os.path.lexists(self.path(name))

    def remove(self, name):
        if self.exists(name):
            os.unlink(self.path(name))

    def try_run(self, *command):
        """Runs a command to its end, whatever that is."""
        environment = {
            "PATH": "/usr/sbin:/usr/bin:/sbin:/bin", "HOME": "/root", "LC_ALL": "C",
            "DEBIAN_FRONTEND": "noninteractive",
        }
        return subprocess.run(
            ["chroot", self.folder, *command], env=environment, stdin=subprocess.DEVNULL,
            capture_output=True, text=True, timeout=300, check=False)

    def run(self, *command):
        """The standard output of a command that has to succeed."""
        done = self.try_run(*command)
        if done.returncode != 0:
            raise CommandFailed(f"{' '.join(command)}\n{done.stdout}{done.stderr}")
        return done.stdout

    def take_in(self, *debs):
        """Copies packages onto the host and returns their names there."""
        names = [f"/tmp/{os.path.basename(deb.path)}" for deb in debs]
        for name, deb in zip(names, debs):
            shutil.copyfile(deb.path, self.path(name))
        return names

    def apt_install(self, *debs):
        """Installs packages and, from the mirrors, what they depend on."""
        names = self.take_in(*debs)
        self.run("apt-get", "install", "-y", "--no-install-recommends", "-o",
                 "Dpkg::Options::=--force-confold", *names)
        for name in names:
            self.remove(name)

    def dpkg_install(self, *debs):
        """Installs packages whose dependencies are there; returns the finished process."""
        return self.try_run("dpkg", "--force-confold", "-i", *self.take_in(*debs))

    def state_of(self, package):
        done = self.try_run("dpkg-query", "-W", "-f=${db:Status-Status}", package)
        return done.stdout or "unknown"

    def names(self):
        """All files and folders but those of the package manager's own."""
        found = set()
        for folder, folders, files in os.walk(self.folder):
            if folder == self.folder:
                folders.remove("proc")
            place = os.path.normpath("/" + os.path.relpath(folder, self.folder))
            found |= {os.path.join(place, name) for name in folders + files}
        return {name for name in found if not name.startswith(MANAGERS_OWN)} | {
            name for name in found if name.startswith(("/var/log/sysboot", "/var/log/vantor"))}

    @property
    def syslog(self):
        """The host's system log, which listens from its first use on."""
        self._syslog = self._syslog or SyslogRecorder(self.path("/dev"))
        return self._syslog

    def close(self):
        if self._syslog:
            self._syslog.close()
        Isolation.remove_tree(self.folder)
