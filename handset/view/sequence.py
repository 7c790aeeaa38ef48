# SPDX-License-Identifier: Apache-2.0
"""A run's calls, or what a log tells of a phone's, as a sequence that `vibctl play` takes: one JSON
object a line.

    {"at":1250.4,"uid":1000,"iface":"std","method":"perform","args":["TICK","STRONG"]}

at is in milliseconds from the first call; uid is who called, left out where the log does not tell;
callback is there where one was passed, or could have been and was not.
"""

import json
import os
import re

import requests_of_log
import run
import waveform

_PRIMITIVES = {1: "CLICK", 124: "THUD", 123: "SPIN", 121: "QUICK_RISE", 122: "SLOW_RISE",
               120: "QUICK_FALL", 41: "LIGHT_TICK", 119: "LOW_TICK",
               # the same as use_kyp_index moves them
               10: "CLICK", 140: "THUD", 139: "SPIN", 137: "QUICK_RISE", 138: "SLOW_RISE",
               136: "QUICK_FALL", 50: "LIGHT_TICK", 135: "LOW_TICK"}
_PLAIN = ("std off", "std on", "std perform", "std setAmplitude", "std getCapabilities",
          "std getSupportedEffects", "std getSupportedPrimitives", "std getCompositionDelayMax",
          "std getCompositionSizeMax", "std getSupportedAlwaysOnEffects", "ext setAmplitude",
          "ext setForceTouchAmplitude", "ext setFrequencyType", "ext setFolderStatus",
          "ext setFolderTentModeStatus", "ext getNumberOfPrebakedHapticPattern", "ext perform")


def of(source):
    """(calls, left out): the calls as dictionaries, and what the source does not tell, in words.
    Raises run.Unreadable."""
    if os.path.isdir(source):
        recorded = os.path.join(source, "calls.jsonl")
        if os.path.isfile(recorded):
            return _of_calls(run.read(source).requests), []
        source = os.path.join(source, "service.log")
    if not os.path.isfile(source):
        raise run.Unreadable(f"{source}: no such file; give a run's directory or a log")
    logged = requests_of_log.read(source).requests
    if not logged:
        raise run.Unreadable(f"{source}: no line of the vibrator service there")
    return _of_log(logged)


_AWAITED = ("std compose", "std composePwle")  # played with a callback unless told


def _call(at, method, words, uid=None):
    """A call of a sequence; `words` are those of a command line."""
    call = {"at": round(at, 3)}
    if uid is not None:
        call["uid"] = uid
    iface, name = method.split()
    call.update(iface=iface, method=name, args=[word for word in words if word != "--callback"])
    if "--callback" in words or method in _AWAITED:
        call["callback"] = "--callback" in words
    return call


def line(call):
    """One line of a sequence."""
    return json.dumps(call, separators=(",", ":")) + "\n"


def _of_calls(requests):
    first = requests[0].start if requests else 0
    return [_call((one.start - first) / 1000, one.method, one.arguments, int(one.client.split()[1]))
            for one in requests]


def _of_log(logged):
    calls, left_out = [], []
    if any(one.us is None and one.seconds is None for one in logged):
        left_out.append("the times: lines without one follow each other at once")
    elif all(one.us is None and one.seconds == int(one.seconds) for one in logged):
        left_out.append("the times within a second")
    left_out.append("who called; the service does not log it")
    first = _milliseconds(logged[0])
    for one in logged:
        arguments = _arguments(one)
        at = _milliseconds(one) - first
        if arguments is None:
            left_out.append(f"{one.method} at {at / 1000:.3f} s: its arguments are not logged")
            continue
        at += 86_400_000 if at < 0 else 0  # past midnight
        calls.append(_call(at, one.method, arguments))
    return calls, left_out


def _milliseconds(logged):
    if logged.us is not None:
        return logged.us / 1000
    return (logged.seconds or 0) * 1000


def _arguments(one):
    """The words that vibctl takes, or None where the log does not tell them."""
    if one.method in _PLAIN:
        refused = any(detail.startswith("Not support") for detail in one.details)
        return one.arguments + (["--callback"] if refused else [])
    if one.method in ("std setExternalControl", "ext performPrebakedHapticPattern"):
        return one.arguments[:-1] + ["true" if one.arguments[-1] == "1" else "false"]
    reader = {"std compose": _composition, "ext performHapticEngine": _packets,
              "ext performHybridHapticEngine": _hybrid_packets,
              "ext performPlaybackEngine": _playback, "ext performFifoHapticEngine": _fifo,
              "ext getAmplitudeList": _amplitude_type}.get(one.method)
    return reader(one.details) if reader else None


def _found(pattern, details):
    return next((found.group(1) for found in (re.match(pattern, detail) for detail in details)
                 if found), None)


def _composition(details):
    text = _found(r"V_2_0: Effect cmd : (.+)", details)
    if text is None:
        return None
    tokens = [token for token in text.split(",") if token]
    # In force-feedback mode a level is percent, elsewhere it is of 10000 and a 0 ends the string.
    sysfs = any("Effect cmd" in detail and detail.endswith(",0") for detail in details)
    words, delay = [], 0
    for token in tokens:
        if "." not in token:
            delay = int(token)
            continue
        index, level = token.split(".")
        if int(index) not in _PRIMITIVES:
            return None
        scale = int(level) / (waveform.FULL if sysfs else 100)
        words.append(f"{delay},{_PRIMITIVES[int(index)]},{scale:g}")
        delay = 0
    if delay:
        words.append(f"{delay},NOOP,0")
    notified = any(requests_of_log.NOTIFY.search(detail) for detail in details)
    return words + (["--callback"] if notified else [])


def _packets(details):
    """The intensities are logged after scaling, so the amplitude is all of it."""
    text = _found(r"V_4_0: performHapticEngine : (.+)", details)
    if text is None:
        return None
    rows = zip(*[iter(text.split()[1:])] * 4)
    return [str(waveform.FULL), *(",".join(row) for row in rows)]


def _hybrid_packets(details):
    text = _found(r"V_4_0: performHybridHapticEngine : (.+)", details)
    if text is None:
        return None
    rows = zip(*[iter(text.split()[1:])] * 4)
    return [str(waveform.FULL), *(
        f"{time},{intensity},{int(value[0] == '#')},{value.lstrip('#')},{frequency}"
        for time, intensity, value, frequency in rows)]


def _playback(details):
    repeat = _found(r"V_4_0: performPlaybackEngine repeat : ([01])", details)
    count = _found(r"V_4_0: performPlaybackEngine repeatCnt : (-?\d+)", details)
    text = _found(r"V_4_0: Packet data with repeat option : (.+)", details)
    if None in (repeat, count, text):
        return None
    packets = re.findall(r"(-?\d+)\.(-?\d+)(?:,(-?\d+)(?=,|$))?", text.rstrip("~"))
    return ["true" if repeat == "1" else "false", count,
            *(f"{index},{level},{option or 0}" for index, level, option in packets)]


def _fifo(details):
    number = _found(r".*writeNode node:\S*/fifo val:(-?\d+)", details)
    return None if number is None else [number]


def _amplitude_type(details):
    number = _found(r"V_4_0: getAmplitudeList amplitude type: (-?\d+)", details)
    return None if number is None else [number]
