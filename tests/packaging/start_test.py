# SPDX-License-Identifier: Apache-2.0
"""How a phone starts the service and finds it: init script, VINTF files, product makefile."""

import json
import re
import unittest
import xml.etree.ElementTree

import blueprint
import init_script
import project

SCRIPT = project.SERVICE / f"{project.PROGRAM}.rc"
FRAGMENT = project.SERVICE / f"{project.PROGRAM}.xml"
MATRIX = project.HAL / "compatibility_matrix.quorvan.xml"
EXECUTABLE = f"/vendor/bin/hw/{project.PROGRAM}"


class InitScript(unittest.TestCase):
    def setUp(self):
        (self.service,) = init_script.parse(project.text(SCRIPT))

    def test_starts_the_program_under_a_vendor_name(self):
        keyword, name, executable = self.service.words
        self.assertEqual((keyword, executable), ("service", EXECUTABLE))
        self.assertRegex(name, r"^vendor\.[a-z-]+$")

    def test_user_and_groups_are_those_the_nodes_need(self):
        self.assertIn(["user", "system"], self.service.options)
        self.assertIn(["group", "system", "input", "log"], self.service.options)

    def test_is_a_hardware_service_that_is_started_again(self):
        self.assertIn(["class", "hal"], self.service.options)
        self.assertIn(["restart_period", "5"], self.service.options)
        words = {option[0] for option in self.service.options}
        self.assertFalse(words & {"oneshot", "disabled", "critical", "interface"})

    def test_has_no_capabilities(self):
        self.assertIn(["capabilities"], self.service.options)

    def test_says_nothing_else(self):
        self.assertEqual([option[0] for option in self.service.options],
                         ["class", "user", "group", "capabilities", "restart_period"])


class Declaration(unittest.TestCase):
    def hals(self, path, tag, kind):
        root = xml.etree.ElementTree.parse(path).getroot()
        self.assertEqual(root.tag, tag)
        self.assertEqual(root.attrib, {"version": "1.0", "type": kind})
        return list(root)

    def test_fragment_declares_the_standard_service_alone(self):
        (hal,) = self.hals(FRAGMENT, "manifest", "device")
        self.assertEqual(hal.attrib, {"format": "aidl"})
        self.assertEqual([(each.tag, each.text) for each in hal],
                         [("name", "android.hardware.vibrator"), ("version", "2"),
                          ("fqname", "IVibrator/default")])

    def test_what_is_declared_is_what_the_program_registers(self):
        (hal,) = self.hals(FRAGMENT, "manifest", "device")
        interface, instance = hal.findtext("fqname").split("/")
        self.assertTrue((project.STANDARD_AIDL / hal.findtext("name").replace(".", "/")
                         / f"{interface}.aidl").is_file())
        self.assertEqual(int(hal.findtext("version")), project.standard_version())
        main = project.SERVICE / "main.cpp"
        self.assertIn(f"/{instance}", project.string_literals(main))
        self.assertIn("std::string(Vibrator::descriptor)", project.code(main))
        self.assertIn(f"public Bn{interface[1:]}",
                      project.code(project.SERVICE / "Vibrator.h"))

    def test_no_manifest_promises_the_extension(self):
        manifests = []
        for path in project.HAL.rglob("*.xml"):
            root = xml.etree.ElementTree.parse(path).getroot()
            if root.tag == "manifest":
                manifests.append(path)
                self.assertNotIn(project.EXTENSION_PACKAGE,
                                 [each.findtext("name") for each in root])
        self.assertEqual(manifests, [FRAGMENT])

    def test_matrix_asks_for_the_extension_as_frozen_without_insisting(self):
        (hal,) = self.hals(MATRIX, "compatibility-matrix", "framework")
        self.assertEqual(hal.attrib, {"format": "aidl", "optional": "true"})
        self.assertEqual(hal.findtext("name"), "vendor.quorvan.hardware.vibrator")
        self.assertEqual(hal.findtext("version"), "4")
        self.assertEqual(hal.findtext("interface/name"), "IZelVibrator")
        self.assertEqual(hal.findtext("interface/instance"), "default")
        self.assertEqual(project.extension_version(), 4)
        self.assertTrue((project.HAL / "vendor/quorvan/hardware/vibrator/IZelVibrator.aidl")
                        .is_file())


class Product(unittest.TestCase):
    def test_makefile_brings_program_and_policy(self):
        lines = [line for line in project.text(project.HAL / "vibrator.mk").splitlines()
                 if line and not line.startswith("#")]
        self.assertEqual(lines, [
            "QVX_VIBRATOR_DIRECTORY := $(patsubst %/,%,$(dir $(lastword $(MAKEFILE_LIST))))",
            "PRODUCT_PACKAGES += android.hardware.vibrator-service.quorvan",
            "PRODUCT_COPY_FILES += $(foreach class,$(QVX_VIBRATOR_CLASS), \\",
            "    $(QVX_VIBRATOR_DIRECTORY)/init/init.vibrator-$(class).rc:"
            "$(TARGET_COPY_OUT_VENDOR)/etc/init/init.vibrator-$(class).rc)",
            "BOARD_VENDOR_SEPOLICY_DIRS += $(QVX_VIBRATOR_DIRECTORY)/sepolicy"])
        self.assertTrue((project.HAL / "sepolicy").is_dir())

    def test_test_mapping_names_tests_that_exist(self):
        mapping = json.loads(project.text(project.HAL / "TEST_MAPPING"))
        names = {group: [test["name"] for test in tests] for group, tests in mapping.items()}
        built = [module.name for module in blueprint.read(project.ROOT / "hal-server/vibrator/aidl/tests/Android.bp")
                 if module.kind == "cc_test"]
        self.assertEqual(names["presubmit"], built)
        # The platform's own test of every vibrator service.
        self.assertEqual(names["postsubmit"], ["VtsHalVibratorTargetTest"])

    def test_owners_are_addresses_or_per_file_rules(self):
        lines = [line for line in project.text(project.HAL / "OWNERS").splitlines()
                 if line and not line.startswith("#")]
        address = r"[\w.+-]+@[\w-]+(\.[\w-]+)+"
        self.assertTrue(any(re.fullmatch(address, line) for line in lines))
        for line in lines:
            with self.subTest(line):
                self.assertRegex(line, rf"^(per-file [\w*.,-]+ = )?{address}$")


if __name__ == "__main__":
    unittest.main()
