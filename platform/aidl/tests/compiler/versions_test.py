# SPDX-License-Identifier: Apache-2.0
"""Frozen versions: the dump, the hash, whether a version may follow another."""

import hashlib
import pathlib
import subprocess
import unittest

from compiler_case import PROJECT, CompilerCase

EXTENSION = PROJECT / "hal-server/vibrator/aidl"
FROZEN = EXTENSION / "aidl_api/vendor.quorvan.hardware.vibrator"


def files_of(directory):
    return {str(path.relative_to(directory)): path.read_text(encoding="utf-8")
            for path in pathlib.Path(directory).rglob("*.aidl")}


class Dump(CompilerCase):
    def dump(self, text, name="Foo"):
        file = self.write(f"p/{name}.aidl", text)
        self.assertEqual(self.run_compiler("--dumpapi", "out", "--include=.", file), (0, "", ""))
        return pathlib.Path(f"out/p/{name}.aidl").read_text(encoding="utf-8")

    def body(self, text, name="Foo"):
        """The dump from the package on."""
        dumped = self.dump(text, name)
        return dumped[dumped.index("package"):]

    def test_interface_lists_methods_before_constants(self):
        self.write("q/Bar.aidl", "package q; parcelable Bar { int a; }")
        self.assertEqual(self.body("""\
            package p;
            import q.Bar;
            /** Documentation. */
            interface IFoo {
                const int B = 1 << 4;   // a comment
                void first(in Bar bar, int number);
                const String C = "x" + "y";
                @nullable Bar second(@nullable @utf8InCpp String text, inout int[] numbers);
                oneway void third();
            }
            """, "IFoo"), """\
package p;
interface IFoo {
  void first(in q.Bar bar, int number);
  @nullable q.Bar second(@nullable @utf8InCpp String text, inout int[] numbers);
  oneway void third();
  const int B = 16;
  const String C = "xy";
}
""")

    def test_parcelable_keeps_defaults_only_where_given(self):
        self.write("p/Bar.aidl", "package p; enum Bar { X, Y }")
        self.assertEqual(self.body("""\
            package p;
            @FixedSize
            parcelable Foo {
                int a; int b = 1 + 1; Bar c = Bar.Y; float d = 1.5f; boolean e = true; char f = 'x';
            }
            """), """\
package p;
@FixedSize
parcelable Foo {
  int a;
  int b = 2;
  p.Bar c = p.Bar.Y;
  float d = 1.5f;
  boolean e = true;
  char f = 'x';
}
""")

    def test_enumerators_have_explicit_values(self):
        self.assertEqual(self.body("""\
            package p;
            @VintfStability
            @Backing(type="int")
            enum Foo { A, B = 4, C }
            """), """\
package p;
@Backing(type="int") @VintfStability
enum Foo {
  A = 0,
  B = 4,
  C = 5,
}
""")

    def test_licence_stays_and_other_comments_go(self):
        dumped = self.dump("""\
            // SPDX-License-Identifier: Apache-2.0
            // What this file is for.
            package p;
            /** What the type is for. */
            parcelable Foo {
                /** What the field is for. */
                int a;
            }
            """)
        self.assertTrue(dumped.startswith("// SPDX-License-Identifier: Apache-2.0\n"))
        self.assertNotIn("is for", dumped)

    def test_marks_of_hidden_and_deprecated_members_stay(self):
        body = self.body("""\
            package p;
            parcelable Foo {
                /** Old. @deprecated use b */
                int a;
                /**
                 * New.
                 * @hide
                 */
                int b;
            }
            """)
        self.assertIn("@deprecated use b", body)
        self.assertIn("@hide", body)
        self.assertNotIn("Old", body)
        self.assertNotIn("New", body)

    def test_method_numbers_stay(self):
        self.assertIn("  void a() = 7;\n",
                      self.body("package p; interface IFoo { void a() = 7; }", "IFoo"))

    def test_dump_of_a_dump_is_the_same(self):
        for path in sorted((PROJECT / "platform/aidl/android/hardware/vibrator").glob("*.aidl")):
            with self.subTest(path.name):
                include = f"--include={PROJECT / 'platform/aidl'}"
                self.assertEqual(self.run_compiler("--dumpapi", "first", include, str(path)),
                                 (0, "", ""))
                once = f"first/android/hardware/vibrator/{path.name}"
                # The type itself comes from the dump, what it imports from the source.
                self.assertEqual(self.run_compiler("--dumpapi", "second", include, once),
                                 (0, "", ""))
                self.assertEqual(files_of("second")[f"android/hardware/vibrator/{path.name}"],
                                 pathlib.Path(once).read_text(encoding="utf-8"))


