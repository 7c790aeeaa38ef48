# SPDX-License-Identifier: Apache-2.0
"""What is AIDL by its grammar and yet refused: one test for each rule."""

import unittest

from compiler_case import CompilerCase


class Types(CompilerCase):
    def test_unknown_type_is_refused_where_it_is_used(self):
        self.refuse_type("parcelable Foo {\n  Bar a;\n}", "3:3: unknown type 'Bar'")
        self.refuse_type("parcelable Foo {\n  List<Bar> a;\n}", "3:8: unknown type 'Bar'")

    def test_import_that_is_not_found_is_refused(self):
        file = self.write("p/Foo.aidl", "package p;\nimport q.Bar;\nparcelable Foo {}")
        self.refuse(file, "2:1: cannot find the imported type 'q.Bar' (include directories: .)")

    def test_mistake_in_an_import_is_told_there(self):
        self.write("q/Bar.aidl", "package q;\nparcelable Bar { Baz a; }")
        file = self.write("p/Foo.aidl", "package p;\nimport q.Bar;\nparcelable Foo { Bar bar; }")
        self.assertEqual(self.generate(file),
                         (1, "", "q/Bar.aidl:2:18: unknown type 'Baz'\n"))

    def test_path_must_be_that_of_the_package(self):
        file = self.write("q/Foo.aidl", "package p.q;\nparcelable Foo {}")
        self.refuse(file, "1:1: the path of a type in package p.q must end in p/q/Foo.aidl")

    def test_file_must_be_named_like_its_type(self):
        self.refuse_type("parcelable Bar {}",
                         "2:12: 'Bar' must stand in a file named Bar.aidl, not Foo.aidl")

    def test_type_defined_twice_is_refused(self):
        self.write("a/p/Foo.aidl", "package p;\nparcelable Foo {}")
        self.write("b/p/Foo.aidl", "package p;\nparcelable Foo {}")
        self.assertEqual(
            self.generate("a/p/Foo.aidl", "b/p/Foo.aidl"),
            (1, "", "b/p/Foo.aidl:2:12: 'p.Foo' is already defined in a/p/Foo.aidl\n"))

    def test_type_of_the_same_package_needs_no_import(self):
        self.write("p/Bar.aidl", "package p;\nparcelable Bar {}")
        self.accept_type("parcelable Foo { Bar bar; }")

    def test_void_is_for_results_only(self):
        self.refuse_type("parcelable Foo { void a; }", "2:18: void is for results only")
        self.refuse_type("interface IFoo { void a(void b); }", "2:25: void is for results only",
                         name="IFoo")
        self.refuse_type("interface IFoo { void[] a(); }", "2:18: void[] is not allowed",
                         name="IFoo")

    def test_list_takes_one_type_that_is_no_primitive(self):
        self.refuse_type("parcelable Foo { List a; }",
                         "2:18: List takes one type, as in List<String>")
        self.refuse_type("parcelable Foo { List<int> a; }",
                         "2:23: List<int> is not allowed: use int[]")
        self.refuse_type("parcelable Foo { int<String> a; }", "2:18: int takes no type arguments")
        self.accept_type("parcelable Foo { List<String> a; List<ParcelFileDescriptor> b; }")

    def test_primitives_cannot_be_nullable(self):
        self.refuse_type("parcelable Foo { @nullable int a; }", "2:28: int cannot be @nullable")
        self.accept_type("parcelable Foo { @nullable int[] a; @nullable String b; }")

    def test_parcelable_cannot_hold_itself(self):
        self.refuse_type("parcelable Foo { @nullable Foo a; }", "2:28: 'Foo' would hold itself")
        self.write("p/Bar.aidl", "package p;\nparcelable Bar { Foo foo; }")
        self.refuse_type("parcelable Foo { Bar bar; }", "2:18: 'Foo' would hold itself")

    def test_fixed_size_parcelable_holds_only_such(self):
        self.refuse_type("@FixedSize\nparcelable Foo { String a; }",
                         "3:18: 'Foo' is @FixedSize but the size of String is not fixed")
        self.accept_type("@FixedSize\nparcelable Foo { int a; double b; }")


