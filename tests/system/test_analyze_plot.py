"""`vantor-analyze plot`, looked at in a browser: what is drawn, and whether it can be read."""

import fcntl
import os
import pathlib
import re
import struct
import subprocess
import termios
import xml.etree.ElementTree as ElementTree

import pytest
from harness import boot_texts, browser

BUILD = os.environ.get("VANTOR_BUILD_DIR",
                       pathlib.Path(__file__).resolve().parents[2] / "build" / "default")
ANALYZE = os.path.join(os.path.realpath(BUILD), "bin", "vantor-analyze")
SVG = "{http://www.w3.org/2000/svg}"

needs_browser = pytest.mark.skipif(
    browser.PROGRAM is None, reason="no browser here: neither chromium-headless-shell nor chromium")

# Of the drawing on the page: how many bars there are, and whatever is not as it should be.
MEASURE = """
function facts() {
    const svg = document.querySelector("svg");
    const box = element => {
        const found = element.getBBox();
        return {left: found.x, right: found.x + found.width, top: found.y,
                bottom: found.y + found.height, text: element.textContent};
    };
    const boxes = selector => [...svg.querySelectorAll(selector)].map(box);
    const [, , width, height] = svg.getAttribute("viewBox").split(" ").map(Number);
    const texts = boxes("text").sort((one, other) => one.left - other.left);
    const meeting = [];
    texts.forEach((one, index) => {
        for (let next = index + 1; next < texts.length; next++) {
            const other = texts[next];
            if (other.left >= one.right - 0.5) break;
            if (other.top < one.bottom - 3 && one.top < other.bottom - 3)
                meeting.push(one.text + " and " + other.text);
        }
    });
    const bars = boxes(".run > .bar");
    const strayed = boxes(".names > text").filter(text => !bars.some(bar =>
        bar.left <= text.left && text.right <= bar.right && bar.top <= text.top + 1.5 &&
        text.bottom - 1.5 <= bar.bottom));
    const outside = boxes("text, rect, line, path").filter(one =>
        one.left < -0.01 || one.right > width + 0.01 || one.top < -0.01 ||
        one.bottom > height + 0.01);
    const groups = [...svg.querySelectorAll(".run, .plugin, .barrier:not(.legends *)")];
    return {
        runs: bars.length,
        rows: boxes(".plugin > .bar").length,
        barriers: svg.querySelectorAll("g.barrier > title").length,
        chain: svg.querySelectorAll(".run.chain").length,
        named: svg.querySelectorAll(".names > text").length,
        unseen: boxes(".run > .bar, .plugin > .bar").filter(bar =>
            bar.right - bar.left < 0.9).length,
        untold: groups.filter(group =>
            group.parentNode === svg && !/\\n/.test(group.querySelector("title").textContent)).length,
        meeting: meeting.slice(0, 5),
        strayed: strayed.slice(0, 5).map(one => one.text),
        outside: outside.slice(0, 5),
    };
}
"""


def analyze(*arguments):
    """A run of the program on this machine, its outputs as bytes."""
    return subprocess.run([ANALYZE, *map(str, arguments)], capture_output=True, check=False,
                          timeout=240)


def plot(folder, log, drawing, *options):
    """What the program draws of a log, with nothing said on standard error."""
    (folder / "boot.log").write_bytes(log)
    (folder / "boot.dot").write_bytes(drawing)
    done = analyze("plot", folder / "boot.log", f"--dot={folder / 'boot.dot'}", *options)
    assert (done.returncode, done.stderr) == (0, b"")
    return done.stdout.decode("utf-8")


def body_of(text):
    """A drawing without its declaration, to be put into a page."""
    return re.sub(r"^<\?xml.*\n", "", text)


READABLE = {"unseen": 0, "untold": 0, "meeting": [], "strayed": [], "outside": []}


@needs_browser
@pytest.mark.parametrize("plugins, workers", [(20, 8), (20, 1), (101, 8), (2000, 8), (2000, 1)])
def test_every_plugin_is_drawn_and_can_be_read(tmp_path, plugins, workers):
    log, drawing = boot_texts.random_boot(plugins, workers)
    found = browser.facts(body_of(plot(tmp_path, log, drawing)), MEASURE, tmp_path)
    assert {key: found[key] for key in READABLE} == READABLE
    assert (found["runs"], found["rows"]) == (plugins, plugins)
    assert found["barriers"] > 0 and found["chain"] > 0
    if plugins == 20:
        assert found["named"] > 0


