# SPDX-License-Identifier: Apache-2.0
"""The man pages: well formed, and of the same options as the programs' own help."""

import os
import pathlib
import re
import subprocess
import unittest

PROJECT = pathlib.Path(__file__).resolve().parent.parent.parent
BUILD = pathlib.Path(os.environ["QVX_BUILD"])
PAGES = PROJECT / "docs" / "man"

# What each page describes: the commands whose help, taken together, has the same options.
HELPS = {
    **{f"handset-{tool}.1": [[PROJECT / "handset" / tool, "--help"]]
       for tool in ("run", "shell", "picture", "trace", "replay", "scope")},
    "vibctl.1": [[BUILD / "bin" / "vibctl", "--help"]],
    "servicemanager.8": [[BUILD / "bin" / "servicemanager", "--help"]],
    "phone.1": [[BUILD / "bin" / "phone", *command, "--help"] for command in
                ([], ["up"], ["down"], ["status"], ["service"], ["reset"], ["fault"], ["unplug"],
                 ["plug"], ["node"], ["journal"], ["log"], ["exec"])],
}


def run(*command):
    return subprocess.run([str(word) for word in command], capture_output=True, text=True,
                          check=True, env={**os.environ, "LC_ALL": "C.UTF-8"})


def options_in(text):
    return set(re.findall(r"(?<![\w-])--[a-z][a-z-]*", text))


def rendered(page):
    """The page as text, in lines long enough that none is broken inside an option."""
    text = run("groff", "-mdoc", "-Tascii", "-P-cbou", "-rLL=500n", PAGES / page).stdout
    return text.replace("\b", "")


class ManPages(unittest.TestCase):
    def test_there_is_one_for_every_command(self):
        self.assertEqual(sorted(path.name for path in PAGES.iterdir()), sorted(HELPS))

    def test_are_well_formed(self):
        for page in HELPS:
            with self.subTest(page):
                self.assertEqual(run("groff", "-mdoc", "-ww", "-z", PAGES / page).stderr, "")
                warnings = run("man", "--warnings", "-E", "UTF-8", "-l", "-Tutf8", "-Z",
                               PAGES / page).stderr
                self.assertEqual(warnings, "")

    def test_have_the_sections_that_readers_expect(self):
        for page in HELPS:
            text = rendered(page)
            for section in ("NAME", "SYNOPSIS", "DESCRIPTION", "EXIT STATUS", "SEE ALSO"):
                self.assertRegex(text, rf"(?m)^{section}$", page)

    def test_have_the_options_of_the_programs(self):
        for page, commands in HELPS.items():
            with self.subTest(page):
                helped = set().union(*(options_in(run(*command).stdout) for command in commands))
                # The examples have other commands; vibctl's doctor reads the service manager's --root.
                text = re.sub(r"(?ms)^EXAMPLES$.*?(?=^[A-Z])", "", rendered(page))
                described = options_in(text) - {"--root"}
                self.assertEqual(described, helped - {"--root"})

    def test_name_every_command_of_phone(self):
        text = rendered("phone.1")
        helped = run(BUILD / "bin" / "phone", "--help").stdout.split("Subcommands:")[1]
        commands = re.findall(r"(?m)^  ([a-z]+) ", helped)
        self.assertEqual(len(commands), 12)
        for command in commands:
            self.assertRegex(text, rf"(?m)^     phone {command}\b")


if __name__ == "__main__":
    unittest.main()
