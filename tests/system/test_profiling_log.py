"""The boot profiling log: its lines, its mode, and what becomes of it when it cannot be written."""

import math
import re
import time
from datetime import datetime, timezone

from harness.syslog_recorder import ERR, WARNING

LOG = "/var/log/sysboot.log"
TIME = r"\d{4}-\d\d-\d\d \d\d:\d\d:\d\d\.\d{6}"
OLD = "the report of an earlier boot\n"


def uptime():
    with open("/proc/uptime", encoding="ascii") as file:
        return float(file.read().split()[0])


def seconds(text):
    """A time of the log, which is UTC, in seconds since the epoch."""
    parsed = datetime.strptime(text, "%Y-%m-%d %H:%M:%S.%f")
    return parsed.replace(tzinfo=timezone.utc).timestamp()


def test_every_line_of_the_log(root, vantor):
    root.native("alpha")
    root.native("beta")
    root.debug_configuration("inject:x:y:true")
    vantor("--randomize=-5", "--verbose")
    text = root.read(LOG)
    names = root.plugins_in_order() + ["inject"]
    assert re.fullmatch(
        r"NVKernel Initialization Time: \d+\n"
        + "".join(rf"\[{TIME} - {TIME}\] sysboot: {name}\n" for name in names)
        + "=== Vantor configuration info ===\n"
        + rf" Start: {TIME}\n End: {TIME}\n"
        + " Verbose: 1\n Parallel: 0\n Randomize: 1\n Interactive Mode: 0\n Random Seed: -5\n",
        text), text


def test_times_are_utc_whatever_the_time_zone(root, vantor):
    root.native("alpha")
    before = time.time()
    vantor(environment={"TZ": "EAST-11:30"})
    after = time.time()
    times = [seconds(text) for text in re.findall(TIME, root.read(LOG))]
    assert len(times) == 4
    first, last, begin, end = times
    # The log keeps whole microseconds.
    assert before - 0.000002 <= begin <= first <= last <= end <= after + 0.000002


def test_the_kernels_initialisation_time_is_the_uptime_in_whole_seconds(root, vantor):
    before = uptime()
    vantor()
    after = uptime()
    value = int(root.profiling_log()[0].rpartition(" ")[2])
    assert value % 1000000 == 0
    assert math.floor(before) <= value // 1000000 <= math.ceil(after) + 1


def test_a_new_log_is_its_owners_alone(root, vantor):
    vantor()
    assert root.mode(LOG) == 0o600


def test_a_replaced_log_keeps_its_mode(root, vantor):
    root.write(LOG, OLD, mode=0o644)
    vantor()
    assert root.mode(LOG) == 0o644
    assert root.profiling_log()[0].startswith("NVKernel Initialization Time: ")
    assert OLD not in root.read(LOG)
    assert root.temporary_files() == []


def test_an_open_log_keeps_showing_its_reader_the_report_it_opened(root, vantor):
    root.write(LOG, OLD)
    with open(root.path(LOG), encoding="utf-8") as reader:
        vantor()
        assert reader.read() == OLD


def test_the_plugins_that_did_not_run_are_listed_with_zero_times(root, vantor):
    root.native("again", run_once=True, plugin_version="1.0")
    vantor("--run-once=again1.0")
    zero = "1970-01-01 00:00:00.000000"
    assert root.profiling_log()[1] == f"[{zero} - {zero}] sysboot: again"


def test_a_missing_log_directory_is_reported(root, vantor):
    root.remove("/var/log")
    result = vantor()
    text = "unable to open profiling log (/var/log/sysboot.log): No such file or directory"
    assert result.messages == [(ERR, text)]
    assert result.status == 0
    assert not root.exists("/var/log")


def test_a_log_directory_that_is_a_file_is_reported(root, vantor):
    root.remove("/var/log")
    root.write("/var/log", OLD)
    result = vantor()
    text = "unable to open profiling log (/var/log/sysboot.log): Not a directory"
    assert result.messages == [(ERR, text)]
    assert (result.status, root.read("/var/log")) == (0, OLD)


def test_a_destination_that_cannot_be_replaced_is_reported(root, vantor):
    root.folder_at(LOG)
    result = vantor()
    [(priority, text)] = result.messages
    assert priority == WARNING
    assert re.fullmatch(
        r"unable to log profiling information: unable to rename '/var/log/sysboot\.log\.\w{6}' "
        r"to '/var/log/sysboot\.log': Is a directory", text), text
    assert (result.status, root.temporary_files()) == (0, [])
