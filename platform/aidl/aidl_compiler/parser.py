# SPDX-License-Identifier: Apache-2.0
"""Text to tree. The grammar stands in aidl.lark; here it meets the classes of `syntax`."""

from __future__ import annotations

import functools
import pathlib
import re
from typing import Any, Optional

import lark

from . import syntax
from .errors import CompileError, Location, UsageError

GRAMMAR = pathlib.Path(__file__).with_name("aidl.lark")

# How a terminal is called in a complaint; any other is called by its text.
_TERMINAL_NAMES = {
    "NAME": "a name",
    "INTEGER": "a number",
    "FLOAT": "a number",
    "STRING": "a string",
    "CHARACTER": "a character",
    "ANNOTATION_NAME": "an annotation",
    "$END": "the end of the file",
}


def parse_file(path: str) -> syntax.Document:
    """Reads and parses one file. `path` is kept as given: it is how complaints name the file."""
    try:
        data = pathlib.Path(path).read_bytes()
    except OSError as error:
        raise UsageError(f"cannot read {path}: {error.strerror}") from error
    try:
        text = data.decode("utf-8")
    except UnicodeDecodeError as error:
        line = data.count(b"\n", 0, error.start) + 1
        column = error.start - (data.rfind(b"\n", 0, error.start) + 1) + 1
        raise CompileError(Location(path, line, column), "the file is not UTF-8 text") from error
    return parse_text(text, path)


def parse_text(text: str, path: str) -> syntax.Document:
    parser = _parser()
    parser.comments.clear()
    try:
        tree = parser.lark.parse(text)
    except lark.UnexpectedInput as error:
        raise _syntax_error(error, text, path) from error
    try:
        return _TreeBuilder(path, text, parser.comments).transform(tree)
    except lark.exceptions.VisitError as error:
        raise error.orig_exc from error
    except RecursionError as error:
        raise CompileError(Location(path, 1, 1), "an expression is nested too deeply") from error


class _Parser:
    """The grammar's tables, and the comments of the text parsed last: the grammar ignores them."""

    def __init__(self) -> None:
        self.comments: list[lark.Token] = []
        callbacks = dict.fromkeys(("LINE_COMMENT", "BLOCK_COMMENT"), self._keep_comment)
        self.lark = lark.Lark(GRAMMAR.read_text("utf-8"), parser="lalr", lexer="contextual",
                              propagate_positions=True, maybe_placeholders=True,
                              lexer_callbacks=callbacks)

    def _keep_comment(self, token: lark.Token) -> lark.Token:
        self.comments.append(token)
        return token


@functools.cache
def _parser() -> _Parser:
    """Building the parse tables is the slow part of a run, so one parser serves all files."""
    return _Parser()


def _syntax_error(error: lark.UnexpectedInput, text: str, path: str) -> CompileError:
    if isinstance(error, lark.UnexpectedToken):
        accepted = error.accepts or error.expected
        if error.token.type == "$END":
            found = "end of the file"
            location = Location(path, text.count("\n") + 1, len(text) - text.rfind("\n"))
        else:
            found = _describe_character(text[error.token.start_pos:], len(error.token))
            location = Location(path, error.line, error.column)
    else:
        accepted = getattr(error, "allowed", None) or set()
        location = Location(path, error.line, error.column)
        found = _describe_character(text[error.pos_in_stream:])
    return CompileError(location, f"unexpected {found}{_describe_accepted(accepted)}")


def _describe_character(rest: str, length: int = 1) -> str:
    if rest.startswith("/*"):
        return "'/*': the comment is never closed"
    if rest[:1] == '"' and length == 1:
        return '": the string is never closed'
    if rest[:1] == "'" and length == 1:
        return "': one character between two of these is a char"
    return f"'{rest[:length]}'"


def _describe_accepted(accepted: Any) -> str:
    """", expected ';' or a name" while the list is short enough to help."""
    patterns = {each.name: each.pattern for each in _parser().lark.terminals}
    names = set()
    for terminal in accepted:
        if terminal in _TERMINAL_NAMES:
            names.add(_TERMINAL_NAMES[terminal])
        elif isinstance(patterns.get(terminal), lark.lexer.PatternStr):
            names.add(f"'{patterns[terminal].value}'")
    if not names or len(names) > 6:
        return ""
    ordered = sorted(names)
    return ", expected " + " or ".join(filter(None, [", ".join(ordered[:-1]), ordered[-1]]))


_LICENCE = re.compile(r"licen[cs]e|copyright", re.IGNORECASE)


