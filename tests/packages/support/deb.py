"""Debian packages: what one says and holds, and a copy of it with another version."""

import glob
import os
import re
import subprocess


def output_of(*command):
    """The standard output of a command that has to succeed."""
    done = subprocess.run(command, capture_output=True, text=True, check=False)
    assert done.returncode == 0, f"{' '.join(command)}\n{done.stdout}{done.stderr}"
    return done.stdout


class Deb:
    """One package file."""

    def __init__(self, path):
        self.path = path

    @classmethod
    def find(cls, folder, name):
        """The only package of this name in the folder."""
        found = glob.glob(os.path.join(folder, f"{name}_*.deb"))
        assert len(found) == 1, f"{folder} holds {len(found)} packages {name}"
        return cls(found[0])

    def field(self, name):
        return output_of("dpkg-deb", "-f", self.path, name).strip()

    def contents(self):
        """Each name, folders with a slash behind it, with "<mode> <owner>" as tar shows it."""
        lines = output_of("dpkg-deb", "-c", self.path).splitlines()
        found = (re.fullmatch(r"(\S+) (\S+) +\d+ \S+ \S+ \.(/.*)", line) for line in lines)
        return {one[3]: f"{one[1]} {one[2]}" for one in found}

    def files(self):
        return {name for name in self.contents() if not name.endswith("/")}

    def unpack(self, folder):
        """Lays the files out below the folder."""
        output_of("dpkg-deb", "-x", self.path, folder)
        return folder

    def control_file(self, name):
        return output_of("dpkg-deb", "-I", self.path, name)

    def with_version(self, version, folder, change=lambda unpacked: None):
        """The same package as a file of the folder, of another version and changed."""
        unpacked = os.path.join(folder, "unpacked")
        output_of("dpkg-deb", "-R", self.path, unpacked)
        control = os.path.join(unpacked, "DEBIAN", "control")
        with open(control, encoding="utf-8") as file:
            text = re.sub(r"(?m)^Version: .*$", f"Version: {version}", file.read())
        with open(control, "w", encoding="utf-8") as file:
            file.write(text)
        change(unpacked)
        made = os.path.join(folder, os.path.basename(self.path).replace(
            self.field("Version"), version))
        output_of("dpkg-deb", "--root-owner-group", "-b", unpacked, made)
        return Deb(made)


def make_deb(folder, name, files=(), **fields):
    """A package of these files, {name: content}, with these fields of its control file."""
    tree = os.path.join(folder, name)
    for file, content in dict(files).items():
        os.makedirs(os.path.dirname(tree + file), exist_ok=True)
        with open(tree + file, "w", encoding="utf-8") as opened:
            opened.write(content)
    os.makedirs(os.path.join(tree, "DEBIAN"))
    described = {
        "Package": name, "Version": "1", "Architecture": "all",
        "Maintainer": "Nobody <nobody@vantor.example>", "Description": "for a test",
    } | fields
    with open(os.path.join(tree, "DEBIAN", "control"), "w", encoding="utf-8") as file:
        file.write("".join(f"{key}: {value}\n" for key, value in described.items()))
    output_of("dpkg-deb", "--root-owner-group", "-b", tree, tree + ".deb")
    return Deb(tree + ".deb")
