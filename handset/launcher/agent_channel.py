# SPDX-License-Identifier: Apache-2.0
"""The launcher's end of the conversation with handset-agent.

handset/guest/frames.h describes it: one byte for the kind, four for the payload's length,
little-endian, then the payload.
"""

import struct

INPUT_WINDOW = 64 * 1024  # standard input sent ahead of what the command has taken, in bytes

_HEADER = struct.Struct("<cI")


class Channel:
    """Frames over a connected socket."""

    def __init__(self, socket):
        self._socket = socket
        self._received = bytearray()

    def fileno(self):
        """The socket's descriptor, for a selector."""
        return self._socket.fileno()

    def send(self, kind, payload=b""):
        """Sends one frame; `kind` is one byte. Raises OSError when the guest has gone."""
        self._socket.sendall(_HEADER.pack(kind, len(payload)) + payload)

    def receive(self):
        """What has arrived, as a list of (kind, payload); None when the guest has gone."""
        try:
            chunk = self._socket.recv(256 * 1024)
        except ConnectionError:
            return None
        if not chunk:
            return None
        self._received += chunk
        return list(self._frames())

    def close(self):
        """Hangs up, which makes a live agent power its guest off."""
        self._socket.close()

    def _frames(self):
        while len(self._received) >= _HEADER.size:
            kind, length = _HEADER.unpack_from(self._received)
            end = _HEADER.size + length
            if len(self._received) < end:
                return
            payload = bytes(self._received[_HEADER.size:end])
            del self._received[:end]
            yield kind, payload
