# SPDX-License-Identifier: Apache-2.0
"""Every command that README.md, docs/*.md and the man pages show, run. documents.py says how one is
found."""

import os
import pathlib
import re
import shlex
import subprocess
import tempfile
import unittest

from documents import (PRELUDE, PROJECT, all_blocks, blocks_of, documents, inline_commands,
                       man_examples, script)

BUILD = pathlib.Path(os.environ["QVX_BUILD"])
LABELS = {"", "text", "json", "xml", "c", "cpp", "make", "rc"}  # of blocks that hold no command

# What takes minutes or a person, and what is run in its place: the reason why that is enough.
INSTEAD = {
    "./check": ("true", "it is what runs this test"),
    "./demo": ("true", "what it does once it has built is a test of its own below"),
    "handset/shell": ("handset/shell --help >/dev/null",
                      "needs a terminal; launcher.shell_guest_test gives it one"),
    "handset/scope": ("handset/scope --help >/dev/null",
                      "runs until it is stopped; view.scope_browser_test opens it"),
    "bench/run": ("bash -n bench/run", "measures for a minute on an idle machine"),
    "tests/soak/run": ("tests/soak/run --help >/dev/null",
                       "takes the minutes that it is given; soak_test and attack_test are short"),
    "fuzz/run": ("expect_status 2 fuzz/run no-such-fuzzer", "builds with another compiler"),
}

# The tools that code spans may name, with the helps in which their options are looked up.
TOOLS = {
    "vibctl": [[BUILD / "bin" / "vibctl"]],
    "phone": [[BUILD / "bin" / "phone", *command] for command in
              ([], ["up"], ["status"], ["fault"], ["unplug"], ["plug"], ["journal"], ["log"],
               ["exec"])],
    "handset/run": [[PROJECT / "handset" / "run"]],
    "handset/shell": [[PROJECT / "handset" / "shell"]],
}
PHONE_COMMANDS = {"up", "down", "status", "service", "reset", "fault", "unplug", "plug", "node",
                  "journal", "log", "exec"}
VIBCTL_COMMANDS = {"std", "ext", "info", "dump", "raw", "play", "session", "list", "doctor", "help"}


def is_host(block):
    return block.label in ("sh", "indented") and not block.not_run


def is_guest(block):
    return block.label.startswith("sh guest ") and not block.not_run


def replaced(line):
    """The line, or what is run in the place of its command."""
    first = line.split()[0] if line.split() else ""
    return INSTEAD[first][0] if first in INSTEAD else line


def with_build(line):
    """handset/run takes build/release by default; here it takes the build under test."""
    return re.sub(r"\bhandset/run (?!--help)", f"handset/run --build {shlex.quote(str(BUILD))} ",
                  line)


