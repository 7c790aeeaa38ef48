# SPDX-License-Identifier: Apache-2.0
"""The tables of docs/figures.md that commands write: each a block of text below a mark with its name."""

import pathlib
import re

PROJECT = pathlib.Path(__file__).resolve().parent.parent
DOCUMENT = PROJECT / "docs" / "figures.md"


def table(name):
    """The table of that name as it stands in the document."""
    return re.search(rf"(?s)<!-- written: {re.escape(name)} -->\n```text\n(.*?)```",
                     DOCUMENT.read_text("utf-8"))[1]


def with_table(document, name, text):
    """The document with `text` as the table of that name."""
    replaced, count = re.subn(rf"(?s)(<!-- written: {re.escape(name)} -->\n```text\n).*?```",
                              lambda match: f"{match[1]}{text}```", document)
    if count != 1:
        raise ValueError(f"{DOCUMENT}: no table '{name}'")
    return replaced


def write(name, text):
    DOCUMENT.write_text(with_table(DOCUMENT.read_text("utf-8"), name, text), "utf-8")
