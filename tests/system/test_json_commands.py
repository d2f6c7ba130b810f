"""What becomes of the commands of JSON plugins."""

import pytest

from harness.json_plugin import (
    command, describe, describe_notes, failed, option, shell_command, unparsed, write_plugin)
from harness.messages import starting
from harness.waiting import wait_until

PROFILE = "/etc/nuvex/hostprofile.xml"
FAILED = '"/usr/bin/fail" ended with exit status 3: no'


@pytest.fixture(autouse=True)
def notes(root):
    describe_notes(root)


def test_commands_run_in_the_order_of_the_document(root, vantor):
    write_plugin(root, "net", "test note --text=one", "test note -t two", "test note -tthree")
    result = vantor()
    assert (result.status, result.stdout, result.stderr) == (0, "", "")
    assert result.messages == starting("net")
    assert root.ran() == ["one", "two", "three"]
    assert root.alerts() == []


def test_a_failed_command_keeps_none_of_the_others_from_running(root, vantor):
    lines = [f"test {word} --text={text}"
             for word, text in (("note", "a"), ("fail", "b"), ("note", "c"))]
    write_plugin(root, "net", *lines, provides=["ready"])
    root.native("after", start=None, requires=["ready"])
    result = vantor("--trace")
    assert root.ran() == ["a", "b", "c"]
    assert result.messages == [
        *starting("net"), failed(lines[1], "net", f"{FAILED} b"), *starting("after")]
    # The plugin itself counts as run.
    assert "completed execution of plugin: net" in result.stdout
    assert result.status == 0


def test_a_host_profile_operation_is_named_in_the_messages(root, vantor):
    root.write(PROFILE)
    write_plugin(root, "net", "test note -t start",
                 apply=["test fail -t b", "test note -t c", "test '"])
    result = vantor()
    assert root.ran() == ["b", "c"]
    assert result.messages[1:] == [
        failed("test fail -t b", "net", f"{FAILED} b", "apply host profile"),
        unparsed("net", 'the word "\'" has a single quote that is not closed',
                 "apply host profile"),
    ]


def test_a_value_is_one_argument_whatever_is_in_it(root, vantor):
    shell = "$(touch /tmp/oops); `false` * > /tmp/oops & \\ \" '"
    root.script("/usr/bin/count", 'echo "$# $1" >>/tmp/ran')
    describe(root, command("test count", "/usr/bin/count", "${text}", options=[option("text")]))
    quoted = shell.replace("'", "'\\''")
    write_plugin(root, "net", f"test count --text='{quoted}'")
    assert vantor().messages == starting("net")
    assert root.ran() == [f"1 {shell}"]
    assert not root.exists("/tmp/oops")


def test_percent_signs_of_a_command_are_no_format(root, vantor):
    line = "test fail --text=100%s%n%d"
    write_plugin(root, "5%s", line, "no%n such%s")
    assert vantor().messages == [
        *starting("5%s"), failed(line, "5%s", f"{FAILED} 100%s%n%d"),
        failed("no%n such%s", "5%s",
               'unknown command "no%n such%s"; the nearest known one is "test fail"')]


@pytest.mark.parametrize("line, error", [
    ("test nota --text=x",
     'unknown command "test nota"; the nearest known one is "test note"'),
    ("test", '"test" is a namespace and needs a command word, as in "test fail"'),
    ("test note", 'the command "test note" needs the option "--text"'),
    ("test note --text=", 'the option "--text" needs a value'),
    ("test note -tx --text=y", 'the option "--text" is given twice'),
])
def test_a_command_that_cannot_be_executed_as_it_stands(root, vantor, line, error):
    write_plugin(root, "net", line, "test note --text=next")
    assert vantor().messages == [*starting("net"), failed(line, "net", error)]
    assert root.ran() == ["next"]


def test_each_error_of_one_command_is_a_message_of_its_own(root, vantor):
    write_plugin(root, "net", "test note --size=4 -x")
    assert vantor().messages == [*starting("net"), *(
        failed("test note --size=4 -x", "net", error) for error in (
            'the command "test note" has no option "--size"',
            'the command "test note" has no option "-x"',
            'the command "test note" needs the option "--text"'))]


