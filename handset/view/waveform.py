# SPDX-License-Identifier: Apache-2.0
"""What the driver is handed to play, taken apart: packets, pattern queues, composite waveforms.

Each reader returns a Program or raises ValueError with what is wrong. docs/formats.md has the
grammars; what is drawn of a stored pattern is only what is known of it from outside.
"""

import dataclasses
import math
import re

FULL = 10000         # the driver's scale for intensities and the gain
FOREVER = 255        # a composite's outer loop that does not end
OWN_LENGTH = 65535   # a composite's duration: as long as the stored waveform is
HAS_DURATION = 0x08  # a composite section's flag
QUEUE_INDEX = 65534  # written to the pattern-index node: play what the queue node gets

UNKNOWN_MS = 50      # drawn for a stored pattern whose length nobody outside the driver knows

# Milliseconds that the services report for patterns: of the effects' patterns, of the primitives'.
_EFFECT_MS = {10: 50, 14: 100, 23: 100, 50: 50}
_PRIMITIVE_MS = {1: 20, 41: 20, 119: 20, 120: 100, 121: 150, 122: 500, 123: 130, 124: 300}


@dataclasses.dataclass(frozen=True)
class Piece:
    """A stretch of a program: `level` 0 to 1 for `ms` milliseconds; level 0 is a pause."""
    level: float
    ms: float
    label: str = ""
    known: bool = True  # whether the length is more than a guess


@dataclasses.dataclass(frozen=True)
class Program:
    """Pieces in order, all of them so many times; math.inf is until they are stopped."""
    kind: str
    pieces: tuple
    times: float = 1


def stored(index, level, primitives=False, platform_numbers=False):
    """The piece for a stored pattern. `primitives`: numbers of the composition's primitives come
    first; `platform_numbers`: these have been moved as the use_kyp_index node asks."""
    number = index
    if platform_numbers:
        number = index - 16 if 135 <= index <= 140 else index - 9
    known = (_PRIMITIVE_MS.get(number) if primitives else None) or _EFFECT_MS.get(
        number if primitives else index)
    return Piece(level, known or UNKNOWN_MS, f"pattern {index}", known is not None)


def packets(text):
    """The haptic_engine node's: "COUNT time intensity frequency overdrive ...", COUNT values."""
    values = [int(word) for word in text.split()]
    if not values or len(values) - 1 != values[0] or values[0] % 4:
        raise ValueError(f"packets: {len(values) - 1} values, {values[:1]} announced")
    rows = zip(*[iter(values[1:])] * 4)
    return Program("packets", tuple(
        Piece(_share(intensity), time, f"packet {frequency}" + (" overdrive" if overdrive else ""))
        for time, intensity, frequency, overdrive in rows))


def hybrid(text):
    """The hybrid_haptic_engine node's: "COUNT time intensity [#]value frequency ..."."""
    words = text.split()
    rows = list(zip(*[iter(words[1:])] * 4))
    if not words or len(words) - 1 != int(words[0]):
        raise ValueError(f"hybrid packets: {len(words) - 1} values, {words[:1]} announced")
    return Program("packets", tuple(
        Piece(_share(int(intensity)), int(time), f"packet {value} {frequency}")
        for time, intensity, value, frequency in rows))


def queue(text):
    """The cp_trigger_queue node's: INDEX.LEVEL and pauses in ms, separated by commas and spaces;
    "~" repeats for ever, "N!" N times. A composition's ends with ",0", its levels are of 10000;
    the others' are percent."""
    tokens = [token for token in re.split(r"[,\s\0]+", text) if token]
    of = FULL if tokens[-1:] == ["0"] else 100
    pieces, times = [], 1
    for token in tokens:
        if token.endswith("~"):
            times = math.inf
        elif token.endswith("!"):
            times = int(token[:-1])
        elif "." in token:
            index, level = token.split(".")[:2]
            pieces.append(stored(int(index), int(level) / of, primitives=of == FULL))
        elif int(token) > 0:
            pieces.append(Piece(0, int(token)))
    return Program("queue", tuple(pieces), times)


def composite(data, platform_numbers=False):
    """The force-feedback motor's type-10 layout: four bytes of header (two zero, the number of
    sections, the outer loop), then each section's fields in words of a zero byte and 24 bits."""
    if len(data) < 4 or len(data) % 4:
        raise ValueError(f"composite: {len(data)} bytes are no header and whole words")
    stream = b"".join(data[at + 1:at + 4] for at in range(4, len(data), 4))
    pieces, loop, at = [], None, 0
    for _ in range(data[2]):
        if at + 6 > len(stream):
            raise ValueError(f"composite: {data[2]} sections announced, the data ends before")
        amplitude, index, repeat, flags = stream[at:at + 4]
        delay = int.from_bytes(stream[at + 4:at + 6], "big")
        at += 6
        own_length = True
        if flags & HAS_DURATION:
            quarters = int.from_bytes(stream[at + 1:at + 3], "big")
            own_length = quarters == OWN_LENGTH
            at += 3
        if repeat == FOREVER:  # the first section of an inner loop
            loop = len(pieces)
        start = len(pieces)
        if amplitude:
            piece = stored(index, amplitude / 100, True, platform_numbers)
            if not own_length:
                piece = Piece(piece.level, quarters / 4, piece.label)
            pieces.append(piece)
        if delay:
            pieces.append(Piece(0, delay))
        if 0 < repeat < FOREVER:  # its last section
            start = start if loop is None else loop
            pieces[start:] = pieces[start:] * repeat
            loop = None
    return Program("composite", tuple(pieces), math.inf if data[3] == FOREVER else data[3] or 1)


def _share(intensity):
    return max(0.0, min(1.0, intensity / FULL))
