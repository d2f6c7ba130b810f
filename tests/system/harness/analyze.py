"""Runs of vantor-analyze on a private root, from outside of it: it only reads."""

import os
import subprocess

from harness.runner import ENVIRONMENT, Result
from harness.waiting import LIMIT_SECONDS

NAME = "vantor-analyze"


def run_analyze(root, *arguments, stdout=None, stderr=None, environment=None):
    """Runs the program of the root's build on this machine, with these words and no others.

    stdout, stderr  descriptors in place of the recorded outputs
    """
    command = [os.path.join(root.base.build, "bin", NAME), *arguments]
    done = subprocess.run(
        command, stdin=subprocess.DEVNULL, stdout=stdout or subprocess.PIPE,
        stderr=stderr or subprocess.PIPE,
        timeout=LIMIT_SECONDS, check=False, env={**ENVIRONMENT, **(environment or {})}, cwd="/")
    return Result(command, done.returncode, _text(done.stdout), _text(done.stderr))


def analyze(root, verb, *arguments, environment=None):
    """Runs one verb on the host that the root is."""
    return run_analyze(root, verb, *arguments, "--root", root.folder, environment=environment)


def _text(output):
    return (output or b"").decode("utf-8", "surrogateescape")
