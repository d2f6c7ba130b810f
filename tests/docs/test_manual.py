"""The manual pages say all that the program can say, and nothing that it cannot do."""

import json
import os
import re

import pytest

import cxx_texts
import pages
from cxx_texts import ANY

BUILD = os.path.realpath(os.environ.get("VANTOR_BUILD_DIR", pages.ROOT / "build" / "default"))
SOURCES = cxx_texts.sources("src")

# Texts that nobody ever reads as they stand.
UNSAID = {
    "unterminated quote": "becomes the message about a malformed entry",
    "digraph g {": "the language of the drawing",
}
# The functions that hand a whole text on to syslog, with the place of the text in their arguments,
# by what the call of syslog names.
HANDED_ON = {"complaint": ("Check", 1), "message.c_str()": ("ReportFailure", 0),
             "text.c_str()": ("report", 1), "verdict.message.c_str()": ("KeepOut", 1)}


def pattern(pieces):
    """An expression for a text on a page, where every value is a word or a few."""
    fixed = [piece if piece is ANY else re.escape(re.sub(r"\s+", " ", piece)) for piece in pieces]
    while fixed and (fixed[0] is ANY or not fixed[0].strip("\\ ")):
        fixed.pop(0)
    while fixed and (fixed[-1] is ANY or not fixed[-1].strip("\\ ")):
        fixed.pop()
    text = "".join(r"\S.{0,40}?" if piece is ANY else piece for piece in fixed)
    return re.sub(r"^(\\ )+|(\\ )+$", "", text)


def readable(pieces):
    """A text as a failed test names it."""
    return "".join("<value>" if piece is ANY else piece for piece in pieces)


def pages_with(expression):
    return [name for name in pages.NAMES if re.search(expression, pages.plain(name))]


def texts():
    """Every text of the program that has words, with the file it stands in."""
    found = {}
    for source in SOURCES:
        if not source.name.endswith("driver/Usage.cc"):  # compared with the options instead
            for pieces in source.texts():
                fixed = readable(pieces).replace("<value>", "").strip()
                if cxx_texts.has_words(pieces) and fixed not in UNSAID:
                    found.setdefault(pattern(cxx_texts.format_pieces(pieces)),
                                     (source.name, readable(pieces)))
    return found


def log_messages():
    """Every message to syslog: its priority and its text."""
    messages = []
    for source in SOURCES:
        for priority, text, *values in source.calls("syslog"):
            if cxx_texts.spelling(text) != "%s":
                messages.append((cxx_texts.spelling(priority), cxx_texts.format_text(text)))
            elif cxx_texts.is_literal(values[0]):
                messages.append((cxx_texts.spelling(priority), cxx_texts.text_of(values[0])))
            else:
                messages += handed_on(source, cxx_texts.spelling(priority),
                                      HANDED_ON[cxx_texts.spelling(values[0])])
    return messages


def handed_on(source, priority, function):
    name, place = function
    if priority == "verdict.priority":  # stands beside the text
        found = [(cxx_texts.spelling(call[0]), cxx_texts.text_of(call[place]))
                 for caller in SOURCES for call in caller.calls(name)
                 if any(item.kind == "string" for item in call[place])]
        assert found, f"nobody calls {name} with a text"
        return found
    if priority == "priority":  # LogFormat's own: told by whoever calls it
        callers = [other for other in SOURCES if list(other.calls("LogFormat"))]
        priorities = {cxx_texts.spelling(call[0]) for other in callers
                      for call in other.calls("LogFormat")} - {"intpriority"}
        assert len(priorities) == 1, priorities
        priority = priorities.pop()
    else:
        callers = [source]
    found = [(priority, cxx_texts.text_of(call[place])) for caller in callers
             for call in caller.calls(name) if any(item.kind == "string" for item in call[place])]
    assert found, f"nobody calls {name} with a text"
    return found


