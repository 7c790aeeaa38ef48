# SPDX-License-Identifier: Apache-2.0
"""What the tests of the AIDL compiler share: a directory to write files into, and the compiler."""

import contextlib
import io
import os
import pathlib
import shutil
import sys
import tempfile
import textwrap
import unittest

PROJECT = pathlib.Path(__file__).resolve().parents[4]
COMPILER = PROJECT / "platform/aidl/aidl"
sys.path.insert(0, str(COMPILER.parent))

from aidl_compiler.command_line import main  # noqa: E402  (needs the path above)


class CompilerCase(unittest.TestCase):
    """Runs in a directory of its own; paths are relative to it, as complaints then are."""

    def setUp(self):
        directory = tempfile.TemporaryDirectory()
        self.addCleanup(directory.cleanup)
        before = os.getcwd()
        os.chdir(directory.name)
        self.addCleanup(os.chdir, before)

    def write(self, path, text):
        """Writes a file; the text may be indented as the test is."""
        file = pathlib.Path(path)
        file.parent.mkdir(parents=True, exist_ok=True)
        file.write_text(textwrap.dedent(text), encoding="utf-8")
        return str(path)

    def run_compiler(self, *arguments):
        """Exit status, standard output and standard error."""
        out, err = io.StringIO(), io.StringIO()
        with contextlib.redirect_stdout(out), contextlib.redirect_stderr(err):
            status = main(list(arguments))
        return status, out.getvalue(), err.getvalue()

    def generate(self, *files, options=()):
        return self.run_compiler("--lang=ndk", "--structured", "--out-headers=headers",
                                 "--out-sources=sources", "--include=.", *options, *files)

    def accept(self, *files, options=()):
        self.assertEqual(self.generate(*files, options=options), (0, "", ""))

    def refuse(self, file, complaint, *others, options=()):
        """The file is refused with exactly this line, and nothing is written."""
        for directory in ("headers", "sources"):
            shutil.rmtree(directory, ignore_errors=True)
        self.assertEqual(self.generate(file, *others, options=options),
                         (1, "", f"{file}:{complaint}\n"))
        self.assertFalse(pathlib.Path("headers").exists() or pathlib.Path("sources").exists())

    def refuse_type(self, text, complaint, name="Foo", options=()):
        """As `refuse`, for the only type of a file; its text begins in line 2."""
        file = self.write(f"p/{name}.aidl", "package p;\n" + textwrap.dedent(text))
        self.refuse(file, complaint, options=options)

    def accept_type(self, text, name="Foo", options=()):
        file = self.write(f"p/{name}.aidl", "package p;\n" + textwrap.dedent(text))
        self.accept(file, options=options)

    def header(self, path):
        return pathlib.Path("headers", path).read_text(encoding="utf-8")

    def source(self, path):
        return pathlib.Path("sources", path).read_text(encoding="utf-8")
