"""Waiting for conditions. The limit is there for hung programs only, never to measure them."""

import os
import time

LIMIT_SECONDS = 300


def wait_until(condition, what):
    """Returns the condition's first true value; fails, naming what never came, at the limit."""
    end = time.monotonic() + LIMIT_SECONDS
    while True:
        value = condition()
        if value:
            return value
        if time.monotonic() > end:
            raise AssertionError(f"waited {LIMIT_SECONDS} s in vain until {what}")
        time.sleep(0.002)


def _sleeps(process, thread):
    try:
        with open(f"/proc/{process}/task/{thread}/stat", encoding="ascii") as file:
            return file.read().rpartition(")")[2].split()[0] == "S"
    except (FileNotFoundError, ProcessLookupError):
        return False


def is_asleep(process):
    """Whether the first thread of a process waits for something: another thread, a child, input."""
    return _sleeps(process, process)


def all_threads_asleep(process):
    """Whether every thread of a process waits."""
    try:
        threads = os.listdir(f"/proc/{process}/task")
    except FileNotFoundError:
        return False
    return all(_sleeps(process, thread) for thread in threads)
