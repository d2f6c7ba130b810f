"""What a real bash completes, on a terminal, with the completion files of the sources."""

import gzip
import os
import re

import pexpect
import pytest
from harness.messages import NVCLI_USAGE

# Words that no completion produces, to see where the prompt and an answer end.
PROMPT, END = "@prompt@", "@end@"
OPTIONS = [
    "-h", "--help", "--init", "--invoke", "--method=", "--plugin=", "--trace", "--verbose",
    "--randomize", "--parallel", "--plugin-flags=", "--interactive", "--disable-plugins=",
    "--dump-dependency-tree", "--interactive-mode-requires=", "--run-once=",
    "--plugin-directory=",
]
PAGE = NVCLI_USAGE + """
Commands without a namespace:
  reboot  Starts over

network route:
  load    Adds the routes of a table
  list    Shows the routes

system folder:
  create  Creates a folder and those above it
"""
COMMAND = """\
Usage: nvcli network route load --table=TEXT [OPTION]...

Adds the routes of a table

Options:
  -t, --table=TEXT         A file of /etc/sample-host/tables (required)
  -m, --metric=INTEGER     How far away they are
      --family=inet|inet6  The kind of their addresses
  -r, --replace            Forget all earlier ones
  -h, --help               Show this page

Described in examples/json/commands/network.json
"""

# As vantor-analyze lists its verbs, and the options of one of them.
VERBS = """\
Shows what a boot will do before it runs, and where its time went afterwards.
Usage: vantor-analyze [OPTIONS] SUBCOMMAND

Options:
  -h,--help                   Print this help message and exit
  --version                   Print the version and exit

Subcommands:
  verify                      Tell all that is wrong with a plugin directory
  explain                     Tell in words what a plugin waits for
  blame                       Show what each plugin waited for
"""
VERB = """\
Tell all that is wrong with a plugin directory
Usage: vantor-analyze verify [OPTIONS] [DIRECTORY]

Positionals:
  DIRECTORY                   The plugin directory, a host's path

Options:
  -h,--help                   Print this help message and exit
  --root FOLDER               Read the host whose file system lies in FOLDER
  --format FORMAT:{text,json,sarif} [text]
                              text, json or sarif
  --strict                    Make every warning an error
"""


class Bash:
    """An interactive bash. Instead of running a command line, its programs show their words."""

    def __init__(self, source, folder, settings=()):
        self.folder = folder
        self.shell = pexpect.spawn(
            "/bin/bash", ["--norc", "--noprofile", "-i"], cwd=folder, encoding="utf-8", timeout=20,
            echo=False, dimensions=(200, 4000), env={
                "PATH": f"{folder}/bin:/usr/bin:/bin", "TERM": "dumb", "HOME": folder,
                "LC_ALL": "C"})
        self.shell.delaybeforesend = None
        self.say("PS1=@'prompt'@; PS2=; unset HISTFILE")
        self.say("bind 'set enable-bracketed-paste off' 'set bell-style none'")
        self.say("bind 'set show-all-if-ambiguous on' 'set page-completions off'")
        self.say("bind 'set completion-query-items 0' 'set colored-stats off'")
        for setting in settings:
            self.say(setting)
        for name in ("vantor", "nvcli", "vantor-analyze"):
            self.say(f". '{source}/packaging/completion/{name}'")

    def say(self, line):
        self.shell.sendline(line + f" ; echo @'end'@")
        self.shell.expect_exact(END)
        self.shell.expect_exact(PROMPT)

    def words(self, line):
        """The words of the command once <Tab> was pressed behind the line."""
        self.shell.send(line + "\t")
        self.shell.sendline(f" {END}")
        self.shell.expect(r"(?s)words((?:<[^>]*>)*)<@end@>")
        words = re.findall(r"<([^>]*)>", self.shell.match[1])
        self.shell.expect_exact(PROMPT)
        return words

    def offers(self, line):
        """What is listed when <Tab> is pressed behind the line."""
        self.shell.send(line + "\t")
        self.shell.send("\x01\x0b")  # back to the line's begin, and away with all behind it
        self.shell.sendline("echo @'end'@")
        self.shell.expect_exact(END)
        # The terminal does not echo, so this is the list alone.
        listed = set(self.shell.before.split())
        self.shell.expect_exact(PROMPT)
        return listed

    def close(self):
        self.shell.close(force=True)


