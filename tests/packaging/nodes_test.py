# SPDX-License-Identifier: Apache-2.0
"""docs/nodes.md is the one table of the driver's nodes: the service opens those and no others, the
doctor asks for them in the same way, and each init script hands over those of its class."""

import re
import unittest

import init_script
import project

DOCUMENT = project.text(project.ROOT / "docs/nodes.md")
CLASSES = {"legacy": "legacy", "LED": "leds", "force feedback": "inputff"}
FLAGS = {"read-write": "O_RDWR", "for reading": "O_RDONLY", "for writing": "O_WRONLY"}
CALIBRATION = "/efs/FactoryApp/vibrator_calibration"


def directories():
    return dict(re.findall(r"(?m)^\| ([\w ]+) \| `(/[^`]+/)` \|$", DOCUMENT))


def nodes():
    """{path: how it is opened}, those that are never opened among them."""
    found = {}
    for name, classes, opened in re.findall(r"(?m)^\| `(\w+)` \| ([^|]+) \| ([^|]+) \|", DOCUMENT):
        for each in classes.split(","):
            found[directories()[each.strip()] + name] = opened.strip()
    return found


def of_class(name):
    return {path for path, opened in nodes().items()
            if path.startswith(directories()[name]) and opened != "never"}


class Nodes(unittest.TestCase):
    def test_of_the_service_are_those_of_the_table(self):
        constants = {path for path in project.string_literals(project.SERVICE / "Constants.h")
                     if path.startswith("/sys/class/") and not path.endswith("/dc_pmic")}
        probing = project.SERVICE / "hwapi/Probing.cpp"
        leaves = re.findall(r'\{THE_DEVICE_\w+,\s*"(\w+)"', project.code(probing))
        literals = [each for each in project.string_literals(probing)
                    if each.startswith("/sys/class/")]
        both = [each for each in literals if each.endswith("/")]
        self.assertEqual(set(both), {directories()["legacy"], directories()["LED"]})
        self.assertEqual(constants | {each for each in literals if each not in both}
                         | {place + leaf for place in both for leaf in leaves}, set(nodes()))

    def test_of_the_doctor_are_those_of_the_table(self):
        source = project.text(project.ROOT / "vibctl/doctor/nodes.h")
        asked = {name.split("/")[-1]: flags for name, flags in
                 re.findall(r'"(?:/sys[\w/]*/)?(\w+)",\s*(O_\w+)\}', source)}
        self.assertEqual(asked, {path.split("/")[-1]: FLAGS[opened]
                                 for path, opened in nodes().items() if opened != "never"})

    def test_of_a_class_are_handed_over_by_its_init_script(self):
        for name, file in CLASSES.items():
            with self.subTest(name):
                path = project.HAL / f"init/init.vibrator-{file}.rc"
                (section,) = init_script.parse(project.text(path))
                # Class "hal" is started by the action "boot", which comes next.
                self.assertEqual(section.words, ["on", "early-boot"])
                handed_over = {option[3] for option in section.options
                               if option[:3] == ["chown", "system", "system"]}
                self.assertEqual(handed_over, of_class(name))
                others = [option for option in section.options if option[-1] not in handed_over]
                self.assertEqual(others, [] if file != "inputff" else [
                    ["chown", "root", "system", CALIBRATION], ["chmod", "0640", CALIBRATION],
                    ["restorecon", CALIBRATION]])

    def test_scripts_are_those_of_the_classes(self):
        self.assertEqual({path.name for path in (project.HAL / "init").iterdir()},
                         {f"init.vibrator-{file}.rc" for file in CLASSES.values()})


if __name__ == "__main__":
    unittest.main()
