"""The program is built so that a flaw in it is hard to exploit, whatever flags a builder forgets."""

import re
import subprocess

import pytest

from harness.build import PROGRAM, SANITIZED


def readelf(*options):
    return subprocess.run(
        ["readelf", "-W", *options, PROGRAM], check=True, capture_output=True, text=True
    ).stdout


def test_the_program_is_position_independent():
    assert re.search(r"\(FLAGS_1\).*\bPIE\b", readelf("-d"))


def test_relocations_are_read_only_once_the_program_runs():
    assert "GNU_RELRO" in readelf("-l")
    assert re.search(r"\(FLAGS\).*\bBIND_NOW\b", readelf("-d"))


def test_no_segment_is_writable_and_executable():
    segments = re.findall(r"^  (?:LOAD|GNU_STACK) .* ([R ][W ][E ]) 0x", readelf("-l"), re.M)
    assert segments
    assert "RWE" not in segments


def test_the_stack_is_protected():
    assert "__stack_chk_fail" in readelf("--dyn-syms")


@pytest.mark.skipif(SANITIZED, reason="sanitizers check these calls themselves")
def test_calls_of_the_c_library_are_fortified():
    assert re.search(r"__\w+_chk@", readelf("--dyn-syms").replace("__stack_chk_fail", ""))
