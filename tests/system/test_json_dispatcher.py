"""The command descriptions that the program reads, when it does, and what it says of bad ones."""

import pytest

from harness.json_plugin import (
    DIRECTORIES, command, describe, describe_notes, failed, unparsed, write_plugin)
from harness.messages import starting
from harness.syslog_recorder import ERR

NOTE = "test note --text=x"
UNKNOWN = failed(NOTE, "net", 'unknown command "test note"; no command is known at all')


def refused(text):
    return (ERR, f"unable to add external directory to the nvcli dispatcher: {text}")


def missing(directory):
    return refused(f"{directory}: cannot read the directory: No such file or directory")


def test_missing_directories_are_told_in_their_order(root, vantor):
    write_plugin(root, "net", NOTE)
    assert vantor().messages == [
        *starting("net"), *(missing(directory) for directory in DIRECTORIES), UNKNOWN]


@pytest.mark.parametrize("number", range(1, 4))
def test_one_missing_directory_takes_no_command_of_the_others_away(root, vantor, number):
    describe_notes(root)
    gone = DIRECTORIES[number]
    root.remove(gone)
    write_plugin(root, "net", NOTE)
    below = [name for name in DIRECTORIES if name == gone or name.startswith(gone + "/")]
    assert vantor().messages == [*starting("net"), *(missing(name) for name in below)]
    assert root.ran() == ["x"]


def test_a_missing_directory_is_told_once_however_many_commands_run(root, vantor):
    describe_notes(root)
    root.remove(DIRECTORIES[3])
    write_plugin(root, "a", NOTE, NOTE, provides=["ready"])
    write_plugin(root, "b", NOTE, NOTE, requires=["ready"])
    assert vantor().messages == [*starting("a"), missing(DIRECTORIES[3]), *starting("b")]
    assert root.ran() == ["x"] * 4


@pytest.mark.parametrize("lines, messages", [
    ([], []),
    (["", "  ", "test note --help", "-h"], []),
    (["test '", '"'], [
        unparsed("net", 'the word "\'" has a single quote that is not closed'),
        unparsed("net", 'the word """ has a double quote that is not closed')]),
], ids=["no commands", "help", "parse errors"])
def test_descriptions_are_not_read_before_a_command_is_executed(root, vantor, lines, messages):
    write_plugin(root, "net", *lines)
    # Reading them would tell of every directory, none of which is there.
    assert vantor().messages == [*starting("net"), *messages]


@pytest.mark.parametrize("options", [
    ["--disable-plugins=net"], ["--dump-dependency-tree"],
    ["--invoke", "--method=none", "--plugin=net.json"]])
def test_descriptions_are_not_read_for_plugins_that_do_not_run(root, vantor, options):
    write_plugin(root, "net", NOTE)
    assert [text for _, text in vantor(*options).messages if "dispatcher" in text] == []


def test_all_four_directories_add_up(root, vantor):
    root.script("/usr/bin/note", 'echo "$*" >>/tmp/ran')
    for number, directory in enumerate(DIRECTORIES):
        describe(root, command(f"test n{number}", "/usr/bin/note", directory), directory=directory)
    write_plugin(root, "net", *(f"test n{number}" for number in (3, 1, 0, 2)))
    assert vantor().messages == starting("net")
    assert root.ran() == [DIRECTORIES[number] for number in (3, 1, 0, 2)]


def test_a_bad_file_is_told_with_its_place_and_the_good_ones_are_known(root, vantor):
    describe_notes(root)
    root.write(f"{DIRECTORIES[0]}/bad.json", '{"commands": [\n{"path": "a b",}]}')
    root.write(f"{DIRECTORIES[0]}/worse.json", '{"commands": 7}')
    root.write(f"{DIRECTORIES[0]}/.hidden.json", "no description")
    root.write(f"{DIRECTORIES[0]}/notes.txt", "no description")
    write_plugin(root, "net", NOTE)
    first, (priority, text), *others = vantor().messages
    bad, _, worse = text.rpartition("; ")
    assert [first] == starting("net") and others == []
    beginning = refused(f"{DIRECTORIES[0]}/bad.json: line 2, column 16: ")
    assert priority == ERR and bad.startswith(beginning[1])
    assert worse == f"{DIRECTORIES[0]}/worse.json: /commands: must be an array, not a number"
    assert root.ran() == ["x"]


def test_a_command_described_twice_is_a_mistake_of_the_later_file(root, vantor):
    describe_notes(root)
    describe(root, command("test note", "/usr/bin/false"), command("test other", "/usr/bin/note"),
             directory=DIRECTORIES[2], file_name="again.json")
    write_plugin(root, "net", NOTE, "test other")
    assert vantor().messages == [*starting("net"), refused(
        f'{DIRECTORIES[2]}/again.json: /commands/0/path: the command "test note" is described '
        f"already in {DIRECTORIES[0]}/notes.json")]
    assert root.ran() == ["x", ""]


@pytest.mark.parametrize("kind, reason", [
    ("fifo", "not a regular file"), ("folder", "not a regular file"),
    ("link", "cannot read the file: No such file or directory")])
def test_a_description_that_is_no_file(root, vantor, kind, reason):
    describe_notes(root)
    name = f"{DIRECTORIES[0]}/odd.json"
    if kind == "fifo":
        root.fifo(name)
    elif kind == "folder":
        root.folder_at(name)
    else:
        root.symlink("nowhere", name)
    write_plugin(root, "net", NOTE)
    assert vantor().messages == [*starting("net"), refused(f"{name}: {reason}")]
    assert root.ran() == ["x"]


def test_a_file_in_a_directorys_place(root, vantor):
    root.write(DIRECTORIES[0])
    write_plugin(root, "net", NOTE)
    assert vantor().messages == [
        *starting("net"),
        *(refused(f"{name}: cannot read the directory: Not a directory") for name in DIRECTORIES),
        UNKNOWN]


def test_descriptions_changed_during_the_boot_are_not_read_again(root, vantor):
    describe_notes(root)
    root.script("/usr/bin/forget", f"echo changed >{DIRECTORIES[0]}/notes.json")
    describe(root, command("test forget", "/usr/bin/forget"), file_name="forget.json")
    write_plugin(root, "net", "test forget", NOTE)
    assert vantor().messages == starting("net")
    assert root.ran() == ["x"]
