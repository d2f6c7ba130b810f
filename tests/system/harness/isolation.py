"""How this session turns a folder into the program's "/": the only place that asks for privileges.

"mount"   A mount namespace of our own (as an ordinary user inside a user namespace of our own).
          /proc is seen inside the roots, which the sanitizers need, and device files are bound
          into them where they cannot be made.
"chroot"  Plain chroot as root, for a container that allows neither mounts nor namespaces. There
          is no /proc inside the roots.

VANTOR_TEST_ISOLATION=chroot|mount asks for one of them; without it the first that works is taken.
"""

import ctypes
import errno
import os
import shutil
import stat

CLONE_NEWNS, CLONE_NEWUSER = 0x00020000, 0x10000000
MS_RDONLY, MS_REMOUNT, MS_BIND, MS_REC, MS_PRIVATE = 1, 32, 4096, 16384, 1 << 18
MS_NOSUID, MS_NODEV = 2, 4
MNT_DETACH = 2

DEVICES = {"null": (1, 3), "zero": (1, 5), "full": (1, 7), "tty": (5, 0)}

_libc = ctypes.CDLL(None, use_errno=True)


class IsolationError(Exception):
    """Neither way works here, or not the one that was asked for."""


def _call(name, *arguments):
    if getattr(_libc, name)(*arguments) != 0:
        error = ctypes.get_errno()
        raise OSError(error, f"{name}: {os.strerror(error)}")


def _bytes(path):
    return None if path is None else os.fsencode(path)


def _mount(source, target, kind, flags, data=None):
    flags = ctypes.c_ulong(flags)
    _call("mount", _bytes(source), _bytes(target), _bytes(kind), flags, _bytes(data))


def _write(path, text):
    with open(path, "w", encoding="ascii") as file:
        file.write(text)


def _enter_mount_namespace():
    """Moves this process into a mount namespace of its own; whatever it mounts ends with it."""
    uid, gid = os.geteuid(), os.getegid()
    try:
        _call("unshare", CLONE_NEWNS)
    except OSError:
        _call("unshare", CLONE_NEWNS | CLONE_NEWUSER)
        _write("/proc/self/setgroups", "deny")
        _write("/proc/self/uid_map", f"0 {uid} 1")
        _write("/proc/self/gid_map", f"0 {gid} 1")
    _mount(None, "/", None, MS_REC | MS_PRIVATE)


class Isolation:
    """The way in use, and the privileged operations on a root that depend on it."""

    def __init__(self, wanted):
        if wanted not in ("", "chroot", "mount"):
            raise IsolationError(f"VANTOR_TEST_ISOLATION={wanted}: neither chroot nor mount")
        self.way = wanted
        reason = ""
        if wanted != "chroot":
            try:
                _enter_mount_namespace()
                self.way = "mount"
            except OSError as error:
                reason = f"no mount namespace ({error})"
                if wanted == "mount":
                    raise IsolationError(reason) from error
        if self.way != "mount":
            self.way = "chroot"
            if os.geteuid() != 0:
                raise IsolationError(
                    f"{reason or 'chroot was asked for'}, and only root can chroot")

    @property
    def has_proc(self):
        """Whether the roots hold a /proc."""
        return self.way == "mount"

    def mount_proc(self, root):
        """Shows this machine's /proc inside the root, the kernel's settings read-only."""
        target = os.path.join(root, "proc")
        _mount("/proc", target, None, MS_BIND | MS_REC)
        try:
            _mount("/proc/sys", os.path.join(target, "sys"), None, MS_BIND)
            flags = MS_BIND | MS_REMOUNT | MS_RDONLY | MS_NOSUID | MS_NODEV
            _mount(None, os.path.join(target, "sys"), None, flags)
        except OSError:
            pass  # an extra safety only: nothing of ours writes there

    def mount_tmpfs(self, folder, size="50%"):
        """Puts a file system in memory over the folder; False where that is not allowed."""
        if self.way != "mount":
            return False
        _mount("tmpfs", folder, "tmpfs", 0, f"size={size},mode=755")
        return True

    def make_device(self, path, name):
        """Makes the device file, or binds the machine's own; False when neither works."""
        try:
            os.mknod(path, 0o666 | stat.S_IFCHR, os.makedev(*DEVICES[name]))
            os.chmod(path, 0o666)
            os.close(os.open(path, os.O_WRONLY | os.O_NOCTTY))
            return True
        except OSError as error:
            # ENXIO: /dev/tty works, but this process has no terminal.
            if os.path.exists(path) and error.errno == errno.ENXIO:
                return True
        if os.path.lexists(path):
            os.unlink(path)  # made, but of no use: the file system is mounted without devices
        if self.way != "mount":
            return False
        with open(path, "w", encoding="ascii"):
            pass
        _mount(f"/dev/{name}", path, None, MS_BIND)
        return True

    @staticmethod
    def mounts_below(folder):
        """The mount points at or below the folder, outermost first."""
        folder = os.path.realpath(folder)
        found = []
        with open("/proc/self/mountinfo", "rb") as lines:
            for line in lines:
                point = line.split()[4].decode("unicode_escape")
                if point == folder or point.startswith(folder + "/"):
                    found.append(point)
        return sorted(found, key=len)

    @staticmethod
    def remove_tree(folder):
        """Undoes every mount at or below a folder and removes it: nothing outside is reached.

        A mount goes together with those inside it: an ordinary user may not take them one by one.
        """
        left = Isolation.mounts_below(folder)
        while left:
            _call("umount2", _bytes(left[0]), MNT_DETACH)
            before, left = left, Isolation.mounts_below(folder)
            if len(left) >= len(before):
                raise IsolationError(f"still mounted, so not removed: {left}")
        shutil.rmtree(folder)
