# SPDX-License-Identifier: Apache-2.0
"""A compiler from AIDL to NDK C++.

The way of a file: `parser` turns text into the tree of `syntax`; `library` finds the files that
imports name and gives every type name its declaration; `checks`, with `names` and `annotations`,
refuses what the language or this compiler does not allow; `ndk` says what each type is in C++ and
`generate` renders the templates. `dump`, `freeze` and `compatibility` serve the frozen versions of
an interface. `command_line` is the way in.
"""
