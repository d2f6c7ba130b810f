"""Runs of the program inside a private root."""

import subprocess
from dataclasses import dataclass, field

from harness import sanitizers, stand_in_proc
from harness.streams import PipeRecorder
from harness.waiting import LIMIT_SECONDS, all_threads_asleep, is_asleep, wait_until

PROGRAM = "/usr/sbin/vantor"
LIMITS = {"file_size": "-f", "open_files": "-n", "stack_size": "-s"}
ENVIRONMENT = {"PATH": "/usr/sbin:/usr/bin:/sbin:/bin"}


@dataclass
class Result:
    """What one finished run left: its exit status, its two outputs, its syslog messages."""

    command: list
    status: int
    stdout: str
    stderr: str
    syslog: list = field(default_factory=list)

    @property
    def messages(self):
        """The syslog messages as pairs of priority and text."""
        return [(message.priority, message.text) for message in self.syslog]

    def texts(self, priority):
        """The texts of the messages of one priority."""
        return [message.text for message in self.syslog if message.priority == priority]

    def __str__(self):
        lines = [f"<{message.priority}> {message.text}" for message in self.syslog]
        return "\n".join([
            f"command: {' '.join(self.command)}", f"status:  {self.status}",
            f"stdout:\n{self.stdout}", f"stderr:\n{self.stderr}", "syslog:", *lines])


class Run:
    """A run under way; wait() ends it.

    stdin, stdout   descriptors in place of no input and of a recorded output
    program         what is run, by its name inside the root
    environment     further variables
    cwd             the working directory, inside the root
    group_leader    the program leads a process group, so that it cannot make a session
    leaked          numbers of descriptors that are open for the program besides the standard ones
    limits          file_size, open_files, stack_size: the resource limits of those names
    """

    def __init__(self, root, session, arguments, stdin=None, stdout=None, program=PROGRAM,
                 environment=None, cwd="/", group_leader=False, leaked=(), **limits):
        self._root, self._command = root, [program, *arguments]
        self._pipes = [PipeRecorder(), PipeRecorder()]
        options = session.sanitizers.enter_options() + ["-c", cwd]
        options += ["-g"] if group_leader else []
        for limit, value in limits.items():
            options += [LIMITS[limit], str(value)]
        for number in leaked:
            options += ["-l", str(number)]
        variables = {**ENVIRONMENT, **session.sanitizers.environment(), **(environment or {})}
        self._process = subprocess.Popen(
            [session.enter, *options, root.folder, *self._command],
            stdin=subprocess.DEVNULL if stdin is None else stdin,
            stdout=self._pipes[0].write_end if stdout is None else stdout,
            stderr=self._pipes[1].write_end, env=variables)
        self.pid, self._result = self._process.pid, None
        root.runs.append(self)
        if session.sanitizers.needs_stand_in_proc:
            stand_in_proc.complete(root, self.pid)

    def stdout_so_far(self):
        return self._pipes[0].so_far()

    def reads(self):
        """How many read calls the program has made."""
        with open(f"/proc/{self.pid}/io", encoding="ascii") as file:
            return int(dict(line.split(": ") for line in file)["syscr"])

    def has_ended(self):
        return self._process.poll() is not None

    def wait_until(self, condition, what):
        """Waits for a condition that the run brings about, but no longer than the run lasts."""

        def met():
            ended = self.has_ended()
            value = condition()
            if ended and not value:
                raise AssertionError(f"the run ended before {what}\n{self.wait()}")
            return value

        return wait_until(met, what)

    def wait_until_asleep(self):
        """Waits until the main thread does nothing but wait: for nodes, or for a child."""
        self.wait_until(lambda: is_asleep(self.pid), "the main thread waits")

    def wait_until_every_thread_sleeps(self):
        """Waits until no thread has anything left to do by itself."""
        self.wait_until(lambda: all_threads_asleep(self.pid), "every thread waits")

    def wait(self):
        """The result; fails when the program hangs or its sanitizer reports anything."""
        result = self.wait_unchecked()
        sanitizers.check(result.status, result.stderr)
        return result

    def wait_unchecked(self):
        """As wait(), with sanitizer reports left in the result."""
        try:
            return self._collect(self._process.wait(LIMIT_SECONDS))
        except subprocess.TimeoutExpired:
            raise AssertionError(f"the program hangs\n{self.abandon()}") from None

    def abandon(self):
        """Ends the program at once, its children being the root's to end; the result so far."""
        if not self.has_ended():
            self._process.kill()
        return self._collect(self._process.wait())

    def _collect(self, status):
        if self._result is None:
            self._result = Result(self._command, status, self._pipes[0].take(),
                                  self._pipes[1].take(), self._root.syslog.take())
            for pipe in self._pipes:
                pipe.close()
        return self._result
