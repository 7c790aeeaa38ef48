# SPDX-License-Identifier: Apache-2.0
"""What the project's commands say when they are asked for help or used wrongly. None of it starts
anything: a command that did would show a step."""

import pathlib
import re
import subprocess
import unittest

PROJECT = pathlib.Path(__file__).resolve().parent.parent.parent


def run(*words):
    done = subprocess.run([PROJECT / words[0], *words[1:]], stdin=subprocess.DEVNULL, text=True,
                          capture_output=True, timeout=60, check=False)
    return done.returncode, done.stdout, done.stderr


class Help(unittest.TestCase):
    def test_begins_with_the_usage_and_starts_nothing(self):
        for command in ("demo", "check", "bench/run", "fuzz/run", "tests/mutation/run",
                        "tests/soak/run"):
            for option in ("--help", "-h"):
                with self.subTest(command=command, option=option):
                    status, output, errors = run(command, option)
                    self.assertEqual((status, errors), (0, ""))
                    self.assertTrue(output.startswith("usage: "), output)
                    self.assertIn(command, output.splitlines()[0])
                    self.assertNotRegex(output, "(?m)^-- ")

    def test_of_check_names_both_ways(self):
        self.assertIn("--all", run("check", "--help")[1])


class WrongUsage(unittest.TestCase):
    def test_is_one_line_with_what_is_accepted_and_status_2(self):
        for words, line in (
                (["demo", "now"], "demo: unknown argument 'now'; it takes none but --help"),
                (["check", "-j4"], "check: unknown argument '-j4'; "
                                   "it takes --all, -R, -E and -L with a REGEX, --help"),
                (["check", "-R"], "check: -R needs a regular expression"),
                (["check", "-E", ""], "check: -E needs a regular expression"),
                (["check", "-R", "("], "check: -R '(': no regular expression"),
                (["check", "-R", "*"], "check: -R '*': no regular expression"),
                (["check", "a\nb\x1b"], "check: unknown argument 'a?b?'; "
                                        "it takes --all, -R, -E and -L with a REGEX, --help"),
                ([".ci/run", "now"], "check: unknown argument 'now'; "
                                     "it takes --all, -R, -E and -L with a REGEX, --help"),
                (["bench/run", "-x"], "bench/run: unknown argument '-x'; accepted: --write, --help"),
                (["fuzz/run"], "fuzz/run: no fuzzer given; it takes a fuzzer (...) "
                               "and a number of executions, or --all MINUTES"),
                (["fuzz/run", ""], "fuzz/run: no fuzzer ''; it takes a fuzzer (...) "
                                   "and a number of executions, or --all MINUTES"),
                (["fuzz/run", "--all", "0"], "fuzz/run: '0' is no number above 0; it takes a "
                                             "fuzzer (...) and a number of "
                                             "executions, or --all MINUTES"),
                (["tests/mutation/run", "--mutants", "0"],
                 "tests/mutation/run: argument --mutants: '0' is no number above 0; it takes files "
                 "below hal-server/vibrator/aidl/default and --mutants N, --jobs N, --help"),
                (["tests/mutation/run", "README.md"],
                 "tests/mutation/run: argument FILE: 'README.md' is no source of the service; it "
                 "takes files below hal-server/vibrator/aidl/default and --mutants N, --jobs N, "
                 "--help"),
                (["tests/soak/run"],
                 "tests/soak/run: no minutes given; it takes MINUTES, --attack, "
                 "--arch amd64 or arm64, --smp N and --service asan or tsan"),
                (["tests/soak/run", "1", "2"],
                 "tests/soak/run: minutes given twice, '1' and '2'; it takes MINUTES, --attack, "
                 "--arch amd64 or arm64, --smp N and --service asan or tsan"),
                (["tests/soak/run", "1", "--arch", "mips"],
                 "tests/soak/run: wrong argument '--arch'; it takes MINUTES, --attack, "
                 "--arch amd64 or arm64, --smp N and --service asan or tsan"),
                (["scripts/install-packages", "-y"],
                 "install-packages: wrong arguments '-y'; it takes none or --all")):
            with self.subTest(words=words):
                status, output, errors = run(*words)
                self.assertEqual((status, output), (2, ""))
                self.assertEqual(re.sub(r"fuzzer \([a-z_ ]+\)", "fuzzer (...)", errors), line + "\n")


class Packages(unittest.TestCase):
    def test_of_the_foreign_architecture_are_not_for_everybody(self):
        lists = {name: (PROJECT / "scripts" / name).read_text("ascii").split("\n")
                 for name in ("packages.txt", "packages-all.txt")}
        self.assertEqual([line for line in lists["packages.txt"]
                          if line.endswith(":arm64") or "aarch64" in line], [])
        self.assertIn("libc6:arm64", lists["packages-all.txt"])


if __name__ == "__main__":
    unittest.main()
