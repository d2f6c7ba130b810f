"""The interactive prompt on a real terminal, and on what is none."""

import fcntl
import os
import termios

import pytest

from harness.messages import starting
from harness.prompt import prompt, question, redrawn
from harness.syslog_recorder import ERR, INFO

NEVER = "1970-01-01 00:00:00.000000"


def skipped(name):
    return (INFO, f"skipping plugin {name} (interactive mode request)")


@pytest.fixture
def step(root, start, terminal):
    """step([keys, ...], argument...) answers one prompt after another and returns the result."""

    def run_through(answers, *arguments):
        run = start("--interactive", *arguments, stdin=terminal.slave, stdout=terminal.slave)
        for keys in answers:
            terminal.answer(run, keys, redrawn(keys[-1].lower()))
        return run.wait()

    for name in ("a", "b", "c"):
        root.native(name)
    return run_through


ALL = "--plugin=liba.so,libb.so,libc.so"


def test_execute_runs_each_plugin_after_its_prompt(root, terminal, step):
    result = step(["e", "e", "e"], ALL)
    assert terminal.transcript() == prompt("a", "e") + prompt("b", "e") + prompt("c", "e")
    assert result.messages == starting("a", "b", "c")
    assert root.started() == ["a", "b", "c"]
    assert (result.status, result.stderr) == (0, "")


def test_nothing_runs_before_the_key(root, start, terminal):
    root.native("a")
    run = start("--interactive", stdin=terminal.slave, stdout=terminal.slave)
    run.wait_until(terminal.takes_keys, "a prompt takes keys")
    run.wait_until_every_thread_sleeps()
    assert terminal.transcript() == question("a")
    assert root.ran() == []
    terminal.type("e")
    assert run.wait().status == 0
    assert root.started() == ["a"]


def test_skip_leaves_the_plugin_out_and_its_times_zero(root, terminal, step):
    result = step(["e", "s", "e"], ALL, "--trace")
    assert result.messages == [*starting("a"), skipped("b"), *starting("c")]
    assert root.started() == ["a", "c"]
    assert root.profiling_log()[2] == f"[{NEVER} - {NEVER}] sysboot: b"
    transcript = terminal.transcript()
    assert prompt("b", "s") + prompt("c", "e") in transcript
    assert "execution of plugin: b" not in transcript


def test_a_skipped_plugin_counts_as_done(root, start, terminal):
    root.native("giver", provides=["ready"])
    root.native("taker", requires=["ready"])
    run = start("--interactive", stdin=terminal.slave, stdout=terminal.slave)
    terminal.answer(run, "s", redrawn("s"))
    terminal.answer(run, "e", redrawn("e"))
    assert run.wait().messages == [skipped("giver"), *starting("taker")]
    assert root.alerts() == []


def test_continue_ends_the_prompts(root, terminal, step):
    result = step(["e", "c"], ALL)
    assert terminal.transcript() == prompt("a", "e") + prompt("b", "c")
    assert result.messages == starting("a", "b", "c")
    # The report shows the mode as it was at the end.
    assert " Interactive Mode: 0" in root.profiling_log()


def test_upper_case_keys_count(terminal, step):
    result = step(["E", "S", "C"], ALL)
    assert terminal.transcript() == prompt("a", "e") + prompt("b", "s") + prompt("c", "c")
    assert result.messages == [*starting("a"), skipped("b"), *starting("c")]


def test_other_keys_are_ignored(terminal, step):
    result = step(["x \n\t1?\033[A\x7f\x04\xffe", "qQ\re", "..s"], ALL)
    assert terminal.transcript() == prompt("a", "e") + prompt("b", "e") + prompt("c", "s")
    assert result.messages == [*starting("a", "b"), skipped("c")]


def test_trace_lines_follow_the_prompt(terminal, step):
    step(["e"], "--plugin=liba.so", "--trace")
    transcript = terminal.transcript()
    assert transcript.startswith(
        prompt("a", "e") + "starting execution of plugin: a\ncompleted execution of plugin: a ")


def test_the_plugins_of_the_requires_list_run_without_a_prompt(terminal, step):
    result = step(["e"], ALL, "--interactive-mode-requires=a,a", "--interactive-mode-requires=b")
    assert terminal.transcript() == prompt("c", "e")
    assert result.messages == starting("a", "b", "c")


def test_prompts_begin_once_the_last_plugin_of_the_requires_list_has_run(terminal, step):
    # "a" is not on the list and runs unasked all the same; so does "b", the last of the list.
    result = step(["s"], ALL, "--interactive-mode-requires=b")
    assert terminal.transcript() == prompt("c", "s")
    assert result.messages == [*starting("a", "b"), skipped("c")]


