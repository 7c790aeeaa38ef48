# SPDX-License-Identifier: Apache-2.0
"""A type as a chapter of a document: its comments, with what each tag says in a list."""

from __future__ import annotations

import re
from typing import Iterator

from . import constants, dump, syntax
from .library import Library

_TAGS = {"return": "Returns", "throws": "Throws"}


def chapter(document: syntax.Document, library: Library) -> str:
    """One type: heading, comment, then a table of its values or fields, or its methods."""
    declaration = document.declaration
    lines = [f"## {declaration.name}", "",
             f"{declaration.keyword.capitalize()} `{declaration.qualified_name}`.", "",
             *_comment(declaration.comment)]
    if isinstance(declaration, syntax.Enum):
        lines += _enumerators(declaration, library)
    elif isinstance(declaration, syntax.Interface):
        lines += _constants(declaration, library)
        for number, method in enumerate(declaration.methods, start=1):
            lines += _method(method, number if method.id is None else method.id + 1)
    else:
        lines += _fields(declaration, library)
        lines += _constants(declaration, library)
    return "\n".join(lines).rstrip("\n") + "\n"


def _enumerators(declaration: syntax.Enum, library: Library) -> Iterator[str]:
    values = constants.enumerator_values(declaration, library)
    yield from (f"Values are of type `{declaration.backing}`.", "")
    yield from _table("value", "name", [(str(values[each.name]), f"`{each.name}`", each.comment)
                                        for each in declaration.enumerators])


def _fields(declaration: syntax.Parcelable | syntax.Union, library: Library) -> Iterator[str]:
    rows = []
    for field in declaration.fields:
        default = "" if field.default is None else " = " + dump.value_text(
            field.type, constants.evaluate(field.default, field.type, declaration, library))
        rows.append((f"`{_type(field.type)}`", f"`{field.name}{default}`", field.comment))
    yield from _table("type", "field", rows)


def _constants(declaration: syntax.Declaration, library: Library) -> Iterator[str]:
    rows = []
    for each in declaration.constants:
        value = constants.evaluate(each.value, each.type, declaration, library)
        rows.append((dump.value_text(each.type, value), f"`{each.name}`", each.comment))
    if rows:
        yield from _table("value", "constant", rows)


def _method(method: syntax.Method, code: int) -> Iterator[str]:
    arguments = ", ".join(f"{each.direction} {_type(each.type)} {each.name}".lstrip()
                          for each in method.arguments)
    oneway = "oneway " if method.oneway else ""
    yield from (f"### {method.name}", "",
                f"`{oneway}{_type(method.return_type)} {method.name}({arguments})`, "
                f"transaction {code}", "")
    yield from _comment(method.comment)


def _type(of: syntax.TypeReference) -> str:
    """The type by its simple name, as a reader of one package knows it."""
    nullable = "@nullable " if of.nullable else ""
    return nullable + re.sub(r"\b(?:\w+\.)+(\w+)", r"\1", str(of))


def _table(first: str, second: str, rows: list[tuple[str, str, str]]) -> Iterator[str]:
    if not rows:
        return
    yield from (f"| {first} | {second} | |", "|---|---|---|")
    for one, other, comment in rows:
        yield f"| {one} | {other} | {' '.join(comment.split()).replace('|', chr(92) + '|')} |"
    yield ""


def _comment(comment: str) -> Iterator[str]:
    """The paragraphs as they stand, then the tags as a list."""
    text, tags = [], []
    for line in comment.split("\n"):
        tag = re.match(r"@(\w+)\s*(.*)", line)
        if tag:
            tags.append([tag.group(1), tag.group(2)])
        elif tags:
            tags[-1][1] += " " + line.strip()
        else:
            text.append(line)
    body = "\n".join(text).strip("\n")
    if body:
        yield from (body, "")
    for name, rest in tags:
        yield f"- {_tag(name, ' '.join(rest.split()))}"
    if tags:
        yield ""


def _tag(name: str, rest: str) -> str:
    if name == "param":
        parameter, _, what = rest.partition(" ")
        return f"`{parameter}`: {what}"
    return f"{_TAGS.get(name, name)}: {rest}" if rest else _TAGS.get(name, name)
