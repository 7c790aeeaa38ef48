# SPDX-License-Identifier: Apache-2.0
"""What a guest boots from: when it is made, that it is made whole or not at all, the kernel cut."""

import lzma
import os
import struct
import subprocess
import tempfile
import threading
import time
import unittest
from unittest import mock

import launcher_path  # noqa: F401
import debian_packages
import guest_image
from failure import Failure


class Preparation(unittest.TestCase):
    """prepare() with the network left out: fetching and assembling are counted and leave a file."""

    def setUp(self):
        scratch = tempfile.TemporaryDirectory()
        self.addCleanup(scratch.cleanup)
        self.project = scratch.name
        self.init = os.path.join(self.project, "init")
        self.write(self.init, "first")
        self.fetched = 0
        self.assembled = 0
        self.said = []
        for name, value in (("PROJECT", self.project), ("INIT", self.init),
                            ("_fetch_parts", self.fetch), ("_assemble", self.assemble)):
            patch = mock.patch.object(guest_image, name, value)
            patch.start()
            self.addCleanup(patch.stop)
        self.directory = os.path.join(self.project, "build", "guest", "amd64")

    @staticmethod
    def write(path, text):
        with open(path, "w", encoding="ascii") as file:
            file.write(text)

    def fetch(self, _arch, target, _say):
        self.fetched += 1
        self.write(os.path.join(target, "kernel"), "kernel")

    def assemble(self, _arch, parts, target):
        self.assembled += 1
        os.link(os.path.join(parts, "kernel"), os.path.join(target, "kernel"))

    def prepare(self):
        guest_image.prepare("amd64", self.said.append)

    def left(self):
        return sorted(os.listdir(os.path.dirname(self.directory)))

    def test_makes_everything_the_first_time(self):
        self.prepare()
        self.assertEqual((self.fetched, self.assembled), (1, 1))
        self.assertEqual(sorted(os.listdir(self.directory)), ["kernel", "stamp"])
        self.assertEqual(self.said, ["the amd64 guest is ready"])

    def test_does_and_says_nothing_the_second_time(self):
        self.prepare()
        self.said.clear()
        self.prepare()
        self.assertEqual((self.fetched, self.assembled), (1, 1))
        self.assertEqual(self.said, [])

    def test_changed_init_is_packed_without_a_download(self):
        self.prepare()
        self.write(self.init, "second")
        self.prepare()
        self.assertEqual((self.fetched, self.assembled), (1, 2))

    def test_changed_modules_are_fetched(self):
        self.prepare()
        with mock.patch.object(guest_image, "MODULES", ("overlay",)):
            self.prepare()
        self.assertEqual((self.fetched, self.assembled), (2, 2))

    def test_directory_without_a_stamp_is_made_anew(self):
        self.prepare()
        os.unlink(os.path.join(self.directory, "stamp"))
        self.prepare()
        self.assertEqual((self.fetched, self.assembled), (1, 2))

    def test_failed_fetch_leaves_only_the_lock(self):
        with mock.patch.object(guest_image, "_fetch_parts", side_effect=Failure("no network")):
            with self.assertRaisesRegex(Failure, "no network"):
                self.prepare()
        self.assertEqual(self.left(), ["amd64.lock"])

    def test_failed_packing_keeps_the_older_guest(self):
        self.prepare()
        self.write(self.init, "second")
        with mock.patch.object(guest_image, "_assemble", side_effect=KeyboardInterrupt):
            with self.assertRaises(KeyboardInterrupt):
                self.prepare()
        self.assertEqual(self.left(), ["amd64", "amd64.lock", "amd64.parts"])
        self.assertTrue(os.path.exists(os.path.join(self.directory, "kernel")))

    def test_what_a_killed_run_left_is_removed(self):
        for name in ("amd64.new", "amd64.old", "amd64.parts.new"):
            os.makedirs(os.path.join(os.path.dirname(self.directory), name, "half"))
        self.prepare()
        self.assertEqual(self.left(), ["amd64", "amd64.lock", "amd64.parts"])

    def test_runs_at_the_same_time_wait_for_each_other(self):
        started = threading.Event()

        def slow_fetch(arch, target, say):
            started.set()
            time.sleep(0.3)
            self.fetch(arch, target, say)

        with mock.patch.object(guest_image, "_fetch_parts", slow_fetch):
            other = threading.Thread(target=self.prepare)
            other.start()
            started.wait()
            self.prepare()
            other.join()
        self.assertEqual((self.fetched, self.assembled), (1, 1))
        self.assertEqual(self.said, ["another run is preparing the amd64 guest, waiting for it",
                                     "the amd64 guest is ready"])


