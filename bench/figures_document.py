# SPDX-License-Identifier: Apache-2.0
"""The tables of docs/figures.md that commands write: each a block of text below a mark with its name."""

import pathlib
import re

PROJECT = pathlib.Path(__file__).resolve().parent.parent
DOCUMENT = PROJECT / "docs" / "figures.md"


def with_table(document, name, table):
    """The document with `table` as the one of that name."""
    replaced, count = re.subn(rf"(?s)(<!-- written: {re.escape(name)} -->\n```text\n).*?```",
                              lambda match: f"{match[1]}{table}```", document)
    if count != 1:
        raise ValueError(f"{DOCUMENT}: no table '{name}'")
    return replaced


def write(name, table):
    DOCUMENT.write_text(with_table(DOCUMENT.read_text("utf-8"), name, table), "utf-8")
