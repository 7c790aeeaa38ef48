# SPDX-License-Identifier: Apache-2.0
"""A type in the form that is frozen: equal meaning gives equal bytes, whatever the layout."""

from __future__ import annotations

from typing import Iterator

from . import constants, syntax
from .library import Library
from .parser import comment_has_tag

_WARNING = """\
// One version of this type as `aidl --dumpapi` wrote it. A numbered version is what its users were
// built against: the version's hash covers every byte, so it is never edited, only followed by the
// next. Change the source beside aidl_api/ instead.
"""


def path(document: syntax.Document) -> str:
    """Where the text belongs, below the version's directory."""
    return document.declaration.qualified_name.replace(".", "/") + ".aidl"


def text(document: syntax.Document, library: Library) -> str:
    """The licence, the package, the type: methods, then fields, then constants."""
    declaration = document.declaration
    oneway = "oneway " if isinstance(declaration, syntax.Interface) and declaration.oneway else ""
    lines = [
        *document.licence,
        _WARNING,
        f"package {document.package};",
        *_marks(declaration.comment, ""),
        *_annotation_line(declaration),
        f"{oneway}{declaration.keyword} {declaration.name} {{",
        *_members(declaration, library),
        "}",
    ]
    return "\n".join(lines) + "\n"


def _members(declaration: syntax.Declaration, library: Library) -> Iterator[str]:
    if isinstance(declaration, syntax.Enum):
        values = constants.enumerator_values(declaration, library)
        for enumerator in declaration.enumerators:
            yield from _marks(enumerator.comment, "  ")
            yield f"  {enumerator.name} = {values[enumerator.name]},"
        return
    if isinstance(declaration, syntax.Interface):
        for method in declaration.methods:
            yield from _marks(method.comment, "  ")
            yield f"  {_annotations(method)}{_method(method)};"
    else:
        assert isinstance(declaration, (syntax.Parcelable, syntax.Union))
        for field in declaration.fields:
            yield from _marks(field.comment, "  ")
            default = "" if field.default is None else " = " + value_text(
                field.type, constants.evaluate(field.default, field.type, declaration, library))
            yield f"  {_annotations(field)}{_type(field.type)} {field.name}{default};"
    for constant in declaration.constants:
        yield from _marks(constant.comment, "  ")
        value = constants.evaluate(constant.value, constant.type, declaration, library)
        yield (f"  {_annotations(constant)}const {_type(constant.type)} {constant.name} = "
               f"{value_text(constant.type, value)};")


def _method(method: syntax.Method) -> str:
    arguments = ", ".join(f"{each.direction} {_type(each.type)} {each.name}".lstrip()
                          for each in method.arguments)
    oneway = "oneway " if method.oneway else ""
    number = "" if method.id is None else f" = {method.id}"
    return f"{oneway}{_type(method.return_type)} {method.name}({arguments}){number}"


def _type(of: syntax.TypeReference) -> str:
    return f"{_annotations(of)}{of}"


def _annotations(annotated: syntax.Annotated) -> str:
    return "".join(f"{each} " for each in sorted(map(annotation_text, annotated.annotations)))


def _annotation_line(annotated: syntax.Annotated) -> list[str]:
    line = _annotations(annotated).rstrip()
    return [line] if line else []


def annotation_text(annotation: syntax.Annotation) -> str:
    """The annotation with its parameters in the order of their names."""
    parameters = ", ".join(f"{name}={_expression(value)}"
                           for name, value in sorted(annotation.parameters.items()))
    return f"@{annotation.name}" + (f"({parameters})" if parameters else "")


def _expression(expression: syntax.Expression) -> str:
    """An annotation's parameter as in the source, spaces aside."""
    if isinstance(expression, syntax.Literal):
        return expression.text
    if isinstance(expression, syntax.Reference):
        return expression.name
    if isinstance(expression, syntax.Unary):
        return f"{expression.operator}{_expression(expression.operand)}"
    if isinstance(expression, syntax.Binary):
        return (f"({_expression(expression.left)} {expression.operator} "
                f"{_expression(expression.right)})")
    return f"{{{', '.join(map(_expression, expression.elements))}}}"


def value_text(of: syntax.TypeReference, value: constants.Value) -> str:
    """An evaluated constant as AIDL."""
    if isinstance(value, list):
        return f"{{{', '.join(value_text(of.element, each) for each in value)}}}"
    if isinstance(value, constants.EnumValue):
        return f"{value.declaration.qualified_name}.{value.name}"
    if isinstance(value, bool):
        return "true" if value else "false"
    if isinstance(value, int):
        return str(value)
    if isinstance(value, float):
        return repr(value) + ("f" if of.name == "float" else "")
    quote = "'" if of.name == "char" else '"'
    return quote + "".join(constants.escaped(each, quote) for each in value) + quote


def _marks(comment: str, indentation: str) -> list[str]:
    """Of a documentation comment only what hides or deprecates is part of the interface."""
    marks = [f"@{tag} {rest}".rstrip() for tag in ("hide", "deprecated")
             if (rest := comment_has_tag(comment, tag)) is not None]
    if not marks:
        return []
    return [f"{indentation}/**", *(f"{indentation} * {each}" for each in marks),
            f"{indentation} */"]
