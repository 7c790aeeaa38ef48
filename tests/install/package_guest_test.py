# SPDX-License-Identifier: Apache-2.0
"""The Debian package: its fields and files, and its programs at work in the handset."""

import pathlib
import re
import subprocess
import tempfile
import unittest

from installation import BUILD, FILES, PROJECT, SERVICE, files_below, run


class Package(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        # Below the build folder, because the guest sees that.
        cls.folder = tempfile.TemporaryDirectory(prefix="package-", dir=BUILD)
        cls.root = pathlib.Path(cls.folder.name)
        cls.root.chmod(0o755)  # for the user that the service runs as
        run("cpack", "-G", "DEB", "--config", BUILD / "CPackConfig.cmake", "-B", cls.root,
            cwd=cls.root)
        packages = list(cls.root.glob("*.deb"))
        if len(packages) != 1:
            raise AssertionError(f"cpack has made {packages}")
        cls.package = packages[0]
        run("dpkg-deb", "--extract", cls.package, cls.root / "unpacked")

    @classmethod
    def tearDownClass(cls):
        cls.folder.cleanup()

    def field(self, name):
        return run("dpkg-deb", "--field", self.package, name).strip()

    def test_is_named_as_debian_names_packages(self):
        architecture = run("dpkg", "--print-architecture").strip()
        self.assertEqual(self.package.name, f"qvx-vibrator_1.0.0_{architecture}.deb")
        self.assertEqual(self.field("Package"), "qvx-vibrator")
        self.assertEqual(self.field("Version"), "1.0.0")
        self.assertEqual(self.field("Architecture"), architecture)
        self.assertEqual(self.field("Section"), "utils")
        self.assertTrue(self.field("Maintainer"))
        self.assertTrue(self.field("Description"))

    def test_depends_on_the_libraries_that_its_programs_need(self):
        names = {re.split(r"[ (]", one.strip())[0] for one in self.field("Depends").split(",")}
        self.assertEqual(names, {"android-libbase", "android-liblog", "libc6", "libfmt9",
                                 "libgcc-s1", "libstdc++6", "libtinyxml2-9"})

    def test_holds_the_installed_files_owned_by_root(self):
        self.assertEqual(files_below(self.root / "unpacked", "/usr"), FILES)
        for line in run("dpkg-deb", "--contents", self.package).splitlines():
            self.assertEqual(line.split()[1], "root/root", line)

    def test_has_scripts_that_a_shell_understands(self):
        run("dpkg-deb", "--control", self.package, self.root / "control")
        for script in ("postinst", "prerm"):
            path = self.root / "control" / script
            self.assertEqual(path.stat().st_mode & 0o777, 0o755)
            run("sh", "-n", path)
        # A package that is only unpacked again has nothing to make.
        run("sh", self.root / "control" / "postinst", "abort-upgrade")
        run("sh", self.root / "control" / "prerm", "upgrade")

    def test_is_stripped(self):
        programs = self.root / "unpacked/usr/libexec/qvx-vibrator"
        self.assertNotIn(".symtab", run("readelf", "--sections", programs / SERVICE))

    def test_makes_a_handset_vibrate(self):
        usr = self.root / "unpacked" / "usr"
        # The phone's own service manager makes way for the package's, which finds the package's
        # fragment; the service then runs where the simulated nodes are.
        script = f"""
            set -eu
            phone up --no-service
            manager=$(cat /proc/[0-9]*/stat | sed -n 's/^\\([0-9]*\\) (servicemanager).*/\\1/p')
            kill $manager
            while [ -e /proc/$manager/exe ]; do sleep 0.1; done
            rm -r /vendor/etc/vintf/manifest/*
            {usr}/libexec/qvx-vibrator/servicemanager --root {usr}/share/qvx-vibrator &
            phone exec --user 1000 -- {usr}/libexec/qvx-vibrator/{SERVICE} 2>/run/service.log &
            for i in $(seq 40); do
                {usr}/bin/vibctl list | grep -q IVibrator/default && break
                sleep 0.5
            done
            {usr}/bin/vibctl std on 500
            {usr}/bin/vibctl doctor
            kill %2 %1
            phone down
        """
        result = subprocess.run(
            [PROJECT / "handset" / "run", "--build", BUILD, "--profile", "off", "--timeout", "60", "--",
             "sh", "-c", script], capture_output=True, text=True)
        self.assertEqual(result.returncode, 0, result.stdout + result.stderr)
        self.assertIn("\non: ok\n", result.stdout)
        self.assertIn(f"\nok       declaration: {usr}/share/qvx-vibrator/vendor/etc/vintf/manifest/"
                      f"{SERVICE}.xml declares ", result.stdout)
        self.assertNotIn("\nbad ", result.stdout)


if __name__ == "__main__":
    unittest.main()
