# SPDX-License-Identifier: Apache-2.0
"""handset/picture, handset/trace and handset/replay: from a run's directory to a file."""

import argparse
import os
import sys

from run import Unreadable, read


class _Refused(Exception):
    """One line for the user."""


class _Parser(argparse.ArgumentParser):
    def error(self, message):
        raise _Refused(message)


def picture(program, description, words):
    """handset/picture; returns its exit status."""
    def work(parser):
        parser.add_argument("directory", metavar="DIR", help="what handset/run left with --out")
        parser.add_argument("--out", metavar="FILE", action="append",
                            help="a .svg or .png to draw to, may be given twice (default run.svg "
                                 "and run.png in DIR)")
        parser.add_argument("--title", metavar="STRING", help="default: the directory's name")
        options = parser.parse_args(words)
        import picture as drawing  # takes its time; a wrong option is told before
        paths = options.out or [os.path.join(options.directory, name)
                                for name in ("run.svg", "run.png")]
        run = read(options.directory)
        for path in paths:
            if wrong := drawing.check_path(path):
                raise _Refused(wrong)
        name = os.path.basename(os.path.realpath(options.directory))
        drawing.draw(run, options.title or name, paths)
        print("\n".join(paths))
    return _with_one_line(program, description, work)


def trace(program, description, words):
    """handset/trace; returns its exit status."""
    def work(parser):
        parser.add_argument("directory", metavar="DIR", help="what handset/run left with --out")
        parser.add_argument("--out", metavar="FILE", help="default trace.json in DIR")
        options = parser.parse_args(words)
        import trace as tracing
        path = options.out or os.path.join(options.directory, "trace.json")
        tracing.write(read(options.directory), path)
        print(path)
    return _with_one_line(program, description, work)


def replay(program, description, words):
    """handset/replay; returns its exit status."""
    def work(parser):
        parser.add_argument("source", metavar="DIR|LOG",
                            help="what handset/run left with --out, or a log as logcat prints it")
        source = parser.parse_args(words).source
        import sequence
        calls, left_out = sequence.of(source)
        sys.stdout.writelines(sequence.line(call) for call in calls)
        for what in left_out:
            print(f"{program}: left out: {what}", file=sys.stderr)
    return _with_one_line(program, description, work)


def _with_one_line(program, description, work):
    try:
        work(_Parser(prog=program, description=description, allow_abbrev=False))
        return 0
    except (_Refused, Unreadable) as failure:
        print(f"{program}: {failure}", file=sys.stderr)
    except OSError as error:
        print(f"{program}: {error.filename}: {error.strerror}", file=sys.stderr)
    return 2