class _TreeBuilder(lark.Transformer):
    """One method per rule of the grammar; each gets the rule's children, None for absent ones."""

    def __init__(self, path: str, text: str, comments: list[lark.Token]):
        super().__init__()
        self._path = path
        self._text = text
        self._comments = comments
        # A documentation comment by the offset of what follows it.
        self._documentation = {
            self._skip_blanks(_end(token)): str(token)
            for token in comments if token.startswith("/**") and len(token) > 4
        }

    def _skip_blanks(self, offset: int) -> int:
        while offset < len(self._text) and self._text[offset].isspace():
            offset += 1
        return offset

    def _location(self, meta_or_token: Any) -> Location:
        return Location(self._path, meta_or_token.line, meta_or_token.column)

    def _comment(self, meta: Any) -> str:
        return _plain_comment(self._documentation.get(meta.start_pos, ""))

    def _unsupported(self, place: Any, what: str) -> CompileError:
        return CompileError(self._location(place), f"{what} not supported")

    # --- file ---

    @lark.v_args(meta=True)
    def start(self, meta: Any, children: list[Any]) -> syntax.Document:
        beginning = Location(self._path, 1, 1)
        package = next((each for each in children if isinstance(each, _Package)), None)
        imports = [each for each in children if isinstance(each, syntax.Import)]
        declarations = [each for each in children if isinstance(each, syntax.Declaration)]
        if package is None:
            raise CompileError(beginning, "the file has no package declaration")
        if not declarations:
            raise CompileError(beginning, "the file declares no type")
        if len(declarations) > 1:
            raise CompileError(declarations[1].location,
                               f"a second type, '{declarations[1].name}': a file holds one type")
        declaration = declarations[0]
        declaration.package = package.name
        licence = [str(each) for each in self._comments
                   if _end(each) <= package.offset and _LICENCE.search(each)]
        return syntax.Document(self._path, package.name, imports, declaration, licence)

    @lark.v_args(meta=True)
    def package(self, meta: Any, children: list[str]) -> "_Package":
        return _Package(children[0], meta.start_pos)

    @lark.v_args(meta=True)
    def import_(self, meta: Any, children: list[str]) -> syntax.Import:
        return syntax.Import(children[0], self._location(meta))

    def qualified_name(self, children: list[lark.Token]) -> str:
        return ".".join(children)

    # --- declarations ---

    @lark.v_args(meta=True)
    def interface(self, meta: Any, children: list[Any]) -> syntax.Interface:
        annotations, (oneway, name, *members) = _split_annotations(children)
        self._refuse_nested(members)
        return syntax.Interface(
            annotations, str(name), self._comment(meta), self._location(name), oneway is not None,
            [each for each in members if isinstance(each, syntax.Method)],
            [each for each in members if isinstance(each, syntax.Constant)])

    @lark.v_args(meta=True)
    def parcelable(self, meta: Any, children: list[Any]) -> syntax.Parcelable:
        return syntax.Parcelable(*self._structure(meta, children))

    @lark.v_args(meta=True)
    def union(self, meta: Any, children: list[Any]) -> syntax.Union:
        return syntax.Union(*self._structure(meta, children))

    def _structure(self, meta: Any, children: list[Any]) -> tuple[Any, ...]:
        annotations, (name, parameters, members) = _split_annotations(children)
        if parameters is not None:
            raise self._unsupported(name, f"'{name}': type parameters are")
        self._refuse_nested(members)
        return (annotations, str(name), self._comment(meta), self._location(name),
                [each for each in members if isinstance(each, syntax.Field)],
                [each for each in members if isinstance(each, syntax.Constant)])

    def type_parameters(self, children: list[lark.Token]) -> list[lark.Token]:
        return children

    def fields(self, children: list[Any]) -> list[Any]:
        return children

    def unstructured_parcelable(self, children: list[Any]) -> None:
        _, (name, *_rest) = _split_annotations(children)
        raise self._unsupported(name, f"'{name}': a parcelable without fields in AIDL is")

    def _refuse_nested(self, members: list[Any]) -> None:
        for each in members:
            if isinstance(each, syntax.Declaration):
                raise CompileError(each.location, f"'{each.name}': nested types are not supported")

    @lark.v_args(meta=True)
    def enum(self, meta: Any, children: list[Any]) -> syntax.Enum:
        annotations, (name, *enumerators) = _split_annotations(children)
        return syntax.Enum(annotations, str(name), self._comment(meta), self._location(name),
                           [each for each in enumerators if each is not None])

    @lark.v_args(meta=True)
    def enumerator(self, meta: Any, children: list[Any]) -> syntax.Enumerator:
        name, value = children
        return syntax.Enumerator(str(name), value, self._comment(meta), self._location(name))

    # --- members ---

    @lark.v_args(meta=True)
    def method(self, meta: Any, children: list[Any]) -> syntax.Method:
        annotations, (oneway, return_type, name, *rest) = _split_annotations(children)
        *arguments, number = rest
        _move_type_annotations(annotations, return_type)
        return syntax.Method(
            annotations, oneway is not None, return_type, str(name),
            [each for each in arguments if each is not None],
            None if number is None else int(number.rstrip("lL"), 0), self._comment(meta),
            self._location(name))

    @lark.v_args(meta=True)
    def argument(self, meta: Any, children: list[Any]) -> syntax.Argument:
        direction, of_type, name = children
        return syntax.Argument(direction or "", of_type, str(name), self._location(name))

    def direction(self, children: list[lark.Token]) -> str:
        return str(children[0])

    @lark.v_args(meta=True)
    def constant(self, meta: Any, children: list[Any]) -> syntax.Constant:
        annotations, (of_type, name, value) = _split_annotations(children)
        _move_type_annotations(annotations, of_type)
        return syntax.Constant(annotations, of_type, str(name), value, self._comment(meta),
                               self._location(name))

    @lark.v_args(meta=True)
    def field(self, meta: Any, children: list[Any]) -> syntax.Field:
        annotations, (of_type, name, default) = _split_annotations(children)
        _move_type_annotations(annotations, of_type)
        return syntax.Field(annotations, of_type, str(name), default, self._comment(meta),
                            self._location(name))

    # --- types and annotations ---

    def annotation(self, children: list[Any]) -> syntax.Annotation:
        name, *parameters = children
        return syntax.Annotation(name[1:], dict(each for each in parameters if each is not None),
                                 self._location(name))

    def annotation_parameter(self, children: list[Any]) -> tuple[str, syntax.Expression]:
        return str(children[0]), children[1]

    def annotated_type(self, children: list[Any]) -> syntax.TypeReference:
        *annotations, of_type = children
        of_type.annotations.extend(annotations)
        return of_type

    @lark.v_args(meta=True)
    def type(self, meta: Any, children: list[Any]) -> syntax.TypeReference:
        name, arguments, *marks = children
        return syntax.TypeReference([], name, arguments or [], len(marks), any(marks),
                                    self._location(meta))

    def type_arguments(self, children: list[Any]) -> list[Any]:
        return children

    def array_mark(self, children: list[Any]) -> bool:
        return children[0] is not None

    # --- expressions ---

    @lark.v_args(meta=True)
    def array(self, meta: Any, children: list[Any]) -> syntax.ArrayLiteral:
        elements = tuple(each for each in children if each is not None)
        return syntax.ArrayLiteral(elements, self._location(meta))

    @lark.v_args(meta=True)
    def binary(self, meta: Any, children: list[Any]) -> syntax.Binary:
        left, operator, right = children
        return syntax.Binary(str(operator), left, right, self._location(meta))

    @lark.v_args(meta=True)
    def unary(self, meta: Any, children: list[Any]) -> syntax.Unary:
        operator, operand = children
        return syntax.Unary(str(operator), operand, self._location(meta))

    @lark.v_args(meta=True)
    def reference(self, meta: Any, children: list[str]) -> syntax.Reference:
        return syntax.Reference(children[0], self._location(meta))

    def literal(self, children: list[lark.Token]) -> syntax.Literal:
        token = children[0]
        kind = token.type.lower() if token.type in ("INTEGER", "FLOAT", "STRING",
                                                    "CHARACTER") else "boolean"
        return syntax.Literal(kind, str(token), self._location(token))


