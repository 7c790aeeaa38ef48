#!/usr/bin/python3 -B
# SPDX-License-Identifier: Apache-2.0
"""Feeds the AIDL compiler damaged files: whatever they hold, it writes code or complains about one
place of the file. Anything else that it raises is a finding, whose input is kept.

compiler_fuzzer.py --replay     each kept input once
compiler_fuzzer.py [EXECUTIONS [SEED]]
"""

import contextlib
import io
import os
import pathlib
import random
import re
import sys
import tempfile

HERE = pathlib.Path(__file__).resolve().parent
sys.path.insert(0, str(HERE.parent))

from aidl_compiler.command_line import main as compile_aidl  # noqa: E402  (needs the path above)

CORPUS = HERE / "compiler_corpus"
COMPLAINT = re.compile(r"p/Foo\.aidl:\d+:\d+: .+\n")
TOKEN = re.compile(rb"\w+|\s+|.", re.DOTALL)


def run(data: bytes) -> None:
    """Compiles `data` as the file p/Foo.aidl of the current directory."""
    pathlib.Path("p").mkdir(exist_ok=True)
    pathlib.Path("p/Foo.aidl").write_bytes(data)
    out, err = io.StringIO(), io.StringIO()
    with contextlib.redirect_stdout(out), contextlib.redirect_stderr(err):
        status = compile_aidl(["--lang=ndk", "--structured", "--out-headers=h", "--out-sources=s",
                               "--include=.", "p/Foo.aidl"])
    if out.getvalue() or (status, bool(err.getvalue())) not in ((0, False), (1, True)):
        raise AssertionError(f"status {status}: {err.getvalue()!r}")
    if status == 1 and not COMPLAINT.fullmatch(err.getvalue()):
        raise AssertionError(f"a complaint without its place: {err.getvalue()!r}")


def damaged(inputs: list[bytes], chance: random.Random) -> bytes:
    """One input with a few of its tokens removed, doubled, or replaced by those of another."""
    tokens = TOKEN.findall(chance.choice(inputs))
    for _ in range(chance.randint(1, 4)):
        at = chance.randrange(len(tokens))
        other = TOKEN.findall(chance.choice(inputs))
        tokens[at:at + chance.randint(0, 3)] = chance.choice((
            [], tokens[at:at + 2] * 2, [chance.choice(other)], [bytes([chance.randrange(256)])],
            other[chance.randrange(len(other)):][:chance.randint(1, 8)]))
        if not tokens:
            return b""
    return b"".join(tokens)


def main(arguments: list[str]) -> int:
    replay = arguments == ["--replay"]
    if not replay and not (len(arguments) <= 2 and all(each.isdigit() for each in arguments)):
        print("usage: compiler_fuzzer.py --replay | [EXECUTIONS [SEED]]", file=sys.stderr)
        return 2
    inputs = [path.read_bytes() for path in sorted(CORPUS.iterdir()) if path.stat().st_size > 0]
    executions = int(arguments[0]) if arguments and not replay else 1000
    chance = random.Random(int(arguments[1]) if len(arguments) > 1 else None)
    queue = inputs if replay else (damaged(inputs, chance) for _ in range(executions))
    before = pathlib.Path.cwd()
    with tempfile.TemporaryDirectory() as directory:
        os.chdir(directory)
        try:
            for data in queue:
                try:
                    run(data)
                except Exception:
                    kept = before / "compiler-finding.aidl"
                    kept.write_bytes(data)
                    print(f"kept in {kept}", file=sys.stderr)
                    raise
        finally:
            os.chdir(before)
    return 0


if __name__ == "__main__":
    sys.exit(main(sys.argv[1:]))
