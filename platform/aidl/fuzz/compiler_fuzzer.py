#!/usr/bin/python3 -B
# SPDX-License-Identifier: Apache-2.0
"""Feeds the AIDL compiler damaged files: whatever they hold, it writes code or complains about one
place of the file. Anything else that it raises is a finding. fuzz/damage.py has the options."""

import contextlib
import io
import pathlib
import re
import sys

HERE = pathlib.Path(__file__).resolve().parent
sys.path[:0] = [str(HERE.parent), str(HERE.parents[2] / "fuzz")]

import damage  # noqa: E402  (needs the path above)
from aidl_compiler.command_line import main as compile_aidl  # noqa: E402  (likewise)

COMPLAINT = re.compile(r"p/Foo\.aidl:\d+:\d+: .+\n")


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


if __name__ == "__main__":
    sys.exit(damage.main(run, HERE / "compiler_corpus", sys.argv[1:]))
