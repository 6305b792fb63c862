"""What each subcommand writes, says on standard error and exits with."""

import base64
import json
import os
import re
import select
import signal
import socket
import subprocess
import time

from tool import COMMAND, delimited, expect, in_scratch_directory, record, run, write

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


def spellings(marker):
    """The ways in which three bytes of the marker in a row can be written."""
    windows = [marker[at:at + 3] for at in range(len(marker) - 2)]
    numbers = [int.from_bytes(marker[:size], "little") for size in (4, 8)]
    yield from windows
    for window in windows:
        yield from (window.hex().encode(), window.hex(" ").encode())
        yield from ("".join(form % byte for byte in window).encode() for form in ("\\%03o", "\\x%02x"))
    for shift in range(3):
        digits = base64.b64encode(bytes(shift) + marker)[2 * shift:-4]
        yield from (digits[at:at + 4] for at in range(len(digits) - 3))
    for number in numbers:
        yield from (str(number).encode(), b"%x" % number)


def hiding(marker):
    """Messages, each with the marker where it is to be hidden; those after the first are malformed."""

    def envelope(kind, payload, behind=b""):
        return b"\x08\x01\x10" + bytes([kind]) + record(3, payload) + behind

    def added(member):
        return record(2, record(1, b"\x3b") + record(2, member))

    unknown = [
        record(77, marker),
        record(77, record(1, marker)),
        b"\x69" + marker,  # 64 bits
        b"\x6d" + marker[:4],
        b"\x6b" + record(1, marker) + b"\x6c",  # a group
        b"\x98\x81\x00" + bytes([len(marker)]) + bytes([byte & 0x7F for byte in marker]),
        record(4, marker),
    ]
    member = record(1, b"open")
    whole = [
        envelope(1, record(1, marker) + record(2, marker)),
        envelope(2, record(2, marker)),
        envelope(4, record(1, b"i") + record(4, record(1, marker))),
        envelope(9, marker),
        record(3, marker),
        record(1, marker) + record(2, marker),  # the wire type of no number
        *[envelope(3, record(1, b"i") + field) for field in unknown[:5]],
        *[envelope(5, added(member + field)) for field in unknown],
        *[envelope(5, added(member)) + field for field in unknown],
    ]
    if marker.isascii():
        whole.append(envelope(5, added(member + record(2, marker))))
    overrunning = b"\x0a\x7f" + b"open" + record(2, marker)
    malformed = [
        marker,
        envelope(5, marker),
        envelope(5, added(overrunning)),
        envelope(5, added(record(1, b"\xff" + marker))),
        envelope(5, added(member), overrunning),
        envelope(5, added(member), b"\x07" + marker),
        envelope(3, overrunning),
        b"\x08\x01\x10\x05\x1a\x7f" + added(overrunning),
        b"\x08\x01\x10\x05\x1a\x7f" + added(b"") + record(1, marker),
    ]
    malformed += [message[:cut] for message in whole[:7] for cut in range(len(message) - 1, 4, -1)]
    return whole, malformed


def redacted():
    """Nothing of a secret value shows in any form, nor of what nobody knows, however the message is broken."""
    for marker in (b"qZ7xKv9w", bytes.fromhex("f39ac187d2ee91bb")):
        whole, malformed = hiding(marker)
        hidden = set(spellings(marker))
        for command, form in [
            ("decode", "text"), ("decode", "json"), ("convert", "text"), ("convert", "json"),
            ("inspect", "text"), ("inspect", "json"), ("inspect", "html"),
        ]:
            for extra in ["--redact"], ["--redact", "--no-unwrap"], ["--redact", "--unknown"], []:
                if command == "inspect" and "--unknown" in extra:
                    extra = ["--redact", "--defaults"]
                elif form == "text" and "--unknown" in extra:
                    continue
                words = [command, "-dk", "--from", "binary", "--to", form, *extra]
                done = run(*words, stdin=delimited(*whole, *malformed))
                shown = [part for part in hidden if part in done.stdout + done.stderr]
                expect(f"{words} of {marker}", bool(shown), "--redact" not in extra)
                expect(f"{words}: status", done.returncode, 3)
                for at, message in enumerate(malformed[:9]) if extra == ["--redact"] else []:
                    done = run(command, "--from", "binary", "--to", form, *extra, stdin=message)
                    shown = [part for part in hidden if part in done.stdout + done.stderr]
                    expect(f"{words} of malformed message {at} alone", shown, [])
    for text in [
        "tokenID: qZ7xKv9w", 'tokenID: "a" qZ7xKv9w', "qZ7xKv9w: 1", 'tokenID: "qZ7xKv9w', '5: qZ7xKv9w',
        '{"tokenID":qZ7xKv9w}', '{"tokenID":{"qZ7xKv9w":1}}', '{"qZ7xKv9w":1}', '{"handle":"a\\qZ7xKv9w"}',
        '{"unknownFields":[{"number":9,"wireType":"varint","value":"qZ7xKv9w"}]}',
    ]:
        done = run("convert", "--redact", "--from", "json" if text[0] == "{" else "text", "-t", "Member", stdin=text)
        expect(f"{text}: status", done.returncode, 3)
        expect(text, [part for part in spellings(b"qZ7xKv9w") if part in done.stdout + done.stderr], [])


