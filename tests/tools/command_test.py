"""What each subcommand writes, says on standard error and exits with."""

import os

from tool import COMMAND, delimited, expect, in_scratch_directory, run, write
import subprocess

MEMBER_ADDED = bytes.fromhex("12 0A 0A 01 FF 12 05 0A 03 61 6E 6E")  # a Group
ADDED = bytes.fromhex("08 01 10 05 1A 0C") + MEMBER_ADDED  # in its envelope
LEFT = bytes.fromhex("08 01 10 05 1A 04 22 02 10 01")
TRUNCATED = bytes.fromhex("08 01 10 05 1A 0C 12 0A 0A 01 FF 12 17 0A 03 61 6E 6E")
STREAM = delimited(ADDED, LEFT)

ADDED_TEXT = """\
version: 1
type: groupMessage
data {
  memberAdded {
    groupUUID: "\\377"
    member {
      handle: "ann"
    }
  }
}
"""
ADDED_LINE = '{"version":1,"type":"groupMessage","data":{"memberAdded":{"groupUUID":"/w==","member":{"handle":"ann"}}}}\n'
LEFT_LINE = '{"version":1,"type":"groupMessage","data":{"memberLeft":{"usesToken":true}}}\n'
CLOSED_LINE = '{"version":1,"type":"groupMessage","data":"EgoKAf8SBQoDYW5u"}\n'
STREAM_TEXT = (
    f"# message 1, at byte 1 (0x0001)\n{ADDED_TEXT}\n# message 2, at byte 20 (0x0014)\n"
    + """\
version: 1
type: groupMessage
data {
  memberLeft {
    usesToken: true
  }
}
"""
)

ADDED_DUMP = """\
orv.SessionMessage, 18 bytes
0000  08 01                    version                           uint32   1
0002  10 05                    type                              enum     groupMessage (5)
0004  1a 0c                    data                              bytes    12 bytes, orv.Group
0006  12 0a                      memberAdded                     message  10 bytes, orv.Group.MemberAdded
0008  0a 01 ff                   memberAdded.groupUUID           bytes    1 byte
000b  12 05                      memberAdded.member              message  5 bytes, orv.Member
000d  0a 03 61 6e 6e             memberAdded.member.handle       string   "ann"
"""
TRUNCATED_DUMP = ADDED_DUMP.replace(
    "000b  12 05                      memberAdded.member              message  5 bytes, orv.Member\n"
    '000d  0a 03 61 6e 6e             memberAdded.member.handle       string   "ann"\n',
    "000b  12 17 0a 03 61 6e 6e\n"
    "                               error at byte 12 (0x000c): orv.Group.memberAdded.member: length 23 runs 18 bytes past the end\n",
)