class Hash(CompilerCase):
    def test_is_that_of_the_files_hashes_and_the_version_before(self):
        self.write("v/b.aidl", "second\n")
        self.write("v/a/z.aidl", "first\n")
        self.write("v/notes.txt", "not counted\n")
        lines = (f"{hashlib.sha1(b'first' + bytes([10])).hexdigest()}  ./a/z.aidl\n"
                 f"{hashlib.sha1(b'second' + bytes([10])).hexdigest()}  ./b.aidl\n3\n")
        self.assertEqual(self.run_compiler("--hash", "v", "3"),
                         (0, hashlib.sha1(lines.encode()).hexdigest() + "\n", ""))

    def test_agrees_with_the_shell(self):
        for name in ("B.aidl", "a/B.aidl", "a.aidl", "a-b/c.aidl", "Z.aidl"):
            self.write(f"v/{name}", name)
        shell = subprocess.run(
            "cd v && { find . -name '*.aidl' | LC_ALL=C sort | xargs sha1sum; "
            "echo latest-version; } | sha1sum | cut -d ' ' -f 1",
            shell=True, check=True, capture_output=True, text=True).stdout
        self.assertEqual(self.run_compiler("--hash", "v", "latest-version"), (0, shell, ""))

    def test_known_value(self):
        self.write("v/p/Foo.aidl", "package p;\nparcelable Foo {\n}\n")
        self.assertEqual(self.run_compiler("--hash", "v", "latest-version")[1],
                         "c7b434fb411aef96fe34ca38c95aacd900721d01\n")

    def test_bad_arguments_are_refused(self):
        self.write("v/a.aidl", "")
        pathlib.Path("empty").mkdir()
        for arguments in (("missing", "3"), ("empty", "3"), ("v", "0"), ("v", "-1"), ("v", "x"),
                          ("v",), ("v", "1", "2")):
            with self.subTest(arguments):
                status, out, err = self.run_compiler("--hash", *arguments)
                self.assertEqual((status, out, err.count("\n")), (2, "", 1))


