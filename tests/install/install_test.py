# SPDX-License-Identifier: Apache-2.0
"""cmake --install: the files, the units, and programs that run from where they are put."""

import configparser
import os
import pathlib
import re
import shutil
import subprocess
import tempfile
import unittest

from installation import BUILD, FILES, PROJECT, SERVICE, files_below, install, run

# What a unit needs of the system it is verified in.
TARGETS = ("basic", "multi-user", "shutdown", "sysinit", "time-set", "time-sync", "timers")

EVERYWHERE = {
    "CapabilityBoundingSet": "", "NoNewPrivileges": "yes", "ProtectSystem": "strict",
    "ProtectHome": "yes", "PrivateNetwork": "yes", "MemoryDenyWriteExecute": "yes",
    "DevicePolicy": "closed", "LimitNICE": "40", "UMask": "0077",
    # As the init script has it.
    "Restart": "always", "RestartSec": "5",
}


class Installation(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        cls.directory = tempfile.TemporaryDirectory(prefix="installation-")
        cls.root = pathlib.Path(cls.directory.name)
        install(cls.root, "/usr")

    @classmethod
    def tearDownClass(cls):
        cls.directory.cleanup()

    def test_brings_these_files_and_no_other(self):
        self.assertEqual(files_below(self.root, "/usr"), FILES)
        self.assertEqual(os.listdir(self.root), ["usr"])

    def test_brings_the_same_below_another_prefix(self):
        with tempfile.TemporaryDirectory(prefix="installation-") as name:
            other = pathlib.Path(name)
            install(other, "/opt/vibrator")
            self.assertEqual(files_below(other, "/opt/vibrator"), FILES)
            unit = self.unit("qvx-servicemanager", other / "opt/vibrator")
            self.assertEqual(unit["Service"]["ExecStart"],
                             "/opt/vibrator/libexec/qvx-vibrator/servicemanager "
                             "--root /opt/vibrator/share/qvx-vibrator "
                             "--rules /opt/vibrator/share/qvx-vibrator/services.rules")
            self.assertEqual(run(other / "opt/vibrator/bin/vibctl", "--version"), "vibctl 1.0.0\n")

    def test_programs_find_their_library_where_they_are_put(self):
        self.assertEqual(run(self.root / "usr/bin/vibctl", "--version"), "vibctl 1.0.0\n")
        programs = self.root / "usr/libexec/qvx-vibrator"
        self.assertIn("--root DIR", run(programs / "servicemanager", "--help"))
        for program in (programs / "servicemanager", programs / SERVICE):
            needed = run("ldd", program)
            self.assertNotIn("not found", needed)
            self.assertIn(f"=> {programs}/../../lib/", needed)

    def test_no_program_takes_a_library_from_where_it_is_started(self):
        installed = [self.root / "usr/bin/vibctl", *self.root.glob("usr/libexec/qvx-vibrator/*")]
        built = [BUILD / "bin" / program.name for program in installed]
        self.assertEqual(len(built), 3)
        for program in [*installed, *built, *BUILD.glob("lib/*.so")]:
            path = re.search(r"R(?:UN)?PATH.*\[(.*)\]", run("readelf", "--dynamic", program)).group(1)
            for directory in path.split(":"):
                self.assertRegex(directory, r"^(/|\$ORIGIN/)", f"{program}: {path}")

    def test_fragment_is_the_phones(self):
        name = f"{SERVICE}.xml"
        installed = self.root / "usr/share/qvx-vibrator/vendor/etc/vintf/manifest" / name
        own = PROJECT / "hal-server/vibrator/aidl/default" / name
        self.assertEqual(installed.read_bytes(), own.read_bytes())

    @staticmethod
    def unit(name, prefix):
        parser = configparser.ConfigParser(interpolation=None, strict=False)
        parser.optionxform = str
        parser.read(prefix / f"lib/systemd/system/{name}.service")
        return parser

    def test_units_start_the_installed_programs_as_their_own_users(self):
        manager = self.unit("qvx-servicemanager", self.root / "usr")["Service"]
        self.assertEqual(manager["ExecStart"], "/usr/libexec/qvx-vibrator/servicemanager "
                                               "--root /usr/share/qvx-vibrator "
                                               "--rules /usr/share/qvx-vibrator/services.rules")
        self.assertEqual(manager["User"], "qvx-servicemanager")
        service = self.unit("qvx-vibrator", self.root / "usr")
        self.assertEqual(service["Service"]["ExecStart"],
                         f"/usr/libexec/qvx-vibrator/{SERVICE}")
        self.assertEqual(service["Service"]["User"], "qvx-vibrator")
        self.assertEqual(service["Unit"]["Requires"], "qvx-servicemanager.service")
        self.assertEqual(service["Unit"]["After"], "qvx-servicemanager.service")

    def test_units_give_up_what_they_do_not_need_but_not_the_nodes(self):
        for name in ("qvx-servicemanager", "qvx-vibrator"):
            section = self.unit(name, self.root / "usr")["Service"]
            for key, value in EVERYWHERE.items():
                self.assertEqual(section[key], value, f"{name}: {key}")
            for key in ("TasksMax", "MemoryMax", "SystemCallFilter"):
                self.assertIn(key, section, name)
            self.assertEqual(self.unit(name, self.root / "usr")["Unit"]["StartLimitIntervalSec"],
                             "0")
        section = self.unit("qvx-vibrator", self.root / "usr")["Service"]
        text = (self.root / "usr/lib/systemd/system/qvx-vibrator.service").read_text()
        self.assertIn("\nDeviceAllow=/dev/binder rw\n", text)
        self.assertIn("\nDeviceAllow=char-input rw\n", text)
        # Each would take a node or the input-device list away.
        for key in ("PrivateDevices", "ProtectKernelTunables", "ProcSubset", "DynamicUser"):
            self.assertNotIn(key, section)

    def test_units_are_what_systemd_understands(self):
        if shutil.which("systemd-analyze") is None:
            self.skipTest("systemd-analyze is not installed")
        directory = self.root / "usr/lib/systemd/system"
        stubs = [directory / f"{target}.target" for target in TARGETS]
        for stub in stubs:
            stub.write_text("[Unit]\nDescription=stub\n")
        # Programs of the system that the units start.
        for program in ("usr/bin/timeout", "bin/sh"):
            path = self.root / program
            path.parent.mkdir(parents=True, exist_ok=True)
            path.write_text("#!/bin/sh\n")
            path.chmod(0o755)
            stubs.append(path)
        try:
            result = subprocess.run(
                ["systemd-analyze", "verify", "--man=no", f"--root={self.root}",
                 "qvx-servicemanager.service", "qvx-vibrator.service",
                 "qvx-vibrator-watchdog.service", "qvx-vibrator-watchdog.timer"],
                capture_output=True, text=True)
        finally:
            for stub in stubs:
                stub.unlink()
        self.assertEqual((result.returncode, result.stdout + result.stderr), (0, ""))

    def test_users_are_none_that_the_service_manager_takes_for_an_app(self):
        text = (self.root / "usr/lib/sysusers.d/qvx-vibrator.conf").read_text()
        lines = [line.split(maxsplit=3) for line in text.splitlines()
                 if not line.startswith("#")]
        # "-": the next free number of the system's own users.
        self.assertEqual([line[:3] for line in lines],
                         [["u", "qvx-servicemanager", "-"], ["u", "qvx-vibrator", "-"]])


if __name__ == "__main__":
    unittest.main()