@pytest.fixture(name="folder", scope="module")
def fixture_folder(tmp_path_factory):
    """A folder with plugins, folders and stand-ins for the programs."""
    tmp_path = tmp_path_factory.mktemp("completion")
    for name in ("libstorage.so", "libstart net.so", "setup.json", "probe.debug", "README"):
        (tmp_path / "plugins").mkdir(exist_ok=True)
        (tmp_path / "plugins" / name).touch()
    (tmp_path / "pictures").mkdir()
    (tmp_path / "bin").mkdir()
    show = "#!/bin/sh\nprintf words; printf '<%s>' \"$@\"\n"
    (tmp_path / "bin" / "vantor").write_text(show)
    (tmp_path / "page").write_text(PAGE)
    (tmp_path / "command").write_text(COMMAND)
    (tmp_path / "verbs").write_text(VERBS)
    (tmp_path / "verb").write_text(VERB)
    (tmp_path / "bin" / "vantor-analyze").write_text(f"""#!/bin/sh
case "$*" in
--help) cat {tmp_path}/verbs ;;
*--help) cat {tmp_path}/verb ;;
*) printf words; printf '<%s>' "$@" ;;
esac
""")
    (tmp_path / "bin" / "nvcli").write_text(f"""#!/bin/sh
echo "$@" >> {tmp_path}/asked
case "$*" in
--help | '--directory=pictures --help') cat {tmp_path}/page ;;
'network route load --help') cat {tmp_path}/command ;;
*--help) exit 2 ;;
*) printf words; printf '<%s>' "$@" ;;
esac
""")
    for name in ("vantor", "nvcli", "vantor-analyze"):
        (tmp_path / "bin" / name).chmod(0o755)
    return str(tmp_path)


NO_BREAKS = "COMP_WORDBREAKS=${COMP_WORDBREAKS//=}"


@pytest.fixture(name="bash", scope="module", params=[(), (NO_BREAKS,)],
                ids=["breaks-at-=", "does-not"])
def fixture_bash(request, source, folder):
    made = Bash(source, folder, request.param)
    yield made
    made.close()


def test_every_option_of_the_program_is_offered(bash):
    assert set(OPTIONS) <= bash.offers("vantor -")


def test_the_options_are_those_of_the_program(source):
    with open(os.path.join(source, "src/driver/CommandLine.cc"), encoding="utf-8") as file:
        rules = re.findall(r'\{"([\w-]+)", (\w+)_argument', file.read())
    known = {"--" + name + ("=" if kind == "required" else "") for name, kind in rules}
    assert known == set(OPTIONS) - {"-h"}


@pytest.mark.parametrize("line, words", [
    ("vantor --in", ["--in"]),
    ("vantor --ini", ["--init"]),
    ("vantor --tr", ["--trace"]),
    ("vantor --meth", ["--method="]),
    ("vantor --method=st", ["--method=start"]),
    ("vantor --method a", ["--method", "apply_host_profile"]),
    ("vantor --plugin-directory=pl", ["--plugin-directory=plugins/"]),
    ("vantor --plugin-directory=plugins --plugin=libsto",
     ["--plugin-directory=plugins", "--plugin=libstorage.so"]),
    ("vantor --plugin-directory plugins --plugin libsto",
     ["--plugin-directory", "plugins", "--plugin", "libstorage.so"]),
    ("vantor --plugin-directory=plugins --plugin=setup.json,pro",
     ["--plugin-directory=plugins", "--plugin=setup.json,probe.debug"]),
    ("vantor --plugin-directory=plugins --plugin=libsta",
     ["--plugin-directory=plugins", "--plugin=libstart net.so"]),
    ("vantor --plugin-directory=plugins --disable-plugins=setup,sto",
     ["--plugin-directory=plugins", "--disable-plugins=setup,storage"]),
    ("vantor --plugin-directory=plugins --interactive-mode-requires=pro",
     ["--plugin-directory=plugins", "--interactive-mode-requires=probe"]),
    ("vantor --dump-dependency-tree=pict", ["--dump-dependency-tree=pictures/"]),
    ("vantor --dump-dependency-tree=com", ["--dump-dependency-tree=command"]),
    ("vantor --plugin-flags=st", ["--plugin-flags=st"]),
])
def test_one_possible_end_is_typed(bash, line, words):
    assert bash.words(line) == words


