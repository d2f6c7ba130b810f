"""Fixtures: the session's base root and way of isolation, and one private root for each test."""

import os
import signal
import sys
import tempfile

import pytest

sys.dont_write_bytecode = True

# pylint: disable=wrong-import-position
from harness import sample_boot, stand_in_proc  # noqa: E402
from harness.analyze import run_analyze  # noqa: E402
from harness.base_root import BaseRoot, BuildError, compile_program  # noqa: E402
from harness.isolation import Isolation, IsolationError  # noqa: E402
from harness.native_plugin import PluginFactory  # noqa: E402
from harness.private_root import PrivateRoot  # noqa: E402
from harness.runner import Run  # noqa: E402
from harness.sanitizers import Sanitizers  # noqa: E402
from harness.terminal import Terminal  # noqa: E402

_HERE = os.path.dirname(os.path.abspath(__file__))
_PROGRAMS = os.path.join(_HERE, "harness", "programs")
_notices = []

# Where the program writes and reads; the machine's own must stay as they are.
REAL_PATHS = [
    "/bootbank", "/etc/nuvex", "/usr/libexec/vantor", "/usr/lib/nuvex", "/var/run/nuvex",
    "/var/log/sysboot.log", "/etc/init.d/nvevtd",
]


BUILD = os.path.realpath(
    os.environ.get("VANTOR_BUILD_DIR", os.path.join(_HERE, "..", "..", "build/default")))


class Session:
    """What all tests share: made once, removed at the end, whatever happens in between."""

    def __init__(self, folder):
        self._folder, self._count = folder, 0
        # From here on this process sees mounts of its own.
        self.isolation = Isolation(os.environ.get("VANTOR_TEST_ISOLATION", ""))
        # Where it can be, all of it lives in memory: quick, and gone with this process.
        self.isolation.mount_tmpfs(folder)
        self.base = BaseRoot(os.path.join(folder, "base"), BUILD)
        self.base.add_program(os.path.join(_PROGRAMS, "witness.c"), "usr/bin/witness")
        self.enter = os.path.join(folder, "enter")
        compile_program(os.path.join(_PROGRAMS, "enter.c"), self.enter)
        PluginFactory.open(os.path.join(folder, "plugins"))
        self.sanitizers = Sanitizers(self.base.sanitizers, self.isolation.has_proc)
        self._probe()

    def _probe(self):
        """Runs what must be known of the machine before the first test."""
        root = self.new_root()
        try:
            self.sanitizers.probe_leaks(
                root, lambda program: Run(root, self, [], program=program).wait_unchecked())
        finally:
            root.remove_all()

    def new_root(self):
        self._count += 1
        root = PrivateRoot(self.base, self.isolation, os.path.join(self._folder, str(self._count)))
        if self.sanitizers.needs_stand_in_proc:
            stand_in_proc.lay_out(root, self.sanitizers.environment())
        return root


def pytest_configure(config):
    """A terminated session cleans up as an interrupted one does."""
    del config
    signal.signal(signal.SIGTERM, signal.default_int_handler)


def pytest_collection_modifyitems(items):
    """vantor-analyze has one thread and is not built with the thread sanitizer."""
    program = os.path.join(BUILD, "bin", "vantor")
    if not os.path.exists(program):
        return
    with open(program, "rb") as file:
        if b"__tsan_" not in file.read():
            return
    for item in items:
        if item.path.name.startswith("test_analyze_"):
            item.add_marker(pytest.mark.skip(reason="one thread: not built with this sanitizer"))


@pytest.fixture(scope="session")
def session():
    """The base root, the plugins' factory and the way into a root."""
    folder = tempfile.mkdtemp(prefix="vantor-")
    try:
        made = Session(folder)
        before = [os.path.lexists(path) for path in REAL_PATHS]
        _notices.append(f"isolation: {made.isolation.way}")
        if made.sanitizers.notice:
            _notices.append(f"leaks are NOT looked for: {made.sanitizers.notice}")
        yield made
        assert before == [os.path.lexists(path) for path in REAL_PATHS], "the machine was touched"
    except (BuildError, IsolationError) as error:
        pytest.exit(f"no system test can run: {error}", returncode=3)
    finally:
        Isolation.remove_tree(folder)


@pytest.fixture
def root(session, request):
    """A host of its own for one test."""
    made = session.new_root()
    request.node.private_root = made
    try:
        yield made
    finally:
        for run in made.runs:
            run.abandon()
        made.remove_all()


@pytest.fixture
def start(session, root):
    """start(argument..., **how) begins a run of the program; see Run."""
    return lambda *arguments, **how: Run(root, session, arguments, **how)


@pytest.fixture
def vantor(start):
    """vantor(argument..., **how) runs the program to its end and returns the Result."""
    return lambda *arguments, **how: start(*arguments, **how).wait()


@pytest.fixture
def terminal(request):
    """A pseudo-terminal for interactive runs; its transcript is kept for a failed test's report."""
    made = Terminal()
    request.node.terminal = made
    yield made
    made.close()


@pytest.hookimpl(hookwrapper=True)
def pytest_runtest_makereport(item):
    """Adds to the report of a failed test what its runs wrote and left."""
    outcome = yield
    report = outcome.get_result()
    made = getattr(item, "private_root", None)
    if report.failed and report.when == "call" and made:
        for number, run in enumerate(made.runs, 1):
            report.sections.append((f"run {number}", str(run.abandon())))
        if hasattr(item, "terminal"):
            report.sections.append(("terminal", repr(item.terminal.transcript())))
        report.sections.append(("system alerts", "\n".join(made.alerts())))
        report.sections.append(("/tmp/ran", "\n".join(made.ran())))


def pytest_terminal_summary(terminalreporter):
    """Says how the roots were isolated, and what could not be looked for."""
    for notice in _notices:
        terminalreporter.write_line(f"system tests: {notice}")


@pytest.fixture
def analyze(root):
    """analyze(argument..., **how) runs the program on this machine, where the logs are."""
    return lambda *arguments, **how: run_analyze(root, *arguments, **how)


@pytest.fixture
def boot(tmp_path):
    """The arguments that name the log and the drawing of a boot that has taken place."""
    (tmp_path / "boot.log").write_text(sample_boot.LOG, encoding="utf-8")
    (tmp_path / "tree.dot").write_text(sample_boot.DOT, encoding="utf-8")
    return [str(tmp_path / "boot.log"), "--dot", str(tmp_path / "tree.dot")]
