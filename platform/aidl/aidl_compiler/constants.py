# SPDX-License-Identifier: Apache-2.0
"""Constant expressions: their value, checked against the type it is for.

Integers are 32 bits wide unless an operand needs 64; a result that does not fit is an error and
never wraps. A hexadecimal literal may name any bit pattern of 32 (or 64) bits.
"""

from __future__ import annotations

import operator
from dataclasses import dataclass
from typing import Callable, Union as AnyOf

from . import syntax
from .errors import CompileError
from .library import Library

RANGES = {"byte": (-2**7, 2**7 - 1), "int": (-2**31, 2**31 - 1), "long": (-2**63, 2**63 - 1)}
_LARGEST = {"float": 3.4028234663852886e38, "double": 1.7976931348623157e308}

_ESCAPES = {"n": "\n", "t": "\t", "r": "\r", "0": "\0", "\\": "\\", "'": "'", '"': '"'}


@dataclass(frozen=True)
class EnumValue:
    """A value of an enumeration: the enumerator that was named."""

    declaration: syntax.Enum
    name: str


Value = AnyOf[int, float, bool, str, EnumValue, list]


def evaluate(expression: syntax.Expression, wanted: syntax.TypeReference,
             scope: syntax.Declaration, library: Library) -> Value:
    """The value of `expression` as a `wanted`; `scope` is the type whose constants it may name."""
    return _Evaluator(scope, library).as_type(expression, wanted)


def enumerator_values(declaration: syntax.Enum, library: Library) -> dict[str, int]:
    """Every enumerator's number, in declaration order."""
    return _Evaluator(declaration, library).enumerators(declaration)


class _Evaluator:
    def __init__(self, scope: syntax.Declaration, library: Library,
                 pending: frozenset[str] = frozenset()):
        self._scope = scope
        self._library = library
        self._pending = pending  # constants being evaluated, to find those that name themselves

    def as_type(self, expression: syntax.Expression, wanted: syntax.TypeReference) -> Value:
        if wanted.is_sequence:
            if not isinstance(expression, syntax.ArrayLiteral):
                raise CompileError(expression.location, f"a value of type {wanted} stands in {{}}")
            return [self.as_type(each, wanted.element) for each in expression.elements]
        value = self._value(expression)
        if isinstance(wanted.declaration, syntax.Enum):
            if isinstance(value, EnumValue) and value.declaration is wanted.declaration:
                return value
        elif wanted.name in RANGES:
            if isinstance(value, int) and not isinstance(value, bool):
                low, high = RANGES[wanted.name]
                if not low <= value <= high:
                    raise CompileError(expression.location,
                                       f"{value} does not fit into {wanted.name}")
                return value
        elif wanted.name in _LARGEST:
            if isinstance(value, (int, float)) and not isinstance(value, bool):
                if not abs(value) <= _LARGEST[wanted.name]:
                    raise CompileError(expression.location,
                                       f"{value} does not fit into {wanted.name}")
                return float(value)
        elif wanted.name == "boolean" and isinstance(value, bool):
            return value
        elif wanted.name == "String" and isinstance(value, str) and not _is_character(expression):
            if "\0" in value:
                raise CompileError(expression.location, "a String here cannot hold a zero")
            return value
        elif wanted.name == "char" and isinstance(value, str) and _is_character(expression):
            if ord(value) > 0xffff:
                raise CompileError(expression.location, f"'{value}' does not fit into char")
            return value
        raise CompileError(expression.location, f"the value is not of type {wanted}")

    def enumerators(self, declaration: syntax.Enum) -> dict[str, int]:
        low, high = RANGES[declaration.backing]
        values: dict[str, int] = {}
        following = 0
        for each in declaration.enumerators:
            if each.value is not None:
                value = self._nested(declaration, each.name, each.location)._value(each.value)
                if isinstance(value, EnumValue):
                    value = self.enumerators(value.declaration)[value.name]
                if not isinstance(value, int) or isinstance(value, bool):
                    raise CompileError(each.value.location, "an enumerator's value is an integer")
                following = value
            if not low <= following <= high:
                raise CompileError(each.location,
                                   f"{following} does not fit into the backing type "
                                   f"{declaration.backing}")
            values[each.name] = following
            following += 1
        return values

    def _nested(self, scope: syntax.Declaration, name: str, location) -> "_Evaluator":
        key = f"{scope.qualified_name}.{name}"
        if key in self._pending:
            raise CompileError(location, f"the value of '{name}' depends on itself")
        return _Evaluator(scope, self._library, self._pending | {key})

    def _value(self, expression: syntax.Expression) -> Value:
        if isinstance(expression, syntax.Literal):
            return _literal(expression)
        if isinstance(expression, syntax.Reference):
            return self._reference(expression)
        if isinstance(expression, syntax.Unary):
            return self._unary(expression)
        if isinstance(expression, syntax.Binary):
            return self._binary(expression)
        raise CompileError(expression.location, "a list of values cannot stand here")

    # --- names ---

    def _reference(self, reference: syntax.Reference) -> Value:
        type_name, _, member = reference.name.rpartition(".")
        declaration = self._named_type(type_name) if type_name else self._scope
        if isinstance(declaration, syntax.Enum):
            if any(each.name == member for each in declaration.enumerators):
                if declaration is self._scope:
                    # Enumerators may be built from earlier ones of the same enumeration.
                    return self._earlier_enumerator(declaration, member, reference)
                return EnumValue(declaration, member)
        elif declaration is not None:
            for each in declaration.constants:
                if each.name == member:
                    nested = self._nested(declaration, member, reference.location)
                    return nested.as_type(each.value, each.type)
        raise CompileError(reference.location, f"unknown constant '{reference.name}'")

    def _earlier_enumerator(self, declaration: syntax.Enum, member: str,
                            reference: syntax.Reference) -> int:
        names = [each.name for each in declaration.enumerators]
        earlier = syntax.Enum(declaration.annotations, declaration.name, "", declaration.location,
                              declaration.enumerators[:names.index(member) + 1])
        earlier.package, earlier.backing = declaration.package, declaration.backing
        nested = self._nested(declaration, member + "'", reference.location)
        return nested.enumerators(earlier)[member]

    def _named_type(self, name: str) -> syntax.Declaration | None:
        if name == self._scope.name:
            return self._scope
        document = self._library.find_from(name, self._scope)
        return document.declaration if document else None

    # --- operators ---

    def _unary(self, expression: syntax.Unary) -> Value:
        value = self._value(expression.operand)
        if expression.operator == "!":
            if isinstance(value, bool):
                return not value
        elif isinstance(value, float) and expression.operator in "+-":
            return -value if expression.operator == "-" else value
        elif isinstance(value, int) and not isinstance(value, bool):
            result = {"+": value, "-": -value, "~": ~value}[expression.operator]
            return _fitting(result, expression)
        raise CompileError(expression.location, f"'{expression.operator}' does not apply here")

    def _binary(self, expression: syntax.Binary) -> Value:
        left, right = self._value(expression.left), self._value(expression.right)
        symbol = expression.operator
        if symbol == "+" and isinstance(left, str) and isinstance(right, str):
            return left + right
        if symbol in _LOGICAL and isinstance(left, bool) and isinstance(right, bool):
            return _LOGICAL[symbol](left, right)
        numbers = all(isinstance(each, (int, float)) and not isinstance(each, bool)
                      for each in (left, right))
        if symbol in _COMPARISONS and numbers:
            return _COMPARISONS[symbol](left, right)
        if symbol in _ARITHMETIC and numbers and not isinstance(left + right, float):
            if symbol in ("/", "%") and right == 0:
                raise CompileError(expression.location, "division by zero")
            if symbol in ("<<", ">>") and not 0 <= right < 64:
                raise CompileError(expression.location, f"a shift by {right} bits")
            return _fitting(_ARITHMETIC[symbol](left, right), expression)
        raise CompileError(expression.location, f"'{symbol}' does not apply to these values")


