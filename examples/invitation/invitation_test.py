#!/usr/bin/env python3
"""Plays the invitation, well and badly, and looks at what it says, keeps and leaves behind.

usage: invitation_test.py INVITATION PROTOC SCHEMA [unittest arguments]
"""

import os
import pathlib
import re
import signal
import socket
import subprocess
import sys
import tempfile
import time
import unittest

sys.path.append(str(pathlib.Path(__file__).parents[2] / "tests" / "testing"))
from framing import delimited, read_delimited

INVITATION, PROTOC, SCHEMA = sys.argv[1:4]

# Seconds for one step: enough on a busy machine, and short enough for a test to wait.
TIME_LIMIT = 1.5
# Seconds after which a process is taken to hang.
PATIENCE = 60

ANNAS_REQUEST = 'identifier: "2C8E91B7" handle: "anna@tablet" displayName: "Anna\'s tablet"'
DENIAL = 'identifier: "2C8E91B7" handle: "living-room@home" denied {}'


def protoc(direction, message, data):
    command = [PROTOC, direction + "=orv." + message, "--proto_path=" + os.path.dirname(SCHEMA), SCHEMA]
    return subprocess.run(command, input=data, stdout=subprocess.PIPE, check=True).stdout


def encode(message, text):
    return protoc("--encode", message, text.encode())


def decode(message, data):
    return " ".join(protoc("--decode", message, data).decode().split())


def escaped(data):
    return "".join(f"\\{byte:03o}" for byte in data)


def envelope(kind, payload, version=1):
    """A session message behind its length."""
    data = escaped(payload)
    return delimited(encode("SessionMessage", f'version: {version} type: {kind} data: "{data}"'))


def data_of(body):
    """The bytes of field 3, which protoc shows escaped."""
    shown = decode("SessionMessage", body)
    escapes = re.search(r'data: "(.*)"$', shown).group(1)
    return escapes.encode().decode("unicode_escape").encode("latin-1")


