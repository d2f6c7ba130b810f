"""What vantor-analyze reads of a boot and writes, and what it refuses to."""

import os
import pty
import threading

import pytest

from harness.sample_boot import LOG, NO_HOST, NO_PLUGINS, lay_out
from harness.terminal import written_on


def test_without_the_plugins_of_the_host_the_log_alone_is_read(analyze, boot):
    done = analyze("blame", boot[0], NO_HOST)
    assert (done.status, done.stderr) == (
        0, "note: 'disks', 'look', 'slow': only in the log, taken to provide and require nothing\n"
        + NO_PLUGINS)
    assert len(done.stdout.splitlines()) == 5


def test_a_directory_that_is_named_must_be_there(analyze, boot):
    done = analyze("blame", boot[0], "--directory=/nonexistent")
    assert (done.status, done.stdout, done.stderr) == (
        3, "", "vantor-analyze: /nonexistent: No such file or directory\n")


def test_the_log_of_a_host_stays_within_the_host(analyze, root):
    lay_out(root)
    root.write("/var/log/real.log", LOG)
    root.remove("/var/log/sysboot.log")
    root.symlink("/var/log/real.log", "/var/log/sysboot.log")
    done = analyze("blame", "--root", root.folder)
    assert done.status == 0
    assert "disks" in done.stdout
    root.remove("/var/log/sysboot.log")
    root.fifo("/var/log/sysboot.log")
    done = analyze("blame", "--root", root.folder)
    assert (done.status, done.stdout, done.stderr) == (
        3, "", f"vantor-analyze: {root.folder}/var/log/sysboot.log: not a regular file\n")


@pytest.mark.parametrize("option", ["LOG", "--dot"])
def test_no_more_is_read_than_a_boot_can_leave(analyze, boot, option):
    if not os.path.exists("/dev/zero"):
        pytest.skip("there is no /dev/zero here")
    arguments = ["/dev/zero"] if option == "LOG" else [boot[0], "--dot=/dev/zero"]
    done = analyze("blame", *arguments)
    assert (done.status, done.stdout, done.stderr) == (
        3, "", "vantor-analyze: /dev/zero: longer than any boot leaves: more than 268435456 "
        "bytes\n")


@pytest.mark.parametrize("verb", ["plot", "trace"])
def test_what_is_read_is_not_overwritten(analyze, boot, verb):
    drawing = boot[2]
    for path in (boot[0], drawing):
        with open(path, "rb") as file:
            content = file.read()
        done = analyze(verb, *boot, f"--output={path}")
        assert (done.status, done.stdout, done.stderr) == (
            3, "", f"vantor-analyze: {path}: is what the result is made from, not overwritten\n")
        with open(path, "rb") as file:
            assert file.read() == content


def test_what_a_host_says_is_not_overwritten_under_another_name(analyze, root, vantor):
    lay_out(root)
    assert vantor("--parallel").status == 0
    content = root.read("/var/log/sysboot.log")
    root.write("/data/boot.log", content)
    root.remove("/var/log/sysboot.log")
    root.symlink("/data/boot.log", "/var/log/sysboot.log")
    plugin = root.path("/usr/libexec/vantor/plugins/libdisks.so")
    for verb, path in (("plot", root.path("/data/boot.log")), ("trace", plugin), ("graph", plugin)):
        done = analyze(verb, "--root", root.folder, "--output", path)
        assert (done.status, done.stdout) == (3, ""), verb
        assert done.stderr.endswith(": is what the result is made from, not overwritten\n"), verb
    assert root.read("/data/boot.log") == content
    with open(plugin, "rb") as file:
        assert file.read(4) == b"\x7fELF"


def test_a_result_replaces_an_earlier_one_as_a_whole(analyze, boot, tmp_path):
    output = tmp_path / "boot.json"
    output.write_text("x" * 100000, encoding="utf-8")
    os.chmod(output, 0o640)
    assert analyze("trace", *boot, "--output", str(output)).status == 0
    assert output.read_text(encoding="utf-8") == analyze("trace", *boot).stdout
    assert os.stat(output).st_mode & 0o777 == 0o640
    assert sorted(os.listdir(tmp_path)) == ["boot.json", "boot.log", "tree.dot"]


def test_a_log_without_a_name_is_not_the_hosts(analyze):
    done = analyze("blame", "")
    assert (done.status, done.stdout) == (3, "")
    assert "the file has no name" in done.stderr


@pytest.mark.parametrize("option", ["--dot", "--output"])
def test_a_file_without_a_name_is_refused(analyze, boot, option):
    done = analyze("trace", boot[0], f"{option}=")
    assert (done.status, done.stdout) == (3, "")
    assert f"{option}: the file has no name" in done.stderr


@pytest.mark.parametrize("verb, what", [
    ("plot", b"drawing the boot"), ("blame", b"reading the boot"), ("chain", b"reading the boot"),
    ("trace", b"reading the boot"), ("simulate", b"reading the boot"),
    ("diff", b"comparing the boots")])
def test_a_verb_that_takes_long_says_so_on_a_terminal(analyze, boot, tmp_path, verb, what):
    os.mkfifo(tmp_path / "slow.log")
    ours, theirs = pty.openpty()
    said = b""

    def write_slowly():
        nonlocal said
        with open(tmp_path / "slow.log", "w", encoding="utf-8") as log:
            # The line stands there from the first second on; the log comes only behind it.
            while b")" not in said:
                said += os.read(ours, 4096)
            log.write(LOG)

    writer = threading.Thread(target=write_slowly)
    writer.start()
    other = boot[:1] if verb == "diff" else []
    done = analyze(verb, str(tmp_path / "slow.log"), *other, *boot[1:], stderr=theirs)
    writer.join()
    os.close(theirs)
    rest = written_on(ours)
    assert done.status == 0
    assert said.startswith(b"\r" + what + b" (1 s)")
    assert rest.endswith(b"\r\x1b[K")
    assert done.stdout != ""
