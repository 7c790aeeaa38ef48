# SPDX-License-Identifier: Apache-2.0
"""Debian packages that are downloaded and unpacked somewhere, not installed."""

import os
import shutil
import subprocess

from failure import Failure


# What only the arm64 guest needs.
_FOREIGN = ("g++-aarch64-linux-gnu", "qemu-system-arm", "qemu-user-static")


def is_missing(tool, package):
    """The failure that says where a tool comes from."""
    option = " --all" if package in _FOREIGN else ""
    return Failure(f"{tool} is not installed: scripts/install-packages{option} installs {package}")


def find_tool(tool, package):
    """The path of a program, which on Debian may lie outside a plain user's PATH."""
    path = shutil.which(tool, path=os.environ.get("PATH", "") + ":/usr/sbin:/sbin")
    if path is None:
        raise is_missing(tool, package)
    return path


def run(command, directory=None):
    """Runs a program and returns its output; a failure is reported with its last line."""
    command = [find_tool(command[0], command[0])] + command[1:]
    done = subprocess.run(command, cwd=directory, stdin=subprocess.DEVNULL, capture_output=True,
                          text=True, errors="replace", check=False)
    if done.returncode != 0:
        last = (done.stderr.strip().splitlines() or [f"exit status {done.returncode}"])[-1]
        raise Failure(f"{' '.join(command)}: {last}")
    return done.stdout


def describe(package, say):
    """What the package lists say of the newest version of a package, NAME or NAME:ARCH."""
    return _with_fresh_lists(
        lambda: run(["apt-cache", "show", "--no-all-versions", package]), say)


def unpack(package, directory, say):
    """Downloads a package and lays its files out below `directory`."""
    size = ""
    for line in describe(package, say).splitlines():
        if line.startswith("Size: "):
            size = f" ({int(line.split()[1]) / 1e6:.0f} MB)"
    say(f"downloading {package}{size}")
    # apt's own download user cannot write here; as root it needs telling.
    options = ["-o", "APT::Sandbox::User=root"] if os.geteuid() == 0 else []
    _with_fresh_lists(lambda: run(["apt-get", *options, "download", package], directory), say)
    for deb in [name for name in os.listdir(directory) if name.endswith(".deb")]:
        run(["dpkg-deb", "-x", deb, "."], directory)
        os.unlink(os.path.join(directory, deb))


def _with_fresh_lists(action, say):
    """Runs `action` again after apt-get update when it fails, where that may be run."""
    try:
        return action()
    except Failure as failure:
        if os.geteuid() != 0:
            raise Failure(f"{failure}; 'apt-get update' may help") from None
        say("updating the package lists")
        run(["apt-get", "update"])
        return action()
