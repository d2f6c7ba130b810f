"""nvcli on the host: the commands of JSON plugins, tried by hand."""

import pytest

from harness.json_plugin import (
    DIRECTORIES, NVCLI, command, describe, describe_notes, make_directories, option, shell_command)
from harness.messages import NVCLI_USAGE


@pytest.fixture
def nvcli(root, vantor):
    """nvcli(word...) runs it; its status and both of its outputs."""
    if not root.exists(NVCLI):
        pytest.skip("this build has no nvcli")

    def run(*words, **how):
        result = vantor(*words, program=NVCLI, **how)
        assert result.messages == []
        return result.status, result.stdout, result.stderr

    return run


@pytest.mark.parametrize("words", [[], ["--help"], ["-h"]])
def test_it_lists_every_namespace_and_command(root, nvcli, words):
    describe_notes(root)
    describe(root, command("net firewall set", "/usr/bin/true", summary="Opens a port"),
             command("reboot", "/usr/bin/true", summary="Starts again"), directory=DIRECTORIES[3])
    assert nvcli(*words) == (0, NVCLI_USAGE + """
Commands without a namespace:
  reboot  Starts again

net firewall:
  set     Opens a port

test:
  fail    For the tests
  note    For the tests
""", "")


def test_a_host_that_describes_nothing(nvcli):
    assert nvcli() == (0, NVCLI_USAGE + "\nNo command is described.\n", "")


def test_the_page_of_a_namespace(root, nvcli):
    describe_notes(root)
    assert nvcli("test", "--help") == (0, """\
Usage: nvcli test COMMAND [COMMAND'S OPTION]...

test:
  fail  For the tests
  note  For the tests
""", "")


def test_the_page_of_a_command(root, nvcli):
    describe(root, command("net set", "/usr/bin/true", summary="Opens a port", options=[
        option("port", "integer", letter="p", required=True, summary="The port's number"),
        option("state", "choice", values=["open", "closed"], summary="What becomes of it"),
        option("force", "flag", letter="f"),
    ]))
    assert nvcli("net", "set", "--help") == (0, f"""\
Usage: nvcli net set --port=INTEGER [OPTION]...

Opens a port

Options:
  -p, --port=INTEGER       The port's number (required)
      --state=open|closed  What becomes of it
  -f, --force
  -h, --help               Show this page

Described in {DIRECTORIES[0]}/commands.json
""", "")


def test_a_command_that_succeeds(root, nvcli):
    shell_command(root, "test talk", "echo result", "echo warning >&2")
    assert nvcli("test", "talk") == (0, "result\n", "warning\n")


def test_words_reach_the_command_as_the_shell_gave_them(root, nvcli):
    describe_notes(root)
    for words in (["--text=a b"], ["--text", "it's"], ["-t", '"'], ["-t\\ $x"]):
        assert nvcli("test", "note", *words) == (0, "", "")
    assert root.ran() == ["a b", "it's", '"', "\\ $x"]


def test_a_command_that_fails(root, nvcli):
    describe_notes(root)
    assert nvcli("test", "fail", "--text=x") == (
        1, "", 'nvcli: "/usr/bin/fail" ended with exit status 3: no x\n')


def test_a_program_that_cannot_be_executed(root, nvcli):
    describe(root, command("test gone", "/usr/bin/gone"))
    assert nvcli("test", "gone") == (
        1, "", 'nvcli: cannot execute "/usr/bin/gone": No such file or directory\n')


@pytest.mark.parametrize("words, error", [
    (["test", "nota"], 'unknown command "test nota"; the nearest known one is "test note"'),
    (["tset", "--help"], 'unknown command "tset"; the nearest known one is "test note"'),
    (["test"], '"test" is a namespace and needs a command word, as in "test fail"'),
    (["test", "note"], 'the command "test note" needs the option "--text"'),
    (["test", "note", "--text"], 'the option "--text" needs a value'),
    (["test", "note", "--text=x", "y"], 'the value "y" belongs to no option'),
    (["--text=x"], 'nvcli itself has no option "--text=x"; those of a command stand behind its '
                   "words"),
    (["--directory"], 'the option "--directory" needs a value'),
])
def test_a_bad_command_line_executes_nothing(root, nvcli, words, error):
    describe_notes(root)
    assert nvcli(*words) == (2, "", f"nvcli: {error}\n")
    assert root.ran() == []


def test_named_directories_take_the_place_of_the_hosts(root, nvcli):
    describe_notes(root)
    describe(root, command("other talk", "/usr/bin/echo", "talk"), directory="/tmp/one")
    describe(root, command("more talk", "/usr/bin/echo", "more"), directory="/tmp/two")
    both = ["--directory=/tmp/one", "--directory", "two"]
    assert nvcli(*both, "other", "talk", cwd="/tmp") == (0, "talk\n", "")
    assert nvcli(*both, "more", "talk", cwd="/tmp") == (0, "more\n", "")
    assert nvcli(*both, "test", "note", "-tx", cwd="/tmp") == (
        2, "", 'nvcli: unknown command "test note"; the nearest known one is "more talk"\n')


def test_bad_descriptions_are_reported_and_the_command_is_what_counts(root, nvcli):
    describe_notes(root)
    root.write(f"{DIRECTORIES[1]}/bad.json", "[]")
    report = f"nvcli: {DIRECTORIES[1]}/bad.json: must be an object, not an array\n"
    assert nvcli("test", "note", "-tx") == (0, "", report)
    status, output, errors = nvcli("test", "--help")
    assert (status, errors) == (1, report)
    assert "note  For the tests\n" in output


def test_a_missing_directory_that_was_named_is_reported(root, nvcli):
    make_directories(root)
    status, output, errors = nvcli("--directory=/none", "--help")
    assert (status, output) == (1, NVCLI_USAGE + "\nNo command is described.\n")
    assert errors == "nvcli: /none: cannot read the directory: No such file or directory\n"


def test_a_result_that_cannot_be_written(root, nvcli):
    shell_command(root, "test talk", "echo result")
    if "full" not in root.devices:
        pytest.skip("no /dev/full here")
    with open(root.path("/dev/full"), "wb") as full:
        assert nvcli("test", "talk", stdout=full) == (
            1, "", "nvcli: cannot write the output\n")
