"""The base root: the built program, what it links to, a shell and a few tools, laid out once."""

import os
import re
import shutil
import subprocess

TOOLS = ["sh", "sleep", "cat", "echo", "ls", "kill", "true", "false", "touch",
         "mkdir"]
FOLDERS = [
    "etc/nuvex/vantor", "etc/init.d", "usr/libexec/vantor/plugins", "usr/lib/nuvex/nvsyslog/bin",
    "usr/sbin", "usr/bin", "var/log", "var/run/nuvex", "bootbank", "dev", "tmp", "proc",
]
MERGED = ["bin", "sbin", "lib", "lib32", "lib64", "libx32"]


class BuildError(Exception):
    """A program of the build, or of the harness, that cannot be used."""


def compile_program(source, target, *options):
    """Compiles one of the harness's own C files."""
    compiler = os.environ.get("CC", "cc")
    command = [compiler, "-O1", "-Wall", "-Wextra", *options, "-o", target, source]
    done = subprocess.run(command, capture_output=True, text=True, check=False)
    if done.returncode != 0:
        raise BuildError(f"{' '.join(command)}\n{done.stderr}")


def linked_files(program):
    """The shared objects that a program needs, its dynamic linker included."""
    done = subprocess.run(["ldd", program], capture_output=True, text=True, check=False)
    if "not found" in done.stdout:
        raise BuildError(f"ldd {program}:\n{done.stdout}")
    return re.findall(r"(/\S+) \(0x", done.stdout)


class BaseRoot:
    """A folder that holds what every private root starts from."""

    def __init__(self, folder, build):
        self.folder, self.build = folder, build
        self.program = os.path.join(build, "bin", "vantor")
        if not os.path.exists(self.program):
            raise BuildError(f"{self.program} is not built")
        self._lay_out()
        with open(self.program, "rb") as file:
            content = file.read()
        # The class byte of an ELF file, elf(5): 1 for 32 bits, 2 for 64.
        self.word_size = {1: 4, 2: 8}[content[4]]
        self.sanitizers = [
            name for name in ("asan", "tsan", "ubsan")
            if f"__{name}_".encode() in content
        ]

    def path(self, name):
        return os.path.join(self.folder, name.lstrip("/"))

    def _lay_out(self):
        for name in FOLDERS:
            os.makedirs(self.path(name))
        for name in MERGED:
            os.makedirs(self.path("usr/" + name), exist_ok=True)
            os.symlink("usr/" + name, self.path(name))
        os.chmod(self.path("tmp"), 0o1777)
        self._add(self.program, "usr/sbin/vantor")
        # The program looks for the host libraries in its own ../lib.
        for name in os.listdir(os.path.join(self.build, "lib")):
            if ".so" in name:
                self._add(os.path.join(self.build, "lib", name), "usr/lib/" + name)
        for name in TOOLS:
            found = shutil.which(name, path="/usr/bin:/bin")
            if found:
                self._add(found, "usr/bin/" + name)
        # Not built where the host's own libraries take the place of ours.
        nvcli = os.path.join(self.build, "bin", "nvcli")
        if os.path.exists(nvcli):
            self._add(nvcli, "usr/bin/nvcli")

    def _add(self, source, target):
        """Copies one file with all that it links to, each under the name it is looked for by."""
        if not os.path.exists(self.path(target)):
            shutil.copyfile(source, self.path(target))
            os.chmod(self.path(target), 0o755)
        for library in linked_files(source):
            folder = self.path(os.path.dirname(library))
            if library.startswith(self.build + "/") or os.path.exists(self.path(library)):
                continue
            os.makedirs(folder, exist_ok=True)
            shutil.copyfile(library, self.path(library))
            os.chmod(self.path(library), 0o755)

    def add_program(self, source, target):
        """Compiles one of the harness's own programs into the root."""
        compile_program(source, self.path(target))
        for library in linked_files(self.path(target)):
            if not os.path.exists(self.path(library)):
                self._add(library, library.lstrip("/"))

    def clone(self, target):
        """A root of its own at `target`: folders are made anew, files are hard links."""
        for folder, folders, files in os.walk(self.folder):
            place = os.path.join(target, os.path.relpath(folder, self.folder))
            os.makedirs(place, exist_ok=True)
            shutil.copymode(folder, place)
            for name in folders + files:
                source = os.path.join(folder, name)
                if os.path.islink(source):
                    os.symlink(os.readlink(source), os.path.join(place, name))
                elif name in files:
                    os.link(source, os.path.join(place, name))
