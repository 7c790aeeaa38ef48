# SPDX-License-Identifier: Apache-2.0
"""docs/interfaces.md: up to date with the .aidl files, and complete."""

import pathlib
import re
import subprocess
import sys
import unittest

PROJECT = pathlib.Path(__file__).resolve().parent.parent.parent
sys.path.insert(0, str(PROJECT / "platform" / "aidl"))

from aidl_compiler import markdown  # noqa: E402  (found through the line above)
from aidl_compiler.library import Library  # noqa: E402
from aidl_compiler.parser import parse_text  # noqa: E402

DOCUMENT = (PROJECT / "docs" / "interfaces.md").read_text("utf-8")


def chapter(text, name):
    return markdown.chapter(parse_text(text, f"a/b/{name}.aidl"), Library([]))


class Interfaces(unittest.TestCase):
    def test_are_up_to_date(self):
        result = subprocess.run([PROJECT / "scripts" / "generate-interfaces", "--check"],
                                capture_output=True, text=True)
        self.assertEqual((result.returncode, result.stderr), (0, ""))

    def test_have_a_chapter_for_every_type(self):
        files = [*(PROJECT / "platform" / "aidl" / "android" / "hardware").rglob("*.aidl"),
                 *(PROJECT / "hal-server" / "vibrator" / "aidl" / "vendor").rglob("*.aidl")]
        self.assertEqual(sorted(re.findall(r"(?m)^## (\w+)$", DOCUMENT)),
                         sorted(path.stem for path in files))

    def test_tell_what_a_call_does(self):
        self.assertIn("### performFifoHapticEngine\n", DOCUMENT)
        self.assertIn("`void setAmplitude(float amplitude)`, transaction 6\n", DOCUMENT)


class Chapters(unittest.TestCase):
    def test_list_methods_with_their_tags(self):
        self.assertEqual(
            chapter("""package a.b;
/** A door. */
interface IDoor {
    /**
     * Opens it.
     *
     * @param angle how far,
     *     in degrees.
     * @return whether it
     *     moved.
     * @throws EX_ILLEGAL_STATE when locked.
     */
    boolean open(int angle);
    oneway void shut();
}""", "IDoor"),
            """## IDoor

Interface `a.b.IDoor`.

A door.

### open

`boolean open(int angle)`, transaction 1

Opens it.

- `angle`: how far, in degrees.
- Returns: whether it moved.
- Throws: EX_ILLEGAL_STATE when locked.

### shut

`oneway void shut()`, transaction 2
""")

    def test_list_fields_with_their_defaults(self):
        self.assertEqual(
            chapter("""package a.b;
parcelable Point {
    /** Across | along. */
    int x = 3;
    float[] ys;
}""", "Point"),
            """## Point

Parcelable `a.b.Point`.

| type | field | |
|---|---|---|
| `int` | `x = 3` | Across \\| along. |
| `float[]` | `ys` |  |
""")


if __name__ == "__main__":
    unittest.main()
