"""What the tests of the command share."""

import os
import pathlib
import subprocess
import sys
import tempfile

sys.path.append(str(pathlib.Path(__file__).parents[1] / "testing"))
from framing import delimited, record

COMMAND = os.path.abspath(sys.argv[1])
SKIPPED = 77

failures = 0


def run(*arguments, stdin=b"", **options):
    """Runs the command; the answer has its status and what it wrote."""
    if isinstance(stdin, str):
        stdin = stdin.encode()
    return subprocess.run([COMMAND, *arguments], input=stdin, capture_output=True, timeout=60, **options)


def expect(name, actual, expected):
    global failures
    if actual == expected:
        return
    failures += 1
    print(f"{name}:\n  expected {expected!r}\n  but got  {actual!r}")


def in_scratch_directory(test):
    """Runs the test in a directory of its own, and ends the program."""
    with tempfile.TemporaryDirectory() as directory:
        os.chdir(directory)
        test()
    sys.exit(1 if failures else 0)


def write(path, contents):
    with open(path, "wb") as file:
        file.write(contents)
    return path
