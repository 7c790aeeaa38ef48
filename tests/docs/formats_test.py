# SPDX-License-Identifier: Apache-2.0
"""docs/formats.md: every request shown there is made in the handset, and the driver has to see what
the document says, to the byte; each limit is tried on both sides."""

import json
import os
import pathlib
import re
import shlex
import subprocess
import unittest

PROJECT = pathlib.Path(__file__).resolve().parent.parent.parent
BUILD = os.environ["QVX_BUILD"]
DOCUMENT = (PROJECT / "docs" / "formats.md").read_text("utf-8")
UNIT_TESTS = PROJECT / "hal-server" / "vibrator" / "aidl" / "tests"

# A limit's request with the number in its place, on the phone "leds", which has every node.
LIMITS = {
    "packets of `ext performHapticEngine`":
        lambda n: "ext performHapticEngine 10000" + " 7,10000,2050,0" * n,
    "packets of `ext performHybridHapticEngine`":
        lambda n: "ext performHybridHapticEngine 10000" + " 5,5000,1,3,170" * n,
    "highest amplitude of `ext performHapticEngine`":
        lambda n: f"ext performHapticEngine {n} 7,10000,2050,0",
    "lowest amplitude of `ext performHapticEngine`":
        lambda n: f"ext performHapticEngine {n} 7,10000,2050,0",
    "highest type of `ext performFifoHapticEngine`": lambda n: f"ext performFifoHapticEngine {n}",
    "lowest type of `ext performFifoHapticEngine`": lambda n: f"ext performFifoHapticEngine {n}",
    "packets of `ext performPlaybackEngine`":
        lambda n: "ext performPlaybackEngine false 0" + " 5,100,0" * n,
    "fewest packets of `ext performPlaybackEngine`":
        lambda n: "ext performPlaybackEngine false 0" + " 5,100,0" * n,
    "lowest repeat count of `ext performPlaybackEngine`":
        lambda n: f"ext performPlaybackEngine true {n} 5,100,0",
    "effects of `std compose`": lambda n: "std compose" + " 0,CLICK,1.0" * n,
    "longest delay of `std compose`": lambda n: f"std compose {n},CLICK,1.0",
}


def rows(head):
    """The rows of all tables whose first line is this one, as lists of cells."""
    found = []
    for table in DOCUMENT.split(f"\n{head}\n")[1:]:
        for line in table.splitlines()[1:]:
            if not line.startswith("|"):
                break
            cells = re.split(r"(?<!\\)\|", line.strip("|"))
            found.append([cell.strip() for cell in cells])
    return found


def spans(cell):
    return re.findall(r"`([^`]*)`", cell)


def bytes_of(shown):
    return shown.replace("\\n", "\n").replace("\\0", "\0")


def in_guest(lines):
    """The standard output of a script in the guest, where no phone is up."""
    done = subprocess.run([PROJECT / "handset" / "run", "--build", BUILD, "--profile", "off", "--",
                           "sh", "-c", "\n".join(["set -u", *lines])], capture_output=True,
                          text=True, timeout=280, stdin=subprocess.DEVNULL, check=False)
    if done.returncode != 0:
        raise AssertionError(done.stdout + done.stderr)
    return done.stdout


def by_phone(script_of_phone):
    """One script that brings each phone up, runs what is wanted on it and takes it down."""
    lines = []
    for phone, script in script_of_phone.items():
        lines += [f"phone up --profile {phone} >/dev/null || exit 1", *script, "phone down >/dev/null"]
    return lines