class KernelCut(unittest.TestCase):
    """The ELF image inside an x86 kernel file, found by the boot protocol's header."""

    def cut(self, image, arch):
        with tempfile.TemporaryDirectory() as scratch:
            source = os.path.join(scratch, "vmlinuz")
            target = os.path.join(scratch, "kernel")
            with open(source, "wb") as file:
                file.write(image)
            guest_image._take_kernel(source, target, arch)
            with open(target, "rb") as file:
                return file.read()

    @staticmethod
    def bz_image(setup_sectors, payload):
        sectors = setup_sectors or 4
        image = bytearray((sectors + 1) * 512 + 0x100)
        image[0x1F1] = setup_sectors
        struct.pack_into("<II", image, 0x248, 0x100, len(payload))
        return bytes(image) + payload + b"after the payload"

    def test_payload_is_unpacked(self):
        payload = lzma.compress(b"\x7fELF kernel") + struct.pack("<I", 11)
        self.assertEqual(self.cut(self.bz_image(3, payload), "amd64"), b"\x7fELF kernel")

    def test_zero_setup_sectors_mean_four(self):
        payload = lzma.compress(b"\x7fELF kernel") + struct.pack("<I", 11)
        self.assertEqual(self.cut(self.bz_image(0, payload), "amd64"), b"\x7fELF kernel")

    def test_arm64_image_stays_as_it_is(self):
        self.assertEqual(self.cut(b"MZ raw image", "arm64"), b"MZ raw image")


class KernelPackage(unittest.TestCase):
    META = "Package: linux-image-amd64\nDepends: linux-image-6.1.0-99-amd64 (= 6.1.999-1)\n"

    def test_is_the_one_behind_the_metapackage(self):
        with mock.patch.object(debian_packages, "run", return_value=self.META):
            self.assertEqual(guest_image._kernel_package("amd64", print),
                             "linux-image-6.1.0-99-amd64:amd64")

    def test_metapackage_without_a_kernel_is_a_failure(self):
        with mock.patch.object(debian_packages, "run", return_value="Package: other\n"):
            with self.assertRaisesRegex(Failure, "linux-image-arm64:arm64 names no kernel"):
                guest_image._kernel_package("arm64", print)


class Tools(unittest.TestCase):
    def test_missing_tool_is_named_with_its_package(self):
        with self.assertRaisesRegex(Failure, "^no-such-tool is not installed: "
                                             "scripts/install-packages installs some-package$"):
            debian_packages.find_tool("no-such-tool", "some-package")

    def test_failing_tool_is_shown_with_its_last_line(self):
        with self.assertRaisesRegex(Failure, "sh -c .*: the reason$"):
            debian_packages.run(["sh", "-c", "echo first >&2; echo the reason >&2; exit 1"])


class BusyboxLayer(unittest.TestCase):
    def test_every_link_leads_to_busybox_before_and_after_the_hand_over(self):
        with tempfile.TemporaryDirectory() as scratch:
            busybox = os.path.join(scratch, "busybox")
            with open(busybox, "w", encoding="ascii") as file:
                file.write("#!/bin/sh\nprintf '%s\\n' bin/sh sbin/init usr/bin/env usr/sbin/httpd\n")
            os.chmod(busybox, 0o755)
            layer = os.path.join(scratch, "layer")
            guest_image._make_layer(busybox, layer, "amd64")
            found = subprocess.run(["find", ".", "-type", "l", "-printf", "%p %l\\n"], cwd=layer,
                                   capture_output=True, text=True, check=True).stdout
            self.assertEqual(sorted(found.splitlines()),
                             ["./usr/bin/env busybox", "./usr/bin/sh busybox",
                              "./usr/sbin/httpd ../bin/busybox", "./usr/sbin/init ../bin/busybox"])


if __name__ == "__main__":
    unittest.main()
