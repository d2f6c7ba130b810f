"""Native plugins laid out by hand, in assembly, as a plugin author without our header sees them.

The offsets are numbers, and every object ends with its page. The page behind it is part of the
file and forbids every access, so a read of one byte too many is the end of the program; its zeros
would do no harm if they could be read. What lies before an object, and between its fields, is
filled with bytes that mean something else.
"""

import os
import re

from harness.base_root import BuildError
from harness.elf import word_size, word_size_of
from harness.native_plugin import PluginFactory
from harness.private_root import PLUGINS

PAGE, FILL = 4096, 0xEE
# Word size to offsets; "end" is where the object ends.
TABLE = {
    4: {"start": 0, "apply_host_profile": 4, "end": 8},
    8: {"start": 0, "apply_host_profile": 8, "end": 16},
}
SHORT_RECORD = {
    4: {"version": 0, "requires": 4, "provides": 8, "end": 12},
    8: {"version": 0, "requires": 8, "provides": 16, "end": 24},
}
LONG_RECORD = {
    4: {"version": 0, "requires": 4, "provides": 8, "plugin_version": 12, "run_once": 16,
        "required_flags": 20, "disabling_flags": 24, "end": 28},
    8: {"version": 0, "requires": 8, "provides": 16, "plugin_version": 24, "run_once": 32,
        "required_flags": 40, "disabling_flags": 48, "end": 56},
}
_POINTER = {4: ".long", 8: ".quad"}


def _linker_script(pages):
    """Each page, and what is behind it, is a segment of its own; flags are 4 r, 2 w, 1 x."""
    headers, sections = [], []
    for name in pages:
        headers += [f"{name} PT_LOAD FLAGS(6);", f"behind_{name} PT_LOAD FLAGS(0);"]
        sections += [f".{part} : ALIGN({PAGE}) {{ *(.{part}) }} :{part}"
                     for part in (name, f"behind_{name}")]
    code = [f".{name} : {{ *(.{name}) }} :code" for name in (
        "hash", "gnu.hash", "dynsym", "dynstr", "rel.dyn", "rela.dyn", "text")]
    return "\n".join([
        "PHDRS {", "code PT_LOAD FILEHDR PHDRS FLAGS(5);", "data PT_LOAD FLAGS(6);",
        "linking PT_DYNAMIC FLAGS(6);", "stack PT_GNU_STACK FLAGS(6);", *headers, "}",
        "SECTIONS {", ". = SIZEOF_HEADERS;", *code, f". = ALIGN({PAGE});",
        ".dynamic : { *(.dynamic) } :data :linking", ".strings : { *(.strings) } :data",
        *sections, "/DISCARD/ : { *(.note*) *(.comment) }", "}", ""])


def _method(word, name, result):
    """A method that returns the result; what the caller must not look at is no zero."""
    if result is None:
        return []
    move = f"movl ${result}, %eax" if word == 4 else f"movabsq ${0xEEEEEEEE << 32 | result}, %rax"
    return [".text", f"{name}:", move, "ret"]


def _page(name, size, cells):
    """An object of so many bytes at the end of its page; cells are pairs of offset and content."""
    begin = PAGE - size
    lines = [f'.section .{name}, "aw", @progbits', f".org {begin}, {FILL}", f"{name}:"]
    for offset, content in cells:
        lines += [f".org {begin + offset}, {FILL}", content]
    return lines + [f".org {PAGE}, {FILL}", f'.section .behind_{name}, "a", @progbits',
                    f".zero {PAGE}"]


def _list(word, name, values, ended):
    """A list of pointers to strings, and a null pointer behind the last."""
    labels = [f"{name}_{number}" for number in range(len(values))]
    lines = ['.section .strings, "a", @progbits']
    lines += [f'{label}: .asciz "{value}"' for label, value in zip(labels, values)]
    pointers = labels + (["0"] if ended else [])
    return lines + _page(name, word * len(pointers), [
        (word * number, f"{_POINTER[word]} {pointer}") for number, pointer in enumerate(pointers)])


def assembly(word, version, table=None, record=None, unended=(), start=0, apply_host_profile=0,
             **fields):
    """The text of a plugin; see write_raw_plugin()."""
    methods = {"start": start, "apply_host_profile": apply_host_profile}
    table = table or TABLE[word]
    record = record or (SHORT_RECORD if version < 3 else LONG_RECORD)[word]
    lines = [".globl operations, metadata", ".type operations, @object", ".type metadata, @object"]
    for name, result in methods.items():
        lines += _method(word, name, result)
    lines += _page("operations", table["end"], [
        (offset, f"{_POINTER[word]} {'0' if methods[name] is None else name}")
        for name, offset in table.items() if name != "end"])
    cells = []
    for name, offset in record.items():
        value = fields.get(name)
        if name == "version":
            cells.append((offset, f".long {version}"))
        elif name == "run_once":
            cells.append((offset, f".byte {value or 0}"))
        elif name != "end":
            cells.append((offset, f"{_POINTER[word]} {'0' if value is None else name}"))
            if name == "plugin_version" and value is not None:
                lines += _page(name, len(value) + 1, [(0, f'.asciz "{value}"')])
            elif value is not None:
                lines += _list(word, name, value, name not in unended)
    return "\n".join(lines + _page("metadata", record["end"], cells)) + "\n"


def write_raw_plugin(root, name, version, **how):
    """Writes lib<name>.so into the plugin directory.

    requires, provides, required_flags, disabling_flags, plugin_version, run_once
                        what the fields of the record hold; None is a null pointer
    start, apply_host_profile
                        what the methods return; None leaves the entry of the table null
    record, table       the offsets of the fields that are there, and where they end; without them,
                        what the version has
    unended             the lists that lack the null pointer behind the last name
    """
    word = word_size_of(root.base.program)
    text = assembly(word, version, **how)
    pages = re.findall(r"\.section \.behind_(\w+)", text)
    script = os.path.join(PluginFactory.folder, "-".join(pages) + ".ld")
    with open(script, "w", encoding="ascii") as file:
        file.write(_linker_script(pages))
    content = PluginFactory.compile(
        text, "s", "-nostdlib", "-Wl,-T," + script,
        "-Wl,--build-id=none", f"-Wl,-z,max-page-size={PAGE}")
    if word_size(content) != word:
        raise BuildError("the compiler's word size is not the program's")
    root.write(f"{PLUGINS}/lib{name}.so", content, 0o755)
