# SPDX-License-Identifier: Apache-2.0
"""handset/run: what a command finds in the guest and what comes back from it."""

import json
import os
import shutil
import subprocess
import tempfile
import unittest

from handset_command import ARCH, BUILD, handset
from launcher_path import PROJECT, RUN

MACHINE = {"amd64": "x86_64", "arm64": "aarch64"}[ARCH]

SCRIPT = r"""
ask() { echo "== $1"; shift; "$@" 2>&1; }
printf 'to standard error\n' >&2
ask machine uname -m
ask user id -u
ask directory pwd
ask path sh -c 'echo "$PATH" | cut -d: -f1'
ask out sh -c 'echo "$OUT"'
ask names sh -c 'env | cut -d= -f1 | grep -v -e PWD -e SHLVL -e ^_ | sort | tr "\n" " "'
ask gtest sh -c 'echo "$GTEST_FILTER"'
ask devices sh -c 'for node in binder hwbinder vndbinder; do stat -c "%a %F" /dev/$node; done'
ask fuse sh -c 'test -c /dev/fuse && test -c /dev/cuse && echo there'
ask project head -n 1 "$PROJECT/handset/guest/init"
ask write sh -c 'echo x > "$PROJECT/written-in-the-guest" && echo done'
ask temporary sh -c 'ls -A /tmp | wc -l'
ask log sh -c 'dmesg | grep -c "Linux version"'
ask clock sh -c 'test $(date +%s) -gt 1600000000 && echo set'
ask input md5sum
printf 'x\000\377y' > "$OUT/bytes"
mkdir "$OUT/directory"
(sleep 1000 &)
exit 7
"""

INPUT = bytes(range(256)) * 2000  # more than the launcher sends ahead


class OneSession(unittest.TestCase):
    """One boot with --profile off, looked at from all sides."""

    @classmethod
    def setUpClass(cls):
        cls.out = tempfile.mkdtemp(prefix="handset-test-", dir="/var/tmp")
        cls.addClassCleanup(shutil.rmtree, cls.out)
        cls.before = set(os.listdir(tempfile.gettempdir()))
        with tempfile.TemporaryFile() as file:
            file.write(INPUT)
            file.seek(0)
            cls.done = handset(
                "--profile", "off", "--out", "out/put", "--timing", "timing.json", "--",
                "env", f"PROJECT={PROJECT}", "sh", "-c", SCRIPT,
                cwd=cls.out, stdin=file,
                env={**os.environ, "GTEST_FILTER": "Some.*", "UNRELATED": "x"})
        cls.answers = {}
        for block in cls.done.stdout.decode().split("== ")[1:]:
            name, _, text = block.partition("\n")
            cls.answers[name] = text

    def assert_answer(self, name, text):
        self.assertEqual(self.answers.get(name), text, self.done)

    def read(self, *path):
        with open(os.path.join(self.out, *path), "rb") as file:
            return file.read()

    def test_exit_status_is_the_commands(self):
        self.assertEqual(self.done.returncode, 7, self.done)

    def test_standard_error_is_the_commands_alone(self):
        self.assertEqual(self.done.stderr, b"to standard error\n")

    def test_machine_is_the_asked_one(self):
        self.assert_answer("machine", MACHINE + "\n")

    def test_user_is_root(self):
        self.assert_answer("user", "0\n")

    def test_directory_is_the_callers(self):
        self.assert_answer("directory", self.out + "\n")

    def test_path_starts_with_the_build(self):
        self.assert_answer("path", f"{BUILD}/bin\n")

    def test_out_is_named(self):
        self.assert_answer("out", "/run/handset/out\n")

    def test_environment_is_small_and_known(self):
        names = "GTEST_FILTER HOME LANG OUT PATH PROJECT USER "
        terminal = "".join(name + " " for name in ("TERM", "TZ") if name in os.environ)
        self.assertEqual(sorted(self.answers["names"].split()),
                         sorted((names + terminal).split()))

    def test_test_filter_is_passed_on(self):
        self.assert_answer("gtest", "Some.*\n")

    def test_binder_devices_are_open_to_everyone(self):
        self.assert_answer("devices", "666 character special file\n" * 3)

    def test_fuse_and_cuse_are_there(self):
        self.assert_answer("fuse", "there\n")

    def test_project_is_seen_under_its_path(self):
        self.assert_answer("project", "#!/layer/usr/bin/sh\n")

    def test_writing_to_the_project_stays_in_the_guest(self):
        self.assert_answer("write", "done\n")
        self.assertFalse(os.path.exists(os.path.join(PROJECT, "written-in-the-guest")))

    def test_temporary_directory_is_empty(self):
        if BUILD.startswith("/tmp/") or PROJECT.startswith("/tmp/"):
            self.skipTest("the build lies in /tmp, which the guest therefore sees")
        self.assert_answer("temporary", "0\n")

    def test_kernel_log_can_be_read(self):
        self.assert_answer("log", "1\n")

    def test_clock_is_set(self):
        self.assert_answer("clock", "set\n")

    def test_input_reaches_the_command_whole(self):
        self.assert_answer("input", "6ea2d0c7b39a74bcd86933bda2b46bb4  -\n")

    def test_what_the_command_left_in_out_is_outside(self):
        self.assertEqual(self.read("out", "put", "bytes"), b"x\0\377y")
        self.assertTrue(os.path.isdir(os.path.join(self.out, "out", "put", "directory")))

    def test_kernel_log_is_left_in_out(self):
        log = self.read("out", "put", "kernel.log")
        self.assertRegex(log, rb"\A\[ +0\.0+\] .*\n")
        self.assertIn(b"Linux version 6.", log)
        self.assertTrue(log.endswith(b"\n"))

    def test_timing_names_the_phases(self):
        seconds = json.loads(self.read("timing.json"))
        self.assertEqual(sorted(seconds), ["boot", "command", "preparation"])
        self.assertGreater(seconds["boot"], 0.5)

    def test_nothing_is_left_in_the_temporary_directory(self):
        ours = [name for name in set(os.listdir(tempfile.gettempdir())) - self.before
                if name.startswith("handset") and not name.startswith("handset-test-")]
        self.assertEqual(ours, [])


