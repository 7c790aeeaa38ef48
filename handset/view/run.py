# SPDX-License-Identifier: Apache-2.0
"""The one reader of a run's directory, what handset/run left with --out: journal, log and calls.

    journal.jsonl  what the driver saw        docs/formats.md, "Journal"
    service.log    what the service logged    with microseconds since boot in front, where known
    calls.jsonl    what the clients asked and were answered

All three are on one clock, microseconds since the guest's boot.
"""

import bisect
import dataclasses
import json
import os

import requests_of_log
from drive import FF_GAIN, Drive

_EXCEPTIONS = {-1: "EX_SECURITY", -3: "EX_ILLEGAL_ARGUMENT", -5: "EX_ILLEGAL_STATE",
               -7: "EX_UNSUPPORTED_OPERATION"}

_CONCURRENT = 32  # clients that may wait for the service at a time

HANG_US = 250_000  # a driver that has held a caller this long is shown as hanging


class Unreadable(Exception):
    """One line for the user: the file, its line, what is wrong."""


@dataclasses.dataclass
class Op:
    """One line of the journal. `us` is when the driver had answered, `took` how long that took
    (0 where the journal does not tell)."""
    us: int
    op: str
    node: str
    result: object  # a count or an id, or the name of an error
    took: int
    fault: dict     # what was injected, or None
    fields: dict

    @property
    def failed(self):
        return isinstance(self.result, str)

    @property
    def text(self):
        """What was written; bytes that are not UTF-8 come one to a character."""
        data = self.fields.get("data")
        return data if data is not None else bytes.fromhex(self.fields["hex"]).decode("latin-1")

    @property
    def name(self):
        """The node without its directories."""
        return self.node.rsplit("/", 1)[-1]

    @property
    def kind(self):
        """The operation, and of events those that set the gain by themselves."""
        return "gain" if self.op == "event" and self.fields["code"] == FF_GAIN else self.op

    def describe(self):
        """What was written, uploaded or sent, in a few characters."""
        if self.op == "write":
            return self.text.rstrip("\n\0")
        if self.op == "upload":
            data = self.fields.get("custom_hex", "")
            if len(data) > 8:
                return f"upload {len(data) // 2} bytes"
            index = int.from_bytes(bytes.fromhex(data)[2:4], "little", signed=True)
            return f"upload pattern {index}" if index else f"upload {self.fields['length']} ms"
        if self.op == "event":
            code, value = self.fields["code"], self.fields["value"]
            return f"gain {value}" if code == FF_GAIN else f"{'play' if value else 'stop'} {code}"
        return self.op


@dataclasses.dataclass
class Request:
    """One call: as its client recorded it, or as the service's log tells."""
    start: int
    end: int      # equal to `start` where only the log tells of it
    client: str   # "uid 1000", or "service log"
    method: str   # "std on"
    arguments: list
    answer: str   # "ok", "EX_ILLEGAL_STATE", "" where unknown
    callback: int = None  # when onComplete came, on the run's clock
    said: str = ""        # what the client printed of the answer

    @property
    def failed(self):
        return self.answer not in ("", "ok")

    def describe(self):
        words = " ".join([self.method, *map(str, self.arguments)])
        return f"{words}: {self.answer}" if self.answer else words


@dataclasses.dataclass
class Run:
    """Everything that a run left, in the order of time."""
    ops: list        # of Op; opening, closing and reading are left out unless they failed
    requests: list   # of Request
    served: list     # (microseconds, method) of each request that the service's log tells of
    callbacks: list  # microseconds at which the service notified a client
    stretches: list  # of drive.Stretch
    start: int
    end: int

    def cause(self, us):
        """The request that what happened at `us` belongs to, or None: the service serves one after
        the other, so of those under way the one that ended first; else the last that was begun, as
        a request's worker thread goes on after its answer."""
        before = self.requests[:bisect.bisect_right(self.requests, us, key=lambda one: one.start)]
        under_way = [one for one in before[-_CONCURRENT:] if one.end >= us]
        if under_way:
            return min(under_way, key=lambda one: one.end)
        return before[-1] if before else None

    @property
    def marks(self):
        """What went wrong at the driver, as (Op, text)."""
        for op in self.ops:
            said = [f"{op.op} {op.result}"] if op.failed else []
            if op.op in ("unplug", "plug"):
                said.append(f"{op.op}ged")
            if op.fault and "short" in op.fault:
                said.append(f"took {op.result} bytes")
            if op.fault and ("text" in op.fault or "hex" in op.fault):
                said.append(f"{op.op} of other contents")
            if op.took >= HANG_US or op.fault and op.fault.get("delay"):
                said.append(f"held {op.took / 1000:.0f} ms")
            if said or op.fault:
                yield op, ", ".join(said or ["fault"])


