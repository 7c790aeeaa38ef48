# SPDX-License-Identifier: Apache-2.0
"""Where the files of the project are, and what its C++, CMake and .aidl files say."""

import pathlib
import re

ROOT = pathlib.Path(__file__).resolve().parents[2]
HAL = ROOT / "hal-server/vibrator/aidl"
SERVICE = HAL / "default"
POLICY = HAL / "sepolicy"
STANDARD_AIDL = ROOT / "platform/aidl"
STANDARD_PACKAGE = "android.hardware.vibrator"
EXTENSION_PACKAGE = "vendor.quorvan.hardware.vibrator"
FROZEN = HAL / "aidl_api" / EXTENSION_PACKAGE
PROGRAM = "android.hardware.vibrator-service.quorvan"

_COMMENT = re.compile(r'("(?:\\.|[^"\\])*")|//[^\n]*|/\*.*?\*/', re.DOTALL)
_STRING = re.compile(r'"((?:\\.|[^"\\])*)"')
_INCLUDE = re.compile(r'^\s*#\s*include\s*([<"])([^>"]+)[>"]', re.MULTILINE)


def text(path):
    return pathlib.Path(path).read_text(encoding="utf-8")


def code(path):
    """A C++ or .aidl file without its comments."""
    return _COMMENT.sub(lambda match: match[1] or " ", text(path))


def service_files(*suffixes):
    return sorted(path for path in SERVICE.rglob("*") if path.suffix in suffixes)


def service_names(*suffixes):
    """The same by their paths below the service's directory, as its sources include them."""
    return [str(path.relative_to(SERVICE)) for path in service_files(*suffixes)]


def string_literals(path):
    without_includes = _INCLUDE.sub("", code(path))
    return _STRING.findall(re.sub(r'"\s*"', "", without_includes))


def includes(path):
    """What a C++ file includes, as (quote, name): ("<", "string") or ('"', "HwApi.h")."""
    return _INCLUDE.findall(code(path))


def cmake_words(path, command):
    """The words of the first call of a CMake command that begins with `command`."""
    match = re.search(re.escape(command) + r"([^)]*)\)", text(path))
    return match[1].split()


def aidl_files(root, package):
    return sorted((root / package.replace(".", "/")).glob("*.aidl"))


def aidl_imports(path):
    """The packages that an .aidl file takes types from."""
    return set(re.findall(r"^\s*import\s+([\w.]+)\.\w+\s*;", code(path), re.MULTILINE))


def standard_version():
    words = cmake_words(STANDARD_AIDL / "CMakeLists.txt",
                        f"aidl_interface_library({STANDARD_PACKAGE}-V")
    return int(words[words.index("VERSION") + 1])


def extension_version():
    return int(cmake_words(HAL / "CMakeLists.txt", "set(version ")[0])