class Methods(CompilerCase):
    def refuse_method(self, method, complaint):
        self.refuse_type(f"interface IFoo {{\n{method}\n}}", complaint, name="IFoo")

    def accept_method(self, method):
        self.accept_type(f"interface IFoo {{\n{method}\n}}", name="IFoo")

    def test_arrays_and_parcelables_must_say_their_direction(self):
        self.write("p/Bar.aidl", "package p; parcelable Bar {}")
        self.refuse_method("void a(int[] b);",
                           "3:14: the direction of 'b' is missing: int[] takes in, out or inout")
        self.refuse_method("void a(Bar b);",
                           "3:12: the direction of 'b' is missing: p.Bar takes in, out or inout")
        self.accept_method("void a(in int[] b, out Bar c, inout Bar d);")

    def test_primitives_texts_enums_and_interfaces_are_in_only(self):
        self.write("p/Bar.aidl", "package p; enum Bar { A }")
        for name, shown in (("int", "int"), ("String", "String"), ("Bar", "p.Bar"),
                            ("IFoo", "p.IFoo"), ("IBinder", "IBinder")):
            with self.subTest(name):
                self.refuse_method(f"void a(out {name} b);",
                                   f"3:{13 + len(name)}: 'b' cannot be out: {shown} is for in only")
                self.accept_method(f"void a(in {name} b, {name} c);")

    def test_oneway_method_returns_nothing(self):
        self.refuse_method("oneway int a();", "3:12: 'a' is oneway and cannot return int")
        self.refuse_method("oneway void a(out int[] b);",
                           "3:25: 'a' is oneway and cannot have the out argument 'b'")
        self.accept_method("oneway void a(in int[] b);")

    def test_methods_of_a_oneway_interface_are_oneway(self):
        self.refuse_type("oneway interface IFoo {\n  int a();\n}",
                         "3:7: 'a' is oneway and cannot return int", name="IFoo")

    def test_methods_of_one_name_are_refused(self):
        self.refuse_method("void a();\nvoid a(int b);",
                           "4:6: 'IFoo' has two members named 'a' (the first in line 3)")

    def test_method_and_constant_of_one_name_are_refused(self):
        self.refuse_method("const int a = 1;\nvoid a();",
                           "4:6: 'IFoo' has two members named 'a' (the first in line 3)")

    def test_arguments_of_one_name_are_refused(self):
        self.refuse_method("void a(int b, int b);",
                           "3:19: 'a' has two arguments named 'b' (the first in line 3)")

    def test_numbers_stand_at_all_methods_or_at_none(self):
        self.refuse_method("void a() = 1;\nvoid b();",
                           "4:6: either every method has a number or none has")
        self.refuse_method("void a();\nvoid b() = 1;",
                           "4:6: either every method has a number or none has")

    def test_number_given_twice_is_refused(self):
        self.refuse_method("void a() = 1;\nvoid b() = 1;", "4:6: 'b' has the number 1 of 'a'")

    def test_number_must_be_a_user_transaction(self):
        self.refuse_method("void a() = 16777115;",
                           "3:6: the number of 'a' is not between 0 and 16777114")
        self.accept_method("void a() = 16777114;")


class Names(CompilerCase):
    def test_fields_of_one_name_are_refused(self):
        self.refuse_type("parcelable Foo {\n  int a;\n  long a;\n}",
                         "4:8: 'Foo' has two members named 'a' (the first in line 3)")

    def test_enumerators_of_one_name_are_refused(self):
        self.refuse_type("enum Foo {\n  A,\n  A,\n}",
                         "4:3: 'Foo' has two members named 'A' (the first in line 3)")

    def test_reserved_words_of_the_generated_language_are_refused(self):
        self.refuse_type("parcelable Foo { int new; }",
                         "2:22: 'new' cannot be a name: C++ reserves the word")
        self.refuse_type("enum Foo { NULL }",
                         "2:12: 'NULL' cannot be a name: C++ reserves the word")

    def test_names_of_the_generated_class_are_refused(self):
        self.refuse_type("interface IFoo { int getInterfaceVersion(); }",
                         "2:22: the name 'getInterfaceVersion' is taken by the generated code of "
                         "every interface", name="IFoo")
        self.refuse_type("union Foo { int getTag; }",
                         "2:17: the name 'getTag' is taken by the generated code of every union")
        self.refuse_type("parcelable Foo { int _aidl_size; }",
                         "2:22: the name '_aidl_size' is taken by the generated code of every "
                         "parcelable")

    def test_interface_and_parcelable_whose_stubs_meet_are_refused(self):
        self.write("p/IFoo.aidl", "package p;\ninterface IFoo {}")
        self.write("p/Foo.aidl", "package p;\nparcelable Foo {}")
        self.assertEqual(
            self.generate("p/IFoo.aidl", "p/Foo.aidl"),
            (1, "", "p/Foo.aidl:2:12: 'Foo' and another type of this run both make "
                    "aidl/p/BnFoo.h\n"))


