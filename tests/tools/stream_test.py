"""Streams of any length pass through in the memory of one message."""

import os
import subprocess
import threading

from tool import COMMAND, delimited, expect, in_scratch_directory, record

MEBIBYTE = 1 << 20


def message(size):
    payload = record(1, b"k" * 32) + record(2, b"e" * size)
    return bytes.fromhex("08 01 10 01") + record(3, payload)


def peak_memory(arguments, pieces):
    """Feeds the pieces to the command; answers its status and the most memory that it held, in bytes."""
    process = subprocess.Popen(
        [COMMAND, *arguments], stdin=subprocess.PIPE, stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL
    )

    def feed():
        try:
            for piece in pieces:
                process.stdin.write(piece)
            process.stdin.close()
        except BrokenPipeError:
            pass

    feeder = threading.Thread(target=feed)
    feeder.start()
    _, status, usage = os.wait4(process.pid, 0)
    process.returncode = os.waitstatus_to_exitcode(status)
    feeder.join()
    return process.returncode, usage.ru_maxrss * 1024


def documents(count):
    return (
        b'{"version":1,"type":"joinRequest","data":{"encryptedData":"' + b"AAAA" * 80 + b'"}}\n'
        for _ in range(count)
    )


def texts(count):
    return (
        b'# message\nversion: 1\ntype: joinRequest\ndata { encryptedData: "' + b"e" * 300 + b'" }\n'
        for _ in range(count)
    )


def test():
    encoded = [delimited(message(300))] * 1000
    hexadecimal = [piece.hex().encode() + b"\n" for piece in encoded]
    for arguments, few, many in [
        (["decode", "-d"], encoded, encoded * 100),
        (["decode", "-d", "--to", "json"], encoded, encoded * 100),
        (["inspect", "-d"], encoded, encoded * 20),
        (["identify", "-d"], encoded, encoded * 20),
        (["convert", "-d", "--from", "hex", "--to", "base64"], hexadecimal, hexadecimal * 50),
        (["encode", "-d", "--from", "json"], documents(1000), documents(50000)),
        (["encode", "-d", "--from", "text"], texts(1000), texts(20000)),
    ]:
        status, little = peak_memory(arguments, few)
        expect(f"{arguments}: status of a short stream", status, 0)
        status, much = peak_memory(arguments, many)
        expect(f"{arguments}: status of a long stream", status, 0)
        expect(f"{arguments}: memory does not grow ({little}, {much})", much < little + 4 * MEBIBYTE, True)

    # What is announced, or sent without an end, is not made room for.
    for arguments, pieces in [
        (["decode", "-d", "--max-size", "2G"], [b"\xff\xff\xff\xff\x07 and no more"]),
        (["decode", "--max-size", "1M"], [b"\x1a" * MEBIBYTE] * 64),
        (["decode", "-d", "--max-size", "1M"], [b"\x80\x80\x80\x01" + b"\x1a" * MEBIBYTE] * 64),
        (["encode", "-d", "--from", "json", "--max-size", "1M"], [b"[" * MEBIBYTE] * 64),
        (["encode", "-d", "--from", "json", "--max-size", "1M"], [b'{"version":\n' * 1000] * 6400),
        (["encode", "-d", "--from", "text", "--max-size", "1M"], [b"version: 1\n" * 1000] * 6400),
        (["encode", "--max-size", "1M"], [b'{"data":"' + b"A" * MEBIBYTE] * 64),
    ]:
        status, memory = peak_memory(arguments, pieces)
        expect(f"{arguments}: status of too much", status, 3)
        expect(f"{arguments}: memory of too much ({memory})", memory < 32 * MEBIBYTE, True)


if os.environ.get("ASAN_OPTIONS"):
    # The sanitizers keep what was freed.
    raise SystemExit(77)
in_scratch_directory(test)
