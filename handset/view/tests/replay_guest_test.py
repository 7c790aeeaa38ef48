# SPDX-License-Identifier: Apache-2.0
"""A run of the handset, replayed: the calls that it left are played on another phone, by the users who
made them, and the driver is told the same."""

import json
import os
import pathlib
import subprocess
import tempfile
import unittest

from view_path import HANDSET

SESSION = """
vibctl std on 60
vibctl std perform TICK STRONG
phone exec --user 1000 -- vibctl ext performHapticEngine 10000 30,10000,2050,0
phone exec --user 2000 -- vibctl ext performHapticEngine 10000 30,10000,2050,0
vibctl std compose 0,CLICK,1.0 80,THUD,0.5
phone exec --user 1000 -- vibctl std off
"""


def lines(path):
    return [json.loads(line) for line in path.read_text("utf-8").splitlines()]


class Replay(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        made = tempfile.TemporaryDirectory(prefix="replay-", dir="/var/tmp")
        cls.addClassCleanup(made.cleanup)
        cls.directory = pathlib.Path(made.name)
        cls.run_in_guest("first", "sh", "-c", SESSION)
        done = subprocess.run([HANDSET / "replay", cls.directory / "first"], capture_output=True,
                              text=True, check=True)
        (cls.directory / "calls.jsonl").write_text(done.stdout, "utf-8")
        cls.played = cls.run_in_guest("second", "sh", "-c", "vibctl play - <calls.jsonl")

    @classmethod
    def run_in_guest(cls, out, *command, status=0):
        done = subprocess.run([HANDSET / "run", "--build", os.environ["HANDSET_BUILD"], "--profile",
                               "leds", "--out", cls.directory / out, "--", *command],
                              cwd=cls.directory, capture_output=True, text=True,
                              stdin=subprocess.DEVNULL, timeout=280, check=False)
        if done.returncode != status:
            raise AssertionError(done.stdout + done.stderr)
        return done

    def seen(self, out):
        return [(line["node"], line["data"]) for line in lines(self.directory / out / "journal.jsonl")
                if line["op"] == "write"]

    def calls(self, out):
        return [(line["uid"], line["call"], line["answer"]["exception"])
                for line in lines(self.directory / out / "calls.jsonl")]

    def test_writes_what_the_run_wrote(self):
        self.assertGreater(len(self.seen("first")), 10)
        self.assertEqual(self.seen("second"), self.seen("first"))

    def test_calls_as_the_users_who_called(self):
        self.assertEqual([uid for uid, _, _ in self.calls("first")], [0, 0, 1000, 2000, 0, 1000])
        # User 2000 is answered as if the phone had no haptic engine, and the driver hears nothing.
        self.assertEqual(self.calls("second"), self.calls("first"))

    def test_keeps_the_times(self):
        at = [call["at"] for call in lines(self.directory / "calls.jsonl")]
        began = [line["us"] / 1000 for line in lines(self.directory / "second" / "calls.jsonl")]
        for wanted, was in zip(at, began, strict=True):
            self.assertGreaterEqual(was - began[0], wanted - at[0] - 20)
        self.assertEqual(self.played.stdout.count(" ms late: "), 6)

    def test_as_others_takes_root(self):
        done = self.run_in_guest("third", "sh", "-c", "phone exec --user 1000 -- vibctl play - "
                                 "<calls.jsonl", status=2)
        self.assertEqual(done.stderr, "vibctl: play: uid: user 1000 cannot call as user 0; play it as "
                                      "root, or leave uid out\n")


if __name__ == "__main__":
    unittest.main()
