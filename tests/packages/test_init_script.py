"""The init script alone, with its paths in a temporary folder and a program that says its words."""

import gzip
import os
import re
import shutil
import subprocess

import pytest

KEYS = "vantor.run-once=identity1.2,setup3,\n"
NO_RECORD = "booting as if no run-once plugin had run"


class Script:
    """The script of the sources, for another program, defaults file and record."""

    def __init__(self, source, folder):
        self.folder = str(folder)
        self.defaults, self.record = f"{folder}/defaults", f"{folder}/record.gz"
        self.program = f"{folder}/program"
        self.install_program("printf '<%s>' \"$@\"")
        with open(os.path.join(source, "packaging", "vantor.init"), encoding="utf-8") as file:
            text = file.read()
        self.analyzer = f"{folder}/analyzer"
        for name, path in [("PROGRAM", self.program), ("DEFAULTS", self.defaults),
                           ("RECORD", self.record), ("ANALYZER", self.analyzer)]:
            text, count = re.subn(rf"(?m)^{name}=.*$", f"{name}='{path}'", text)
            assert count == 1, f"the script sets {name} {count} times"
        self.path = f"{folder}/script"
        self._write(self.path, text)

    @staticmethod
    def _write(path, text, mode=0o755):
        with open(path, "w", encoding="utf-8") as file:
            file.write(text)
        os.chmod(path, mode)

    def install_program(self, *lines):
        self._write(self.program, "#!/bin/sh\n" + "\n".join(lines) + "\n")

    def install_analyzer(self, *lines):
        self._write(self.analyzer, "#!/bin/sh\n" + "\n".join(lines) + "\n")

    def set_defaults(self, text):
        self._write(self.defaults, text, 0o644)

    def set_record(self, text):
        with open(self.record, "wb") as file:
            file.write(gzip.compress(text.encode()))

    def call(self, *arguments, **environment):
        return subprocess.run(
            [self.path, *arguments], capture_output=True, text=True, check=False, timeout=60,
            stdin=subprocess.DEVNULL, env={"PATH": "/usr/bin:/bin"} | environment)

    def boot(self):
        """The words that the program got, and what was said on standard error."""
        done = self.call("start")
        assert done.returncode == 0
        return re.findall(r"<([^>]*)>", done.stdout), done.stderr


@pytest.fixture(name="script")
def fixture_script(source, tmp_path):
    made = Script(source, tmp_path)
    made.set_record(KEYS)
    return made


def test_without_settings_the_boot_is_serial_and_flagless(script):
    assert script.boot() == (["--init", "--run-once=identity1.2,setup3,"], "")


def test_the_shipped_settings_are_those_of_no_settings(script, source):
    with open(os.path.join(source, "packaging", "vantor.default"), encoding="utf-8") as file:
        script.set_defaults(file.read())
    assert script.boot() == (["--init", "--run-once=identity1.2,setup3,"], "")


def test_each_setting_becomes_its_option(script):
    script.set_defaults("VANTOR_PARALLEL=yes\nVANTOR_PLUGIN_FLAGS=debug,noroutes\n"
                        "VANTOR_OPTIONS='\n--trace\n--disable-plugins=telemetry\n'\n")
    assert script.boot() == ([
        "--init", "--parallel", "--plugin-flags=debug,noroutes",
        "--run-once=identity1.2,setup3,", "--trace", "--disable-plugins=telemetry"], "")


NAMES = "a b,*,$HOME,`id`,\"q\",\\n,~,[a-z]?,;&|"


def test_names_arrive_as_they_were_written(script):
    script.set_defaults(f"VANTOR_PLUGIN_FLAGS='{NAMES}'\n"
                        f"VANTOR_OPTIONS='\n--disable-plugins={NAMES}\n'\n")
    script.set_record(f"vantor.run-once={NAMES},\n")
    assert script.boot() == ([
        "--init", f"--plugin-flags={NAMES}", f"--run-once={NAMES},",
        f"--disable-plugins={NAMES}"], "")


def test_a_single_quote_arrives_too(script):
    script.set_defaults("VANTOR_PLUGIN_FLAGS=\"it's,'b'\"\n")
    script.set_record("vantor.run-once=it's1,\n")
    assert script.boot()[0] == ["--init", "--plugin-flags=it's,'b'", "--run-once=it's1,"]


