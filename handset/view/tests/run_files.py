# SPDX-License-Identifier: Apache-2.0
"""Writes the files of a run for a test, key by key as little as the test needs."""

import json
import pathlib
import tempfile

LEDS = "/sys/class/leds/vibrator/"


class Directory:
    """A run's directory; lines are added in the order of time, which is in milliseconds here."""

    def __init__(self, test):
        made = tempfile.TemporaryDirectory(prefix="run-")
        test.addCleanup(made.cleanup)
        self.path = pathlib.Path(made.name)
        (self.path / "journal.jsonl").touch()
        self._n = 0

    def line(self, ms, op, node, **fields):
        self._n += 1
        self._add("journal.jsonl", {"n": self._n, "us": round(ms * 1000), "pid": 9, "uid": 1000,
                                    "op": op, "node": node, **fields})

    def write(self, ms, node, data, **fields):
        self.line(ms, "write", LEDS + node, data=data, **{"result": len(data), **fields})

    def upload(self, ms, result, custom, length=0):
        self.line(ms, "upload", "motor", id=-1, result=result, type=81, waveform=93, length=length,
                  custom_len=len(custom) // 4, custom_hex=custom)

    def event(self, ms, code, value):
        self.line(ms, "event", "motor", type=21, code=code, value=value, result=24)

    def call(self, ms, took, words, **answer):
        self._add("calls.jsonl", {
            "us": round(ms * 1000), "pid": 7, "uid": answer.pop("uid", 0), "call": words.split(),
            "answer": {"exception": 0, "status": 0, "callback": None, "us": round(took * 1000),
                       **answer}})

    def text(self, name, text):
        (self.path / name).write_text(text, "utf-8")

    def _add(self, name, fields):
        with open(self.path / name, "a", encoding="utf-8") as file:
            file.write(json.dumps(fields, separators=(",", ":")) + "\n")
