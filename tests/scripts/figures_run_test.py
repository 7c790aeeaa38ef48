# SPDX-License-Identifier: Apache-2.0
"""bench/run: that every target it builds can be built, and that it builds all that it runs."""

import os
import pathlib
import re
import subprocess
import unittest

PROJECT = pathlib.Path(__file__).resolve().parent.parent.parent
COMMAND = re.sub(r"\\\n", " ", (PROJECT / "bench" / "run").read_text("ascii"))


def targets(build):
    return [word for line in COMMAND.splitlines()
            for found in re.finditer(rf"--build {build} --target (.+)", line)
            for word in found[1].split()]


class FiguresRun(unittest.TestCase):
    def test_builds_targets_that_there_are(self):
        self.assertNotEqual(targets("build/release"), [])
        done = subprocess.run(["ninja", "-C", os.environ["QVX_BUILD"], "-t", "query",
                               *targets("build/release")],
                              stdin=subprocess.DEVNULL, capture_output=True, text=True, check=False)
        self.assertEqual(done.returncode, 0, done.stdout[-2000:] + done.stderr)

    def test_builds_the_programs_that_it_runs(self):
        for build in ("build/release", "build/arm64"):
            self.assertIn("phone-parts", targets(build))
            run = re.findall(rf"{build}/bin/(\w+_figures)", COMMAND)
            self.assertNotEqual(run, [])
            self.assertEqual(set(run) - set(targets(build)), set())

    def test_runs_commands_that_there_are(self):
        for name in re.findall(r"(?:bench|handset|scripts|tests)/[\w/.-]+", COMMAND):
            self.assertTrue((PROJECT / name).exists(), name)


if __name__ == "__main__":
    unittest.main()
