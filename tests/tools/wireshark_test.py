"""The Wireshark dissector, on captures of datagrams and of a stream that segments cut anywhere."""

import os
import re
import shutil
import struct
import subprocess
import sys

from tool import SKIPPED, delimited, expect, in_scratch_directory, record, run

DISSECTOR = os.path.abspath(sys.argv[2])
TREE = os.path.realpath(os.path.join(os.path.dirname(__file__), "../.."))
PORT = 4711

# Envelopes, and what the dissector is to say of each: kind, payload message, something that is in the
# payload.
ENVELOPES = [
    (
        bytes.fromhex("08 01 10 03") + record(3, record(1, b"id-1") + record(2, b"carol")),
        "connectionRequest",
        "orv.ConnectionRequest",
        "handle = carol",
    ),
    (
        bytes.fromhex("10 04") + record(3, record(4, record(1, b"\xca\xfe"))),
        "connectionResponse",
        "orv.ConnectionResponse.Content",
        "invitationData",
    ),
    # The type behind the data, and given twice.
    (
        record(3, record(2, b"sealed" * 50)) + bytes.fromhex("10 05 10 02"),
        "joinResponse",
        "orv.JoinResponse",
        "encryptedData",
    ),
    (bytes.fromhex("10 01") + record(3, b""), "joinRequest", "orv.JoinRequest", "orv.JoinRequest"),
    (
        bytes.fromhex("10 05 25 00 00 00 00") + record(3, bytes.fromhex("22 02 10 01")),
        "groupMessage",
        "orv.Group",
        "usesToken = true",
    ),
    (bytes.fromhex("10 09") + record(3, b"\xff"), "type 9", None, "data"),
    (bytes.fromhex("10 FF FF FF FF FF FF FF FF FF 01"), "type -1", None, "type = -1"),
]


def ip(protocol, payload):
    header = struct.pack(
        ">BBHHHBBH4s4s",
        0x45,
        0,
        20 + len(payload),
        1,
        0,
        64,
        protocol,
        0,
        bytes([10, 0, 0, 1]),
        bytes([10, 0, 0, 2]),
    )
    return header + payload


def udp(payload):
    return ip(17, struct.pack(">HHHH", 40000, PORT, 8 + len(payload), 0) + payload)


def tcp(sequence, payload):
    return ip(6, struct.pack(">HHIIBBHHH", 40001, PORT, sequence, 1, 0x50, 0x18, 65535, 0, 0) + payload)


def capture(path, packets):
    raw_ip = 101
    with open(path, "wb") as file:
        file.write(struct.pack("<IHHiIII", 0xA1B2C3D4, 2, 4, 0, 0, 65535, raw_ip))
        for second, packet in enumerate(packets):
            file.write(struct.pack("<IIII", second, 0, len(packet), len(packet)) + packet)


def dissected(path, *arguments):
    done = subprocess.run(
        [
            "tshark",
            "-X",
            f"lua_script:{DISSECTOR}",
            "-o",
            f'uat:protobuf_search_paths:"{TREE}/proto","TRUE"',
            "-o",
            f"orv.udp:{PORT}",
            "-o",
            f"orv.tcp:{PORT}",
            "-r",
            path,
            *arguments,
        ],
        capture_output=True,
        timeout=120,
    )
    expect(f"{path}: status", done.returncode, 0)
    expect(f"{path}: complaints", re.findall(rb"[Ll]ua.*", done.stdout + done.stderr), [])
    return done.stdout.decode()


def names(path):
    """What the packets' information column says, put together."""
    column = dissected(path, "-Y", "orv", "-T", "fields", "-e", "_ws.col.Info")
    return [name for line in column.splitlines() for name in line.split(", ")]


def trees(path):
    """The dissection of each envelope."""
    return dissected(path, "-V", "-O", "orv,protobuf").split("Invitation protocol: ")[1:]