# name, arguments, standard input, status, standard output, standard error (None where it does not matter)
CASES = [
    ("decodes without a command", ["-"], ADDED, 0, ADDED_TEXT, ""),
    ("decodes from a file", ["decode", "added.bin"], b"", 0, ADDED_TEXT, ""),
    ("decodes nothing", ["decode"], b"", 0, "", ""),
    ("decodes a stream", ["-d", "stream.bin"], b"", 0, STREAM_TEXT, ""),
    ("decodes an empty stream", ["-d"], b"", 0, "", ""),
    ("decodes to a document a line", ["-d", "--to", "json"], STREAM, 0, ADDED_LINE + LEFT_LINE, ""),
    (
        "decodes to an indented document",
        ["--to", "json", "-t", "Member"],
        b"\x12\x00",
        0,
        '{\n  "tokenID": ""\n}\n',
        "",
    ),
    ("leaves payloads closed", ["-d", "--to", "json", "--no-unwrap"], delimited(ADDED), 0, CLOSED_LINE, ""),
    (
        "leaves payloads of unknown kinds closed",
        ["-d", "--to", "json"],
        delimited(b"\x10\x09\x1a\x01\xff"),
        0,
        '{"type":9,"data":"/w=="}\n',
        "",
    ),
    (
        "takes the last of several payloads",
        ["-d", "--to", "json"],
        delimited(b"\x10\x05\x1a\x01\xff\x1a\x02\x22\x00"),
        0,
        '{"type":"groupMessage","data":{"memberLeft":{}}}\n',
        "",
    ),
    (
        "reads a connection response as its content",
        ["--to", "json", "-d"],
        delimited(b"\x10\x04\x1a\x02\x1a\x00"),
        0,
        '{"type":"connectionResponse","data":{"denied":{}}}\n',
        "",
    ),
    (
        "reads a payload as it is told",
        ["--to", "json", "-d", "--payload", "connectionResponse=ConnectionResponse"],
        delimited(b"\x10\x04\x1a\x00"),
        0,
        '{"type":"connectionResponse","data":{}}\n',
        "",
    ),
    (
        "reads payloads of a number as it is told",
        ["--to", "json", "-d", "--payload", "9=orv.Member"],
        delimited(b"\x10\x09\x1a\x03\x0a\x01a"),
        0,
        '{"type":9,"data":{"handle":"a"}}\n',
        "",
    ),
    (
        "reads all payloads as it is told",
        ["--to", "json", "-d", "--payload", "Member"],
        delimited(b"\x1a\x00"),
        0,
        '{"data":{}}\n',
        "",
    ),
    ("takes the last word of a type", ["-t", "MemberLeft", "-"], b"\x10\x01", 0, "usesToken: true\n", ""),
    (
        "shows unknown fields on demand",
        ["-d", "--to", "json", "--unknown"],
        delimited(b"\x20\x01"),
        0,
        '{"unknownFields":[{"number":4,"wireType":"varint","value":"1"}]}\n',
        "",
    ),
    (
        "reads hexadecimal digits",
        ["--from", "hex", "--to", "json", "-d"],
        "0x02 0x08\n01 0208\r\n\t02",
        0,
        '{"version":1}\n{"version":2}\n',
        "",
    ),
    ("reads base64", ["--from", "base64", "-t", "Member"], "CgNh\nbm4\n=", 0, 'handle: "ann"\n', ""),
    (
        "reads base64 in padded pieces",
        ["--from", "base64", "-t", "Member"],
        "CgNhYg==\nYw==\n",
        0,
        'handle: "abc"\n',
        "",
    ),
    (
        "says where a payload goes wrong",
        ["truncated.bin"],
        b"",
        3,
        "",
        "truncated.bin: byte 12 (0x000c): orv.Group.memberAdded.member: length 23 runs 18 bytes past the end\n",
    ),
    (
        "says in which message",
        ["-d", "--to", "json", "-"],
        delimited(ADDED, TRUNCATED),
        3,
        ADDED_LINE,
        "standard input: message 2: byte 32 (0x0020): orv.Group.memberAdded.member: length 23 runs 18 bytes past the end\n",
    ),
    (
        "says where a stream ends early",
        ["-d", "--to", "json", "-"],
        STREAM[:-1],
        3,
        ADDED_LINE,
        "standard input: message 2: byte 19 (0x0013): the stream ends inside a message\n",
    ),
    (
        "refuses a length that is none",
        ["-d"],
        b"\x00" + b"\xff" * 9,
        3,
        "# message 1, at byte 1 (0x0001)\n",
        "standard input: message 2: byte 1 (0x0001): length of 2^31 or more, or spelled in more than five bytes\n",
    ),
    (
        "refuses a length above the most",
        ["-d", "--max-size", "1K"],
        b"\x81\x08",
        3,
        "",
        "standard input: message 1: byte 0 (0x0000): length 1025 is above 1024, the most that --max-size allows\n",
    ),
    (
        "refuses a message above the most",
        ["--max-size", "17"],
        ADDED,
        3,
        "",
        "standard input: message of more than 17 bytes, the most that --max-size allows\n",
    ),
    ("takes a message of the most", ["--max-size", "18"], ADDED, 0, ADDED_TEXT, ""),
    (
        "refuses a document above the most",
        ["encode", "-d", "--max-size", "9"],
        '{"version":10}\n',
        3,
        "",
        "standard input: message 1: message of more than 9 bytes, the most that --max-size allows\n",
    ),
    (
        "says where hexadecimal digits go wrong",
        ["--from", "hex", "-"],
        "08\n0g",
        3,
        "",
        'standard input: line 2, column 2: "g" is no hexadecimal digit\n',
    ),
    (
        "says that a digit is missing",
        ["--from", "hex", "-"],
        "080",
        3,
        "",
        "standard input: line 1, column 4: half a byte: an odd number of hexadecimal digits\n",
    ),
    (
        "reads what stands before a wrong digit",
        ["-d", "--from", "hex", "--to", "json", "-"],
        "020801 zz",
        3,
        '{"version":1}\n',
        'standard input: line 1, column 8: "z" is no hexadecimal digit\n',
    ),
    (
        "says where base64 goes wrong",
        ["--from", "base64", "-"],
        "CgNh\nb!4=",
        3,
        "",
        "standard input: line 2, column 4: no base64\n",
    ),
    ("encodes a document", ["encode"], ADDED_LINE, 0, ADDED, ""),
    ("encodes a text", ["encode"], ADDED_TEXT, 0, ADDED, ""),
    (
        "encodes a closed payload as it is",
        ["encode", "--to", "hex"],
        '{"type":5,"data":"IgIQAA=="}',
        0,
        "10051a0422021000\n",
        "",
    ),
    ("encodes nothing as a text", ["encode"], "", 0, "", ""),
    (
        "encodes documents of several lines",
        ["encode", "-d"],
        '{\n"version":\n1}\n\n{"version":2}',
        0,
        delimited(b"\x08\x01", b"\x08\x02"),
        "",
    ),
    ("encodes texts behind their separators", ["encode", "-d"], STREAM_TEXT, 0, STREAM, ""),
    (
        "encodes empty texts of a stream",
        ["encode", "-d", "--from", "text", "--to", "hex"],
        "# message 1\n# message 2\nversion: 2\n# message 3",
        0,
        "00\n020802\n00\n",
        "",
    ),
    ("encodes to base64", ["encode", "--to", "base64", "-t", "Member"], '{"handle":"a"}', 0, "CgFh\n", ""),
    (
        "says which value of a document is wrong",
        ["encode", "-t", "Group"],
        '{"initialize":{"members":[{},{"hndle":""}]}}',
        3,
        "",
        'standard input: $.initialize.members[1].hndle: unknown field (did you mean "handle"?)\n',
    ),
    (
        "says which value of a payload is wrong",
        ["encode"],
        '{"data":{"memberLeft":{"usesToken":1}},"type":"groupMessage"}',
        3,
        "",
        "standard input: $.data.memberLeft.usesToken: expected true or false, found a number\n",
    ),
    (
        "says that a payload has no type",
        ["encode"],
        '{"data":{}}',
        3,
        "",
        'standard input: $.data: an object, but no "type" says of which message\n',
    ),
    (
        "says where a stream of documents goes wrong",
        ["encode", "-d", "--to", "hex"],
        '{"version":1}\n\n{"version":\n1,}\n',
        3,
        "020801\n",
        "standard input: message 2: line 4, column 3: syntax error while parsing object key - unexpected '}'; expected string literal\n",
    ),
    (
        "says where a stream of texts goes wrong",
        ["encode", "-d", "--to", "hex"],
        "# message 1\nversion: 1\n# message 2\nversion: x\n",
        3,
        "020801\n",
        "standard input: message 2: line 4, column 10: Expected integer, got: x\n",
    ),
    (
        "keeps bytes as they are",
        ["convert", "--from", "hex", "--to", "binary"],
        "1A028800 08 81 00",
        0,
        b"\x1a\x02\x88\x00\x08\x81\x00",
        "",
    ),
    (
        "checks bytes that it keeps",
        ["convert", "--from", "hex", "--to", "base64", "-"],
        "0A",
        3,
        "",
        "standard input: byte 1 (0x0001): orv.SessionMessage.version: the input ends inside a record\n",
    ),
    (
        "converts text to JSON",
        ["convert", "--from", "text", "--to", "json", "-d"],
        ADDED_TEXT,
        0,
        ADDED_LINE,
        "",
    ),
    (
        "opens payloads that were closed",
        ["convert", "--from", "json", "--to", "json", "-d"],
        CLOSED_LINE,
        0,
        ADDED_LINE,
        "",
    ),
    (
        "leaves payloads closed that cannot be opened",
        ["convert", "--from", "json", "--to", "json", "-d"],
        '{"type":5,"data":"/w=="}',
        0,
        '{"type":"groupMessage","data":"/w=="}\n',
        "",
    ),
    ("explains bytes", ["inspect"], ADDED, 0, ADDED_DUMP, ""),
    (
        "explains malformed bytes up to the error",
        ["inspect", "truncated.bin"],
        b"",
        3,
        TRUNCATED_DUMP,
        "truncated.bin: byte 12 (0x000c): orv.Group.memberAdded.member: length 23 runs 18 bytes past the end\n",
    ),
    (
        "explains a document's bytes",
        ["inspect", "--from", "json", "-t", "Member"],
        '{"handle":"é\\n"}',
        0,
        'orv.Member, 5 bytes\n0000  0a 03 c3 a9 0a           handle                            string   "é\\x0a"\n',
        "",
    ),
    (
        "explains unknown fields",
        ["inspect", "-t", "Member"],
        bytes.fromhex("08 05 1A 02 6F 6B 23 28 01 24 35 FF 00 00 00"),
        0,
        "orv.Member, 15 bytes\n"
        "0000  08 05                    handle                            varint   another wire type than the field's, kept as unknown: 5\n"
        '0002  1a 02 6f 6b              3                                 bytes    unknown: 2 bytes "ok"\n'
        "0006  23 28 01 24              4                                 group    unknown: 3 bytes\n"
        "000a  35 ff 00 00 00           6                                 fixed32  unknown: 255\n",
        "",
    ),
    (
        "explains a stream with its offsets",
        ["inspect", "-d", "-t", "MemberLeft"],
        delimited(b"\x10\x01", b"", b"\x0a"),
        3,
        "message 1: orv.Group.MemberLeft, 2 bytes\n0001  10 01                    usesToken                         bool     true\n"
        "\nmessage 2: orv.Group.MemberLeft, 0 bytes\n"
        "\nmessage 3: orv.Group.MemberLeft, 1 bytes\n0005  0a\n"
        "                               error at byte 6 (0x0006): orv.Group.MemberLeft.groupUUID: the input ends inside a record\n",
        "standard input: message 3: byte 6 (0x0006): orv.Group.MemberLeft.groupUUID: the input ends inside a record\n",
    ),
    ("finds no difference", ["diff", "added.bin", "added.bin"], b"", 0, "", ""),
    (
        "tells differences",
        ["diff", "added.bin", "-"],
        LEFT,
        1,
        '--- added.bin\n+++ -\n- data.memberAdded.groupUUID: ff\n- data.memberAdded.member.handle: "ann"\n+ data.memberLeft.usesToken: true\n',
        "",
    ),
    (
        "tells differences of documents",
        ["diff", "--from", "json", "-t", "Member", "a.json", "b.json"],
        b"",
        0,
        "",
        "",
    ),
    (
        "tells differences of encodings",
        ["diff", "--bytes", "--from", "json", "-t", "Member", "a.json", "b.json"],
        b"",
        1,
        "--- a.json\n+++ b.json\n~ encoding: 4 bytes -> 5 bytes, the first that differs is byte 1 (0x0001)\n",
        "",
    ),
    ("tells nothing", ["diff", "-q", "added.bin", "-"], LEFT, 1, "", ""),
    (
        "tells differences of streams",
        ["diff", "-d", "stream.bin", "-"],
        delimited(LEFT),
        1,
        '--- stream.bin\n+++ -\n- message 1: data.memberAdded.groupUUID: ff\n- message 1: data.memberAdded.member.handle: "ann"\n'
        "+ message 1: data.memberLeft.usesToken: true\n- message 2: 10 bytes\n",
        "",
    ),
    (
        "fails to compare what is malformed",
        ["diff", "added.bin", "truncated.bin"],
        b"",
        3,
        "",
        "truncated.bin: byte 12 (0x000c): orv.Group.memberAdded.member: length 23 runs 18 bytes past the end\n",
    ),
    ("ranks types", ["identify"], MEMBER_ADDED, 0, None, ""),
    (
        "finds no type for what is no message",
        ["identify", "-"],
        b"\x0f",
        3,
        "",
        "standard input: byte 0 (0x0000): reserved wire type\n",
    ),
    (
        "lists one type",
        ["types", "Group.Initialization"],
        b"",
        0,
        "orv.Group.Initialization\n  1  groupUUID  bytes\n  2  members    repeated Member\n",
        "",
    ),
    (
        "lists a oneof",
        ["types", "JoinResponse.Content"],
        b"",
        0,
        "orv.JoinResponse.Content\n  1  identifier  string\n  3  denied      oneof 1 JoinResponse.Content.DeniedContent\n"
        "  4  approved    oneof 1 JoinResponse.Content.ApprovalContent\n",
        "",
    ),
    (
        "goes on behind a file that fails",
        ["-t", "Member", "nofile", "member.bin"],
        b"",
        4,
        'handle: "a"\n',
        "nofile: No such file or directory\n",
    ),
    ("cannot read a directory", ["."], b"", 4, "", ".: Is a directory\n"),
    ("cannot write into a directory", ["added.bin", "-o", "."], b"", 4, "", ".: Is a directory\n"),
    (
        "cannot write to a full disk",
        ["added.bin", "-o", "/dev/full"],
        b"",
        4,
        "",
        "/dev/full: No space left on device\n",
    ),
    (
        "names a file on one line",
        ["no\nfile\033"],
        b"",
        4,
        "",
        "no\\x0afile\\x1b: No such file or directory\n",
    ),
    (
        "knows its options",
        ["decode", "--delimted"],
        b"",
        2,
        "",
        'orv: decode: unknown option --delimted (did you mean "--delimited"?)\n',
    ),
    (
        "knows its commands",
        ["inspct", "added.bin"],
        b"",
        2,
        "",
        'orv: no file and no command "inspct" (did you mean "inspect"?)\n',
    ),
    (
        "knows its types",
        ["-t", "Grup"],
        b"",
        2,
        "",
        'orv: --type: unknown message type "Grup" (did you mean "Group"?)\n',
    ),
    (
        "asks which type is meant",
        ["-t", "DeniedContent"],
        b"",
        2,
        "",
        'orv: --type: "DeniedContent" could be ConnectionResponse.Content.DeniedContent or JoinResponse.Content.DeniedContent\n',
    ),
    (
        "knows its kinds",
        ["--payload", "joinReques=Group"],
        b"",
        2,
        "",
        'orv: --payload: unknown envelope type "joinReques" (did you mean "joinRequest"?)\n',
    ),
    ("knows its formats", ["--to", "hex"], b"", 2, "", 'orv: --to: "hex" is none of text, json\n'),
    (
        "wants both formats to convert",
        ["convert", "--to", "hex"],
        b"",
        2,
        "",
        "orv: convert: --from and --to must be given\n",
    ),
    ("wants two files to compare", ["diff", "added.bin"], b"", 2, "", "orv: diff: takes two files, not 1\n"),
    (
        "wants two files, not one twice",
        ["diff", "-", "-"],
        b"",
        2,
        "",
        "orv: diff: only one of the files can be standard input\n",
    ),
    (
        "wants a size",
        ["--max-size", "1.5M"],
        b"",
        2,
        "",
        'orv: --max-size: "1.5M" is no size (1000000, 64KiB, 1G)\n',
    ),
    (
        "does not put messages together without lengths",
        ["encode", "a.json", "b.json"],
        b"",
        2,
        "",
        "orv: encode: several messages in binary need --delimited\n",
    ),
    (
        "writes an empty file for an empty message",
        ["encode", "-t", "Member", "empty.json", "-o", "empty.bin"],
        b"",
        0,
        "",
        "",
    ),
]


