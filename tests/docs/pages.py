"""The manual pages: built from their sources and rendered as plain text."""

import os
import re
import subprocess
from functools import lru_cache
from pathlib import Path

ROOT = Path(__file__).resolve().parents[2]
FOLDER = ROOT / "docs" / "man"
NAMES = sorted(path.name[:-len(".scd")] for path in FOLDER.glob("*.scd"))

_ENVIRONMENT = {"PATH": os.environ["PATH"], "LC_ALL": "C.UTF-8", "SOURCE_DATE_EPOCH": "0"}


def run(*arguments, **options):
    """Runs a program and returns what came of it, the outputs as text."""
    return subprocess.run(arguments, capture_output=True, encoding="utf-8", check=False,
                          **{"env": _ENVIRONMENT, **options})


def source(name):
    """The page as it is written."""
    return (FOLDER / (name + ".scd")).read_text(encoding="utf-8")


@lru_cache(maxsize=None)
def build(name):
    """What scdoc(1) makes of a page, with everything that it says."""
    return run("scdoc", input=source(name))


@lru_cache(maxsize=None)
def rendered(name):
    """A page as plain text, its lines as long as their paragraphs, no word divided."""
    built = build(name)
    assert built.returncode == 0, f"{name}: {built.stderr}"
    done = run("groff", "-t", "-man", "-Tascii", "-rLL=5000n", "-rHY=0", "-P-c", "-P-b", "-P-u",
               input=built.stdout)
    assert done.returncode == 0 and done.stdout.strip(), f"{name}: {done.stderr}"
    return done.stdout


def plain(name):
    """The words of a page with one blank between them."""
    return " ".join(rendered(name).split())


def section(name, title):
    """The rendered lines of one section, without its heading."""
    found = re.search(rf"^{re.escape(title)}\n(.*?)(?=^\S|\Z)", rendered(name),
                      re.MULTILINE | re.DOTALL)
    assert found, f"{name} has no section {title}"
    return found[1].splitlines()


def examples(name):
    """The literal blocks of a page's source, escapes resolved."""
    blocks = re.findall(r"^```\n(.*?)^```$", source(name), re.MULTILINE | re.DOTALL)
    return [re.sub(r"\\(.)", r"\1", block) for block in blocks]
