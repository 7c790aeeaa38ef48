#!/usr/bin/python3 -B
# SPDX-License-Identifier: Apache-2.0
"""Feeds the reader of a run damaged files: it reads them, or says in one line in which file and line
it cannot. fuzz/damage.py has the options.

An input is a journal, a log and a list of calls, with a line of three dashes between them."""

import pathlib
import re
import sys

HERE = pathlib.Path(__file__).resolve().parent
sys.path[:0] = [str(HERE.parent), str(HERE.parents[2] / "fuzz")]

import damage  # noqa: E402  (needs the path above)
import run as run_reader  # noqa: E402  (likewise)

COMPLAINT = re.compile(r"\S+\.jsonl:\d+: no (journal line|call): [^\n]*")
FILES = ("journal.jsonl", "service.log", "calls.jsonl")


def run(data: bytes) -> None:
    """Reads `data` as the files of a run in the current directory, and everything of that run."""
    parts = data.split(b"---\n", 2)
    for name, part in zip(FILES, [*parts, b"", b""]):
        pathlib.Path(name).write_bytes(part)
    try:
        read = run_reader.read(".")
    except run_reader.Unreadable as complaint:
        if not COMPLAINT.fullmatch(str(complaint)):
            raise AssertionError(f"a complaint without its place: {complaint}") from None
        return
    for op in read.ops:
        op.describe()
        read.cause(op.us)
    for request in read.requests:
        request.describe()
    list(read.marks)


if __name__ == "__main__":
    sys.exit(damage.main(run, HERE / "journal_corpus", sys.argv[1:]))
