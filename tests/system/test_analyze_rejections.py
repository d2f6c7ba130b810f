"""What the boot says of a file that it rejects or ignores is what the analysis says before it."""

import json
import os
import re
import struct
import subprocess

import pytest

from harness.json_plugin import write_text
from harness.messages import NOT_ELF
from harness.native_plugin import PluginFactory
from harness.private_root import PLUGINS
from harness.syslog_recorder import INFO, WARNING
from test_bad_files import LARGE, METADATA_ALONE, NO_OBJECTS, OPERATIONS_ALONE
from test_json_rejections import FAULTS, LENIENT, cases, changed, nested

LOADING = "exception occurred whilst loading plugin "
REJECTIONS = {"rejected", "truncated", "foreign-architecture", "unsupported-version",
              "deep-nesting", "missing-library", "missing-version", "undefined-symbol"}
# Behind the boot's words these say in parentheses what those leave out.
EXPLAINED = {"foreign-architecture", "deep-nesting"}
OF_VERSION = OPERATIONS_ALONE.replace("{", "{{").replace("}", "}}") + """
VANTOR_EXPORTED_ const struct vantor_metadata_1 metadata;
const struct vantor_metadata_1 metadata = {{ {version}, NULL, NULL }};
"""
NEEDY = OPERATIONS_ALONE + "VANTOR_METADATA_1(NULL, NULL);\n"
DATA_OF_NOBODY = NEEDY + "extern int nowhere; int *found = &nowhere;\n"
CALL_OF_NOBODY = NEEDY.replace("return 0;", "return nowhere();").replace(
    "VANTOR_METHOD", "int nowhere(void);\nVANTOR_METHOD", 1)
WEAK_CALL_OF_NOBODY = CALL_OF_NOBODY.replace("return nowhere();", "return nowhere ? 1 : 0;").replace(
    "int nowhere", "__attribute__((weak)) int nowhere", 1)
# Offsets of fields of an ELF header, by the size of a word.
TYPE, MACHINE, VERSION = 16, 18, 20
SEGMENTS = {4: 28, 8: 32}
SEGMENT_SIZE = {4: 42, 8: 54}
SEGMENT_COUNT = {4: 44, 8: 56}


def verify(root, *options):
    """The findings of an analysis of the root's plugin directory."""
    done = subprocess.run(
        [os.path.join(root.base.build, "bin", "vantor-analyze"), "verify", "--format=json",
         f"--root={root.folder}", *options, PLUGINS],
        capture_output=True, text=True, check=False, encoding="utf-8", errors="surrogateescape")
    assert done.stderr == ""
    assert done.returncode in (0, 1, 2)
    return json.loads(done.stdout)["findings"]


def foretold(root):
    """The reason of each file of the directory that is to be rejected, by the file's name."""
    reasons = {}
    for finding in verify(root):
        if finding["code"] not in REJECTIONS:
            continue
        name = os.path.basename(finding["path"])
        assert name not in reasons, "a file is rejected once"
        text = finding["text"]
        if finding["code"] in EXPLAINED:
            text, _, explanation = text.rpartition(" (")
            assert explanation.endswith(")")
        reasons[name] = text
    return reasons


def told(root):
    """The same as the boot has said it."""
    reasons = {}
    for alert in root.alerts():
        assert alert.startswith(LOADING)
        name, _, reason = alert[len(LOADING):].partition(": ")
        reasons[name] = reason
    return reasons


def assert_foretold(root, vantor, count):
    """So many files are rejected, and each for the reason that is told before."""
    before = foretold(root)
    assert vantor().status == 0
    assert before == told(root)
    assert len(before) == count


def put(content, offset, layout, value):
    made = bytearray(content)
    struct.pack_into("<" + layout, made, offset, value)
    return bytes(made)


