"""Native plugins: stamped ones without a compiler, and compiled ones from a text of C or C++."""

import hashlib
import os
import subprocess

from harness.base_root import BuildError

MARK = b"VANTOR TEST PLUGIN DESCRIPTION"
ROOM = 16384

_HERE = os.path.dirname(os.path.abspath(__file__))
_INCLUDE = os.path.join(_HERE, "..", "..", "..", "include")


class PluginFactory:
    """Compiles each plugin text once in a session."""

    folder = None
    _stamp = None

    @classmethod
    def open(cls, folder):
        cls.folder = folder
        os.makedirs(folder)
        with open(os.path.join(_HERE, "programs", "stamped_plugin.c"), encoding="utf-8") as file:
            cls._stamp = cls.compile(file.read(), "c", "-Wl,-Bsymbolic")

    @classmethod
    def compile(cls, text, language, *options):
        """The bytes of the shared object that the text compiles to."""
        digest = hashlib.sha256("\0".join((text, language, *options)).encode()).hexdigest()[:16]
        source = os.path.join(cls.folder, f"{digest}.{language}")
        target = os.path.join(cls.folder, f"{digest}.so")
        if not os.path.exists(target):
            with open(source, "w", encoding="utf-8") as file:
                file.write(text)
            compiler = os.environ.get("CC", "cc")
            if language == "cc":
                compiler = os.environ.get("CXX", "c++")
            command = [
                compiler, "-O1", "-Wall", "-Wextra", "-Werror", "-fPIC", "-shared",
                "-I", _INCLUDE, "-o", target, source, *options,
            ]
            done = subprocess.run(command, capture_output=True, text=True, check=False)
            if done.returncode != 0:
                raise BuildError(f"{' '.join(command)}\n{done.stderr}")
        with open(target, "rb") as file:
            return file.read()

    @classmethod
    def stamped(cls, lines):
        """The shared object of the stamped plugin with these lines for its description."""
        text = "\n".join(lines).encode() + b"\n\0"
        if len(text) > ROOM:
            raise BuildError(f"a description of {len(text)} bytes does not fit")
        start = cls._stamp.index(MARK)
        return cls._stamp[:start] + text + cls._stamp[start + len(text):]


def write_native_plugin(path, name, version=3, start=0, apply=None, **description):
    """Writes a stamped plugin that notes "start <name>", "apply <name>" and "end <name>".

    start, apply    what the method returns; None leaves the entry of the table null
    requires, provides, required_flags, disabling_flags
                    names, in the record's order
    plugin_version, run_once
                    fields of the record
    null_lists      every list of the record is a null pointer
    creates         a file that the method makes
    opens_to_read, opens_to_write
                    a FIFO that the method opens, so that it waits for the other end
    meets_at, meets a folder, and how many plugins must be in their methods there at one time
    """
    lines = [f"name {name}", f"version {version}"]
    for key, value in [("start", start), ("apply", apply), *description.items()]:
        values = value if isinstance(value, (list, tuple)) else [value]
        lines += [f"{key} {int(one) if isinstance(one, bool) else one}"
                  for one in values if one is not None]
    with open(path, "wb") as file:
        file.write(PluginFactory.stamped(lines))
    os.chmod(path, 0o755)
