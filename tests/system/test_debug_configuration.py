"""The debug configuration file: which lines are entries, and how the others are reported."""

import re

import pytest

from harness.messages import starting
from harness.syslog_recorder import INFO

CONFIGURATION = "/etc/nuvex/vantor/debug.conf"


def malformed(number, line):
    return (INFO, f"ignoring malformed debug entry at line {number}: {line}")


def drawn_edges(root, vantor):
    """The edges of the graph as pairs of labels, and the result of the run that drew them."""
    result = vantor("--dump-dependency-tree=/tmp/graph.dot")
    text = root.read("/tmp/graph.dot")
    labels = dict(re.findall(
        r'^(\d+) \[label="((?:.|\n)*?)"(?: shape=box)?\];$', text, re.MULTILINE))
    edges = re.findall(r"^(\d+) -> (\d+);$", text, re.MULTILINE)
    return [(labels[source], labels[target]) for source, target in edges], result


def test_without_the_file_nothing_is_said(vantor):
    assert vantor().messages == []


def test_blank_lines_say_nothing(root, vantor):
    root.write(CONFIGURATION, "\n  \n\t\n\r\n\n")
    result = vantor()
    assert (result.status, result.messages) == (0, [])


@pytest.mark.parametrize("line", [
    "x:a:b", "x", "# a note", "x:a:b:c:d", "::::", ":a:b:c:", "x::b:true",
    r"x:a\q:b:true", r"x:a:b\ :true", 'x:"a:b:true', "x:a:b,'c:true", "x:a\\:b:true",
])
def test_a_line_that_is_no_entry_is_reported_and_skipped(root, vantor, line):
    root.write(CONFIGURATION, f"\n\n  {line} \t\nafter:a:b:true\n")
    result = vantor()
    assert result.messages == [malformed(3, line)] + starting("after")


def test_every_physical_line_counts(root, vantor):
    root.write(CONFIGURATION, "bad\n\nx:a:b:true\n   \nworse\nlast without line end")
    result = vantor()
    assert result.messages == [
        malformed(1, "bad"), malformed(5, "worse"), malformed(6, "last without line end"),
        *starting("x")]


def test_the_file_is_read_afresh_for_every_file_with_an_extension(root, vantor):
    root.write(CONFIGURATION, "no entry\n")
    for name in ("one.debug", "two.so.1", "three.", "README"):
        root.write("/usr/libexec/vantor/plugins/" + name)
    root.native("four")
    # Once for the driver and once for each of the four names that have a dot.
    assert vantor().texts(INFO).count(malformed(1, "no entry")[1]) == 5


def test_an_entry_in_the_last_line_needs_no_line_end(root, vantor):
    root.write(CONFIGURATION, "x:a:b:echo done >/tmp/done")
    vantor()
    assert root.read("/tmp/done") == "done\n"


def test_a_byte_that_is_no_text_is_kept(root, vantor):
    root.write(CONFIGURATION, b"caf\xe9\n")
    assert vantor().messages == [malformed(1, "caf\udce9")]


@pytest.mark.parametrize("fields, expected", [
    ("x:a,b:c:true", [("x", "c"), ("a", "x"), ("b", "x")]),
    ("x : a , b : c :true", [("x ", "c"), (" b", "x "), ("a ", "x ")]),
    ("x::a::b:true", [("x", "b"), ("a", "x")]),
    (":x:a:b:true:", [("x", "b"), ("a", "x")]),
    ('x:"a,b",c:d:true', [("x", "d"), ("a,b", "x"), ("c", "x")]),
    ("x:'a,b':d:true", [("x", "d"), ("a,b", "x")]),
    (r"x:a\,b:c\"d:true", [("x", 'c"d'), ("a,b", "x")]),
    (r"x:a\\b:c\nd:true", [("x", "c\nd"), ("a\\b", "x")]),
    ("x:a,,b:c:true", [("x", "c"), ("", "x"), ("a", "x"), ("b", "x")]),
    ("x:,:b:true", [("x", "b"), ("", "x"), ("", "x")]),
    ("x: :\t:true", []),
], ids=str)
def test_the_barriers_of_an_entry(root, vantor, fields, expected):
    # Edges from the plugin come first, then those of the barriers in byte order.
    root.write(CONFIGURATION, fields + "\n")
    edges, result = drawn_edges(root, vantor)
    assert result.messages == []
    assert edges == expected


def test_the_command_is_used_as_written(root, vantor):
    root.write(CONFIGURATION, "x:a:b:  echo 'blanks  stay and \"quotes\", too' >/tmp/said  \n")
    vantor()
    assert root.read("/tmp/said") == "blanks  stay and \"quotes\", too\n"