def test_plugins_are_offered_and_nothing_else_of_their_folder(bash):
    offered = bash.offers("vantor --plugin-directory=plugins --plugin=")
    assert {"libstorage.so", "setup.json", "probe.debug"} <= {
        word.removeprefix("--plugin=") for word in offered}
    assert not any("README" in word for word in offered)


def test_recorded_keys_are_offered(source, folder):
    record = os.path.join(folder, "record.gz")
    with open(record, "wb") as file:
        file.write(gzip.compress(b"vantor.run-once=identity1.2,setup3,\n"))
    with open(os.path.join(source, "packaging/completion/vantor"), encoding="utf-8") as file:
        text = file.read()
    assert text.count("/bootbank/vantorbk.gz") == 1
    with open(os.path.join(folder, "completion"), "w", encoding="utf-8") as file:
        file.write(text.replace("/bootbank/vantorbk.gz", record))
    bash = Bash(source, folder, ())
    try:
        bash.say(f". {folder}/completion")
        assert bash.words("vantor --run-once=identity1.2,se") == ["--run-once=identity1.2,setup3"]
    finally:
        bash.close()


@pytest.mark.parametrize("line, words", [
    ("nvcli --ver", ["--version"]),
    ("nvcli --dir", ["--directory="]),
    ("nvcli --directory=pic", ["--directory=pictures/"]),
    ("nvcli --directory pic", ["--directory", "pictures/"]),
    ("nvcli reb", ["reboot"]),
    ("nvcli net", ["network"]),
    ("nvcli network ", ["network", "route"]),
    ("nvcli network route lo", ["network", "route", "load"]),
    ("nvcli --directory=pictures system fol", ["--directory=pictures", "system", "folder"]),
    ("nvcli --directory pictures system fol", ["--directory", "pictures", "system", "folder"]),
    ("nvcli network route load --ta", ["network", "route", "load", "--table="]),
    ("nvcli network route load --rep", ["network", "route", "load", "--replace"]),
    ("nvcli network route load --table=x --met",
     ["network", "route", "load", "--table=x", "--metric="]),
    ("nvcli network route load -t x --fam", ["network", "route", "load", "-t", "x", "--family="]),
    ("nvcli network route load --family=inet6", ["network", "route", "load", "--family=inet6"]),
    ("nvcli network route load --family=", ["network", "route", "load", "--family=inet"]),
    ("nvcli nowhere ", ["nowhere"]),
])
def test_commands_are_those_that_nvcli_lists(bash, line, words):
    assert bash.words(line) == words


def test_all_that_a_namespace_holds_is_offered(bash):
    assert {"load", "list"} <= bash.offers("nvcli network route l")
    assert {"network", "system", "reboot", "--help"} <= bash.offers("nvcli ")



@pytest.mark.parametrize("line, words", [
    ("vantor-analyze ver", ["verify"]),
    ("vantor-analyze --ver", ["--version"]),
    ("vantor-analyze verify --st", ["verify", "--strict"]),
    ("vantor-analyze verify --ro", ["verify", "--root="]),
    ("vantor-analyze verify --root=pic", ["verify", "--root=pictures/"]),
    ("vantor-analyze verify --format=js", ["verify", "--format=json"]),
    ("vantor-analyze verify --format sa", ["verify", "--format", "sarif"]),
    ("vantor-analyze verify pic", ["verify", "pictures/"]),
    ("vantor-analyze blame comm", ["blame", "command"]),
    ("vantor-analyze blame --output=comm", ["blame", "--output=command"]),
    ("vantor-analyze explain --directory=plugins set",
     ["explain", "--directory=plugins", "setup"]),
    ("vantor-analyze graph --directory plugins --around sto",
     ["graph", "--directory", "plugins", "--around", "storage"]),
])
def test_verbs_and_their_options_are_those_that_the_program_lists(bash, line, words):
    assert bash.words(line) == words


def test_all_verbs_and_options_are_offered(bash):
    assert {"verify", "explain", "blame"} <= bash.offers("vantor-analyze ")
    assert {"--help", "--root=", "--format=", "--strict"} <= bash.offers("vantor-analyze verify -")
