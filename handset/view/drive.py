# SPDX-License-Identifier: Apache-2.0
"""What the motor does, worked out from what the driver was told: a level over time.

Written from the driver's side. Whatever is armed last (a stored pattern's index, packets, a queue)
is what the next start plays, and a start uses it up; without one it plays for the time that was
written. A force-feedback effect plays what was uploaded with it, each time it is started.
"""

import dataclasses

import waveform

_LEGACY = "/sys/class/timed_output/vibrator/"
_LEDS = "/sys/class/leds/vibrator/"
_CONTROL = "/sys/class/qvx_vib_inputff/control/"
FF_GAIN = 0x60   # FF_GAIN of linux/input-event-codes.h
_FF_EVENT = 0x15
_UNGAINED = ("packets", "queue")  # these carry levels of their own


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
        while self._loop and self._loop[1] < us:
            self._run(*self._loop)

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
        if program.forever and any(piece.ms > 0 for piece in program.pieces):
            self._loop = (program, us)
        self._run(program, us)

    def _run(self, program, us):
        """Lays a program out once, from `us` on."""
        gain = 1.0 if program.kind in _UNGAINED else self._gain
        for piece in program.pieces:
            end = us + piece.ms * 1000
            if piece.level > 0 and end > us:
                self._append(Stretch(us, end, round(piece.level * gain, 6), piece.level,
                                     program.kind, piece.label, piece.known))
            us = end
        if self._loop:
            self._loop = (program, us)

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
            if stretch.kind not in _UNGAINED:
                stretch.level = round(stretch.own * gain, 6)
            self._append(stretch)
        self._gain = gain


def _timed(milliseconds):
    return waveform.Program("timed", (waveform.Piece(1.0, milliseconds, f"{milliseconds} ms"),))
