# SPDX-License-Identifier: Apache-2.0
"""handset/picture, handset/trace and handset/replay: from a run's directory to a file."""

import os
import sys

from failure import Failure, Parser, one_line, path
from run import Unreadable, read


def picture(program, description, words):
    """handset/picture; returns its exit status."""
    def work(parser):
        parser.add_argument("directory", metavar="DIR", type=path,
                            help="what handset/run left with --out")
        parser.add_argument("--out", metavar="FILE", action="append", type=path,
                            help="a .svg or .png to draw to, may be given twice (default run.svg "
                                 "and run.png in DIR)")
        parser.add_argument("--title", metavar="STRING", help="default: the directory's name")
        options = parser.parse_args(words)
        import picture as drawing  # takes its time; a wrong option is told before
        paths = options.out or [os.path.join(options.directory, name)
                                for name in ("run.svg", "run.png")]
        run = read(options.directory)
        for file in paths:
            if wrong := drawing.check_path(file):
                raise Failure(wrong)
        name = os.path.basename(os.path.realpath(options.directory))
        drawing.draw(run, options.title or name, paths)
        print("\n".join(paths))
    return _with_one_line(program, description, work)


def trace(program, description, words):
    """handset/trace; returns its exit status."""
    def work(parser):
        parser.add_argument("directory", metavar="DIR", type=path,
                            help="what handset/run left with --out")
        parser.add_argument("--out", metavar="FILE", type=path, help="default trace.json in DIR")
        options = parser.parse_args(words)
        import trace as tracing
        file = options.out or os.path.join(options.directory, "trace.json")
        tracing.write(read(options.directory), file)
        print(file)
    return _with_one_line(program, description, work)


def replay(program, description, words):
    """handset/replay; returns its exit status."""
    def work(parser):
        parser.add_argument("source", metavar="DIR|LOG", type=path,
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
        work(Parser(program, description))
        return 0
    except (Failure, Unreadable) as failure:
        print(f"{program}: {one_line(str(failure))}", file=sys.stderr)
    except OSError as error:
        print(f"{program}: {one_line(str(error.filename))}: {error.strerror}", file=sys.stderr)
    return 2
