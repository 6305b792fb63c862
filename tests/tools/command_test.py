"""What each subcommand writes, says on standard error and exits with."""

import os
import re
import select
import signal
import socket
import subprocess
import time

from tool import COMMAND, delimited, expect, in_scratch_directory, write

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


def live():
    """What is complete is written before more is waited for."""
    message = b"\x02\x08\x01"
    for arguments, piece, expected in [
        (["-d"], message, b"# message 1, at byte 1 (0x0001)\nversion: 1\n"),
        (["-d", "--to", "json"], message, b'{"version":1}\n'),
        (["-d", "--to", "json", "--from", "hex"], b"0208 01\n", b'{"version":1}\n'),
        (["-d", "--to", "json", "--from", "base64"], b"AggB\n", b'{"version":1}\n'),
        (["encode", "-d"], b'{"version":\n1}\n', message),
        (["encode", "-d", "--from", "text"], b"# message\nversion: 1\n# message\n", message),
        (["convert", "-d", "--from", "binary", "--to", "binary"], message, message),
        (["inspect", "-d"], message, b"message 1: orv.SessionMessage, 2 bytes\n0001  08 01 "),
        (["identify", "-d"], message, b"message 1:\n100 %  "),
        (["diff", "-d", "-", "other"], message, b"--- -\n+++ other\n- message 1: "),
    ]:
        for name, pair in [("pipe", os.pipe), ("socket", socket_descriptors)]:
            source, feed = pair()
            write("other", b"")
            process = subprocess.Popen([COMMAND, *arguments], stdin=source, stdout=subprocess.PIPE)
            os.close(source)
            os.write(feed, piece)
            shown = b""
            while len(shown) < len(expected) and select.select([process.stdout], [], [], 20)[0]:
                if not (more := os.read(process.stdout.fileno(), 65536)):
                    break
                shown += more
            expect(f"{arguments} on a {name} that stays open", shown[:len(expected)], expected)
            os.close(feed)
            process.stdout.read()
            process.wait(timeout=60)


def socket_descriptors():
    return [end.detach() for end in socket.socketpair()]


def interrupted():
    """A run that a signal ends leaves the old file, and nothing beside it."""
    os.mkdir("signals")
    for number in (signal.SIGHUP, signal.SIGINT, signal.SIGTERM):
        write("signals/kept", b"precious")
        process = subprocess.Popen([COMMAND, "-d", "-o", "signals/kept"], stdin=subprocess.PIPE)
        process.stdin.write(delimited(b"\x08\x01") * 10000)
        process.stdin.flush()
        for _ in range(2000):
            if len(os.listdir("signals")) == 2:
                break
            time.sleep(0.01)
        expect(f"{number}: writes aside", len(os.listdir("signals")), 2)
        process.send_signal(number)
        expect(f"{number}: status", process.wait(timeout=60), -number)
        process.stdin.close()
        expect(f"{number}: what is left", os.listdir("signals"), ["kept"])
        with open("signals/kept", "rb") as file:
            expect(f"{number}: the old file", file.read(), b"precious")


def test():
    transcript()
    closed_descriptors()
    live()
    interrupted()


in_scratch_directory(test)