def test_settings_may_be_computed(script):
    script.set_defaults("PATH=/nowhere\nset -eu\nif [ -e / ]; then VANTOR_PARALLEL=yes; fi\n"
                        "cd /\necho said; false || true\n")
    assert script.boot() == (["--init", "--parallel", "--run-once=identity1.2,setup3,"], "")


def test_options_that_the_program_does_not_take_are_left_out(script):
    script.install_program(
        "for word; do case $word in --trce)",
        "    echo \"$0: unrecognized option '$word'\" >&2; echo Try --help. >&2; exit 1",
        "esac; done",
        "printf '<%s>' \"$@\"")
    script.set_defaults("VANTOR_PARALLEL=yes\nVANTOR_OPTIONS='\n--verbose\n--trce\n'\n")
    assert script.boot() == (
        ["--init", "--parallel", "--run-once=identity1.2,setup3,"],
        f"vantor: {script.defaults}: VANTOR_OPTIONS: unrecognized option '--trce'; "
        "booting without them\n")


def test_the_environment_sets_nothing(script):
    done = script.call("start", VANTOR_PARALLEL="yes", VANTOR_PLUGIN_FLAGS="debug",
                       VANTOR_OPTIONS="--trace")
    assert done.stdout == "<--init><--run-once=identity1.2,setup3,>"


@pytest.mark.parametrize("text", [
    "VANTOR_PARALLEL=yes\nVANTOR_PLUGIN_FLAGS='debug\n",
    "VANTOR_PARALLEL=yes\nif then fi\n",
    "VANTOR_PARALLEL=yes\nexit 0\n",
    "VANTOR_PARALLEL=yes\nexit 7\n",
    "VANTOR_PARALLEL=yes\nset -u\necho $nowhere\n",
    "VANTOR_PARALLEL=yes\n)(\n",
    "VANTOR_PARALLEL=yes\nkill -9 $(sh -c 'echo $PPID')\n",
])
def test_a_defaults_file_that_breaks_off_is_left_out(script, text):
    script.set_defaults(text)
    words, said = script.boot()
    assert words == ["--init", "--run-once=identity1.2,setup3,"]
    assert said == f"vantor: {script.defaults} does not run to its end; booting without it\n"


def test_a_folder_in_the_place_of_the_defaults_file(script):
    os.mkdir(script.defaults)
    words, said = script.boot()
    assert words == ["--init", "--run-once=identity1.2,setup3,"]
    assert said == f"vantor: {script.defaults} is no file; booting without it\n"


def test_a_wrong_answer_about_parallel_boots_serially(script):
    script.set_defaults("VANTOR_PARALLEL=maybe\nVANTOR_PLUGIN_FLAGS=debug\n")
    words, said = script.boot()
    assert words == ["--init", "--plugin-flags=debug", "--run-once=identity1.2,setup3,"]
    assert said == (f"vantor: {script.defaults}: VANTOR_PARALLEL is neither yes nor no; "
                    "booting serially\n")


def test_an_empty_record_needs_no_option(script):
    script.set_record("vantor.run-once=\n")
    assert script.boot() == (["--init"], "")


def test_a_missing_record(script):
    os.unlink(script.record)
    assert script.boot() == (["--init"], f"vantor: {script.record} is missing; {NO_RECORD}\n")


@pytest.mark.parametrize("cut", [0, 1, 9, 20, -1])
def test_a_torn_record(script, cut):
    with open(script.record, "rb") as file:
        content = file.read()
    with open(script.record, "wb") as file:
        file.write(content[:cut])
    assert script.boot() == (
        ["--init"], f"vantor: {script.record} is no whole gzip file; {NO_RECORD}\n")


def test_a_record_that_was_never_compressed(script):
    with open(script.record, "w", encoding="utf-8") as file:
        file.write(KEYS)
    assert script.boot() == (
        ["--init"], f"vantor: {script.record} is no whole gzip file; {NO_RECORD}\n")


