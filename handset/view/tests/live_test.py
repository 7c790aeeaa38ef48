# SPDX-License-Identifier: Apache-2.0
"""A run that is under way, looked at again and again."""

import time
import unittest

import view_path  # noqa: F401
from live import LiveRun
from run_files import Directory


class Looking(unittest.TestCase):
    def setUp(self):
        self.directory = Directory(self)
        self.live = LiveRun(str(self.directory.path))
        self.now = time.monotonic() * 1000  # the run's clock is this machine's

    def texts(self):
        return [line["text"] for line in self.live.look()]

    def test_sees_each_line_once(self):
        self.directory.write(10, "state", "1\n")
        self.assertEqual(self.texts(), ["state ← 1"])
        self.directory.write(11, "duration", "50\n", result="EIO")
        self.assertEqual(self.texts(), ["duration ← 50 (EIO)"])
        self.assertEqual(self.texts(), [])

    def test_waits_for_the_end_of_a_line(self):
        self.directory.write(10, "state", "1\n")
        whole = (self.directory.path / "journal.jsonl").read_text("utf-8")
        self.directory.text("journal.jsonl", whole[:30])
        self.assertEqual(self.texts(), [])
        self.directory.text("journal.jsonl", whole)
        self.assertEqual(self.texts(), ["state ← 1"])

    def test_begins_anew_with_a_file_that_was_emptied(self):
        self.directory.write(10, "cp_trigger_queue", "5.100, 10, 0~\0")
        self.texts()
        self.directory.text("journal.jsonl", "")
        self.texts()
        self.directory.write(20, "state", "1\n")
        self.assertEqual(self.texts(), ["state ← 1"])

    def test_puts_log_and_journal_in_order(self):
        self.directory.text("service.log", "10500 QvxVibrator-HAL-AIDL-CORE E 11-22 12:19:12   1   1 "
                                           "Vibrator.cpp:75] V_2_0: Vibrator off\n")
        self.directory.write(10, "state", "1\n")
        self.directory.write(11, "activate", "0\n")
        self.assertEqual(self.texts(), ["state ← 1", "V_2_0: Vibrator off", "activate ← 0"])

    def test_puts_an_answer_behind_what_its_call_caused(self):
        self.directory.call(9, 3, "std on 5", exception=-5, text="EX_ILLEGAL_STATE; no motor")
        self.directory.write(10, "state", "1\n")
        self.directory.write(13, "activate", "0\n")
        self.assertEqual([(line["source"], line["text"], line["bad"]) for line in self.live.look()],
                         [("driver", "state ← 1", False),
                          ("answer", "EX_ILLEGAL_STATE; no motor", True),
                          ("driver", "activate ← 0", False)])

    def test_tells_what_has_changed_of_the_drive(self):
        self.directory.write(self.now - 40, "fifo", "1\n")
        self.directory.write(self.now - 30, "fifo", "2\n")
        self.live.look()
        drive = self.live.drive()
        self.assertEqual((drive["from"], [one[4] for one in drive["stretches"]]),
                         (0, ["FIFO 1", "FIFO 2"]))
        self.assertIsNone(self.live.drive())
        self.directory.write(self.now - 10, "fifo", "3\n")
        self.live.look()
        drive = self.live.drive()
        self.assertEqual((drive["from"], [one[4] for one in drive["stretches"]]),
                         (1, ["FIFO 2", "FIFO 3"]))


if __name__ == "__main__":
    unittest.main()
