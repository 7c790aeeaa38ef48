# SPDX-License-Identifier: Apache-2.0
"""The files of one run: finds imports and gives every type name its declaration."""

from __future__ import annotations

import pathlib

from . import syntax
from .errors import CompileError, Location, UsageError
from .parser import parse_file


class Library:
    """Every type the run knows, by qualified name; imports are read when first asked for."""

    def __init__(self, include_directories: list[str]):
        for directory in include_directories:
            if not pathlib.Path(directory).is_dir():
                raise UsageError(f"--include {directory}: no such directory")
        self._directories = [pathlib.Path(directory) for directory in include_directories]
        self._documents: dict[str, syntax.Document] = {}
        self._imports: dict[str, dict[str, syntax.Document]] = {}  # by the importing type

    def load(self, paths: list[str]) -> list[syntax.Document]:
        """Parses and resolves the given files; the result is in their order."""
        documents = [parse_file(path) for path in paths]
        for document in documents:
            self._add(document)
        for document in documents:
            self._resolve(document)
        return documents

    def find(self, qualified_name: str) -> syntax.Document | None:
        """The document that declares this type, read from the include directories if need be."""
        if qualified_name not in self._documents:
            relative = pathlib.Path(*qualified_name.split(".")).with_suffix(".aidl")
            for directory in self._directories:
                if (directory / relative).is_file():
                    document = parse_file(str(directory / relative))
                    self._add(document)
                    self._resolve(document)
                    break
        return self._documents.get(qualified_name)

    def _add(self, document: syntax.Document) -> None:
        declaration = document.declaration
        _check_path(document)
        earlier = self._documents.get(declaration.qualified_name)
        if earlier is not None:
            raise CompileError(
                declaration.location,
                f"'{declaration.qualified_name}' is already defined in {earlier.path}")
        self._documents[declaration.qualified_name] = document
        if isinstance(declaration, syntax.Enum):
            declaration.backing = _backing(declaration)

    def _resolve(self, document: syntax.Document) -> None:
        imported = {}
        for each in document.imports:
            found = self.find(each.name)
            if found is None:
                raise CompileError(each.location, self._not_found(each.name))
            simple_name = each.name.rsplit(".", 1)[-1]
            if imported.setdefault(simple_name, found) is not found:
                raise CompileError(each.location, f"a second import of the name '{simple_name}'")
        self._imports[document.declaration.qualified_name] = imported
        for reference in syntax.type_references(document.declaration):
            self._resolve_type(reference, document.declaration)

    def find_from(self, name: str, user: syntax.Declaration) -> syntax.Document | None:
        """What `name` means inside `user`: an import, a type of its package, a qualified name."""
        imported = self._imports.get(user.qualified_name, {})
        return (imported.get(name) or self.find(f"{user.package}.{name}")
                or (self.find(name) if "." in name else None))

    def _resolve_type(self, reference: syntax.TypeReference, user: syntax.Declaration) -> None:
        name = reference.name
        if name in syntax.BUILT_IN_TYPES:
            return
        if name in syntax.UNSUPPORTED_TYPES:
            raise CompileError(reference.location, f"the type '{name}' is not supported")
        found = self.find_from(name, user)
        if found is None:
            raise CompileError(reference.location, f"unknown type '{name}'")
        reference.declaration = found.declaration
        reference.name = found.declaration.qualified_name

    def _not_found(self, name: str) -> str:
        directories = ", ".join(map(str, self._directories)) or "none given"
        return f"cannot find the imported type '{name}' (include directories: {directories})"


def _check_path(document: syntax.Document) -> None:
    declaration = document.declaration
    wanted = declaration.qualified_name.replace(".", "/") + ".aidl"
    actual = pathlib.PurePath(document.path)
    if actual.stem != declaration.name:
        raise CompileError(declaration.location,
                           f"'{declaration.name}' must stand in a file named "
                           f"{declaration.name}.aidl, not {actual.name}")
    # A relative path may leave out the directories above the current one.
    resolved = pathlib.Path(document.path).absolute().as_posix()
    if not resolved.endswith("/" + wanted):
        raise CompileError(Location(document.path, 1, 1),
                           f"the path of a type in package {document.package} must end in "
                           f"{wanted}")


def _backing(declaration: syntax.Enum) -> str:
    annotation = declaration.annotation("Backing")
    if annotation is None:
        return "byte"
    value = annotation.parameters.get("type")
    if (set(annotation.parameters) != {"type"} or not isinstance(value, syntax.Literal)
            or value.text not in ('"byte"', '"int"', '"long"')):
        raise CompileError(annotation.location,
                           '@Backing takes type="byte", type="int" or type="long"')
    return value.text.strip('"')
