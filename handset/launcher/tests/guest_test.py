# SPDX-License-Identifier: Apache-2.0
"""The conversation with a guest, against a machine that is only two socket pairs."""

import os
import socket
import struct
import threading
import unittest
from unittest import mock

import launcher_path  # noqa: F401
import guest
from failure import Failure


class FakeMachine:
    """The test's ends are `agent_end` and `console_end`."""

    def __init__(self):
        self.agent, self.agent_end = socket.socketpair()
        self.console, self.console_end = socket.socketpair()
        self.killed = False

    def read_console(self):
        return bool(self.console.recv(4096))

    def drain_console(self):
        pass

    def last_words(self, _count):
        return ["the last line"]

    def kill(self):
        self.killed = True


class Streams:
    def __init__(self, descriptor=None):
        self.input = descriptor
        self.output = b""
        self.errors = b""

    def write_output(self, chunk):
        self.output += chunk

    def write_errors(self, chunk):
        self.errors += chunk


def frame(kind, payload=b""):
    return kind + struct.pack("<I", len(payload)) + payload


class Guest(unittest.TestCase):
    def setUp(self):
        self.machine = FakeMachine()
        for end in ("agent", "agent_end", "console", "console_end"):
            self.addCleanup(getattr(self.machine, end).close)
        self.guest = guest.Guest(self.machine)

    def answer(self, *frames):
        self.machine.agent_end.sendall(b"".join(frames))

    def run_command(self, streams, *words):
        return self.guest.run(words or ("true",), "/", {}, streams)

    def received(self, size):
        """The next `size` bytes the agent gets."""
        return self.machine.agent_end.recv(size, socket.MSG_WAITALL)

    def test_boot_is_over_when_the_agent_speaks(self):
        self.answer(frame(b"R"))
        self.guest.wait_for_boot()
        self.assertFalse(self.machine.killed)

    def test_boot_that_takes_too_long_fails_with_the_console(self):
        with mock.patch.object(guest, "BOOT_SECONDS", 0.05):
            with self.assertRaises(Failure) as failed:
                self.guest.wait_for_boot()
        self.assertEqual(str(failed.exception),
                         "the guest did not boot within 0.05 s\n  console: the last line")
        self.assertTrue(self.machine.killed)

    def test_guest_that_ends_in_its_boot_fails_with_the_console(self):
        self.machine.agent_end.close()
        with self.assertRaisesRegex(Failure, "^the guest ended while it booted\n  console: the last line$"):
            self.guest.wait_for_boot()

    def test_command_is_described_and_started(self):
        self.answer(frame(b"X", bytes(4)))
        self.guest.run(["ls", "-l"], "/tmp", {"OUT": "/run/x"}, Streams())
        wanted = (b"A\x02\0\0\0ls" b"A\x02\0\0\0-l" b"E\x0a\0\0\0OUT=/run/x" b"D\x04\0\0\0/tmp"
                  b"S\0\0\0\0" b"I\0\0\0\0")
        self.assertEqual(self.received(len(wanted)), wanted)

    def test_output_and_status_come_back(self):
        self.answer(frame(b"O", b"a"), frame(b"E", b"b"), frame(b"O", b"c"),
                    frame(b"X", b"\0\x07\0\0"))
        streams = Streams()
        self.assertEqual(self.run_command(streams), 0x700)
        self.assertEqual((streams.output, streams.errors), (b"ac", b"b"))

    def test_command_that_was_not_started_is_told(self):
        self.answer(frame(b"F", b"\x02\0\0\0cannot run nothing"))
        with self.assertRaises(guest.NotStarted) as failed:
            self.run_command(Streams())
        self.assertEqual(str(failed.exception), "cannot run nothing: No such file or directory")
        self.assertEqual(failed.exception.error, 2)

    def test_guest_that_ends_during_the_command_is_a_failure(self):
        self.answer(frame(b"O", b"a"))
        self.machine.agent_end.close()
        streams = Streams()
        with self.assertRaisesRegex(Failure, "^the guest ended before the command did\n"):
            self.run_command(streams)
        self.assertEqual(streams.output, b"a")

    def test_input_stops_at_the_window_until_it_is_consumed(self):
        reading, writing = os.pipe()
        self.addCleanup(os.close, reading)
        writer = threading.Thread(target=self.write_and_close, args=(writing, b"x" * 70000))
        writer.start()
        agent = threading.Thread(target=self.take_input)
        agent.start()
        self.run_command(Streams(reading))
        agent.join()
        writer.join()
        self.assertEqual(self.ahead, 65536)
        self.assertEqual(self.rest, 70000 - 65536)

    @staticmethod
    def write_and_close(descriptor, content):
        os.write(descriptor, content[:60000])
        os.write(descriptor, content[60000:])
        os.close(descriptor)

    def take_frame(self):
        kind, length = struct.unpack("<cI", self.received(5))
        return kind, self.received(length) if length else b""

    def take_input(self):
        """The agent's side: takes all that comes unasked, then says that it was consumed."""
        self.machine.agent_end.settimeout(0.5)
        self.ahead = self.rest = 0
        try:
            while True:
                kind, payload = self.take_frame()
                self.ahead += len(payload) if kind == b"I" else 0
        except TimeoutError:
            self.answer(frame(b"C", struct.pack("<I", self.ahead)))
        kind, payload = self.take_frame()
        while payload:
            self.rest += len(payload)
            kind, payload = self.take_frame()
        self.answer(frame(b"X", bytes(4)))

    def test_kernel_log_loses_its_priority_marks(self):
        self.answer(frame(b"O", b"late output"), frame(b"K", b"<6>[ 0.1] one\n<3>[ 0.2] t"),
                    frame(b"K", b"wo <x>\n"), frame(b"K"))
        self.assertEqual(self.guest.kernel_log(5), b"[ 0.1] one\n[ 0.2] two <x>\n")

    def test_kernel_log_of_a_silent_guest_is_none(self):
        self.assertIsNone(self.guest.kernel_log(0.05))


if __name__ == "__main__":
    unittest.main()
