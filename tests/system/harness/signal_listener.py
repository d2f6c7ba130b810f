"""A process of our own that tells which signals it was sent."""

import signal
import subprocess
import sys

from harness.waiting import LIMIT_SECONDS

_PROGRAM = """
import signal
expected = [signal.SIGUSR1, signal.SIGUSR2]
signal.pthread_sigmask(signal.SIG_BLOCK, expected)
print("ready", flush=True)
while True:
    found = signal.sigwaitinfo(expected)
    print(signal.Signals(found.si_signo).name, found.si_pid, flush=True)
    if found.si_signo == signal.SIGUSR2:
        break
"""


class SignalListener:
    """Stands in for a running daemon; use it as a context."""

    def __enter__(self):
        self._process = subprocess.Popen([sys.executable, "-S", "-c", _PROGRAM],
                                         stdout=subprocess.PIPE, text=True)
        self.pid = self._process.pid
        assert self._process.stdout.readline() == "ready\n"
        return self

    def signals(self):
        """The signals received, as pairs of name and sender; this ends the listening.

        A signal of our own marks the end: of several pending ones, the lowest number comes first.
        """
        self._process.send_signal(signal.SIGUSR2)
        output, _ = self._process.communicate(timeout=LIMIT_SECONDS)
        lines = [line.split() for line in output.splitlines()]
        return [(name, int(sender)) for name, sender in lines if name != "SIGUSR2"]

    def __exit__(self, *exception):
        if self._process.poll() is None:
            self._process.kill()
            self._process.communicate()
