"""vantor-analyze graph and explain: the drawing of a plugin directory, and its words."""

import os
import re
import shutil
import xml.etree.ElementTree

import pytest
from harness import json_plugin
from harness.analyze import analyze, run_analyze
from harness.private_root import PLUGINS

needs_graphviz = pytest.mark.skipif(shutil.which("dot") is None, reason="Graphviz is not installed")


@pytest.fixture(name="host")
def fixture_host(root):
    # disks --> storage --> store --> volumes --> shares
    # nics (filtered)  --> net  --> shares               gone (provided by nobody) --> shares
    json_plugin.make_directories(root)
    json_plugin.write_plugin(root, "disks", provides=["storage"])
    json_plugin.write_plugin(root, "store", requires=["storage"], provides=["volumes"])
    json_plugin.write_plugin(root, "nics", provides=["net"], disabling_flags=["offline"])
    json_plugin.write_plugin(root, "shares", requires=["volumes", "net", "gone"])
    return root


def nodes_of(drawing):
    """The ids of the nodes."""
    return re.findall(r'^  "([^"]*)" \[label=', drawing, re.MULTILINE)


def test_the_drawing_of_a_directory(host):
    result = analyze(host, "graph", "--plugin-flags=offline")
    tooltip = f'tooltip="{PLUGINS}/'
    assert (result.status, result.stderr) == (0, "")
    assert result.stdout.splitlines() == [
        "digraph vantor {",
        f'  "plugin:disks" [label="disks" {tooltip}disks.json"];',
        f'  "plugin:nics" [label="nics" {tooltip}nics.json: ignoring plugin \'nics\', disabled due '
        'to boot flags: offline" style=filled fillcolor=gray90 color=gray fontcolor=gray40];',
        f'  "plugin:shares" [label="shares" {tooltip}shares.json"];',
        f'  "plugin:store" [label="store" {tooltip}store.json"];',
        '  "barrier:gone" [label="gone" shape=box style=dashed];',
        '  "barrier:net" [label="net" shape=box];',
        '  "barrier:storage" [label="storage" shape=box];',
        '  "barrier:volumes" [label="volumes" shape=box];',
        '  "plugin:disks" -> "barrier:storage";',
        '  "plugin:nics" -> "barrier:net" [color=gray style=dashed];',
        '  "plugin:store" -> "barrier:volumes";',
        '  "barrier:gone" -> "plugin:shares";',
        '  "barrier:net" -> "plugin:shares";',
        '  "barrier:storage" -> "plugin:store";',
        '  "barrier:volumes" -> "plugin:shares";',
        "}",
    ]


@pytest.mark.parametrize("options, shown", [
    (["--around=store", "--depth=0"], {"plugin:store"}),
    (["--around=store", "--depth=1"], {"plugin:store", "barrier:storage", "barrier:volumes"}),
    (["--around=store"], {"plugin:store", "barrier:storage", "barrier:volumes", "plugin:disks",
                          "plugin:shares"}),
    (["--around=net", "--depth=1"], {"barrier:net", "plugin:nics", "plugin:shares"}),
])
def test_only_what_is_near_a_name(host, options, shown):
    result = analyze(host, "graph", *options)
    assert (result.status, set(nodes_of(result.stdout))) == (0, shown)


def test_around_an_unknown_name(host):
    result = analyze(host, "graph", "--around=volume")
    assert (result.status, result.stdout, result.stderr) == (
        3, "", "vantor-analyze: no plugin and no barrier has the name 'volume'; did you mean "
        "barrier \"volumes\"?\n")


def test_around_an_empty_name_is_not_all(host):
    result = analyze(host, "graph", "--around=")
    assert (result.status, result.stdout, result.stderr) == (
        3, "", "vantor-analyze: no plugin and no barrier has the name ''\n")


@pytest.mark.parametrize("options, message", [
    (["--depth=3"], "--around"), (["--around=store", "--depth=-1"], "--depth"),
    (["--around=store", "--depth=far"], "--depth"), (["--format=png"], "--format"),
])
def test_options_that_are_refused(host, options, message):
    result = analyze(host, "graph", *options)
    assert (result.status, result.stdout) == (3, "")
    assert message in result.stderr


def test_a_cycle_is_red(root):
    json_plugin.make_directories(root)
    json_plugin.write_plugin(root, "a", provides=["x"], requires=["x"])
    drawing = analyze(root, "graph").stdout
    assert '  "plugin:a" -> "barrier:x" [color=red];\n' in drawing
    assert '  "barrier:x" -> "plugin:a" [color=red];\n' in drawing


def test_the_drawing_goes_to_a_file(host, tmp_path):
    target = tmp_path / "graph.dot"
    result = analyze(host, "graph", "--output", str(target))
    assert (result.status, result.stdout, result.stderr) == (0, "", "")
    assert target.read_text(encoding="utf-8") == analyze(host, "graph").stdout


def test_a_file_that_cannot_be_written(host):
    result = analyze(host, "graph", "--output=/nowhere/graph.dot")
    assert (result.status, result.stdout) == (3, "")
    assert result.stderr == (
        "vantor-analyze: /nowhere/graph.dot: cannot be written: No such file or directory\n")


