# SPDX-License-Identifier: Apache-2.0
"""Directorys below build/ that a command makes from something and keeps.

A directory is put in place whole or not at all, holds a stamp that says what it was made from, and
is made by one process at a time.
"""

import contextlib
import fcntl
import os
import shutil


def read_stamp(directory):
    """What the directory was made from; None when it has not been made."""
    try:
        with open(os.path.join(directory, "stamp"), encoding="ascii") as stamp:
            return stamp.read()
    except FileNotFoundError:
        return None


def write_stamp(directory, text):
    """To be written last, so that a directory without it is never used."""
    with open(os.path.join(directory, "stamp"), "w", encoding="ascii") as file:
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
def replacing(directory):
    """A scratch directory that takes the place of `directory` when all went well, and else
    disappears."""
    for stale in (directory + ".new", directory + ".old"):
        shutil.rmtree(stale, ignore_errors=True)
    scratch = directory + ".new"
    os.mkdir(scratch)
    try:
        yield scratch
    except BaseException:
        shutil.rmtree(scratch, ignore_errors=True)
        raise
    with contextlib.suppress(FileNotFoundError):
        os.rename(directory, directory + ".old")
    os.rename(scratch, directory)
    shutil.rmtree(directory + ".old", ignore_errors=True)