def _quotient(left: int, right: int) -> int:
    """Division that cuts towards zero, as in C++."""
    magnitude = abs(left) // abs(right)
    return magnitude if (left < 0) == (right < 0) else -magnitude


_ARITHMETIC: dict[str, Callable[[int, int], int]] = {
    "+": operator.add, "-": operator.sub, "*": operator.mul, "/": _quotient,
    "%": lambda left, right: left - right * _quotient(left, right),
    "&": operator.and_, "|": operator.or_, "^": operator.xor,
    "<<": operator.lshift, ">>": operator.rshift,
}
_COMPARISONS: dict[str, Callable[[float, float], bool]] = {
    "==": operator.eq, "!=": operator.ne, "<": operator.lt, "<=": operator.le,
    ">": operator.gt, ">=": operator.ge,
}
_LOGICAL: dict[str, Callable[[bool, bool], bool]] = {
    "&&": lambda left, right: left and right, "||": lambda left, right: left or right,
}


def _fitting(value: int, expression: syntax.Expression) -> int:
    low, high = RANGES["long"]
    if not low <= value <= high:
        raise CompileError(expression.location, f"{value} does not fit into long")
    return value


def _is_character(expression: syntax.Expression) -> bool:
    return isinstance(expression, syntax.Literal) and expression.kind == "character"


def _literal(literal: syntax.Literal) -> Value:
    if literal.kind == "boolean":
        return literal.text == "true"
    if literal.kind == "float":
        return float(literal.text.rstrip("f"))
    if literal.kind == "integer":
        return _integer(literal)
    return _unescape(literal)


def _integer(literal: syntax.Literal) -> int:
    """Hexadecimal literals are bit patterns: 0xffffffff is -1, 0xffffffffL is 4294967295."""
    text = literal.text
    is_byte, is_long = text.endswith("u8"), text[-1] in "lL"
    digits = text[:-2] if is_byte else text.rstrip("lL")
    is_hexadecimal = digits[:2] in ("0x", "0X")
    if len(digits) > 20:
        raise CompileError(literal.location, "the number does not fit into long")
    value = int(digits, 16 if is_hexadecimal else 10)
    if is_byte:
        if value > 0xff:
            raise CompileError(literal.location, f"{text} does not fit into byte")
        return value - 0x100 if value > 0x7f else value
    if is_hexadecimal and not is_long and 2**31 <= value < 2**32:
        return value - 2**32
    if is_hexadecimal and 2**63 <= value < 2**64:
        return value - 2**64
    return value


def _unescape(literal: syntax.Literal) -> str:
    body, result, escaped = literal.text[1:-1], [], False
    for character in body:
        if escaped:
            if character not in _ESCAPES:
                raise CompileError(literal.location, f"unknown escape sequence '\\{character}'")
            result.append(_ESCAPES[character])
        elif character != "\\":
            result.append(character)
        escaped = character == "\\" and not escaped
    return "".join(result)


def escaped(character: str, quote: str) -> str:
    """A character of a text as it stands in a source."""
    for letter, meaning in _ESCAPES.items():
        if character == meaning and character not in "'\"":
            return "\\" + letter
    return "\\" + character if character == quote else character
