# SPDX-License-Identifier: Apache-2.0
"""What AIDL is in NDK C++: the spelling of types, names and values, and how each type travels.

Everything here is text for the templates. In reading and writing expressions `parcel` is the C++
expression for the parcel and `value` (or `target`, a pointer) the one for what is read or written.
"""

from __future__ import annotations

import math

from . import constants, syntax

# The part of the AParcel functions' names that says which scalar they carry.
_PARCEL_NAMES = {"boolean": "Bool", "byte": "Byte", "char": "Char", "int": "Int32",
                 "long": "Int64", "float": "Float", "double": "Double"}

# Handles: they know null themselves, so @nullable does not change their C++ type.
_HANDLES = {"IBinder": ("::ndk::SpAIBinder", "StrongBinder"),
            "ParcelFileDescriptor": ("::ndk::ScopedFileDescriptor", "ParcelFileDescriptor")}


# --- names ---------------------------------------------------------------------------------------


def namespace(package: str) -> str:
    return "aidl::" + package.replace(".", "::")


def qualified(declaration: syntax.Declaration) -> str:
    return f"::{namespace(declaration.package)}::{declaration.name}"


def base_name(name: str) -> str:
    """IFoo is Foo's interface, with BnFoo and BpFoo; Iris is just a name."""
    return name[1:] if name[:1] == "I" and name[1:2].isupper() else name


def class_name(declaration: syntax.Declaration, kind: str) -> str:
    """The class's name for a `kind` of "" (the type itself), "Bn" (stub) or "Bp" (proxy)."""
    return kind + base_name(declaration.name) if kind else declaration.name


def header(declaration: syntax.Declaration, kind: str = "") -> str:
    """The path a header is included by."""
    directory = declaration.package.replace(".", "/")
    return f"aidl/{directory}/{class_name(declaration, kind)}.h"


def source(declaration: syntax.Declaration) -> str:
    return f"{declaration.qualified_name.replace('.', '/')}.cpp"


def argument_name(argument: syntax.Argument) -> str:
    return ("in_" if argument.is_in else "out_") + argument.name


# --- types ---------------------------------------------------------------------------------------


def stack_type(of: syntax.TypeReference) -> str:
    """The type of a variable that holds such a value."""
    if of.is_sequence:
        vector = f"std::vector<{_element_type(of)}>"
        return f"std::optional<{vector}>" if of.nullable else vector
    plain = _plain_type(of)
    return f"std::optional<{plain}>" if of.nullable and _nullable_by_optional(of) else plain


def argument_type(argument: syntax.Argument) -> str:
    if argument.is_out:
        return stack_type(argument.type) + "*"
    return stack_type(argument.type) if _is_by_value(argument.type) \
        else f"const {stack_type(argument.type)}&"


def is_enum(of: syntax.TypeReference) -> bool:
    return isinstance(of.declaration, syntax.Enum)


def _is_by_value(of: syntax.TypeReference) -> bool:
    return not of.is_sequence and (of.name in syntax.SCALARS or is_enum(of))


def _nullable_by_optional(of: syntax.TypeReference) -> bool:
    return of.name == "String" or isinstance(of.declaration, (syntax.Parcelable, syntax.Union))


def _plain_type(of: syntax.TypeReference) -> str:
    if of.name in syntax.SCALARS:
        return syntax.SCALARS[of.name]
    if of.name == "String":
        return "std::string"
    if of.name in _HANDLES:
        return _HANDLES[of.name][0]
    assert of.declaration is not None, f"{of} is unresolved"
    name = qualified(of.declaration)
    return f"std::shared_ptr<{name}>" if isinstance(of.declaration, syntax.Interface) else name


def _element_type(sequence: syntax.TypeReference) -> str:
    element = sequence.element
    if element.name == "byte":
        return "uint8_t"  # although a single byte is int8_t
    plain = _plain_type(element)
    # A nullable list may hold nulls where the element's type can say so.
    return f"std::optional<{plain}>" if sequence.nullable and _nullable_by_optional(element) \
        else plain


# --- reading and writing -------------------------------------------------------------------------


def write(of: syntax.TypeReference, parcel: str, value: str) -> str:
    """An expression that writes `value` and is a binder_status_t."""
    if of.is_sequence:
        return _write_sequence(of, parcel, value)
    if of.name in _PARCEL_NAMES:
        return f"::AParcel_write{_PARCEL_NAMES[of.name]}({parcel}, {value})"
    if is_enum(of):
        backing = of.declaration.backing
        cast = f"static_cast<{syntax.SCALARS[backing]}>({value})"
        return f"::AParcel_write{_PARCEL_NAMES[backing]}({parcel}, {cast})"
    if isinstance(of.declaration, syntax.Interface):
        return f"{qualified(of.declaration)}::writeToParcel({parcel}, {value})"
    return f"::ndk::AParcel_write{_function_name(of)}({parcel}, {value})"


