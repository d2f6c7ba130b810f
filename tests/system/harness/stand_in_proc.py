"""What the sanitizers need of /proc, inside a root into which the machine's own cannot be mounted.

They find their options, the program, its memory map and its threads there. Without the map the
address sanitizer does not know the first thread's stack and reports errors that are none; without
the threads no leak is looked for. The map exists only once the program has been executed, so the
program is stopped there (`enter -p` asks to be traced), the map copied, and the program let go.
"""

import ctypes
import os

PTRACE_DETACH = 17

_libc = ctypes.CDLL(None, use_errno=True)
_libc.ptrace.argtypes = [ctypes.c_long] * 4


def lay_out(root, environment):
    """Writes what is known before a run."""
    root.write("/proc/self/environ", "".join(f"{k}={v}\0" for k, v in environment.items()))
    root.symlink("/usr/sbin/vantor", "/proc/self/exe")


def complete(root, process):
    """Writes what is known once the traced process has executed its program, and lets it run.

    To be called by the thread that made the process.
    """
    found = os.waitid(os.P_PID, process, os.WEXITED | os.WSTOPPED | os.WNOWAIT)
    if found.si_code != os.CLD_TRAPPED:
        return  # it has failed before that, and says why
    os.waitpid(process, 0)
    with open(f"/proc/{process}/maps", "rb") as file:
        root.write("/proc/self/maps", file.read())
    # The only thread left when leaks are looked for; the parent's id shows that it lives.
    root.write(f"/proc/{process}/task/{process}/status", "PPid:\t1\n")
    if _libc.ptrace(PTRACE_DETACH, process, 0, 0) != 0:
        error = ctypes.get_errno()
        raise OSError(error, f"ptrace: {os.strerror(error)}")
