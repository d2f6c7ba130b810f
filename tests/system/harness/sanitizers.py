"""Sanitizer builds: their options, and the rule that no report goes unseen."""

import re

from harness.base_root import BuildError, compile_program

EXIT_STATUS = 86
_REPORT = re.compile(
    r"ERROR: \w+Sanitizer|WARNING: ThreadSanitizer|FATAL: \w+Sanitizer|\w+Sanitizer:DEADLYSIGNAL|"
    r"SUMMARY: \w+Sanitizer|\w+Sanitizer CHECK failed|LeakSanitizer has encountered|"
    r": runtime error: ")
_NO_PTRACE = "LeakSanitizer has encountered a fatal error"
_LEAK = """
#include <stdlib.h>
void* volatile lost;
__attribute__((noinline)) static void Leak(void) {
    for (int i = 0; i < 10; ++i) {
        lost = malloc(99);
    }
    lost = NULL;
}
int main(void) {
    Leak();
    return 0;
}
"""


class SanitizerReport(AssertionError):
    """The program under test was reported by its sanitizer."""


def check(status, stderr):
    """Fails when a run was ended, or commented on, by a sanitizer."""
    if status == EXIT_STATUS or _REPORT.search(stderr):
        raise SanitizerReport(f"status {status}, sanitizer report:\n{stderr}")


class Sanitizers:
    """What the sanitizers of the build under test need; nothing at all for a build without any.

    `notice` says what is not looked for on this machine, "" when everything is.
    """

    def __init__(self, names, has_proc):
        self.names, self.notice = names, ""
        self._detect_leaks = "asan" in names
        self.needs_stand_in_proc = bool(names) and not has_proc

    def probe_leaks(self, root, run):
        """Checks that a program which leaks is reported inside a root.

        `run` runs a program of the root and returns its result. Where the leak check says itself
        that it cannot work, it is turned off and the notice says so.
        """
        if not self._detect_leaks:
            return
        root.write("/tmp/leak.c", _LEAK)
        compile_program(root.path("/tmp/leak.c"), root.path("/usr/bin/leak"), "-fsanitize=address")
        result = run("/usr/bin/leak")
        if _NO_PTRACE in result.stderr:
            self._detect_leaks, self.notice = False, "ptrace is denied"
        elif result.status != EXIT_STATUS:
            raise BuildError(f"a leak goes unseen\n{result}")

    def environment(self):
        """The options' variables."""
        if not self.names:
            return {}
        common = f"exitcode={EXIT_STATUS}:print_stacktrace=1"
        return {
            "ASAN_OPTIONS": f"{common}:detect_leaks={int(self._detect_leaks)}",
            "UBSAN_OPTIONS": f"{common}:halt_on_error=1",
            "TSAN_OPTIONS": f"{common}:halt_on_error=0",
        }

    def enter_options(self):
        """The thread sanitizer finds no room for its shadow among randomised addresses."""
        return (["-a"] if "tsan" in self.names else []) + (
            ["-p"] if self.needs_stand_in_proc else [])
