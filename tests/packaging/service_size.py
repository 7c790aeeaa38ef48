# SPDX-License-Identifier: Apache-2.0
"""Prints how large the service is without its symbols, and fails when that is above the limit:

    service_size.py STRIP PROGRAM LIMIT      STRIP as of the program's toolchain, LIMIT in KiB
"""

import pathlib
import subprocess
import sys
import tempfile


def main(arguments):
    if len(arguments) != 3 or not arguments[2].isdigit():
        print("usage: service_size.py STRIP PROGRAM LIMIT", file=sys.stderr)
        return 2
    strip, program, limit = arguments[0], pathlib.Path(arguments[1]), int(arguments[2])
    with tempfile.TemporaryDirectory() as directory:
        stripped = pathlib.Path(directory) / program.name
        subprocess.run([strip, "-o", str(stripped), str(program)], check=True)
        size = stripped.stat().st_size
    kib = size / 1024
    relation = "below" if kib <= limit else "ABOVE"
    print(f"{program.name}: {size} bytes stripped = {kib:.1f} KiB, "
          f"{abs(limit - kib):.1f} KiB {relation} the limit of {limit} KiB")
    return 0 if kib <= limit else 1


if __name__ == "__main__":
    sys.exit(main(sys.argv[1:]))
