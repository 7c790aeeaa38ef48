# SPDX-License-Identifier: Apache-2.0
"""Reading a run's directory: calls, answers, faults, and what is not to be read."""

import unittest

import view_path  # noqa: F401
import run
from run_files import LEDS, Directory

LOG = ("%sQvxVibrator-HAL-AIDL-CORE E 11-22 12:19:12   112   112 Vibrator.cpp:81] "
       "V_2_0: Vibrator on for timeoutMs: 500\n")


class Reading(unittest.TestCase):
    def setUp(self):
        self.directory = Directory(self)

    def read(self):
        return run.read(str(self.directory.path))

    def test_takes_calls_with_their_answers(self):
        self.directory.call(20, 5, "std on 30", exception=-5, uid=1000)
        self.directory.call(10, 2, "std compose 0,CLICK,1 --callback", callback=22.5)
        self.directory.call(40, 2, "std compose 0,CLICK,1 --callback", callback="timeout")
        found = self.read().requests
        self.assertEqual([one.describe() for one in found],
                         ["std compose 0,CLICK,1 --callback: ok", "std on 30: EX_ILLEGAL_STATE",
                          "std compose 0,CLICK,1 --callback: no callback"])
        self.assertEqual([(one.start, one.end, one.callback) for one in found],
                         [(10000, 12000, 32500), (20000, 25000, None), (40000, 42000, None)])
        self.assertEqual([one.client for one in found], ["uid 0", "uid 1000", "uid 0"])

    def test_takes_requests_from_the_log_where_no_calls_were_recorded(self):
        self.directory.text("service.log", LOG % "8122998 ")
        found, = self.read().requests
        self.assertEqual((found.start, found.describe()), (8122998, "std on 500"))

    def test_takes_no_request_from_a_log_without_the_clock(self):
        self.directory.text("service.log", LOG % "")
        self.assertEqual(self.read().requests, [])

    def test_marks_failures_faults_and_hangs(self):
        self.directory.write(10, "state", "1\n", result="EIO", fault={"errno": "EIO"}, took=40)
        self.directory.write(500, "state", "1\n", fault={"delay": 300}, took=300_040)
        self.directory.write(600, "cp_trigger_queue", "5.100", fault={"short": 3}, result=3)
        self.directory.line(700, "open", LEDS + "duration", flags="O_RDWR", error="EACCES")
        self.directory.line(800, "unplug", "motor")
        self.directory.write(900, "state", "1\n")
        self.assertEqual([(op.name, text) for op, text in self.read().marks],
                         [("state", "write EIO"), ("state", "held 300 ms"),
                          ("cp_trigger_queue", "took 3 bytes"), ("duration", "open EACCES"),
                          ("motor", "unplugged")])

    def test_begins_when_the_first_operation_did(self):
        self.directory.write(500, "state", "1\n", took=300_000)
        self.assertEqual(self.read().start, 200_000)

    def test_passes_over_a_line_under_way(self):
        self.directory.write(10, "state", "1\n")
        with open(self.directory.path / "journal.jsonl", "a", encoding="utf-8") as journal:
            journal.write('{"n":2,"us":12')
        self.assertEqual(len(self.read().ops), 1)

    def test_names_the_line_that_is_none(self):
        self.directory.text("journal.jsonl", '{"n":1,"us":5,"op":"plug","node":"motor"}\n{"n":2}\n')
        with self.assertRaisesRegex(run.Unreadable, r"journal\.jsonl:2: no journal line: 'us'"):
            self.read()

    def test_names_the_line_whose_values_are_of_another_kind(self):
        for line, reason in (('{"us":"5","op":"plug"}', "us is '5'"),
                             ('{"us":5,"op":"write","node":"n"}', "'data'"),
                             ('{"us":5,"op":"upload","custom_hex":"0"}', "non-hexadecimal"),
                             ('{"us":5,"op":"event","code":"a","value":1}', "code is 'a'"),
                             ('[]', "list indices")):
            with self.subTest(line=line):
                self.directory.text("journal.jsonl", line + "\n")
                with self.assertRaisesRegex(run.Unreadable, "journal.jsonl:1: no journal line: .*"
                                            + reason):
                    self.read()

    def test_names_the_call_that_is_none(self):
        for call in (b'{"us":5,"call":["std","on"],"answer":\x9b}', b'{"us":5}', b'[]',
                     b'{"us":5,"call":["std"],"answer":{}}', b'{"us":5,"call":"std","answer":{}}',
                     b'{"us":5,"uid":0,"call":["std","on"],"answer":{"callback":Infinity}}'):
            with self.subTest(call=call):
                (self.directory.path / "calls.jsonl").write_bytes(call + b"\n")
                with self.assertRaisesRegex(run.Unreadable, r"calls\.jsonl:1: no call: "):
                    self.read()

    def test_wants_a_journal(self):
        (self.directory.path / "journal.jsonl").unlink()
        with self.assertRaisesRegex(run.Unreadable, "no journal.jsonl there"):
            self.read()

    def test_of_an_empty_journal_gives_an_empty_run(self):
        found = self.read()
        self.assertEqual((found.ops, found.requests, found.stretches), ([], [], []))


if __name__ == "__main__":
    unittest.main()
