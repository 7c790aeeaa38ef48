# SPDX-License-Identifier: Apache-2.0
"""handset/shell on a terminal of the test's own."""

import fcntl
import os
import pty
import select
import signal
import struct
import subprocess
import termios
import time
import unittest

from handset_command import OPTIONS, emulator_of, ends
from launcher_path import SHELL


class Shell(unittest.TestCase):
    def setUp(self):
        self.master, terminal = pty.openpty()
        self.addCleanup(os.close, self.master)
        self.addCleanup(os.close, terminal)
        self.terminal = terminal
        self.set_size(30, 100)
        self.before = termios.tcgetattr(terminal)
        self.process = subprocess.Popen([SHELL, *OPTIONS, "--profile", "off"], stdin=terminal,
                                        stdout=terminal, stderr=terminal)
        self.addCleanup(self.process.wait)
        self.addCleanup(self.process.kill)
        self.seen = ""
        self.expect("# ")
        self.emulator = emulator_of(self.process)

    def set_size(self, rows, columns):
        fcntl.ioctl(self.terminal, termios.TIOCSWINSZ, struct.pack("<HHHH", rows, columns, 0, 0))

    def say(self, text):
        os.write(self.master, text.encode())

    def expect(self, text):
        """Reads until `text` has come; what came before it is returned and forgotten."""
        deadline = time.monotonic() + 90
        while text not in self.seen:
            self.assertGreater(deadline, time.monotonic(), f"no {text!r} in {self.seen!r}")
            if select.select([self.master], [], [], 1)[0]:
                self.seen += os.read(self.master, 4096).decode()
        before, _, self.seen = self.seen.partition(text)
        return before

    def test_is_interactive_and_ends_with_its_status(self):
        self.say("echo $((6 * 7)); test -t 0 && echo terminal\r")
        self.expect("\r\n42\r\nterminal\r\n")
        self.say("stty size\r")
        self.expect("\r\n30 100\r\n")
        self.set_size(40, 120)
        self.process.send_signal(signal.SIGWINCH)
        self.expect("# ")
        deadline = time.monotonic() + 30
        while time.monotonic() < deadline:
            self.say("stty size\r")
            self.expect("stty size\r\n")
            if self.expect("\r\n") == "40 120":
                break
        else:
            self.fail("the new size did not arrive")
        # An interrupt ends the command in the guest, not the session.
        self.say("sleep 1000\r")
        time.sleep(1)
        self.say("\x03")
        self.expect("# ")
        self.say("exit 5\r")
        self.assertEqual(self.process.wait(30), 5)
        self.assertEqual(termios.tcgetattr(self.terminal), self.before)
        self.assertTrue(ends(self.emulator))

    def test_terminal_is_restored_after_a_signal(self):
        self.assertNotEqual(termios.tcgetattr(self.terminal), self.before)
        self.process.send_signal(signal.SIGTERM)
        self.assertEqual(self.process.wait(30), -signal.SIGTERM)
        self.assertEqual(termios.tcgetattr(self.terminal), self.before)
        self.assertTrue(ends(self.emulator))


if __name__ == "__main__":
    unittest.main()