def test_every_text_of_the_program_is_explained():
    found = texts()
    assert len(found) >= 75, "too few texts found to be all of them"
    assert all(re.search("[A-Za-z]{2}", expression) for expression in found)
    missing = [f"{where}: {text}" for expression, (where, text) in found.items()
               if not pages_with(expression)]
    assert missing == []


def test_every_log_message_is_explained_with_its_priority():
    messages = log_messages()
    assert len(messages) >= 36, "too few messages found to be all of them"
    page = pages.plain("vantor.8")
    missing = [f"{readable(text)} ({priority})" for priority, text in messages
               if not re.search(pattern(text) + rf".{{0,20}}? \({priority}\)", page)]
    assert missing == []


def test_no_priority_is_used_past_the_messages_that_are_known():
    used = [word for source in SOURCES for word in source.words(r"LOG_[A-Z]+")]
    calls = [call for source in SOURCES for call in source.calls("syslog", "LogFormat", "KeepOut")]
    named = [cxx_texts.spelling(call[0]) for call in calls]
    assert len(used) >= 30
    assert sorted(used) == sorted(name for name in named if name.startswith("LOG_"))


@pytest.mark.parametrize("call, texts_of_key", [
    ("ReadNames", ["metadata is corrupt (unable to parse {})", "{} tag is not a string"]),
    ("ReadFlags", ["metadata is corrupt (unable to parse {})", "{} tag is not a string"]),
    ("AppendCommands", ["operations is corrupt (unable to parse {})"]),
])
def test_every_rejection_of_a_document_stands_whole_on_its_page(call, texts_of_key):
    named = [[argument for argument in arguments[1:] if cxx_texts.is_literal(argument)]
             for source in SOURCES for arguments in source.calls(call)]
    keys = [cxx_texts.text_of(literals[-1])[0] for literals in named if literals]
    assert len(keys) == 2
    page = pages.plain("vantor-json.5")
    for key in keys:
        for text in texts_of_key:
            assert text.format(key) in page


def test_every_reason_against_a_plugin_file_is_on_the_page_of_its_kind():
    kinds = {"NativePlugin.cc": "vantor-plugin.5", "SharedObjectCheck.cc": "vantor-plugin.5",
             "JSONPlugin.cc": "vantor-json.5", "PluginDocument.cc": "vantor-json.5"}
    count = 0
    for source in SOURCES:
        page = kinds.get(os.path.basename(source.name))
        for pieces in source.texts() if page else []:
            if cxx_texts.has_words(pieces) and "%" not in readable(pieces):
                count += readable(pieces) != "apply host profile"
                assert re.search(pattern(pieces), pages.plain(page)) or readable(
                    pieces) == "apply host profile", readable(pieces)
    assert count >= 16


def test_every_fixed_path_is_named():
    everything = SOURCES + [source for source in cxx_texts.sources("hostlibs")
                            if source.name == "hostlibs/NvkCtl.cc"]
    found = {text for source in everything for text in source.literals()
             if re.fullmatch(r"(/[\w.-]+)+", text)}
    whole = {path for path in found
             if not any(other.startswith(path + "/") for other in found)} | {
                 "/usr/lib/nuvex/nvcli", "/usr/lib/nuvex/nvcli/int"}
    assert len(whole) >= 19
    assert [path for path in sorted(whole)
            if not pages_with(re.escape(path) + r"(?![\w/-]|\.\w)")] == []


def documented_options(page):
    """The terms of a page's options as {name: what stands behind it}."""
    options = {}
    for line in pages.section(page, "OPTIONS"):
        term = re.match(r" {7}(-.*)", line)
        for one in re.split(r", (?=-)", term[1]) if term else []:
            name, value = re.fullmatch(r"(--?[a-z-]+)(.*)", one).groups()
            assert name not in options, f"{name} is documented twice"
            options[name] = value
    return options


def accepted_options():
    """The option table of the program as {name: kind of argument}."""
    text = (pages.ROOT / "src/driver/CommandLine.cc").read_text(encoding="utf-8")
    found = re.findall(r'\{"([a-z-]+)", (no|required|optional)_argument,', text)
    assert len(found) >= 16
    return dict(found)


