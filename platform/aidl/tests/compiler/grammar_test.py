# SPDX-License-Identifier: Apache-2.0
"""What the grammar takes, and how a text it does not take is complained about."""

import pathlib
import unittest

from compiler_case import CompilerCase


class Grammar(CompilerCase):
    def test_comments_may_stand_anywhere(self):
        self.accept_type("""\
            // line
            /* block ** / */ interface /**/ IFoo { // more
              /** doc */ void /* name */ bar(/* nothing */);
            } // end""", name="IFoo")

    def test_trailing_comma_of_an_enum_is_allowed(self):
        self.accept_type("enum Foo { A, B, }")
        self.accept_type("enum Foo { A, B }")

    def test_keywords_may_name_members_where_no_keyword_fits(self):
        self.accept_type("parcelable Foo { int oneway; int parcelable; int in; }")

    def test_windows_line_ends_and_tabs_are_blanks(self):
        self.write("p/Foo.aidl", "")
        pathlib.Path("p/Foo.aidl").write_bytes(b"package p;\r\nparcelable Foo {\r\n\tint a;\r\n}\r\n")
        self.accept("p/Foo.aidl")

    def test_missing_semicolon_is_told_at_the_token_after_it(self):
        self.refuse_type("interface IFoo {\n  void bar()\n  void baz();\n}",
                         "4:3: unexpected 'void', expected ';' or '='", name="IFoo")

    def test_end_inside_a_type_is_told(self):
        self.refuse_type("parcelable Foo {\n  int a;\n", "4:1: unexpected end of the file")

    def test_unclosed_comment_is_told(self):
        self.refuse_type("/* parcelable Foo {}", "2:1: unexpected '/*': the comment is never closed")

    def test_unclosed_text_is_told(self):
        self.refuse_type('interface IFoo {\n  const String A = "x;\n}',
                         '3:20: unexpected ": the string is never closed', name="IFoo")

    def test_unknown_character_is_told(self):
        self.refuse_type("parcelable Foo { int a$; }", "2:23: unexpected '$', expected ';' or '='")

    def test_file_that_is_no_text_is_told(self):
        self.write("p/Foo.aidl", "")
        pathlib.Path("p/Foo.aidl").write_bytes(b"package p;\n// \xff\n")
        self.refuse("p/Foo.aidl", "2:4: the file is not UTF-8 text")

    def test_file_without_package_is_refused(self):
        self.write("Foo.aidl", "parcelable Foo {}")
        self.refuse("Foo.aidl", "1:1: the file has no package declaration")

    def test_file_without_type_is_refused(self):
        self.refuse_type("", "1:1: the file declares no type")

    def test_second_type_is_refused(self):
        self.refuse_type("parcelable Foo {}\nparcelable Bar {}",
                         "3:12: a second type, 'Bar': a file holds one type")

    def test_deep_nesting_is_refused_and_no_crash(self):
        self.refuse_type(f"interface IFoo {{ const int A = {'~' * 20000}1; }}",
                         "1:1: an expression is nested too deeply", name="IFoo")


class Unsupported(CompilerCase):
    """What the language has and this compiler has not is refused by its name."""

    def test_unstructured_parcelables(self):
        self.refuse_type("parcelable Foo;",
                         "2:12: 'Foo': a parcelable without fields in AIDL is not supported")
        self.refuse_type('parcelable Foo cpp_header "foo.h";',
                         "2:12: 'Foo': a parcelable without fields in AIDL is not supported")

    def test_type_parameters(self):
        self.refuse_type("parcelable Foo<T> { int a; }",
                         "2:12: 'Foo': type parameters are not supported")

    def test_nested_types(self):
        self.refuse_type("parcelable Foo {\n  enum Bar { A }\n}",
                         "3:8: 'Bar': nested types are not supported")
        self.refuse_type("interface IFoo {\n  parcelable Bar { int a; }\n}",
                         "3:14: 'Bar': nested types are not supported", name="IFoo")

    def test_arrays_of_fixed_size_and_of_arrays(self):
        self.refuse_type("parcelable Foo { int[4] a; }",
                         "2:18: an array of a fixed size is not supported")
        self.refuse_type("parcelable Foo { int[][] a; }",
                         "2:18: an array of arrays is not supported")

    def test_types_of_other_languages(self):
        for name in ("Map", "CharSequence", "FileDescriptor", "ParcelableHolder"):
            with self.subTest(name):
                self.refuse_type(f"parcelable Foo {{ {name} a; }}",
                                 f"2:18: the type '{name}' is not supported")

    def test_lists_of_interfaces_and_binders(self):
        self.write("p/IBar.aidl", "package p; interface IBar {}")
        self.refuse_type("parcelable Foo { IBinder[] a; }", "2:18: IBinder[] is not supported")
        self.refuse_type("parcelable Foo { IBar[] a; }", "2:18: p.IBar[] is not supported")
        self.refuse_type("parcelable Foo { List<IBar> a; }",
                         "2:18: List<p.IBar> is not supported")

    def test_constants_of_other_types(self):
        self.refuse_type("interface IFoo { const double A = 1.0; }",
                         "2:24: a constant of type double is not supported, byte, int, long, "
                         "String are", name="IFoo")


if __name__ == "__main__":
    unittest.main()
