"""Files that look like plugins and are none: each is reported and the boot goes on."""

import re

import pytest

from harness.messages import IRREGULAR, NOT_ELF, TRUNCATED, invalid, linker_says, starting
from harness.native_plugin import PluginFactory
from harness.syslog_recorder import ERR, INFO, WARNING

PLUGINS = "/usr/libexec/vantor/plugins"
NO_OBJECTS = "int nothing_of_interest;\n"
OPERATIONS_ALONE = """#include "vantor/plugin.h"
VANTOR_METHOD(start) { return 0; }
VANTOR_OPERATIONS(start);
"""
METADATA_ALONE = """#include "vantor/plugin.h"
VANTOR_METADATA_1(NULL, NULL);
"""
LARGE = OPERATIONS_ALONE + """
char large[200000] = {1};
VANTOR_METADATA_1(NULL, NULL);
"""
THROWING = """#include "vantor/plugin.h"
#include <stdexcept>
VANTOR_METHOD(start) {{ throw {what}; }}
VANTOR_OPERATIONS(start);
VANTOR_METADATA_1(NULL, NULL);
"""


def assert_load_failure(root, result, text):
    assert result.messages == [(WARNING, text)]
    assert root.alerts() == [text]
    assert (result.status, result.stdout, result.stderr) == (0, "", "")


def test_a_text_file(root, vantor):
    root.write(f"{PLUGINS}/libx.so", NOT_ELF)
    assert_load_failure(root, vantor(), linker_says("libx.so", "invalid ELF header"))


def test_an_empty_file(root, vantor):
    root.write(f"{PLUGINS}/libx.so")
    assert_load_failure(root, vantor(), linker_says("libx.so", "file too short"))


def test_a_dangling_link(root, vantor):
    root.symlink("nowhere", f"{PLUGINS}/libx.so")
    assert_load_failure(root, vantor(), linker_says(
        "libx.so", "cannot open shared object file: No such file or directory"))


def test_a_folder(root, vantor):
    root.folder_at(f"{PLUGINS}/x.so")
    assert_load_failure(root, vantor(), linker_says(
        "x.so", "cannot read file data: Is a directory"))


def test_an_object_of_the_other_word_size(root, vantor):
    content = bytearray(PluginFactory.stamped(["name x"]))
    own = content[4]
    content[4] = 3 - own
    root.write(f"{PLUGINS}/libx.so", bytes(content))
    other = {1: "ELFCLASS64", 2: "ELFCLASS32"}[own]
    assert_load_failure(root, vantor(), linker_says("libx.so", f"wrong ELF class: {other}"))


@pytest.mark.parametrize("text, symbol", [
    (NO_OBJECTS, "operations"), (METADATA_ALONE, "operations"), (OPERATIONS_ALONE, "metadata"),
], ids=["neither object", "no operations", "no metadata"])
def test_an_object_that_exports_too_little(root, vantor, text, symbol):
    root.compiled("x", text)
    assert_load_failure(root, vantor(), linker_says("libx.so", f"undefined symbol: {symbol}"))


def test_an_object_that_needs_another_that_is_missing(root, vantor):
    content = PluginFactory.stamped(["name x"])
    assert content.count(b"libc.so.6\0") == 1
    root.write(f"{PLUGINS}/libx.so", content.replace(b"libc.so.6\0", b"libc.so.0\0"))
    text = ("exception occurred whilst loading plugin libx.so: plugin "
            f"`{PLUGINS}/libx.so' is invalid: libc.so.0: cannot open shared object file: "
            "No such file or directory")
    assert_load_failure(root, vantor(), text)


@pytest.mark.parametrize("version", [0, 5, -1, 2147483647, -2147483648])
def test_an_unsupported_version(root, vantor, version):
    root.native("x", version=version, provides=["ready"])
    root.native("taker", requires=["ready"])
    result = vantor()
    text = invalid("libx.so", "Unsupported API version")
    assert result.messages == [(WARNING, text)] + starting("taker")
    # A plugin that was refused provides nothing.
    assert root.alerts() == [
        text, 'Vantor dependency error: Initialization barrier "ready" is not provided by any '
        'plugin but the following plugins require it: "taker"']


@pytest.mark.parametrize("lacking", ["all", "all but one byte", "one byte"])
def test_an_object_cut_short_within_its_header(root, vantor, lacking):
    header = {4: 52, 8: 64}[root.base.word_size]
    length = {"all": 0, "all but one byte": 1, "one byte": header - 1}[lacking]
    root.write(f"{PLUGINS}/libx.so", PluginFactory.compile(LARGE, "c")[:length])
    assert_load_failure(root, vantor(), linker_says("libx.so", "file too short"))


@pytest.mark.parametrize("length", [4096, 20000, 100000, 200000])
def test_an_object_cut_short_within_its_segments(root, vantor, length):
    root.write(f"{PLUGINS}/libx.so", PluginFactory.compile(LARGE, "c")[:length])
    assert_load_failure(root, vantor(), invalid("libx.so", TRUNCATED))


