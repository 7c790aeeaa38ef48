# SPDX-License-Identifier: Apache-2.0
"""Reads init scripts (.rc): sections that begin with "service", "on" or "import"."""

import dataclasses
import shlex


@dataclasses.dataclass
class Section:
    words: list  # of the line that begins it
    options: list  # the lines that follow, each as its words


def parse(text):
    sections = []
    for number, line in enumerate(text.splitlines(), 1):
        words = shlex.split(line, comments=True)
        if not words:
            continue
        if words[0] in ("service", "on", "import"):
            sections.append(Section(words, []))
        elif not sections:
            raise ValueError(f"line {number}: \"{line}\" belongs to no section")
        else:
            sections[-1].options.append(words)
    return sections
