# SPDX-License-Identifier: Apache-2.0
"""Whether one version of an interface may follow another.

Either side of a call may be the older one, so what was said once stays: methods and fields are only
appended, enumerators, constants and types only added.
"""

from __future__ import annotations

from . import annotations, constants, syntax
from .dump import annotation_text, value_text
from .errors import CompileError, Location
from .library import Library

# Null or not null is for the two sides to agree on, and @Backing is compared as a type.
_FREE_ANNOTATIONS = annotations.OTHER_LANGUAGES | {"nullable", "Backing"}

Version = dict[str, syntax.Document]  # the types of a version by qualified name


def check(old: Version, old_library: Library, new: Version, new_library: Library) -> None:
    """Raises the first thing that `new` does not keep of `old`."""
    for name, document in sorted(old.items()):
        before = document.declaration
        if name not in new:
            raise CompileError(before.location, f"{name} is missing in the newer version")
        after = new[name].declaration
        if before.keyword != after.keyword:
            raise CompileError(after.location,
                               f"{name} was a {before.keyword} and is a {after.keyword} now")
        _Comparison(before, old_library, after, new_library).check()


class _Comparison:
    def __init__(self, old: syntax.Declaration, old_library: Library,
                 new: syntax.Declaration, new_library: Library):
        self._old, self._old_library = old, old_library
        self._new, self._new_library = new, new_library

    def check(self) -> None:
        self._same(self._new.location, "", "the annotations", _strict(self._old),
                   _strict(self._new))
        if isinstance(self._old, syntax.Enum):
            self._enumerators()
            return
        if isinstance(self._old, syntax.Interface):
            self._methods()
        else:
            self._fields()
        self._constants()

    def _same(self, location: Location, member: str, what: str, old: object, new: object) -> None:
        if old != new:
            name = f"{self._old.name}.{member}" if member else self._old.name
            raise CompileError(location, f"{what} of {name} changed: {old or 'none'} before, "
                                         f"{new or 'none'} now")

    def _counterpart(self, old_member, new_members):
        for each in new_members:
            if each.name == old_member.name:
                return each
        raise CompileError(self._new.location,
                           f"{self._old.name}.{old_member.name} of the older version is missing")

    def _methods(self) -> None:
        new_codes = _codes(self._new)
        for name, code in _codes(self._old).items():
            old = next(each for each in self._old.methods if each.name == name)
            new = self._counterpart(old, self._new.methods)
            self._same(new.location, name, "the number", str(code), str(new_codes[name]))
            self._same(new.location, name, "the annotations", _strict(old), _strict(new))
            self._same(new.location, name, "the signature", _signature(self._old, old),
                       _signature(self._new, new))

    def _fields(self) -> None:
        for index, old in enumerate(self._old.fields):
            new = self._counterpart(old, self._new.fields)
            self._same(new.location, old.name, "the position", str(index + 1),
                       str(next(position for position, each in enumerate(self._new.fields, 1)
                                if each is new)))
            self._same(new.location, old.name, "the type", _type(old.type), _type(new.type))
            self._same(new.location, old.name, "the annotations", _strict(old), _strict(new))
            if old.default is not None:
                self._same(new.location, old.name, "the default",
                           _value(old.type, old.default, self._old, self._old_library),
                           None if new.default is None else
                           _value(new.type, new.default, self._new, self._new_library))
        added = self._new.fields[len(self._old.fields):]
        if added and self._old.annotation("FixedSize"):
            raise CompileError(added[0].location, f"{self._old.name} is @FixedSize: it cannot get "
                                                  f"the field '{added[0].name}'")

    def _enumerators(self) -> None:
        self._same(self._new.location, "", "the backing type", self._old.backing,
                   self._new.backing)
        new_values = constants.enumerator_values(self._new, self._new_library)
        for old in self._old.enumerators:
            new = self._counterpart(old, self._new.enumerators)
            values = constants.enumerator_values(self._old, self._old_library)
            self._same(new.location, old.name, "the value", str(values[old.name]),
                       str(new_values[old.name]))

    def _constants(self) -> None:
        for old in self._old.constants:
            new = self._counterpart(old, self._new.constants)
            self._same(new.location, old.name, "the type", _type(old.type), _type(new.type))
            self._same(new.location, old.name, "the value",
                       _value(old.type, old.value, self._old, self._old_library),
                       _value(new.type, new.value, self._new, self._new_library))


def _codes(interface: syntax.Interface) -> dict[str, int]:
    return {each.name: index if each.id is None else each.id
            for index, each in enumerate(interface.methods)}


def _signature(interface: syntax.Interface, method: syntax.Method) -> str:
    """Everything of a method that both sides must agree on; argument names are not of it."""
    oneway = "oneway " if interface.oneway or method.oneway else ""
    arguments = ", ".join(f"{each.direction or 'in'} {_type(each.type)}"
                          for each in method.arguments)
    return f"{oneway}{_type(method.return_type)} ({arguments})"


def _type(of: syntax.TypeReference) -> str:
    return " ".join(filter(None, [_strict(of), str(of)]))


def _strict(annotated: syntax.Annotated) -> str:
    return " ".join(sorted(annotation_text(each) for each in annotated.annotations
                           if each.name not in _FREE_ANNOTATIONS))


def _value(of: syntax.TypeReference, expression: syntax.Expression, scope: syntax.Declaration,
           library: Library) -> str:
    return value_text(of, constants.evaluate(expression, of, scope, library))
