#!/usr/bin/env python3
"""Peers in Python: code that protoc generates from the schema takes part in the invitation, as the guests of the host
in C++ and as the host of a guest in C++. Each side fails at the first thing that is not what the story has it say.

usage: peer_test.py INVITATION PROTOC SCHEMA [unittest arguments]
"""

import pathlib
import socket
import subprocess
import sys
import tempfile
import time
import unittest

from nacl import bindings as sodium

sys.path.append(str(pathlib.Path(__file__).parents[2] / "tests" / "testing"))
from framing import delimited

INVITATION, PROTOC, SCHEMA = sys.argv[1:4]
PATIENCE = 20  # seconds for one step, on a busy machine
NONCE_SIZE = sodium.crypto_aead_xchacha20poly1305_ietf_NPUBBYTES
with tempfile.TemporaryDirectory() as generated:
    subprocess.run([PROTOC, f"--python_out={generated}", f"-I{pathlib.Path(SCHEMA).parent}", SCHEMA], check=True)
    sys.path.append(generated)
    import orv_pb2 as orv

Answer = orv.ConnectionResponse.Content
PAYLOADS = {orv.joinRequest: orv.JoinRequest, orv.joinResponse: orv.JoinResponse, orv.groupMessage: orv.Group,
            orv.connectionRequest: orv.ConnectionRequest, orv.connectionResponse: Answer}
TYPES = {payload: number for number, payload in PAYLOADS.items()}

# The story.
HOST = "living-room@home"
ANNA = orv.ConnectionRequest(identifier="2C8E91B7", handle="anna@tablet", displayName="Anna's tablet")
BEN = orv.ConnectionRequest(identifier="D04B7733", handle="ben@phone", displayName="Ben's phone")
DENIAL = Answer(identifier=BEN.identifier, handle=HOST, denied=Answer.DeniedContent())
JOIN = orv.JoinRequest.Content(identifier=ANNA.identifier, displayName=ANNA.displayName, wantsTokenURI=True)
WELCOME = orv.JoinResponse.Content(identifier=ANNA.identifier, approved=orv.JoinResponse.Content.ApprovalContent(
    sessionIdentifier="movie-night", memberHandles=[HOST, ANNA.handle]))
UUID = bytes.fromhex("3b1f54c09a774e0d8c215eb6d49013fa")
MEMBERS = [orv.Member(handle=HOST), orv.Member(handle=ANNA.handle)]
SPEAKER = orv.Member(handle="speaker@kitchen", tokenID="token-1")
EVENTS = [orv.Group(initialize=orv.Group.Initialization(groupUUID=UUID, members=MEMBERS)),
          orv.Group(memberAdded=orv.Group.MemberAdded(groupUUID=UUID, member=SPEAKER)),
          orv.Group(memberRemoved=orv.Group.MemberRemoved(groupUUID=UUID, member=SPEAKER))]
FAREWELL = orv.Group(memberLeft=orv.Group.MemberLeft(groupUUID=UUID, usesToken=False))


def approval(key):
    return Answer(identifier=ANNA.identifier, handle=HOST, approved=Answer.ApprovalContent(invitationData=key))


def seal(key, body):
    nonce = sodium.randombytes(NONCE_SIZE)
    return nonce + sodium.crypto_aead_xchacha20poly1305_ietf_encrypt(body.SerializeToString(), None, nonce, key)


def unseal(kind, key, sealed):
    nonce, body = sealed[:NONCE_SIZE], sealed[NONCE_SIZE:]
    return kind.FromString(sodium.crypto_aead_xchacha20poly1305_ietf_decrypt(body, None, nonce, key))


class Peer:
    """Session messages over a connection, each behind its length, which takes one byte or two."""

    def __init__(self, connection, test):
        self.connection, self.test = connection, test
        self.connection.settimeout(PATIENCE)
        self.test.addCleanup(connection.close)

    def send(self, payload):
        envelope = orv.SessionMessage(version=1, type=TYPES[type(payload)], data=payload.SerializeToString())
        self.connection.sendall(delimited(envelope.SerializeToString()))

    def receive(self):
        length = self.read(1)[0]
        if length >= 0x80:
            length = length & 0x7F | self.read(1)[0] << 7
        envelope = orv.SessionMessage.FromString(self.read(length))
        self.test.assertEqual(envelope.version, 1)
        return PAYLOADS[envelope.type].FromString(envelope.data)

    def read(self, count):
        return self.connection.recv(count, socket.MSG_WAITALL)

    def end(self):
        self.connection.shutdown(socket.SHUT_WR)
        self.test.assertEqual(self.connection.recv(1), b"")


class PeerTest(unittest.TestCase):
    def setUp(self):
        self.path = self.enterContext(tempfile.TemporaryDirectory()) + "/socket"

    def start(self, *part):
        command = [INVITATION, "--capture", self.path + ".capture", "--time-limit", str(PATIENCE), *part]
        process = self.enterContext(subprocess.Popen(command, stderr=subprocess.PIPE, text=True))
        self.addCleanup(process.kill)
        return process

    def connect(self, process):
        connection = socket.socket(socket.AF_UNIX)
        while connection.connect_ex(self.path) != 0:
            self.assertIsNone(process.poll(), "the host does not listen")
            time.sleep(0.01)
        return Peer(connection, self)

    def test_guests_of_a_host_in_cpp(self):
        process = self.start("host", self.path)
        peer = self.connect(process)
        peer.send(ANNA)
        answer = peer.receive()
        host_key = answer.approved.invitationData
        self.assertEqual(answer, approval(host_key))
        keys = sodium.crypto_kx_keypair()
        receiving, sending = sodium.crypto_kx_client_session_keys(*keys, host_key)
        peer.send(orv.JoinRequest(publicKey=keys[0], encryptedData=seal(sending, JOIN)))
        self.assertEqual(unseal(orv.JoinResponse.Content, receiving, peer.receive().encryptedData), WELCOME)
        self.assertEqual([peer.receive() for _ in EVENTS], EVENTS)
        peer.send(FAREWELL)
        peer.end()
        peer = self.connect(process)
        peer.send(BEN)
        self.assertEqual(peer.receive(), DENIAL)
        peer.end()
        self.assertEqual((process.communicate(timeout=PATIENCE)[1], process.returncode), ("", 0))

    def test_a_host_of_a_guest_in_cpp(self):
        with socket.create_server(self.path, family=socket.AF_UNIX) as listener:
            listener.settimeout(PATIENCE)
            process = self.start("guest", self.path, "anna")
            peer = Peer(listener.accept()[0], self)
        self.assertEqual(peer.receive(), ANNA)
        keys = sodium.crypto_kx_keypair()
        peer.send(approval(keys[0]))
        request = peer.receive()
        receiving, sending = sodium.crypto_kx_server_session_keys(*keys, request.publicKey)
        self.assertEqual(unseal(orv.JoinRequest.Content, receiving, request.encryptedData), JOIN)
        peer.send(orv.JoinResponse(encryptedData=seal(sending, WELCOME)))
        for event in EVENTS:
            peer.send(event)
        self.assertEqual(peer.receive(), FAREWELL)
        peer.end()
        self.assertEqual((process.communicate(timeout=PATIENCE)[1], process.returncode), ("", 0))


unittest.main(argv=[sys.argv[0], *sys.argv[4:]])
