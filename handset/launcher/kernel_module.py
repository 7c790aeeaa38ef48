# SPDX-License-Identifier: Apache-2.0
"""Builds handset/kernel for the very kernel a guest boots.

The result lies in the project's untracked build/kernel/ARCH/:

    qvx_vibrator.ko   the module
    stamp             what it was made from

The kernel's headers and build tools are Debian's, downloaded and unpacked, not installed, in
build/kernel/ARCH.headers/, so that a change of the module costs no download.
"""

import hashlib
import os
import shutil
import subprocess
import tempfile

import debian_packages
import guest_image
import artifact_directory
from failure import Failure

SOURCES = os.path.join(guest_image.PROJECT, "handset", "kernel")
MODULE = "qvx_vibrator.ko"

_PREFIXES = {"amd64": "", "arm64": "aarch64-linux-gnu-"}  # of the compiler and its tools
_COMPILER_PACKAGES = {"amd64": "g++", "arm64": "g++-aarch64-linux-gnu"}

# What make is told beside the directories; the headers name the compiler they want themselves.
_VARIABLES = {
    "amd64": [],
    "arm64": ["ARCH=arm64", "CROSS_COMPILE=aarch64-linux-gnu-", "DEB_BUILD_ARCH=amd64",
              "DEB_HOST_ARCH=arm64", "DEB_HOST_GNU_TYPE=aarch64-linux-gnu"],
}


def module_path(arch):
    """Where the module for guests of `arch` is put."""
    return os.path.join(_directory(arch), MODULE)


def build(arch, say):
    """Makes module_path(arch) unless it is up to date. `say` is called with lines of progress."""
    guest_image.prepare(arch, say)
    release = guest_image.kernel_release(arch)
    wanted = _stamp(release)
    directory = _directory(arch)
    with artifact_directory.lock(directory + ".lock", f"the {arch} kernel module", say):
        if artifact_directory.read_stamp(directory) == wanted:
            return
        headers = directory + ".headers"
        if artifact_directory.read_stamp(headers) != release:
            with artifact_directory.replacing(headers) as scratch:
                _fetch_headers(arch, release, scratch, say)
                artifact_directory.write_stamp(scratch, release)
        with artifact_directory.replacing(directory) as scratch:
            say(f"building {MODULE} for {release}")
            _make(arch, headers, release, scratch)
            artifact_directory.write_stamp(scratch, wanted)
        say(f"the {arch} kernel module is ready")


def _directory(arch):
    return os.path.join(guest_image.PROJECT, "build", "kernel", arch)


def _source_files():
    return sorted(name for name in os.listdir(SOURCES)
                  if name == "Kbuild" or name.endswith((".c", ".h")))


def _stamp(release):
    digest = hashlib.sha256(release.encode())
    paths = [os.path.join(SOURCES, name) for name in _source_files()]
    for path in [*paths, os.path.realpath(__file__)]:
        with open(path, "rb") as source:
            digest.update(os.path.basename(path).encode() + b"\0" + source.read())
    return digest.hexdigest()


def _fetch_headers(arch, release, target, say):
    """Lays out what a module of that kernel is built with, below target/usr."""
    version = release.split("-")[0].rsplit(".", 1)[0]  # 6.1 of 6.1.0-13-amd64
    common = f"linux-headers-{release.rsplit('-', 1)[0]}-common"
    try:
        for package in (f"linux-headers-{release}:{arch}", common, f"linux-kbuild-{version}"):
            debian_packages.unpack(package, target, say)
    except Failure as failure:
        raise Failure(f"{failure}; when Debian has replaced the kernel {release}, remove "
                      f"{guest_image.image_directory(arch)}.parts to fetch its successor") from None
    # The packages expect to be installed.
    makefile = os.path.join(target, "usr", "src", f"linux-headers-{release}", "Makefile")
    with open(makefile, "w", encoding="ascii") as file:
        file.write(f"include $(dir $(lastword $(MAKEFILE_LIST)))/../{common}/Makefile\n")


def _make(arch, headers, release, target):
    """Compiles copies of sources and headers in a directory whose name make takes for one word,
    which the project's need not be; nothing is left beside the sources."""
    debian_packages.find_tool("make", "make")
    debian_packages.find_tool(_PREFIXES[arch] + "gcc-12", _COMPILER_PACKAGES[arch])
    with tempfile.TemporaryDirectory(prefix="handset-module.", dir="/var/tmp") as scratch:
        shutil.copytree(os.path.join(headers, "usr"), os.path.join(scratch, "usr"), symlinks=True)
        source = os.path.join(scratch, "source")
        os.mkdir(source)
        for name in _source_files():
            shutil.copy(os.path.join(SOURCES, name), source)
        done = subprocess.run(
            ["make", "--silent", "-C", f"{scratch}/usr/src/linux-headers-{release}", f"M={source}",
             *_VARIABLES[arch], "modules"],
            stdin=subprocess.DEVNULL, capture_output=True, text=True, errors="replace", check=False)
        if done.returncode != 0:
            complaints = [line for line in done.stderr.splitlines() if "error" in line.lower()]
            raise Failure("the kernel module does not build:",
                          "".join(f"\n  {line}" for line in complaints[:10]))
        # What a debugger wants is most of the file, which the guest reads through an export.
        debian_packages.run([_PREFIXES[arch] + "strip", "--strip-debug", MODULE], source)
        shutil.move(os.path.join(source, MODULE), target)
