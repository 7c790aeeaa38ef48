# SPDX-License-Identifier: Apache-2.0
"""The readers of build files and init scripts themselves: what they take, and what they refuse."""

import unittest

import lark

import blueprint
import init_script


class Blueprint(unittest.TestCase):
    def test_modules_have_properties_of_every_kind(self):
        modules = blueprint.parse("""
            // a comment
            cc_binary {
                name: "a",  /* another */
                vendor: true, stl: false, level: 31,
                srcs: ["b.cpp", "c.cpp",],
                backend: { ndk: { enabled: true, }, },
            }
            package {}
            """)
        self.assertEqual([(each.kind, each.name) for each in modules],
                         [("cc_binary", "a"), ("package", None)])
        self.assertEqual(modules[0].properties,
                         {"name": "a", "vendor": True, "stl": False, "level": 31,
                          "srcs": ["b.cpp", "c.cpp"], "backend": {"ndk": {"enabled": True}}})

    def test_what_the_build_refuses_is_refused(self):
        for text in ('cc_binary { name: "a" ', 'cc_binary { name = "a" }', "cc_binary { name: a }",
                     'cc_binary { name: "a" srcs: ["b"] }', 'cc_binary { srcs: ["a" "b"] }',
                     'name: "a"', 'cc_binary { name: "a", name: "b" }', "true { }"):
            with self.subTest(text):
                self.assertRaises((lark.LarkError, ValueError), blueprint.parse, text)

    def test_defaults_add_to_lists_and_give_way_elsewhere(self):
        modules = blueprint.parse("""
            cc_defaults { name: "d", cflags: ["-Wall"], cpp_std: "c++17", vendor: true }
            cc_test { name: "t", defaults: ["d"], cflags: ["-g"], cpp_std: "c++20" }
            """)
        joined = blueprint.with_defaults(modules[1], modules)
        self.assertEqual(joined["cflags"], ["-Wall", "-g"])
        self.assertEqual(joined["cpp_std"], "c++20")
        self.assertIs(joined["vendor"], True)


class InitScript(unittest.TestCase):
    def test_sections_have_options(self):
        (service,) = init_script.parse(
            "# a comment\nservice a /b\n    class hal # why\n\n  task x y\n")
        self.assertEqual(service.words, ["service", "a", "/b"])
        self.assertEqual(service.options, [["class", "hal"], ["task", "x", "y"]])

    def test_option_outside_a_section_is_refused(self):
        self.assertRaises(ValueError, init_script.parse, "class hal\nservice a /b\n")


if __name__ == "__main__":
    unittest.main()
