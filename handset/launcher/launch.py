# SPDX-License-Identifier: Apache-2.0
"""What handset/run and handset/shell do: options, session, exit status."""

import os
import signal
import sys

import options
import session
from failure import Failure
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
        return session.run(chosen, chosen.command, streams)
    return _with_one_line(program, work)


def run_shell(program, description, words):
    """handset/shell; returns the shell's exit status."""
    def work():
        chosen = options.parse(program, description, words, takes_command=False)
        if not os.isatty(0) or not os.isatty(1):
            raise Failure("needs a terminal; for a script use handset/run")
        with Terminal() as terminal:
            prompt = ["env", "PS1=handset:\\w# ", "sh"]
            return session.run(chosen, prompt, _Inherited(0), terminal)
    return _with_one_line(program, work)


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