def usage(program):
    done = pages.run(os.path.join(BUILD, "bin", program), "--help")
    assert (done.returncode, done.stderr) == (0, "")
    return set(re.findall(r"(?<![\w-])--?[a-z][a-z-]*", done.stdout))


def test_the_options_are_those_that_the_program_takes():
    accepted = accepted_options()
    documented = documented_options("vantor.8")
    assert set(documented) == {"--" + name for name in accepted} | {"-h"}
    for name, kind in accepted.items():
        form = {"no": r"", "required": r"=\w.*", "optional": r"\[=\w+\]"}[kind]
        assert re.fullmatch(form, documented["--" + name]), name


def test_every_option_of_the_usage_text_is_documented_and_the_others_are_marked():
    documented, shown = set(documented_options("vantor.8")), usage("vantor")
    assert len(shown) >= 15
    assert shown <= documented
    page = " ".join(" ".join(pages.section("vantor.8", "OPTIONS")).split())
    for name in documented - shown:
        assert re.search(rf" {name}=(?:(?! --).)* Not in the usage text\.", page), name


def test_the_options_of_nvcli_are_those_of_its_help():
    shown = usage("nvcli")
    assert len(shown) >= 4
    assert set(documented_options("nvcli.1")) == shown


@pytest.mark.parametrize("page, others", [
    ("vantor.8", set()), ("vantor-log.5", set()), ("vantor-debug.conf.5", set()),
    ("vantor-plugin.5", {"--args"}), ("vantor-json.5", {"--module"}),
])
def test_a_page_names_no_option_that_is_not_there(page, others):
    named = set(re.findall(r"(?<![\w-])--[a-z][a-z-]*", pages.plain(page)))
    assert named - others <= {"--" + name for name in accepted_options()}


def test_the_layout_of_the_native_interface_is_that_of_the_header():
    header = (pages.ROOT / "include/vantor/plugin.h").read_text(encoding="utf-8")
    rows = {(field.replace("VANTOR_REQUIRES_FIELD", "requires"), at32, at64)
            for field, at32, at64 in
            re.findall(r"^VANTOR_ASSERT_OFFSET_\(\w+, (\w+), (\d+), (\d+)\);", header, re.M)}
    assert len(rows) == 9
    table = re.findall(r"^ *([a-z_]+) +(\d+) +(\d+)  from \d  ",
                       pages.rendered("vantor-plugin.5"), re.M)
    assert set(table) == rows


def test_the_log_shown_has_the_lines_that_are_written():
    (source,) = [source for source in SOURCES if source.name.endswith("driver/ProfilingLog.cc")]
    text = source.path.read_text(encoding="utf-8")
    keys = re.findall(r'"( ?[A-Z][\w ]+: )"', text)
    assert len(keys) >= 8
    (log,) = [text for text in pages.examples("vantor-log.5") if text.startswith(keys[0])]
    written = re.findall(r"^ ?[A-Z][\w ]+: ", log, re.M)
    assert written == keys
    for key in keys:
        assert re.search(rf"^ {{7}}{key.strip()} \w", pages.rendered("vantor-log.5"), re.M), key


def test_the_native_example_compiles(tmp_path):
    blocks = pages.examples("vantor-plugin.5")
    first, last = (block for block in blocks if "VANTOR_" in block)
    assert first.startswith("#include <vantor/plugin.h>")
    command = next(block for block in blocks if block.startswith("cc ")).split()
    (tmp_path / command[-1]).write_text(first, encoding="utf-8")
    profile = "VANTOR_METHOD(apply_profile) { return 0; }\n"
    second = first[:first.index("VANTOR_OPERATIONS")] + profile + last
    (tmp_path / "second.c").write_text(second, encoding="utf-8")
    flags = ["-Wall", "-Wextra", "-Werror", "-I", str(pages.ROOT / "include")]
    for arguments in (command, command[:-1] + ["second.c"]):
        done = pages.run(*arguments, *flags, cwd=tmp_path)
        assert (done.returncode, done.stdout, done.stderr) == (0, "", "")