def part_of(part, whole, truncated):
    """Whether all that the part says the whole says too, but for a text or base64 that is its start."""
    if isinstance(part, dict):
        name, _, below = truncated.partition(".")
        return all(
            key in whole and part_of(value, whole[key], below or " " if key == name else "")
            for key, value in part.items()
        )
    if isinstance(part, list):
        return all(part_of(item, whole[at], truncated if item is part[-1] else "") for at, item in enumerate(part))
    return part == whole or (truncated == " " and len(part) > 0 and whole.startswith(part.rstrip("=")[:-1]))


def values_of(document):
    """How many there are, messages not counted."""
    if isinstance(document, (dict, list)):
        return sum(map(values_of, document.values() if isinstance(document, dict) else document))
    return 1


def salvaged():
    """Wherever a message is cut, what stands before the cut is shown, and nothing else."""
    payloads = [
        (1, record(1, b"\x01\x02\x03\x04") + record(2, b"sealed body")),
        (3, record(1, b"2C8E91B7") + record(2, b"anna@tablet") + record(3, "Anna\u2019s".encode())),
        (4, record(1, b"i") + record(4, record(1, b"\xff\xfe\xfd"))),
        (5, record(1, record(1, b"\x3b") + record(2, record(1, b"ann")) + record(2, record(2, b"token")))),
        (5, record(4, record(1, b"\x3b") + b"\x10\x01")),
        (9, record(1, b"of no known kind")),
    ]
    for kind, payload in payloads:
        message = b"\x08\x01\x10" + bytes([kind]) + record(3, payload) + record(9, b"unknown")
        whole = json.loads(run("--to", "json", stdin=message).stdout)
        pieces = [message[:cut] for cut in range(len(message))]
        if kind != 9:
            pieces += [message[:4] + record(3, payload[:cut]) for cut in range(len(payload))]
        fields = json.loads(run("inspect", "--to", "json", stdin=message).stdout)["fields"]
        ends = [
            field["offset"] + field["header"] + field["length"]
            for field in fields
            if "message" not in field and "unknown" not in field
        ]
        done = run("-dk", "--from", "binary", "--to", "json", stdin=delimited(*pieces))
        shown = [json.loads(line) for line in done.stdout.splitlines()]
        expect(f"kind {kind}: documents", len(shown), len(pieces))
        for piece, document in zip(pieces, shown):
            partial, truncated = document.get("partial", {}), document.get("truncated", "")
            expect(f"{document}: is part", part_of(partial, whole, truncated), True)
            if "error" not in document:
                partial = document
            values = sum(end <= len(piece) for end in ends)
            expect(f"{piece.hex()}: {document}: values", values_of(partial) - bool(truncated), values)
        # Comments: what is malformed does not come back as something else.
        done = run("-dk", "--from", "binary", stdin=delimited(*pieces))
        again = run("encode", "-d", stdin=done.stdout).stdout
        expect(f"kind {kind}: back", again, delimited(*[b"" if "bytes" in d else p for p, d in zip(pieces, shown)]))


def test():
    salvaged()
    transcript()
    redacted()
    closed_descriptors()
    live()
    interrupted()


in_scratch_directory(test)
