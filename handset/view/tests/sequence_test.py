# SPDX-License-Identifier: Apache-2.0
"""Runs and logs as sequences of calls."""

import unittest

import view_path  # noqa: F401
import sequence
from run_files import Directory

PHONE = "11-22 23:59:59.%03d   612   612 E QvxVibrator-HAL-AIDL-CORE: %s\n"


class Sequence(unittest.TestCase):
    def setUp(self):
        self.directory = Directory(self)

    def of_log(self, *messages):
        path = self.directory.path / "report.txt"
        path.write_text("".join(PHONE % (100 + at, message) for at, message in enumerate(messages)),
                        "utf-8")
        return sequence.of(path)

    def calls_of_log(self, *messages):
        return [" ".join([call["iface"], call["method"], *call["args"],
                          *["--callback"] * call.get("callback", False)])
                for call in self.of_log(*messages)[0]]

    def test_of_recorded_calls_has_their_times_and_callers(self):
        self.directory.call(20.5, 3, "std off", uid=1000)
        self.directory.call(10, 2, "std perform TICK STRONG")
        calls, left_out = sequence.of(self.directory.path)
        self.assertEqual([sequence.line(call) for call in calls], [
            '{"at":0.0,"uid":0,"iface":"std","method":"perform","args":["TICK","STRONG"]}\n',
            '{"at":10.5,"uid":1000,"iface":"std","method":"off","args":[]}\n'])
        self.assertEqual(left_out, [])

    def test_of_a_phone_s_log_says_what_is_not_told(self):
        calls, left_out = self.of_log("V_2_0: Vibrator on for timeoutMs: 30",
                                      "Not support on() callback",
                                      "V_2_0: Vibrator getPrimitiveDuration ",
                                      "Vibrator set external control: 1")
        self.assertEqual(calls, [
            {"at": 0, "iface": "std", "method": "on", "args": ["30"], "callback": True},
            {"at": 3, "iface": "std", "method": "setExternalControl", "args": ["true"]}])
        self.assertEqual(left_out, [
            "who called; the service does not log it",
            "std getPrimitiveDuration at 0.002 s: its arguments are not logged"])

    def test_of_a_composition_finds_its_primitives(self):
        self.assertEqual(self.calls_of_log(
            "V_2_0: Vibrator compose : 2 size", "V_2_0: Effect cmd : 1.100,50,124.50,20,",
            "Notifying compose complete"),
            ["std compose 0,CLICK,1 50,THUD,0.5 20,NOOP,0 --callback"])
        self.assertEqual(self.calls_of_log(
            "V_2_0: Vibrator compose : 2 size", "V_2_0: Effect cmd : 30,10.10000,135.2500,",
            "V_2_0: Effect cmd : 30,10.10000,135.2500,0"),
            ["std compose 30,CLICK,1 0,LOW_TICK,0.25"])

    def test_of_packets_and_queues_repeats_their_values(self):
        self.assertEqual(self.calls_of_log(
            "V_4_0: performHapticEngine", "V_4_0: performHapticEngine : 4 7 5000 2050 0",
            "V_4_0: performHybridHapticEngine",
            "V_4_0: performHybridHapticEngine : 8 5 5000 #3 170 9 100 2 171",
            "V_4_0: performPlaybackEngine", "V_4_0: performPlaybackEngine repeat : 1",
            "V_4_0: performPlaybackEngine repeatCnt : 2",
            "V_4_0: Packet data with repeat option : 5.100,7.80,-3,2!",
            "V_4_0: performFifoHapticEngine",
            "HW_API: >> writeNode node:/leds/vibrator/fifo val:7",
            "V_4_0: performPrebakedHapticPattern 5 : 10000 : 0"),
            ["ext performHapticEngine 10000 7,5000,2050,0",
             "ext performHybridHapticEngine 10000 5,5000,1,3,170 9,100,0,2,171",
             "ext performPlaybackEngine true 2 5,100,0 7,80,-3", "ext performFifoHapticEngine 7",
             "ext performPrebakedHapticPattern 5 10000 false"])

    def test_goes_on_past_midnight(self):
        path = self.directory.path / "report.txt"
        line = "11-2%d %s.000 1 1 E QvxVibrator-HAL-AIDL-CORE: V_2_0: Vibrator off\n"
        path.write_text(line % (2, "23:59:59") + line % (3, "00:00:01"), "utf-8")
        self.assertEqual([call["at"] for call in sequence.of(path)[0]], [0, 2000])

    def test_needs_a_line_of_the_service(self):
        with self.assertRaisesRegex(sequence.run.Unreadable, "no line of the vibrator service"):
            self.of_log()


if __name__ == "__main__":
    unittest.main()
