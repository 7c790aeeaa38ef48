# SPDX-License-Identifier: Apache-2.0
"""handset/picture and handset/trace as commands."""

import json
import struct
import subprocess
import unittest

from run_files import Directory
from view_path import HANDSET


def command(*words):
    return subprocess.run([HANDSET / words[0], *words[1:]], capture_output=True, text=True,
                          check=False)


def small_run(test):
    directory = Directory(test)
    directory.call(1000, 20, "std on 500", uid=1000)
    directory.write(1005, "state", "1\n")
    directory.write(1009, "duration", "500\n")
    directory.write(1012, "activate", "1\n")
    directory.call(1190, 700, "std off", exception=-5)
    directory.write(1800, "activate", "0\n", result="EIO", fault={"errno": "EIO"}, took=600_000)
    return directory


class Picture(unittest.TestCase):
    def test_has_a_lane_for_each_client_node_and_fault(self):
        directory = small_run(self)
        done = command("picture", directory.path)
        self.assertEqual((done.returncode, done.stderr), (0, ""))
        self.assertEqual(done.stdout.split(), [str(directory.path / name)
                                               for name in ("run.svg", "run.png")])
        drawn = (directory.path / "run.svg").read_text("utf-8")
        for text in ("uid 1000", "std on 500: ok", "uid 0", "std off: EX_ILLEGAL_STATE", "state",
                     "duration", "activate: write EIO, held 600 ms", "500 ms", "drive"):
            self.assertIn(f">{text}<", drawn)

    def test_is_1200_pixels_wide(self):
        directory = small_run(self)
        file = directory.path / "a.png"
        self.assertEqual(command("picture", directory.path, "--out", file).returncode, 0)
        self.assertEqual(struct.unpack_from(">I", file.read_bytes(), 16)[0], 1200)

    def test_of_the_same_run_is_the_same(self):
        directory = small_run(self)
        drawn = []
        for name in ("a.svg", "b.svg"):
            command("picture", directory.path, "--out", directory.path / name)
            drawn.append((directory.path / name).read_bytes())
        self.assertEqual(*drawn)

    def test_of_a_long_run_has_no_more_words_than_find_room(self):
        directory = Directory(self)
        for number in range(1000):
            start = 50 * number
            directory.call(start, 10, f"std setAmplitude 0.{number % 10}")
            directory.write(start + 1, "haptic_engine",
                            f"8 10 10000 2050 0 10 {1000 * (number % 10)} 1700 0\n")
            directory.write(start + 2, "activate", "1\n")
        self.assertEqual(command("picture", directory.path).returncode, 0)
        drawn = (directory.path / "run.svg").read_text("utf-8")
        self.assertLess(drawn.count("<text"), 250)

    def test_has_no_title_where_the_legend_stands(self):
        directory = small_run(self)
        command("picture", directory.path, "--title", "much " * 50)
        self.assertRegex((directory.path / "run.svg").read_text("utf-8"), ">(much ){10,24}m?u?c?h?…<")

    def test_names_each_block_and_puts_no_name_on_a_taller_one(self):
        directory = Directory(self)
        for start, packets in ((0, "8 30 10000 2050 0 60 3000 1700 1"), (100, "4 60 10000 2050 0")):
            directory.write(start, "haptic_engine", packets + "\n")
            directory.write(start + 1, "duration", "1\n")
            directory.write(start + 2, "activate", "1\n")
        self.assertEqual(command("picture", directory.path).returncode, 0)
        drawn = (directory.path / "run.svg").read_text("utf-8")
        self.assertEqual(drawn.count(">packet 2050<"), 2)
        self.assertIn(">packet 1700 overdrive 30%<", drawn)
        for number in range(2, 12):
            directory.write(100 * number, "haptic_engine", "4 60 10000 2050 0\n")
            directory.write(100 * number + 2, "activate", "1\n")
        self.assertEqual(command("picture", directory.path).returncode, 0)
        drawn = (directory.path / "run.svg").read_text("utf-8")
        self.assertNotIn(">packet 1700 overdrive 30%<", drawn)
        self.assertGreater(drawn.count(">packet 2050<"), 5)

    def test_of_an_empty_run_is_drawn(self):
        self.assertEqual(command("picture", Directory(self).path).returncode, 0)

    def test_is_refused_in_one_line(self):
        directory = Directory(self)
        for words, said in (((directory.path / "missing",), "no journal.jsonl there"),
                            ((directory.path, "--out", "a.gif"), "ends in .svg or .png"),
                            ((directory.path, "--out", "/missing/a.svg"), "does not exist"),
                            (("a\nb",), "handset/picture: a\\nb: no journal.jsonl there"),
                            (("",), "argument DIR: '' is no path"),
                            ((directory.path, "b"),
                             "unrecognized arguments: b; accepted: --help, --out, --title, DIR"),
                            ((), "required: DIR")):
            done = command("picture", *words)
            self.assertEqual((done.returncode, done.stdout, done.stderr.count("\n")), (2, "", 1))
            self.assertIn(said, done.stderr)


