# SPDX-License-Identifier: Apache-2.0
"""What the motor does, worked out from what the driver was told: a level over time.

Written from the driver's side. Whatever is armed last (a stored pattern's index, packets, a queue)
is what the next start plays, and a start uses it up; without one it plays for the time that was
written. A force-feedback effect plays what was uploaded with it, each time it is started.
"""

import dataclasses
import math

import waveform

_LEGACY = "/sys/class/timed_output/vibrator/"
_LEDS = "/sys/class/leds/vibrator/"
_CONTROL = "/sys/class/qvx_vib_inputff/control/"
FF_GAIN = 0x60   # FF_GAIN of linux/input-event-codes.h
_FF_EVENT = 0x15
_UNGAINED = ("packets", "queue")  # these carry levels of their own
_ROUNDS = 1000  # of a program at once are laid out one by one


@dataclasses.dataclass
class Stretch:
    """The motor at `level` (0 to 1) from `start` to `end`, in microseconds of the run's clock."""
    start: float
    end: float
    level: float
    own: float   # the level before the gain
    kind: str    # "timed", "pattern", "packets", "queue", "composite"
    label: str
    known: bool  # whether the end is more than a guess

    def gained(self, gain):
        """The same at another gain."""
        if self.kind in _UNGAINED:
            return self
        return dataclasses.replace(self, level=round(self.own * gain, 6))

    def parts(self, step=0):  # pylint: disable=unused-argument  (Rounds' has a use for it)
        """Itself."""
        yield self


@dataclasses.dataclass
class Rounds(Stretch):
    """What a program plays over and over, too often to be laid out. As a stretch, it is as strong as
    its strongest part."""
    first: tuple  # the stretches of the round that began it all
    length: float

    def gained(self, gain):
        first = tuple(one.gained(gain) for one in self.first)
        return dataclasses.replace(self, level=max(one.level for one in first), first=first)

    def parts(self, step=0):
        """The stretches in order, without those that end less than `step` microseconds after the
        one before."""
        at, count = self.start, -1
        while True:
            count = max(count + 1, math.floor((at - self.first[0].start) / self.length))
            for one in self.first:
                start = max(self.start, one.start + count * self.length)
                end = min(self.end, one.end + count * self.length)
                if start >= self.end:
                    return
                if end >= at and end > start:
                    yield dataclasses.replace(one, start=start, end=end)
                    at = end + step


