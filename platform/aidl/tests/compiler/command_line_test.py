# SPDX-License-Identifier: Apache-2.0
"""The command: what it writes where, and how it refuses a wrong command line."""

import os
import pathlib
import subprocess
import unittest

from compiler_case import COMPILER, CompilerCase


class Outputs(CompilerCase):
    def test_interface_makes_three_headers_and_a_source(self):
        self.accept(self.write("a/b/IFoo.aidl", "package a.b; interface IFoo {}"))
        self.assertEqual(self.written(), [
            "headers/aidl/a/b/BnFoo.h", "headers/aidl/a/b/BpFoo.h", "headers/aidl/a/b/IFoo.h",
            "sources/a/b/IFoo.cpp"])
        self.assertIn("namespace aidl::a::b {", self.header("aidl/a/b/IFoo.h"))

    def test_other_types_have_stub_headers_that_only_refuse(self):
        self.accept(self.write("a/b/Foo.aidl", "package a.b; parcelable Foo {}"))
        self.assertEqual(self.written(), [
            "headers/aidl/a/b/BnFoo.h", "headers/aidl/a/b/BpFoo.h", "headers/aidl/a/b/Foo.h",
            "sources/a/b/Foo.cpp"])
        self.assertIn("#error", self.header("aidl/a/b/BnFoo.h"))

    def test_leading_i_goes_only_before_another_capital(self):
        self.accept(self.write("p/Iris.aidl", "package p; interface Iris {}"))
        self.assertIn("headers/aidl/p/BnIris.h", self.written())

    def test_imported_types_are_not_generated(self):
        self.write("p/Bar.aidl", "package p; parcelable Bar {}")
        self.accept_type("parcelable Foo { Bar bar; }")
        self.assertNotIn("sources/p/Bar.cpp", self.written())

    def test_file_that_is_right_already_is_left_alone(self):
        self.accept_type("parcelable Foo { int a; }")
        os.utime("sources/p/Foo.cpp", (1, 1))
        self.accept_type("parcelable Foo { int a; }")
        self.assertEqual(os.stat("sources/p/Foo.cpp").st_mtime, 1)
        self.accept_type("parcelable Foo { int b; }")
        self.assertNotEqual(os.stat("sources/p/Foo.cpp").st_mtime, 1)

    def test_same_input_makes_the_same_bytes(self):
        self.accept_type("union Foo { int a; String b; }")
        first = self.header("aidl/p/Foo.h") + self.source("p/Foo.cpp")
        for path in self.written():
            pathlib.Path(path).unlink()
        self.accept_type("union Foo { int a; String b; }")
        self.assertEqual(self.header("aidl/p/Foo.h") + self.source("p/Foo.cpp"), first)

    def test_version_and_hash_show_only_when_given(self):
        self.accept_type("interface IFoo {}", name="IFoo")
        self.assertNotIn("getInterfaceVersion", self.header("aidl/p/IFoo.h"))
        self.accept_type("interface IFoo {}", name="IFoo", options=("--version=7", "--hash=abc"))
        self.assertIn(" version = 7;", self.header("aidl/p/IFoo.h"))
        self.assertIn(' hash = "abc";', self.header("aidl/p/IFoo.h"))

    @staticmethod
    def written():
        return sorted(str(path) for directory in ("headers", "sources")
                      for path in pathlib.Path(directory).rglob("*") if path.is_file())


class Usage(CompilerCase):
    def refuse_usage(self, *arguments):
        status, out, err = self.run_compiler(*arguments)
        self.assertEqual((status, out, err.count("\n")), (2, "", 1), err)
        self.assertTrue(err.startswith("aidl: "), err)
        return err

    def test_nothing_to_do(self):
        self.assertEqual(self.refuse_usage(), "aidl: nothing to do: give --lang=ndk, --dumpapi, "
                                              "--checkapi or --hash\n")

    def test_wrong_options(self):
        file = self.write("p/Foo.aidl", "package p; parcelable Foo {}")
        ndk = ("--lang=ndk", "--out-headers=h", "--out-sources=s")
        for arguments in (("--lang=java", "--out-headers=h", "--out-sources=s", file),
                          ("--lang=ndk", file), ("--lang=ndk", "--out-headers=h", file), ndk,
                          (*ndk, "--version=0", file), (*ndk, "--version=x", file),
                          (*ndk, "--version=99999999999", file), (*ndk, "--hash=abc", file),
                          (*ndk, "--stability=local", file), (*ndk, "--unknown", file),
                          (*ndk, "--include=missing", file), (*ndk, "p/Missing.aidl"),
                          (*ndk, "p"), (*ndk, "--dumpapi", "d", file), ("--dumpapi", "d"),
                          ("--lang",)):
            with self.subTest(arguments):
                self.refuse_usage(*arguments)
        self.assertEqual(sorted(os.listdir(".")), ["p"])

    def test_executable_reports_its_exit_status(self):
        wrong = self.write("p/Foo.aidl", "package p;\nparcelable Foo { Bar a; }")
        run = subprocess.run([COMPILER, "--dumpapi", "d", wrong], capture_output=True, text=True,
                             check=False)
        self.assertEqual((run.returncode, run.stdout, run.stderr),
                         (1, "", "p/Foo.aidl:2:18: unknown type 'Bar'\n"))
        help_text = subprocess.run([COMPILER, "--help"], capture_output=True, text=True,
                                   check=False)
        self.assertEqual(help_text.returncode, 0)
        self.assertIn("--dumpapi", help_text.stdout)


if __name__ == "__main__":
    unittest.main()
