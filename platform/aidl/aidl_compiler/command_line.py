# SPDX-License-Identifier: Apache-2.0
"""The command line: what is asked for, and what a complaint looks like.

Exit status: 0 done, 1 an input file is wrong, 2 the command is. Nothing is written unless every
file is right.
"""

from __future__ import annotations

import argparse
import pathlib
import re
import sys

from . import checks, compatibility, dump, freeze, syntax
from .errors import CompileError, UsageError
from .library import Library

_DESCRIPTION = "Compiles AIDL to NDK C++ and keeps frozen versions of interfaces."
_USAGE = """
  aidl --lang=ndk --structured [--version N [--hash TEXT]] [--stability vintf]
       --out-headers DIR --out-sources DIR [--include DIR]... FILE...
                                    C++ for these types
  aidl --dumpapi DIR [--include DIR]... FILE...
                                    the normalised form that is frozen, below DIR
  aidl --hash DIR PREVIOUS          the hash of the frozen version in DIR; PREVIOUS is the number of
                                    the version before it, or latest-version
  aidl --checkapi [--include DIR]... OLD NEW
                                    whether the version in NEW may follow the one in OLD"""


class _Parser(argparse.ArgumentParser):
    def error(self, message: str) -> None:
        raise UsageError(message)


def _parser() -> _Parser:
    parser = _Parser(prog="aidl", description=_DESCRIPTION, usage=_USAGE, allow_abbrev=False)
    parser.add_argument("--lang", metavar="LANGUAGE", help="ndk is the only one")
    parser.add_argument("--structured", action="store_true",
                        help="accepted: every interface here is")
    parser.add_argument("--version", metavar="N", help="the version the code reports")
    parser.add_argument("--hash", metavar="TEXT",
                        help="the hash the code reports, or the directory to compute one of")
    parser.add_argument("--stability", metavar="vintf",
                        help="the files declare vintf-stable types only")
    parser.add_argument("--out-headers", metavar="DIR", help="include directory to write headers to")
    parser.add_argument("--out-sources", metavar="DIR", help="directory to write sources to")
    parser.add_argument("--include", metavar="DIR", action="append", default=[],
                        help="where the package path of imported types starts")
    parser.add_argument("--dumpapi", metavar="DIR", help="directory to write normalised files to")
    parser.add_argument("--checkapi", action="store_true", help="compare two versions")
    parser.add_argument("operands", metavar="FILE", nargs="*")
    return parser


def main(arguments: list[str]) -> int:
    try:
        _run(_parser().parse_args(arguments))
    except UsageError as error:
        print(f"aidl: {error}", file=sys.stderr)
        return 2
    except CompileError as error:
        print(error, file=sys.stderr)
        return 1
    except OSError as error:
        print(f"aidl: {error.filename}: {error.strerror}", file=sys.stderr)
        return 1
    return 0


def _run(options: argparse.Namespace) -> None:
    wanted = [options.lang is not None, options.dumpapi is not None, options.checkapi]
    if sum(wanted) > 1:
        raise UsageError("--lang, --dumpapi and --checkapi exclude one another")
    if options.lang is not None:
        _generate(options)
    elif options.dumpapi is not None:
        _dump(options)
    elif options.checkapi:
        _check_compatibility(options)
    elif options.hash is not None:
        _print_hash(options)
    else:
        raise UsageError("nothing to do: give --lang=ndk, --dumpapi, --checkapi or --hash")


def _generate(options: argparse.Namespace) -> None:
    from . import generate  # brings the template engine, which only this needs

    if options.lang != "ndk":
        raise UsageError(f"--lang={options.lang}: only ndk is supported")
    if options.stability not in (None, "vintf"):
        raise UsageError(f"--stability {options.stability}: only vintf is supported")
    for option in ("out_headers", "out_sources"):
        if getattr(options, option) is None:
            raise UsageError(f"--{option.replace('_', '-')} DIR is missing")
    if options.hash is not None and options.version is None:
        raise UsageError("--hash needs --version")
    if options.hash is not None and not re.fullmatch("[0-9A-Za-z]+", options.hash):
        raise UsageError(f"--hash {options.hash}: letters and digits are expected")
    version = None if options.version is None else _version(options.version)

    library, documents = _load(options)
    for document in documents:
        checks.check_stability_option(document, options.stability == "vintf")
    generator = generate.Generator(library, generate.Options(version, options.hash))
    outputs: dict[str, generate.Output] = {}
    for document in documents:
        for output in generator.outputs(document):
            if output.path in outputs:
                raise CompileError(document.declaration.location,
                                   f"'{document.declaration.name}' and another type of this run "
                                   f"both make {output.path}")
            outputs[output.path] = output
    for output in outputs.values():
        directory = options.out_headers if output.is_header else options.out_sources
        _write(pathlib.Path(directory) / output.path, output.text)


def _dump(options: argparse.Namespace) -> None:
    library, documents = _load(options)
    outputs = [(dump.path(each), dump.text(each, library)) for each in documents]
    for path, text in outputs:
        _write(pathlib.Path(options.dumpapi) / path, text)


def _check_compatibility(options: argparse.Namespace) -> None:
    if len(options.operands) != 2:
        raise UsageError("--checkapi takes two directories: the older version and the newer one")
    versions = []
    for directory in options.operands:
        if not pathlib.Path(directory).is_dir():
            raise UsageError(f"--checkapi {directory}: no such directory")
        files = sorted(map(str, pathlib.Path(directory).rglob("*.aidl")))
        if not files:
            raise UsageError(f"--checkapi {directory}: there is no .aidl file in it")
        library, documents = _load_files(files, [directory, *options.include])
        versions += [{each.declaration.qualified_name: each for each in documents}, library]
    compatibility.check(*versions)


def _print_hash(options: argparse.Namespace) -> None:
    if len(options.operands) != 1:
        raise UsageError("--hash takes a directory and the number of the version before it")
    print(freeze.version_hash(options.hash, options.operands[0]))


def _load(options: argparse.Namespace) -> tuple[Library, list[syntax.Document]]:
    if not options.operands:
        raise UsageError("no input files")
    return _load_files(options.operands, options.include)


def _load_files(files: list[str],
                include_directories: list[str]) -> tuple[Library, list[syntax.Document]]:
    library = Library(include_directories)
    documents = library.load(files)
    for document in documents:
        checks.check(document, library)
    return library, documents


def _version(text: str) -> int:
    if not text.isascii() or not text.isdigit() or not 1 <= int(text[:11]) <= 2**31 - 1:
        raise UsageError(f"--version {text}: a number from 1 is expected")
    return int(text)


def _write(path: pathlib.Path, text: str) -> None:
    """Leaves a file that is right already alone, so that nothing is built again for it."""
    data = text.encode("utf-8")
    if path.is_file() and path.read_bytes() == data:
        return
    path.parent.mkdir(parents=True, exist_ok=True)
    path.write_bytes(data)
