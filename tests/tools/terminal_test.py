"""What the command does on a terminal, and what it does not do elsewhere."""

import fcntl
import os
import pty
import struct
import subprocess
import termios
import threading
import unicodedata

from tool import COMMAND, delimited, expect, in_scratch_directory, record, run, write

ENVELOPE = (
    bytes.fromhex("08 01 10 05 1A 2B 0A 29 0A 01 FF 12 07 0A 05")
    + b"carol"
    + bytes.fromhex("12 1B 0A 0F")
    + b"dave's tablet 2"
    + bytes.fromhex("12 08")
    + b"token-77"
)
TRUNCATED = ENVELOPE[:-1]


def on_terminal(
    arguments, columns=80, environment=(), captured=("stdout", "stderr"), stdin=subprocess.DEVNULL
):
    """Runs the command with some of its streams on a terminal; the status, and what the terminal was sent."""
    master, slave = pty.openpty()
    fcntl.ioctl(slave, termios.TIOCSWINSZ, struct.pack("HHHH", 24, columns, 0, 0))
    streams = {name: slave if name in captured else subprocess.DEVNULL for name in ("stdout", "stderr")}
    variables = {**os.environ, "TERM": "xterm", **dict(environment)}
    variables = {name: value for name, value in variables.items() if value is not None}
    process = subprocess.Popen(
        [COMMAND, *arguments], stdin=slave if stdin == "terminal" else stdin, env=variables, **streams
    )
    os.close(slave)
    shown = b""

    def read():
        nonlocal shown
        try:
            while piece := os.read(master, 65536):
                shown += piece
        except OSError:
            pass  # the terminal's other end was closed

    reader = threading.Thread(target=read)
    reader.start()
    status = process.wait(timeout=60)
    reader.join(timeout=60)
    os.close(master)
    return status, shown.decode().replace("\r\n", "\n")


def widths():
    write("message.bin", ENVELOPE)
    write("truncated.bin", TRUNCATED)
    for columns in (40, 60, 80, 100, 120, 160):
        status, shown = on_terminal(["inspect", "message.bin"], columns, [("NO_COLOR", "1")])
        expect(f"dump on {columns} columns: status", status, 0)
        longest = max(len(line) for line in shown.splitlines())
        expect(f"dump on {columns} columns is no wider ({longest})", longest <= columns, True)
        for value in ("carol", "dave's tablet 2", "token-77"):
            expect(f"dump on {columns} columns shows the value", f'"{value}"' in shown, True)
        status, shown = on_terminal(["decode", "--help"], columns)
        text = [line for line in shown.split("Examples:")[0].splitlines() if not line.startswith("Usage")]
        longest = max(len(line) for line in text)
        expect(f"help on {columns} columns is no wider ({longest})", longest <= columns, True)


def wide_characters():
    """Those that take two columns are counted so, and those that take none."""
    write("wide.bin", record(1, "茶の間のスピーカー".encode() * 2) + record(2, "e\u0301".encode() * 9))
    for columns in range(52, 110, 3):
        _, shown = on_terminal(["inspect", "-t", "Member", "wide.bin"], columns, [("NO_COLOR", "1")])
        longest = max(width(line) for line in shown.splitlines())
        expect(f"wide characters on {columns} columns ({longest})", longest <= columns, True)
        wanted = '"' + "e\u0301" * 9 + '"'
        room = columns >= 31 + 2 + 11
        expect(f"combining characters on {columns} columns are not cut", wanted in shown, room)


def width(line):
    wide = sum(unicodedata.east_asian_width(character) in "WF" for character in line)
    return len(line) + wide - sum(unicodedata.combining(character) != 0 for character in line)


def colours():
    write("message.bin", ENVELOPE)
    plain = run("inspect", "message.bin").stdout
    expect("no colours without a terminal", b"\033" in plain, False)
    expect(
        "colours without a terminal, on demand",
        b"\033[" in run("inspect", "--color", "always", "message.bin").stdout,
        True,
    )
    no_colour = [("NO_COLOR", None)]
    for name, arguments, environment, expected in [
        ("a terminal", [], no_colour, True),
        ("a terminal, not wanted", ["--color", "never"], no_colour, False),
        ("NO_COLOR", [], [("NO_COLOR", "1")], False),
        ("NO_COLOR that is empty", [], [("NO_COLOR", "")], True),
        ("NO_COLOR and the wish for colour", ["--color", "always"], [("NO_COLOR", "1")], True),
        ("a terminal without colours", [], no_colour + [("TERM", "dumb")], False),
    ]:
        _, shown = on_terminal(["inspect", *arguments, "message.bin"], 80, environment)
        expect(f"colours on {name}", "\033[" in shown, expected)


def refusals():
    status, shown = on_terminal(["encode", "document.json"])
    expect(
        "binary output on a terminal",
        (status, shown),
        (2, "orv: encode: binary output is not for a terminal: use --to hex, or -o FILE\n"),
    )
    status, shown = on_terminal([], stdin="terminal")
    expect(
        "nothing to read",
        (status, shown),
        (2, "orv: decode: nothing to read: name a file or pipe one in (orv --help tells more)\n"),
    )


def progress():
    """Only work that takes long is told of, and only where that disturbs nothing."""
    write("long.bin", delimited(record(3, b"x" * 1000)) * 1000)
    feed = ["sh", "-c", "for i in 1 2 3 4 5 6 7 8 9 10 11 12; do cat long.bin; sleep 0.2; done"]
    with subprocess.Popen(feed, stdout=subprocess.PIPE) as source:
        status, shown = on_terminal(["-d"], captured=("stderr",), stdin=source.stdout)
    expect("progress: status", status, 0)
    expect("progress is shown", " messages, " in shown, True)
    expect("progress goes at the end", shown.endswith("\r\033[K"), True)
    _, shown = on_terminal(["-d", "long.bin"], captured=("stderr",))
    expect("no progress of short work", shown, "")


def test():
    widths()
    wide_characters()
    colours()
    refusals()
    progress()


in_scratch_directory(test)