class Commands(unittest.TestCase):
    def run_script(self, command, text, place, **options):
        result = subprocess.run([*command], capture_output=True, text=True, timeout=280,
                                stdin=subprocess.DEVNULL, **options)
        self.assertEqual(result.returncode, 0,
                         f"{place}\n{text}\n{result.stdout}{result.stderr}")

    def test_blocks_are_marked_as_what_they_are(self):
        for block in all_blocks():
            known = (block.label in LABELS | {"sh", "indented"} or
                     re.fullmatch(r"sh guest (legacy|leds|ff|none|off)", block.label))
            self.assertTrue(known, f"{block.place}: a block marked {block.label!r}")
            if block.label in LABELS:
                for line in block.lines:
                    self.assertNotRegex(line, r"^(\$ |\./|vibctl \S|phone \S|handset/|cmake |ctest )",
                                        f"{block.place}: a command in a block without sh")

    def test_of_the_host_work(self):
        # A directory that looks like the project's takes what the commands leave behind.
        with tempfile.TemporaryDirectory(prefix="documents-") as name:
            directory = pathlib.Path(name)
            for entry in PROJECT.iterdir():
                if entry.name != "build" and not entry.name.startswith("."):
                    (directory / entry.name).symlink_to(entry)
            (directory / "build").mkdir()
            (directory / "build" / "release").symlink_to(BUILD)
            blocks = [block for block in [*all_blocks(), *man_examples()] if is_host(block)]
            self.assertGreater(len(blocks), 8)
            for block in blocks:
                with self.subTest(block.place):
                    lines = [with_build(replaced(line)) for line in block.lines]
                    text = PRELUDE + script(lines)
                    self.run_script(["bash", "-c", text], text, block.place, cwd=directory)

    def test_demo_prints_what_the_readme_shows(self):
        (shown,) = [block for block in all_blocks()
                    if block.place.startswith("README.md:") and block.label == "text"
                    and block.lines[0].startswith("vibctl  ")]
        result = subprocess.run([PROJECT / "handset" / "run", "--build", BUILD, "--profile", "leds",
                                 "--", PROJECT / "scripts" / "demo-session"], capture_output=True,
                                text=True, timeout=280, stdin=subprocess.DEVNULL, check=True)
        printed = result.stdout.splitlines()
        for line in shown.lines:
            self.assertIn(line, printed)

    def test_of_the_guest_work(self):
        blocks = [block for block in [*all_blocks(), *man_examples()] if is_guest(block)]
        self.assertGreater(len(blocks), 5)
        for block in blocks:
            with self.subTest(block.place):
                text = PRELUDE + script(block.lines)
                self.run_script([PROJECT / "handset" / "run", "--build", BUILD, "--profile",
                                 block.label.split()[2], "--", "sh", "-c", text], text,
                                block.place, cwd=PROJECT)

    def test_not_run_have_a_reason(self):
        for block in all_blocks():
            if block.not_run:
                self.assertGreater(len(block.not_run.split()), 3, block.place)

    def test_in_running_text_exist(self):
        helps = {tool: "".join(subprocess.run([*command, "--help"], text=True, check=True,
                                              capture_output=True).stdout for command in commands)
                 for tool, commands in TOOLS.items()}
        seen = 0
        for path in documents():
            for span in inline_commands(path.read_text("utf-8")):
                words = span.split()
                if words and re.fullmatch(r"(\./|handset/|scripts/|bench/|fuzz/)[\w-]+", words[0]):
                    self.assertTrue(os.access(PROJECT / words[0], os.X_OK), f"{path.name}: {span}")
                    seen += 1
                if len(words) < 2 or words[0] not in TOOLS:
                    continue
                seen += 1
                if words[0] == "phone":
                    self.assertIn(words[1], PHONE_COMMANDS, f"{path.name}: {span}")
                if words[0] == "vibctl" and not words[1].startswith("-"):
                    self.assertIn(words[1], VIBCTL_COMMANDS, f"{path.name}: {span}")
                for option in re.findall(r"--[a-z-]+", span.split(" -- ")[0]):
                    self.assertIn(option, helps[words[0]], f"{path.name}: {span}")
        self.assertGreater(seen, 5)


class Blocks(unittest.TestCase):
    def test_are_found_with_their_reasons(self):
        blocks = blocks_of("docs/a.md", "x\n```sh\na  # status 2\nb\n```\n\n"
                                        "<!-- not run: needs a board -->\n```sh guest ff\nc\n```\n")
        self.assertEqual([(one.label, one.lines, one.not_run) for one in blocks],
                         [("sh", ["a  # status 2", "b"], ""),
                          ("sh guest ff", ["c"], "needs a board")])
        self.assertEqual(script(blocks[0].lines), "expect_status 2 a\nb\n")

    def test_are_found_where_the_readme_indents_them(self):
        blocks = blocks_of("README.md", "x\n\n    ./demo     builds\n    ./check    tests\n\ny")
        self.assertEqual([one.lines for one in blocks], [["./demo", "./check"]])

    def test_without_an_end_are_refused(self):
        with self.assertRaises(ValueError):
            blocks_of("docs/a.md", "```sh\na\n")

    def test_whose_status_is_another_fail(self):
        for line, status in (("false  # status 1", 0), ("true  # status 1", 99), ("false", 1)):
            result = subprocess.run(["sh", "-c", PRELUDE + script([line])], capture_output=True)
            self.assertEqual(result.returncode, status, line)


if __name__ == "__main__":
    unittest.main()