class Drive:
    """Takes the driver's operations one by one, in order; `stretches` is what came of them.
    `changed` is the first of them that is another than when it was last set to None."""

    def __init__(self):
        self.stretches, self.changed = [], None
        self._gain = 1.0
        self._duration = 0       # what the LED class's duration node holds, in ms
        self._armed = None
        self._effects = {}       # motor: id -> program
        self._playing = None     # the motor's id
        self._loop = None        # a program without end, and when it starts again
        self._platform_numbers = False

    def feed(self, op):
        """One journal line that succeeded; others mean nothing to the motor."""
        if op.op == "write":
            self._write(op)
        elif op.op == "upload" and isinstance(op.result, int):
            self._effects[op.result] = self._effect(op)
        elif op.op == "erase" and op.fields["id"] == self._playing:
            self._stop(op.us)
        elif op.op == "event" and op.fields.get("type", _FF_EVENT) == _FF_EVENT:
            self._event(op)
        elif op.op in ("close", "unplug") and op.node == "motor":
            self._stop(op.us)

    def finish(self, us):
        """What has no end goes on until `us`. May be called again, later."""
        if self._loop and self._loop[1] < us:
            program, start = self._loop
            self._run(program, start, math.ceil((us - start) / _length(program)))

    # --- sysfs -----------------------------------------------------------------------------------

    def _write(self, op):
        text = op.text.rstrip("\n\0")
        for directory in (_LEGACY, _LEDS):
            if op.node.startswith(directory):
                self._node(op.us, op.node[len(directory):], text)
        if op.node in (_LEGACY + "use_kyp_index", _CONTROL + "use_kyp_index"):
            self._platform_numbers = text == "1"

    def _node(self, us, node, text):
        try:
            if node == "intensity":
                self._set_gain(us, int(text))
            elif node == "duration":
                self._duration = int(text)
            elif node == "activate" and int(text) or node == "enable" and int(text):
                self._start(us, self._duration if node == "activate" else int(text))
            elif node in ("activate", "enable"):
                self._stop(us)
            elif node == "cp_trigger_index" and int(text) != waveform.QUEUE_INDEX:
                self._armed = self._pattern(int(text))
            elif node == "cp_trigger_queue":
                self._armed = waveform.queue(text)
            elif node == "haptic_engine":
                self._armed = waveform.packets(text)
            elif node == "hybrid_haptic_engine":
                self._armed = waveform.hybrid(text)
            elif node == "fifo":
                self._play(us, waveform.Program("pattern", (waveform.Piece(
                    1, waveform.UNKNOWN_MS, f"FIFO {text}", False),)))
        except ValueError:
            pass  # a driver refuses it, or makes of it what nobody outside knows

    def _start(self, us, milliseconds):
        program, self._armed = self._armed, None
        self._play(us, program or _timed(milliseconds))

    def _pattern(self, index):
        if index <= 0:
            return None
        return waveform.Program("pattern", (waveform.stored(index, 1.0),))

    # --- the force-feedback motor ----------------------------------------------------------------

    def _effect(self, op):
        data = bytes.fromhex(op.fields.get("custom_hex", ""))
        if len(data) > 4:
            try:
                return waveform.composite(data, self._platform_numbers)
            except ValueError:
                return _timed(0)
        index = int.from_bytes(data[2:4], "little", signed=True)
        return self._pattern(index) or _timed(op.fields.get("length", 0))

    def _event(self, op):
        code, value = op.fields["code"], op.fields["value"]
        if code == FF_GAIN:
            self._set_gain(op.us, value)
        elif code in self._effects and value > 0:
            self._play(op.us, self._effects[code])
            self._playing = code
        elif code == self._playing and value == 0:
            self._stop(op.us)

    # --- the motor -------------------------------------------------------------------------------

    def _play(self, us, program):
        self._stop(us)
        if program.times < math.inf:
            self._run(program, us, program.times)
            return
        if _length(program) > 0:
            self._loop = (program, us)
        self._run(program, us, 1)

    def _run(self, program, us, rounds):
        """Lays a program out, from `us` on, so many times."""
        first, length = self._round(program, us), _length(program)
        if first and rounds > _ROUNDS:
            loudest = max(first, key=lambda one: one.level)
            self._append(Rounds(
                first[0].start, first[-1].end + (rounds - 1) * length, loudest.level, loudest.own,
                loudest.kind, f"{loudest.label}, {rounds} times", loudest.known, first, length))
        elif first:
            for past in range(rounds):
                for one in first:
                    self._append(dataclasses.replace(one, start=one.start + past * length,
                                                     end=one.end + past * length))
        if self._loop:
            self._loop = (program, us + rounds * length)

    def _round(self, program, us):
        """The stretches of a program that is played once, from `us` on."""
        found = []
        for piece in program.pieces:
            end = us + piece.ms * 1000
            if piece.level > 0 and end > us:
                found.append(Stretch(us, end, piece.level, piece.level, program.kind, piece.label,
                                     piece.known).gained(self._gain))
            us = end
        return tuple(found)

    def _append(self, stretch):
        self._note_change(len(self.stretches))
        self.stretches.append(stretch)

    def _note_change(self, at):
        self.changed = at if self.changed is None else min(at, self.changed)

    def _stop(self, us):
        self.finish(us)
        self._loop, self._playing = None, None
        self._cut(us)

    def _cut(self, us):
        """Ends what reaches beyond `us`; returns what was cut off."""
        rest = []
        while self.stretches and self.stretches[-1].end > us:
            last = self.stretches[-1]
            self._note_change(len(self.stretches) - 1)
            if last.start < us:
                rest.insert(0, dataclasses.replace(last, start=us))
                last.end, last.known = us, True
                break
            rest.insert(0, self.stretches.pop())
        return rest

    def _set_gain(self, us, value):
        gain = max(0.0, min(1.0, value / waveform.FULL))
        self.finish(us)
        for stretch in self._cut(us):
            self._append(stretch.gained(gain))
        self._gain = gain


def _length(program):
    """Of one round, in microseconds."""
    return sum(piece.ms for piece in program.pieces) * 1000


def _timed(milliseconds):
    return waveform.Program("timed", (waveform.Piece(1.0, milliseconds, f"{milliseconds} ms"),))
