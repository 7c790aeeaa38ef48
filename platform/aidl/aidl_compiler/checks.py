# SPDX-License-Identifier: Apache-2.0
"""What the grammar cannot refuse: the rules of the language, and what this compiler leaves out."""

from __future__ import annotations

from . import annotations, constants, names, syntax
from .errors import CompileError
from .library import Library

# The largest number a method may be given; the codes above are the platform's.
_MAX_METHOD_ID = 16777114

_CONSTANT_TYPES = ("byte", "int", "long", "String")


def check(document: syntax.Document, library: Library) -> None:
    """Refuses a file that is not right; the first complaint is raised."""
    declaration = document.declaration
    annotations.check(declaration)
    names.check(declaration)
    for reference in syntax.type_references(declaration):
        _check_type(reference)
    _check_stability(declaration)
    if isinstance(declaration, syntax.Interface):
        _check_interface(declaration, library)
    elif isinstance(declaration, syntax.Enum):
        _check_enum(declaration, library)
    else:
        _check_structure(declaration, library)
    if not isinstance(declaration, syntax.Enum):
        _check_constants(declaration, library)


def check_stability_option(document: syntax.Document, vintf: bool) -> None:
    """A library is stable as a whole or not at all."""
    declaration = document.declaration
    if declaration.is_vintf_stable and not vintf:
        raise CompileError(declaration.location,
                           f"'{declaration.name}' is @VintfStability: --stability vintf is needed")
    if vintf and not declaration.is_vintf_stable:
        raise CompileError(declaration.location,
                           f"'{declaration.name}' is not @VintfStability, which --stability vintf "
                           "demands")


# --- types in use --------------------------------------------------------------------------------


def _check_type(of: syntax.TypeReference) -> None:
    annotations.check(of)
    _check_shape(of)
    if of.annotation("utf8InCpp") and "String" not in (of.name, *(each.name for each in
                                                                  of.arguments)):
        raise CompileError(of.location, f"@utf8InCpp is for String, not {of}")
    if not of.nullable:
        return
    if not of.is_sequence and (of.name in syntax.SCALARS or of.name == "void"
                               or isinstance(of.declaration, syntax.Enum)):
        raise CompileError(of.location, f"{of} cannot be @nullable")
    if of.is_sequence and of.element.name == "ParcelFileDescriptor":
        raise _unsupported(of, f"@nullable {of}")


def _check_shape(of: syntax.TypeReference) -> None:
    if of.fixed_size:
        raise _unsupported(of, "an array of a fixed size")
    if of.dimensions > 1 or (of.dimensions == 1 and of.name == "List"):
        raise _unsupported(of, "an array of arrays")
    if of.name == "List":
        if len(of.arguments) != 1:
            raise CompileError(of.location, "List takes one type, as in List<String>")
        element = of.arguments[0]
        if element.is_sequence:
            raise _unsupported(of, "a List of lists or arrays")
        if element.annotations:
            raise _unsupported(element, f"an annotation in {of}")
        if element.name in syntax.SCALARS or isinstance(element.declaration, syntax.Enum):
            raise CompileError(element.location, f"{of} is not allowed: use {element.name}[]")
    elif of.arguments:
        raise CompileError(of.location, f"{of.name} takes no type arguments")
    if of.is_sequence:
        element = of.element
        if element.name == "void":
            raise CompileError(of.location, f"{of} is not allowed")
        if element.name == "IBinder" or isinstance(element.declaration, syntax.Interface):
            raise _unsupported(of, f"{of}")


def _unsupported(of: syntax.TypeReference, what: str) -> CompileError:
    return CompileError(of.location, f"{what} is not supported")


def _check_stability(declaration: syntax.Declaration) -> None:
    if not declaration.is_vintf_stable:
        return
    for each in syntax.type_references(declaration):
        if each.declaration is not None and not each.declaration.is_vintf_stable:
            raise CompileError(each.location,
                               f"'{declaration.name}' is @VintfStability but uses {each.name}, "
                               "which is not")


def _refuse_void(of: syntax.TypeReference) -> None:
    if of.name == "void":
        raise CompileError(of.location, "void is for results only")


# --- interfaces ----------------------------------------------------------------------------------


def _check_interface(interface: syntax.Interface, library: Library) -> None:
    descriptor = interface.annotation("Descriptor")
    if descriptor is not None:
        text = syntax.TypeReference([], "String", [], 0, False, descriptor.location)
        if not constants.evaluate(descriptor.parameters["value"], text, interface, library):
            raise CompileError(descriptor.location, "@Descriptor takes a text that is not empty")
    for method in interface.methods:
        annotations.check(method)
        for argument in method.arguments:
            _check_direction(argument)
        if interface.oneway or method.oneway:
            _check_oneway(method)
    _check_method_ids(interface)