def test_an_object_that_lacks_only_what_the_linker_never_maps(root, vantor):
    root.write(f"{PLUGINS}/libx.so", PluginFactory.compile(LARGE, "c")[:-1])
    assert vantor().messages == starting("x")


@pytest.mark.parametrize("step", range(7))
def test_an_object_cut_short_anywhere_never_kills_the_boot(root, vantor, step):
    content = PluginFactory.stamped(["name x"])
    root.native("good")
    length = len(content) * step // 8 + step * 7
    root.write(f"{PLUGINS}/libx.so", content[:length])
    result = vantor()
    assert result.status == 0
    assert root.started() == ["good"]
    [text] = result.texts(WARNING)
    assert text.startswith(invalid("libx.so", ""))
    assert root.alerts() == [text]


@pytest.mark.parametrize("kind", ["fifo", "socket", "device", "link to a fifo"])
def test_a_file_that_is_not_regular_is_not_opened(root, vantor, kind):
    if not root.odd_entry(f"{PLUGINS}/libx.so", kind):
        pytest.skip("no device file can be made here")
    assert_load_failure(root, vantor(), invalid("libx.so", IRREGULAR))


def test_a_fifo_named_like_a_document_does_not_hold_the_boot_up(root, vantor):
    root.fifo(f"{PLUGINS}/x.json")
    root.native("good")
    result = vantor()
    assert result.status == 0
    assert root.started() == ["good"]
    assert len(result.texts(WARNING)) == 1


@pytest.mark.parametrize("name", ["%s%n%d", "5% d", "%", "100% ", "%5$s", "%-08lx"])
def test_a_percent_sign_that_wants_an_argument_stands_for_itself(root, vantor, name):
    root.write(f"{PLUGINS}/lib{name}.so", NOT_ELF)
    assert_load_failure(root, vantor(), linker_says(f"lib{name}.so", "invalid ELF header"))


def test_a_doubled_percent_sign_is_logged_once_and_alerted_as_it_is(root, vantor):
    root.write(f"{PLUGINS}/lib100%%.so", NOT_ELF)
    result = vantor()
    assert result.messages == [(WARNING, linker_says("lib100%.so", "invalid ELF header"))]
    assert root.alerts() == [linker_says("lib100%%.so", "invalid ELF header")]


def test_percent_m_is_logged_as_an_error_text(root, vantor):
    root.write(f"{PLUGINS}/lib%m.so", NOT_ELF)
    [(priority, text)] = vantor().messages
    name = re.search("loading plugin lib(.*?)\\.so: ", text)[1]
    assert "%" not in name and len(name) > 3
    assert (priority, text) == (WARNING, linker_says(f"lib{name}.so", "invalid ELF header"))
    assert root.alerts() == [linker_says("lib%m.so", "invalid ELF header")]


def test_a_directory_of_every_kind_of_bad_file_boots_to_the_end(root, vantor):
    root.native("good1", provides=["ready"])
    root.native("good2", requires=["ready"])
    root.write(f"{PLUGINS}/libtext.so", NOT_ELF)
    root.compiled("bare", NO_OBJECTS)
    root.native("zero", version=0)
    root.native("five", version=5)
    root.write(f"{PLUGINS}/README")
    root.write(f"{PLUGINS}/old.so.1")
    root.folder_at(f"{PLUGINS}/x.so")
    root.write(f"{PLUGINS}/libcut.so", PluginFactory.compile(LARGE, "c")[:20000])
    root.fifo(f"{PLUGINS}/y.so")
    root.symlink("nowhere", f"{PLUGINS}/libgone.so")
    root.compiled("standard", THROWING.format(what='std::runtime_error("no such disk")'), "cc")
    root.compiled("other", THROWING.format(what="7"), "cc")
    result = vantor()
    assert (result.status, result.stdout, result.stderr) == (0, "", "")
    alerts = [
        linker_says("libtext.so", "invalid ELF header"),
        linker_says("libbare.so", "undefined symbol: operations"),
        invalid("libzero.so", "Unsupported API version"),
        invalid("libfive.so", "Unsupported API version"),
        linker_says("x.so", "cannot read file data: Is a directory"),
        invalid("libcut.so", TRUNCATED),
        invalid("y.so", IRREGULAR),
        linker_says("libgone.so", "cannot open shared object file: No such file or directory"),
    ]
    assert sorted(root.alerts()) == sorted(alerts)
    assert sorted(result.texts(WARNING)) == sorted(alerts + [
        "ignoring plugin 'README' of unspecified type...",
        "ignoring plugin 'old.so.1' of unknown type (1)...",
    ])
    assert sorted(result.texts(ERR)) == [
        "ignoring unknown exception whilst processing other ...",
        "unhandled exception whilst processing standard: no such disk",
    ]
    assert sorted(result.texts(INFO)) == sorted(
        text for _, text in starting("good1", "good2", "standard", "other"))
    assert root.started() == ["good1", "good2"]
    assert root.run_once_record() == "vantor.run-once=\n"
    assert len([line for line in root.profiling_log() if "sysboot:" in line]) == 4
