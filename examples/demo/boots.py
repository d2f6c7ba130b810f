"""The runs of the demo, and what is kept of each."""

import os
import re
import subprocess
from collections import Counter
from types import SimpleNamespace

import harness
from harness.base_root import compile_program
from harness.private_root import RUN_ONCE_RECORD
from harness.runner import Run
from harness.sanitizers import Sanitizers
from harness.waiting import wait_until

import sample_host

TRACED = re.compile(r"(starting|completed) execution of plugin: (\S+)(?: \(took \d+ us\))?")
PROFILED = re.compile(r"\[(.{26}) - (.{26})\] sysboot: (.*)")


class Boot:
    """One run of the program: its result, and the files that it left, read right after it."""

    def __init__(self, result, root):
        self.status, self.output, self.errors = result.status, result.stdout, result.stderr
        self.messages, self.texts = result.syslog, result.texts
        self.profile, self.record = root.profiling_log(), _record(root)
        self.services = root.read(sample_host.SERVICES).splitlines()
        self.alerts = root.alerts()

    def traced(self):
        """How often each plugin was traced, by ("starting" or "completed", name)."""
        found = [TRACED.fullmatch(line) for line in self.output.splitlines()]
        return Counter((match[1], match[2]) for match in found if match)

    def times(self):
        """The start and the end of every plugin by its name, as texts that sort by time."""
        found = [PROFILED.fullmatch(line) for line in self.profile]
        return {match[3]: (match[1], match[2]) for match in found if match}


def _record(root):
    """The run-once record as an administrator reads it, "" when there is none."""
    if not root.exists(RUN_ONCE_RECORD):
        return ""
    return subprocess.run(["gzip", "-dc", root.path(RUN_ONCE_RECORD)], stdout=subprocess.PIPE,
                          text=True, check=True).stdout


class Host:
    """Runs the program in a laid-out root."""

    def __init__(self, root, isolation, folder):
        self._root = root
        self._session = SimpleNamespace(
            enter=os.path.join(folder, "enter"), sanitizers=Sanitizers([], isolation.has_proc))
        programs = os.path.join(os.path.dirname(harness.__file__), "programs")
        compile_program(os.path.join(programs, "enter.c"), self._session.enter)

    def run(self, *options):
        result = Run(self._root, self._session, options).wait()
        if "--init" in options:
            wait_until(lambda: "read again" in self._root.read(sample_host.SERVICES),
                       "the log daemon reads its configuration again")
        return Boot(result, self._root)

    def by_hand(self, *words):
        """What nvcli makes of a command line: a Result."""
        return Run(self._root, self._session, words, program="/usr/bin/nvcli").wait()
