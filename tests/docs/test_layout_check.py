"""scripts/check-layout notices when sources, CMake files and documents no longer agree."""

import pathlib
import shutil
import subprocess

import pytest

CHECKOUT = pathlib.Path(__file__).resolve().parents[2]
COPIED = ["src", "docs", "scripts", "README.md"]


@pytest.fixture(name="checkout")
def fixture_checkout(tmp_path):
    """A checkout with what a test changes as files of its own and all else as links."""
    for path in CHECKOUT.iterdir():
        if path.name in COPIED:
            copy = shutil.copytree if path.is_dir() else shutil.copy2
            copy(path, tmp_path / path.name)
        elif path.name not in (".git", "build"):
            (tmp_path / path.name).symlink_to(path)
    return tmp_path


def check(checkout, *arguments):
    """The status, and the slips that the unchanged checkout does not have."""
    known = subprocess.run([CHECKOUT / "scripts" / "check-layout"], capture_output=True, text=True,
                           check=False).stdout.splitlines()
    done = subprocess.run([checkout / "scripts" / "check-layout", *arguments],
                          capture_output=True, text=True, check=False)
    assert done.stderr == ""
    return done.returncode, [line for line in done.stdout.splitlines() if line not in known]


def replace(path, old, new):
    text = path.read_text(encoding="utf-8")
    assert old in text
    path.write_text(text.replace(old, new, 1), encoding="utf-8")


def test_the_checkout_as_it_is_has_no_slip():
    done = subprocess.run([CHECKOUT / "scripts" / "check-layout"], capture_output=True, text=True,
                          check=False)
    assert (done.returncode, done.stdout, done.stderr) == (0, "", "")


DRAWING_SLIP = ("docs/architecture.md: the drawing is not of what CMake declares: "
                "scripts/check-layout --draw")


@pytest.mark.parametrize("file, old, new, slip", [
    ("docs/architecture.md", "vantor --> vantor_driver", "vantor --> vantor_io", DRAWING_SLIP),
    ("docs/architecture.md", "```mermaid", "```text", DRAWING_SLIP),
    ("src/json/CMakeLists.txt", "vantor_plugin_document vantor_plugins vantor_platform",
     "vantor_plugin_document vantor_plugins vantor_platform vantor_debug_config", DRAWING_SLIP),
    ("docs/architecture.md", "- `src/io/ChildProcess.{h,cc}`", "- `src/io/Other.cc`",
     "docs/architecture.md: 0 lines for src/io/ChildProcess.h, not 1"),
    ("README.md", "- `cmake/`: ", "- ", "README.md: 0 lines for the folder cmake/, not 1"),
    ("docs/architecture.md", "- `analyze/boot/`: ", "- ",
     "docs/architecture.md: 0 lines for the folder analyze/boot/, not 1"),
])
def test_a_document_that_has_gone_stale_is_a_slip(checkout, file, old, new, slip):
    replace(checkout / file, old, new)
    status, slips = check(checkout)
    assert status == 1 and slip in slips


def test_a_command_that_is_gone_is_a_slip(checkout):
    replace(checkout / "README.md", "\n    scripts/test ", "\n    scripts/tests ")
    status, slips = check(checkout)
    assert status == 1
    assert [line.partition(": ")[2] for line in slips] == [
        "names scripts/tests, which does not exist"]


def test_an_include_of_a_library_that_is_not_declared_is_a_slip(checkout):
    replace(checkout / "src/io/afstream.cc", '#include "io/afstream.h"',
            '#include "graph/Node.h"\n#include "io/afstream.h"')
    assert check(checkout) == (1, [
        "src/io/afstream.cc:1: vantor_io includes graph/Node.h of vantor_graph, "
        "which its DEPENDS do not reach"])


def test_drawing_anew_mends_the_drawing(checkout):
    architecture = checkout / "docs" / "architecture.md"
    before = architecture.read_text(encoding="utf-8")
    replace(architecture, "    vantor --> vantor_driver\n", "")
    assert check(checkout, "--draw")[1] == []
    assert architecture.read_text(encoding="utf-8") == before
