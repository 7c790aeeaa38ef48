# SPDX-License-Identifier: Apache-2.0
"""A run as a trace in Chrome's JSON form, which Perfetto's viewer (ui.perfetto.dev) opens.

Tracks: a thread for each client, one for the service, one for each node of the driver, one for the
motor and its level as a counter. A flow leads from a call through what the driver took for it to the
callback.
"""

import json

_CLIENTS, _SERVICE, _DRIVER, _MOTOR = 1, 2, 3, 4
_SHORTEST = 50  # microseconds, so that a slice is to be seen and clicked


def write(run, path):
    """Writes `run` to the file at `path`."""
    with open(path, "w", encoding="utf-8") as file:
        json.dump({"displayTimeUnit": "ms", "traceEvents": list(_events(run))}, file,
                  separators=(",", ":"))
        file.write("\n")


class _Threads:
    """Numbers for names, and the events that tell the viewer. What overlaps on a thread would have to
    be nested, so it goes to another thread of the name, with a number behind it."""

    def __init__(self, process):
        self._process, self._numbers, self._busy = process, {}, {}

    def take(self, name, start, end):
        """The thread for a slice; the slices of a name come in the order of their starts."""
        count = 1
        while True:
            number = self._numbers.setdefault(name if count == 1 else f"{name} ({count})",
                                              len(self._numbers) + 1)
            if self._busy.get(number, start) <= start:
                self._busy[number] = start + _length(start, end)
                return number
            count += 1

    def names(self):
        for name, number in self._numbers.items():
            yield {"ph": "M", "name": "thread_name", "pid": self._process, "tid": number,
                   "args": {"name": name}}


def _events(run):
    for number, name in ((_CLIENTS, "clients"), (_SERVICE, "service"), (_DRIVER, "driver"),
                         (_MOTOR, "motor")):
        yield {"ph": "M", "name": "process_name", "pid": number, "args": {"name": name}}
        yield {"ph": "M", "name": "process_sort_index", "pid": number,
               "args": {"sort_index": number}}
    flows = {id(request): at for at, request in enumerate(run.requests, 1)}
    clients, nodes = _Threads(_CLIENTS), _Threads(_DRIVER)
    for request in run.requests:
        thread = clients.take(request.client, request.start, request.end)
        yield _slice(request.describe(), _CLIENTS, thread, request.start, request.end,
                     arguments=request.arguments, answer=request.answer)
        yield _flow("s", flows[id(request)], _CLIENTS, thread, request.start)
    for us, method in run.served:
        yield {"ph": "i", "s": "t", "name": method, "pid": _SERVICE, "tid": 1, "ts": us}
    marks = {id(op): text for op, text in run.marks}
    for op in run.ops:
        start = op.us - op.took
        thread = nodes.take(op.name, start, op.us)
        wrong = marks.get(id(op))
        yield _slice(f"{op.describe()} ({wrong})" if wrong else op.describe(), _DRIVER, thread,
                     start, op.us, **op.fields)
        cause = run.cause(op.us)
        if cause:
            yield _flow("t", flows[id(cause)], _DRIVER, thread, start)
    for request in sorted(run.requests, key=lambda one: one.callback or 0):
        if request.callback:
            thread = clients.take(f"callbacks of {request.client}", request.callback,
                                  request.callback)
            yield _slice("onComplete", _CLIENTS, thread, request.callback, request.callback)
            yield _flow("f", flows[id(request)], _CLIENTS, thread, request.callback)
    for us in run.callbacks:
        yield {"ph": "i", "s": "t", "name": "notifies", "pid": _SERVICE, "tid": 1, "ts": us}
    yield from _motor(run)
    yield from clients.names()
    yield from nodes.names()


def _motor(run):
    previous = None
    for stretch in run.stretches:
        if previous is not None and previous < stretch.start:
            yield _level(previous, 0)
        yield _level(stretch.start, stretch.level)
        yield _slice(stretch.label, _MOTOR, 1, stretch.start, stretch.end, kind=stretch.kind,
                     level=stretch.level, length_known=stretch.known)
        previous = stretch.end
    if previous is not None:
        yield _level(previous, 0)


def _level(us, level):
    return {"ph": "C", "name": "level %", "pid": _MOTOR, "ts": round(us),
            "args": {"level": round(level * 100, 2)}}


def _slice(name, process, thread, start, end, **arguments):
    return {"ph": "X", "name": name, "pid": process, "tid": thread, "ts": round(start),
            "dur": _length(start, end), "args": arguments}


def _length(start, end):
    return max(round(end) - round(start), _SHORTEST)


def _flow(phase, number, process, thread, us):
    return {"ph": phase, "bp": "e", "id": number, "name": "request", "cat": "request",
            "pid": process, "tid": thread, "ts": us}