def test_svg_without_graphviz(host):
    result = analyze(host, "graph", "--format=svg", environment={"PATH": "/nowhere"})
    assert (result.status, result.stdout, result.stderr) == (
        3, "", "vantor-analyze: there is no program 'dot': install Graphviz, or draw with "
        "--format=dot\n")


@needs_graphviz
def test_svg_with_graphviz(host):
    result = analyze(host, "graph", "--format=svg")
    assert (result.status, result.stderr) == (0, "")
    drawing = xml.etree.ElementTree.fromstring(result.stdout)
    texts = {text.text for text in drawing.iter("{http://www.w3.org/2000/svg}text")}
    assert texts == {"disks", "nics", "shares", "store", "gone", "net", "storage", "volumes"}


@needs_graphviz
def test_graphviz_reads_whatever_names_there_are(root):
    json_plugin.make_directories(root)
    names = ['say "b\\n"', "a&lt;b", "<b>bold</b>", "back\\", "line\nend", "{a|b}", "-> x; }"]
    json_plugin.write_plugin(root, "odd", provides=names)
    result = analyze(root, "graph", "--format=svg")
    assert (result.status, result.stderr) == (0, "")
    drawing = xml.etree.ElementTree.fromstring(result.stdout)
    texts = {text.text.replace("\xa0", " ")
             for text in drawing.iter("{http://www.w3.org/2000/svg}text")}
    assert texts == {name.replace("\n", "\\x0a") for name in names} | {"odd"}


def test_files_that_are_not_loaded_are_mentioned(host):
    host.write(f"{PLUGINS}/broken.json", "{")
    for arguments in (["graph"], ["explain", "disks"]):
        result = analyze(host, *arguments)
        assert (result.status, result.stderr) == (
            0, "vantor-analyze: reading the plugins found 1 error; vantor-analyze verify tells all"
            "\n")


def test_an_explained_plugin(host):
    result = analyze(host, "explain", "disks")
    assert (result.status, result.stderr) == (0, "")
    assert result.stdout.splitlines() == [
        "plugin 'disks'",
        f"  comes from        {PLUGINS}/disks.json, a JSON plugin",
        "  runs              yes",
        "  waits for         nothing",
        "  provides          \"storage\", required by 'store'",
        "  in all            waits for 0 plugins; 2 plugins wait for it",
        "  were it disabled  'store' would be left waiting for nothing at \"storage\"",
    ]


def test_an_explained_plugin_that_is_filtered_out(host):
    result = analyze(host, "explain", "nics", "--plugin-flags=offline")
    assert (result.status, result.stderr) == (0, "")
    assert result.stdout.splitlines() == [
        "plugin 'nics'",
        f"  comes from        {PLUGINS}/nics.json, a JSON plugin",
        "  is to run         not with any of the boot flags 'offline'",
        "  runs              no: ignoring plugin 'nics', disabled due to boot flags: offline",
        "  waits for         nothing",
        "  provides          \"net\", required by 'shares'",
        "  as it is          'shares' is left waiting for nothing at \"net\"",
    ]


def test_an_explained_barrier(host):
    result = analyze(host, "explain", "gone")
    assert (result.status, result.stderr) == (0, "")
    assert result.stdout.splitlines() == [
        'barrier "gone"',
        "  provided by       nobody",
        "  required by       'shares'",
        "  is reached        at once, with a system alert when somebody requires it",
        "  in all            waits for 0 plugins; 1 plugin waits for it",
        "  as it is          'shares' is left waiting for nothing",
    ]


def test_an_explained_debug_plugin(root):
    json_plugin.make_directories(root)
    root.debug_configuration("", "look:storage:seen:true")
    lines = analyze(root, "explain", "look").stdout.splitlines()
    assert lines[:2] == [
        "plugin 'look'", "  comes from        /etc/nuvex/vantor/debug.conf:2, a debug plugin"]


def test_explaining_an_unknown_name(host):
    result = analyze(host, "explain", "storge")
    assert (result.status, result.stdout, result.stderr) == (
        3, "", "vantor-analyze: no plugin and no barrier has the name 'storge'; did you mean "
        "plugin 'store' or barrier \"storage\"?\n")


@pytest.mark.parametrize("name", ["store.json", f"{PLUGINS}/store.json"])
def test_a_plugin_may_be_named_by_its_file(host, name):
    assert analyze(host, "explain", name).stdout == analyze(host, "explain", "store").stdout != ""


def test_explaining_nothing_is_refused(host):
    result = run_analyze(host, "explain")
    assert (result.status, result.stdout) == (3, "")
    assert "NAME is required" in result.stderr


def test_nothing_of_the_host_is_changed(host):
    def state():
        return {name: (os.lstat(host.path(name)).st_mtime_ns, os.lstat(host.path(name)).st_size)
                for name in host.all_files()}

    before = state()
    for arguments in (["verify"], ["graph"], ["explain", "disks"]):
        analyze(host, *arguments)
    assert state() == before
