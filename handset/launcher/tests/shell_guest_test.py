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

from handset_command import ARCH, OPTIONS, emulator_of, ends
from launcher_path import SHELL


class OnTerminal:
    """handset/shell on a terminal of its own, killed with the test."""

    def __init__(self, test, *words):
        self.test = test
        self.master, self.terminal = pty.openpty()
        test.addCleanup(os.close, self.master)
        test.addCleanup(os.close, self.terminal)
        self.set_size(30, 100)
        self.before = termios.tcgetattr(self.terminal)
        self.process = subprocess.Popen([SHELL, *words], stdin=self.terminal,
                                        stdout=self.terminal, stderr=self.terminal)
        test.addCleanup(self.process.wait)
        test.addCleanup(self.process.kill)
        self.seen = ""
        self.greeting = self.expect("# ")

    def set_size(self, rows, columns):
        fcntl.ioctl(self.terminal, termios.TIOCSWINSZ, struct.pack("<HHHH", rows, columns, 0, 0))

    def say(self, text):
        os.write(self.master, text.encode())

    def expect(self, text):
        """Reads until `text` has come; what came before it is returned and forgotten."""
        deadline = time.monotonic() + 90
        while text not in self.seen:
            self.test.assertGreater(deadline, time.monotonic(), f"no {text!r} in {self.seen!r}")
            if select.select([self.master], [], [], 1)[0]:
                self.seen += os.read(self.master, 4096).decode()
        before, _, self.seen = self.seen.partition(text)
        return before


class ShellCase(unittest.TestCase):
    PROFILE = "off"

    def setUp(self):
        self.shell = OnTerminal(self, *OPTIONS, "--profile", self.PROFILE)
        self.process, self.terminal = self.shell.process, self.shell.terminal
        self.say, self.expect, self.before = self.shell.say, self.shell.expect, self.shell.before
        self.emulator = emulator_of(self.process)


class Shell(ShellCase):
    def test_is_interactive_and_ends_with_its_status(self):
        self.say("echo $((6 * 7)); test -t 0 && echo terminal\r")
        self.expect("\r\n42\r\nterminal\r\n")
        self.say("stty size\r")
        self.expect("\r\n30 100\r\n")
        self.shell.set_size(40, 120)
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


class ShellWithPhone(ShellCase):
    PROFILE = "leds"

    def test_greets_with_the_phone_and_completes(self):
        for line in ("phone is up: profile leds", "vibctl std on 500", "phone journal"):
            self.assertIn(line, self.shell.greeting)
        self.say("ls /sys/class/leds/vibrator\r")
        self.expect("duration")
        # The run's record of calls is kept of what is typed here, too.
        self.say("vibctl std on 20; grep -c '\"std\",\"on\",\"20\"' $OUT/calls.jsonl\r")
        self.expect("on: ok\r\n1\r\n")
        if ARCH == "amd64":
            self.say("phone jou\t | wc -c; vibctl doc\t --help | head -n 1\r")
            self.expect("phone journal ")
            self.expect("vibctl doctor ")
        self.say("exit 0\r")
        self.assertEqual(self.process.wait(60), 0)

    def test_is_joined_by_another_terminal(self):
        other = OnTerminal(self, "--join")
        other.say("while ! phone journal | grep -c duration; do sleep 0.2; done; exit 3\r")
        self.say("vibctl std on 500\r")
        self.expect("on: ok")
        self.assertEqual(other.process.wait(60), 3)
        self.assertEqual(termios.tcgetattr(other.terminal), other.before)
        again = OnTerminal(self, "--join", str(self.process.pid))
        self.say("exit 0\r")
        again.expect("handset/shell: the guest ended before the command did")
        self.assertEqual(again.process.wait(60), 2)
        refused = subprocess.run([SHELL, "--join", str(self.process.pid)], text=True, check=False,
                                 stdin=other.terminal, stdout=other.terminal,
                                 stderr=subprocess.PIPE)
        self.assertEqual((refused.returncode, refused.stderr), (
            2, f"handset/shell: no guest {self.process.pid} to join\n"))


if __name__ == "__main__":
    unittest.main()