class InvitationTest(unittest.TestCase):
    def setUp(self):
        self.place = tempfile.TemporaryDirectory()
        self.addCleanup(self.place.cleanup)
        self.capture = os.path.join(self.place.name, "capture")
        self.socket_path = os.path.join(self.place.name, "socket")
        self.temporary = os.path.join(self.place.name, "tmp")
        os.mkdir(self.temporary)

    def start(self, *arguments, time_limit=TIME_LIMIT):
        command = [INVITATION, "--capture", self.capture, "--time-limit", str(time_limit), *arguments]
        process = subprocess.Popen(command, stdout=subprocess.PIPE, stderr=subprocess.PIPE, text=True,
                                   start_new_session=True, env={**os.environ, "TMPDIR": self.temporary})
        self.addCleanup(lambda: process.poll() is None and os.killpg(process.pid, signal.SIGKILL))
        return process

    def finish(self, process):
        output, errors = process.communicate(timeout=PATIENCE)
        self.assertEqual(os.listdir(self.temporary), [], "something was left behind")
        self.assertTrue(self.has_gone(process), "a process was left behind")
        return process.returncode, output, errors

    def has_gone(self, process):
        """Whether the whole process group ends. What a sanitizer started takes a moment."""
        deadline = time.monotonic() + 10
        while time.monotonic() < deadline:
            try:
                os.killpg(process.pid, 0)
            except ProcessLookupError:
                return True
            time.sleep(0.01)
        return False

    def connect(self):
        client = socket.socket(socket.AF_UNIX)
        self.addCleanup(client.close)
        for _ in range(1000):
            try:
                client.connect(self.socket_path)
                return client
            except (FileNotFoundError, ConnectionRefusedError):
                time.sleep(0.01)
        self.fail("the host does not listen")

    def test_both_sides_see_the_whole_story(self):
        status, output, errors = self.finish(self.start(time_limit=20))
        self.assertEqual((status, errors), (0, ""))
        self.assertNotIn("\033", output)
        told = [line.split(maxsplit=3) for line in output.splitlines()]
        receivers = [("host", ("anna", "ben"), 4), ("anna", ("host",), 5), ("ben", ("host",), 1)]
        for receiver, senders, count in receivers:
            received = [line[2:] for line in told if line[0] == receiver and line[1] == "receives"]
            self.assertEqual(len(received), count)
            sent = [line[2:] for line in told if line[0] in senders and line[1] == "sends"]
            remaining = iter(sent)
            self.assertTrue(all(line in remaining for line in received), receiver)

    def test_the_capture_holds_the_session(self):
        self.assertEqual(self.finish(self.start(time_limit=20))[0], 0)
        with open(self.capture, "rb") as capture:
            bodies = read_delimited(capture.read())
        shown = [decode("SessionMessage", body) for body in bodies]
        kinds = [re.match(r"version: 1 type: (\w+) ", text).group(1) for text in shown]
        self.assertEqual(kinds, ["connectionRequest", "connectionResponse", "joinRequest", "joinResponse"]
                         + ["groupMessage"] * 4 + ["connectionRequest", "connectionResponse"])
        self.assertEqual(decode("ConnectionRequest", data_of(bodies[0])), ANNAS_REQUEST.replace("'", "\\'"))
        approval = decode("ConnectionResponse.Content", data_of(bodies[1]))
        self.assertIn("approved { invitationData: ", approval)
        self.assertEqual(decode("ConnectionResponse.Content", data_of(bodies[9])),
                         'identifier: "D04B7733" handle: "living-room@home" denied { }')
        for body in bodies[2:4]:
            self.assertNotIn(b"anna", data_of(body).lower(), "a join body is not sealed")
        events = [decode("Group", data_of(body)) for body in bodies[4:8]]
        self.assertEqual([event.split(" ")[0] for event in events],
                         ["initialize", "memberAdded", "memberRemoved", "memberLeft"])
        self.assertIn('members { handle: "living-room@home" } members { handle: "anna@tablet" }', events[0])
        self.assertIn('member { handle: "speaker@kitchen" tokenID: "token-1" }', events[1])

    def test_a_misbehaving_guest_ends_it(self):
        cases = [
            ("garbage", 20, "host: orv.SessionMessage.data: length 5 runs 4 bytes past the end, at byte "),
            ("close", 20, "host: the connection was closed (anna, joinRequest was due)"),
            ("stall", TIME_LIMIT, "host: timed out (anna, joinRequest was due)"),
            ("freeze", TIME_LIMIT, "a process did not end in time and was killed"),
        ]
        for how, time_limit, complaint in cases:
            with self.subTest(how):
                status, _, errors = self.finish(self.start("--misbehave", how, time_limit=time_limit))
                self.assertEqual(status, 1)
                self.assertIn("invitation: " + complaint, errors)

    @staticmethod
    def answer_to(client):
        """What comes until the host hangs up, which may be before it has read everything."""
        try:
            return client.recv(1)
        except ConnectionResetError:
            return b""

    def test_strangers_are_turned_away_and_the_invitation_goes_on(self):
        stranger = encode("ConnectionRequest", 'identifier: "2C8E91B7" handle: "mallory@tablet"')
        cases = [
            (b"", "the connection was closed (anna, connectionRequest was due)"),
            (b"GET / HTTP/1.1\r\n\r\n", "the stream ends inside a message, at byte "),
            (b"\xff\xff\xff\xff\x07", "longer than is allowed (2147483647 bytes)"),
            (b"\xff\xff\xff\xff\xff\x01", "length of 2^31 or more"),
            (b"\x02\x00\x01", "orv.SessionMessage: field number 0, at byte 1"),
            (b"\x00", "a message of version 0 where version 1 is spoken"),
            (envelope("groupMessage", b"", 2), "a message of version 2 where"),
            (envelope("unknown", b""), "an envelope of the type unknown carries no payload"),
            (envelope("9", b""), "an envelope of the type 9 carries no payload"),
            (envelope("connectionRequest", b"\x12\x05a"),
             "payload: orv.ConnectionRequest.handle: length 5 runs 4 bytes past the end, at byte 1"),
            (envelope("groupMessage", b""), "something else came (anna, connectionRequest"),
            (envelope("connectionRequest", stranger), "not what was expected of anna"),
        ]
        host = self.start("host", self.socket_path, time_limit=20)
        stalling = [self.connect() for _ in range(2)]
        stalling[1].sendall(b"\x40\x08")
        for sent, _ in cases:
            client = self.connect()
            client.sendall(sent)
            client.shutdown(socket.SHUT_WR)
            self.assertEqual(self.answer_to(client), b"")
        for guest in ("anna", "ben"):
            status, _, errors = self.finish(self.start("guest", self.socket_path, guest, time_limit=20))
            self.assertEqual((status, errors), (0, ""))
        status, output, errors = self.finish(host)
        self.assertEqual(status, 0)
        self.assertRegex(output, r"host +wrote +10 messages")
        lines = errors.splitlines()
        self.assertEqual(len(lines), len(cases))
        for line, (sent, complaint) in zip(lines, cases):
            self.assertIn("invitation: host: turned a stranger away: ", line)
            self.assertIn(complaint, line, sent)

    def test_a_guest_whose_join_cannot_be_read_ends_it(self):
        hello = envelope("connectionRequest", encode("ConnectionRequest", ANNAS_REQUEST))

        def join(key, body):
            text = f'publicKey: "{escaped(key)}" encryptedData: "{escaped(body)}"'
            return hello + envelope("joinRequest", encode("JoinRequest", text))

        cases = [
            ("a short key", join(b"short", b""), "a public key of 5 bytes"),
            ("a weak key", join(bytes(32), b""), "an unacceptable public key"),
            ("an empty body", join(b"\x09" + bytes(31), b""), "a sealed body of 0 bytes"),
            ("an unsealed body", join(b"\x09" + bytes(31), b"a" * 80), "that was not sealed for us"),
        ]
        for name, sent, complaint in cases:
            with self.subTest(name):
                process = self.start("host", self.socket_path, time_limit=20)
                client = self.connect()
                client.sendall(sent)
                client.shutdown(socket.SHUT_WR)
                status, _, errors = self.finish(process)
                self.assertEqual(status, 1)
                self.assertIn("invitation: host: ", errors)
                self.assertIn(complaint, errors)
                self.assertFalse(os.path.exists(self.socket_path), "the socket was left behind")

    def test_a_host_waits_no_longer_than_it_says(self):
        for name, sent in (("nobody", None), ("silence", b""), ("slow bytes", b"\x40\x08")):
            with self.subTest(name):
                process = self.start("host", self.socket_path)
                if sent is not None:
                    client = self.connect()
                    client.sendall(sent)
                status, _, errors = self.finish(process)
                self.assertEqual(status, 1)
                self.assertIn("invitation: host: timed out (anna", errors)

    def test_a_byte_now_and_then_does_not_keep_a_host_waiting(self):
        process = self.start("host", self.socket_path)
        client = self.connect()
        client.sendall(b"\x7f")
        started = time.monotonic()
        while process.poll() is None and time.monotonic() - started < PATIENCE:
            try:
                client.sendall(b"\x0a")
            except OSError:
                pass
            time.sleep(0.1)
        status, _, errors = self.finish(process)
        self.assertEqual(status, 1)
        self.assertIn("invitation: host: timed out (anna was due)", errors)

    def test_a_guest_that_is_answered_otherwise_says_what(self):
        cases = [
            ("nothing", b"", "the connection was closed (host, connectionResponse was due)"),
            ("a denial", envelope("connectionResponse", encode("ConnectionResponse.Content", DENIAL)),
             "not what was expected of host"),
            ("an end group", b"\x01\x0c",
             "orv.SessionMessage.version: end of a group that was not begun, at byte 1"),
        ]
        for name, answer, complaint in cases:
            with self.subTest(name):
                with socket.socket(socket.AF_UNIX) as listener:
                    listener.bind(self.socket_path)
                    listener.listen()
                    process = self.start("guest", self.socket_path, "anna", time_limit=20)
                    connection = listener.accept()[0]
                    connection.sendall(answer)
                    connection.shutdown(socket.SHUT_WR)
                    status, _, errors = self.finish(process)
                    connection.close()
                os.unlink(self.socket_path)
                self.assertEqual(status, 1)
                self.assertIn("invitation: anna: ", errors)
                self.assertIn(complaint, errors)

    def test_a_guest_without_a_host_says_so(self):
        status, _, errors = self.finish(self.start("guest", self.socket_path, "ben"))
        self.assertEqual(status, 1)
        self.assertIn("invitation: ben: cannot connect to " + self.socket_path, errors)

    def test_an_interrupted_invitation_leaves_nothing(self):
        for name in ("SIGINT", "SIGTERM", "SIGHUP"):
            with self.subTest(name):
                process = self.start("--misbehave", "stall", time_limit=100)
                while "approved" not in process.stdout.readline():
                    pass
                process.send_signal(getattr(signal, name))
                status, _, errors = self.finish(process)
                self.assertEqual(status, 1)
                self.assertIn("invitation: interrupted", errors)

    def test_what_cannot_be_done_is_refused_first(self):
        cases = [
            (["--misbehave", "politely"], 2, "--misbehave takes garbage, close, stall or freeze"),
            (["--time-limit", "0"], 2, "--time-limit takes a number of seconds"),
            (["--time-limit", "1s"], 2, "--time-limit takes a number of seconds"),
            (["--frobnicate", "1"], 2, "there is no option --frobnicate"),
            (["--capture"], 2, "--capture takes a value"),
            (["guest", self.socket_path, "mallory"], 2, "a guest is anna or ben"),
            (["host"], 2, "that is no part to play"),
            (["host", "x" * 200], 1, "a socket's path has 1 to 107 bytes"),
            (["--capture", os.path.join(self.place.name, "no", "file")], 1, "cannot write "),
        ]
        for arguments, expected, complaint in cases:
            with self.subTest(" ".join(arguments)):
                status, output, errors = self.finish(self.start(*arguments))
                self.assertEqual((status, output), (expected, ""))
                self.assertIn(complaint, errors)
                self.assertEqual(errors.count("\n"), 1)


if __name__ == "__main__":
    unittest.main(argv=[sys.argv[0], *sys.argv[4:]])
