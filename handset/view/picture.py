# SPDX-License-Identifier: Apache-2.0
"""A run as a picture: lanes of requests, of what the driver took, and the drive, on one time axis.

Stretches of time in which nothing happened are cut short; between them every millisecond is as
wide as every other. Kinds differ by hatching as well as by colour, for grey print and for readers
who do not tell the colours apart.
"""

import bisect
import os

# No pyplot: it would double the time an import takes.
from matplotlib import rcParams
from matplotlib.backends.backend_agg import FigureCanvasAgg
from matplotlib.backends.backend_svg import FigureCanvasSVG
from matplotlib.collections import LineCollection, PolyCollection
from matplotlib.figure import Figure

WIDTH = 1200      # pixels
_DPI = 100
_LEFT, _RIGHT = 138, 14
_ROW = 22         # height of a row
_DRIVE = 150      # height of the drive's lane
_TEXT = 8         # points
_CHARACTER = 6.0  # pixels of an average character at that size
_TITLE_CHARACTER = 8.8
_GAP = 34         # width of a stretch of time that was cut short
_ROWS = 5         # of labels in a client's lane; what finds no room goes without

_INK, _GREY, _FAINT, _BAD = "#1a1a1a", "#767676", "#e4e4e4", "#b3261e"
_KINDS = {  # kind: (colour, hatching, name)
    "timed": ("#0072b2", "", "timed"),
    "pattern": ("#e69f00", "//", "stored pattern"),
    "packets": ("#56b4e9", "..", "packets"),
    "queue": ("#f0e442", "xx", "queue"),
    "composite": ("#cc79a7", "\\\\", "composite"),
}


