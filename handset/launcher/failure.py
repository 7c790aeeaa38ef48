# SPDX-License-Identifier: Apache-2.0
"""The one way in which the launcher gives up."""


class Failure(Exception):
    """One clear line for the user; the launcher prints it and exits with status 2."""
