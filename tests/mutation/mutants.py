# SPDX-License-Identifier: Apache-2.0
"""Finds in clang's syntax tree what can be changed in a source, one change a mutant."""

import hashlib
import pathlib
import re
import typing

from clang.cindex import CursorKind, Index, TranslationUnit, TypeKind

# Each operator with what takes its place: the boundary and the opposite of a comparison, the
# counterpart of the others.
OPERATORS = {
    "<": ["<=", ">="], "<=": ["<", ">"], ">": [">=", "<="], ">=": [">", "<"],
    "==": ["!="], "!=": ["=="], "&&": ["||"], "||": ["&&"],
    "+": ["-"], "-": ["+"], "*": ["/"], "/": ["*"], "%": ["*"],
    "&": ["|"], "|": ["&"], "^": ["&"], "<<": [">>"], ">>": ["<<"],
    "+=": ["-="], "-=": ["+="], "*=": ["/="], "/=": ["*="], "|=": ["&="], "&=": ["|="],
}
# Macros' counterparts: accesses to a file, severities of a log line.
MACROS = {
    "O_RDONLY": "O_RDWR", "O_WRONLY": "O_RDWR", "O_RDWR": "O_RDONLY",
    "LOG(INFO)": "LOG(ERROR)", "LOG(ERROR)": "LOG(INFO)",
}
PREFIXES = {"!": "", "-": "", "~": "", "++": "--", "--": "++"}
# Which children of a node are statements.
STATEMENTS = {
    CursorKind.COMPOUND_STMT: slice(None), CursorKind.DEFAULT_STMT: slice(None),
    CursorKind.IF_STMT: slice(1, None), CursorKind.CASE_STMT: slice(-1, None),
    CursorKind.FOR_STMT: slice(-1, None), CursorKind.WHILE_STMT: slice(-1, None),
    CursorKind.CXX_FOR_RANGE_STMT: slice(-1, None),
}
WHOLE_NUMBERS = (TypeKind.INT, TypeKind.UINT, TypeKind.LONG, TypeKind.ULONG, TypeKind.SHORT,
                 TypeKind.USHORT, TypeKind.UCHAR)
JUMPS = (CursorKind.RETURN_STMT, CursorKind.BREAK_STMT, CursorKind.CONTINUE_STMT)
LAST_CHARACTER = re.compile(r'(\\.|[^\\"])"$')
# Values that a "{}" in their place is the same as.
DEFAULTS = re.compile(r'std::nullopt|(core::)?ok\(\)|""|\{\}')
CHANGED_AS_SUCH = (CursorKind.BINARY_OPERATOR, CursorKind.UNARY_OPERATOR,
                   CursorKind.INTEGER_LITERAL, CursorKind.CXX_BOOL_LITERAL_EXPR)


class Mutant(typing.NamedTuple):
    """The bytes from `begin` to `end` of `file` replaced."""
    file: str
    begin: int
    end: int
    replacement: str


