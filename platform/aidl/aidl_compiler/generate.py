# SPDX-License-Identifier: Apache-2.0
"""Trees to C++ files: picks a type's templates and gives them what they need."""

from __future__ import annotations

import pathlib
import re
from dataclasses import dataclass

import jinja2

from . import constants, ndk, syntax
from .library import Library

# Codes of the two methods that every versioned interface has, counted as user methods are.
VERSION_METHOD_ID = 16777214
HASH_METHOD_ID = 16777213


_BLANK_LINES = re.compile(r"\n{3,}")  # what a part without contents leaves behind


@dataclass(frozen=True)
class Options:
    """What the command line says about all files of a run."""

    version: int | None = None  # None: the interfaces are not versioned
    hash: str | None = None


@dataclass(frozen=True)
class Output:
    """A file to be written below the directory for headers or the one for sources."""

    is_header: bool
    path: str
    text: str


class Generator:
    def __init__(self, library: Library, options: Options):
        self._library = library
        self._options = options
        self._environment = jinja2.Environment(
            loader=jinja2.FileSystemLoader(pathlib.Path(__file__).with_name("templates")),
            undefined=jinja2.StrictUndefined, trim_blocks=True, lstrip_blocks=True,
            keep_trailing_newline=True, autoescape=False)
        self._environment.filters["stack_type"] = ndk.stack_type
        self._environment.globals.update(
            ndk=ndk, options=options, version_id=VERSION_METHOD_ID, hash_id=HASH_METHOD_ID)

    def outputs(self, document: syntax.Document) -> list[Output]:
        """The files of one type: three headers and a source, whatever the type is."""
        declaration = document.declaration
        kind = declaration.keyword
        is_interface = isinstance(declaration, syntax.Interface)
        values = self._values(declaration)

        def output(template: str, path: str, stub: str = "") -> Output:
            text = self._environment.get_template(template).render(
                type=declaration, name=declaration.name, stub=stub, **values)
            return Output(path.endswith(".h"), path, _BLANK_LINES.sub("\n\n", text))

        return [
            output(f"{kind}.h.j2", ndk.header(declaration)),
            *(output(f"{stub.lower()}.h.j2" if is_interface else "no_interface.h.j2",
                     ndk.header(declaration, stub), stub) for stub in ("Bn", "Bp")),
            output(f"{kind}.cpp.j2", ndk.source(declaration)),
        ]

    def _values(self, declaration: syntax.Declaration) -> dict[str, object]:
        values: dict[str, object] = {
            "includes": sorted(map(ndk.header, self._used(declaration).values())),
            "classes": self._forward_declarations(declaration),
        }
        if isinstance(declaration, syntax.Enum):
            values["enumerators"] = constants.enumerator_values(declaration, self._library)
            return values
        values["constants"] = [
            (each, constants.evaluate(each.value, each.type, declaration, self._library))
            for each in declaration.constants]
        if isinstance(declaration, syntax.Interface):
            values["descriptor"] = self._descriptor(declaration)
            values["method_ids"] = [index if each.id is None else each.id
                                    for index, each in enumerate(declaration.methods)]
        else:
            values["defaults"] = {
                each.name: None if each.default is None else constants.evaluate(
                    each.default, each.type, declaration, self._library)
                for each in declaration.fields}
        return values

    def _descriptor(self, declaration: syntax.Interface) -> str:
        annotation = declaration.annotation("Descriptor")
        if annotation is None:
            return declaration.qualified_name
        text = syntax.TypeReference([], "String", [], 0, False, annotation.location)
        value = constants.evaluate(annotation.parameters["value"], text, declaration, self._library)
        assert isinstance(value, str)
        return value

    @staticmethod
    def _used(declaration: syntax.Declaration) -> dict[str, syntax.Declaration]:
        found = {each.declaration.qualified_name: each.declaration
                 for each in syntax.type_references(declaration) if each.declaration is not None}
        found.pop(declaration.qualified_name, None)
        return dict(sorted(found.items()))

    def _forward_declarations(self, declaration: syntax.Declaration) -> list[syntax.Declaration]:
        """The classes this type uses: they may use it in turn, so each header must do without the
        others' contents wherever the language allows."""
        return [each for each in self._used(declaration).values()
                if not isinstance(each, syntax.Enum)]
