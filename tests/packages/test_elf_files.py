"""The installed ELF files: hardened, and in need of nothing but the libraries named here."""

import glob
import os
import re

import pytest
from support.deb import output_of

RUNTIME = ["libc.so.6", "libgcc_s.so.1", "libstdc++.so.6"]
NEEDED = {
    "vantor/usr/sbin/vantor": [
        "libbasekit.so", "libboost_filesystem.so.1.74.0", "libboost_iostreams.so.1.74.0",
        "libnvkctl.so", *RUNTIME],
    "vantor/usr/sbin/vantor-analyze": ["libelf.so.1", "libfmt.so.9", "libm.so.6", *RUNTIME],
    "vantor-hostlibs/usr/bin/nvcli": ["libbasekit.so", *RUNTIME],
    "vantor-hostlibs/usr/lib/*/libbasekit.so": RUNTIME,
    "vantor-hostlibs/usr/lib/*/libnvkctl.so": RUNTIME,
    "vantor-hostlibs/usr/lib/*/libnvkuser.so": [],
}
PROGRAMS = [name for name in NEEDED if not name.endswith(".so")]
# The empty library has no code that any of this could protect.
WITH_CODE = [name for name in NEEDED if not name.endswith("libnvkuser.so")]
MACHINES = {"amd64": ("ELF64", "X86-64"), "i386": ("ELF32", "Intel 80386")}
# 32-bit programs call it by a name within the file.
STACK_CHECK = re.compile(r"__stack_chk_fail(_local)?\b")


@pytest.fixture(name="readelf")
def fixture_readelf(unpacked):
    """readelf(file, option...): what the ELF tools say of a file."""

    def read(name, *options):
        found = glob.glob(os.path.join(unpacked, name))
        assert len(found) == 1, f"{name}: {found}"
        return output_of("readelf", "-W", *options, found[0])

    return read


@pytest.mark.parametrize("name", NEEDED)
def test_only_the_named_libraries_are_needed(readelf, name):
    libraries = re.findall(r"\(NEEDED\) .*\[(.*)\]", readelf(name, "-d"))
    assert set(libraries) <= set(NEEDED[name])
    # Which of the compiler's own libraries are called, the compiler decides.
    assert set(libraries) >= set(NEEDED[name]) - set(RUNTIME)


@pytest.mark.parametrize("name", NEEDED)
def test_libraries_are_looked_for_in_the_systems_folders_alone(readelf, name):
    dynamic = readelf(name, "-d")
    assert "(NEEDED)" in dynamic or "libnvkuser" in name
    assert not re.search(r"\(R(UN)?PATH\)", dynamic)


@pytest.mark.parametrize("name", NEEDED)
def test_it_is_of_the_packages_word_size(readelf, packages, name):
    header = readelf(name, "-h")
    size, machine = MACHINES[packages["vantor"].field("Architecture")]
    assert re.search(rf"Class: +{size}\n", header)
    assert re.search(rf"Machine: .*{machine}\n", header)


@pytest.mark.parametrize("name", PROGRAMS)
def test_programs_lie_anywhere_in_memory(readelf, name):
    assert re.search(r"\(FLAGS_1\).*\bPIE\b", readelf(name, "-d"))


@pytest.mark.parametrize("name", NEEDED)
def test_relocations_are_read_only_once_it_runs(readelf, name):
    assert "GNU_RELRO" in readelf(name, "-l")
    assert re.search(r"\(FLAGS\).*\bBIND_NOW\b", readelf(name, "-d"))


@pytest.mark.parametrize("name", NEEDED)
def test_no_memory_is_writable_and_executable(readelf, name):
    segment = r"^  (?:LOAD|GNU_STACK) +(?:0x\w+ +){5}([R ][W ][E ])"
    flags = re.findall(segment, readelf(name, "-l"), re.M)
    assert "R E" in flags
    assert "RWE" not in flags


@pytest.mark.parametrize("name", WITH_CODE)
def test_the_stack_is_protected(readelf, name):
    assert STACK_CHECK.search(readelf(name, "--dyn-syms"))


@pytest.mark.parametrize("name", NEEDED)
def test_nothing_is_left_for_a_debugger(readelf, name):
    sections = readelf(name, "-S")
    assert ".dynsym" in sections
    assert ".symtab" not in sections
    assert ".debug_info" not in sections
