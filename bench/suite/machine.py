"""The machine that is measured on, as far as it matters for the figures."""

import os
import platform
import time


def description():
    """Processor and number of cores, kernel and word size: nothing that names the machine."""
    model = "unknown processor"
    with open("/proc/cpuinfo", encoding="utf-8", errors="replace") as lines:
        for line in lines:
            if line.startswith("model name"):
                model = line.partition(":")[2].strip()
                break
    kernel = ".".join(platform.release().split("-")[0].split(".")[:2])
    return f"{model}, {len(os.sched_getaffinity(0))} cores, Linux {kernel}"


def _times():
    with open("/proc/stat", encoding="ascii") as file:
        numbers = [int(word) for word in file.readline().split()[1:9]]
    return sum(numbers), numbers[3] + numbers[4]  # all, and idle or waiting for a disk


def other_load(seconds=0.5):
    """The share of the processors that others use while this process sleeps, from 0 to 1."""
    total, idle = _times()
    time.sleep(seconds)
    later_total, later_idle = _times()
    spent = later_total - total
    return 1 - (later_idle - idle) / spent if spent else 0.0