def read(directory):
    """The run that was left in `directory`. Raises Unreadable."""
    journal = os.path.join(directory, "journal.jsonl")
    if not os.path.isfile(journal):
        raise Unreadable(f"{directory}: no journal.jsonl there; give the directory of a run's --out")
    ops = list(_ops(journal))
    log = requests_of_log.read(os.path.join(directory, "service.log"))
    requests = _calls(os.path.join(directory, "calls.jsonl")) or [
        Request(found.us, found.us, "service log", found.method, found.arguments, "")
        for found in log.requests if found.us is not None]
    drive = Drive()
    for op in ops:
        if not op.failed:
            drive.feed(op)
    times = [time for op in ops for time in (op.us - op.took, op.us)]
    times += [time for one in requests for time in (one.start, one.end, one.callback or one.end)]
    times += log.callbacks
    times += [stretch.end for stretch in drive.stretches]
    start, end = (min(times), max(times)) if times else (0, 0)
    drive.finish(end)
    served = [(one.us, one.method) for one in log.requests if one.us is not None]
    return Run(ops, requests, served, log.callbacks, drive.stretches, start, end)


def _check(fields, required, optional):
    """Raises TypeError or KeyError where a key is missing or its value is of another kind."""
    for key, kind in {**required, **optional}.items():
        if (key in required or fields.get(key) is not None) and \
                (not isinstance(fields[key], kind) or isinstance(fields[key], bool)):
            raise TypeError(f"{key} is {fields[key]!r}")


# The keys of each operation that are made use of, beside those of all.
_REQUIRED = {"event": {"code": int, "value": int}, "erase": {"id": int}}
_OPTIONAL = {"write": {"data": str, "hex": str}, "upload": {"custom_hex": str, "length": int}}


def _op_of(fields):
    """The Op of a line's fields. Raises ValueError, KeyError, TypeError."""
    _check(fields, {"us": int, "op": str},
           {"node": str, "took": int, "fault": dict, "result": (int, str), "error": (int, str)})
    kind = fields["op"]
    _check(fields, _REQUIRED.get(kind, {}), _OPTIONAL.get(kind, {}))
    for key in ("hex", "custom_hex"):
        bytes.fromhex(fields.get(key) or "")
    result = fields.get("result", fields.get("error", 0))
    op = Op(fields["us"], kind, fields.get("node") or "", result, fields.get("took") or 0,
            fields.get("fault"), fields)
    if kind == "write" and fields.get("data") is None and fields.get("hex") is None:
        raise KeyError("data")
    return op


def parse_op(line):
    """The Op of one journal line, or None for what is left out. Raises ValueError, KeyError,
    TypeError."""
    # Most lines are these; they are passed over unparsed. A fault or an error makes them count.
    if ('"op":"close"' in line or '"op":"open"' in line or '"op":"read"' in line) and \
            '"fault"' not in line and '"took"' not in line and '"error":"' not in line and \
            '"result":"' not in line and '"node":"motor"' not in line:
        return None
    op = _op_of(json.loads(line))
    plain = op.op in ("open", "close", "read") and op.fault is None and not op.failed
    if plain and op.took < HANG_US and (op.node, op.op) != ("motor", "close"):
        return None
    return op


def _ops(path):
    with open(path, encoding="utf-8", errors="replace") as lines:
        for number, line in enumerate(lines, 1):
            try:
                op = parse_op(line)
            except (ValueError, KeyError, TypeError) as error:
                if not line.endswith("\n"):  # the run ended, or goes on, in the middle of a line
                    return
                raise Unreadable(f"{path}:{number}: no journal line: {error}") from None
            if op is not None:
                yield op


def _calls(path):
    """What the clients recorded, or nothing."""
    if not os.path.isfile(path):
        return []
    found = []
    with open(path, encoding="utf-8", errors="replace") as lines:
        for number, line in enumerate(lines, 1):
            try:
                found.append(parse_call(json.loads(line)))
            except (ValueError, KeyError, TypeError, OverflowError) as error:
                raise Unreadable(f"{path}:{number}: no call: {error}") from None
    return sorted(found, key=lambda request: request.start)


def parse_call(fields):
    """The Request of one line of calls.jsonl. Raises ValueError, KeyError, TypeError and, for times
    without end, OverflowError."""
    _check(fields, {"us": int, "call": list, "answer": dict}, {})
    answer = fields["answer"]
    _check(answer, {}, {"us": int})
    start, waited = fields["us"], answer.get("callback")
    callback = start + int(waited * 1000) if isinstance(waited, (int, float)) else None
    interface, method, *arguments = fields["call"]
    return Request(start, start + (answer.get("us") or 0), f"uid {fields['uid']}",
                   f"{interface} {method}", arguments, _answer(answer), callback,
                   answer.get("text") or _answer(answer))


def _answer(answer):
    """What was answered, in one word: "ok", an exception's name, a transport status."""
    if answer.get("exception"):
        number = answer["exception"]
        return answer.get("name") or _EXCEPTIONS.get(number, f"exception {number}")
    if answer.get("status"):
        return f"status {answer['status']}"
    return "no callback" if answer.get("callback") == "timeout" else "ok"