@pytest.mark.parametrize("line, errors", [
    ('test note "open',
     ['the word ""open" has a double quote that is not closed']),
    ("test note --text='open wide",
     ["the word \"--text='open wide\" has a single quote that is not closed"]),
    ("test note \\", ['the word "\\" has a backslash with nothing after it']),
    ("--text=x",
     ['the command line starts with the option "--text=x": nvcli needs the words of a command '
      "before it"]),
    ("test '' --text=x", ['the command word after "test" is empty']),
    ("test note --=x", ['the option "--=x" has no name']),
    ("test note --text a b", ['the value "b" belongs to no option']),
    ("test note - stray --=1",
     ['the option "-" has no name', 'the value "stray" belongs to no option',
      'the option "--=1" has no name']),
])
def test_a_command_line_that_does_not_parse_is_logged_and_not_executed(root, vantor, line, errors):
    write_plugin(root, "net", line, "test note --text=next")
    assert vantor().messages == [
        *starting("net"), *(unparsed("net", error) for error in errors)]
    assert root.ran() == ["next"]


@pytest.mark.parametrize("line", [
    "", " \t ", "--help", "-h", "test note --help", "test note --text=x -h", "no such --help",
    "test note stray --text --help"])
def test_nothing_is_executed_or_said_of_a_blank_line_or_one_that_asks_for_help(root, vantor, line):
    write_plugin(root, "net", line, "test note --text=next")
    result = vantor()
    assert (result.stdout, result.stderr, result.messages) == ("", "", starting("net"))
    assert root.ran() == ["next"]


def test_a_program_that_is_missing(root, vantor):
    describe(root, command("test gone", "/usr/bin/gone"))
    write_plugin(root, "net", "test gone", "test note --text=next")
    error = 'cannot execute "/usr/bin/gone": No such file or directory'
    assert vantor().messages == [*starting("net"), failed("test gone", "net", error)]
    assert root.ran() == ["next"]


def test_a_program_that_may_not_be_executed(root, vantor):
    root.write("/usr/bin/plain", "text\n")
    describe(root, command("test plain", "/usr/bin/plain"))
    write_plugin(root, "net", "test plain")
    error = 'cannot execute "/usr/bin/plain": Permission denied'
    assert vantor().messages == [*starting("net"), failed("test plain", "net", error)]


def test_a_program_that_is_killed(root, vantor):
    shell_command(root, "test kill", "echo last words >&2", "kill -9 $$")
    write_plugin(root, "net", "test kill")
    error = '"/usr/bin/test-kill" was killed by signal 9: last words'
    assert vantor().messages == [*starting("net"), failed("test kill", "net", error)]


@pytest.mark.parametrize("written, said", [
    ("", ""), ("printf 'two\\nlines\\n\\n' >&2", ": two\nlines"), ("echo result", "")])
def test_a_failure_is_told_with_what_was_written_on_standard_error(root, vantor, written, said):
    shell_command(root, "test end", written, "exit 42")
    write_plugin(root, "net", "test end")
    error = f'"/usr/bin/test-end" ended with exit status 42{said}'
    result = vantor()
    assert result.messages == [*starting("net"), failed("test end", "net", error)]
    assert (result.stdout, result.stderr) == ("", "")


def test_what_a_command_that_succeeds_writes_is_not_shown(root, vantor):
    shell_command(root, "test talk", "echo result", "echo warning >&2")
    write_plugin(root, "net", "test talk")
    result = vantor()
    assert (result.stdout, result.stderr, result.messages) == ("", "", starting("net"))


# 300,000 bytes on each stream, in turns: either pipe alone would fill long before the end.
FLOOD = ["line=0123456789012345678901234567890123456789012345678",
         "line=$line.$line", 'line="$line $line $line $line $line $line $line $line $line $line"',
         "for i in 1 2 3; do for j in 1 2 3 4 5 6 7 8 9 0; do for k in 1 2 3 4 5 6 7 8 9 0; do",
         'echo "$line"; echo "$line" >&2', "done; done; done", "echo flooded >>/tmp/ran"]


def flood():
    """What the script writes on either stream."""
    part = "0123456789012345678901234567890123456789012345678"
    return (" ".join([f"{part}.{part}"] * 10) + "\n") * 300