def cases():
    write("added.bin", ADDED)
    write("truncated.bin", TRUNCATED)
    write("stream.bin", STREAM)
    write("member.bin", b"\x0a\x01a")
    write("empty.json", b"{}")
    # Canonically equivalent, of two and three bytes.
    write("a.json", '{"handle":"\u00e9"}'.encode())
    write("b.json", '{"handle":"e\u0301"}'.encode())
    for name, arguments, stdin, status, stdout, stderr in CASES:
        done = run(*arguments, stdin=stdin)
        expect(f"{name}: status", done.returncode, status)
        expect(f"{name}: standard error", done.stderr.decode(), stderr)
        if stdout is not None:
            expect(name, done.stdout, stdout if isinstance(stdout, bytes) else stdout.encode())
    expect("empty file", os.path.getsize("empty.bin"), 0)


def ranking():
    """The likeliest types come first; types of the same fields fit alike."""
    lines = run("identify", stdin=MEMBER_ADDED).stdout.decode().splitlines()
    expect("the likeliest type", lines[0].split()[2], "orv.Group")
    body = MEMBER_ADDED[2:]
    lines = run("identify", stdin=body).stdout.decode().splitlines()
    first = sorted(line.split()[2] for line in lines if line.split()[0] == lines[0].split()[0])
    expect(
        "types alike", first, ["orv.Group.Initialization", "orv.Group.MemberAdded", "orv.Group.MemberRemoved"]
    )
    lines = run("identify", stdin=ADDED).stdout.decode().splitlines()
    expect("an envelope", lines[0].split()[2], "orv.SessionMessage")


def closed_descriptors():
    """What is closed cannot be read or written; the reader of a pipe may leave."""
    for command, status in [("types >&-", 4), ("decode <&-", 4), ("types 2>&-", 0), ("inspct 2>&-", 2)]:
        done = subprocess.run(["sh", "-c", f'"{COMMAND}" {command}'], capture_output=True, timeout=60)
        expect(f"orv {command}: status", done.returncode, status)
    stream = delimited(*[ADDED] * 20000)
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


def kept_files():
    """A file is not touched when there is nothing to put into it."""
    write("kept", b"precious")
    expect("malformed input: status", run("truncated.bin", "-o", "kept").returncode, 3)
    expect("malformed input: the output file", open("kept", "rb").read(), b"precious")


def test():
    cases()
    ranking()
    closed_descriptors()
    kept_files()


in_scratch_directory(test)
