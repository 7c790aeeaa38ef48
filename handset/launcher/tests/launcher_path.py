# SPDX-License-Identifier: Apache-2.0
"""Where the tests find the launcher; importing this puts its modules within reach."""

import os
import sys

PROJECT = os.path.dirname(os.path.dirname(os.path.dirname(os.path.dirname(
    os.path.realpath(__file__)))))
RUN = os.path.join(PROJECT, "handset", "run")
SHELL = os.path.join(PROJECT, "handset", "shell")
PREPARE_GUEST = os.path.join(PROJECT, "handset", "launcher", "prepare-guest")
BUILD_MODULE = os.path.join(PROJECT, "handset", "kernel", "build-module")

sys.path.insert(0, os.path.join(PROJECT, "handset", "launcher"))
