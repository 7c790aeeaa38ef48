# SPDX-License-Identifier: Apache-2.0
"""Reads Android.bp files."""

import dataclasses

import lark

import project

_GRAMMAR = r"""
start: (assignment | module)*
assignment: NAME ("=" | "+=") expression
module: NAME "{" (property ("," property)*)? ","? "}"
property: NAME ":" expression
?expression: value ("+" value)*
?value: STRING -> string
      | INT -> integer
      | "true" -> true
      | "false" -> false
      | "[" (expression ("," expression)*)? ","? "]" -> list
      | "{" (property ("," property)*)? ","? "}" -> map
NAME: /(?!(true|false)\b)[A-Za-z_]\w*/
INT: /-?[0-9]+/
STRING: /"(\\.|[^"\\\n])*"/
COMMENT: /\/\/[^\n]*/ | /\/\*(.|\n)*?\*\//
%import common.WS
%ignore WS
%ignore COMMENT
"""


@dataclasses.dataclass
class Module:
    kind: str
    properties: dict

    @property
    def name(self):
        return self.properties.get("name")


class _Reader(lark.Transformer):
    def start(self, items):
        return [item for item in items if isinstance(item, Module)]

    def assignment(self, items):
        raise ValueError(f"line {items[0].line}: variables are not read here")

    def module(self, items):
        return Module(str(items[0]), self.map(items[1:]))

    def property(self, items):
        return str(items[0]), items[1]

    def map(self, items):
        properties = dict(items)
        if len(properties) != len(items):
            raise ValueError(f"a property is given twice among {[name for name, _ in items]}")
        return properties

    def expression(self, items):
        raise ValueError("sums are not read here")

    def string(self, items):
        return str(items[0])[1:-1]

    def integer(self, items):
        return int(items[0])

    def true(self, _):
        return True

    def false(self, _):
        return False

    list = list


_PARSER = lark.Lark(_GRAMMAR, parser="lalr", transformer=_Reader())


def parse(text):
    """The modules of a file. Raises lark.LarkError or ValueError when it is no such file."""
    return _PARSER.parse(text)


def read(path):
    return parse(project.text(path))


def with_defaults(module, modules):
    """The module's properties and those of its defaults, as the build joins them: lists are added,
    other values are the module's own where it has one."""
    named = {each.name: each for each in modules}
    joined = {}
    for name in module.properties.get("defaults", []):
        _join(joined, with_defaults(named[name], modules))
    _join(joined, module.properties)
    return joined


def _join(into, properties):
    for name, value in properties.items():
        if isinstance(value, list) and name in into:
            into[name] = into[name] + value
        else:
            into[name] = value
