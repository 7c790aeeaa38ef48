# SPDX-License-Identifier: Apache-2.0
"""What docs/android.md tells a board engineer to copy, and the files that it names."""

import re
import unittest

import init_script
import project

DOCUMENT = project.ROOT / "docs/android.md"


def blocks(language):
    return re.findall(rf"^```{language}\n(.*?)^```$", project.text(DOCUMENT),
                      re.MULTILINE | re.DOTALL)


def nodes_to_hand_over():
    """Every node that the service writes or that may be its user's alone: the fixed ones, and in
    both classes the leaves that probing puts behind the class's folder."""
    constants = set(project.string_literals(project.SERVICE / "Constants.h"))
    fixed = {path for path in constants if path.startswith("/sys/class/")
             and "/vib_info_class/" not in path and not path.endswith("/dc_pmic")}
    probing = project.SERVICE / "Probing.cpp"
    leaves = re.findall(r'\{THE_DEVICE_\w+,\s*"(\w+)"', project.code(probing))
    folders = [literal for literal in project.string_literals(probing) if literal.endswith("/")
               and literal.startswith("/sys/class/")]
    others = {literal for literal in project.string_literals(probing)
              if literal.startswith("/sys/class/") and not literal.endswith("/")}
    assert len(leaves) == 21 and len(folders) == 2
    return fixed | others | {folder + leaf for folder in folders for leaf in leaves}


class Document(unittest.TestCase):
    def test_init_section_hands_over_every_node_the_service_opens(self):
        (text,) = blocks("rc")
        (section,) = init_script.parse(text)
        # Class "hal" is started by the action "boot", which comes next.
        self.assertEqual(section.words, ["on", "early-boot"])
        self.assertEqual({tuple(option[:3]) for option in section.options},
                         {("chown", "system", "system")})
        self.assertEqual({option[3] for option in section.options}, nodes_to_hand_over())

    def test_makefile_line_names_the_makefile(self):
        (text,) = blocks("make")
        path = re.fullmatch(r"\$\(call inherit-product, vendor/quorvan/(.*)\)\n", text)[1]
        self.assertTrue((project.ROOT / path).is_file())

    def test_files_of_the_table_exist(self):
        names = re.findall(r"`([^`]+)`",
                           "".join(re.findall(r"(?m)^\| (`[^|]*) \| [^|]* \|$",
                                              project.text(DOCUMENT))))
        self.assertIn("vibrator.mk", names)
        for name in names:
            with self.subTest(name):
                self.assertTrue((project.HAL / name).exists())


if __name__ == "__main__":
    unittest.main()
