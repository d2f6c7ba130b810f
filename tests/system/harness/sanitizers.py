"""Sanitizer builds: their options, and the rule that no report goes unseen."""

import os
import re
import subprocess

from harness.base_root import BuildError, compile_program

EXIT_STATUS = 86
_REPORT = re.compile(
    r"ERROR: \w+Sanitizer|WARNING: ThreadSanitizer|FATAL: \w+Sanitizer|\w+Sanitizer:DEADLYSIGNAL|"
    r"SUMMARY: \w+Sanitizer|\w+Sanitizer CHECK failed|LeakSanitizer has encountered|: runtime error: ")
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

    def __init__(self, names, isolation, folder):
        self.names, self.notice = names, ""
        self._has_proc = isolation.has_proc
        self._detect_leaks = False
        if "asan" in names:
            if not self._has_proc:
                self.notice = "no /proc inside the private roots (no mount namespace is allowed)"
            elif not self._leaks_are_seen(folder):
                self.notice = "ptrace is denied"
            self._detect_leaks = not self.notice

    @staticmethod
    def _leaks_are_seen(folder):
        """Whether a program that leaks is reported here, or the leak check says that it cannot."""
        source, program = os.path.join(folder, "leak.c"), os.path.join(folder, "leak")
        with open(source, "w", encoding="utf-8") as file:
            file.write(_LEAK)
        compile_program(source, program, "-fsanitize=address")
        done = subprocess.run(
            [program], capture_output=True, text=True, check=False,
            env={"ASAN_OPTIONS": f"detect_leaks=1:exitcode={EXIT_STATUS}"})
        if _NO_PTRACE in done.stderr:
            return False
        if done.returncode != EXIT_STATUS:
            raise BuildError(f"a leak goes unseen: status {done.returncode}\n{done.stderr}")
        return True

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

    def prepare(self, root):
        """Stands in for the two files of /proc in which the sanitizers look for themselves."""
        if self.names and not self._has_proc:
            variables = [f"{name}={value}\0" for name, value in self.environment().items()]
            root.write("/proc/self/environ", "".join(variables))
            os.symlink("/usr/sbin/vantor", root.path("/proc/self/exe"))

    def enter_options(self):
        """The thread sanitizer finds no room for its shadow among randomised addresses."""
        return ["-a"] if "tsan" in self.names else []