class Structures(CompilerCase):
    def test_union_needs_a_field(self):
        self.refuse_type("union Foo {}", "2:7: 'Foo': a union has a field at least")

    def test_only_the_first_field_of_a_union_has_a_default(self):
        self.refuse_type("union Foo { int a; int b = 1; }",
                         "2:28: only the first field of a union can have a default")

    def test_enum_needs_an_enumerator(self):
        self.refuse_type("enum Foo {}", "2:6: 'Foo': an enum has an enumerator at least")


class Annotations(CompilerCase):
    def test_unknown_annotation_is_refused(self):
        self.refuse_type("@Foo\nparcelable Foo {}", "2:1: unknown annotation @Foo")

    def test_annotation_in_the_wrong_place_is_refused(self):
        self.refuse_type('@Backing(type="int")\nparcelable Foo {}',
                         "2:1: @Backing cannot stand at a parcelable")
        self.refuse_type("parcelable Foo { @VintfStability int a; }",
                         "2:18: @VintfStability cannot stand at a field")

    def test_annotation_given_twice_is_refused(self):
        self.refuse_type("@FixedSize @FixedSize\nparcelable Foo {}",
                         "2:12: @FixedSize is given twice")

    def test_wrong_parameters_are_refused(self):
        self.refuse_type("@FixedSize(a=1)\nparcelable Foo {}",
                         "2:1: @FixedSize takes no parameters")
        self.refuse_type("@Descriptor\ninterface IFoo {}",
                         "2:1: @Descriptor takes value=...", name="IFoo")

    def test_backing_must_be_byte_int_or_long(self):
        complaint = '2:1: @Backing takes type="byte", type="int" or type="long"'
        self.refuse_type('@Backing(type="short")\nenum Foo { A }', complaint)
        self.refuse_type("@Backing(type=1)\nenum Foo { A }", complaint)
        self.refuse_type("@Backing\nenum Foo { A }", complaint)

    def test_utf8_is_for_texts(self):
        self.refuse_type("parcelable Foo { @utf8InCpp int a; }",
                         "2:29: @utf8InCpp is for String, not int")
        self.accept_type("parcelable Foo { @utf8InCpp String a; @utf8InCpp String[] b; }")


class Stability(CompilerCase):
    VINTF = ("--stability", "vintf")

    def test_stable_type_may_not_use_one_that_is_not(self):
        self.write("p/Bar.aidl", "package p; parcelable Bar {}")
        self.refuse_type("@VintfStability\nparcelable Foo {\n  Bar[] a;\n}",
                         "4:3: 'Foo' is @VintfStability but uses p.Bar, which is not",
                         options=self.VINTF)

    def test_stable_library_holds_stable_types_only(self):
        self.refuse_type("parcelable Foo {}",
                         "2:12: 'Foo' is not @VintfStability, which --stability vintf demands",
                         options=self.VINTF)

    def test_stable_type_needs_a_stable_library(self):
        self.refuse_type("@VintfStability\nparcelable Foo {}",
                         "3:12: 'Foo' is @VintfStability: --stability vintf is needed")
        self.accept_type("@VintfStability\nparcelable Foo {}", options=self.VINTF)


if __name__ == "__main__":
    unittest.main()
