"""The usage text and the command lines that are answered without a run."""

import pytest

USAGE = "".join(line + "\n" for line in [
    " -h,--help                  display this help message",
    "    --init                  run in init mode (this will cause nvsyslog to be",
    "                            launched, and the start method to be invoked on the",
    "                            plugins)",
    "    --invoke                run a particular method from the plugin's function",
    "                            pointer table (requires --method)",
    "    --method=<method>       specifies the method identifier",
    "    --plugin=<plugin>[,<plugin>]",
    "                            comma separated list of plugins to load (note that ",
    "                            this will prevent the loading of all plugins, and ",
    "                            only the specified plugins will be loaded), which",
    "                            are specified by the filename (basename of the",
    "                            plugin path)",
    "    --trace                 trace execution of the plugins for debugging ",
    "                            purposes",
    "    --verbose               logs plugin execution to syslog to aid in debugging",
    "    --randomize[=seed]      evaluate the execution order randomizing the",
    "                            order of independent jobs. Only useful for testing.",
    "                            You can specify an optional seed for reproducibility",
    "    --parallel              evaluate the execution order accounting for",
    "                            parallelism between jobs which are independent",
    "    --plugin-flags=<flag>[,<flag>]",
    "                            specify flags for conditional execution of plugins.",
    "                            If there are multiple occurences of this option, the",
    "                            last one is the only one that counts. See plugin",
    "                            documentation for which plugins support flags.",
    "    --interactive           prompts before performing the action, allowing",
    "                            plugins to be skipped, executed, or to fall to a",
    "                            troubleshooting shell",
    "    --disable-plugins=<plugin>[,<plugin>]",
    "                            a comma separated list of plugins to be disabled",
    "                            during execution, which are specified by the",
    "                            filename (basename of the plugin path)",
    "    --dump-dependency-tree[=<path>]",
    "                            dump plugin dependency tree information to the file",
    "                            specified by path.  If path is not specified, the",
    "                            information will be dumped to the console",
    "    --interactive-mode-requires=<plugin>[,<plugin>]",
    "                            interactive mode requires the specified plugins to ",
    "                            be loaded before it can be activated",
])
HINT = "usage: /usr/sbin/vantor --help for usage information\n"


def assert_nothing_was_run(root, result):
    assert result.messages == []
    assert root.ran() == []
    assert not root.exists("/var/log/sysboot.log")
    assert not root.exists("/bootbank/vantorbk.gz")


@pytest.mark.parametrize("option", ["-h", "--help"])
def test_help_prints_the_usage_text_and_runs_nothing(root, vantor, option):
    root.native("alpha")
    result = vantor(option)
    assert (result.status, result.stdout, result.stderr) == (0, USAGE, "")
    assert_nothing_was_run(root, result)


def test_help_first_hides_the_bad_options_behind_it(vantor):
    result = vantor("-h", "--no-such-option", "--method")
    assert (result.status, result.stdout, result.stderr) == (0, USAGE, "")


def test_a_bad_option_before_help_ends_the_run(vantor):
    result = vantor("--no-such-option", "-h")
    assert (result.status, result.stdout) == (1, "")


def test_help_behind_a_word_that_is_no_option_is_found(vantor):
    result = vantor("word", "--help")
    assert (result.status, result.stdout, result.stderr) == (0, USAGE, "")


@pytest.mark.parametrize("argument, diagnostic", [
    ("--no-such-option", "unrecognized option '--no-such-option'"),
    ("-x", "invalid option -- 'x'"),
    ("--plugin-flags", "option '--plugin-flags' requires an argument"),
    ("--method", "option '--method' requires an argument"),
    ("--plugin", "option '--plugin' requires an argument"),
    ("--run-once", "option '--run-once' requires an argument"),
    ("--disable-plugins", "option '--disable-plugins' requires an argument"),
    ("--plugin-directory", "option '--plugin-directory' requires an argument"),
    ("--interactive-mode-requires", "option '--interactive-mode-requires' requires an argument"),
    ("--init=now", "option '--init' doesn't allow an argument"),
    ("--trace=yes", "option '--trace' doesn't allow an argument"),
])
def test_an_option_error_is_diagnosed_with_a_hint(root, vantor, argument, diagnostic):
    root.native("alpha")
    result = vantor(argument)
    assert result.stderr == f"/usr/sbin/vantor: {diagnostic}\n{HINT}"
    assert (result.status, result.stdout) == (1, "")
    assert_nothing_was_run(root, result)


@pytest.mark.parametrize("arguments", [
    ["--invoke"],
    ["--invoke", "--method=start"],
    ["--invoke", "--plugin=libalpha.so"],
    ["--invoke", "--method=", "--plugin=libalpha.so"],
    ["--invoke", "--method=start", "--plugin=,"],
])
def test_invoke_without_method_or_plugin_is_refused(root, vantor, arguments):
    root.native("alpha")
    result = vantor(*arguments)
    assert result.stderr == "invoke requires a method and plugin specified."
    assert (result.status, result.stdout) == (1, USAGE)
    assert_nothing_was_run(root, result)
