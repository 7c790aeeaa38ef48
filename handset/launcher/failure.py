# SPDX-License-Identifier: Apache-2.0
"""The one way in which the handset's commands give up, and the options that lead to it."""

import argparse


def one_line(text):
    """The text with what is not printed written as an escape: a word of the user's may hold
    anything."""
    return "".join(c if c.isprintable() else c.encode("unicode_escape").decode("ascii")
                   for c in text)


class Failure(Exception):
    """One clear line for the user; the command prints it and exits with status 2. `details` are
    lines that follow it as they stand."""

    def __init__(self, text, details=""):
        super().__init__(one_line(text) + details)


class Parser(argparse.ArgumentParser):
    """Takes options as they are spelled, and refuses others with a Failure that names those."""

    def __init__(self, program, description):
        self._accepted = []
        super().__init__(prog=program, description=description, allow_abbrev=False)

    def add_argument(self, *names, **settings):
        self._accepted.append(names[-1] if names[-1].startswith("-") else settings["metavar"])
        return super().add_argument(*names, **settings)

    def error(self, message):
        if message.startswith("unrecognized arguments: "):
            message += f"; accepted: {', '.join(sorted(self._accepted))}"
        raise Failure(message)


def path(word):
    """The type of an option that is a path: an empty one would be the working directory."""
    if not word:
        raise argparse.ArgumentTypeError("'' is no path")
    return word
