# SPDX-License-Identifier: Apache-2.0
"""The hash of a frozen version."""

from __future__ import annotations

import hashlib
import os
import pathlib
import re

from .errors import UsageError


def version_hash(directory: str, previous: str) -> str:
    """SHA-1 of what `sha1sum` prints for every .aidl file below `directory`, in the byte order of
    their paths, and of a last line with the number of the version before ("latest-version" for the
    first one)."""
    if previous != "latest-version" and not re.fullmatch("[1-9][0-9]*", previous):
        raise UsageError(f"--hash: the previous version is a number from 1 or latest-version, "
                         f"not {previous}")
    root = pathlib.Path(directory)
    if not root.is_dir():
        raise UsageError(f"--hash {directory}: no such directory")
    files = {os.fsencode(f"./{each.relative_to(root).as_posix()}"): each
             for each in root.rglob("*.aidl") if each.is_file()}
    if not files:
        raise UsageError(f"--hash {directory}: there is no .aidl file in it")
    whole = hashlib.sha1(usedforsecurity=False)
    for name, file in sorted(files.items()):
        content = hashlib.sha1(file.read_bytes(), usedforsecurity=False)
        whole.update(content.hexdigest().encode() + b"  " + name + b"\n")
    whole.update(previous.encode() + b"\n")
    return whole.hexdigest()
