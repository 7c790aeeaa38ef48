# SPDX-License-Identifier: Apache-2.0
"""Fuzzing of what is written in Python: damages kept inputs and hands them to a harness, which raises
where a promise is broken. Such an input is kept in build/fuzz/.

A harness NAME_fuzzer.py calls main() with its function and the directory of its inputs, and is run as
    NAME_fuzzer.py --replay             each kept input once
    NAME_fuzzer.py [EXECUTIONS [SEED]]
    NAME_fuzzer.py --seconds SECONDS
The last two print at the end the executions and how many lines of the tested code they reached.
"""

import os
import pathlib
import random
import re
import sys
import tempfile
import time

PROJECT = pathlib.Path(__file__).resolve().parent.parent
_TOKEN = re.compile(rb"\w+|\s+|.", re.DOTALL)


def _damaged(inputs, chance):
    """One input with a few of its tokens removed, doubled, or replaced by those of another."""
    tokens = _TOKEN.findall(chance.choice(inputs))
    for _ in range(chance.randint(1, 4)):
        at = chance.randrange(len(tokens))
        other = _TOKEN.findall(chance.choice(inputs))
        tokens[at:at + chance.randint(0, 3)] = chance.choice((
            [], tokens[at:at + 2] * 2, [chance.choice(other)], [bytes([chance.randrange(256)])],
            other[chance.randrange(len(other)):][:chance.randint(1, 8)]))
        if not tokens:
            return b""
    return b"".join(tokens)


def _queue(inputs, words):
    """What is to be run, one after another."""
    if words == ["--replay"]:
        yield from inputs
        return
    end = time.monotonic() + int(words[1]) if words[:1] == ["--seconds"] else None
    chance = random.Random(int(words[1]) if len(words) > 1 and end is None else None)
    count = int(words[0]) if words and end is None else 1000
    while count if end is None else time.monotonic() < end:
        count -= 1
        yield _damaged(inputs, chance)


class _Lines:
    """The lines below a directory that are run."""

    def __init__(self, directory):
        self._prefix = str(directory)
        self.seen = set()

    def trace(self, frame, event, _argument):
        if not frame.f_code.co_filename.startswith(self._prefix):
            return None
        if event == "line":
            self.seen.add((frame.f_code.co_filename, frame.f_lineno))
        return self.trace


def main(run, corpus, words):
    """Runs `run` on each input, in an empty directory of its own. The tested code lies below the
    directory above that of the corpus. Returns the exit status."""
    numbers = words[1:] if words[:1] == ["--seconds"] and len(words) == 2 else words
    if words != ["--replay"] and not (len(words) <= 2 and all(word.isdigit() for word in numbers)):
        print(f"usage: {pathlib.Path(sys.argv[0]).name} --replay | --seconds SECONDS | "
              "[EXECUTIONS [SEED]]", file=sys.stderr)
        return 2
    inputs = [path.read_bytes() for path in sorted(corpus.iterdir()) if path.stat().st_size > 0]
    if not inputs:
        print(f"no inputs in {corpus}", file=sys.stderr)
        return 1
    lines = _Lines(corpus.parent.parent)
    executions = 0
    before = os.getcwd()
    with tempfile.TemporaryDirectory() as directory:
        os.chdir(directory)
        sys.settrace(None if words == ["--replay"] else lines.trace)
        try:
            for data in _queue(inputs, words):
                try:
                    run(data)
                except Exception:
                    kept = PROJECT / "build" / "fuzz" / f"{corpus.name.removesuffix('_corpus')}-finding"
                    kept.parent.mkdir(parents=True, exist_ok=True)
                    kept.write_bytes(data)
                    print(f"kept in {kept}", file=sys.stderr)
                    raise
                executions += 1
        finally:
            sys.settrace(None)
            os.chdir(before)
    if words != ["--replay"]:
        print(f"{executions} executions, {len(lines.seen)} lines")
    return 0