class Requests(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        cls.written = [(*(spans(cell)[0] if "`" in cell else cell for cell in row[:3]),
                        spans(row[3])[0], kind)
                       for kind in ("written", "uploaded")
                       for row in rows(f"| request | phone | node | {kind} |")]
        # A journal that has reads as well, those of the service's start among them.
        scripts = {"leds": ["vibctl std getCapabilities >/dev/null", "echo '== -1'; phone journal"]}
        for number, (request, phone, *_) in enumerate(cls.written):
            scripts.setdefault(phone, []).extend(
                ["phone reset", f"vibctl {request} >/dev/null", f"echo '== {number}'; phone journal"])
        output = in_guest(by_phone(scripts))
        cls.journals = {}
        for part in output.split("== ")[1:]:
            number, *lines = part.splitlines()
            cls.journals[int(number)] = [json.loads(line) for line in lines]

    def test_write_what_the_document_says(self):
        self.assertGreater(len(self.written), 15)
        for number, (request, phone, node, shown, kind) in enumerate(self.written):
            with self.subTest(request, phone=phone):
                lines = [line for line in self.journals[number]
                         if line.get("node", "").split("/")[-1] == node]
                if kind == "written":
                    seen = [line["data"] for line in lines if line["op"] == "write"]
                    self.assertEqual(seen[:1], [bytes_of(shown)])
                else:
                    seen = [line["custom_hex"] for line in lines if line["op"] == "upload"]
                    self.assertEqual(seen, [shown.replace(" ", "")])

    def test_are_recorded_with_the_keys_that_the_document_lists(self):
        lines = [line for journal in self.journals.values() for line in journal]
        documented = {spans(op)[0]: spans(keys) for op, keys, _ in rows("| `op` | keys | |")[:7]}
        self.assertEqual(set(documented), {line["op"] for line in lines})
        for line in lines:
            self.assertEqual(list(line)[:6], ["n", "us", "pid", "uid", "op", "node"])
            for key in list(line)[6:]:
                self.assertIn(key, documented[line["op"]], line)
        example = json.loads(re.search(r'(?m)^    (\{"n":.*)$', DOCUMENT)[1])
        self.assertEqual(list(example), list(next(line for line in lines if line["op"] == "write")))


class Limits(unittest.TestCase):
    def test_are_where_the_document_says(self):
        limits = [(LIMITS[name], int(good), int(bad))
                  for name, good, bad in rows("| limit | accepted | refused |")]
        self.assertEqual(len(limits), len(LIMITS))
        requests = [(request(number), status) for request, good, bad in limits
                    for number, status in ((good, 0), (bad, 1))]
        output = in_guest(by_phone({"leds": [
            f"vibctl --json {request} >/run/out; echo $? $(cat /run/out)"
            for request, _ in requests]}))
        for (request, status), line in zip(requests, output.splitlines(), strict=True):
            with self.subTest(request[:60]):
                seen, _, outcome = line.partition(" ")
                self.assertEqual(int(seen), status, line)
                self.assertEqual(json.loads(outcome)["exception"], -3 if status else 0, line)


class Strings(unittest.TestCase):
    """What no request can send as it stands is held by the service's unit tests: the document's
    strings are theirs."""

    composite = (UNIT_TESTS / "composite_waveform_test.cpp").read_text("utf-8")

    def compiled(self, string):
        match = re.search(r'expectBytes\(\s*"' + re.escape(string) + r'",\s*\{([^}]*)\}\)',
                          self.composite)
        self.assertTrue(match, f"no unit test compiles {string}")
        numbers = re.sub(r"//[^\n]*", "", match[1]).split(",")
        return bytes(int(number, 0) for number in numbers)

    def test_compile_to_what_the_document_says(self):
        table = rows("| string | compiled |")
        self.assertEqual(len(table), 3)
        for string, compiled in table:
            self.assertEqual(self.compiled(spans(string)[0]), bytes.fromhex(spans(compiled)[0]))

    def test_are_refused_where_the_document_says(self):
        table = rows("| string | accepted | refused |")
        self.assertGreater(len(table), 7)
        for _, accepted, refused in table:
            self.compiled(spans(accepted)[0])
            self.assertIn(f'expectRefusal("{spans(refused)[0]}"', self.composite)

    def test_of_a_pwle_composition_are_the_unit_tests(self):
        test = (UNIT_TESTS / "pwle_composition_test.cpp").read_text("utf-8")
        (example,) = re.findall(r"(?m)^S:0.*$", DOCUMENT)
        self.assertIn(f'"{example}"', re.sub(r'"\s*"', "", test))


if __name__ == "__main__":
    unittest.main()
