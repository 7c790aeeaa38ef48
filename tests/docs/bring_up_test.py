# SPDX-License-Identifier: Apache-2.0
"""docs/bring-up.md beside the service: a log line that is explained there is one that is logged."""

import pathlib
import re
import unittest

PROJECT = pathlib.Path(__file__).resolve().parent.parent.parent
DOCUMENT = (PROJECT / "docs" / "bring-up.md").read_text("utf-8")
SERVICE = PROJECT / "hal-server" / "vibrator" / "aidl" / "default"


def section(title):
    return DOCUMENT.split(f"\n## {title}\n")[1].split("\n## ")[0]


def first_cells(text):
    """The first cell of every row of the tables, heads left out."""
    rows = re.findall(r"(?m)^\|(.*?)\|", text)
    return [row for row in rows if not set(row) <= set("-") and "`" in row]


class BringUp(unittest.TestCase):
    def test_explains_lines_that_the_service_logs(self):
        sources = "".join(path.read_text("utf-8") for path in SERVICE.rglob("*.cpp"))
        # What is streamed in pieces counts as one text: the pieces follow each other.
        logged = re.sub(r'"\s*<<\s*"|"\s+"', "", sources)
        lines = [span for cell in first_cells(section("4. The log"))
                 for span in re.findall(r"`([^`]+)`", cell)]
        self.assertGreater(len(lines), 12)
        for line in lines:
            pieces = [line] if line in logged else [line.removeprefix("HW_API: ")]
            for piece in pieces:
                self.assertIn(piece, logged, line)

    def test_names_nodes_that_the_service_opens(self):
        sources = "".join(path.read_text("utf-8") for path in
                          [*SERVICE.rglob("*.cpp"), *SERVICE.rglob("*.h")])
        for cell in first_cells(section("1. The driver: which node decides what")):
            for span in re.findall(r"`([a-z_0-9]+)`", cell):
                self.assertRegex(sources, rf"[\"/]{span}\"", span)

    def test_says_that_no_callback_comes_without_force_feedback(self):
        self.assertIn("so the callback never comes", section("3. The first vibration"))


if __name__ == "__main__":
    unittest.main()
