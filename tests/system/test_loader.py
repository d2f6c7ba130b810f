"""Which files of the plugin directory become plugins, by which names, and the filters."""

import pytest

from harness.messages import NOT_ELF, linker_says, starting
from harness.syslog_recorder import DEBUG, INFO, WARNING

PLUGINS = "/usr/libexec/vantor/plugins"


def unspecified(name):
    return (WARNING, f"ignoring plugin '{name}' of unspecified type...")


def unknown(name, extension):
    return (WARNING, f"ignoring plugin '{name}' of unknown type ({extension})...")


@pytest.mark.parametrize("file_name, message", [
    ("README", unspecified("README")),
    ("libfoo", unspecified("libfoo")),
    ("libfoo.so.1", unknown("libfoo.so.1", "1")),
    ("libfoo.SO", unknown("libfoo.SO", "SO")),
    ("libfoo.so ", unknown("libfoo.so ", "so ")),
    ("trailing.", unknown("trailing.", "")),
    (".hidden", unknown(".hidden", "hidden")),
    ("notes.txt", unknown("notes.txt", "txt")),
    ("50%s.n%n", unknown("50%s.n%n", "n%n")),
])
def test_a_file_that_is_no_plugin_is_reported(root, vantor, file_name, message):
    root.write(f"{PLUGINS}/{file_name}")
    result = vantor()
    assert (result.status, result.messages, root.alerts()) == (0, [message], [])


def test_a_folder_is_an_entry_like_any_other(root, vantor):
    root.folder_at(f"{PLUGINS}/folder")
    assert vantor().messages == [unspecified("folder")]


@pytest.mark.parametrize("file_name, name", [
    ("libfoo.so", "foo"), ("foo.so", "foo"), ("lib.so", ""), (".so", ""), ("liblib.so", "lib"),
    ("liblibfoo.so", "libfoo"), ("libfoo.bar.so", "foo.bar"), ("foolib.so", "foolib"),
    ("libfoo bar.so", "foo bar"), ("Libfoo.so", "Libfoo"), ("li.so", "li"),
])
def test_the_name_of_a_plugin(root, vantor, file_name, name):
    root.native("it", file_name=file_name)
    result = vantor()
    assert result.messages == starting(name)
    assert root.started() == ["it"]


def test_a_link_to_a_plugin_is_a_plugin_of_the_links_name(root, vantor):
    root.native("there", file_name="../elsewhere.so")
    root.symlink("../elsewhere.so", f"{PLUGINS}/libhere.so")
    assert vantor().messages == starting("here")


def test_a_blacklisted_plugin_is_named_and_left_out(root, vantor):
    root.native("off")
    result = vantor("--disable-plugins=off")
    assert result.messages == [(INFO, "ignoring plugin 'off' due to blacklist")]
    assert root.ran() == []
    assert "sysboot: off" not in root.read("/var/log/sysboot.log")


@pytest.mark.parametrize("entry", ["Off", "of", "liboff.so", "liboff", " off", "off "])
def test_a_blacklist_entry_is_the_plugins_exact_name(root, vantor, entry):
    root.native("off")
    assert vantor(f"--disable-plugins={entry}").messages == starting("off")


def test_a_blacklisted_file_that_is_broken_still_reports_so(root, vantor):
    root.write(f"{PLUGINS}/liboff.so", NOT_ELF)
    result = vantor("--disable-plugins=off")
    text = linker_says("liboff.so", "invalid ELF header")
    assert result.messages == [(WARNING, text)]
    assert root.alerts() == [text]


@pytest.mark.parametrize("how", [
    {"arguments": ["--disable-plugins=giver"]},
    {"arguments": ["--plugin-flags=x"], "disabling_flags": ["x"]},
    {"arguments": [], "required_flags": ["x"]},
])
def test_a_plugin_left_out_still_provides_its_barriers(root, vantor, how):
    root.native("giver", provides=["ready"], **{k: v for k, v in how.items() if k != "arguments"})
    root.native("taker", requires=["ready"])
    result = vantor(*how["arguments"])
    assert result.messages[-1:] == starting("taker")
    assert root.started() == ["taker"]
    assert root.alerts() == []


def disabled_by(name, flags):
    return (WARNING, f"ignoring plugin '{name}', disabled due to boot flags: {flags}")


def missing_flags(name, flags):
    return (WARNING,
            f"ignoring plugin '{name}', disabled due to missing required boot flags: {flags}")


@pytest.mark.parametrize("required, disabling, boot, expected", [
    ([], [], "", starting("x")),
    ([], [], "a,b", starting("x")),
    ([], ["nousb", "noacpi", "other"], "nousb,extra,noacpi", [disabled_by("x", "noacpi nousb ")]),
    ([], ["a"], "b", starting("x")),
    ([], ["a"], "", starting("x")),
    (["b", "a"], [], "c,a,b", starting("x")),
    (["b", "c", "a"], [], "a", [missing_flags("x", "b c ")]),
    (["b", "B"], [], "", [missing_flags("x", "B b ")]),
    (["a"], [], "A", [missing_flags("x", "a ")]),
    (["r"], ["d"], "d", [disabled_by("x", "d ")]),
    (["r"], ["d"], "r,d", [disabled_by("x", "d ")]),
    (["r"], ["d"], "r", starting("x")),
    (["f", "f"], [], "", [missing_flags("x", "f ")]),
])
def test_boot_flags(root, vantor, required, disabling, boot, expected):
    root.native("x", required_flags=required, disabling_flags=disabling)
    result = vantor(f"--plugin-flags={boot}")
    assert (result.status, result.messages) == (0, expected)


def test_the_blacklist_is_asked_before_the_boot_flags(root, vantor):
    root.native("x", disabling_flags=["d"], required_flags=["r"])
    result = vantor("--disable-plugins=x", "--plugin-flags=d")
    assert result.messages == [(INFO, "ignoring plugin 'x' due to blacklist")]


@pytest.mark.parametrize("version, messages", [
    (1, starting("x")), (2, starting("x")),
    (3, [disabled_by("x", "d ")]), (4, [disabled_by("x", "d ")]),
])
def test_flags_count_from_version_3_on(root, vantor, version, messages):
    root.native("x", version=version, disabling_flags=["d"])
    assert vantor("--plugin-flags=d").messages == messages


@pytest.mark.parametrize("version, record", [(1, ""), (2, ""), (3, "x7,"), (4, "x7,")])
def test_run_once_counts_from_version_3_on(root, vantor, version, record):
    root.native("x", version=version, run_once=True, plugin_version="7")
    vantor()
    assert root.run_once_record() == f"vantor.run-once={record}\n"


def test_a_plugin_that_has_run_stays_in_the_queue(root, vantor):
    root.native("x", run_once=True, plugin_version="7", provides=["ready"])
    root.native("taker", requires=["ready"])
    result = vantor("--run-once=x7")
    assert result.messages == [
        (DEBUG, "ignoring plugin 'x' because version '7' has already been run"),
        *starting("taker")]
    assert "sysboot: x" in root.read("/var/log/sysboot.log")
    assert root.alerts() == []
