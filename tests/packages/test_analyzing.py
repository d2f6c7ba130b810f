"""What vantor-analyze says of a 32-bit host: on the host itself, and from a build machine."""

import glob
import os
import subprocess

import pytest
from support.host import PLUGINS

CYCLE = ('{"metadata": {"version": 1, "provides": ["%s"], "requires": ["%s"]}, '
         '"operations": {"start": []}}')
DOCUMENTS = {
    "one.json": CYCLE % ("a", "b"),
    "two.json": CYCLE % ("b", "a"),
    "three.json": CYCLE % ("c", "c"),
    "typo.json": CYCLE % ("x", "storag"),
    "slash.json": '{"metadata": / }',
    "libtwin.json": CYCLE % ("y", "storage"),
    "twin.json": CYCLE % ("z", "storage"),
    "rare.json": '{"metadata": {"version": 3, "provides": ["rarity"], "requires": [], '
                 '"run_once": false, "plugin_version": "1", "required_flags": ["rare"]}, '
                 '"operations": {"start": ["no such command"]}}',
    "caf\u00e9.json": '{"metadata": {"version": 1, "provides": ["caf\u00e9"], '
                      '"requires": ["rarity", "th\u00e9"]}, "operations": {"start": []}}',
    "README": "",
    "gone.debug": "",
}


@pytest.fixture(name="objects", scope="module")
def fixture_objects(source):
    """The shared objects that the 32-bit build has made, good and bad, and one of this machine's."""
    found = {}
    for folder in ("i386/examples", "i386/tests/unit/plugins/objects"):
        for path in sorted(glob.glob(os.path.join(source, "build", folder, "*.so"))):
            with open(path, "rb") as file:
                found[os.path.basename(path)] = file.read()
    program = os.path.join(source, "build/default/bin/vantor-analyze")
    if not found or not os.path.exists(program):
        pytest.skip("this needs the builds of both word sizes")
    with open(os.path.join(source, "build/default/examples/libstorage.so"), "rb") as file:
        found["foreign.so"] = file.read()
    found["cut.so"] = found["libstorage.so"][:len(found["libstorage.so"]) // 2]
    return found


def test_both_word_sizes_say_the_same_of_a_host(host, objects, source):
    for name, content in {**DOCUMENTS, **objects}.items():
        host.write(f"{PLUGINS}/{name}", content)
    host.write("/etc/nuvex/vantor/debug.conf", "good:a:b:true\nbad:a\n")
    for arguments in (["verify"], ["verify", "--format=json"], ["verify", "--format=sarif"],
                      ["verify", "--strict", "--plugin-flags=rare"], ["graph"],
                      ["explain", "storage"]):
        inside = host.try_run("vantor-analyze", *arguments)
        outside = subprocess.run(
            [os.path.join(source, "build/default/bin/vantor-analyze"), *arguments,
             f"--root={host.folder}"], capture_output=True, text=True, check=False)
        assert (inside.returncode, inside.stderr) == (outside.returncode, outside.stderr), arguments
        assert inside.stdout == outside.stdout, arguments
        if arguments == ["verify"]:
            assert inside.returncode == 2
            for code in ("cycle", "no-provider", "filtered-provider", "lone-slash", "truncated",
                         "duplicate-name", "foreign-architecture", "malformed-entry",
                         "unsupported-version", "rejected", "ignored-file"):
                assert f"[{code}]: " in inside.stdout, code


def test_what_the_host_lacks_is_told_of_a_plugin(host, objects):
    good = objects["libstorage.so"]
    assert b"libc.so.6\0" in good
    host.write(f"{PLUGINS}/libstorage.so", good)
    told = host.try_run("vantor-analyze", "verify").stdout
    assert "missing-library" not in told and "unchecked-objects" not in told, told
    host.write(f"{PLUGINS}/libstorage.so", good.replace(b"libc.so.6\0", b"libc.so.7\0"))
    told = host.try_run("vantor-analyze", "verify")
    assert told.returncode == 2
    assert (f"{PLUGINS}/libstorage.so: error[missing-library]: plugin `{PLUGINS}/libstorage.so' is "
            "invalid: libc.so.7: cannot open shared object file: No such file or directory\n"
            ) in told.stdout
