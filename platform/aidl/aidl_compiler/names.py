# SPDX-License-Identifier: Apache-2.0
"""Names that a file may not give: those C++ or the generated classes need themselves."""

from __future__ import annotations

from . import syntax
from .errors import CompileError, Location

_CPP_KEYWORDS = frozenset("""
    alignas alignof and and_eq asm auto bitand bitor bool break case catch char char8_t char16_t
    char32_t class co_await co_return co_yield compl concept const const_cast consteval constexpr
    constinit continue decltype default delete do double dynamic_cast else enum explicit export
    extern false float for friend goto if inline int long mutable namespace new noexcept not not_eq
    nullptr operator or or_eq private protected public register reinterpret_cast requires return
    short signed sizeof static static_assert static_cast struct switch template this thread_local
    throw true try typedef typeid typename union unsigned using virtual void volatile wchar_t while
    xor xor_eq NULL""".split())

# What the generated class of a kind of type declares besides the file's own members.
_STRUCTURE_MEMBERS = {"descriptor", "fixed_size", "readFromParcel", "toString", "writeToParcel"}
_TAKEN = {
    syntax.Interface: {
        "asBinder", "asInterface", "createBinder", "default_impl", "defineClass", "descriptor",
        "dump", "fromBinder", "getDefaultImpl", "getInterfaceHash", "getInterfaceVersion",
        "handleShellCommand", "hash", "isRemote", "make", "readFromParcel", "ref",
        "setDefaultImpl", "version", "writeToParcel"},
    syntax.Parcelable: _STRUCTURE_MEMBERS,
    syntax.Union: _STRUCTURE_MEMBERS | {"get", "getTag", "isFieldValue", "make", "set", "Tag",
                                        "Value"},
    syntax.Enum: set(),
}


def check(declaration: syntax.Declaration) -> None:
    """Refuses names that do not work as C++, and members of the same name."""
    for part in declaration.package.split("."):
        _check_keyword(part, declaration.location)
    _check_keyword(declaration.name, declaration.location)
    taken = _TAKEN[type(declaration)] | {declaration.name}
    if isinstance(declaration, syntax.Interface):
        taken |= {f"TRANSACTION_{each.name}" for each in declaration.methods}
        for method in declaration.methods:
            _check_unique(method.arguments, f"'{method.name}' has two arguments named")
    seen = members(declaration)
    for each in seen:
        _check_keyword(each.name, each.location)
        if each.name in taken or each.name.startswith("_aidl_"):
            raise CompileError(each.location, f"the name '{each.name}' is taken by the generated "
                                              f"code of every {declaration.keyword}")
    _check_unique(seen, f"'{declaration.name}' has two members named")


def members(declaration: syntax.Declaration) -> list:
    """Everything that has a name of its own inside the type."""
    if isinstance(declaration, syntax.Enum):
        return declaration.enumerators
    if isinstance(declaration, syntax.Interface):
        return [*declaration.methods, *declaration.constants]
    assert isinstance(declaration, (syntax.Parcelable, syntax.Union))
    return [*declaration.fields, *declaration.constants]


def _check_keyword(name: str, location: Location) -> None:
    if name in _CPP_KEYWORDS:
        raise CompileError(location, f"'{name}' cannot be a name: C++ reserves the word")


def _check_unique(named: list, complaint: str) -> None:
    first: dict[str, int] = {}
    for each in sorted(named, key=lambda each: (each.location.line, each.location.column)):
        if each.name in first:
            raise CompileError(each.location,
                               f"{complaint} '{each.name}' (the first in line {first[each.name]})")
        first[each.name] = each.location.line
