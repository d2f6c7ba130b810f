"""The run-once record on the boot bank."""

import subprocess

from harness.syslog_recorder import DEBUG, ERR, INFO

RECORD = "/bootbank/vantorbk.gz"


def test_the_record_is_one_gzip_file_with_a_bare_header(root, vantor):
    vantor("--run-once=b,a")
    done = subprocess.run(["gzip", "-dc", root.path(RECORD)], capture_output=True, check=True)
    assert done.stdout == b"vantor.run-once=a,b,\n"
    with open(root.path(RECORD), "rb") as file:
        content = file.read()
    magic, method, flags, time = content[:2], content[2], content[3], content[4:8]
    assert (magic, method, flags, time) == (b"\x1f\x8b", 8, 0, bytes(4))


def test_accepted_run_once_plugins_are_added_to_the_names_given(root, vantor):
    root.native("fresh", run_once=True, plugin_version="2.1-rc_1+x")
    root.native("bare", run_once=True)
    root.native("usual", plugin_version="9")
    root.native("off", run_once=True, plugin_version="1")
    vantor("--run-once=known", "--disable-plugins=off")
    assert root.run_once_record() == "vantor.run-once=bare,fresh2.1-rc_1+x,known,\n"
    assert sorted(root.started()) == ["bare", "fresh", "usual"]


def test_a_recorded_plugin_is_not_run_again(root, vantor):
    root.native("again", run_once=True, plugin_version="1.0")
    vantor()
    line = root.run_once_record().strip()
    known = line.partition("=")[2]
    result = vantor(f"--run-once={known}")
    assert result.messages == [
        (DEBUG, "ignoring plugin 'again' because version '1.0' has already been run")]
    assert root.started() == ["again"]
    assert root.run_once_record().strip() == line


def test_the_record_keeps_cleaned_keys_and_the_look_up_takes_raw_ones(root, vantor):
    root.native("odd name", run_once=True, plugin_version="1/0 é")
    vantor()
    assert root.run_once_record() == "vantor.run-once=oddname10,\n"
    # The cleaned key is never found, so the plugin runs each time ...
    again = vantor("--run-once=oddname10")
    assert again.messages == [(INFO, "executing start plugin: odd name")]
    # ... and the raw one is.
    third = vantor("--run-once=odd name1/0 é")
    assert third.messages == [
        (DEBUG, "ignoring plugin 'odd name' because version '1/0 é' has already been run")]
    assert root.started() == ["odd name", "odd name"]
    assert root.run_once_record() == "vantor.run-once=odd name1/0 é,\n"


def test_of_two_alike_in_one_load_the_second_finds_the_key_of_the_first(root, vantor):
    root.native("same", run_once=True, plugin_version="1")
    result = vantor("--plugin=libsame.so,libsame.so")
    assert result.messages == [
        (DEBUG, "ignoring plugin 'same' because version '1' has already been run"),
        (INFO, "executing start plugin: same")]
    assert root.started() == ["same"]


def test_of_two_alike_with_odd_keys_both_are_run(root, vantor):
    root.native("same", run_once=True, plugin_version="1:0")
    vantor("--plugin=libsame.so,libsame.so")
    assert root.started() == ["same", "same"]
    assert root.run_once_record() == "vantor.run-once=same10,\n"


def test_an_invocation_writes_the_record_too(root, vantor):
    root.native("alpha", run_once=True, plugin_version="7")
    vantor("--invoke", "--method=start", "--plugin=libalpha.so")
    assert root.run_once_record() == "vantor.run-once=alpha7,\n"


def test_the_record_replaces_the_one_before(root, vantor):
    root.write(RECORD, b"x" * 5000)
    vantor("--run-once=a")
    assert root.run_once_record() == "vantor.run-once=a,\n"


def test_many_long_names_are_recorded_whole(root, vantor):
    names = [f"name{number:05}" + "x" * 90 for number in range(900)]
    vantor("--run-once=" + ",".join(reversed(names)))
    assert root.run_once_record() == "vantor.run-once=" + "".join(n + "," for n in names) + "\n"


def test_the_record_is_written_after_every_plugin_and_before_the_profiling_log(root, vantor):
    root.debug_configuration(
        f"late:x:y:ls {RECORD} /var/log/sysboot.log >/tmp/there 2>/dev/null")
    vantor()
    assert root.read("/tmp/there") == ""
    assert root.exists(RECORD)


def test_a_record_that_cannot_be_opened_is_reported(root, vantor):
    root.native("alpha")
    root.remove("/bootbank")
    result = vantor()
    text = f"unable to write run-once record ({RECORD}): No such file or directory"
    assert result.messages == [(INFO, "executing start plugin: alpha"), (ERR, text)]
    assert result.status == 0
    assert "sysboot: alpha" in root.read("/var/log/sysboot.log")


def test_a_folder_in_the_records_place_is_reported(root, vantor):
    root.folder_at(RECORD)
    result = vantor()
    text = f"unable to write run-once record ({RECORD}): Is a directory"
    assert (result.status, result.messages) == (0, [(ERR, text)])
