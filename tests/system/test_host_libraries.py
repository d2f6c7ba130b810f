"""A host's own libraries take the place of ours without a rebuild of the program."""

import os
import subprocess

from harness.json_plugin import failed, unparsed, write_plugin
from harness.messages import starting
from harness.syslog_recorder import ERR

HOST_LIBRARY = r"""
#include "platform/NvkCtl.h"

#include <fstream>

namespace NvkCtl::System {

SystemInfoImpl::SystemInfoImpl() {}
SystemInfoImpl::~SystemInfoImpl() {}
void SystemInfoImpl::SetSystemAlert(const std::string& text) {
    std::ofstream("/tmp/host-alerts", std::ios::app) << "host: " << text << '\n';
}

}  // namespace NvkCtl::System
"""

_HERE = os.path.dirname(os.path.abspath(__file__))
SOURCES = os.path.join(_HERE, "..", "..", "src")
HOST_FRAMEWORK = os.path.join(_HERE, "harness", "programs", "host_basekit.cc")


def install(root, name, *arguments, **how):
    """Compiles a library of the host's own in place of ours of that name."""
    library = root.path(f"/usr/lib/{name}")
    os.unlink(library)  # the name only: other hosts share the file
    subprocess.run(["g++", "-std=c++17", "-shared", "-fPIC", "-o", library, *arguments],
                   check=True, **how)


def test_alerts_go_to_the_kernel_control_library_that_the_host_has(root, vantor):
    install(root, "libnvkctl.so", "-I", SOURCES, "-x", "c++", "-", input=HOST_LIBRARY, text=True)
    root.native("taker", requires=["ready"])
    result = vantor()
    assert result.status == 0
    assert root.read("/tmp/host-alerts") == (
        'host: Vantor dependency error: Initialization barrier "ready" is not provided by any '
        'plugin but the following plugins require it: "taker"\n')
    assert root.alerts() == []


def test_commands_go_to_the_framework_that_the_host_has(root, vantor):
    install(root, "libbasekit.so", HOST_FRAMEWORK)
    write_plugin(root, "disks", "quiet", "unknown word", "disk attach --name=sda --force=yes",
                 "disk break")
    result = vantor()
    assert (result.status, result.messages) == (0, [
        *starting("disks"),
        unparsed("disks", "the host knows no 'unknown'"),
        unparsed("disks", "the host helps nobody"),
        (ERR, "unable to add external directory to the nvcli dispatcher: "
              "the host refuses /usr/lib/nuvex/nvcli/ext"),
        failed("disk break", "disks", "the host broke it"),
        failed("disk break", "disks", "and is sorry")])
    assert root.read("/tmp/host-framework").splitlines() == [
        "nvcli: quiet", "nvcli: unknown word", "nvcli: disk attach --name=sda --force=yes", "made",
        "executes for vantor disk attach force=yes name=sda", "nvcli: disk break",
        "executes for vantor disk break", "gone, with 3"]
