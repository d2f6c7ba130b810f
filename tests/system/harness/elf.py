"""What ELF files say of themselves: word size, needed libraries, symbols."""

import re
import subprocess


def word_size(content):
    """The bytes of a pointer, from a file's first bytes or all of them."""
    return {1: 4, 2: 8}[content[4]]


def word_size_of(path):
    with open(path, "rb") as file:
        return word_size(file.read(5))


def _readelf(option, path):
    done = subprocess.run(["readelf", "-W", option, path], check=True, capture_output=True,
                          text=True)
    return done.stdout


def needed(path):
    """The names of the libraries that the dynamic linker is asked for."""
    return re.findall(r"\(NEEDED\).*\[(.*)\]", _readelf("-d", path))


def _symbols(path, imported):
    rows = [line.split() for line in _readelf("--dyn-syms", path).splitlines()]
    return {row[7] for row in rows
            if len(row) > 7 and row[0][:-1].isdigit() and (row[6] == "UND") == imported}


def imports(path):
    """The symbols that an object takes from others, as "name" or "name@version"."""
    return _symbols(path, True)


def exports(path):
    """The symbols that an object offers to others, as "name" or "name@version"."""
    return _symbols(path, False)


def plain(symbols):
    """The names without their versions."""
    return {symbol.partition("@")[0] for symbol in symbols}


def demangled(symbols):
    """C++ names as they are written, without parameters and marks of the compiler."""
    names = sorted(plain(symbols))
    done = subprocess.run(["c++filt", "-p"], input="".join(name + "\n" for name in names),
                          check=True, capture_output=True, text=True)
    return {re.sub(r"\[abi:\w+\]", "", line) for line in done.stdout.splitlines()}
