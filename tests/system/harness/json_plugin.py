"""JSON plugins and the commands that they run: documents, and descriptions for the framework."""

import json

from harness.private_root import PLUGINS
from harness.syslog_recorder import ERR

NVCLI = "/usr/bin/nvcli"
# Where the framework looks for descriptions, in its order.
DIRECTORIES = [
    "/usr/lib/nuvex/nvcli", "/usr/lib/nuvex/nvcli/int", "/usr/lib/nuvex/nvcli/int/ext",
    "/usr/lib/nuvex/nvcli/ext",
]


def document(version=3, start=(), apply=None, provides=(), requires=(), **metadata):
    """A plugin document as Python's values; what its version asks for is there.

    apply       the commands of "apply_host_profile"; None leaves the key out
    metadata    further keys: required_flags, disabling_flags, run_once, plugin_version
    """
    described = {"version": version, "provides": provides, "requires": requires}
    if version >= 3:
        described |= {"run_once": False, "plugin_version": "1"}
    operations = {"start": start}
    if apply is not None:
        operations["apply_host_profile"] = apply
    return {"metadata": described | metadata, "operations": operations}


def write_plugin(root, name, *start, **how):
    """Writes <name>.json with these start commands; see document()."""
    write_text(root, name, json.dumps(document(start=start, **how)))


def write_text(root, name, text):
    """Writes <name>.json as it stands."""
    root.write(f"{PLUGINS}/{name}.json", text)


def option(name, kind="string", **more):
    """An option of a described command."""
    return {"name": name, "kind": kind, **more}


def command(path, *execute, options=(), summary="For the tests"):
    """A described command that executes a program."""
    return {"path": path, "summary": summary, "options": list(options), "execute": list(execute)}


def describe(root, *commands, file_name="commands.json", directory=DIRECTORIES[0]):
    """Writes a description file; the other directories are there too, so nothing is logged."""
    make_directories(root)
    root.write(f"{directory}/{file_name}", json.dumps({"commands": list(commands)}))


def make_directories(root):
    for name in DIRECTORIES:
        if not root.exists(name):
            root.folder_at(name)


def describe_notes(root):
    """Commands that every case can use.

    "test note --text=TEXT" adds a line to what root.ran() tells; "test fail --text=TEXT" does so,
    complains about it on standard error and ends with status 3.
    """
    root.script("/usr/bin/note", 'echo "$*" >>/tmp/ran')
    root.script("/usr/bin/fail", 'echo "$*" >>/tmp/ran', 'echo "no $*" >&2', "exit 3")
    text = option("text", letter="t", required=True, summary="What is noted")
    describe(root, command("test note", "/usr/bin/note", "${text}", options=[text]),
             command("test fail", "/usr/bin/fail", "${text}", options=[text]),
             file_name="notes.json")


def shell_command(root, path, *lines):
    """Describes a command without options that is a shell script of these lines."""
    name = path.replace(" ", "-")
    root.script(f"/usr/bin/{name}", *lines)
    describe(root, command(path, f"/usr/bin/{name}"), file_name=f"{name}.json")


def unparsed(plugin, error, operation="start"):
    """What is logged of a command line that does not parse."""
    return (ERR, f"unable to parse '{operation}' commands in context '{plugin}': {error}")


def failed(line, plugin, error, operation="start"):
    """What is logged of a command that failed."""
    return (ERR, f"execution of '{line}' failed in context {plugin}[{operation}]': {error}")
