# SPDX-License-Identifier: Apache-2.0
"""The requests that the service's log tells of: every request logs its name and most arguments.

Taken are the handset's own lines, with or without microseconds since boot in front, and what
`logcat` prints of a phone (its formats threadtime and brief, and time in front of either).
"""

import dataclasses
import os
import re

_TAG = re.compile(r"QvxVibrator-HAL-AIDL-(?:CORE|EXT)")
_STAMP = re.compile(r"\[?\s*(\d{4,})\]?[ :]")            # microseconds since boot
_CLOCK = re.compile(r"\d\d-\d\d (\d\d):(\d\d):(\d\d)(\.\d+)?")
_SOURCE = re.compile(r"^[\w.]+:\d+\] ")                   # libbase's "NodeIo.cpp:63] "

NOTIFY = re.compile(r"Notifying compose(?: PWLE)? complete$")

# A request's first line -> its method. Groups are arguments in the order of the declaration.
# (composePwle logs nothing of its own: it shows as the getPwleCompositionSizeMax that it asks.)
_ENTRIES = [(method, re.compile(pattern + r"\s*$")) for method, pattern in (
    ("std off", r"V_2_0: Vibrator off"),
    ("std on", r"V_2_0: Vibrator on for timeoutMs: (-?\d+)"),
    ("std perform", r"V_2_0: Vibrator perform Effect : (-?\d+) EffectStrength : (-?\d+)"),
    ("std setAmplitude", r"V_2_0: Vibrator set amplitude: (\S+)"),
    ("std setExternalControl", r"Vibrator set external control: ([01])"),
    ("std compose", r"V_2_0: Vibrator compose : \d+ size"),
    ("std getCapabilities", r"V_2_0: Vibrator reporting capabilities"),
    ("std getSupportedEffects", r"V_2_0: getSupportedEffects"),
    ("std getSupportedPrimitives", r"V_2_0: Vibrator getSupportedPrimitives"),
    ("std getPrimitiveDuration", r"V_2_0: Vibrator getPrimitiveDuration"),
    ("std getCompositionDelayMax", r"V_2_0: Vibrator getCompositionDelayMax"),
    ("std getCompositionSizeMax", r"V_2_0: Vibrator getCompositionSizeMax"),
    ("std getSupportedAlwaysOnEffects", r"V_2_0: Vibrator getSupportedAlwaysOnEffects"),
    ("std %s", r"V_2_0: \[(\w+)\]unsupported"),
    ("ext setAmplitude", r"V_4_0: setAmplitude (-?\d+)"),
    ("ext setForceTouchAmplitude", r"V_4_0: setForceTouchAmplitude (-?\d+)"),
    ("ext setFrequencyType", r"V_4_0: setFrequencyType(-?\d+)"),
    ("ext setFolderStatus", r"V_4_0: setFolderStatus(-?\d+)"),
    ("ext setFolderTentModeStatus", r"V_4_0: setFolderTentModeStatus(-?\d+)"),
    ("ext getNumberOfPrebakedHapticPattern", r"V_4_0: getNumberOfPrebakedHapticPattern"),
    ("ext getAmplitudeList", r"V_4_0: getAmplitudeList"),
    ("ext performHapticEngine", r"V_4_0: performHapticEngine"),
    ("ext performHybridHapticEngine", r"V_4_0: performHybridHapticEngine"),
    ("ext performFifoHapticEngine", r"V_4_0: performFifoHapticEngine"),
    ("ext performPrebakedHapticPattern",
     r"V_4_0: performPrebakedHapticPattern (-?\d+) : (-?\d+) : ([01])"),
    ("ext performPlaybackEngine", r"V_4_0: performPlaybackEngine"),
    ("ext perform", r"V_4_0: Vibrator perform Effect for QVX : (-?\d+) amplitude : (-?\d+)"),
)]


@dataclasses.dataclass
class Logged:
    """A request as the log tells of it. `us` is None without a clock since boot, `seconds` None
    without any; `details` are the lines that followed it."""
    us: int
    seconds: float
    method: str
    arguments: list
    details: list


@dataclasses.dataclass
class Log:
    requests: list   # of Logged
    callbacks: list  # microseconds since boot


def parse(line):
    """(us, seconds, message) of a line that a service logged, each None where it does not tell;
    None for other lines."""
    tag = _TAG.search(line)
    if tag is None:
        return None
    stamp = _STAMP.match(line)
    clock = _CLOCK.search(line)
    seconds = None
    if clock:
        hours, minutes, whole, part = clock.groups()
        seconds = int(hours) * 3600 + int(minutes) * 60 + int(whole) + float(part or 0)
    message = line[tag.end():].rstrip("\n")
    if clock and clock.start() > tag.end():   # the handset's: the time and the ids follow the tag
        message = re.sub(r"^ \w ", "", message)
        message = message[_CLOCK.search(message).end():]
        message = re.sub(r"^(?:\s+\d+){2} ", "", message)
    else:
        message = re.sub(r"^\s*(?:\(\s*\d+\))?: ", "", message)
    return (int(stamp.group(1)) if stamp else None, seconds, _SOURCE.sub("", message))


def read(path):
    """The requests in a log's file; none where there is no such file."""
    log = Log([], [])
    if not os.path.isfile(path):
        return log
    with open(path, encoding="utf-8", errors="replace") as lines:
        for line in lines:
            parsed = parse(line)
            if parsed is None:
                continue
            us, seconds, message = parsed
            entry = _entry(message)
            if entry and not (log.requests and _is_inside(entry[0], log.requests[-1])):
                log.requests.append(Logged(us, seconds, *entry, []))
            elif log.requests:
                log.requests[-1].details.append(message)
            if us is not None and NOTIFY.search(message):
                log.callbacks.append(us)
    return log


def _is_inside(method, request):
    """Whether the service asks itself, in the middle of a request."""
    if method == "std getPrimitiveDuration":
        return request.method == "std compose" and not any(
            line.startswith((" totaldelay", "V_2_0:  e.", "V_2_0: effectBuilder"))
            for line in request.details)
    return method == "std getSupportedEffects" and not request.details and \
        request.method == "std getSupportedAlwaysOnEffects"


def _entry(message):
    # Nine lines in ten begin otherwise.
    if not message.startswith(("V_2_0: ", "V_4_0: ", "Vibrator set ")):
        return None
    for method, pattern in _ENTRIES:
        found = pattern.match(message)
        if found and "%s" in method:
            return method % found.group(1), []
        if found:
            return method, list(found.groups())
    return None
