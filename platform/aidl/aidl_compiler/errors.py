# SPDX-License-Identifier: Apache-2.0
"""How a complaint about an input file travels: one exception, one line."""

from __future__ import annotations

from dataclasses import dataclass


@dataclass(frozen=True)
class Location:
    """A place in a file; line and column count from 1."""

    file: str
    line: int
    column: int

    def __str__(self) -> str:
        return f"{self.file}:{self.line}:{self.column}"


class CompileError(Exception):
    """What is wrong with an input file, and where."""

    def __init__(self, location: Location, message: str):
        super().__init__(f"{location}: {message}")
        self.location = location
        self.message = message


class UsageError(Exception):
    """A command line that asks for something the compiler cannot do."""
