"""A disk without room: the old report stays, nothing is left behind, and it is said."""

import os
import re

import pytest

from harness.syslog_recorder import ERR, WARNING

LOG = "/var/log/sysboot.log"
RECORD = "/bootbank/vantorbk.gz"
OLD = "the report of an earlier boot\n"


def assert_the_old_report_stays(root, result, error):
    [text] = result.texts(WARNING)
    assert re.fullmatch(
        r"unable to log profiling information: unable to write '/var/log/sysboot\.log\.\w{6}': "
        + error, text), text
    assert result.status == 0
    assert root.read(LOG) == OLD
    assert root.mode(LOG) == 0o640
    assert root.temporary_files() == []


def test_files_that_may_not_grow(root, vantor):
    root.write(LOG, OLD, mode=0o640)
    result = vantor("--run-once=a", file_size=16)
    assert_the_old_report_stays(root, result, "File too large")
    assert result.texts(ERR) == [f"unable to write run-once record ({RECORD}): File too large"]


def test_a_log_longer_than_a_buffer_that_fails_half_way(root, vantor):
    for number in range(150):
        root.native(f"plugin{number:03}", start=None)
    root.write(LOG, OLD, mode=0o640)
    result = vantor(file_size=10000)
    assert_the_old_report_stays(root, result, "File too large")
    assert result.texts(ERR) == []


def test_a_file_system_without_a_free_block(root, vantor):
    if not root.isolation.mount_tmpfs(root.path("/var/log"), 8192):
        pytest.skip("a small file system can only be mounted, which is not allowed here")
    root.write(LOG, OLD, mode=0o640)
    root.write("/var/log/filler", "x" * 4096)
    result = vantor()
    assert_the_old_report_stays(root, result, "No space left on device")
    assert sorted(os.listdir(root.path("/var/log"))) == ["filler", "sysboot.log"]


def test_a_record_without_room_is_reported_and_the_log_written(root, vantor):
    if "full" not in root.devices:
        pytest.skip("no /dev/full can be made here")
    os.symlink("/dev/full", root.path(RECORD))
    result = vantor()
    text = f"unable to write run-once record ({RECORD}): No space left on device"
    assert (result.status, result.messages) == (0, [(ERR, text)])
    assert len(root.profiling_log()) == 9


def test_alerts_without_room_fail_nothing(root, vantor):
    root.write("/usr/libexec/vantor/plugins/libbad.so", "")
    root.folder_at("/var/run/nuvex/system-alerts")
    result = vantor()
    assert result.status == 0
    assert len(result.texts(WARNING)) == 1
