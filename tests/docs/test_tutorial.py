"""The tutorial of README.md: its commands are run as they stand, and what it shows must come."""

import os
import pathlib
import re
import shutil
import subprocess

import pytest

CHECKOUT = pathlib.Path(__file__).resolve().parents[2]
BUILD = os.path.realpath(os.environ.get("VANTOR_BUILD_DIR", CHECKOUT / "build" / "default"))
SECTION = "## A plugin in five minutes"
BLOCK = re.compile(r"^```sh\n(.*?)^```\n(?:```text\n(.*?)^```\n)?", re.MULTILINE | re.DOTALL)
LIMIT_SECONDS = 300
# What differs from boot to boot, with the same word for it on both sides.
VARYING = [
    (re.compile(r"\d{4}-\d\d-\d\d \d\d:\d\d:\d\d\.\d{6}"), "TIME"),
    (re.compile(r"\d{4}-\d\d-\d\dT\d\d:\d\d:\d\dZ"), "TIME"),
    (re.compile(r"took \d+ us"), "took N us"),
    (re.compile(r"^\d+ (?=\[label=)", re.MULTILINE), "ID "),
]


def tutorial():
    """The tutorial's steps in order: pairs of commands and the output that is shown for them."""
    text = (CHECKOUT / "README.md").read_text(encoding="utf-8")
    section = text.partition(f"\n{SECTION}\n")[2].partition("\n## ")[0]
    return [(commands, shown or "") for commands, shown in BLOCK.findall(section)]


def without_varying(text):
    for pattern, word in VARYING:
        text = pattern.sub(word, text)
    return text


@pytest.fixture(name="checkout")
def fixture_checkout(tmp_path):
    """A checkout whose build folder is the test's own, so that nobody's sandbox is disturbed."""
    for name in ("include", "tests", "examples"):
        (tmp_path / name).symlink_to(CHECKOUT / name)
    shutil.copytree(CHECKOUT / "scripts", tmp_path / "scripts")
    (tmp_path / "build").mkdir()
    (tmp_path / "build" / "default").symlink_to(BUILD)
    return tmp_path


def run(commands, checkout):
    """What a reader sees who pastes the commands; fails when one of them does."""
    environment = {name: value for name, value in os.environ.items() if name != "VANTOR_BUILD_DIR"}
    done = subprocess.run(
        ["bash", "-e", "-o", "pipefail", "-c", commands], cwd=checkout, env=environment,
        stdin=subprocess.DEVNULL, stdout=subprocess.PIPE, stderr=subprocess.STDOUT, text=True,
        timeout=LIMIT_SECONDS, check=False)
    assert done.returncode == 0, f"status {done.returncode} of\n{commands}\n{done.stdout}"
    return done.stdout


def test_every_fence_of_the_tutorial_belongs_to_a_step():
    text = (CHECKOUT / "README.md").read_text(encoding="utf-8")
    section = text.partition(f"\n{SECTION}\n")[2].partition("\n## ")[0]
    assert len(re.findall(r"^```", BLOCK.sub("", section), re.MULTILINE)) == 0
    assert len(tutorial()) >= 10


def test_the_tutorial_shows_what_its_commands_print(checkout):
    machine = [os.path.lexists(path) for path in ("/etc/nuvex", "/var/log/sysboot.log")]
    for commands, shown in tutorial():
        printed = run(commands, checkout)
        assert without_varying(printed) == without_varying(shown), commands
    assert (checkout / "build" / "tutorial" / "tree.svg").stat().st_size > 0
    assert machine == [os.path.lexists(path) for path in ("/etc/nuvex", "/var/log/sysboot.log")]


def test_the_sandbox_passes_on_the_status_of_its_command(checkout):
    script = checkout / "scripts" / "sandbox"
    for command, status in ((["true"], 0), (["sh", "-c", "exit 7"], 7),
                            (["sh", "-c", "kill -9 $$"], 137), (["no-such-command"], 127)):
        done = subprocess.run([script, *command], capture_output=True, text=True, check=False)
        assert done.returncode == status, done.stderr


def test_the_sandbox_keeps_files_but_not_those_of_the_last_boot(checkout):
    script = checkout / "scripts" / "sandbox"
    subprocess.run([script, "sh", "-c", "touch /var/log/kept /var/run/gone /tmp/gone"], check=True)
    left = subprocess.run([script, "ls", "/var/log", "/var/run", "/tmp"], check=True,
                          capture_output=True, text=True).stdout
    assert "kept" in left and "gone" not in left
    assert (checkout / "build" / "sandbox" / "var" / "log" / "kept").exists()


def test_the_sandbox_ends_what_its_command_left_running(checkout):
    script = checkout / "scripts" / "sandbox"
    subprocess.run([script, "sh", "-c", "sleep 1000 > /dev/null 2>&1 &"], check=True,
                   timeout=LIMIT_SECONDS)
    host = os.path.realpath(checkout / "build" / "sandbox")
    roots = []
    for process in filter(str.isdigit, os.listdir("/proc")):
        try:
            roots.append(os.readlink(f"/proc/{process}/root"))
        except OSError:
            pass  # gone meanwhile, or another user's
    assert roots and host not in roots
