# SPDX-License-Identifier: Apache-2.0
"""The tree a source file is turned into. Plain data; `library` fills in the resolved parts."""

from __future__ import annotations

from dataclasses import dataclass, field
from typing import Iterator, Optional, Union as AnyOf

from .errors import Location

# Every type name the language itself knows, with its C++ spelling as a value.
SCALARS = {
    "boolean": "bool",
    "byte": "int8_t",
    "char": "char16_t",
    "int": "int32_t",
    "long": "int64_t",
    "float": "float",
    "double": "double",
}
BUILT_IN_TYPES = {*SCALARS, "void", "String", "IBinder", "ParcelFileDescriptor", "List"}
UNSUPPORTED_TYPES = {"Map", "CharSequence", "FileDescriptor", "ParcelableHolder"}


# --- expressions ---------------------------------------------------------------------------------


@dataclass(frozen=True)
class Literal:
    kind: str  # "integer", "float", "string", "character" or "boolean"
    text: str  # as in the source
    location: Location


@dataclass(frozen=True)
class Reference:
    name: str  # "NAME" or "Type.NAME", the type possibly qualified
    location: Location


@dataclass(frozen=True)
class Unary:
    operator: str
    operand: "Expression"
    location: Location


@dataclass(frozen=True)
class Binary:
    operator: str
    left: "Expression"
    right: "Expression"
    location: Location


@dataclass(frozen=True)
class ArrayLiteral:
    elements: tuple["Expression", ...]
    location: Location


Expression = AnyOf[Literal, Reference, Unary, Binary, ArrayLiteral]


# --- declarations --------------------------------------------------------------------------------


@dataclass(frozen=True)
class Annotation:
    name: str
    parameters: dict[str, Expression]
    location: Location


@dataclass
class Annotated:
    annotations: list[Annotation]

    def annotation(self, name: str) -> Optional[Annotation]:
        return next((each for each in self.annotations if each.name == name), None)


@dataclass
class TypeReference(Annotated):
    """A type where it is used. `name` is the fully qualified one once it has been resolved."""

    name: str
    arguments: list["TypeReference"]
    dimensions: int  # 0, or the number of [] marks
    fixed_size: bool  # one of the marks holds a size
    location: Location
    declaration: Optional["Declaration"] = None  # None for built-in types

    @property
    def nullable(self) -> bool:
        return self.annotation("nullable") is not None

    @property
    def is_sequence(self) -> bool:
        """An array or a list: a std::vector in C++."""
        return self.dimensions > 0 or self.name == "List"

    @property
    def element(self) -> "TypeReference":
        """The element type of a sequence; it carries the sequence's own @nullable."""
        if self.name == "List":
            return self.arguments[0]
        return TypeReference(self.annotations, self.name, [], 0, False, self.location,
                             self.declaration)

    def __str__(self) -> str:
        arguments = f"<{', '.join(map(str, self.arguments))}>" if self.arguments else ""
        return self.name + arguments + "[]" * self.dimensions


@dataclass
class Argument:
    direction: str  # "", "in", "out" or "inout", as written
    type: TypeReference
    name: str
    location: Location

    @property
    def is_in(self) -> bool:
        return self.direction in ("", "in", "inout")

    @property
    def is_out(self) -> bool:
        return self.direction in ("out", "inout")


@dataclass
class Method(Annotated):
    oneway: bool
    return_type: TypeReference
    name: str
    arguments: list[Argument]
    id: Optional[int]  # the number after "=", if any
    comment: str
    location: Location


@dataclass
class Constant(Annotated):
    type: TypeReference
    name: str
    value: Expression
    comment: str
    location: Location


@dataclass
class Field(Annotated):
    type: TypeReference
    name: str
    default: Optional[Expression]
    comment: str
    location: Location


@dataclass
class Enumerator:
    name: str
    value: Optional[Expression]
    comment: str
    location: Location


@dataclass
class Declaration(Annotated):
    """What the four kinds of type have in common."""

    name: str
    comment: str
    location: Location
    package: str = field(default="", init=False)

    @property
    def qualified_name(self) -> str:
        return f"{self.package}.{self.name}"

    @property
    def is_vintf_stable(self) -> bool:
        return self.annotation("VintfStability") is not None


@dataclass
class Interface(Declaration):
    oneway: bool
    methods: list[Method]
    constants: list[Constant]
    keyword = "interface"


@dataclass
class Parcelable(Declaration):
    fields: list[Field]
    constants: list[Constant]
    keyword = "parcelable"


@dataclass
class Union(Declaration):
    fields: list[Field]
    constants: list[Constant]
    keyword = "union"


@dataclass
class Enum(Declaration):
    enumerators: list[Enumerator]
    keyword = "enum"
    backing: str = field(default="byte", init=False)  # set by `library` from @Backing


@dataclass(frozen=True)
class Import:
    name: str
    location: Location


@dataclass
class Document:
    """One source file: a package, its imports and exactly one type."""

    path: str
    package: str
    imports: list[Import]
    declaration: Declaration
    licence: list[str]  # the comments before "package" that speak of licence or copyright


def type_references(declaration: Declaration) -> Iterator[TypeReference]:
    """Every type a declaration names, list elements included."""
    direct: list[TypeReference] = []
    if isinstance(declaration, Interface):
        for method in declaration.methods:
            direct.append(method.return_type)
            direct.extend(argument.type for argument in method.arguments)
    if isinstance(declaration, (Parcelable, Union)):
        direct.extend(each.type for each in declaration.fields)
    if not isinstance(declaration, Enum):
        direct.extend(each.type for each in declaration.constants)
    while direct:
        reference = direct.pop(0)
        yield reference
        direct.extend(reference.arguments)
