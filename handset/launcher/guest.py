# SPDX-License-Identifier: Apache-2.0
"""A guest from its boot to its end: running commands in it and moving their bytes."""

import collections
import errno
import os
import selectors
import struct
import time

from agent_channel import INPUT_WINDOW, Channel
from failure import Failure

BOOT_SECONDS = 60  # after which a guest without a word from its agent has failed
_JOIN_SECONDS = 10
_TAIL_LINES = 12   # console lines shown for a guest that has failed


class NotStarted(Exception):
    """The guest could not start the command: `error` is an errno value."""

    def __init__(self, error, what):
        super().__init__(f"{what}: {os.strerror(error)}")
        self.error = error


class Guest:
    """Talks to the agent of one machine and keeps an eye on the machine's console meanwhile."""

    def __init__(self, machine):
        self._machine = machine
        self._channel = Channel(machine.agent)
        self._frames = collections.deque()
        self._alive = True
        self._input = None      # descriptor whose bytes go to the running command
        self._input_room = 0    # how many more of them the agent takes now
        self._selector = selectors.PollSelector()  # takes plain files too, for standard input
        self._watch(self._channel, self._read_agent)
        self._watch(machine.console, self._read_console)

    def wait_for_agent(self):
        """Returns when the agent of a guest that is up has taken notice."""
        deadline = time.monotonic() + _JOIN_SECONDS
        while self._alive and not self._frames and time.monotonic() < deadline:
            self._wait(deadline - time.monotonic())
        if not self._frames:
            raise Failure("the guest does not answer; another terminal may have joined it already")
        self._frames.popleft()

    def wait_for_boot(self):
        """Returns when the agent is there."""
        deadline = time.monotonic() + BOOT_SECONDS
        while not self._frames:
            self._wait(deadline - time.monotonic())
            if not self._alive:
                raise self._ended("the guest ended while it booted")
            if time.monotonic() >= deadline:
                raise self._ended(f"the guest did not boot within {BOOT_SECONDS} s")
        self._frames.popleft()

    def run(self, arguments, directory, environment, streams, terminal=None):
        """Runs a command to its end and returns its status as waitpid gives it.

        `streams` has write_output(bytes), write_errors(bytes) and `input`, a descriptor or None.
        `terminal` is None or has size(), (rows, columns), and `changes`, a descriptor that becomes
        readable when the size has changed. Raises NotStarted."""
        for word in arguments:
            self._send(b"A", os.fsencode(word))
        for name, value in environment.items():
            self._send(b"E", os.fsencode(f"{name}={value}"))
        self._send(b"D", os.fsencode(directory))
        if terminal is not None:
            self._send_size(terminal)
            self._watch(terminal.changes, lambda: self._resize(terminal))
        self._send(b"S")
        self._input, self._input_room = streams.input, INPUT_WINDOW
        if self._input is None:
            self._send(b"I")
        try:
            return self._follow(streams)
        finally:
            self._unwatch(streams.input)
            if terminal is not None:
                self._unwatch(terminal.changes)

    def kernel_log(self, seconds):
        """The kernel's log as dmesg shows it, or None when the guest does not answer in time."""
        deadline = time.monotonic() + seconds
        log = bytearray()
        self._send(b"K")
        while self._alive and time.monotonic() < deadline:
            self._wait(deadline - time.monotonic())
            while self._frames:
                kind, payload = self._frames.popleft()
                if kind == b"K" and not payload:
                    return b"".join(_without_priority(line) for line in log.splitlines(True))
                if kind == b"K":
                    log += payload
        return None

    def power_off(self, seconds):
        """Ends the guest in an orderly way, or, when that takes longer, at once."""
        self._send(b"P")
        self._machine.wait(seconds)

    def _follow(self, streams):
        """Passes the command's bytes on until its status comes."""
        while True:
            while self._frames:
                kind, payload = self._frames.popleft()
                if kind == b"O":
                    streams.write_output(payload)
                elif kind == b"E":
                    streams.write_errors(payload)
                elif kind == b"C":
                    self._input_room += struct.unpack("<I", payload)[0]
                elif kind == b"X":
                    return struct.unpack("<i", payload)[0]
                elif kind == b"F":
                    raise NotStarted(struct.unpack_from("<I", payload)[0],
                                     payload[4:].decode(errors="replace"))
            if not self._alive:
                raise self._ended("the guest ended before the command did")
            if self._input is not None and self._input_room > 0:
                self._watch(self._input, self._pass_input)
            self._wait(None)

    def _pass_input(self):
        try:
            chunk = os.read(self._input, self._input_room)
        except OSError:  # a terminal that has hung up, a descriptor that was never open
            chunk = b""
        self._send(b"I", chunk)
        self._input_room -= len(chunk)
        if not chunk or self._input_room == 0:
            self._unwatch(self._input)
        if not chunk:
            self._input = None

    def _resize(self, terminal):
        os.read(terminal.changes, 4096)
        self._send_size(terminal)

    def _send_size(self, terminal):
        self._send(b"T", struct.pack("<HH", *terminal.size()))

    def _watch(self, source, handler):
        """Calls `handler` when `source` is readable; once is enough, more does no harm."""
        if source not in self._selector.get_map():
            self._selector.register(source, selectors.EVENT_READ, handler)

    def _unwatch(self, source):
        if source is not None and source in self._selector.get_map():
            self._selector.unregister(source)

    def _wait(self, seconds):
        for key, _ in self._selector.select(seconds):
            key.data()

    def _send(self, kind, payload=b""):
        try:
            self._channel.send(kind, payload)
        except OSError as error:
            # The guest has gone; what it had said until then is still to be read.
            if error.errno not in (errno.EPIPE, errno.ECONNRESET):
                raise

    def _read_agent(self):
        frames = self._channel.receive()
        if frames is None:
            self._alive = False
            self._unwatch(self._channel)
        else:
            self._frames += frames

    def _read_console(self):
        if not self._machine.read_console():
            self._unwatch(self._machine.console)

    def _ended(self, what):
        """A failure that shows the console's last lines."""
        self._machine.kill()
        self._machine.drain_console()
        tail = self._machine.last_words(_TAIL_LINES)
        said = "".join(f"\n  console: {line}" for line in tail) or " (its console is empty)"
        return Failure(what, said)


def _without_priority(line):
    """A record as dmesg shows it: without its leading "<6>"."""
    return line[line.index(b">") + 1:] if line.startswith(b"<") and b">" in line else line
