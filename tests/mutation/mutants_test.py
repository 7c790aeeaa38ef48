# SPDX-License-Identifier: Apache-2.0
"""What is changed in a source, and that the choice of the changes holds."""

import pathlib
import tempfile
import unittest

try:
    import mutants
except ImportError:  # of what ./check --all installs
    raise unittest.SkipTest("python3-clang is not installed") from None

HEADER = """#define TWICE(x) ((x) + (x))
#define O_RDONLY 0
#define INFO 0
#define LOG(severity) say(#severity)
enum Answer { YES, NO };
Answer answer(Answer);
void say(const char*);
void open(const char*, int, int);
"""


def changed(body):
    """Each mutant of a function with this body, as the body it makes of it."""
    text = HEADER + f"bool held(int a, int b, bool c) {{ {body} }}\n"
    with tempfile.TemporaryDirectory() as directory:
        source = pathlib.Path(directory, "held.cpp")
        source.write_text(text, "ascii")
        finder = mutants.Finder(directory)
        finder.parse(source, ["-std=c++17"])
    bodies = set()
    for file, begin, end, replacement in finder.found:
        assert file == "held.cpp"
        whole = text[:begin] + replacement + text[end:]
        bodies.add(whole.partition("bool c) { ")[2].rpartition(" }")[0])
    return bodies


class Changes(unittest.TestCase):
    def test_of_comparisons_are_the_boundary_and_the_opposite(self):
        self.assertEqual(changed("return a < b;"), {"return a <= b;", "return a >= b;"})
        self.assertEqual(changed("return a == b;"), {"return a != b;"})

    def test_of_arithmetic_and_logic(self):
        self.assertEqual(changed("a += b; return c && c;"),
                         {"a -= b; return c && c;", "(void)0; return c && c;",
                          "a += b; return c || c;"})
        self.assertEqual(changed("return !c;"), {"return c;"})
        self.assertEqual(changed("for (;; ++a) {}"), {"for (;; --a) {}"})

    def test_of_constants(self):
        self.assertEqual(changed("return true;"), {"return false;"})
        self.assertEqual(changed("b = 7;"), {"b = (7 + 1);", "b = (7 - 1);", "(void)0;"})
        self.assertEqual(changed("a = 'x';"), {"a = ('x' + 1);", "(void)0;"})

    def test_of_calls_and_strings(self):
        self.assertEqual(changed('say("hello");'), {'(void)0;', 'say("~" "hello");', 'say("hell");'})
        self.assertEqual(changed('say("a" "b");'), {'(void)0;', 'say("~" "a" "b");', 'say("a" "");'})

        self.assertEqual(changed('say("a\\n");'), {'(void)0;', 'say("~" "a\\n");', 'say("a");'})

    def test_of_the_order(self):
        self.assertEqual(changed('open("", a, b);'), {"(void)0;", 'open("", b, a);',
                                                      'open("~" "", a, b);'})
        self.assertIn('say("y"); say("x");', changed('say("x"); say("y");'))
        self.assertEqual(changed("int values[] = {a, b};"), {"int values[] = {b, a};"})

    def test_of_names(self):
        self.assertIn("answer(NO);", changed("answer(YES);"))
        self.assertIn("answer(::YES);", changed("answer(::NO);"))
        self.assertIn('open("", O_RDWR, a);', changed('open("", O_RDONLY, a);'))
        self.assertEqual(changed("LOG(INFO);"), {"(void)0;", "LOG(ERROR);"})

    def test_of_jumps_but_not_of_the_last(self):
        self.assertEqual(changed("if (c) return c; return c;"),
                         {"if (!(c)) return c; return c;", "if (c) (void)0; return c;",
                          "if (c) return !(c); return c;", "if (c) return c; return !(c);"})
        self.assertIn("for (;;) { (void)0; a = b; }", changed("for (;;) { break; a = b; }"))

    def test_of_branches_and_values(self):
        self.assertEqual(changed('if (c) say(""); else say("x");'),
                         {'if (!(c)) say(""); else say("x");', 'if (c) (void)0; else say("x");',
                          'if (c) say(""); else (void)0;', 'if (c) say("~" ""); else say("x");',
                          'if (c) say(""); else say("~" "x");', 'if (c) say(""); else say("");'})
        self.assertEqual(changed("return c ? c : c;"),
                         {"return !(c) ? c : c;", "return !(c ? c : c);"})

    def test_leave_macros_whole(self):
        self.assertEqual(changed("a = TWICE(b);"), {"(void)0;"})


class Choice(unittest.TestCase):
    def test_takes_some_of_every_file_and_does_not_change(self):
        self.assertEqual(mutants.quotas({"a": 100, "b": 10, "c": 1}, 12), {"a": 10, "b": 1, "c": 1})
        found = [mutants.Mutant("a", i, i + 1, "") for i in range(4)]
        order = [mutant.begin for mutant in mutants.spread(found, lambda _: b"0123")["a"]]
        moved = [mutants.Mutant("a", i + 5, i + 6, "") for i in range(4)]
        self.assertEqual([mutant.begin - 5 for mutant in
                          mutants.spread(moved, lambda _: b"x = \n0123")["a"]], order)


if __name__ == "__main__":
    unittest.main()
