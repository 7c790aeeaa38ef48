# SPDX-License-Identifier: Apache-2.0
"""Which annotation may stand where, and what it takes."""

from __future__ import annotations

from . import syntax
from .errors import CompileError

# No meaning in NDK C++, but other languages' compilers read the same files. Any parameters.
OTHER_LANGUAGES = {
    "Hide", "JavaDebug", "JavaDefault", "JavaDelegator", "JavaDerive", "JavaPassthrough",
    "JavaSuppressLint", "RustDerive", "SuppressWarnings", "UnsupportedAppUsage",
}

_UNSUPPORTED = {"Enforce", "JavaOnlyStableParcelable", "NdkOnlyStableParcelable",
                "RustOnlyStableParcelable", "SensitiveData", "PropagateAllowBlocking"}

# Parameters of those this compiler acts on.
_PARAMETERS = {
    "Backing": {"type"}, "Descriptor": {"value"}, "FixedSize": set(), "VintfStability": set(),
    "nullable": set(), "utf8InCpp": set(),
}

# Where these may stand, and how that is called.
_ALLOWED: dict[type, tuple[str, set[str]]] = {
    syntax.Interface: ("an interface", {"VintfStability", "Descriptor"}),
    syntax.Parcelable: ("a parcelable", {"VintfStability", "FixedSize"}),
    syntax.Union: ("a union", {"VintfStability", "FixedSize"}),
    syntax.Enum: ("an enum", {"VintfStability", "Backing"}),
    syntax.Method: ("a method", set()),
    syntax.Field: ("a field", set()),
    syntax.Constant: ("a constant", set()),
    syntax.TypeReference: ("a type in use", {"nullable", "utf8InCpp"}),
}


def check(annotated: syntax.Annotated) -> None:
    where, allowed = _ALLOWED[type(annotated)]
    seen = set()
    for each in annotated.annotations:
        if each.name in _UNSUPPORTED:
            raise CompileError(each.location, f"the annotation @{each.name} is not supported")
        if each.name not in _PARAMETERS and each.name not in OTHER_LANGUAGES:
            raise CompileError(each.location, f"unknown annotation @{each.name}")
        if each.name in seen:
            raise CompileError(each.location, f"@{each.name} is given twice")
        seen.add(each.name)
        if each.name in OTHER_LANGUAGES:
            continue
        if each.name not in allowed:
            raise CompileError(each.location, f"@{each.name} cannot stand at {where}")
        if set(each.parameters) != _PARAMETERS[each.name]:
            wanted = ", ".join(f"{name}=..." for name in sorted(_PARAMETERS[each.name]))
            raise CompileError(each.location, f"@{each.name} takes {wanted or 'no parameters'}")
