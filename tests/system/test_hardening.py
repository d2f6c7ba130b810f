"""The program is built so that a flaw in it is hard to exploit, whatever flags a build forgets."""

import os
import re
import subprocess

import pytest


@pytest.fixture(name="readelf")
def fixture_readelf(session):
    """readelf(option...): what the ELF tools say of the program."""
    return lambda *options: subprocess.run(
        ["readelf", "-W", *options, session.base.program],
        check=True, capture_output=True, text=True).stdout


def test_the_program_lies_anywhere_in_memory(readelf):
    assert re.search(r"\(FLAGS_1\).*\bPIE\b", readelf("-d"))


def test_relocations_are_read_only_once_the_program_runs(readelf):
    assert "GNU_RELRO" in readelf("-l")
    assert re.search(r"\(FLAGS\).*\bBIND_NOW\b", readelf("-d"))


def test_no_memory_is_writable_and_executable(readelf):
    segment = r"^  (?:LOAD|GNU_STACK) +(?:0x\w+ +){5}([R ][W ][E ])"
    flags = re.findall(segment, readelf("-l"), re.M)
    assert "R E" in flags
    assert "RWE" not in flags


def test_the_stack_is_protected(readelf):
    assert "__stack_chk_fail" in readelf("--dyn-syms")


def test_calls_of_the_c_library_are_checked(readelf, session):
    if session.base.sanitizers:
        pytest.skip("the sanitizers check these calls themselves")
    assert re.search(r"__(?!stack)\w+_chk@", readelf("--dyn-syms"))


def test_no_code_is_changed_when_it_is_loaded(readelf):
    assert "TEXTREL" not in readelf("-d")


@pytest.mark.parametrize("name", ["bin/vantor", "bin/vantor-analyze", "bin/nvcli",
                                  "lib/libnvkctl.so", "lib/libnvkuser.so", "lib/libbasekit.so"])
def test_libraries_are_looked_for_in_folders_that_have_a_name(session, name):
    file = os.path.join(session.base.build, name)
    if not os.path.exists(file):
        pytest.skip("not built here: the thread sanitizer or the host's own libraries")
    dynamic = subprocess.run(["readelf", "-dW", file], check=True, capture_output=True,
                             text=True).stdout
    [path] = re.findall(r"\(RUNPATH\).*\[(.*)\]", dynamic)
    assert "$ORIGIN/../lib" in path.split(":")
    assert all(folder.startswith(("/", "$ORIGIN")) for folder in path.split(":"))


def test_no_library_is_read_from_the_working_directory(root, vantor):
    root.write("/tmp/libstdc++.so.6", "no library")
    result = vantor("--help", cwd="/tmp")
    assert (result.status, result.stderr) == (0, "")
