# SPDX-License-Identifier: Apache-2.0
"""Another terminal in a guest that handset/shell has booted.

QEMU listens on a socket, which is named by the process id of the guest's launcher and lies in a
directory that only its user enters; behind it is a port of the guest with an agent of its own. Beside
it stands, as JSON, what the shell in that guest is started with.
"""

import contextlib
import json
import os
import socket

from failure import Failure
from guest import Guest


def _directory():
    return f"/tmp/handset-{os.geteuid()}"


@contextlib.contextmanager
def offered(description):
    """The path of a socket for QEMU to listen on; `description` is what a shell is started with.
    Both are gone at the end."""
    directory = _directory()
    with contextlib.suppress(FileExistsError):
        os.mkdir(directory, 0o700)
    status = os.lstat(directory)
    if status.st_uid != os.geteuid() or status.st_mode & 0o077:
        raise Failure(f"{directory} is not this user's alone; remove it")
    path = os.path.join(directory, str(os.getpid()))
    try:
        with open(path + ".json", "w", encoding="utf-8") as file:
            json.dump(description, file)
        yield path
    finally:
        for name in (path + ".json", path):
            with contextlib.suppress(FileNotFoundError):
                os.unlink(name)
        with contextlib.suppress(OSError):  # another guest has its socket there
            os.rmdir(directory)


class _Joined:
    """As much of a Machine as Guest wants, for a guest that is somebody else's."""

    def __init__(self, agent):
        self.agent = agent
        self.console, self._silent = socket.socketpair()

    def read_console(self):
        return False

    def drain_console(self):
        pass

    def last_words(self, _count):
        return []

    def kill(self):
        pass


def guest(which):
    """A guest that is up, `which` being its launcher's process id or 0 for the only one, and what a
    shell in it is started with."""
    found = {}
    directory = _directory()
    with contextlib.suppress(FileNotFoundError):
        for name in os.listdir(directory):
            if name.isdigit() and which in (0, int(name)):
                connection = socket.socket(socket.AF_UNIX)
                try:
                    connection.connect(os.path.join(directory, name))
                    found[name] = connection
                except OSError:  # its launcher was killed
                    connection.close()
    if not found:
        raise Failure(f"no guest {which} to join" if which else
                      "no guest to join: start handset/shell in another terminal first")
    if len(found) > 1:
        raise Failure(f"several guests are up: give --join one of {', '.join(sorted(found))}")
    (name, connection), = found.items()
    with open(os.path.join(directory, name + ".json"), encoding="utf-8") as file:
        description = json.load(file)
    joined = Guest(_Joined(connection))
    joined.wait_for_agent()
    return joined, description
