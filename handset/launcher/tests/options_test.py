# SPDX-License-Identifier: Apache-2.0
"""Wrong usage of handset/run and handset/shell: one line, status 2, nothing started."""

import os
import subprocess
import tempfile
import unittest

from launcher_path import BUILD_MODULE, PREPARE_GUEST, PROJECT, RUN, SHELL

ELF_AMD64 = b"\x7fELF\x02\x01\x01" + bytes(9) + b"\x02\x00\x3e\x00"
ELF_ARM64 = b"\x7fELF\x02\x01\x01" + bytes(9) + b"\x02\x00\xb7\x00"


class Options(unittest.TestCase):
    def setUp(self):
        scratch = tempfile.TemporaryDirectory()
        self.addCleanup(scratch.cleanup)
        self.scratch = os.path.realpath(scratch.name)
        self.build = self.make_build(ELF_AMD64)

    def make_build(self, agent, with_phone=True):
        build = tempfile.mkdtemp(dir=self.scratch)
        os.mkdir(os.path.join(build, "bin"))
        for name in ["handset-agent"] + ["phone"] * with_phone:
            with open(os.path.join(build, "bin", name), "wb") as file:
                file.write(agent)
        return build

    def refused(self, *words, program=RUN, directory=None, environment=None):
        """The one line on standard error."""
        done = subprocess.run([program, *words], cwd=directory or self.scratch, text=True,
                              stdin=subprocess.DEVNULL, capture_output=True, timeout=60,
                              env=environment, check=False)
        self.assertEqual(done.returncode, 2, done.stderr)
        self.assertEqual(done.stdout, "")
        self.assertEqual(done.stderr.count("\n"), 1, done.stderr)
        return done.stderr.rstrip("\n")

    def test_no_command(self):
        for words in ([], ["--"], ["true"], ["--profile", "off"]):
            self.assertEqual(self.refused(*words),
                             "handset/run: no command given; put it after '--'")

    def test_unknown_option(self):
        self.assertEqual(self.refused("--bogus", "--", "true"),
                         "handset/run: unrecognized arguments: --bogus; accepted: --arch, --build, "
                         "--counted, --driver, --help, --memory, --out, --picture, --profile, "
                         "--smp, --timeout, --timing, --trace, --verbose")

    def test_abbreviated_option_is_unknown(self):
        self.assertIn("handset/run: unrecognized arguments: --prof off; accepted: ",
                      self.refused("--prof", "off", "--", "true"))

    def test_word_that_is_no_text_is_told_in_one_line(self):
        self.assertIn("handset/run: no profile 'a\\nb\\x1b': use ",
                      self.refused("--profile", "a\nb\x1b", "--", "true"))

    def test_empty_path(self):
        for option in ("--out", "--build", "--timing", "--picture", "--trace"):
            self.assertEqual(self.refused(option, "", "--", "true"),
                             f"handset/run: argument {option}: '' is no path")

    def test_unknown_architecture(self):
        self.assertEqual(self.refused("--arch", "mips", "--", "true"),
                         "handset/run: unknown architecture 'mips': use amd64 or arm64")

    def test_unknown_driver(self):
        self.assertEqual(self.refused("--driver", "real", "--", "true"),
                         "handset/run: unknown driver 'real': use simulated or kernel")

    def test_unknown_profile_names_the_built_in_ones(self):
        refusal = self.refused("--profile", "nope", "--", "true")
        beginning, end = "handset/run: no profile 'nope': use ", ", off, or a file"
        self.assertTrue(refusal.startswith(beginning) and refusal.endswith(end), refusal)
        named = refusal[len(beginning):-len(end)].split(", ")
        self.assertEqual(named, sorted(named))
        self.assertLessEqual({"ff", "leds", "leds-haptic-engine", "legacy", "legacy-none", "none"},
                             set(named))
        self.assertNotIn("profile.schema", named)

    def test_profile_that_is_a_directory(self):
        self.assertIn("no profile '/etc':", self.refused("--profile", "/etc", "--", "true"))

    def test_missing_build_says_how_to_build(self):
        build = os.path.join(PROJECT, "build", "no-such")
        self.assertEqual(self.refused("--build", build, "--profile", "off", "--", "true"),
                         f"handset/run: no handset-agent in {build}/bin; build it with: "
                         "cmake --preset no-such && cmake --build --preset no-such")

    def test_build_without_phone(self):
        build = self.make_build(ELF_AMD64, with_phone=False)
        self.assertEqual(self.refused("--build", build, "--", "true"),
                         f"handset/run: no phone in {build}/bin; build it with: "
                         "cmake --preset release && cmake --build --preset release")

    def test_build_for_the_other_architecture(self):
        build = self.make_build(ELF_ARM64)
        self.assertEqual(self.refused("--build", build, "--", "true"),
                         f"handset/run: {build} is built for arm64, not for amd64: give "
                         "--arch arm64, or with --build the directory of an amd64 build")
        self.assertEqual(self.refused("--arch", "arm64", "--build", self.build, "--", "true"),
                         f"handset/run: {self.build} is built for amd64, not for arm64: give "
                         "--arch amd64, or with --build the directory of an arm64 build")

    def test_truncated_agent_is_not_built_for_any(self):
        build = self.make_build(b"")
        self.assertEqual(self.refused("--build", build, "--", "true"),
                         f"handset/run: {build}/bin/handset-agent is no program for amd64; build "
                         "it with: cmake --preset release && cmake --build --preset release")

    def test_timeout_must_be_above_zero(self):
        for text in ("0", "-1", "soon", "nan", "inf", ""):
            self.assertEqual(
                self.refused("--timeout", text, "--", "true").replace("=", " "),
                f"handset/run: argument --timeout: '{text}' is not a number above 0"
                if text != "-1" else
                "handset/run: argument --timeout: '-1' is not a number above 0")

    def test_memory_and_processors_have_a_range(self):
        for option, range_, texts in (("--memory", "128 to 65536", ("0", "127", "65537", "many")),
                                      ("--smp", "1 to 8", ("0", "9", "1.5", "9" * 30, ""))):
            for text in texts:
                self.assertEqual(self.refused(option, text, "--", "true"),
                                 f"handset/run: argument {option}: '{text}' is not a whole number "
                                 f"from {range_}")

    def test_option_without_its_value(self):
        self.assertEqual(self.refused("--out", "--", "true"),
                         "handset/run: argument --out: expected one argument")

    def test_out_below_a_file(self):
        with open(os.path.join(self.scratch, "file"), "wb"):
            pass
        self.assertEqual(
            self.refused("--build", self.build, "--out", "file/x", "--", "true"),
            f"handset/run: --out {self.scratch}/file/x: Not a directory")

    def test_drawing_that_cannot_be_made(self):
        for words, said in (
                (("--picture", "no/a.svg"), "--picture no/a.svg: its directory does not exist"),
                (("--trace", "no/a.json"), "--trace no/a.json: its directory does not exist"),
                (("--trace", "."), "--trace .: a directory is there; give a file"),
                (("--timing", "."), "--timing .: a directory is there; give a file"),
                (("--picture", "a.gif"),
                 "--picture a.gif: a picture's name ends in .svg or .png")):
            self.assertEqual(self.refused("--build", self.build, *words, "--", "true"),
                             f"handset/run: {said}")

    def test_timing_in_a_missing_directory(self):
        self.assertEqual(
            self.refused("--build", self.build, "--timing", "no/t.json", "--", "true"),
            "handset/run: --timing no/t.json: its directory does not exist")

    def test_directory_the_guest_cannot_see(self):
        self.assertEqual(
            self.refused("--build", self.build, "--", "true", directory="/dev/shm"),
            "handset/run: the guest cannot see /dev/shm: "
            "it has its own /dev, /proc, /run and /sys")

    def test_missing_emulator(self):
        self.assertEqual(
            self.refused("--build", self.build, "--profile", "off", "--", "true",
                         environment={"PATH": "/nowhere"}),
            "handset/run: qemu-system-x86_64 is not installed: "
            "scripts/install-packages installs qemu-system-x86")

    def test_shell_needs_a_terminal(self):
        self.assertEqual(
            self.refused("--build", self.build, program=SHELL),
            "handset/shell: needs a terminal; for a script use handset/run")

    def test_joining_takes_no_other_option(self):
        self.assertEqual(self.refused("--join", "7", "--profile", "ff", program=SHELL),
                         "handset/shell: --join takes no other option")

    def test_shell_takes_no_command(self):
        self.assertEqual(self.refused("ls", program=SHELL),
                         "handset/shell: unrecognized arguments: ls; accepted: --arch, --build, "
                         "--counted, --driver, --help, --join, --memory, --out, --profile, --smp, "
                         "--timeout, --timing, --verbose")

    def test_preparations_refuse_other_words_and_unknown_architectures(self):
        for program, name in ((PREPARE_GUEST, "prepare-guest"), (BUILD_MODULE, "build-module")):
            self.assertEqual(self.refused("now", program=program),
                             f"{name}: unrecognized arguments: now; accepted: --arch, --help")
            self.assertEqual(self.refused("--arch", "mips", program=program),
                             f"{name}: unknown architecture 'mips': use amd64 or arm64")

    def test_help_goes_to_standard_output(self):
        for program, usage in ((RUN, "usage: handset/run [options] -- COMMAND..."),
                               (SHELL, "usage: handset/shell ")):
            done = subprocess.run([program, "--help"], text=True, capture_output=True, timeout=60,
                                  check=False)
            self.assertEqual(done.returncode, 0)
            self.assertEqual(done.stderr, "")
            self.assertTrue(done.stdout.startswith(usage), done.stdout)


if __name__ == "__main__":
    unittest.main()
