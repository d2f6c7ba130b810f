"""What each package holds, with which rights, and what it says of itself."""

import gzip
import os
import re

import pytest
from support.deb import output_of

LIBRARIES = ["libbasekit.so", "libnvkctl.so", "libnvkuser.so"]
DOCUMENTS = ["changelog.Debian.gz", "changelog.gz", "copyright"]
FOLDERS = {"amd64": "x86_64-linux-gnu", "i386": "i386-linux-gnu"}


def documents(name):
    return {f"/usr/share/doc/{name}/{document}" for document in DOCUMENTS}


def without_pages(deb):
    """The files but the manual pages, which have tests of their own."""
    return {name for name in deb.files() if not name.startswith("/usr/share/man/")}


def test_vantor_holds_the_program_and_what_boots_it(packages):
    assert without_pages(packages["vantor"]) == documents("vantor") | {
        "/etc/default/vantor",
        "/etc/init.d/vantor",
        "/usr/sbin/vantor",
        "/usr/sbin/vantor-analyze",
        "/usr/share/bash-completion/completions/vantor",
        "/usr/share/bash-completion/completions/vantor-analyze",
        "/usr/share/lintian/overrides/vantor",
    }
    assert packages["vantor"].contents()["/usr/libexec/vantor/plugins/"] == "drwxr-xr-x root/root"


def test_the_host_libraries_lie_where_the_dynamic_linker_looks(packages):
    deb = packages["vantor-hostlibs"]
    folder = f"/usr/lib/{FOLDERS[deb.field('Architecture')]}"
    assert without_pages(deb) == documents("vantor-hostlibs") | {
        *(f"{folder}/{library}" for library in LIBRARIES),
        "/usr/bin/nvcli",
        "/usr/share/bash-completion/completions/nvcli",
        "/usr/share/lintian/overrides/vantor-hostlibs",
    }
    assert {"/usr/lib/nuvex/nvcli/", "/usr/lib/nuvex/nvcli/ext/", "/usr/lib/nuvex/nvcli/int/",
            "/usr/lib/nuvex/nvcli/int/ext/"} <= set(deb.contents())


def test_the_developers_package_holds_what_a_plugin_is_built_with(packages, source):
    kit = os.path.join(source, "examples", "kit")
    examples = {
        os.path.join("/usr/share/doc/vantor-dev/examples", os.path.relpath(folder, kit), name)
        for folder, _, names in os.walk(kit) for name in names
    }
    assert packages["vantor-dev"].files() == documents("vantor-dev") | {
        os.path.normpath(name) for name in examples
    } | {
        "/usr/include/vantor/plugin.h",
        "/usr/share/cmake/vantor-plugin/vantor-plugin-config-version.cmake",
        "/usr/share/cmake/vantor-plugin/vantor-plugin-config.cmake",
        "/usr/share/pkgconfig/vantor-plugin.pc",
    }


@pytest.mark.parametrize("name, page", [
    ("vantor", "man8/vantor.8"), ("vantor", "man8/vantor-analyze.8"),
    ("vantor-hostlibs", "man1/nvcli.1"),
])
def test_each_program_has_a_manual_page(packages, name, page):
    assert f"/usr/share/man/{page}.gz" in packages[name].files()


@pytest.mark.parametrize("name", ["vantor", "vantor-hostlibs", "vantor-dev"])
def test_only_what_is_run_can_be_executed(packages, name):
    programs = {
        "/usr/sbin/vantor", "/usr/sbin/vantor-analyze", "/usr/bin/nvcli", "/etc/init.d/vantor",
    }
    for file, described in packages[name].contents().items():
        mode = "drwxr-xr-x" if file.endswith("/") else "-rw-r--r--"
        if file in programs:
            mode = "-rwxr-xr-x"
        assert (file, described) == (file, f"{mode} root/root")


def test_settings_are_the_administrators(packages):
    lines = packages["vantor"].control_file("conffiles").split()
    assert lines == ["/etc/default/vantor", "/etc/init.d/vantor"]


def test_the_plugin_directory_is_watched(packages):
    lines = packages["vantor"].control_file("triggers").splitlines()
    assert [line for line in lines if not line.startswith("#")] == [
        "interest-noawait /usr/libexec/vantor/plugins"]


def test_a_hosts_own_libraries_serve_as_well_as_ours(packages):
    needs = packages["vantor"].field("Depends").split(", ")
    assert needs[0] == "vantor-hostlibs | vantor-host-libraries"
    for field in ("Provides", "Conflicts", "Replaces"):
        assert packages["vantor-hostlibs"].field(field) == "vantor-host-libraries"


def test_the_libraries_that_the_program_needs_are_dependencies(packages):
    needs = {need.split(" ")[0] for need in packages["vantor"].field("Depends").split(", ")}
    assert needs == {
        "vantor-hostlibs", "libc6", "libgcc-s1", "libstdc++6", "libboost-filesystem1.74.0",
        "libboost-iostreams1.74.0", "libelf1", "libfmt9",
    }


def test_what_plugins_are_built_with_is_the_same_everywhere(packages):
    assert packages["vantor-dev"].field("Architecture") == "all"
    assert (packages["vantor"].field("Architecture")
            == packages["vantor-hostlibs"].field("Architecture"))


def test_the_newest_change_is_of_the_packages_version(packages, unpacked):
    for name, deb in packages.items():
        path = os.path.join(unpacked, name, "usr/share/doc", name, "changelog.Debian.gz")
        with gzip.open(path, "rt", encoding="utf-8") as file:
            newest = re.match(r"vantor \((\S+)\) ", file.readline())
        assert newest[1] == deb.field("Version")


def test_the_same_documents_give_the_same_bytes(unpacked):
    for folder, _, names in os.walk(unpacked):
        for name in names:
            if name.endswith(".gz"):
                with open(os.path.join(folder, name), "rb") as file:
                    # gzip's own name and time fields: neither is there.
                    assert file.read(8)[3:] == b"\0\0\0\0\0", name


def test_pkg_config_names_the_plugin_folder(unpacked):
    folder = os.path.join(unpacked, "vantor-dev", "usr/share/pkgconfig")
    ask = ["env", f"PKG_CONFIG_LIBDIR={folder}", "pkg-config"]
    assert output_of(*ask, "--variable=plugindir", "vantor-plugin") == (
        "/usr/libexec/vantor/plugins\n")
    assert output_of(*ask, "--cflags", "vantor-plugin").strip() in ("", "-I/usr/include")
