# SPDX-License-Identifier: Apache-2.0
"""What docs/android.md tells a board engineer to copy, and the files that it names."""

import re
import unittest

import project

DOCUMENT = project.ROOT / "docs/android.md"


def blocks(language):
    return re.findall(rf"^```{language}\n(.*?)^```$", project.text(DOCUMENT),
                      re.MULTILINE | re.DOTALL)


class Document(unittest.TestCase):
    def test_makefile_lines_name_the_makefile_and_a_script(self):
        (text,) = blocks("make")
        script, path = re.fullmatch(r"QVX_VIBRATOR_CLASS := (\w+)\n"
                                    r"\$\(call inherit-product, vendor/quorvan/(.*)\)\n",
                                    text).groups()
        self.assertTrue((project.ROOT / path).is_file())
        self.assertTrue((project.HAL / f"init/init.vibrator-{script}.rc").is_file())

    def test_log_tags_are_the_services(self):
        (tags,) = re.findall(r"logcat -d -s (.*)", project.text(DOCUMENT))
        self.assertEqual(set(tags.split()),
                         set(re.findall(r'#define LOG_TAG "([^"]+)"', "".join(
                             project.text(path) for path in project.service_files(".cpp")))))

    def test_files_that_it_names_exist(self):
        text = project.text(DOCUMENT)
        first_cells = "".join(re.findall(r"(?m)^\| (`[^|]*) \| [^|]* \|$", text))
        names = {name for name in re.findall(r"`([^`]+)`", first_cells)
                 if not name.startswith("CONFIG_")} | set(re.findall(r"`(init/[^`]+)`", text))
        self.assertLessEqual({"vibrator.mk", "init/init.vibrator-leds.rc"}, names)
        for name in names:
            with self.subTest(name):
                self.assertTrue((project.HAL / name).exists())


if __name__ == "__main__":
    unittest.main()