def bad_objects(word):
    """Contents of shared objects that no boot loads."""
    good = PluginFactory.stamped(["name x"])
    address = {4: "I", 8: "Q"}[word]
    yield NOT_ELF.encode()
    yield from (b"", b"short", good[:40], good[:100])
    for offset, value in [(0, 1), (4, 3 - good[4]), (4, 9), (5, 2), (5, 7), (6, 2), (7, 9),
                          (8, 7), (12, 1)]:
        yield put(good, offset, "B", value)
    yield from (put(good, TYPE, "H", kind) for kind in (0, 1, 2, 4))
    yield from (put(good, MACHINE, "H", machine) for machine in (22, 40, 183))
    yield put(good, VERSION, "I", 7)
    yield put(good, SEGMENT_SIZE[word], "H", 11)
    yield put(good, SEGMENT_COUNT[word], "H", 0)
    yield put(good, SEGMENTS[word], address, len(good) - 8)
    large = PluginFactory.compile(LARGE, "c")
    yield from (large[:length] for length in (4096, 20000, 100000, 200000))
    yield from (good[:len(good) * step // 8 + step] for step in range(1, 6))
    yield from (PluginFactory.compile(text, "c")
                for text in (NO_OBJECTS, METADATA_ALONE, OPERATIONS_ALONE))
    yield from (PluginFactory.compile(OF_VERSION.format(version=version), "c")
                for version in (0, 5, -1, 2147483647, -2147483648))
    with open(os.path.realpath("/proc/self/exe"), "rb") as program:
        yield program.read()


def test_every_bad_object(root, vantor):
    contents = list(bad_objects(root.base.word_size))
    for number, content in enumerate(contents):
        root.write(f"{PLUGINS}/lib{number}.so", content, 0o755)
    assert_foretold(root, vantor, len(contents))


def test_every_object_that_needs_what_the_host_lacks(root, vantor):
    good = PluginFactory.stamped(["name x"])
    contents = [
        good.replace(b"libc.so.6\0", b"libc.so.0\0"),
        re.sub(rb"GLIBC_2\.", b"GLIBC_9.", good),
        PluginFactory.compile(DATA_OF_NOBODY, "c"),
        PluginFactory.compile(CALL_OF_NOBODY, "c", "-Wl,-z,now"),
    ]
    for number, content in enumerate(contents):
        root.write(f"{PLUGINS}/lib{number}.so", content, 0o755)
    codes = sorted(finding["code"] for finding in verify(root) if finding["code"] in REJECTIONS)
    assert codes == ["missing-library", "missing-version", "undefined-symbol", "undefined-symbol"]
    assert_foretold(root, vantor, len(contents))


def test_a_library_of_a_plugins_own(root, vantor):
    root.compiled("x", NEEDY, "c", "-Wl,--no-as-needed", "-Wl,-rpath,/opt/own",
                  own_library(root, "libmine.so", "int mine;"))
    assert told_of_links(root) == []
    assert vantor().texts(WARNING) == []
    root.remove("/opt/own")
    assert_foretold(root, vantor, 1)


def own_library(root, name, text):
    """Compiles a library into /opt/own, and returns its path for linking."""
    root.write(f"/opt/own/{name}", PluginFactory.compile(text, "c", f"-Wl,-soname,{name}"))
    return root.path(f"/opt/own/{name}")


def told_of_links(root):
    return [finding for finding in verify(root) if finding["code"] in
            ("missing-library", "missing-version", "undefined-symbol", "load-order",
             "unchecked-objects", "taken-over")]


def versioned(root, name, version, symbol):
    """An own library with one symbol of a version."""
    script = root.path(f"/opt/own/{name}.map")
    root.write(f"/opt/own/{name}.map", f"{version} {{ global: {symbol}; local: *; }};\n")
    root.write(f"/opt/own/{name}", PluginFactory.compile(
        f"int {symbol}(void); int {symbol}(void) {{ return 0; }}", "c", f"-Wl,-soname,{name}",
        f"-Wl,--version-script={script}"))
    return root.path(f"/opt/own/{name}")


def test_a_symbol_of_a_version_that_a_library_has_lost(root, vantor):
    library = versioned(root, "libmine.so", "OLD", "nowhere")
    root.compiled("x", CALL_OF_NOBODY, "c", "-Wl,-z,now", "-Wl,-rpath,/opt/own", library)
    assert told_of_links(root) == []
    versioned(root, "libmine.so", "OLD", "elsewhere")
    assert_foretold(root, vantor, 1)


def test_a_library_that_a_plugin_brings_for_its_library(root, vantor):
    deep = own_library(root, "libdeep.so", "int deep;")
    root.write("/opt/own/libmine.so", PluginFactory.compile(
        "int mine;", "c", "-Wl,-soname,libmine.so", "-Wl,--no-as-needed", deep))
    root.compiled("x", NEEDY, "c", "-Wl,--no-as-needed", "-Wl,--disable-new-dtags",
                  "-Wl,-rpath,/opt/own", root.path("/opt/own/libmine.so"))
    assert told_of_links(root) == []
    assert vantor().texts(WARNING) == []
    root.compiled("x", NEEDY, "c", "-Wl,--no-as-needed", "-Wl,--enable-new-dtags",
                  "-Wl,-rpath,/opt/own", root.path("/opt/own/libmine.so"))
    assert_foretold(root, vantor, 1)


def test_a_plugin_that_is_refused_defines_nothing_for_another(root, vantor):
    root.compiled("x", CALL_OF_NOBODY)
    root.compiled("y", DATA_OF_NOBODY.replace("int nowhere;", "int gone;").replace(
        "&nowhere", "&gone") + "VANTOR_EXPORTED_ int nowhere(void);\n"
        "int nowhere(void) { return 0; }\n")
    assert sorted((one["code"], os.path.basename(one["path"])) for one in told_of_links(root)) == [
        ("undefined-symbol", "libx.so"), ("undefined-symbol", "liby.so")]
    assert vantor().status == 127


def test_a_plugin_whose_lists_lie_in_a_library_is_loaded(root, vantor):
    library = own_library(root, "libmine.so", 'const char* const needs[] = {"net", 0};')
    root.compiled("x", NEEDY.replace("VANTOR_METADATA_1(NULL",
                                     "extern const char* const needs[];\nVANTOR_METADATA_1(needs"),
                  "c", "-Wl,-rpath,/opt/own", library)
    [finding] = [one for one in verify(root) if one["severity"] != "note"]
    assert (finding["severity"], finding["code"]) == ("warning", "undetermined")
    assert vantor().texts(WARNING) == []


def test_a_library_that_others_may_write_is_told(root):
    library = own_library(root, "libmine.so", "int mine;")
    root.compiled("x", NEEDY, "c", "-Wl,--no-as-needed", "-Wl,-rpath,/opt/own", library)
    root.symlink("/evil/liby.so", f"{PLUGINS}/liby.so")
    root.write("/evil/liby.so", PluginFactory.compile(NEEDY, "c"))
    os.chmod(library, 0o666)
    os.chmod(root.path("/evil"), 0o777)
    assert {one["path"] for one in verify(root) if one["code"] == "writable"} == {
        "/opt/own/libmine.so", "/evil"}


def test_a_call_of_nobodys_function_ends_the_boot(root, vantor):
    root.compiled("x", CALL_OF_NOBODY)
    [finding] = told_of_links(root)
    assert (finding["severity"], finding["code"], finding["text"]) == (
        "error", "undefined-symbol",
        'no object defines "nowhere", which it calls: the linker ends the boot at the call')
    result = vantor()
    assert result.status == 127
    assert "undefined symbol: nowhere" in result.stderr


def test_a_function_that_need_not_be_there(root, vantor):
    root.compiled("x", WEAK_CALL_OF_NOBODY)
    assert told_of_links(root) == []
    assert vantor().status == 0


def test_a_variable_of_each_thread_is_found(root, vantor):
    text = NEEDY.replace("return 0;", "return mine - 1;").replace(
        "VANTOR_METHOD", "extern __thread int mine;\nVANTOR_METHOD", 1)
    root.compiled("x", text, "c", "-Wl,-rpath,/opt/own",
                  own_library(root, "libmine.so", "__thread int mine = 1;"))
    assert told_of_links(root) == []
    assert vantor().texts(WARNING) == []


def test_another_plugins_function_is_found_when_it_is_called(root, vantor):
    root.compiled("x", CALL_OF_NOBODY)
    root.compiled("y", NEEDY + "VANTOR_EXPORTED_ int nowhere(void);\n"
                  "int nowhere(void) { return 0; }\n")
    assert told_of_links(root) == []
    assert vantor().status == 0


def test_an_entry_under_a_name_of_the_c_library_is_not_the_plugins(root, vantor):
    root.compiled("x", """#include <stdio.h>
#include "vantor/plugin.h"
int getpagesize(void);
__attribute__((visibility("default"))) int getpagesize(void) { puts("own"); return 0; }
struct entries { int (*start)(void); };
VANTOR_EXPORTED_ struct entries operations;
struct entries operations = { getpagesize };
VANTOR_METADATA_1(NULL, NULL);
""")
    [finding] = told_of_links(root)
    assert (finding["severity"], finding["code"]) == ("error", "taken-over")
    assert re.fullmatch(
        r'the start entry is looked up by its exported name "getpagesize", which is exported by '
        r"/\S*/libc\.so\.6 too, which the boot program has loaded before: it serves this plugin",
        finding["text"]), finding
    assert "own" not in vantor().stdout


@pytest.mark.parametrize("extension", ["so", "json"])
def test_every_entry_that_is_no_regular_file(root, vantor, extension):
    kinds = ["fifo", "socket", "device", "link to a fifo", "folder", "dangling link",
             "link to itself"]
    made = [kind for kind in kinds
            if root.odd_entry(f"{PLUGINS}/{kind.replace(' ', '-')}.{extension}", kind)]
    assert len(made) >= len(kinds) - 1, "a device alone may be forbidden"
    assert_foretold(root, vantor, len(made))


def test_every_document_with_a_fault(root, vantor):
    documents = [json.dumps(changed(*case[:4])) for case in cases()]
    documents += [json.dumps(changed(3, *fault[:3])) for fault in FAULTS]
    documents += [
        "", " \n", "[]", "42", '"text"', "true ", "null", "// a comment alone",
        "/* not closed {}", "{", "{]", '{"a" 1}', "{a: 1}", '{"metadata": {"version": 1',
        '{"a": nul', '{"a": "open}', '{"a": 1 "b": 2}', '{"a": 1,,, "b": 2}', "\ufeff{}", "\0",
        "\x7fELF", "{}", nested(1001), nested(100000)]
    for number, text in enumerate(documents):
        write_text(root, str(number), text)
    assert_foretold(root, vantor, len(documents))


def test_files_that_are_good_are_not_rejected(root, vantor):
    root.native("good", provides=["ready"])
    root.write(f"{PLUGINS}/uncut.so", PluginFactory.compile(LARGE, "c")[:-1])
    write_text(root, "lenient", LENIENT)
    write_text(root, "deep", nested(1000))
    assert_foretold(root, vantor, 0)


def test_every_file_of_no_kind(root, vantor):
    for name in ["README", "old.so.1", "x.SO", "empty.", ".hidden", "lib", "x.json~"]:
        root.write(f"{PLUGINS}/{name}")
    texts = [finding["text"] for finding in verify(root) if finding["code"] == "ignored-file"]
    assert sorted(texts) == sorted(vantor().texts(WARNING))
    assert len(texts) == 7


def test_malformed_debug_entries(root, vantor):
    root.debug_configuration("", "good: : :true", "x:a:b", "# note", 'q:"open:b:c', "e:\\x:b:c")
    found = [(finding["line"], finding["text"]) for finding in verify(root)
             if finding["code"] == "malformed-entry"]
    logged = [text for text in vantor().texts(INFO) if text.startswith("ignoring malformed")]
    assert [text for _, text in found] == logged
    assert [line for line, _ in found] == [3, 4, 5, 6]


@pytest.mark.parametrize("text, line, column", [
    ("/", 1, 1), ('{"metadata": {},\n  / "a": 1}', 2, 3), ("[1 /]", 1, 4)])
def test_a_slash_that_no_boot_gets_past_is_found(root, text, line, column):
    write_text(root, "x", text)
    [finding] = [one for one in verify(root) if one["code"] == "lone-slash"]
    assert (finding["path"], finding["line"], finding["column"]) == (
        f"{PLUGINS}/x.json", line, column)
    assert finding["severity"] == "error"


def test_the_fault_of_a_document_is_found_where_it_stands(root):
    text = '{"metadata": {"version": 1, "provides": ["a"],\n  "requires": ["b",\n    7]}}'
    write_text(root, "x", text)
    [finding] = [one for one in verify(root) if one["code"] == "rejected"]
    assert (finding["line"], finding["column"]) == (3, 5)