def check(path):
    kinds = [kind for _, kind, _, _ in ENVELOPES]
    expect(f"{path}: information", names(path), kinds)
    found = trees(path)
    expect(f"{path}: envelopes", len(found), len(ENVELOPES))
    for tree, (_, kind, payload, content) in zip(found, ENVELOPES):
        expect(
            f"{path}: {kind}: heading",
            tree.splitlines()[0],
            kind if payload is None else f"{kind}, {payload}",
        )
        expect(f"{path}: {kind}: payload as a message", f"Message: {payload}" in tree, payload is not None)
        expect(f"{path}: {kind}: content", content in tree, True)


def test():
    envelopes = [envelope for envelope, *_ in ENVELOPES]
    capture("udp.pcap", [udp(envelope) for envelope in envelopes])
    check("udp.pcap")

    stream = delimited(*envelopes)
    for size in (len(stream), 1, 7, 100):
        segments = range(0, len(stream), size)
        capture("tcp.pcap", [tcp(1 + start, stream[start : start + size]) for start in segments])
        check("tcp.pcap")

    exported(envelopes)
    damage(envelopes)


def exported(envelopes):
    """Each envelope with its time and its ends, and as a stream for the command, from captures of either format."""
    shown = run("-d", "--to", "json", stdin=delimited(*envelopes)).stdout
    for name in ("udp.pcap", "tcp.pcap"):
        subprocess.run(["tshark", "-r", name, "-w", name + "ng"], capture_output=True, timeout=120, check=True)
        for path in (name, name + "ng"):
            digits = dissected(path, "-Y", "orv", "-T", "fields", "-E", "aggregator= ", "-e", "orv.hex")
            expect(f"{path}: piped", run("-d", "--from", "hex", "--to", "json", stdin=digits).stdout, shown)
    lines = dissected("udp.pcapng", "-Y", "orv", "-P", "-V", "-O", "orv,protobuf").splitlines()
    summaries = [line.split() for line in lines if "ORV" in line]
    expect("times", [float(words[1]) for words in summaries], list(map(float, range(len(envelopes)))))
    expect("ends", {(words[2], words[4]) for words in summaries}, {("10.0.0.1", "10.0.0.2")})


def damage(envelopes):
    """What is malformed to the command is marked, and disturbs nothing."""
    damaged = [bytes.fromhex("0B 0B 0C 0C"), bytes.fromhex("0B"), b"\xff" * 6, bytes.fromhex("1A FF FF FF FF 0F")]
    for envelope in (envelopes[0], envelopes[4], record(3, record(1, record(2, record(1, b"a\xc3\xa9")))) + b"\x10\x05"):
        damaged += [envelope[:size] for size in range(1, len(envelope))]
        for at in range(len(envelope)):
            damaged += [envelope[:at] + byte + envelope[at + 1 :] for byte in (b"\x00", b"\x0b", b"\x80", b"\xff")]
    malformed = [number for number, message in enumerate(damaged, 1) if run(stdin=message).returncode != 0]
    capture("damaged.pcap", [udp(message) for message in damaged])
    marked = dissected("damaged.pcap", "-Y", "orv.malformed", "-T", "fields", "-e", "frame.number")
    expect("marked as malformed", [int(number) for number in marked.split()], malformed)
    shown = dissected("damaged.pcap", "-Y", "orv.malformed", "-T", "fields", "-e", "_ws.col.Info").splitlines()
    expect("malformed in the column", [name for name in shown if not name.endswith(" (malformed)")], [])

    capture("junk.pcap", [udp(b""), tcp(1, b"\xff" * 20)])
    marked = dissected("junk.pcap", "-Y", "orv.malformed", "-T", "fields", "-e", "frame.number")
    expect("junk: marked as malformed", marked.split(), ["2"])
    capture("place.pcap", [udp(bytes.fromhex("08 01 10 05 1A 05 12 17 0A 01 61"))])
    expect(
        "the place of what is malformed",
        "Malformed: byte 6 of the envelope: field 2 runs past the end" in dissected("place.pcap", "-V"),
        True,
    )


if shutil.which("tshark") is None:
    print("tshark is missing")
    sys.exit(SKIPPED)
in_scratch_directory(test)
