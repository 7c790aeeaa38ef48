# SPDX-License-Identifier: Apache-2.0
"""Lets a test import what it tests."""

import pathlib
import sys

VIEW = pathlib.Path(__file__).resolve().parent.parent
HANDSET = VIEW.parent
sys.path.insert(0, str(VIEW))
