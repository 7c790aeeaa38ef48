# SPDX-License-Identifier: Apache-2.0
"""Constant expressions, seen through the values in the generated code."""

import re
import unittest

from compiler_case import CompilerCase


class Constants(CompilerCase):
    def value(self, expression, of="int"):
        """The value of a constant as the header shows it."""
        self.accept_type(f"interface IFoo {{ const {of} A = {expression}; }}", name="IFoo")
        return re.search(r" A = ([^ ]+) }", self.header("aidl/p/IFoo.h")).group(1)

    def refuse_value(self, expression, complaint, of="int"):
        self.refuse_type(f"interface IFoo {{ const {of}\nA =\n{expression}; }}", complaint,
                         name="IFoo")

    def test_operators_bind_as_in_cpp(self):
        for expression, value in (("1 + 2 * 3", "7"), ("(1 + 2) * 3", "9"), ("10 - 4 - 3", "3"),
                                  ("7 / 2", "3"), ("-7 / 2", "-3"), ("-7 % 3", "-1"),
                                  ("1 << 2 + 1", "8"), ("6 & 3 | 8", "10"), ("5 ^ 1", "4"),
                                  ("~0", "-1"), ("-(-3)", "3"), ("256 >> 4", "16")):
            with self.subTest(expression):
                self.assertEqual(self.value(expression), value)

    def test_hexadecimal_literals_are_bit_patterns(self):
        self.assertEqual(self.value("0x10"), "16")
        self.assertEqual(self.value("0xffffffff"), "-1")
        self.assertEqual(self.value("0xffffffffL", "long"), "4294967295")
        self.assertEqual(self.value("0xffu8", "byte"), "-1")

    def test_smallest_numbers_have_a_spelling(self):
        self.assertEqual(self.value("-2147483648"), "INT32_MIN")
        self.assertEqual(self.value("0x8000000000000000L", "long"), "INT64_MIN")

    def test_constants_may_name_others(self):
        self.write("p/IBaz.aidl", "package p; interface IBaz { const int B = 3; }")
        self.accept_type("interface IFoo { const int C = D + IBaz.B; const int D = 4; }",
                         name="IFoo")
        self.assertIn(" C = 7 ", self.header("aidl/p/IFoo.h"))

    def test_texts_are_joined(self):
        self.accept_type('interface IFoo { const String A = "x" + "y\\n"; }', name="IFoo")
        self.assertIn('const char* IFoo::A = "xy\\012";', self.source("p/IFoo.cpp"))

    def test_value_out_of_range_is_refused(self):
        self.refuse_value("2147483648", "4:1: 2147483648 does not fit into int")
        self.refuse_value("128", "4:1: 128 does not fit into byte", "byte")
        self.refuse_value("9223372036854775807 + 1",
                          "4:1: 9223372036854775808 does not fit into long", "long")

    def test_division_by_zero_is_refused(self):
        self.refuse_value("1 / 0", "4:1: division by zero")
        self.refuse_value("1 % (1 - 1)", "4:1: division by zero")

    def test_impossible_shift_is_refused(self):
        self.refuse_value("1 << 64", "4:1: a shift by 64 bits")
        self.refuse_value("1 >> -1", "4:1: a shift by -1 bits")

    def test_value_of_another_type_is_refused(self):
        for expression in ('"x"', "true", "1.5", "'c'", "{1}"):
            with self.subTest(expression):
                status, _, err = self.generate(self.write(
                    "p/IFoo.aidl", f"package p; interface IFoo {{ const int A = {expression}; }}"))
                self.assertEqual((status, err.count("\n")), (1, 1))

    def test_unknown_name_is_refused(self):
        self.refuse_value("B", "4:1: unknown constant 'B'")
        self.refuse_value("Foo.B", "4:1: unknown constant 'Foo.B'")

    def test_constant_that_depends_on_itself_is_refused(self):
        self.refuse_type("interface IFoo {\n  const int A = B;\n  const int B = A;\n}",
                         "3:17: the value of 'B' depends on itself", name="IFoo")


class Enumerators(CompilerCase):
    def values(self, body):
        self.accept_type(f"enum Foo {{ {body} }}")
        return re.findall(r"(\w+) = (-?\d+),", self.header("aidl/p/Foo.h"))

    def test_values_count_up_from_the_one_before(self):
        self.assertEqual(self.values("A, B, C = 10, D"),
                         [("A", "0"), ("B", "1"), ("C", "10"), ("D", "11")])

    def test_values_may_be_built_from_earlier_ones(self):
        self.assertEqual(self.values("A = 1, B = A << 3, C = A | B"),
                         [("A", "1"), ("B", "8"), ("C", "9")])

    def test_value_beyond_the_backing_type_is_refused(self):
        self.refuse_type("enum Foo {\n  A = 127,\n  B\n}",
                         "4:3: 128 does not fit into the backing type byte")

    def test_default_must_be_of_the_enum(self):
        self.write("p/Bar.aidl", "package p; enum Bar { X }")
        self.refuse_type("parcelable Foo { Bar bar = 1; }", "2:28: the value is not of type p.Bar")
        self.accept_type("parcelable Foo { Bar bar = Bar.X; }")


if __name__ == "__main__":
    unittest.main()