def read(of: syntax.TypeReference, parcel: str, target: str) -> str:
    """An expression that reads into `*target` and is a binder_status_t. Enumerations are read by
    the function readEnum, which the template must define (see `reads_enum`)."""
    if of.is_sequence:
        if is_enum(of.element):
            target = f"reinterpret_cast<{_backing_sequence(of)}*>({target})"
        return f"::ndk::AParcel_readVector({parcel}, {target})"
    if of.name in _PARCEL_NAMES:
        return f"::AParcel_read{_PARCEL_NAMES[of.name]}({parcel}, {target})"
    if is_enum(of):
        function = f"::AParcel_read{_PARCEL_NAMES[of.declaration.backing]}"
        return f"readEnum({parcel}, {function}, {target})"
    if isinstance(of.declaration, syntax.Interface):
        return f"{qualified(of.declaration)}::readFromParcel({parcel}, {target})"
    return f"::ndk::AParcel_read{_function_name(of)}({parcel}, {target})"


def _write_sequence(of: syntax.TypeReference, parcel: str, value: str) -> str:
    if not is_enum(of.element):
        return f"::ndk::AParcel_writeVector({parcel}, {value})"
    if of.nullable:
        value = f"reinterpret_cast<const {_backing_sequence(of)}&>({value})"
        return f"::ndk::AParcel_writeVector({parcel}, {value})"
    backing = of.element.declaration.backing
    data = f"reinterpret_cast<const {syntax.SCALARS[backing]}*>(({value}).data())"
    return f"::AParcel_write{_PARCEL_NAMES[backing]}Array({parcel}, {data}, " \
           f"static_cast<int32_t>(({value}).size()))"


def _backing_sequence(of: syntax.TypeReference) -> str:
    """The list of numbers that a list of an enumeration is: the phone's headers have no functions
    for the latter."""
    backing = of.element.declaration.backing
    vector = f"std::vector<{'uint8_t' if backing == 'byte' else syntax.SCALARS[backing]}>"
    return f"std::optional<{vector}>" if of.nullable else vector


def reads_enum(declaration: syntax.Declaration) -> bool:
    """Whether the code for this type reads an enumeration that is not in a list."""
    return any(is_enum(each) and not each.is_sequence
               for each in syntax.type_references(declaration))


def _function_name(of: syntax.TypeReference) -> str:
    """What follows AParcel_read or AParcel_write in namespace ndk."""
    if of.name == "String":
        return "String"  # overloaded for std::optional
    if of.name in _HANDLES:
        return ("Nullable" if of.nullable else "Required") + _HANDLES[of.name][1]
    return "NullableParcelable" if of.nullable else "Parcelable"


# --- values --------------------------------------------------------------------------------------


def initialiser(member: syntax.Field, value: constants.Value | None) -> str:
    """What stands after a field's name: its default, zero for plain data without one."""
    if value is not None:
        return f" = {literal(member.type, value)}"
    if member.type.is_sequence:
        return ""
    zero = {"boolean": " = false", "char": " = u'\\0'", "float": " = 0.0f", "double": " = 0.0"}
    if member.type.name in syntax.SCALARS:
        return zero.get(member.type.name, " = 0")
    return "{}" if is_enum(member.type) else ""


def literal(of: syntax.TypeReference, value: constants.Value) -> str:
    """A constant as C++."""
    if isinstance(value, list):
        if of.element.name == "byte":
            value = [each & 0xff for each in value]  # unsigned in lists
        return f"{{{', '.join(literal(of.element, each) for each in value)}}}"
    if isinstance(value, constants.EnumValue):
        return f"{qualified(value.declaration)}::{value.name}"
    if isinstance(value, bool):
        return "true" if value else "false"
    if isinstance(value, int):
        return integer(value)
    if isinstance(value, float):
        return _floating(of, value)
    if of.name == "char":
        return f"u'{_escaped(value)}'" if " " <= value <= "~" else f"u'\\x{ord(value):x}'"
    return f'"{"".join(map(_escaped, value))}"'


def integer(value: int) -> str:
    # The smallest numbers have no literal of their own: the minus is not part of one.
    return {-2**31: "INT32_MIN", -2**63: "INT64_MIN"}.get(value, str(value))


def _floating(of: syntax.TypeReference, value: float) -> str:
    assert math.isfinite(value)
    return repr(value) + ("f" if of.name == "float" else "")


def _escaped(character: str) -> str:
    if character in "\\\"'?":
        return "\\" + character
    return character if ord(character) >= 0x20 and ord(character) != 0x7f \
        else f"\\{ord(character):03o}"
