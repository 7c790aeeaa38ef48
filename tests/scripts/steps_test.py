# SPDX-License-Identifier: Apache-2.0
"""Steps of the project's commands: what they show, their status, and that nothing outlives them."""

import contextlib
import os
import pathlib
import pty
import signal
import subprocess
import tempfile
import time
import unittest

STEPS = pathlib.Path(__file__).resolve().parent.parent.parent / "scripts" / "steps.sh"


def end_group_of(pid):
    with contextlib.suppress(ProcessLookupError):
        os.killpg(os.getpgid(pid), signal.SIGKILL)


def is_running(pid):
    try:
        state = pathlib.Path(f"/proc/{pid}/stat").read_text("ascii").rsplit(")", 1)[1].split()[0]
    except FileNotFoundError:
        return False
    return state != "Z"


class Steps(unittest.TestCase):
    def setUp(self):
        directory = tempfile.TemporaryDirectory()
        self.addCleanup(directory.cleanup)
        self.directory = pathlib.Path(directory.name)

    def start(self, script):
        process = subprocess.Popen(
            ["bash", "-c", f"set -euo pipefail\n. {STEPS}\n{script}"], cwd=self.directory,
            env={**os.environ, "TMPDIR": str(self.directory)}, text=True,
            stdout=subprocess.PIPE, stderr=subprocess.PIPE)
        self.addCleanup(process.communicate)
        self.addCleanup(process.kill)
        return process

    def finish(self, script):
        process = self.start(script)
        output, errors = process.communicate(timeout=30)
        return process.returncode, output, errors

    def test_hide_the_output_of_what_succeeds(self):
        status, output, errors = self.finish("step quiet echo hidden; echo after")
        self.assertEqual((status, errors), (0, ""))
        self.assertRegex(output, r"\A-- quiet \(\d s\)\nafter\n\Z")

    def test_show_each_step_once_where_no_terminal_is(self):
        status, output, _ = self.finish("step slow sh -c 'for i in 1 2 3; do echo $i; sleep 0.7; done'")
        self.assertEqual(status, 0)
        self.assertRegex(output, r"\A-- slow \(\d s\)\n\Z")

    def test_show_their_newest_line_on_a_terminal(self):
        master, terminal = pty.openpty()
        self.addCleanup(os.close, master)
        process = subprocess.Popen(
            ["bash", "-c", f". {STEPS}; step slow sh -c 'echo early; sleep 2.5'"], stdout=terminal,
            env={**os.environ, "TERM": "xterm"})
        os.close(terminal)
        self.assertEqual(process.wait(timeout=30), 0)
        output = os.read(master, 65536).decode()
        self.assertIn("\r\033[K-- slow, 1 s  early", output)
        self.assertRegex(output, r"\r\033\[K-- slow \(\d s\)\r\n\Z")

    def test_without_a_reader_end_with_all_that_they_started(self):
        for runner in ("step long", "whole"):
            with self.subTest(runner=runner):
                process, grandchild = self.grandchild_of(runner, "sleep 1; echo more; wait")
                process.stdout.close()
                process.send_signal(signal.SIGPIPE)
                self.assertEqual(process.wait(timeout=20), 141)
                self.assert_ends(grandchild)
                self.assertEqual(list(self.directory.iterdir()), [])

    def test_without_a_reader_end_without_a_word(self):
        process = self.start("step one sleep 0.5; step two true; step three touch reached")
        process.stdout.close()
        self.assertEqual(process.stderr.read(), "")
        self.assertEqual(process.wait(timeout=20), 141)
        self.assertFalse((self.directory / "reached").exists())

    def test_show_the_output_of_what_fails_and_end_with_its_status(self):
        status, output, errors = self.finish("step broken sh -c 'echo why; exit 7'; echo after")
        self.assertEqual((status, errors), (7, "why\n"))
        self.assertRegex(output, r"\A-- broken: failed after \d s\n\Z")

    def test_run_functions_too(self):
        self.assertEqual(self.finish("greet() { exit 3; }; step hello greet")[0], 3)

    def test_whole_commands_show_their_output_and_give_their_status(self):
        self.assertEqual(self.finish("whole sh -c 'echo shown; exit 5' || echo $?"),
                         (0, "shown\n5\n", ""))

    def test_leave_no_file(self):
        self.finish("step good true")
        self.finish("step bad false")
        self.assertEqual(list(self.directory.iterdir()), [])

    def grandchild_of(self, runner, then):
        """Starts a command that starts a long one and then does `then`; gives both."""
        process = self.start(f"{runner} sh -c 'sleep 1000 & echo $! >grandchild; {then}'")
        grandchild = self.directory / "grandchild"
        limit = time.monotonic() + 20
        while not (grandchild.exists() and grandchild.read_text("ascii").endswith("\n")):
            self.assertLess(time.monotonic(), limit)
            time.sleep(0.02)
        pid = int(grandchild.read_text("ascii"))
        grandchild.unlink()
        self.addCleanup(end_group_of, pid)
        return process, pid

    def assert_ends(self, pid):
        limit = time.monotonic() + 20
        while is_running(pid):
            self.assertLess(time.monotonic(), limit, f"process {pid} still runs")
            time.sleep(0.02)

    def test_interrupted_take_along_all_that_they_started(self):
        for runner in ("step long", "whole"):
            for number in (signal.SIGINT, signal.SIGTERM, signal.SIGHUP):
                with self.subTest(runner=runner, signal=number.name):
                    process, grandchild = self.grandchild_of(runner, "wait")
                    self.assertTrue(is_running(grandchild))
                    process.send_signal(number)
                    self.assertEqual(process.wait(timeout=20), 130)
                    self.assert_ends(grandchild)
                    self.assertEqual(list(self.directory.iterdir()), [])

    def test_failed_take_along_all_that_they_started(self):
        for runner in ("step long", "whole"):
            with self.subTest(runner=runner):
                process, grandchild = self.grandchild_of(runner, "exit 3")
                self.assertEqual(process.wait(timeout=20), 3)
                self.assert_ends(grandchild)


if __name__ == "__main__":
    unittest.main()