def _end(token: lark.Token) -> int:
    """The offset behind a token; ignored ones carry only where they start."""
    return token.start_pos + len(token)


class _Package:
    def __init__(self, name: str, offset: int):
        self.name = name
        self.offset = offset


def _split_annotations(children: list[Any]) -> tuple[list[syntax.Annotation], list[Any]]:
    annotations = [each for each in children if isinstance(each, syntax.Annotation)]
    return annotations, [each for each in children if not isinstance(each, syntax.Annotation)]


# Annotations that speak of a type, although they stand before the member that has it.
_TYPE_ANNOTATIONS = ("nullable", "utf8InCpp")


def _move_type_annotations(annotations: list[syntax.Annotation],
                           of_type: syntax.TypeReference) -> None:
    of_type.annotations.extend(each for each in annotations if each.name in _TYPE_ANNOTATIONS)
    annotations[:] = [each for each in annotations if each.name not in _TYPE_ANNOTATIONS]


def _plain_comment(comment: str) -> str:
    """A documentation comment's text without the stars and the indentation."""
    if not comment:
        return ""
    lines = [re.sub(r"^\s*\* ?", "", line).rstrip() for line in comment[3:-2].split("\n")]
    lines[0] = lines[0].strip()
    return "\n".join(lines).strip("\n")


def comment_has_tag(comment: str, tag: str) -> Optional[str]:
    """The text after "@tag" in a documentation comment, or None when the tag is absent."""
    found = re.search(rf"(?:^|\s)@{tag}\b[ \t]*([^\n]*)", comment)
    return found.group(1).strip() if found else None
