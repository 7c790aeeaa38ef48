# SPDX-License-Identifier: Apache-2.0
"""A clone in an awkward place: below a directory that only its owner enters, in a path with spaces
and letters beyond ASCII, used by root and by somebody else. Takes over what the project's own build
has fetched and, through the compiler cache, compiled."""

import os
import pathlib
import shutil
import subprocess
import tempfile
import unittest

PROJECT = pathlib.Path(__file__).resolve().parent.parent.parent
SOMEBODY = 4242  # a user id that Debian gives to nobody by itself


class Clone(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        cls.home = pathlib.Path(tempfile.mkdtemp(prefix="Büro à Übung-", dir="/var/tmp"))
        cls.addClassCleanup(shutil.rmtree, cls.home)
        cls.clone = cls.home / "my project"
        shutil.copytree(PROJECT, cls.clone, symlinks=True,
                        ignore=shutil.ignore_patterns(".git", "build"))
        for fetched in ("guest/amd64", "guest/amd64.parts", "kernel/amd64.headers"):
            if (PROJECT / "build" / fetched).is_dir():
                shutil.copytree(PROJECT / "build" / fetched, cls.clone / "build" / fetched,
                                symlinks=True)
        cls.run_there("cmake", "--preset", "release")
        cls.run_there("cmake", "--build", "build/release", "--target", "phone-parts")

    @classmethod
    def run_there(cls, *command, **more):
        done = subprocess.run(command, cwd=cls.clone, stdin=subprocess.DEVNULL, text=True,
                              stdout=subprocess.PIPE, stderr=subprocess.PIPE, check=False, **more)
        if done.returncode != 0:
            raise AssertionError(f"{command}: {done.returncode}\n{done.stdout}{done.stderr}")
        return done.stdout

    def assert_demo_runs(self, **user):
        shown = self.run_there("handset/run", "--profile", "leds", "--",
                               str(self.clone / "scripts" / "demo-session"), **user)
        self.assertRegex(shown, r'std setAmplitude 0\.5 +ok +intensity <- "5000\\n"')

    def test_runs_the_demo(self):
        self.assert_demo_runs()

    def test_runs_the_demo_for_another_user(self):
        if os.geteuid() != 0:
            self.skipTest("only root can become somebody else")
        subprocess.run(["chown", "-R", f"{SOMEBODY}:{SOMEBODY}", self.home], check=True)
        self.assert_demo_runs(user=SOMEBODY, group=SOMEBODY, extra_groups=[])

    def test_builds_the_kernel_module(self):
        self.run_there("handset/kernel/build-module")
        self.assertTrue((self.clone / "build/kernel/amd64/qvx_vibrator.ko").is_file())


if __name__ == "__main__":
    unittest.main()