@pytest.mark.parametrize("text, problem", [
    ("", "holds something else"),
    ("\n", "holds something else"),
    ("vantor.run-once", "holds something else"),
    ("vantor.run-once=a,", "holds something else"),
    ("other=a,\n", "holds something else"),
    (" vantor.run-once=a,\n", "holds something else"),
    ("vantor.run-once=a,\nvantor.run-once=b,\n", "holds several lines"),
    ("vantor.run-once=a,\n\n", "holds several lines"),
    ("vantor.run-once=" + "a" * 131061 + "\n", "is too long"),
])
def test_a_record_of_other_content(script, text, problem):
    script.set_record(text)
    assert script.boot() == (["--init"], f"vantor: {script.record} {problem}; {NO_RECORD}\n")


def test_the_longest_record_that_the_kernel_takes(script):
    keys = "a" * (131071 - len("--run-once="))
    script.set_record(f"vantor.run-once={keys}\n")
    assert script.boot() == (["--init", f"--run-once={keys}"], "")


def test_a_folder_in_the_place_of_the_record(script):
    os.unlink(script.record)
    os.mkdir(script.record)
    assert script.boot() == (["--init"], f"vantor: {script.record} is no file; {NO_RECORD}\n")


@pytest.mark.parametrize("action", ["start", "restart"])
def test_the_status_is_the_programs(script, action):
    script.install_program("exit 1")
    assert script.call(action).returncode == 1
    script.install_program("exit 0")
    assert script.call(action).returncode == 0


@pytest.mark.parametrize("action, status", [
    ("stop", 0), ("force-reload", 0), ("try-restart", 0), ("status", 3), ("reload", 3),
    ("bogus", 2), ("", 2),
])
def test_other_actions_run_nothing(script, action, status):
    script.install_program(f"touch {script.folder}/ran")
    assert script.call(action).returncode == status
    assert not os.path.exists(f"{script.folder}/ran")


def test_status_while_a_boot_is_under_way(script):
    # As the program itself does: the process is of the file, not of an interpreter of it.
    shutil.copy("/bin/sleep", script.program)
    with subprocess.Popen([script.program, "60"]) as running:
        try:
            done = script.call("status")
        finally:
            running.kill()
    assert (done.returncode, done.stdout) == (0, "vantor is booting the host\n")


def test_verify_filters_as_the_next_boot_does(script):
    script.install_analyzer("printf '<%s>' \"$@\"", "exit 2")
    script.set_defaults("VANTOR_PARALLEL=yes\nVANTOR_PLUGIN_FLAGS='a,b c'\nVANTOR_OPTIONS='\n"
                        "--trace\n--disable-plugins=x y,*\n--plugin-flags=last\n'\n")
    done = script.call("verify")
    assert (re.findall(r"<([^>]*)>", done.stdout), done.stderr, done.returncode) == (
        ["verify", "--plugin-flags=a,b c", "--run-once=identity1.2,setup3,",
         "--disable-plugins=x y,*", "--plugin-flags=last"], "", 2)


def test_verify_says_nothing_of_settings_that_only_a_boot_needs(script):
    script.install_analyzer("printf '<%s>' \"$@\"")
    os.remove(script.record)
    script.set_defaults("VANTOR_PARALLEL=perhaps\n")
    done = script.call("verify")
    assert (done.stdout, done.stderr, done.returncode) == ("<verify>", "", 0)


def test_verify_without_the_analyzer_does_nothing(script):
    done = script.call("verify")
    assert (done.stdout, done.stderr, done.returncode) == ("", "", 0)


def test_a_script_that_a_removed_package_left_does_nothing(script):
    os.unlink(script.program)
    done = script.call("start")
    assert (done.returncode, done.stdout, done.stderr) == (0, "", "")


def test_the_header_tells_init_when_to_run_it(source):
    with open(os.path.join(source, "packaging", "vantor.init"), encoding="utf-8") as file:
        text = file.read()
    header = re.search(r"(?s)### BEGIN INIT INFO\n(.*)### END INIT INFO\n", text)[1]
    fields = dict(re.findall(r"(?m)^# ([A-Z][\w-]+): *(.*)$", header))
    assert fields["Provides"] == "vantor"
    assert fields["Required-Start"].split() == ["$local_fs", "$remote_fs"]
    assert fields["Default-Start"].split() == ["2", "3", "4", "5"]
    assert fields["Default-Stop"] == ""
