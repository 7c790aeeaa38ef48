# SPDX-License-Identifier: Apache-2.0
"""One session from outside: prepare, boot, phone up, the command, phone down, power off."""

import contextlib
import errno
import json
import os
import signal
import sys
import time

import guest_image
import kernel_module
from failure import Failure
from guest import Guest, NotStarted
from machine import Machine

GUEST_OUT = "/run/handset/out"  # $OUT: the exported directory, or one in the guest's memory

# The caller's variables that reach the command.
_PASSED_ON = ("ASAN_OPTIONS", "LSAN_OPTIONS", "TSAN_OPTIONS", "UBSAN_OPTIONS", "TERM", "TZ")
_PASSED_ON_PREFIX = "GTEST_"

# Seconds a guest gets to tell its kernel log, and to power off: as it should, and after a timeout.
_TIMEOUT = 10
_SHORT_TIMEOUT = 2

_SYSTEM_PATH = "/usr/local/sbin:/usr/local/bin:/usr/sbin:/usr/bin:/sbin:/bin"


class Interrupted(BaseException):
    """The user, or whoever started the launcher, wants it to end: `signal_number` says how."""

    def __init__(self, signal_number):
        super().__init__()
        self.signal_number = signal_number


class TimedOut(BaseException):
    """The session has taken longer than it was given."""


class PhoneFailed(Exception):
    """The phone tool refused, with `status`."""

    def __init__(self, text, status):
        super().__init__(text)
        self.status = status


class Phases:
    """How long each phase took; shown with --verbose, written with --timing."""

    def __init__(self, options):
        self._options = options
        self._seconds = {}

    @contextlib.contextmanager
    def measure(self, name):
        start = time.monotonic()
        yield
        self._seconds[name] = round(time.monotonic() - start, 4)
        if self._options.verbose:
            say(f"{name.replace('_', ' ')}: {self._seconds[name]:.2f} s")

    def write(self):
        if self._options.timing is not None:
            with open(self._options.timing, "w", encoding="utf-8") as file:
                json.dump(self._seconds, file)
                file.write("\n")


class Collected:
    """The streams of a command whose output is not the user's."""

    input = None

    def __init__(self):
        self.text = b""

    def write_output(self, chunk):
        self.text += chunk

    write_errors = write_output


def say(line):
    """Tells the user something beside the command's output."""
    print(f"handset: {line}", file=sys.stderr, flush=True)


def run(options, arguments, streams, terminal=None, join_socket=None):
    """Runs `arguments` in a guest of its own as `options` (see options.py) says. Returns the exit
    status of the launcher: the command's, 128 plus the signal that ended it, 124 after a timeout,
    127 or 126 when it could not be started, the phone's when that could not be brought up. Raises
    Failure and Interrupted; the guest is gone in every case."""
    phases = Phases(options)
    raise_on_signals()
    with phases.measure("preparation"):
        guest_image.prepare(options.arch, say)
        if options.driver == "kernel":
            kernel_module.build(options.arch, say)
    machine = Machine(options, join_socket)
    try:
        guest = Guest(machine)
        with phases.measure("boot"):
            guest.wait_for_boot()
        status = _run_in(guest, options, arguments, streams, terminal, phases)
        guest.power_off(_TIMEOUT)
        for line in machine.complaints():
            say(f"the guest's kernel says: {line}")
        return status
    finally:
        _ignore_signals()
        machine.kill()
        phases.write()


def _run_in(guest, options, arguments, streams, terminal, phases):
    timeout = _TIMEOUT
    try:
        signal.setitimer(signal.ITIMER_REAL, options.timeout or 0)
        with _phone(guest, options, phases), phases.measure("command"):
            wait_status = guest.run(in_view(options, arguments), options.directory,
                                    environment(options), streams, terminal)
        status = exit_status(wait_status)
    except NotStarted as failure:
        say(str(failure))
        status = 127 if failure.error == errno.ENOENT else 126
    except PhoneFailed as failure:
        say(str(failure))
        status = failure.status
    except TimedOut:
        say(f"not finished after {options.timeout:g} s; the guest was ended")
        status, timeout = 124, _SHORT_TIMEOUT
    except Interrupted:
        _leave_results(guest, options)
        raise
    _ignore_signals()
    _keep_kernel_log(guest, options, timeout)
    return status


@contextlib.contextmanager
def _phone(guest, options, phases):
    """The phone, up while the command runs. It stays as it is when that did not end."""
    if options.profile is None:
        yield
        return
    with phases.measure("phone_up"):
        _run_phone(guest, options, "up", "--profile", options.profile, "--out", GUEST_OUT)
    yield
    with phases.measure("phone_down"):
        _run_phone(guest, options, "down")


def _phone_tool(options):
    return os.path.join(options.build, "bin", "phone")


def _run_phone(guest, options, *words):
    streams = Collected()
    wait_status = guest.run([_phone_tool(options), *words], options.directory,
                            environment(options), streams)
    text = streams.text.decode(errors="replace").strip()
    if wait_status != 0:
        status = os.waitstatus_to_exitcode(wait_status)
        raise PhoneFailed(text or f"phone {words[0]} ended with status {status}",
                          status if status > 0 else 2)
    if options.verbose and text:
        say(text)


def environment(options):
    variables = {"PATH": f"{os.path.join(options.build, 'bin')}:{_SYSTEM_PATH}",
                 "HOME": "/root", "USER": "root", "OUT": GUEST_OUT, "LANG": "C.UTF-8"}
    if options.driver == "kernel":
        variables["PHONE_MODULE"] = kernel_module.module_path(options.arch)
    for name, value in os.environ.items():
        if name in _PASSED_ON or name.startswith(_PASSED_ON_PREFIX):
            variables[name] = value
    return variables


def in_view(options, arguments):
    """The command as it is run where the phone's nodes are seen, if there is to be a phone."""
    if options.profile is None:
        return arguments
    return [_phone_tool(options), "exec", "--", *arguments]


def exit_status(wait_status):
    """What a shell would say of a command's end."""
    status = os.waitstatus_to_exitcode(wait_status)
    return 128 - status if status < 0 else status


def _leave_results(guest, options):
    """What an interrupted session has to leave. A second signal, or a guest that hangs, ends it."""
    if options.out is None:
        return
    signal.setitimer(signal.ITIMER_REAL, _TIMEOUT)
    with contextlib.suppress(Failure, NotStarted, PhoneFailed, TimedOut):
        if options.profile is not None:  # the driver's journal is whole when it has ended
            _run_phone(guest, options, "down")
        _keep_kernel_log(guest, options, _SHORT_TIMEOUT)


def _keep_kernel_log(guest, options, seconds):
    if options.out is None:
        return
    log = guest.kernel_log(seconds)
    if log is not None:
        with open(os.path.join(options.out, "kernel.log"), "wb") as file:
            file.write(log)


def raise_on_signals():
    def interrupt(number, _):
        raise Interrupted(number)

    def time_out(*_):
        raise TimedOut

    for number in (signal.SIGINT, signal.SIGTERM, signal.SIGHUP):
        signal.signal(number, interrupt)
    signal.signal(signal.SIGALRM, time_out)


def _ignore_signals():
    signal.setitimer(signal.ITIMER_REAL, 0)
    for number in (signal.SIGINT, signal.SIGTERM, signal.SIGHUP, signal.SIGALRM):
        signal.signal(number, signal.SIG_IGN)
