"""What each subcommand writes, says on standard error and exits with."""

import os
import re
import subprocess

from tool import COMMAND, delimited, expect, in_scratch_directory

TRANSCRIPT = os.path.join(os.path.dirname(os.path.abspath(__file__)), "commands.transcript")
FUNCTIONS = """
orv() { "$ORV" "$@"; }
hex() { for byte; do printf "\\\\x$byte"; done; }
dump() { od -An -v -tx1 -w9999 | sed 's/^ //' | tr a-f A-F; }
"""


def transcript():
    with open(TRANSCRIPT, encoding="utf-8") as file:
        blocks = re.split(r"^## ", file.read(), flags=re.MULTILINE)[1:]
    for block in blocks:
        name, steps = block.rstrip("\n").split("\n", 1)
        for step in re.split(r"^\$ ", steps, flags=re.MULTILINE)[1:]:
            line, *expected = step.rstrip("\n").split("\n") if step != "\n" else [step]
            done = subprocess.run(
                ["bash", "-c", FUNCTIONS + line],
                stdin=subprocess.DEVNULL,
                capture_output=True,
                env={**os.environ, "ORV": COMMAND},
                timeout=60,
            )
            actual = done.stdout.decode().rstrip("\n").split("\n") if done.stdout.strip() else []
            actual += ["! " + line for line in done.stderr.decode().splitlines()]
            actual += [f"[{done.returncode}]"] if done.returncode != 0 else []
            expect(f"{name}: {line}", actual, expected)


def closed_descriptors():
    """What is closed cannot be read or written; the reader of a pipe may leave."""
    for command, status in [("types >&-", 4), ("decode <&-", 4), ("types 2>&-", 0), ("inspct 2>&-", 2)]:
        done = subprocess.run(["sh", "-c", f'"{COMMAND}" {command}'], capture_output=True, timeout=60)
        expect(f"orv {command}: status", done.returncode, status)
    stream = delimited(b"\x08\x01") * 100000
    for arguments in [["-d"], ["inspect", "-d"], ["convert", "-d", "--from", "binary", "--to", "hex"]]:
        process = subprocess.Popen(
            [COMMAND, *arguments], stdin=subprocess.PIPE, stdout=subprocess.PIPE, stderr=subprocess.PIPE
        )
        process.stdout.close()
        try:
            process.stdin.write(stream)
            process.stdin.close()
        except BrokenPipeError:
            pass
        expect(f"{arguments} into a closed pipe: standard error", process.stderr.read(), b"")
        expect(f"{arguments} into a closed pipe: status", process.wait(timeout=60), 0)


def test():
    transcript()
    closed_descriptors()


in_scratch_directory(test)
