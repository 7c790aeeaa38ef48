# SPDX-License-Identifier: Apache-2.0
"""Bash completion of vibctl: what is offered where, in a shell that has sourced it."""

import os
import pathlib
import subprocess
import unittest

PROJECT = pathlib.Path(__file__).resolve().parent.parent.parent
VIBCTL = pathlib.Path(os.environ["QVX_BUILD"]) / "bin" / "vibctl"
COMPLETION = PROJECT / "vibctl" / "completion" / "vibctl.bash"

SCRIPT = """
set -u
. "$1"; shift
COMP_WORDS=("$@")
COMP_CWORD=$(($# - 1))
_vibctl
printf '%s\\n' "${COMPREPLY[@]}"
"""


def offered(*words):
    """What is offered for the last of these words, which follow the program's name."""
    result = subprocess.run(["bash", "-c", SCRIPT, "bash", COMPLETION, VIBCTL, *words],
                            capture_output=True, text=True, check=True)
    if result.stderr:
        raise AssertionError(result.stderr)
    return result.stdout.split()


class Completion(unittest.TestCase):
    def test_registers_itself_for_vibctl(self):
        result = subprocess.run(["bash", "-c", '. "$1"; complete -p vibctl', "bash", COMPLETION],
                                capture_output=True, text=True, check=True)
        self.assertEqual(result.stdout, "complete -F _vibctl vibctl\n")

    def test_offers_commands_first(self):
        self.assertEqual(offered(""), ["std", "ext", "info", "dump", "raw", "play", "session", "list",
                                       "doctor", "help"])
        self.assertEqual(offered("do"), ["doctor"])
        self.assertEqual(offered("dump", ""), ["std", "ext"])
        self.assertEqual(offered("raw", "e"), ["ext"])
        self.assertEqual(offered("help", ""), ["std", "ext"])
        self.assertEqual(offered("--json", "--wait", "3", "e"), ["ext"])

    def test_offers_options_anywhere(self):
        options = ["--json", "--timeout", "--wait", "--callback", "--off-on-interrupt",
                   "--amplitudes", "--repeat", "--explain", "--help", "--version"]
        self.assertEqual(offered("-"), options)
        self.assertEqual(offered("std", "on", "500", "--c"), ["--callback"])

    def test_offers_nothing_for_a_number_of_seconds(self):
        self.assertEqual(offered("--wait", ""), [])
        self.assertEqual(offered("--timeout", ""), [])

    def test_offers_the_methods_of_the_interface(self):
        self.assertEqual(offered("std", "setA"), ["setAmplitude"])
        self.assertEqual(offered("std", "compose"), ["compose", "composePwle"])
        self.assertEqual(offered("help", "std", "compose"), ["compose", "composePwle"])
        self.assertEqual(offered("ext", "--json", "setF"),
                         ["setForceTouchAmplitude", "setFrequencyType", "setFolderStatus",
                          "setFolderTentModeStatus"])
        self.assertEqual(len(offered("std", "")), 1 + 26)
        self.assertEqual(len(offered("ext", "")), 1 + 28)

    def test_offers_enumerators_of_the_argument_in_question(self):
        self.assertEqual(offered("std", "perform", "T"),
                         ["TICK", "THUD", "TEXTURE_TICK"])
        self.assertEqual(offered("std", "perform", "CLICK", ""), ["LIGHT", "MEDIUM", "STRONG"])
        self.assertEqual(offered("ext", "performFifoHapticEngine", "PATTERN_25"), ["PATTERN_25"])
        self.assertEqual(offered("std", "setExternalControl", ""), ["true", "false"])
        self.assertEqual(offered("ext", "performPrebakedHapticPattern", "5", "10000", "t"),
                         ["true"])

    def test_offers_nothing_where_there_is_no_choice(self):
        self.assertEqual(offered("std", "on", ""), [])
        self.assertEqual(offered("std", "off", ""), [])
        self.assertEqual(offered("std", "perform", "CLICK", "LIGHT", ""), [])
        self.assertEqual(offered("std", "perfrom", ""), [])
        self.assertEqual(offered("list", ""), [])


if __name__ == "__main__":
    unittest.main()
