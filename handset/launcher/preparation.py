# SPDX-License-Identifier: Apache-2.0
"""The commands that fetch or make something ahead of its first use."""

import os
import signal
import sys

from failure import Failure, Parser
from guest_image import ARCHITECTURES, say_on_stderr


def main(program, description, prepare):
    """Calls prepare(arch, say) for each architecture asked for; returns the exit status."""
    parser = Parser(program, description)
    parser.add_argument("--arch", action="append", metavar="ARCH",
                        help="amd64 (default) or arm64; may be given twice")
    # Leaving through an exception removes what is half made.
    signal.signal(signal.SIGTERM, lambda number, _: sys.exit(128 + number))
    try:
        wanted = parser.parse_args().arch or ["amd64"]
        for arch in wanted:
            if arch not in ARCHITECTURES:
                raise Failure(f"unknown architecture '{arch}': use {' or '.join(ARCHITECTURES)}")
        for arch in wanted:
            prepare(arch, say_on_stderr)
    except Failure as failure:
        print(f"{program}: {failure}", file=sys.stderr)
        return 2
    except KeyboardInterrupt:
        signal.signal(signal.SIGINT, signal.SIG_DFL)
        os.kill(os.getpid(), signal.SIGINT)
    return 0