def test_the_cmake_example_calls_what_the_package_defines():
    blocks = pages.examples("vantor-plugin.5")
    (example,) = [block for block in blocks if block.startswith("find_package(")]
    package, function = re.fullmatch(r"find_package\((\S+) REQUIRED\)\n(\w+)\(\w+ SOURCES .*\)\n",
                                     example).groups()
    config = pages.ROOT / "packaging" / "plugin-author" / f"{package}-config.cmake"
    assert f"\nfunction({function} " in config.read_text(encoding="utf-8")


def test_the_document_shown_has_every_key():
    document = json.loads(pages.examples("vantor-json.5")[1])
    shown = {f"{part} / {key}" for part, keys in document.items() for key in keys}
    table = set(re.findall(r"^ *(\w+ / \w+)  +from \d  ", pages.rendered("vantor-json.5"), re.M))
    assert len(table) == 9
    assert shown == table - {"metadata / required_flags"}


def test_the_description_shown_is_one(tmp_path):
    text = pages.examples("nvcli-commands.5")[1]
    (tmp_path / "network.json").write_text(text, encoding="utf-8")
    nvcli = [os.path.join(BUILD, "bin", "nvcli"), f"--directory={tmp_path}"]
    done = pages.run(*nvcli, "network", "firewall", "set", "--help")
    assert (done.returncode, done.stderr) == (0, "")
    assert done.stdout.startswith("Usage: nvcli network firewall set --port=INTEGER")
    mistaken = text.replace('"flag"', '"flags"')
    (tmp_path / "network.json").write_text(mistaken, encoding="utf-8")
    assert pages.run(*nvcli, "network", "--help").returncode != 0


@pytest.mark.parametrize("page", pages.NAMES)
def test_a_page_is_built_and_shown_without_a_warning(page, tmp_path):
    built = pages.build(page)
    assert (built.returncode, built.stderr) == (0, "")
    for device in ("ascii", "utf8"):
        done = pages.run("groff", "-ww", "-t", "-man", f"-T{device}", "-z", input=built.stdout)
        assert (done.returncode, done.stdout, done.stderr) == (0, "", "")
    path = tmp_path / page
    path.write_text(built.stdout, encoding="utf-8")
    environment = dict(os.environ, LC_ALL="C.UTF-8", MANPAGER="cat", MANWIDTH="80")
    shown = pages.run("man", "--warnings", "-l", str(path), env=environment)
    assert (shown.returncode, shown.stderr) == (0, "")
    # On 80 columns only what is quoted as it stands is longer: a line of the log needs 85.
    assert max(len(line) for line in shown.stdout.splitlines()) <= 85


@pytest.mark.parametrize("page", pages.NAMES)
def test_a_page_has_its_sections_and_refers_to_pages_that_are_there(page):
    title, part = page.rsplit(".", 1)
    written = pages.source(page)
    assert written.startswith(f"{title}({part}) ")
    assert pages.section(page, "NAME")[0].strip().startswith(f"{title} - ")
    assert pages.section(page, "EXAMPLES")
    assert written.rstrip().split("\n# ")[-1].startswith("SEE ALSO\n")
    referred = re.findall(r"([\w.-]+)\((\d)\)", " ".join(pages.section(page, "SEE ALSO")))
    assert referred
    for name in referred:
        assert ".".join(name) in pages.NAMES and ".".join(name) != page
    ours = re.findall(r"\b((?:vantor|nvcli)[\w.-]*)\((\d)\)", pages.plain(page))
    assert [name for name in ours if ".".join(name) not in pages.NAMES] == []


def test_every_page_is_built_and_installed():
    text = (pages.FOLDER / "CMakeLists.txt").read_text(encoding="utf-8")
    listed = [name for names in re.findall(r"foreach\(page ([^)]*)\)", text)
              for name in names.split()]
    assert sorted(listed) == pages.NAMES
    assert len(pages.NAMES) >= 7
