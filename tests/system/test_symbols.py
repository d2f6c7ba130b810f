"""What the program takes from other libraries: no more than a host's own libraries are known for.

A host puts its own kernel-control library and command framework in the place of ours, so whatever
else the program took from ours would keep it from starting there.
"""

import os
import re

import pytest

from harness.elf import demangled, exports, imports, needed

OPERATIONS = {
    "libnvkctl.so": {
        "NvkCtl::System::SystemInfoImpl::" + name
        for name in ("SystemInfoImpl", "~SystemInfoImpl", "SetSystemAlert")},
    "libnvkuser.so": set(),
    # A class that derives from Dispatcher takes all of its virtual operations, called or not.
    "libbasekit.so": {
        "typeinfo for BaseKit::AutoCli::Dispatcher",
        *("BaseKit::AutoCli::" + name for name in (
            "CommandInput::New", "CommandOutput::New",
            "OptionParser::OptionParser", "OptionParser::~OptionParser",
            "OptionParser::ParseString", "OptionParser::GetParseErrors",
            "OptionParser::GetCommandParameters", "OptionParser::GetCommandPath")),
        *("BaseKit::AutoCli::Dispatcher::" + name for name in (
            "Dispatcher", "~Dispatcher", "ExecuteCommand", "FormatOutput",
            "GetDefaultOutputFormatParameters", "GetRootNamespace", "HasFormatter",
            "GetFormatter", "GetFormatters", "AddExternalDirectory", "AddPlugin",
            "GetPluginNames", "RegisterPlugin", "AddDefaultDirectories",
            "ResetRegistrations", "GetCommand"))},
}
COMPILERS = r"libstdc\+\+\.so\.6|libgcc_s\.so\.1|libm\.so\.6|libc\.so\.6|ld-linux.*\.so\.\d"
PROGRAMS = COMPILERS + (
    r"|libnvkctl\.so|libnvkuser\.so|libbasekit\.so|libz\.so\.1"
    r"|libboost_(filesystem|system|iostreams)\.so\.1\.\d+\.0")


@pytest.fixture(name="program")
def fixture_program(session):
    if session.base.sanitizers:
        pytest.skip("a sanitizer takes more of the libraries, and is one")
    return session.base.program


@pytest.fixture(name="ours")
def fixture_ours(session):
    """ours(name): the path of a host library of our own."""
    folder = os.path.join(session.base.build, "lib")
    if not os.path.exists(os.path.join(folder, "libbasekit.so")):
        pytest.skip("built with the host's own libraries")
    return lambda name: os.path.join(folder, name)


@pytest.mark.parametrize("library", OPERATIONS)
def test_the_program_takes_the_named_operations_and_nothing_else(program, ours, library):
    taken = imports(program) & exports(ours(library))
    assert demangled(taken) == OPERATIONS[library]


def test_no_other_library_has_what_is_taken_of_the_hosts(program, ours):
    offered = set().union(*(exports(ours(library)) for library in OPERATIONS))
    # A version in a name would be our library's own mark, which a host's does not bear.
    mangled = {name for name in imports(program) if re.match(r"_Z\w*(6NvkCtl|7BaseKit)", name)}
    assert mangled
    assert [name for name in mangled if "@" in name] == []
    assert mangled <= offered


def test_the_program_needs_no_library_but_those_it_is_known_to_need(program):
    libraries = needed(program)
    assert [name for name in libraries if not re.fullmatch(PROGRAMS, name)] == []
    assert {"libnvkctl.so", "libbasekit.so", "libc.so.6"} <= set(libraries)


@pytest.mark.parametrize("library", OPERATIONS)
def test_our_host_libraries_need_the_compilers_alone(program, ours, library):
    del program
    assert [name for name in needed(ours(library)) if not re.fullmatch(COMPILERS, name)] == []


def test_the_program_exports_nothing_that_plugins_could_lean_on(program):
    assert [name for name in demangled(exports(program)) if name.startswith("vantor::")] == []
