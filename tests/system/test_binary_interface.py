"""What a native plugin is in bytes: the offsets of its fields, and where each version's end.

No plugin here is written with our header; see harness/raw_plugin.py for how a read beyond an
object's end is noticed.
"""

import signal

import pytest

from harness.elf import word_size_of
from harness.messages import invalid, starting
from harness.raw_plugin import LONG_RECORD, SHORT_RECORD, TABLE, write_raw_plugin
from harness.syslog_recorder import DEBUG, ERR, INFO, WARNING
from test_dump import drawn

ALL = {"requires": ["given", "found"], "provides": ["done", "finished"], "plugin_version": "1.0",
       "run_once": 1, "required_flags": ["wanted", "needed"], "disabling_flags": ["unwanted"]}
LONG_FIELDS = ["plugin_version", "run_once", "required_flags", "disabling_flags"]
PROFILE = "/etc/nuvex/hostprofile.xml"


@pytest.fixture(name="raw")
def fixture_raw(root):
    """raw(name, version, **how): see write_raw_plugin()."""
    return lambda name, version, **how: write_raw_plugin(root, name, version, **how)


@pytest.fixture(name="word")
def fixture_word(session):
    """The size of the program's pointers."""
    return word_size_of(session.base.program)


@pytest.fixture(name="dies")
def fixture_dies(session, vantor):
    """dies(argument...): whether the program is killed for a read where there is no memory."""
    if session.base.sanitizers:
        pytest.skip("the sanitizers take the signal")
    return lambda *arguments: vantor(*arguments).status == -signal.SIGSEGV


def cut(layout, field):
    """The layout of an object that ends where the field would begin."""
    return {name: offset for name, offset in layout.items()
            if name != "end" and offset < layout[field]} | {"end": layout[field]}


def failed(name, result):
    return (ERR, f"execution failure in context '{name}', returncode {result}")


@pytest.mark.parametrize("version", [1, 2, 3, 4])
def test_the_barriers_of_every_version(root, raw, vantor, version):
    raw("x", version, start=3, **ALL)
    root.native("giver", provides=["given", "found"])
    root.native("taker", requires=["done", "finished"])
    result = vantor("--plugin-flags=wanted,needed")
    assert (result.status, result.messages) == (
        0, [*starting("giver", "x"), failed("x", 3), *starting("taker")])
    assert root.alerts() == []


@pytest.mark.parametrize("version", [1, 2, 3, 4])
def test_the_order_of_the_barriers(root, raw, vantor, version):
    raw("x", version, **{**ALL, "required_flags": None})
    root.native("taker", requires=["found"])
    vantor("--plugin=libx.so,libtaker.so", "--dump-dependency-tree=/tmp/graph.dot")
    assert [line for line in drawn(root) if "->" in line] == [
        "x -> done;", "x -> finished;", "found -> x;", "found -> taker;", "given -> x;"]


@pytest.mark.parametrize("version", [3, 4])
@pytest.mark.parametrize("flags, why", [
    ("wanted", "disabled due to missing required boot flags: needed "),
    ("", "disabled due to missing required boot flags: needed wanted "),
    ("wanted,unwanted,needed", "disabled due to boot flags: unwanted "),
])
def test_the_flags_of_the_long_record(raw, vantor, version, flags, why):
    raw("x", version, **ALL)
    result = vantor("--plugin-flags=" + flags)
    assert result.messages == [(WARNING, f"ignoring plugin 'x', {why}")]


@pytest.mark.parametrize("version", [1, 2])
def test_a_short_record_has_no_flags_whatever_lies_behind_it(root, raw, word, vantor, version):
    raw("x", version, record=LONG_RECORD[word], **ALL)
    root.native("giver", provides=["given", "found"])
    result = vantor("--plugin-flags=unwanted", "--run-once=x1.0,x")
    assert result.messages == starting("giver", "x")
    assert root.run_once_record() == "vantor.run-once=x,x1.0,\n"


@pytest.mark.parametrize("version", [3, 4])
@pytest.mark.parametrize("byte", [0, 1, 128, 255])
def test_one_byte_says_whether_a_plugin_runs_once(root, raw, vantor, version, byte):
    raw("x", version, run_once=byte, plugin_version="1.0")
    assert vantor().messages == starting("x")
    assert root.run_once_record() == f"vantor.run-once={'x1.0,' if byte else ''}\n"
    again = vantor("--run-once=x1.0")
    assert again.messages == ([(
        DEBUG, "ignoring plugin 'x' because version '1.0' has already been run")]
        if byte else starting("x"))


