"""A browser without a window, to see what a picture or a page becomes in it."""

import html
import json
import os
import re
import shutil
import subprocess

PROGRAM = shutil.which("chromium-headless-shell") or shutil.which("chromium")

# Puts what `facts()` returns into the page, for the program to print.
_REPORT = """
<script>
%s
const report = document.createElement("pre");
report.id = "facts";
report.textContent = JSON.stringify(facts());
document.body.append(report);
</script>
"""


def dom(path, folder):
    """The document that the browser makes of a file, as text."""
    done = subprocess.run(
        [PROGRAM, "--headless", "--no-sandbox", "--disable-gpu", "--disable-dev-shm-usage",
         f"--user-data-dir={folder}/profile", "--window-size=1280,900",
         "--virtual-time-budget=20000", "--dump-dom", f"file://{path}"],
        capture_output=True, encoding="utf-8", check=False, timeout=240,
        env={"PATH": os.environ["PATH"], "HOME": str(folder), "LC_ALL": "C.UTF-8"})
    assert done.returncode == 0 and done.stdout.strip(), done.stderr[-2000:]
    return done.stdout


def facts(body, script, folder):
    """What the function facts() of a script finds on a page with this body."""
    page = folder / "measured.html"
    page.write_text('<!DOCTYPE html><meta charset="UTF-8"><body>' + body + _REPORT % script,
                    encoding="utf-8")
    found = re.search(r'<pre id="facts">(.*?)</pre>', dom(page, folder), re.DOTALL)
    assert found, "the script did not come to its end"
    return json.loads(html.unescape(found[1]))