class Finder:
    """The mutants of the files below `directory` that the parsed units include; files are named
    from `root` on."""

    def __init__(self, root, directory="."):
        self.root = pathlib.Path(root).resolve()
        self.directory = self.root / directory
        self.found = set()
        self._names = {}
        self._sources = {}
        self._macros = {}

    def parse(self, source, arguments):
        """Adds the mutants of one source and of what it includes; the arguments are a compiler's."""
        unit = Index.create().parse(str(source), args=arguments,
                                    options=TranslationUnit.PARSE_DETAILED_PROCESSING_RECORD)
        worst = max((diagnostic.severity for diagnostic in unit.diagnostics), default=0)
        if worst >= 3:
            raise ValueError(f"{source} does not compile: {unit.diagnostics[0].spelling}")
        own = [cursor for cursor in unit.cursor.get_children() if self._file(cursor)]
        for cursor in own:
            if cursor.kind == CursorKind.MACRO_INSTANTIATION:
                if self._text(cursor) in MACROS:
                    self._replace(cursor, cursor, MACROS[self._text(cursor)])
                self._macros.setdefault(self._file(cursor), set()).update(
                    range(cursor.extent.start.offset, cursor.extent.end.offset))
        for cursor in own:
            if not cursor.kind.is_preprocessing():
                self._walk(cursor)

    def source(self, file):
        """The file's bytes."""
        if file not in self._sources:
            self._sources[file] = (self.root / file).read_bytes()
        return self._sources[file]

    def _file(self, cursor):
        location = cursor.location.file
        name = location.name if location else ""
        if name not in self._names:
            path = pathlib.Path(name)
            self._names[name] = (str(path.relative_to(self.root))
                                 if self.directory in path.parents else "")
        return self._names[name]

    def _text(self, cursor):
        extent = cursor.extent
        return self.source(self._file(cursor))[extent.start.offset:extent.end.offset].decode()

    def _replace(self, first, last, replacement):
        self.found.add(Mutant(self._file(first), first.extent.start.offset, last.extent.end.offset,
                              replacement))

    def _swap(self, first, second, between):
        """Changes places with what follows, if only what `between` matches is between them."""
        if not self._file(first) or not self._file(second):
            return
        end, begin = first.extent.end.offset, second.extent.start.offset
        middle = self.source(self._file(first))[end:begin].decode()
        if first.extent.start.offset < end <= begin and re.fullmatch(between, middle) and \
                self._text(first) != self._text(second):
            self._replace(first, second, self._text(second) + middle + self._text(first))

    def _add(self, cursor, *replacements, begin=None, end=None):
        """In place of the cursor, unless given otherwise; what a macro expands to stays as it is."""
        file = self._file(cursor)
        begin = cursor.extent.start.offset if begin is None else begin
        end = cursor.extent.end.offset if end is None else end
        if begin not in self._macros.get(file, ()):
            self.found.update(Mutant(file, begin, end, text) for text in replacements
                              if text.encode() != self.source(file)[begin:end])

    def _walk(self, cursor):
        if not self._file(cursor) or cursor.kind == CursorKind.STATIC_ASSERT:
            return
        children = list(cursor.get_children())
        if cursor.kind in (CursorKind.BINARY_OPERATOR, CursorKind.COMPOUND_ASSIGNMENT_OPERATOR):
            self._binary(cursor, *children)
        elif cursor.kind == CursorKind.UNARY_OPERATOR:
            self._unary(cursor)
        elif cursor.kind == CursorKind.RETURN_STMT and children:
            self._returned(children[0])
        elif cursor.kind in (CursorKind.IF_STMT, CursorKind.CONDITIONAL_OPERATOR):
            self._condition(children)
        elif cursor.kind == CursorKind.DECL_REF_EXPR:
            self._enumerator(cursor)
        elif cursor.kind.is_expression():
            self._literal(cursor)
        if cursor.kind == CursorKind.CALL_EXPR and cursor.spelling not in ("min", "max"):
            self._values(list(cursor.get_arguments()))
        elif cursor.kind == CursorKind.INIT_LIST_EXPR:
            self._values([child for child in children  # rows may mostly stand in any order
                          if child.type.get_canonical().kind != TypeKind.RECORD])
        self._statements(cursor, children[STATEMENTS.get(cursor.kind, slice(0))])
        for child in children:
            self._walk(child)

    def _binary(self, cursor, left, right):
        begin, end = left.extent.end.offset, right.extent.start.offset
        operator = self.source(self._file(cursor))[begin:end].decode()
        self._add(cursor, *(operator.replace(operator.strip(), other)
                            for other in OPERATORS.get(operator.strip(), ())),
                  begin=begin, end=end)

    def _unary(self, cursor):
        text = self._text(cursor)
        for operator, other in PREFIXES.items():
            if text.startswith(operator) and not text.startswith(operator * 2):
                self._add(cursor, other + text[len(operator):])
            elif text.endswith(operator):
                self._add(cursor, text[:-len(operator)] + other)

    def _condition(self, children):
        condition = next((child for child in children if child.kind.is_expression()), None)
        if condition and condition.kind != CursorKind.CXX_BOOL_LITERAL_EXPR:
            self._add(condition, f"!({self._text(condition)})")

    def _returned(self, value):
        kind, text = value.type.get_canonical().kind, self._text(value)
        if value.kind in CHANGED_AS_SUCH:
            return
        if kind == TypeKind.BOOL:
            self._add(value, f"!({text})")
        elif kind in WHOLE_NUMBERS:
            self._add(value, f"({text}) + 1")
        elif kind == TypeKind.POINTER:
            self._add(value, "nullptr")
        elif kind == TypeKind.RECORD and not DEFAULTS.fullmatch(text):
            self._add(value, "{}")

    def _literal(self, cursor):
        text = self._text(cursor)
        if cursor.kind in (CursorKind.INTEGER_LITERAL, CursorKind.FLOATING_LITERAL):
            self._add(cursor, f"({text} + 1)", f"({text} - 1)")
        elif cursor.kind == CursorKind.CHARACTER_LITERAL:
            self._add(cursor, f"({text} + 1)")
        elif cursor.kind == CursorKind.CXX_BOOL_LITERAL_EXPR:
            self._add(cursor, "false" if text == "true" else "true")
        elif cursor.kind == CursorKind.STRING_LITERAL and text.startswith('"'):
            self._add(cursor, f'"~" {text}', LAST_CHARACTER.sub('"', text))

    def _enumerator(self, cursor):
        """The next one of its enumeration, the first one after the last."""
        meant = cursor.referenced
        if meant is not None and meant.kind == CursorKind.ENUM_CONSTANT_DECL:
            names = [one.spelling for one in meant.semantic_parent.get_children()]
            following = names[(names.index(meant.spelling) + 1) % len(names)]
            self._add(cursor, self._text(cursor).removesuffix(meant.spelling) + following)

    def _values(self, values):
        """Neighbours of one type change places."""
        for first, second in zip(values, values[1:]):
            types = [value.type.get_canonical() for value in (first, second)]
            if {one.kind for one in types} <= set(WHOLE_NUMBERS) or \
                    len({one.spelling.replace("const ", "") for one in types}) == 1:
                self._swap(first, second, r",\s*")

    def _statements(self, parent, statements):
        """Those that are expressions are dropped, a macro's too: most are log lines; and they change
        places. Jumps are dropped, but not from the end of a function, which needs its value."""
        for statement, following in zip(statements, [*statements[1:], None]):
            plain = statement.kind.is_expression() and statement.kind != CursorKind.LAMBDA_EXPR
            if plain or statement.kind in JUMPS and (
                    following or parent.kind == CursorKind.IF_STMT):
                self._replace(statement, statement, "(void)0")
            if following and "" != self._what(statement) == self._what(following):
                self._swap(statement, following, r";\s*(//.*\s*)?")

    def _what(self, statement):
        """Whether it logs or calls something: among themselves both have an order."""
        if self._file(statement) and re.match(r"A?LOG", self._text(statement)):
            return "log"
        return "call" if statement.kind == CursorKind.CALL_EXPR and \
            not re.match("operator|va_|__builtin_va", statement.spelling) else ""


def spread(found, source):
    """The mutants by file, in the order in which they are tried, which changes elsewhere in a file
    do not change: by the hash of the change and of which of its kind in the file it is."""
    ordered, seen = {}, {}
    for mutant in sorted(found):
        change = (mutant.file, source(mutant.file)[mutant.begin:mutant.end], mutant.replacement)
        seen[change] = seen.get(change, 0) + 1
        rank = hashlib.sha256(repr((*change, seen[change])).encode()).digest()
        ordered.setdefault(mutant.file, []).append((rank, mutant))
    return {file: [mutant for _, mutant in sorted(ranked)] for file, ranked in ordered.items()}


def quotas(sizes, wanted):
    """How many of each file's mutants are tried: as many of a hundred everywhere, one at least."""
    ranks = sorted(((0 if i == 0 else (i + 0.5) / size), file)
                   for file, size in sizes.items() for i in range(size))
    chosen = [file for _, file in ranks[:wanted]]
    return {file: chosen.count(file) for file in sizes}
