# SPDX-License-Identifier: Apache-2.0
"""The kernel module: when it is built, for which kernel, and what is said when it cannot be."""

import os
import tempfile
import unittest
from unittest import mock

import launcher_path  # noqa: F401
import debian_packages
import guest_image
import kernel_module
from failure import Failure

RELEASE = "6.1.0-99-amd64"


class Build(unittest.TestCase):
    """build() with downloads and compiler left out."""

    def setUp(self):
        scratch = tempfile.TemporaryDirectory()
        self.addCleanup(scratch.cleanup)
        self.project = scratch.name
        self.sources = os.path.join(self.project, "sources")
        os.mkdir(self.sources)
        self.write_source("main.c", "first")
        self.write_source("build-module", "no source")
        self.release = RELEASE
        self.fetched = []
        self.made = []
        self.said = []
        for owner, name, value in (
                (guest_image, "PROJECT", self.project),
                (guest_image, "prepare", lambda arch, say: None),
                (guest_image, "kernel_release", lambda arch: self.release),
                (kernel_module, "SOURCES", self.sources),
                (kernel_module, "_fetch_headers", self.fetch),
                (kernel_module, "_make", self.make)):
            patch = mock.patch.object(owner, name, value)
            patch.start()
            self.addCleanup(patch.stop)

    def write_source(self, name, text):
        with open(os.path.join(self.sources, name), "w", encoding="ascii") as file:
            file.write(text)

    def fetch(self, _arch, release, _target, _say):
        self.fetched.append(release)

    def make(self, _arch, headers, _release, target):
        self.made.append(os.path.relpath(headers, self.project))
        with open(os.path.join(target, "qvx_vibrator.ko"), "w", encoding="ascii") as file:
            file.write(str(len(self.made)))

    def build(self):
        kernel_module.build("amd64", self.said.append)

    def module(self):
        with open(kernel_module.module_path("amd64"), encoding="ascii") as file:
            return file.read()

    def test_is_for_the_guests_kernel(self):
        self.build()
        self.assertEqual(self.fetched, [RELEASE])
        self.assertEqual(self.made, ["build/kernel/amd64.headers"])
        self.assertEqual(self.said, ["building qvx_vibrator.ko for 6.1.0-99-amd64",
                                     "the amd64 kernel module is ready"])

    def test_does_and_says_nothing_the_second_time(self):
        self.build()
        self.said.clear()
        self.build()
        self.assertEqual((len(self.fetched), len(self.made), self.said), (1, 1, []))

    def test_changed_source_is_built_without_a_download(self):
        self.build()
        self.write_source("main.c", "second")
        self.build()
        self.assertEqual((len(self.fetched), len(self.made)), (1, 2))

    def test_changed_file_beside_the_sources_is_no_reason(self):
        self.build()
        self.write_source("build-module", "changed")
        self.build()
        self.assertEqual(len(self.made), 1)

    def test_another_kernel_is_built_for_anew(self):
        self.build()
        self.release = "6.1.0-100-amd64"
        self.build()
        self.assertEqual(self.fetched, [RELEASE, "6.1.0-100-amd64"])
        self.assertEqual(len(self.made), 2)

    def test_failed_build_keeps_the_older_module(self):
        self.build()
        self.write_source("main.c", "broken")
        with mock.patch.object(kernel_module, "_make", side_effect=Failure("broken")):
            with self.assertRaisesRegex(Failure, "broken"):
                self.build()
        self.assertEqual(self.module(), "1")


class Headers(unittest.TestCase):
    def test_are_those_of_the_release_and_find_each_other_where_they_lie(self):
        packages = []
        with tempfile.TemporaryDirectory() as target:
            directory = os.path.join(target, "usr", "src", "linux-headers-6.1.0-99-arm64")
            os.makedirs(directory)
            with mock.patch.object(debian_packages, "unpack",
                                   lambda package, *_: packages.append(package)):
                kernel_module._fetch_headers("arm64", "6.1.0-99-arm64", target, print)
            with open(os.path.join(directory, "Makefile"), encoding="ascii") as file:
                makefile = file.read()
        self.assertEqual(packages, ["linux-headers-6.1.0-99-arm64:arm64",
                                    "linux-headers-6.1.0-99-common", "linux-kbuild-6.1"])
        self.assertEqual(makefile, "include $(dir $(lastword $(MAKEFILE_LIST)))/../"
                                   "linux-headers-6.1.0-99-common/Makefile\n")

    def test_that_are_gone_from_the_archive_say_what_to_do(self):
        with mock.patch.object(debian_packages, "unpack", side_effect=Failure("not found")):
            with self.assertRaisesRegex(
                    Failure, r"^not found; when Debian has replaced the kernel 6\.1\.0-99-amd64, "
                             r"remove .*/build/guest/amd64\.parts to fetch its successor$"):
                kernel_module._fetch_headers("amd64", RELEASE, "/nowhere", print)


class Compiler(unittest.TestCase):
    def test_errors_are_shown_and_nothing_else(self):
        with tempfile.TemporaryDirectory() as scratch:
            target = os.path.join(scratch, "target")
            os.mkdir(target)
            headers = os.path.join(scratch, "usr", "src", f"linux-headers-{RELEASE}")
            os.makedirs(headers)
            with open(os.path.join(headers, "Makefile"), "w", encoding="ascii") as file:
                file.write("modules:\n\t@echo note: a lot >&2\n"
                           "\t@echo 'main.c:3: error: no such thing' >&2\n\t@exit 1\n")
            with self.assertRaises(Failure) as caught:
                kernel_module._make("amd64", scratch, RELEASE, target)
        lines = str(caught.exception).splitlines()
        self.assertEqual(lines[:2], ["the kernel module does not build:",
                                     "  main.c:3: error: no such thing"])
        self.assertNotIn("a lot", str(caught.exception))


if __name__ == "__main__":
    unittest.main()