class _Axis:
    """From the run's clock to pixels."""

    def __init__(self, run):
        spans = sorted(_spans(run)) or [(0, 1_000_000)]
        busy = [list(spans[0])]
        shortest = max(60_000, sum(end - start for start, end in spans) / 40)
        for start, end in spans[1:]:
            if start - busy[-1][1] > shortest:
                busy.append([start, end])
            else:
                busy[-1][1] = max(busy[-1][1], end)
        self.busy = busy
        room = WIDTH - _LEFT - _RIGHT
        self.gap = min(_GAP, room / 2 / len(busy))
        total = sum(end - start for start, end in busy)
        self.scale = (room - self.gap * len(busy)) / total
        self._starts = [start for start, _ in busy]
        self._places, place = [], self.gap / 2
        for start, end in busy:
            self._places.append(place)
            place += (end - start) * self.scale + self.gap

    def __call__(self, us):
        at = max(0, bisect.bisect_right(self._starts, us) - 1)
        start, end = self.busy[at]
        return self._places[at] + (min(us, end) - start) * self.scale

    def gaps(self):
        """(pixel, seconds) of each stretch that was cut short."""
        for at in range(1, len(self.busy)):
            yield (self._places[at] - self.gap / 2,
                   (self.busy[at][0] - self.busy[at - 1][1]) / 1e6)

    def ticks(self):
        """(pixel, seconds) in round numbers after the run's start."""
        origin = self.busy[0][0]
        step = next(size for size in _steps() if size * self.scale >= 70)
        last = -100
        for start, end in self.busy:
            first = origin + -(-(start - origin) // step) * step
            marks = list(range(int(first), int(end) + 1, step)) or [int(start)]
            for us in marks:
                if self(us) - last >= 56:
                    last = self(us)
                    yield last, round((us - origin) / 1e6, 3 if step < 10_000 else 2)


def _steps():
    size = 100
    while True:
        yield from (size, 2 * size, 5 * size)
        size *= 10


def _spans(run):
    """Where something happened, with some room around it."""
    room = 12_000
    for op in run.ops:
        yield op.us - op.took - room, op.us + room
    for request in run.requests:
        yield request.start - room, request.end + room
        if request.callback:
            yield request.callback - room, request.callback + room
    for us in run.callbacks:
        yield us - room, us + room
    for stretch in run.stretches:
        yield stretch.start, min(stretch.end, run.end) + room


def draw(run, title, paths):
    """Draws `run` into each of `paths`, as their endings say: .svg or .png."""
    rcParams.update({"svg.fonttype": "none", "svg.hashsalt": "run", "font.size": _TEXT,
                     "font.family": "DejaVu Sans", "hatch.linewidth": 0.6})
    figure = _Sheet(run, title).figure
    for path in paths:
        canvas = FigureCanvasSVG if path.endswith(".svg") else FigureCanvasAgg
        metadata = {"Date": None} if path.endswith(".svg") else None
        canvas(figure).print_figure(path, dpi=_DPI, metadata=metadata, facecolor="white")


def check_path(path):
    """What is wrong with a path to draw to, or None."""
    if not path.endswith((".svg", ".png")):
        return f"{path}: a picture's name ends in .svg or .png"
    if not os.path.isdir(os.path.dirname(path) or "."):
        return f"{path}: its directory does not exist"
    return None


class _Sheet:
    """The figure under way: one axes in pixels, y growing downward from the top."""

    def __init__(self, run, title):
        self._run, self._axis = run, _Axis(run)
        self._shapes, self._y = [], 44
        self._lanes()
        height = self._y + 26
        self.figure = Figure(figsize=(WIDTH / _DPI, height / _DPI), dpi=_DPI)
        axes = self._axes = self.figure.add_axes((0, 0, 1, 1))
        axes.set_axis_off()
        axes.set_xlim(0, WIDTH)
        axes.set_ylim(height, 0)
        room = self._time(height) - 24
        axes.text(12, 18, _shortened(title, room, _TITLE_CHARACTER), size=11, weight="bold",
                  color=_INK, va="center")
        for shape in self._shapes:
            shape(axes)

    # --- lanes, from the top ----------------------------------------------------------------------

    def _lanes(self):
        run = self._run
        clients = {}
        for request in run.requests:
            clients.setdefault(request.client, []).append(request)
        for client, requests in clients.items():
            self._bars(client, [(one.start, one.end, one.describe(), one.failed, one.callback)
                                for one in requests])
        if run.callbacks and not any(request.callback for request in run.requests):
            self._row("callbacks", [(us, us, "onComplete", False, "D") for us in run.callbacks])
        marks = [(op.us - op.took, op.us, f"{op.name}: {text}", True, None)
                 for op, text in run.marks]
        if marks:
            self._bars("faults, hangs", marks)
        rows = {}
        for op in run.ops:
            if op.op in ("write", "upload", "event", "erase"):
                name = op.name if op.op == "write" else f"motor {op.kind}"
                rows.setdefault(name, []).append(
                    (op.us - op.took, op.us, op.describe().removeprefix(op.kind + " "), op.failed,
                     "X" if op.failed else "|"))
        for name, entries in rows.items():
            self._row(name, entries)
        self._drive()

    def _lane_name(self, name, height):
        top = self._y
        self._y += height
        middle = top + height / 2

        def shape(axes):
            axes.axhline(top, color=_FAINT, linewidth=0.8, zorder=0)
            axes.text(_LEFT - 8, middle, name, ha="right", va="center", color=_INK)
        self._shapes.append(shape)
        return top

    def _bars(self, name, entries):
        """Bars with the words beside them, in as many rows as they need. `entries` are (start, end,
        text, whether it is bad, when the callback came or None)."""
        free, placed, last = [], [], -1
        for start, end, text, bad, callback in entries:
            left, ends = self._x(start), self._x(end)
            right = self._x(callback) if callback else ends
            wide = 8 + _CHARACTER * len(text)
            backward = left + wide > WIDTH and right - wide > _LEFT
            begins = right - wide if backward else left
            row = next((row for row, until in enumerate(free) if until <= begins), len(free))
            if row == _ROWS and left - last < 1:
                continue
            last = left
            if row == _ROWS:  # no room for its words
                placed.append((row - 1, left, ends, right, "", bad, False, callback))
                continue
            free[row:row + 1] = [max(right, begins + wide)]
            placed.append((row, left, ends, right, text, bad, backward, callback))
        top = self._lane_name(name, len(free) * _ROW + 2)
        self._shapes.append(lambda axes: _draw_bars(axes, top, placed))

    def _row(self, name, entries):
        """Marks in one row, with words where there is room for them."""
        top = self._lane_name(name, _ROW)
        middle = top + _ROW / 2
        places, words, bars = {}, [], []
        previous = -1e9
        for at, (start, us, text, bad, marker) in enumerate(entries):
            x = self._x(us)
            places.setdefault((marker, bad), {})[round(x)] = x  # one mark a pixel
            if x - self._x(start) > 2:
                bars.append((self._x(start), x, bad))
            following = self._x(entries[at + 1][1]) if at + 1 < len(entries) else WIDTH + 400
            fitting = text if bad else _shortened(text, following - x - 10)
            if x >= previous and fitting:
                words.append((x, fitting, bad))
                previous = x + _CHARACTER * len(fitting) + 10

        def shape(axes):
            for (marker, bad), columns in places.items():
                axes.plot(list(columns.values()), [middle] * len(columns), linestyle="",
                          marker=marker, color=_BAD if bad else _INK,
                          markersize=7 if marker == "X" else 5 if marker == "D" else 10)
            for left, right, bad in bars:
                axes.plot([left, right], [middle] * 2, color=_BAD if bad else _INK, linewidth=2.5)
            for x, text, bad in words:
                ends = x + _CHARACTER * len(text) + 8 > WIDTH
                axes.text(x - 6 if ends else x + 6, middle, text, va="center",
                          ha="right" if ends else "left", color=_BAD if bad else _INK,
                          weight="bold" if bad else "normal", clip_on=True)
        self._shapes.append(shape)

    def _drive(self):
        top = self._lane_name("", _DRIVE + 30) + 22
        bottom = top + _DRIVE
        stretches = [part for one in self._run.stretches if one.start < self._run.end
                     for part in one.parts(1 / self._axis.scale)]

        def level(axes):
            axes.text(_LEFT - 8, top - 14, "drive", ha="right", va="center", color=_INK)
            for share in (0, 50, 100):
                y = bottom - _DRIVE * share / 100
                axes.plot([_LEFT, WIDTH - _RIGHT], [y, y], color=_INK if share == 0 else _FAINT,
                          linewidth=1 if share == 0 else 0.8, zorder=1)
                axes.text(_LEFT - 8, y, f"{share} %", ha="right", va="center", color=_GREY, size=7)
            self._blocks(axes, bottom, stretches)
            self._drive_words(axes, bottom, stretches)
        self._shapes.append(level)
        self._y += 8

    def _blocks(self, axes, bottom, stretches):
        """All blocks of a kind at once, which is many times quicker than one by one."""
        blocks, open_ends = {}, []
        for left, right, stretch in _per_pixel(stretches, self._x):
            y = bottom - _DRIVE * stretch.level
            narrow = right - left < 3  # an outline would be all there is to see
            blocks.setdefault((stretch.kind, narrow), []).append(
                [(left, bottom), (left, y), (right, y), (right, bottom)])
            if not stretch.known:
                open_ends.append([(right, bottom), (right, y)])
        for (kind, narrow), shapes in blocks.items():
            colour, hatch, _ = _KINDS[kind]
            axes.add_collection(PolyCollection(
                shapes, facecolor=colour, edgecolor=colour if narrow else _INK,
                linewidth=0 if narrow else 0.7, hatch="" if narrow else hatch, zorder=2))
        axes.add_collection(LineCollection(open_ends, color="white", linewidth=2.2, zorder=3))
        axes.add_collection(LineCollection(open_ends, color=_INK, linewidth=1.2, linestyle=":",
                                           zorder=4))

    def _drive_words(self, axes, bottom, stretches):
        """Names above the blocks, where there is room for them; a loop's are said once."""
        said, free = None, {}  # up to where each height of a line has words
        for at, stretch in enumerate(stretches):
            following = stretches[(at + 1) % len(stretches)]
            loops = stretch.kind in ("queue", "composite")
            name = stretch.label if stretch.known else f"{stretch.label}, ? ms"
            name = f"{name} {stretch.level:.0%}" if stretch.level < 1 else name
            if loops and (following.kind, following.label) == (stretch.kind, stretch.label) != said:
                name += ", repeated"
            x, y = self._x(stretch.start), bottom - _DRIVE * stretch.level - 4
            row = round(y / 12)
            if (not loops or (stretch.kind, stretch.label) != said) and \
                    all(x >= free.get(near, 0) for near in (row - 1, row, row + 1)):
                name = self._beside_taller(stretches, at, name)
                if not name:
                    continue
                axes.text(x, y, name, va="bottom", color=_INK, clip_on=True)
                free[row] = x + _CHARACTER * len(name)
                said = stretch.kind, stretch.label

    def _beside_taller(self, stretches, at, name):
        """As much of a name as fits before a later block that reaches as high as the words; "" where
        that is too little to tell blocks apart."""
        x = self._x(stretches[at].start)
        for number in range(at + 1, len(stretches)):
            room = self._x(stretches[number].start) - x
            if room >= _CHARACTER * len(name):
                break
            if stretches[number].level > stretches[at].level:
                return _shortened(name, room) if room > 10 * _CHARACTER else ""
        return name

    # --- time ---------------------------------------------------------------------------------------

    def _time(self, height):
        axes, bottom = self._axes, self._y
        for x, seconds in self._axis.ticks():
            x += _LEFT
            axes.plot([x, x], [30, bottom], color=_FAINT, linewidth=0.8, zorder=0)
            axes.text(x, bottom + 4, f"{seconds:g} s", ha="center", va="top", color=_GREY, size=7.5)
        for x, seconds in self._axis.gaps():
            x += _LEFT
            half = self._axis.gap / 2 - 3
            axes.fill([x - half, x + half, x + half, x - half], [30, 30, bottom, bottom],
                      color="#f4f4f4", linewidth=0, zorder=0)
            if half > 10:
                axes.text(x, 37, f"{seconds:.1f} s", ha="center", va="center", color=_GREY, size=6.5)
        left = WIDTH - _RIGHT
        for kind in reversed(_KINDS):
            if any(stretch.kind == kind for stretch in self._run.stretches):
                left = self._key(left, *_KINDS[kind])
        if any(not stretch.known for stretch in self._run.stretches):
            left = self._key(left, "white", "", "dotted end: length not known", ":")
        return left

    def _key(self, right, colour, hatch, name, line="-"):
        left = right - _CHARACTER * len(name) - 24
        self._axes.fill([left, left + 16, left + 16, left], [12, 12, 24, 24], facecolor=colour,
                        edgecolor=_INK, linewidth=0.7, hatch=hatch, linestyle=line)
        self._axes.text(left + 20, 18, name, va="center", color=_INK)
        return left - 12

    def _x(self, us):
        return _LEFT + self._axis(us)


def _shortened(text, room, character=_CHARACTER):
    """As much of a text as fits, "" where that would say nothing."""
    fitting = int(room / character)
    return text if len(text) <= fitting else text[:fitting - 1] + "…" if fitting > 3 else ""


def _draw_bars(axes, top, placed):
    """All bars at once, which is many times quicker than one by one. `placed` are (row, left, end of
    the answer, end of the callback, text, whether it is bad, whether the text ends there, whether
    there was a callback)."""
    bars, marks, waits, diamonds = [], [], [], {}
    for row, left, ends, right, text, bad, backward, callback in placed:
        y, wide = top + row * _ROW, max(ends, left + 2)
        bars.append([(left, y + 18), (wide, y + 18), (wide, y + 21), (left, y + 21)])
        marks.append([(left, y + (16 if backward else 4)), (left, y + 21)])
        if text:
            axes.text(right if backward else left + 4, y + 11, text, va="center",
                      color=_BAD if bad else _INK, ha="right" if backward else "left",
                      weight="bold" if bad else "normal")
        if callback:
            waits.append([(ends, y + 19.5), (right, y + 19.5)])
            diamonds.setdefault(_BAD if bad else _INK, []).append((right, y + 19.5))
    colours = [_BAD if bad else _INK for *_, bad, _, _ in placed]
    axes.add_collection(PolyCollection(bars, facecolors=colours, linewidth=0))
    axes.add_collection(LineCollection(marks, colors=colours, linewidth=1.2))
    axes.add_collection(LineCollection(waits, color=_INK, linewidth=1, linestyle=":"))
    for colour, places in diamonds.items():
        axes.plot(*zip(*places), linestyle="", marker="D", markersize=5, color=colour)


def _per_pixel(stretches, place):
    """(left, right, stretch), without those that lie in a pixel that is drawn already."""
    last = -1
    for stretch in stretches:
        left, right = place(stretch.start), place(stretch.end)
        if right - last < 1:
            continue
        last = right
        yield left, max(right, left + 0.8), stretch