def test_a_command_that_prints_more_than_pipes_hold_comes_to_its_end(root, vantor):
    shell_command(root, "test flood", *FLOOD)
    write_plugin(root, "net", "test flood", "test note --text=next")
    result = vantor()
    assert (result.stdout, result.stderr, result.messages) == ("", "", starting("net"))
    assert root.ran() == ["flooded", "next"]


def test_of_a_long_complaint_the_beginning_and_the_end_are_logged(root, vantor):
    shell_command(root, "test flood", *FLOOD, "exit 4")
    write_plugin(root, "net", "test flood")
    text, kept = flood(), 1 << 16
    assert len(text) == 300000
    complaint = (f"{text[:kept]}\n[{len(text) - 2 * kept} bytes left out]\n{text[-kept:]}")
    error = f'"/usr/bin/test-flood" ended with exit status 4: {complaint.rstrip()}'
    assert vantor().messages == [*starting("net"), failed("test flood", "net", error)]
    assert root.ran() == ["flooded"]


def test_a_child_in_the_background_is_not_waited_for(root, vantor):
    shell_command(root, "test daemon", "sleep 100000 &", "echo $! >/tmp/child")
    write_plugin(root, "net", "test daemon", "test note --text=next")
    assert vantor().messages == starting("net")
    assert root.ran() == ["next"]
    assert root.processes() == [int(root.read("/tmp/child"))]


def test_a_child_in_the_background_that_goes_on_writing_is_ended(root, vantor):
    root.fifo("/tmp/gate")
    shell_command(root, "test daemon", "{ read go </tmp/gate; echo before >>/tmp/ran; echo late;",
                  "echo behind >>/tmp/ran; } &")
    write_plugin(root, "net", "test daemon")
    assert vantor().messages == starting("net")
    with open(root.path("/tmp/gate"), "r+b", buffering=0) as gate:
        gate.write(b"go\n")
        wait_until(lambda: not root.processes(), "the child ends")
    assert root.ran() == ["before"]


def test_a_command_has_its_standard_streams_open_and_nothing_else(root, vantor):
    describe(root, command("test see", "/usr/bin/witness", "an argument"))
    write_plugin(root, "net", "test see")
    result = vantor(leaked=[7, 300], environment={"SEEN": "yes"})
    assert result.messages == starting("net")
    seen = root.read("/tmp/seen.witness").splitlines()
    assert [line for line in seen if line.startswith("descriptor ")] == [
        "descriptor 0", "descriptor 1", "descriptor 2"]
    assert [line for line in seen if line.startswith("argument ")] == [
        "argument /usr/bin/witness", "argument an argument"]
    assert "variable SEEN=yes" in seen


def test_eight_commands_at_one_time_see_no_descriptor_of_each_other(root, vantor):
    names = [f"see{number}" for number in range(8)]
    for name in names:
        root.link_program("/usr/bin/witness", f"/usr/bin/{name}")
    describe(root, *(command(f"test {name}", f"/usr/bin/{name}") for name in names))
    for name in names:
        write_plugin(root, name, *[f"test {name}"] * 5)
    result = vantor("--parallel")
    assert sorted(result.messages) == sorted(starting(*names))
    assert sorted(root.ran()) == sorted(f"ran {name}" for name in names * 5)
    for name in names:
        seen = root.read(f"/tmp/seen.{name}").splitlines()
        assert [line for line in seen if line.startswith("descriptor ")] == [
            "descriptor 0", "descriptor 1", "descriptor 2"]


def test_a_command_works_in_the_top_folder_with_nothing_to_read(root, vantor):
    shell_command(root, "test place", "pwd >>/tmp/ran",
                  'read x || echo "nothing to read" >>/tmp/ran')
    write_plugin(root, "net", "test place")
    with open(root.path("/tmp/typed"), "w+", encoding="ascii") as typed:
        typed.write("not for commands\n")
        typed.seek(0)
        assert vantor(cwd="/tmp", stdin=typed).messages == starting("net")
    assert root.ran() == ["/", "nothing to read"]


def test_a_thousand_commands_of_one_plugin_all_run(root, vantor):
    write_plugin(root, "net", *(f"test note -t {number}" for number in range(1000)))
    assert vantor().messages == starting("net")
    assert root.ran() == [str(number) for number in range(1000)]
