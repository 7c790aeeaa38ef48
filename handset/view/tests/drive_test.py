# SPDX-License-Identifier: Apache-2.0
"""The drive of small runs: times and levels, reckoned by hand."""

import dataclasses
import time
import unittest

import view_path  # noqa: F401
import run
from run_files import Directory


def drive(directory):
    """(start ms, end ms, level, label), "?" after the label of a guessed length."""
    return [(one.start / 1000, one.end / 1000, one.level, one.label + ("" if one.known else "?"))
            for one in run.read(directory.path).stretches]


class Leds(unittest.TestCase):
    def setUp(self):
        self.run = Directory(self)

    def on(self, ms, duration):
        """Two milliseconds of writes; the motor starts with the last."""
        self.run.write(ms, "state", "1\n")
        self.run.write(ms + 1, "duration", f"{duration}\n")
        self.run.write(ms + 2, "activate", "1\n")

    def test_of_a_small_session(self):
        self.on(1000, 50)
        self.run.write(1100, "intensity", "5000\n")
        self.on(1198, 500)
        self.run.write(1300, "intensity", "2500\n")
        self.run.write(1400, "activate", "0\n")
        self.run.write(1500, "haptic_engine", "8 7 10000 2050 0 20 3000 1700 1\n")
        self.on(1508, 1)
        self.run.write(1600, "intensity", "6700\n")
        self.run.write(1601, "cp_trigger_index", "14\n")
        self.on(1608, 1000)
        self.on(1998, 30)
        self.assertEqual(drive(self.run), [
            (1002, 1052, 1.0, "50 ms"),
            (1200, 1300, 0.5, "500 ms"),
            (1300, 1400, 0.25, "500 ms"),
            (1510, 1517, 1.0, "packet 2050"),
            (1517, 1537, 0.3, "packet 1700 overdrive"),
            (1610, 1710, 0.67, "pattern 14"),
            (2000, 2030, 0.67, "30 ms"),
        ])

    def test_of_a_queue_goes_on_until_it_is_stopped(self):
        self.run.write(100, "cp_trigger_index", "65534\n")
        self.run.write(101, "cp_trigger_queue", "10.80, 10, 0~\0")
        self.on(198, 1000)
        self.run.write(345, "activate", "0\n")
        self.assertEqual(drive(self.run), [(200, 250, 0.8, "pattern 10"),
                                           (260, 310, 0.8, "pattern 10"),
                                           (320, 345, 0.8, "pattern 10")])

    def test_of_a_pattern_nobody_knows_the_length_of_is_a_guess(self):
        self.run.write(100, "cp_trigger_index", "3\n")
        self.on(108, 1000)
        self.assertEqual(drive(self.run), [(110, 160, 1.0, "pattern 3?")])

    def test_takes_no_write_that_failed(self):
        self.run.write(100, "duration", "40\n")
        self.run.write(101, "activate", "1\n", result="EIO")
        self.assertEqual(drive(self.run), [])

    def test_rises_from_nothing_with_the_gain(self):
        self.run.write(99, "intensity", "0\n")
        self.on(98 + 2, 100)
        self.run.write(152, "intensity", "10000\n")
        self.assertEqual(drive(self.run), [(102, 152, 0.0, "100 ms"), (152, 202, 1.0, "100 ms")])

    def test_of_the_fifo_begins_with_the_write(self):
        self.run.write(100, "fifo", "7\n")
        self.assertEqual(drive(self.run), [(100, 150, 1.0, "FIFO 7?")])


