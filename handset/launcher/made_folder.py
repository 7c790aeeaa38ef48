# SPDX-License-Identifier: Apache-2.0
"""Folders below build/ that a command makes from something and keeps.

A folder is put in place whole or not at all, holds a stamp that says what it was made from, and is
made by one process at a time.
"""

import contextlib
import fcntl
import os
import shutil


def read_stamp(folder):
    """What the folder was made from; None when it has not been made."""
    try:
        with open(os.path.join(folder, "stamp"), encoding="ascii") as stamp:
            return stamp.read()
    except FileNotFoundError:
        return None


def write_stamp(folder, text):
    """To be written last, so that a folder without it is never used."""
    with open(os.path.join(folder, "stamp"), "w", encoding="ascii") as file:
        file.write(text)


@contextlib.contextmanager
def lock(path, what, say):
    """Holds a lock, whose file is `path`, on making `what`; the kernel drops it when the holder
    dies. `say` is called with a line when somebody else holds it."""
    os.makedirs(os.path.dirname(path), exist_ok=True)
    with open(path, "w", encoding="ascii") as file:
        try:
            fcntl.flock(file, fcntl.LOCK_EX | fcntl.LOCK_NB)
        except BlockingIOError:
            say(f"another run is preparing {what}, waiting for it")
            fcntl.flock(file, fcntl.LOCK_EX)
        yield


@contextlib.contextmanager
def replacing(folder):
    """A scratch folder that takes the place of `folder` when all went well, else disappears."""
    for stale in (folder + ".new", folder + ".old"):
        shutil.rmtree(stale, ignore_errors=True)
    scratch = folder + ".new"
    os.mkdir(scratch)
    try:
        yield scratch
    except BaseException:
        shutil.rmtree(scratch, ignore_errors=True)
        raise
    with contextlib.suppress(FileNotFoundError):
        os.rename(folder, folder + ".old")
    os.rename(scratch, folder)
    shutil.rmtree(folder + ".old", ignore_errors=True)
