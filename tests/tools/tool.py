"""What the tests of the command share."""

import os
import subprocess
import sys
import tempfile

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


def varint(number):
    encoded = b""
    while number >= 0x80:
        encoded += bytes([number & 0x7F | 0x80])
        number >>= 7
    return encoded + bytes([number])


def delimited(*messages):
    return b"".join(varint(len(message)) + message for message in messages)


def record(number, body):
    return varint(number << 3 | 2) + varint(len(body)) + body


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