class Scope(unittest.TestCase):
    def test_is_refused_in_one_line(self):
        for words, said in (
                (("now",), "unrecognized arguments: now; accepted: --build, --help, --port, --profile"),
                (("--port", "65536"),
                 "argument --port: '65536' is not a whole number from 0 to 65535"),
                (("--port", "-1"), "argument --port: '-1' is not a whole number from 0 to 65535"),
                (("--build", ""), "argument --build: '' is no path"),
                (("--profile", "a\nb"), "no profile 'a\\nb': use ff, leds, leds-amplitude, "
                 "leds-haptic-engine, leds-none, leds-prebaked-index, legacy, legacy-amplitude, "
                 "legacy-haptic-engine, legacy-none, legacy-prebaked-index, none")):
            done = command("scope", *words)
            self.assertEqual((done.returncode, done.stdout, done.stderr),
                             (2, "", f"handset/scope: {said}\n"))


class Trace(unittest.TestCase):
    def setUp(self):
        directory = small_run(self)
        directory.upload(2000, 0, "00000200" "00640100" "00000032" "00327c00" "00000000")
        directory.event(2010, 0, 1)
        directory.call(1990, 40, "std compose 0,CLICK,1 --callback", callback=400)
        directory.call(2012, 5, "std getCapabilities")  # while the same user waits
        directory.call(2017.02, 0.01, "std off")
        done = command("trace", directory.path)
        self.assertEqual((done.returncode, done.stderr), (0, ""))
        file = directory.path / "trace.json"
        self.assertEqual(done.stdout, f"{file}\n")
        self.events = json.loads(file.read_text("utf-8"))["traceEvents"]

    def test_has_clients_driver_and_motor_as_tracks(self):
        names = [event["args"]["name"] for event in self.events if event["ph"] == "M" and
                 event["name"].endswith("_name")]
        self.assertEqual(names, ["clients", "service", "driver", "motor", "uid 1000", "uid 0",
                                 "uid 0 (2)", "callbacks of uid 0", "state", "duration",
                                 "activate", "motor"])
        slices = [(event["name"], event["ts"], event["dur"]) for event in self.events
                  if event["ph"] == "X" and event["pid"] == 4]
        self.assertEqual(slices, [("500 ms", 1012000, 500000), ("pattern 1", 2010000, 20000),
                                  ("pattern 124", 2080000, 300000)])

    def test_is_what_the_viewer_takes(self):
        common = {"ph", "pid", "name"}
        keys = {"X": common | {"tid", "ts", "dur", "args"}, "C": common | {"ts", "args"},
                "i": common | {"tid", "ts", "s"}, "M": common | {"args"},
                **dict.fromkeys("stf", common | {"tid", "ts", "id", "cat", "bp"})}
        slices = {}
        for event in self.events:
            self.assertEqual(set(event) - {"tid"}, keys[event["ph"]] - {"tid"}, event)
            self.assertEqual("tid" in event, "tid" in keys[event["ph"]] or
                             event["name"] == "thread_name", event)
            self.assertTrue(all(isinstance(event[key], int) and event[key] >= 0
                                for key in ("pid", "tid", "ts", "dur", "id") if key in event), event)
            if event["ph"] == "X":
                slices.setdefault((event["pid"], event["tid"]), []).append(
                    (event["ts"], event["ts"] + event["dur"]))
        for thread in slices.values():
            for (_, end), (start, _) in zip(sorted(thread), sorted(thread)[1:]):
                self.assertLessEqual(end, start, "slices overlap")
        flows = {}
        for event in self.events:
            if event["ph"] in "stf":
                self.assertTrue(any(start <= event["ts"] < end for start, end in
                                    slices[event["pid"], event["tid"]]), "a flow without a slice")
                flows.setdefault(event["id"], []).append((event["ts"], event["ph"]))
        self.assertGreater(len(flows), 3)
        for steps in flows.values():
            self.assertRegex("".join(phase for _, phase in steps), "^st*f?$")
            self.assertEqual(steps, sorted(steps, key=lambda step: step[0]))

    def test_leads_from_a_call_to_its_writes_and_its_callback(self):
        flows = {}
        for event in self.events:
            if event["ph"] in "stf":
                flows.setdefault(event["id"], []).append((event["ph"], event["ts"]))
        self.assertEqual(flows, {
            1: [("s", 1000000), ("t", 1005000), ("t", 1009000), ("t", 1012000)],
            2: [("s", 1190000), ("t", 1200000)],
            3: [("s", 1990000), ("t", 2000000), ("t", 2010000), ("f", 2390000)],
            4: [("s", 2012000)], 5: [("s", 2017020)]})


if __name__ == "__main__":
    unittest.main()