@pytest.mark.parametrize("version", [3, 4])
@pytest.mark.parametrize("plugin_version", [None, ""])
def test_a_plugin_without_a_version_text(root, raw, vantor, version, plugin_version):
    raw("x", version, run_once=1, plugin_version=plugin_version)
    assert vantor().messages == starting("x")
    assert root.run_once_record() == "vantor.run-once=x,\n"


@pytest.mark.parametrize("version", [1, 2, 3, 4])
@pytest.mark.parametrize("values", [None, []])
def test_null_and_empty_lists(root, raw, vantor, version, values):
    raw("x", version, requires=values, provides=values, required_flags=values,
        disabling_flags=values)
    result = vantor("--plugin-flags=a")
    assert (result.status, result.messages, root.alerts()) == (0, starting("x"), [])


@pytest.mark.parametrize("result", [0, 1, 0x7FFFFFFF, 0x80000000, 0xFFFFFFFF])
def test_a_method_returns_32_bits(raw, vantor, result):
    raw("x", 1, start=result)
    assert vantor().messages == starting("x") + ([failed("x", result)] if result else [])


@pytest.mark.parametrize("version", [2, 3, 4])
def test_the_second_entry_applies_the_host_profile(root, raw, vantor, version):
    root.write(PROFILE)
    raw("x", version, start=3, apply_host_profile=4)
    assert vantor().messages == [(INFO, "executing host profile plugin: x"), failed("x", 4)]


@pytest.mark.parametrize("version", [2, 3, 4])
def test_without_a_second_entry_the_first_is_called(root, raw, vantor, version):
    root.write(PROFILE)
    raw("x", version, start=3, apply_host_profile=None)
    assert vantor().messages == [*starting("x"), failed("x", 3)]


@pytest.mark.parametrize("entries", ["one", "both"])
def test_version_1_has_no_second_entry(root, raw, word, vantor, entries):
    root.write(PROFILE)
    table = TABLE[word] if entries == "both" else cut(TABLE[word], "apply_host_profile")
    raw("x", 1, table=table, start=3, apply_host_profile=4)
    assert vantor().messages == [*starting("x"), failed("x", 3)]


@pytest.mark.parametrize("version", [1, 2, 3, 4])
def test_a_null_entry_does_nothing(raw, vantor, version):
    raw("x", version, start=None, apply_host_profile=None)
    result = vantor()
    assert (result.status, result.messages) == (0, starting("x"))


@pytest.mark.parametrize("version", [-2147483648, -1, 0, 5, 2147483647])
def test_of_an_unknown_version_nothing_but_the_number_is_read(root, raw, word, vantor, version):
    raw("x", version, record=cut(SHORT_RECORD[word], "requires"))
    result = vantor()
    text = invalid("libx.so", "Unsupported API version")
    assert (result.status, result.messages, root.alerts()) == (0, [(WARNING, text)], [text])


@pytest.mark.parametrize("version", [3, 4])
def test_a_short_record_that_claims_to_be_long_is_read_beyond_its_end(raw, word, dies, version):
    raw("x", version, record=SHORT_RECORD[word])
    assert dies()


@pytest.mark.parametrize("version, field", [
    *((version, field) for version in (1, 2, 3, 4) for field in ("requires", "provides")),
    *((version, field) for version in (3, 4) for field in LONG_FIELDS),
])
def test_every_field_of_a_version_is_read_where_it_lies(raw, word, dies, version, field):
    layout = (SHORT_RECORD if version < 3 else LONG_RECORD)[word]
    raw("x", version, record=cut(layout, field))
    assert dies()


@pytest.mark.parametrize("version", [2, 3, 4])
def test_a_table_without_the_second_entry_is_read_beyond_its_end(raw, word, dies, version):
    raw("x", version, table=cut(TABLE[word], "apply_host_profile"))
    assert dies()


@pytest.mark.parametrize("name", ["requires", "provides", "required_flags", "disabling_flags"])
def test_a_list_without_an_end_is_read_beyond_it(raw, dies, name):
    raw("x", 3, unended=[name], **{name: ["a", "b"]})
    assert dies("--plugin-flags=a,b")
