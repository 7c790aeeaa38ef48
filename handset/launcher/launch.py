# SPDX-License-Identifier: Apache-2.0
"""What handset/run and handset/shell do: options, session, exit status."""

import contextlib
import os
import shlex
import signal
import subprocess
import sys
import tempfile

import join
import options
import session
from failure import Failure
from guest_image import PROJECT
from terminal import Terminal


class _Inherited:
    """The launcher's own streams. Standard input is passed on unless it is a terminal: a command
    put into the background must not be stopped for reading it."""

    def __init__(self, input_descriptor):
        self.input = input_descriptor

    def write_output(self, chunk):
        _write_all(1, chunk)

    def write_errors(self, chunk):
        _write_all(2, chunk)


def run_command(program, description, words):
    """handset/run; returns its exit status."""
    def work():
        chosen = options.parse(program, description, words, takes_command=True)
        streams = _Inherited(None if os.isatty(0) else 0)
        profile = os.path.basename(chosen.profile or "off")
        with contextlib.ExitStack() as scratch:
            if (chosen.picture or chosen.trace) and chosen.out is None:
                chosen.out = scratch.enter_context(tempfile.TemporaryDirectory(prefix="handset-"))
            status = session.run(chosen, chosen.command, streams)
            drawn = _draw(chosen, shlex.join([program, "--profile", profile, "--", *chosen.command]))
            return status or drawn
    return _with_one_line(program, work)


def run_shell(program, description, words):
    """handset/shell; returns the shell's exit status."""
    def work():
        chosen = options.parse(program, description, words, takes_command=False)
        if not os.isatty(0) or not os.isatty(1):
            raise Failure("needs a terminal; for a script use handset/run")
        if chosen.join is not None:
            return _join(chosen.join)
        command = _shell(chosen.arch)
        joined = {"arguments": session.in_view(chosen, command),
                  "directory": chosen.directory, "environment": session.environment(chosen)}
        with join.offered(joined) as join_socket, Terminal() as terminal:
            return session.run(chosen, command, _Inherited(0), terminal, join_socket)
    return _with_one_line(program, work)


def _join(which):
    guest, description = join.guest(which)
    session.raise_on_signals()
    with Terminal() as terminal:
        return session.exit_status(guest.run(streams=_Inherited(0), terminal=terminal, **description))


def _shell(arch):
    """The command that is the shell. The host's bash runs on a processor of the host's kind alone."""
    start = os.path.join(PROJECT, "handset", "launcher", "shellrc")
    variables = ["env", f"HANDSET_PROJECT={PROJECT}"]
    if arch == "amd64":
        return [*variables, "bash", "--rcfile", start, "-i"]
    return [*variables, f"ENV={start}", "sh", "-i"]


def _draw(chosen, title):
    """Draws what the session has left, where --picture or --trace asks for it; the exit status of
    the one that could not, else 0."""
    status = 0
    for tool, file, more in (("picture", chosen.picture, ["--title", title]),
                             ("trace", chosen.trace, [])):
        if file is not None:
            done = subprocess.run([os.path.join(PROJECT, "handset", tool), chosen.out, "--out",
                                   file, *more], stdout=subprocess.DEVNULL, check=False)
            status = status or done.returncode
    return status


def _with_one_line(program, work):
    while os.open(os.devnull, os.O_RDWR) <= 2:  # a missing standard stream is an empty one
        pass
    try:
        return work()
    except Failure as failure:
        print(f"{program}: {failure}", file=sys.stderr)
        return 2
    except BrokenPipeError:  # whoever read the output has enough
        return _die_of(signal.SIGPIPE)
    except session.Interrupted as interrupted:
        return _die_of(interrupted.signal_number)


def _die_of(number):
    """Ends this process by the signal that asked for it, so that the caller sees which."""
    signal.signal(number, signal.SIG_DFL)
    os.kill(os.getpid(), number)
    return 128 + number


def _write_all(descriptor, chunk):
    while chunk:
        chunk = chunk[os.write(descriptor, chunk):]
