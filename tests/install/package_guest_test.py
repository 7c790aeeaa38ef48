# SPDX-License-Identifier: Apache-2.0
"""The Debian package: its fields and files, and its units under a real systemd in the handset."""

import pathlib
import re
import shutil
import subprocess
import tempfile
import unittest

from installation import BUILD, FILES, PROJECT, files_below, run


class Package(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        # Below the build directory, because the guest sees that.
        cls.directory = tempfile.TemporaryDirectory(prefix="package-", dir=BUILD)
        cls.root = pathlib.Path(cls.directory.name)
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
        cls.directory.cleanup()

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
                                 "libgcc-s1", "libjsoncpp25", "libstdc++6", "libtinyxml2-9"})

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

    def test_has_nothing_that_lintian_calls_an_error(self):
        run("lintian", "--allow-root", "--fail-on", "error", self.package)

    def test_programs_are_stripped_hardened_and_without_run_path(self):
        usr = self.root / "unpacked/usr"
        programs = [usr / "bin/vibctl", *usr.glob("libexec/qvx-vibrator/*"),
                    *usr.glob("lib/**/qvx-vibrator/*.so")]
        self.assertEqual(len(programs), 4)
        for program in programs:
            facts = run("readelf", "--wide", "--file-header", "--sections", "--segments",
                        "--dynamic", "--dyn-syms", program)
            for fact in ("Type:                              DYN", "GNU_RELRO", "NOW",
                         "__stack_chk_fail", "_chk@"):
                self.assertIn(fact, facts, program)
            for fact in ("RUNPATH", "RPATH", ".symtab"):
                self.assertNotIn(fact, facts, program)

    def test_runs_under_systemd(self):
        tools = self.root / "tools"
        tools.mkdir()
        for tool in ("dpkg", "dpkg-deb", "dpkg-split", "tar"):
            shutil.copy(shutil.which(tool), tools)
        result = subprocess.run(
            [PROJECT / "handset" / "run", "--build", BUILD, "--counted", "--profile", "off",
             "--timeout", "200", "--", "sh", PROJECT / "tests/install/under_systemd.sh",
             self.package, tools, BUILD, PROJECT / "handset/profiles/leds.json"],
            capture_output=True, text=True)
        self.assertEqual(result.returncode, 0, result.stdout + result.stderr)
        self.assertEqual([line for line in result.stdout.splitlines() if line[:4] == "ok: "], [
            "ok: the package is installed, and has binder loaded",
            "ok: nobody else becomes the manager first",
            "ok: every user reaches the service",
            "ok: the motor runs",
            "ok: a lost manager comes again, and the service registers with it",
            "ok: a killed service comes again",
            "ok: a service that does not answer is started anew",
            "ok: an upgrade restarts the units",
            "ok: the kernel has nothing to say about priorities",
            "ok: all stop together"])


if __name__ == "__main__":
    unittest.main()
