"""Fixtures: the packages under test, and hosts with and without them."""

import os
import shutil
import sys
import tempfile

import pytest

sys.dont_write_bytecode = True
_HERE = os.path.dirname(os.path.abspath(__file__))
_SOURCE = os.path.dirname(os.path.dirname(_HERE))
sys.path[:0] = [_HERE, os.path.join(_SOURCE, "tests", "system")]

# pylint: disable=wrong-import-position
from harness.isolation import Isolation  # noqa: E402
from support.deb import Deb  # noqa: E402
from support.host import Host  # noqa: E402

NAMES = ["vantor", "vantor-hostlibs", "vantor-dev"]


@pytest.fixture(scope="session")
def source():
    """The folder of the sources."""
    return _SOURCE


@pytest.fixture(scope="session")
def packages():
    """The packages under test by name."""
    folder = os.environ.get("VANTOR_PACKAGES", os.path.join(_SOURCE, "build/default/packages"))
    assert os.path.isdir(folder), f"{folder}: scripts/packages makes it"
    return {name: Deb.find(folder, name) for name in NAMES}


@pytest.fixture(scope="session")
def unpacked(packages):
    """A folder that holds the files of each package in a folder of its name."""
    folder = tempfile.mkdtemp(prefix="vantor-unpacked-")
    try:
        for name, deb in packages.items():
            deb.unpack(os.path.join(folder, name))
        yield folder
    finally:
        shutil.rmtree(folder)


class Hosts:
    """Makes hosts and removes them."""

    def __init__(self, memory):
        self._isolation, folder = memory
        self._folder, self._made = tempfile.mkdtemp(dir=folder), []

    def copy_of(self, pristine):
        made = Host(pristine, os.path.join(self._folder, str(len(self._made))), self._isolation)
        self._made.append(made)
        return made

    def close(self):
        for host in self._made:
            host.close()
        os.rmdir(self._folder)


def _root_from(variable):
    """The folder that the variable names."""
    folder = os.environ.get(variable)
    if not folder:
        pytest.skip(f"{variable} names no Debian root to copy")
    assert os.geteuid() == 0, "only root can install packages in a copied root"
    return os.path.realpath(folder)


@pytest.fixture(scope="session")
def memory():
    """The way of isolation, and a folder that lies in memory where this machine allows it."""
    folder = tempfile.mkdtemp(prefix="vantor-hosts-")
    try:
        isolation = Isolation(os.environ.get("VANTOR_TEST_ISOLATION", ""))
        isolation.mount_tmpfs(folder)
        yield isolation, folder
    finally:
        Isolation.remove_tree(folder)


@pytest.fixture(scope="session")
def session_hosts(memory):
    made = Hosts(memory)
    yield made
    made.close()


@pytest.fixture
def hosts(memory):
    """hosts.copy_of(root): a host of one test's own."""
    made = Hosts(memory)
    yield made
    made.close()


@pytest.fixture(scope="session")
def connected_host(session_hosts):
    """A fresh host that knows what the mirrors offer. For copying only."""
    host = session_hosts.copy_of(_root_from("VANTOR_FRESH_ROOT"))
    host.reach_mirrors()
    host.run("apt-get", "update")
    os.makedirs(host.path("/bootbank"))
    return host


@pytest.fixture(scope="session")
def ready_host(connected_host, packages, session_hosts):
    """A host with the packages installed as its maintainer installs them. For copying only."""
    host = session_hosts.copy_of(connected_host.folder)
    host.apt_install(packages["vantor"], packages["vantor-hostlibs"])
    return host


@pytest.fixture
def host(ready_host, hosts):
    """A host of one test's own with the packages installed."""
    return hosts.copy_of(ready_host.folder)


@pytest.fixture(scope="session")
def dev_root():
    """A root of the packages' architecture that has compilers, CMake, make and pkg-config."""
    return _root_from("VANTOR_DEV_ROOT")
