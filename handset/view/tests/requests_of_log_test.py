# SPDX-License-Identifier: Apache-2.0
"""Requests found in the service's log."""

import unittest

import view_path  # noqa: F401
import requests_of_log
from run_files import Directory

MESSAGE = "V_2_0: Vibrator set amplitude: 0.5"


class Lines(unittest.TestCase):
    def test_are_read_in_each_form(self):
        for line, expected in (
                ("8122998 QvxVibrator-HAL-AIDL-CORE E 11-22 12:19:12   112   112 "
                 f"Vibrator.cpp:133] {MESSAGE}\n", (8122998, 44352.0, MESSAGE)),
                ("QvxVibrator-HAL-AIDL-CORE E 11-22 12:19:12   112   112 Vibrator.cpp:133] "
                 f"{MESSAGE}\n", (None, 44352.0, MESSAGE)),
                ("11-22 12:19:12.345   612   612 E QvxVibrator-HAL-AIDL-CORE: "
                 f"Vibrator.cpp:133] {MESSAGE}\n", (None, 44352.345, MESSAGE)),
                (f"11-22 12:19:12.345   612   612 E QvxVibrator-HAL-AIDL-CORE: {MESSAGE}\n",
                 (None, 44352.345, MESSAGE)),
                (f"E/QvxVibrator-HAL-AIDL-CORE(  612): {MESSAGE}\n", (None, None, MESSAGE))):
            self.assertEqual(requests_of_log.parse(line), expected, line)

    def test_of_others_are_none(self):
        self.assertIsNone(requests_of_log.parse("11-22 12:19:12.345  1  1 E zygote: hello\n"))


class Requests(unittest.TestCase):
    def of(self, *messages):
        directory = Directory(self)
        directory.text("service.log", "".join(
            f"{1000 + at} QvxVibrator-HAL-AIDL-CORE E 11-22 12:19:12   112   112 {message}\n"
            for at, message in enumerate(messages)))
        return requests_of_log.read(directory.path / "service.log")

    def test_have_the_arguments_that_were_logged(self):
        log = self.of("V_2_0: Vibrator perform Effect : 5 EffectStrength : 2",
                      "HW_API: amplitude: 10000", "V_2_0: [getQFactor]unsupported",
                      "V_4_0: performPrebakedHapticPattern 12 : 6700 : 1",
                      "V_4_0: setFolderStatus1",
                      "V_4_0: Vibrator perform Effect for QVX : 2 amplitude : 700")
        self.assertEqual([(one.us, one.method, one.arguments) for one in log.requests],
                         [(1000, "std perform", ["5", "2"]), (1002, "std getQFactor", []),
                          (1003, "ext performPrebakedHapticPattern", ["12", "6700", "1"]),
                          (1004, "ext setFolderStatus", ["1"]),
                          (1005, "ext perform", ["2", "700"])])

    def test_do_not_count_what_the_service_asks_itself(self):
        log = self.of("V_2_0: Vibrator compose : 1 size", "V_2_0: 1.100,",
                      "V_2_0: Vibrator getPrimitiveDuration ", " durationMs : 20",
                      " totaldelay : 0 totalDuration : 20",
                      "V_2_0: Vibrator getPrimitiveDuration ",
                      "V_2_0: Vibrator getSupportedAlwaysOnEffects ",
                      "V_2_0: getSupportedEffects", "V_2_0: getSupportedEffects")
        self.assertEqual([one.method for one in log.requests],
                         ["std compose", "std getPrimitiveDuration",
                          "std getSupportedAlwaysOnEffects", "std getSupportedEffects"])

    def test_end_with_callbacks(self):
        log = self.of("Starting compose on another thread", "Notifying compose complete")
        self.assertEqual(log.callbacks, [1001])


if __name__ == "__main__":
    unittest.main()
