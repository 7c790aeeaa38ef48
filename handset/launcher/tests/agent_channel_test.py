# SPDX-License-Identifier: Apache-2.0
"""The launcher's end of the conversation with the agent, byte by byte."""

import socket
import unittest

import launcher_path  # noqa: F401
from agent_channel import Channel


class AgentChannel(unittest.TestCase):
    def setUp(self):
        launcher, self.agent = socket.socketpair()
        self.channel = Channel(launcher)
        self.addCleanup(self.agent.close)
        self.addCleanup(self.channel.close)

    def test_frame_is_kind_length_and_payload(self):
        self.channel.send(b"A", b"ls")
        self.assertEqual(self.agent.recv(100), b"A\x02\0\0\0ls")

    def test_empty_payload_is_a_frame(self):
        self.channel.send(b"S")
        self.assertEqual(self.agent.recv(100), b"S\0\0\0\0")

    def test_frames_in_one_piece_come_in_order(self):
        self.agent.sendall(b"O\x02\0\0\0a\0E\x01\0\0\0bX\x04\0\0\0\0\x07\0\0")
        self.assertEqual(self.channel.receive(),
                         [(b"O", b"a\0"), (b"E", b"b"), (b"X", b"\0\x07\0\0")])

    def test_frame_in_pieces_comes_when_it_is_whole(self):
        for byte in b"O\x02\0\0\0a":
            self.agent.sendall(bytes([byte]))
            self.assertEqual(self.channel.receive(), [])
        self.agent.sendall(b"b")
        self.assertEqual(self.channel.receive(), [(b"O", b"ab")])

    def test_guest_that_has_gone_is_none(self):
        self.agent.close()
        self.assertIsNone(self.channel.receive())


if __name__ == "__main__":
    unittest.main()