class Compatibility(CompilerCase):
    def check(self, old, new, name="Foo"):
        for directory, text in (("old", old), ("new", new)):
            for path in pathlib.Path(".").glob(f"{directory}/p/*"):
                path.unlink()
            if text is not None:
                self.write(f"{directory}/p/{name}.aidl", f"package p;\n{text}")
        return self.run_compiler("--checkapi", "old", "new")

    def accept_change(self, old, new, name="Foo"):
        self.assertEqual(self.check(old, new, name), (0, "", ""))

    def refuse_change(self, old, new, name="Foo"):
        status, out, err = self.check(old, new, name)
        self.assertEqual((status, out, err.count("\n")), (1, "", 1), err)
        self.assertRegex(err, r"^(old|new)/p/\w+\.aidl:\d+:\d+: ")
        return err

    def test_methods_may_be_added_at_the_end(self):
        self.accept_change("interface IFoo { void a(); }",
                           "interface IFoo { void a(); int b(); }", "IFoo")

    def test_method_added_before_another_changes_its_code(self):
        err = self.refuse_change("interface IFoo { void a(); }",
                                 "interface IFoo { int b(); void a(); }", "IFoo")
        self.assertEqual(err, "new/p/IFoo.aidl:2:32: the number of IFoo.a changed: 0 before, "
                              "1 now\n")

    def test_methods_keep_name_result_arguments_and_oneway(self):
        old = "interface IFoo { void a(int b, in int[] c); }"
        for new in ("interface IFoo { void x(int b, in int[] c); }",
                    "interface IFoo { int a(int b, in int[] c); }",
                    "interface IFoo { void a(long b, in int[] c); }",
                    "interface IFoo { void a(int b, inout int[] c); }",
                    "interface IFoo { void a(int b); }",
                    "interface IFoo { oneway void a(int b, in int[] c); }",
                    "oneway interface IFoo { void a(int b, in int[] c); }",
                    "interface IFoo { }"):
            with self.subTest(new):
                self.refuse_change(old, new, "IFoo")

    def test_argument_names_and_nullability_may_change(self):
        self.accept_change("interface IFoo { String a(String b); }",
                           "interface IFoo { @nullable String a(@nullable String c); }", "IFoo")

    def test_direction_that_was_left_out_may_be_written(self):
        self.accept_change("interface IFoo { void a(int b); }",
                           "interface IFoo { void a(in int b); }", "IFoo")

    def test_fields_may_be_added_at_the_end(self):
        self.accept_change("parcelable Foo { int a; }", "parcelable Foo { int a; int b; }")
        self.accept_change("union Foo { int a; }", "union Foo { int a; String b; }")

    def test_fields_keep_place_name_type_and_default(self):
        old = "parcelable Foo { int a = 1; int b; }"
        for new in ("parcelable Foo { int b; int a = 1; }", "parcelable Foo { int a = 1; }",
                    "parcelable Foo { int a = 1; int c; }", "parcelable Foo { int a = 2; int b; }",
                    "parcelable Foo { int a; int b; }", "parcelable Foo { long a = 1; int b; }",
                    "parcelable Foo { int[] a = {1}; int b; }",
                    "union Foo { int a = 1; int b; }"):
            with self.subTest(new):
                self.refuse_change(old, new)

    def test_fixed_size_cannot_grow_or_go(self):
        old = "@FixedSize parcelable Foo { int a; }"
        self.refuse_change(old, "@FixedSize parcelable Foo { int a; int b; }")
        self.refuse_change(old, "parcelable Foo { int a; }")

    def test_enumerators_may_be_added_and_keep_their_values(self):
        self.accept_change("enum Foo { A, B }", "enum Foo { A, B, C }")
        self.accept_change("enum Foo { A, B }", "enum Foo { C = 7, A = 0, B }")
        self.refuse_change("enum Foo { A, B }", "enum Foo { B, A }")
        self.refuse_change("enum Foo { A, B }", "enum Foo { A }")
        self.refuse_change("enum Foo { A }", '@Backing(type="int") enum Foo { A }')
        self.accept_change("enum Foo { A }", '@Backing(type="byte") enum Foo { A }')

    def test_constants_may_be_added_and_keep_their_values(self):
        old = "interface IFoo { const int A = 1; }"
        self.accept_change(old, "interface IFoo { const int B = 2; const int A = B - 1; }", "IFoo")
        self.refuse_change(old, "interface IFoo { const int A = 2; }", "IFoo")
        self.refuse_change(old, "interface IFoo { const long A = 1; }", "IFoo")
        self.refuse_change(old, "interface IFoo { }", "IFoo")

    def test_annotations_stay(self):
        self.refuse_change("parcelable Foo { int a; }", "@VintfStability parcelable Foo { int a; }")
        self.refuse_change('@Descriptor(value="x") interface IFoo {}',
                           '@Descriptor(value="y") interface IFoo {}', "IFoo")

    def test_type_may_not_go(self):
        self.check("parcelable Foo {}", None)
        self.write("new/p/Bar.aidl", "package p; parcelable Bar {}")
        self.assertEqual(self.run_compiler("--checkapi", "old", "new"),
                         (1, "", "old/p/Foo.aidl:2:12: p.Foo is missing in the newer version\n"))

    def test_bad_arguments_are_refused(self):
        self.write("old/p/Foo.aidl", "package p; parcelable Foo {}")
        for arguments in (("old",), ("old", "missing"), ("old", "old", "old"), ()):
            with self.subTest(arguments):
                status, out, err = self.run_compiler("--checkapi", *arguments)
                self.assertEqual((status, out, err.count("\n")), (2, "", 1))


class FrozenExtension(CompilerCase):
    """The vendor's interface as it was promised to devices."""

    def test_sources_are_what_was_frozen(self):
        sources = map(str, sorted(EXTENSION.glob("vendor/quorvan/hardware/vibrator/*.aidl")))
        self.assertEqual(
            self.run_compiler("--dumpapi", "now", f"--include={PROJECT / 'platform/aidl'}",
                              f"--include={EXTENSION}", *sources), (0, "", ""))
        self.assertEqual(files_of("now"), files_of(FROZEN / "4"),
                         "the .aidl files say something else than version 4; what is new belongs "
                         "into a version 5")
        self.assertEqual(files_of("now"), files_of(FROZEN / "current"))

    def test_hash_is_that_of_the_frozen_files(self):
        shell = subprocess.run(
            "{ find . -name '*.aidl' | LC_ALL=C sort | xargs sha1sum; echo 3; } | sha1sum",
            shell=True, check=True, capture_output=True, text=True, cwd=FROZEN / "4").stdout
        self.assertEqual((FROZEN / "4/.hash").read_text(encoding="ascii"), shell[:40] + "\n")

    def test_current_may_follow_what_was_frozen(self):
        self.assertEqual(self.run_compiler("--checkapi", f"--include={PROJECT / 'platform/aidl'}",
                                           str(FROZEN / "4"), str(FROZEN / "current")),
                         (0, "", ""))


if __name__ == "__main__":
    unittest.main()
