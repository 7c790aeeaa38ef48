# SPDX-License-Identifier: Apache-2.0
"""Every way in which a session can end, and that no QEMU outlives it."""

import os
import shutil
import signal
import subprocess
import tempfile
import unittest

from handset_command import ARCH, BUILD, emulator_of, ends, handset, started
from launcher_path import RUN


class Ending(unittest.TestCase):
    def assert_gone(self, pid):
        self.assertTrue(ends(pid), f"QEMU {pid} still runs")

    def test_signal_that_ended_the_command_is_added_to_128(self):
        done = handset("--profile", "off", "--", "sh", "-c", "kill -SEGV $$")
        self.assertEqual((done.returncode, done.stdout, done.stderr), (139, b"", b""))

    def test_missing_program_is_127(self):
        done = handset("--profile", "off", "--", "no-such-program")
        self.assertEqual((done.returncode, done.stdout, done.stderr), (
            127, b"", b"handset: cannot run no-such-program: No such file or directory\n"))

    def test_program_that_may_not_run_is_126(self):
        done = handset("--profile", "off", "--", "/etc/passwd")
        self.assertEqual((done.returncode, done.stdout, done.stderr), (
            126, b"", b"handset: cannot run /etc/passwd: Permission denied\n"))

    def test_timeout_ends_the_guest_and_keeps_what_there_is(self):
        directory = tempfile.mkdtemp(prefix="handset-test-", dir="/var/tmp")
        self.addCleanup(shutil.rmtree, directory)
        with started("--profile", "off", "--timeout", "1.5", "--out", directory, "--",
                     "sh", "-c", "echo early; echo kept > $OUT/file; sleep 1000") as process:
            emulator = emulator_of(process)
            output, errors = process.communicate(timeout=120)
        self.assert_gone(emulator)
        self.assertEqual((process.returncode, output, errors), (
            124, b"early\n", b"handset: not finished after 1.5 s; the guest was ended\n"))
        self.assertEqual(sorted(os.listdir(directory)), ["file", "kernel.log"])

    def test_interrupt_leaves_every_file(self):
        directory = tempfile.mkdtemp(prefix="handset-test-", dir="/var/tmp")
        self.addCleanup(shutil.rmtree, directory)
        with started("--profile", "leds", "--out", directory, "--", "sh", "-c",
                     "vibctl std on 500; echo mine > $OUT/file; echo running; sleep 1000"
                     ) as process:
            emulator = emulator_of(process)
            self.assertEqual(process.stdout.readline(), b"on: ok\n")
            self.assertEqual(process.stdout.readline(), b"running\n")
            process.send_signal(signal.SIGINT)
            self.assertEqual(process.wait(120), -signal.SIGINT)
        self.assert_gone(emulator)
        for name, text in (("journal.jsonl", b'"data":"500\\n"'), ("service.log", b"HW_API"),
                           ("kernel.log", b"Linux version"), ("file", b"mine")):
            with open(os.path.join(directory, name), "rb") as file:
                self.assertIn(text, file.read(), name)

    def test_signals_end_launcher_and_guest(self):
        for number in (signal.SIGINT, signal.SIGTERM, signal.SIGHUP, signal.SIGKILL):
            with self.subTest(signal=number.name):
                with started("--profile", "off", "--", "sh", "-c",
                             "echo running; sleep 1000") as process:
                    emulator = emulator_of(process)
                    self.assertEqual(process.stdout.readline(), b"running\n")
                    process.send_signal(number)
                    output, errors = process.communicate(timeout=60)
                self.assert_gone(emulator)
                self.assertEqual((process.returncode, output, errors), (-number, b"", b""))

    def test_signal_during_the_boot_ends_the_guest(self):
        for number in (signal.SIGINT, signal.SIGKILL):
            with self.subTest(signal=number.name):
                with started("--profile", "off", "--", "true") as process:
                    emulator = emulator_of(process)
                    process.send_signal(number)
                    output, errors = process.communicate(timeout=60)
                self.assert_gone(emulator)
                self.assertEqual((process.returncode, output, errors), (-number, b"", b""))

    def test_panicking_guest_shows_its_console(self):
        done = handset("--profile", "off", "--", "sh", "-c",
                       "echo before; sleep 1; echo c > /proc/sysrq-trigger; sleep 1000")
        self.assertEqual(done.returncode, 2, done)
        self.assertEqual(done.stdout, b"before\n")
        self.assertTrue(done.stderr.startswith(
            b"handset/run: the guest ended before the command did\n  console: "), done)
        self.assertRegex(done.stderr, rb"Kernel panic - not syncing: sysrq triggered crash\n\Z")

    def test_guest_that_cannot_boot_shows_its_console(self):
        # QEMU asked for a device that it lacks, as another version of it might.
        with tempfile.TemporaryDirectory(prefix="handset-test-") as directory:
            name = {"amd64": "qemu-system-x86_64", "arm64": "qemu-system-aarch64"}[ARCH]
            emulator = os.path.join(directory, name)
            with open(emulator, "w", encoding="ascii") as file:
                file.write(f'#!/bin/sh\nexec {shutil.which(name)} "$@" -device no-such-device\n')
            os.chmod(emulator, 0o755)
            done = handset("--profile", "off", "--", "true",
                           env={**os.environ, "PATH": f"{directory}:{os.environ['PATH']}"})
        self.assertEqual((done.returncode, done.stdout), (2, b""))
        self.assertRegex(done.stderr, rb"\Ahandset/run: the guest ended while it booted\n"
                                      rb"  console: qemu[^\n]*no-such-device")

    def test_sessions_at_the_same_time_do_not_meet(self):
        with started("--profile", "off", "--", "sh", "-c",
                     "echo 1 > /tmp/x; sleep 1; cat /tmp/x") as first:
            with started("--profile", "off", "--", "sh", "-c",
                         "echo 2 > /tmp/x; sleep 1; cat /tmp/x") as second:
                self.assertEqual(first.communicate(timeout=240), (b"1\n", b""))
                self.assertEqual(second.communicate(timeout=240), (b"2\n", b""))

    def test_standard_streams_may_be_missing(self):
        done = subprocess.run(
            ["sh", "-c", f"{RUN} --arch {ARCH} --build {BUILD} --profile off -- "
             "sh -c 'read line; exit 9' <&- >&-; echo $?"],
            stdin=subprocess.DEVNULL, capture_output=True, timeout=120, check=False)
        self.assertEqual((done.stdout, done.stderr), (b"9\n", b""))


if __name__ == "__main__":
    unittest.main()
