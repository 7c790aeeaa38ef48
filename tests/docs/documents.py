# SPDX-License-Identifier: Apache-2.0
"""Finds the commands that README.md, docs/*.md and the man pages show.

    ```sh               run on the host, in a directory that looks like the project's
    ```sh guest PROFILE run in the handset, where the nodes of a phone of that profile are seen

A command that is meant to fail is followed by "# status N". A block that cannot be run has, on the
line before it, the reason: <!-- not run: REASON -->. In README.md, blocks that are indented by four
columns are commands too; two spaces or more end the command, what follows describes it. In a man
page the commands are what stands in the displays of the section EXAMPLES.
"""

import dataclasses
import pathlib
import re

PROJECT = pathlib.Path(__file__).resolve().parent.parent.parent


@dataclasses.dataclass
class Block:
    place: str          # "docs/bring-up.md:12"
    label: str          # what follows the backticks; "indented" for an indented one
    lines: list[str]
    not_run: str = ""   # the reason, when it is not to be run


def documents():
    return [PROJECT / "README.md", *sorted((PROJECT / "docs").glob("*.md"))]


def blocks_of(name, text):
    """Every fenced block, and for README.md every indented one."""
    blocks, fence, before = [], None, ""
    for number, line in enumerate(text.split("\n"), start=1):
        if line.startswith("```"):
            if fence is None:
                reason = re.fullmatch(r"<!-- not run: (.+) -->", before)
                fence = Block(f"{name}:{number}", line[3:].strip(), [],
                              reason.group(1) if reason else "")
            else:
                blocks.append(fence)
                fence = None
        elif fence is not None:
            fence.lines.append(line)
        elif name == "README.md" and re.match(r"    \S", line):
            command = re.split(r"\s{2,}", line.strip())[0]
            if blocks and blocks[-1].label == "indented" and before.startswith("    "):
                blocks[-1].lines.append(command)
            else:
                blocks.append(Block(f"{name}:{number}", "indented", [command]))
        before = line
    if fence is not None:
        raise ValueError(f"{fence.place}: the block has no end")
    return blocks


def all_blocks():
    return [block for path in documents()
            for block in blocks_of(str(path.relative_to(PROJECT)), path.read_text("utf-8"))]


def man_examples():
    """For each man page with examples, all of them as one block: they may build on each other."""
    blocks = []
    for path in sorted((PROJECT / "docs" / "man").iterdir()):
        examples = path.read_text("utf-8").partition("\n.Sh EXAMPLES\n")[2].partition("\n.Sh ")[0]
        displays = re.findall(r"(?ms)^\.Bd .*?\n(.*?)^\.Ed$", examples)
        lines = [line.replace("\\e", "\\") for line in "".join(displays).splitlines()]
        if lines:
            blocks.append(Block(f"docs/man/{path.name}", "sh" if path.name.startswith("handset-")
                                else "sh guest " + ("off" if path.name == "phone.1" else "ff"),
                                lines))
    return blocks


def inline_commands(text):
    """The code spans of a document, blocks left out."""
    text = re.sub(r"(?ms)^```.*?^```$", "", text)
    return re.findall(r"`([^`\n]+)`", text)


def script(lines):
    """A block as a script for sh -e. "# status N" becomes a check."""
    out = []
    for line in lines:
        status = re.fullmatch(r"(.*\S)\s+# status (\d+)", line)
        out.append(f"expect_status {status.group(2)} {status.group(1)}" if status else line)
    return "\n".join(out) + "\n"


PRELUDE = """\
set -eu
expect_status() {
    wanted=$1; shift; status=0
    "$@" || status=$?
    if [ $status != $wanted ]; then
        echo "status $status where $wanted is expected: $*" >&2
        exit 99
    fi
}
"""