def _check_direction(argument: syntax.Argument) -> None:
    _refuse_void(argument.type)
    declaration = argument.type.declaration
    both_ways = (argument.type.is_sequence or argument.type.name == "ParcelFileDescriptor"
                 or isinstance(declaration, (syntax.Parcelable, syntax.Union)))
    if both_ways and not argument.direction:
        raise CompileError(argument.location, f"the direction of '{argument.name}' is missing: "
                                              f"{argument.type} takes in, out or inout")
    if not both_ways and argument.is_out:
        raise CompileError(argument.location, f"'{argument.name}' cannot be {argument.direction}: "
                                              f"{argument.type} is for in only")


def _check_oneway(method: syntax.Method) -> None:
    if method.return_type.name != "void" or method.return_type.is_sequence:
        raise CompileError(method.location,
                           f"'{method.name}' is oneway and cannot return {method.return_type}")
    for argument in method.arguments:
        if argument.is_out:
            raise CompileError(argument.location,
                               f"'{method.name}' is oneway and cannot have the "
                               f"{argument.direction} argument '{argument.name}'")


def _check_method_ids(interface: syntax.Interface) -> None:
    used: dict[int, str] = {}
    for method in interface.methods:
        if (method.id is None) != (interface.methods[0].id is None):
            raise CompileError(method.location, "either every method has a number or none has")
        if method.id is None:
            continue
        if not 0 <= method.id <= _MAX_METHOD_ID:
            raise CompileError(method.location, f"the number of '{method.name}' is not between 0 "
                                                f"and {_MAX_METHOD_ID}")
        if method.id in used:
            raise CompileError(method.location, f"'{method.name}' has the number {method.id} of "
                                                f"'{used[method.id]}'")
        used[method.id] = method.name


# --- parcelables, unions, enumerations, constants ------------------------------------------------


def _check_structure(structure: syntax.Parcelable | syntax.Union, library: Library) -> None:
    is_union = isinstance(structure, syntax.Union)
    if is_union and not structure.fields:
        raise CompileError(structure.location, f"'{structure.name}': a union has a field at least")
    for each in structure.fields:
        annotations.check(each)
        _refuse_void(each.type)
        if each.default is not None:
            if each.type.nullable:
                raise CompileError(each.default.location,
                                   f"a default of the @nullable '{each.name}' is not supported")
            if is_union and each is not structure.fields[0]:
                raise CompileError(each.default.location,
                                   "only the first field of a union can have a default")
            constants.evaluate(each.default, each.type, structure, library)
        if structure.annotation("FixedSize") and not _has_fixed_size(each.type):
            raise CompileError(each.type.location, f"'{structure.name}' is @FixedSize but the size "
                                                   f"of {each.type} is not fixed")
        if any(held is structure for held in _held_by_value(each.type, set())):
            raise CompileError(each.type.location, f"'{structure.name}' would hold itself")


def _has_fixed_size(of: syntax.TypeReference) -> bool:
    if of.is_sequence or of.nullable:
        return False
    return (of.name in syntax.SCALARS or isinstance(of.declaration, syntax.Enum)
            or (isinstance(of.declaration, (syntax.Parcelable, syntax.Union))
                and of.declaration.annotation("FixedSize") is not None))


def _held_by_value(of: syntax.TypeReference, seen: set[str]) -> list[syntax.Declaration]:
    """The parcelables and unions that a value of this type contains, other than in a list."""
    declaration = of.declaration
    if of.is_sequence or not isinstance(declaration, (syntax.Parcelable, syntax.Union)) \
            or declaration.qualified_name in seen:
        return []
    seen.add(declaration.qualified_name)
    return [declaration, *(each for field in declaration.fields
                           for each in _held_by_value(field.type, seen))]


def _check_enum(enum: syntax.Enum, library: Library) -> None:
    if not enum.enumerators:
        raise CompileError(enum.location, f"'{enum.name}': an enum has an enumerator at least")
    constants.enumerator_values(enum, library)


def _check_constants(declaration: syntax.Declaration, library: Library) -> None:
    for each in declaration.constants:
        annotations.check(each)
        if each.type.is_sequence or each.type.name not in _CONSTANT_TYPES:
            raise CompileError(each.type.location, f"a constant of type {each.type} is not "
                                                   f"supported, {', '.join(_CONSTANT_TYPES)} are")
        constants.evaluate(each.value, each.type, declaration, library)