class ForceFeedback(unittest.TestCase):
    def setUp(self):
        self.run = Directory(self)

    def test_plays_what_was_uploaded_at_the_gain(self):
        self.run.upload(100, 0, "00000000", length=60)
        self.run.event(110, 0, 1)
        self.run.event(140, 96, 5000)
        self.run.line(300, "erase", "motor", id=0, result=0)
        self.run.upload(301, 0, "00000a00")
        self.run.event(310, 0, 1)
        self.assertEqual(drive(self.run), [(110, 140, 1.0, "60 ms"), (140, 170, 0.5, "60 ms"),
                                           (310, 360, 0.5, "pattern 10")])

    def test_plays_sections_with_pauses(self):
        self.run.upload(100, 3, "00000200" "00640100" "00000032" "00327c00" "00000000")
        self.run.event(110, 3, 1)
        self.assertEqual(drive(self.run), [(110, 130, 1.0, "pattern 1"),
                                           (180, 480, 0.5, "pattern 124")])

    def test_ends_with_a_stop_an_erasing_a_closing_and_an_unplugging(self):
        for op, fields in (("event", {"type": 21, "code": 0, "value": 0, "result": 24}),
                           ("erase", {"id": 0, "result": 0}), ("close", {}), ("unplug", {})):
            with self.subTest(op):
                self.setUp()
                self.run.upload(100, 0, "00000000", length=500)
                self.run.event(110, 0, 1)
                self.run.line(130, op, "motor", **fields)
                self.assertEqual(drive(self.run), [(110, 130, 1.0, "500 ms")])

    def test_drops_what_was_never_uploaded(self):
        self.run.upload(100, "ENOSPC", "00000000", length=500)
        self.run.event(110, 0xFFFF, 1)
        self.assertEqual(drive(self.run), [])


class Rounds(unittest.TestCase):
    HOUR = 3_600_000  # ms

    def setUp(self):
        self.run = Directory(self)

    def drive(self):
        begun = time.process_time()
        stretches = run.read(self.run.path).stretches
        self.assertLess(time.process_time() - begun, 0.3)
        return stretches

    def parts(self, stretch, ms):
        """What is played at `ms` and next: (start ms, end ms, level, label)."""
        parts = dataclasses.replace(stretch, start=ms * 1000).parts()
        return [(one.start / 1000, one.end / 1000, one.level, one.label)
                for one in (next(parts), next(parts))]

    def test_of_an_hour_are_not_laid_out_one_by_one(self):
        # pattern 1 for 1 ms, pattern 41 at half the level for 2 ms, a pause of 2 ms, for ever
        self.run.upload(100, 0, "000002ff" "00640100" "00080000" "00000004"
                                "00322900" "00080002" "00000008")
        self.run.event(200, 0, 1)
        self.run.event(201.5 + self.HOUR, 96, 5000)
        self.run.event(200 + 2 * self.HOUR, 0, 0)
        first, after, hour, cut, gained = self.drive()
        self.assertEqual([(one.start, one.end) for one in (first, after, hour, cut, gained)], [
            (200_000, 201_000), (201_000, 203_000), (205_000, 3_600_201_500),
            (3_600_201_500, 3_600_203_000), (3_600_205_000, 7_200_198_000)])
        self.assertEqual([(one.level, one.label) for one in cut.parts()], [(0.25, "pattern 41")])
        self.assertEqual(self.parts(hour, 1_000_000.5), [(1_000_000.5, 1_000_001, 1.0, "pattern 1"),
                                                         (1_000_001, 1_000_003, 0.5, "pattern 41")])
        self.assertEqual(self.parts(gained, 7_000_002), [(7_000_002, 7_000_003, 0.25, "pattern 41"),
                                                         (7_000_005, 7_000_006, 0.5, "pattern 1")])
        self.assertIn(len(list(hour.parts(self.HOUR))), range(990, 1002))  # one a thousandth

    def test_that_a_client_asked_for_are_not_either(self):
        self.run.write(100, "cp_trigger_index", "65534\n")
        self.run.write(101, "cp_trigger_queue", "10.80, 10, 2000000000!\0")
        self.run.write(110, "activate", "1\n")
        self.run.write(1_000_115, "activate", "0\n")
        only, = self.drive()
        self.assertEqual((only.start, only.end), (110_000, 1_000_115_000))
        self.assertEqual(self.parts(only, 60_100), [(60_110, 60_160, 0.8, "pattern 10"),
                                                    (60_170, 60_220, 0.8, "pattern 10")])


class Legacy(unittest.TestCase):
    def test_runs_for_what_is_written(self):
        directory = Directory(self)
        node = "/sys/class/timed_output/vibrator/"
        directory.line(100, "write", node + "intensity", data="3400\n", result=5)
        directory.line(110, "write", node + "enable", data="70\n", result=3)
        directory.line(130, "write", node + "enable", data="0\n", result=2)
        self.assertEqual(drive(directory), [(110, 130, 0.34, "70 ms")])


if __name__ == "__main__":
    unittest.main()
