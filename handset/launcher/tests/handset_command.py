# SPDX-License-Identifier: Apache-2.0
"""Starting handset/run for a test, with the build that CTest names, and looking after its QEMU."""

import contextlib
import os
import subprocess
import time

from launcher_path import PREPARE_GUEST, PROJECT, RUN

ARCH = os.environ.get("HANDSET_ARCH", "amd64")
BUILD = os.environ.get("HANDSET_BUILD", os.path.join(PROJECT, "build", "release"))
OPTIONS = ["--arch", ARCH, "--build", BUILD]

# A download would take minutes and speak of itself on standard error, so it comes first.
subprocess.run([PREPARE_GUEST, "--arch", ARCH], check=True)


def handset(*words, **more):
    """Runs handset/run to its end; `more` goes to subprocess.run."""
    more = {"stdin": subprocess.DEVNULL, "capture_output": True, "timeout": 300, **more}
    return subprocess.run([RUN, *OPTIONS, *words], check=False, **more)


@contextlib.contextmanager
def started(*words, **more):
    """A running handset/run; killed when the test is over, should it still run."""
    more = {"stdin": subprocess.DEVNULL, "stdout": subprocess.PIPE, "stderr": subprocess.PIPE,
            **more}
    with subprocess.Popen([RUN, *OPTIONS, *words], **more) as process:
        try:
            yield process
        finally:
            process.kill()


def emulator_of(process):
    """The process id of the QEMU that a running handset/run has started."""
    deadline = time.monotonic() + 60
    while time.monotonic() < deadline:
        with open(f"/proc/{process.pid}/task/{process.pid}/children", encoding="ascii") as children:
            for pid in children.read().split():
                if name_of(pid).startswith("qemu-system"):
                    return int(pid)
        time.sleep(0.02)
    raise AssertionError("handset/run started no QEMU")


def name_of(pid):
    try:
        with open(f"/proc/{pid}/comm", encoding="ascii") as name:
            return name.read().strip()
    except FileNotFoundError:
        return ""


def ends(pid, seconds=10):
    """Whether the process goes away, or is at least dead, within `seconds`."""
    deadline = time.monotonic() + seconds
    while time.monotonic() < deadline:
        try:
            with open(f"/proc/{pid}/stat", encoding="ascii") as stat:
                if stat.read().rpartition(")")[2].split()[0] == "Z":
                    return True
        except FileNotFoundError:
            return True
        time.sleep(0.02)
    return False
