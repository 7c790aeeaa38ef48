# SPDX-License-Identifier: Apache-2.0
"""A run that is under way: what the files have gained since the last look, on the run's clock."""

import json
import os
import time

import requests_of_log
from drive import Drive
from run import parse_call, parse_op


class _Tail:
    """The whole lines that a file has gained; a file that has shrunk was begun anew."""

    def __init__(self, path):
        self._path, self._read, self._rest = path, 0, b""

    def lines(self):
        try:
            with open(self._path, "rb") as file:
                if os.fstat(file.fileno()).st_size < self._read:
                    self._read, self._rest = 0, b""
                file.seek(self._read)
                chunk = file.read()
        except FileNotFoundError:
            self._read = 0
            return []
        self._read += len(chunk)
        *lines, self._rest = (self._rest + chunk).split(b"\n")
        return [line.decode(errors="replace") for line in lines]


class LiveRun:
    """Follows the journal, the log and the recorded calls in a directory."""

    def __init__(self, directory):
        self._journal = _Tail(os.path.join(directory, "journal.jsonl"))
        self._log = _Tail(os.path.join(directory, "service.log"))
        self._calls = _Tail(os.path.join(directory, "calls.jsonl"))
        self._drive = Drive()
        self._ahead = None  # by how much the run's clock is ahead of this machine's, microseconds

    def look(self):
        """What is new, as a list of lines for the page, in the order of time."""
        found = []
        for text in self._journal.lines():
            try:
                op = parse_op(text)
            except (ValueError, KeyError, TypeError):
                continue
            if op is None:
                continue
            ahead = op.us - time.monotonic() * 1e6
            self._ahead = ahead if self._ahead is None else max(ahead, self._ahead)
            if not op.failed:
                self._drive.feed(op)
            bad = op.failed or op.fault is not None
            found.append({"us": op.us, "source": "driver", "bad": bad, "op": op.op,
                          "text": f"{op.name} ← {op.describe()}" +
                                  (f" ({op.result})" if op.failed else " (fault)" if bad else "")})
        for text in self._log.lines():
            parsed = requests_of_log.parse(text)
            if parsed is not None:
                found.append({"us": parsed[0], "source": "log", "bad": False, "text": parsed[2]})
        for text in self._calls.lines():
            try:
                call = parse_call(json.loads(text))
            except (ValueError, KeyError, TypeError):
                continue
            # A callback is awaited after the answer, and the call is recorded when that has come.
            found.append({"us": call.end, "source": "answer", "bad": call.failed,
                          "text": call.said})
        if any(line["us"] is None for line in found):  # a log without the clock follows the driver
            return found
        return sorted(found, key=lambda line: line["us"])

    def now(self):
        """The run's clock, as far as it is known; None before the driver's first line."""
        return None if self._ahead is None else time.monotonic() * 1e6 + self._ahead

    def drive(self):
        """What has changed of the drive, as {"from": index, "stretches": [...]}, or None."""
        now = self.now()
        if now is not None:
            self._drive.finish(now)
        first, stretches = self._drive.changed, self._drive.stretches
        if first is None:
            return None
        self._drive.changed = None
        return {"from": first, "now": now, "stretches": [
            [one.start, one.end, one.level, one.kind, one.label, one.known]
            for one in stretches[first:]]}