class Counted(unittest.TestCase):
    def test_nanosecond_is_an_instruction(self):
        done = handset("--counted", "--profile", "off", "--", "dmesg")
        self.assertEqual(done.returncode, 0, done)
        if ARCH == "amd64":  # whose kernel measures how fast the processor counts
            self.assertRegex(done.stdout, rb"tsc: Detected (999\.9|1000\.0)\d\d MHz processor")


class Output(unittest.TestCase):
    def test_every_byte_of_both_streams_arrives_in_order(self):
        one, other = os.urandom(3_000_000), os.urandom(2_000_000)
        with tempfile.TemporaryDirectory(dir="/var/tmp") as directory:
            for name, content in (("one", one), ("other", other)):
                with open(os.path.join(directory, name), "wb") as file:
                    file.write(content)
            done = handset("--profile", "off", "--", "sh", "-c", "cat one & cat other >&2; wait",
                           cwd=directory)
        self.assertEqual(done.returncode, 0)
        self.assertTrue(done.stdout == one, f"{len(done.stdout)} bytes")
        self.assertTrue(done.stderr == other, f"{len(done.stderr)} bytes")

    def test_reader_that_has_enough_ends_the_guest(self):
        done = subprocess.run(
            ["sh", "-c", f"{RUN} --arch {ARCH} --build {BUILD} --profile off -- yes | head -n 1; "
             "echo end"],
            stdin=subprocess.DEVNULL, capture_output=True, timeout=120, check=False)
        self.assertEqual(done.stdout, b"y\nend\n")
        self.assertEqual(done.stderr, b"")


class BuildInTheTemporaryDirectory(unittest.TestCase):
    def test_is_seen_and_its_path_may_hold_spaces_and_commas(self):
        with tempfile.TemporaryDirectory(dir="/tmp") as scratch:
            build = os.path.join(scratch, "my, build")
            os.makedirs(os.path.join(build, "bin"))
            shutil.copy(os.path.join(BUILD, "bin", "handset-agent"), os.path.join(build, "bin"))
            done = subprocess.run(
                [RUN, "--arch", ARCH, "--build", build, "--profile", "off", "--out", "a, b",
                 "--", "sh", "-c", "pwd; echo here > $OUT/file"], cwd=scratch,
                stdin=subprocess.DEVNULL, capture_output=True, timeout=120, check=False)
            self.assertEqual(done.stdout.decode(), scratch + "\n", done)
            with open(os.path.join(scratch, "a, b", "file"), encoding="ascii") as file:
                self.assertEqual(file.read(), "here\n")


class Phone(unittest.TestCase):
    """The default phone around a command."""

    @classmethod
    def setUpClass(cls):
        cls.directory = tempfile.mkdtemp(prefix="handset-test-", dir="/var/tmp")
        cls.addClassCleanup(shutil.rmtree, cls.directory)
        with open(os.path.join(PROJECT, "handset", "profiles", "leds.json"), "rb") as built_in:
            with open(os.path.join(cls.directory, "mine.json"), "wb") as file:
                file.write(built_in.read())
        cls.done = handset("--profile", "mine.json", "--out", "out", "--timing", "timing.json",
                           "--picture", "run.svg", "--trace", "run.json",
                           "--", "sh", "-c", "phone status; ls /sys/class/leds/vibrator; exit 9",
                           cwd=cls.directory)

    def test_is_up_while_the_command_runs(self):
        self.assertIn(b"phone is up", self.done.stdout)

    def test_shows_its_nodes_to_the_command(self):
        self.assertIn(b"\nduration\n", self.done.stdout)

    def test_without_a_journal_cannot_be_drawn_and_says_so_with_its_status(self):
        done = handset("--profile", "off", "--trace", "none.json", "--", "true",
                       cwd=self.directory)
        self.assertEqual(done.returncode, 2, done)
        self.assertIn(b"no journal.jsonl there", done.stderr)

    def test_does_not_change_the_commands_status(self):
        self.assertEqual(self.done.returncode, 9, self.done)

    def test_leaves_journal_and_log(self):
        names = os.listdir(os.path.join(self.directory, "out"))
        for name in ("journal.jsonl", "kernel.log", "service.log"):
            self.assertIn(name, names)

    def test_is_drawn_and_traced(self):
        with open(os.path.join(self.directory, "run.svg"), encoding="utf-8") as file:
            self.assertIn(">drive<", file.read())
        with open(os.path.join(self.directory, "run.json"), encoding="utf-8") as file:
            self.assertIn("traceEvents", json.load(file))

    def test_is_timed(self):
        with open(os.path.join(self.directory, "timing.json"), encoding="ascii") as file:
            self.assertEqual(sorted(json.load(file)),
                             ["boot", "command", "phone_down", "phone_up", "preparation"])

    def test_refused_profile_is_one_line_and_the_phones_status(self):
        with open(os.path.join(self.directory, "bad.json"), "w", encoding="ascii") as file:
            file.write("{ not json")
        done = handset("--profile", "bad.json", "--", "true", cwd=self.directory)
        self.assertEqual(done.returncode, 2, done)
        self.assertEqual(done.stdout, b"")
        self.assertEqual(done.stderr.count(b"\n"), 1, done)
        self.assertIn(b"bad.json", done.stderr)


if __name__ == "__main__":
    unittest.main()
