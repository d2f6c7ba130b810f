"""The manual page of vantor-analyze has every verb, option and code of the program, and no other."""

import os
import re

import pages

BUILD = os.path.realpath(os.environ.get("VANTOR_BUILD_DIR", pages.ROOT / "build" / "default"))
PROGRAM = os.path.join(BUILD, "bin", "vantor-analyze")
PAGE = "vantor-analyze.8"
SEVERITIES = {"Error": "error", "Warning": "warning", "Note": "note"}


def help_of(*arguments):
    done = pages.run(PROGRAM, *arguments)
    assert (done.returncode, done.stderr) == (0, "")
    return done.stdout


def verbs():
    found = re.findall(r"^  ([a-z]+) ", help_of("--help").partition("Subcommands:\n")[2], re.M)
    assert len(found) >= 9
    return found


def options(*verb):
    return set(re.findall(r"^ +(?:-\w,)?(--[a-z][a-z-]*)", help_of(*verb, "--help"), re.M))


def all_options():
    return options().union(*(options(verb) for verb in verbs()))


def source_texts():
    return {path: path.read_text(encoding="utf-8")
            for path in sorted((pages.ROOT / "analyze").rglob("*.cc"))}


def codes():
    """Every code that a source gives to a finding, or describes."""
    found = set()
    for path, text in source_texts().items():
        found.update(re.findall(r'Severity::\w+,\s*"([a-z]+(?:-[a-z]+)*)"', text))
        found.update(re.findall(r'\b(?:[Rr]eport|Reject)\(\s*"([a-z]+(?:-[a-z]+)*)"', text))
        if path.name == "Codes.cc":
            found.update(re.findall(r'^ *\{"([a-z]+(?:-[a-z]+)*)",', text, re.M))
    assert len(found) >= 20
    return found


def documented_codes():
    """The terms of the page's findings as {code: what is said of it}."""
    found, term = {}, None
    for line in pages.section(PAGE, "FINDINGS"):
        if re.fullmatch(r" {7}[a-z]+(-[a-z]+)*", line):
            term = line.strip()
            found[term] = ""
        elif term:
            found[term] += line
    return found


def test_every_verb_has_its_paragraph():
    terms = {line.split()[0] for line in pages.section(PAGE, "VERBS")
             if re.match(r" {7}[a-z]", line)}
    assert terms == set(verbs())


def test_every_option_is_documented_and_no_other():
    documented = set(re.findall(r"^ {7}(?:-h, )?(--[a-z][a-z-]*)",
                                "\n".join(pages.section(PAGE, "OPTIONS")), re.M))
    assert documented - {"--help-all"} == all_options() - {"--help-all"}
    named = set(re.findall(r"(?<![\w-])--[a-z][a-z-]*", pages.plain(PAGE)))
    assert named - {"--dump-dependency-tree"} <= documented


def test_every_code_is_documented_and_no_other():
    assert set(documented_codes()) == codes()


def test_every_code_is_documented_with_its_severities():
    for code, text in documented_codes().items():
        assert re.match(r"\s*(error|warning|note): ", text), code
    told = {(code, SEVERITIES[severity]) for text in source_texts().values() for severity, code
            in re.findall(r'Severity::(\w+),\s*"([a-z]+(?:-[a-z]+)*)"', text)}
    assert len(told) >= 10
    page = documented_codes()
    assert [one for one in sorted(told) if not re.search(rf"\b{one[1]}: ", page[one[0]])] == []


def test_every_exit_status_is_documented():
    text = (pages.ROOT / "analyze/verbs/Invocation.h").read_text(encoding="utf-8")
    statuses = re.findall(r"constexpr int status\w+ = (\d);", text)
    shown = re.findall(r"(\d): ", "\n".join(pages.section(PAGE, "EXIT STATUS")))
    assert len(statuses) >= 4 and shown == statuses


def test_every_verb_has_an_example():
    blocks = pages.examples(PAGE)
    for verb in verbs():
        assert any(re.search(rf"^vantor-analyze {verb}\b", block, re.M) for block in blocks), verb
