# SPDX-License-Identifier: Apache-2.0
"""The user's terminal while a shell in the guest has it."""

import fcntl
import os
import signal
import struct
import termios
import tty


class Terminal:
    """Raw from entry to exit, restored whatever happens in between.

    `changes` is a descriptor that becomes readable when the window's size has changed."""

    def __enter__(self):
        self._saved = termios.tcgetattr(0)
        self.changes, self._changed = os.pipe2(os.O_NONBLOCK | os.O_CLOEXEC)
        self._old_handler = signal.signal(signal.SIGWINCH, self._note_change)
        tty.setraw(0)
        return self

    def __exit__(self, *_):
        termios.tcsetattr(0, termios.TCSADRAIN, self._saved)
        signal.signal(signal.SIGWINCH, self._old_handler)
        os.close(self.changes)
        os.close(self._changed)

    def size(self):
        """Rows and columns."""
        return struct.unpack("<HHHH", fcntl.ioctl(0, termios.TIOCGWINSZ, bytes(8)))[:2]

    def _note_change(self, *_):
        try:
            os.write(self._changed, b"x")
        except BlockingIOError:  # enough notes are waiting
            pass
