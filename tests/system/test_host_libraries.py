"""A host's own libraries take the place of ours without a rebuild of the program."""

import os
import subprocess

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

SOURCES = os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", "..", "src")


def test_alerts_go_to_the_kernel_control_library_that_the_host_has(root, vantor):
    library = root.path("/usr/lib/libnvkctl.so")
    os.unlink(library)  # the name only: other hosts share the file
    subprocess.run(
        ["g++", "-std=c++17", "-shared", "-fPIC", "-I", SOURCES, "-o", library, "-x", "c++", "-"],
        input=HOST_LIBRARY, text=True, check=True)
    root.native("taker", requires=["ready"])
    result = vantor()
    assert result.status == 0
    assert root.read("/tmp/host-alerts") == (
        'host: Vantor dependency error: Initialization barrier "ready" is not provided by any '
        'plugin but the following plugins require it: "taker"\n')
    assert root.alerts() == []