@needs_browser
def test_a_real_boot_is_drawn(tmp_path, root, vantor):
    root.debug_configuration("disks: :storage:true", "vaults:storage:vaults:true",
                             "guests:vaults: :true")
    vantor("--parallel")
    done = analyze("plot", root.path("/var/log/sysboot.log"), f"--root={root.folder}")
    assert (done.returncode, done.stderr) == (0, b"")
    found = browser.facts(body_of(done.stdout.decode()), MEASURE, tmp_path)
    assert {key: found[key] for key in READABLE} == READABLE
    assert (found["runs"], found["rows"], found["barriers"], found["chain"]) == (3, 3, 2, 3)


ODD_NAMES = ["<b>&amp;'\"", "Gerät", "貯蔵庫の準備", "\u202eabc", "x" * 200, "bad\udcff", "]]>",
             "\x1b[1m"]


@needs_browser
def test_odd_names_are_shown_and_stay_in_their_place(tmp_path):
    runs = [(name, 1000 * number, 1000 * number + 9000) for number, name in enumerate(ODD_NAMES)]
    text = plot(tmp_path, boot_texts.log(runs, 20000),
                boot_texts.drawing(ODD_NAMES, [], [[]] * 8, [[]] * 8))
    shown = [title.text.splitlines()[0] for title in
             (group.find(SVG + "title") for group in ElementTree.fromstring(text).iter(SVG + "g")
              if group.get("class", "").startswith("plugin")) if title is not None]
    assert shown == [*ODD_NAMES[:3], "\\u202eabc", "x" * 200, "bad\\xff", "]]>", "\\x1b[1m"]
    found = browser.facts(body_of(text), MEASURE, tmp_path)
    assert {key: found[key] for key in READABLE} == READABLE


@needs_browser
def test_a_clock_that_was_set_does_no_harm(tmp_path):
    runs = [("back", 5000, 100), ("early", -90000000, -80000000), ("instant", 6000, 6000),
            ("late", 7000, 3600000000)]
    (tmp_path / "boot.log").write_bytes(boot_texts.log(runs, 9000))
    (tmp_path / "boot.dot").write_bytes(boot_texts.drawing([run[0] for run in runs], [],
                                                           [[]] * 4, [[]] * 4))
    done = analyze("plot", tmp_path / "boot.log", f"--dot={tmp_path / 'boot.dot'}")
    assert done.returncode == 0 and done.stderr.startswith(b"note: ")
    found = browser.facts(body_of(done.stdout.decode()), MEASURE, tmp_path)
    assert {key: found[key] for key in READABLE} == READABLE
    assert (found["runs"], found["rows"]) == (4, 4)


@needs_browser
def test_the_files_open_as_they_are(tmp_path):
    log, drawing = boot_texts.random_boot(20, 8)
    for name, options in (("boot.svg", ()), ("boot.html", ("--html",))):
        said = plot(tmp_path, log, drawing, f"--output={tmp_path / name}", *options)
        assert said == ""
        dom = browser.dom(tmp_path / name, tmp_path)
        assert "parsererror" not in dom
        assert dom.count('<g class="run') == 20 and dom.count('<g class="plugin') == 20
        assert "running, on the critical chain" in dom


def test_the_page_holds_the_picture(tmp_path):
    log, drawing = boot_texts.random_boot(20, 8)
    picture = body_of(plot(tmp_path, log, drawing))
    page = plot(tmp_path, log, drawing, "--html")
    assert page.startswith("<!DOCTYPE html>\n") and picture in page
    assert "default-src 'none'; style-src 'unsafe-inline'" in page


def test_the_same_boot_gives_the_same_bytes(tmp_path):
    log, drawing = boot_texts.random_boot(200, 8)
    assert len({plot(tmp_path, log, drawing) for _ in range(5)}) == 1


def test_a_file_that_cannot_be_written_is_named(tmp_path):
    log, drawing = boot_texts.random_boot(20, 8)
    (tmp_path / "boot.log").write_bytes(log)
    (tmp_path / "boot.dot").write_bytes(drawing)
    path = tmp_path / "missing" / "boot.svg"
    done = analyze("plot", tmp_path / "boot.log", f"--dot={tmp_path / 'boot.dot'}",
                   f"--output={path}")
    assert (done.returncode, done.stdout) == (3, b"")
    assert done.stderr.decode() == (
        f"vantor-analyze: {path}: cannot be written: No such file or directory\n")


def test_a_terminal_is_told_to_name_a_file(tmp_path, terminal):
    log, _ = boot_texts.random_boot(20, 8)
    (tmp_path / "boot.log").write_bytes(log)
    fcntl.ioctl(terminal.slave, termios.TIOCSWINSZ, struct.pack("HHHH", 25, 80, 0, 0))
    done = subprocess.run([ANALYZE, "plot", str(tmp_path / "boot.log")], stdout=terminal.slave,
                          stderr=subprocess.PIPE, check=False, timeout=60)
    assert done.returncode == 3
    assert done.stderr.decode() == (
        "vantor-analyze: a chart is nothing for a terminal; name a file for it with --output\n")