def test_a_requires_list_that_is_never_met_prompts_never(root, terminal, step):
    result = step([], ALL, "--interactive-mode-requires=c,nowhere")
    assert terminal.transcript() == ""
    assert result.messages == starting("a", "b", "c")
    assert " Interactive Mode: 1" in root.profiling_log()


def test_the_terminal_is_as_it_was_before(terminal, step):
    before = terminal.attributes()
    step(["e", "s", "c"], ALL)
    assert terminal.attributes() == before


def test_while_a_plugin_runs_the_terminal_is_as_it_was_before(root, start, terminal):
    before = terminal.attributes()
    root.fifo("/tmp/gate")
    root.native("a", opens_to_read="/tmp/gate")
    run = start("--interactive", stdin=terminal.slave, stdout=terminal.slave)
    terminal.answer(run, "e", redrawn("e"))
    run.wait_until(lambda: root.started() == ["a"], "the plugin runs")
    assert terminal.attributes() == before
    with open(root.path("/tmp/gate"), "wb"):
        assert run.wait().status == 0


def test_echo_and_lines_are_on_after_a_prompt_even_where_they_were_off(terminal, step):
    attributes = terminal.attributes()
    attributes[3] &= ~(termios.ICANON | termios.ECHO)
    terminal.set_attributes(attributes)
    step(["e"], "--plugin=liba.so")
    assert terminal.modes(termios.ICANON, termios.ECHO) == [True, True]


def test_interactive_runs_are_serial(root, start, terminal):
    for number in range(3):
        root.native(f"p{number}")
    run = start("--parallel", "--interactive", stdin=terminal.slave, stdout=terminal.slave)
    for _ in range(3):
        terminal.answer(run, "e", redrawn("e"))
    assert run.wait().status == 0
    names = root.plugins_in_order()
    assert terminal.transcript() == "".join(prompt(name, "e") for name in names)
    assert [line.split()[0] for line in root.ran()] == ["start", "end"] * 3


def test_disabled_plugins_are_not_asked_for(terminal, step):
    step(["e", "e"], ALL, "--disable-plugins=b")
    assert terminal.transcript() == prompt("a", "e") + prompt("c", "e")


def test_a_named_method_is_asked_for_too(root, terminal, step):
    result = step(["s", "e"], "--plugin=liba.so,libb.so", "--method=start")
    assert terminal.transcript() == prompt("a", "s") + prompt("b", "e")
    assert result.messages == [skipped("a")]
    assert root.started() == ["b"]


COMPLAINTS = [(ERR, f"unable to {verb} terminal io state") for verb in ("get", "set", "restore")]


def test_an_input_that_is_no_terminal_is_complained_about_and_used(root, start):
    root.native("a")
    root.native("b")
    read_end, write_end = os.pipe()
    os.write(write_end, b"junk e? S")
    run = start("--interactive", "--plugin=liba.so,libb.so", stdin=read_end)
    result = run.wait()
    os.close(read_end)
    os.close(write_end)
    # An "e" is among the junk: the first key that is a choice decides.
    assert result.stdout == prompt("a", "e") + prompt("b", "s")
    assert result.messages == [*COMPLAINTS, *starting("a"), *COMPLAINTS, skipped("b")]
    assert result.status == 0


def test_the_end_of_the_input_is_no_answer_and_reading_goes_on(root, start):
    root.native("a")
    root.fifo("/tmp/keys")
    keys = os.open(root.path("/tmp/keys"), os.O_RDONLY | os.O_NONBLOCK)
    fcntl.fcntl(keys, fcntl.F_SETFL, 0)
    # Nobody writes yet, so that the program's reads find the end at once.
    run = start("--interactive", stdin=keys)
    run.wait_until(lambda: run.stdout_so_far() == question("a"), "the prompt is shown")
    before = run.reads()
    run.wait_until(lambda: run.reads() > before + 1, "the end of the input was read again")
    assert root.ran() == []
    with open(root.path("/tmp/keys"), "wb") as writer:
        writer.write(b"s")
    result = run.wait()
    os.close(keys)
    assert result.stdout == prompt("a", "s")
    assert result.messages == [*COMPLAINTS, skipped("a")]


def test_a_console_that_has_no_virtual_terminals_is_passed_over_in_silence(root, terminal, step):
    root.write("/dev/console", "untouched")
    result = step(["e", "c"], "--plugin=liba.so,libb.so")
    assert result.messages == starting("a", "b")
    assert root.read("/dev/console") == "untouched"
    assert terminal.transcript() == prompt("a", "e") + prompt("b", "c")
