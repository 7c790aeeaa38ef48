# SPDX-License-Identifier: Apache-2.0
"""An interface that devices rely on does not change under its version: a changed .aidl file needs a
new one. Shown on copies of the interface, changed as someone might."""

import pathlib
import shutil
import subprocess
import tempfile
import unittest

import project

COMPILER = project.ROOT / "platform/aidl/aidl"
VERSION = str(project.extension_version())
DIRECTORY = project.EXTENSION_PACKAGE.replace(".", "/")


def compiler(*arguments):
    return subprocess.run(["/usr/bin/python3", "-B", str(COMPILER), *map(str, arguments)],
                          capture_output=True, text=True, check=False)


def contents(directory):
    return {str(path.relative_to(directory)): path.read_text(encoding="utf-8")
            for path in directory.rglob("*.aidl")}


def complaints(interface):
    """What is wrong with the interface in this directory, laid out as the extension's is: any of
    "invalid", "changed", "incompatible" and "hash"."""
    found = []
    frozen = interface / "aidl_api" / project.EXTENSION_PACKAGE / VERSION
    include = f"--include={project.STANDARD_AIDL}"
    with tempfile.TemporaryDirectory() as directory:
        now = pathlib.Path(directory)
        if compiler("--dumpapi", now, include, f"--include={interface}",
                    *project.aidl_files(interface, project.EXTENSION_PACKAGE)).returncode != 0:
            return ["invalid"]
        if contents(now) != contents(frozen):
            found.append("changed")
        if compiler("--checkapi", include, frozen, now).returncode != 0:
            found.append("incompatible")
    hashed = compiler("--hash", frozen, int(VERSION) - 1)
    if hashed.stdout != project.text(frozen / ".hash"):
        found.append("hash")
    return found


class ChangedInterface(unittest.TestCase):
    def setUp(self):
        directory = tempfile.TemporaryDirectory()
        self.addCleanup(directory.cleanup)
        self.copy = pathlib.Path(directory.name)
        for name in ("vendor", "aidl_api"):
            shutil.copytree(project.HAL / name, self.copy / name)

    def change(self, name, before, after):
        file = self.copy / name
        text = project.text(file)
        self.assertEqual(text.count(before), 1)
        file.write_text(text.replace(before, after), encoding="utf-8")

    def test_interface_as_it_is_keeps_its_version(self):
        self.assertEqual(complaints(project.HAL), [])
        self.assertEqual(complaints(self.copy), [])

    def test_new_field_needs_a_new_version(self):
        name = f"{DIRECTORY}/ZelPlaybackPacket.aidl"
        text = project.text(self.copy / name).rstrip()
        (self.copy / name).write_text(text.removesuffix("}") + "    int added;\n}\n",
                                      encoding="utf-8")
        self.assertEqual(complaints(self.copy), ["changed"])

    def test_new_type_needs_a_new_version(self):
        (self.copy / DIRECTORY / "ZelNew.aidl").write_text(
            f"package {project.EXTENSION_PACKAGE};\n@VintfStability\nparcelable ZelNew {{\n}}\n",
            encoding="utf-8")
        self.assertEqual(complaints(self.copy), ["changed"])

    def test_lost_type_is_not_allowed_in_any_version(self):
        (self.copy / DIRECTORY / "ZelPlaybackPacket.aidl").unlink()
        self.assertEqual(complaints(self.copy), ["invalid"])

    def test_renamed_method_is_not_allowed_in_any_version(self):
        self.change(f"{DIRECTORY}/IZelVibrator.aidl", " performPlaybackEngine(", " playSequence(")
        self.assertEqual(complaints(self.copy), ["changed", "incompatible"])

    def test_comment_is_no_change(self):
        self.change(f"{DIRECTORY}/IZelVibrator.aidl", "@VintfStability\n",
                    "// An aside.\n@VintfStability\n")
        self.assertEqual(complaints(self.copy), [])

    def test_frozen_files_stay_under_their_hash(self):
        frozen = f"aidl_api/{project.EXTENSION_PACKAGE}/{VERSION}/{DIRECTORY}"
        self.change(f"{frozen}/ZelPlaybackPacket.aidl", "package vendor.", "package  vendor.")
        self.assertEqual(complaints(self.copy), ["changed", "hash"])

    def test_hash_of_another_version_is_refused(self):
        file = self.copy / "aidl_api" / project.EXTENSION_PACKAGE / VERSION / ".hash"
        file.write_text("0" * 40 + "\n", encoding="utf-8")
        self.assertEqual(complaints(self.copy), ["hash"])


if __name__ == "__main__":
    unittest.main()
