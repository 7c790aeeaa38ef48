# SPDX-License-Identifier: Apache-2.0
"""The options of handset/run and handset/shell, checked before anything starts."""

import argparse
import os

import kernel_module
from failure import Failure, Parser, path
from guest_image import ARCHITECTURES, PROJECT
from machine import find_emulator

_DRIVERS = ("simulated", "kernel")
_PRESETS = {"amd64": "release", "arm64": "arm64"}
_ELF_MACHINES = {"amd64": 62, "arm64": 183}  # e_machine of <elf.h>
_ELF_MACHINE_OFFSET = 18

_MEMORY_MIB = 512
_SANITIZED_MEMORY_MIB = 2048  # shadow memory
_LEAST_MEMORY_MIB, _MOST_MEMORY_MIB = 128, 65536
_MOST_PROCESSORS = 8  # of the interrupt controller that a machine for arm64 has

# The guest has file systems of its own there, so a directory below is not seen as it is outside.
_HIDDEN = ("/dev", "/proc", "/run", "/sys")


def _positive(kind, what):
    def convert(text):
        try:
            value = kind(text)
        except ValueError:
            value = 0
        if not 0 < value < 1e9:
            raise argparse.ArgumentTypeError(f"'{text}' is not {what} above 0")
        return value
    return convert


def whole(least, most):
    """The type of an option that is a whole number."""
    def convert(text):
        if not text.isdecimal() or not least <= int(text[:9]) <= most:
            raise argparse.ArgumentTypeError(
                f"'{text}' is not a whole number from {least} to {most}")
        return int(text)
    return convert


def built_in_profiles():
    """Their names, in order."""
    directory = os.path.join(PROJECT, "handset", "profiles")
    files = os.listdir(directory) if os.path.isdir(directory) else []
    return sorted(name[:-len(".json")] for name in files
                  if name.endswith(".json") and not name.endswith(".schema.json"))


def parse(program, description, words, takes_command):
    """The options in `words`, all checked, as an object with the fields that the parser below
    names (`profile` is None for "off") and with
        command    the words after "--"
        agent      the path of handset-agent
        directory  the working directory, here and in the guest
        host_tmp   whether the guest has to see the host's /tmp
        join       of a shell: the process id given with --join, 0 for none given, None without
    With --join nothing else is checked or there.
    """
    parser = Parser(program, description)
    parser.add_argument("--arch", default="amd64", metavar="ARCH", help="amd64 (default) or arm64")
    parser.add_argument("--profile", default="leds", metavar="NAME|FILE",
                        help="what phone this is (default leds); 'off' starts no phone")
    parser.add_argument("--out", metavar="DIR", type=path,
                        help="leave journal.jsonl, service.log, kernel.log and what is written "
                             "to $OUT there")
    parser.add_argument("--timeout", metavar="SECONDS", type=_positive(float, "a number"),
                        default=300 if takes_command else None,
                        help="end the guest this long after its boot, with status 124 (default "
                             f"{'300' if takes_command else 'never'})")
    parser.add_argument("--build", metavar="DIR", type=path,
                        help="build directory with the programs (default build/release, for arm64 "
                             "build/arm64)")
    parser.add_argument("--memory", metavar="MIB", type=whole(_LEAST_MEMORY_MIB, _MOST_MEMORY_MIB),
                        help="the guest's memory (default 512, for a sanitized build 2048)")
    parser.add_argument("--smp", metavar="N", type=whole(1, _MOST_PROCESSORS), default=1,
                        help="processors (default 1)")
    parser.add_argument("--driver", metavar="WHICH", default="simulated",
                        help="simulated (default), or kernel: the nodes and the motor of the kernel "
                             "module")
    parser.add_argument("--counted", action="store_true",
                        help="let the guest's clock count instructions: 1 ns is one instruction")
    parser.add_argument("--timing", metavar="FILE", type=path,
                        help="write the seconds each phase took, as JSON")
    if takes_command:
        parser.add_argument("--picture", metavar="FILE", type=path,
                            help="draw what happened into a .svg or .png, see handset/picture")
        parser.add_argument("--trace", metavar="FILE", type=path,
                            help="write what happened as a trace, see handset/trace")
    parser.add_argument("--verbose", action="store_true", help="tell of each phase")
    command = []
    if not takes_command:
        parser.add_argument("--join", metavar="PID", nargs="?", type=_positive(int, "a process id"),
                            const=0, help="another shell in the guest that a handset/shell (of "
                            "several: the one with this process id) has booted")
    if takes_command:
        parser.usage = f"{program} [options] -- COMMAND..."
        if "--" in words:
            words, command = words[:words.index("--")], words[words.index("--") + 1:]
        if not command and not {"-h", "--help"} & set(words):
            raise Failure("no command given; put it after '--'")
    options = parser.parse_args(words)
    options.command = command
    if takes_command:
        options.join = None
    elif options.join is not None:
        if len(words) > 2 or not words[0].startswith("--join"):
            raise Failure("--join takes no other option")
        return options
    if options.driver not in _DRIVERS:
        raise Failure(f"unknown driver '{options.driver}': use {' or '.join(_DRIVERS)}")
    _check_architecture(options)
    _check_profile(options)
    _check_build(options)
    _check_directories(options)
    _check_results(options)
    if options.memory is None:
        options.memory = _SANITIZED_MEMORY_MIB if _is_sanitized(options.build) else _MEMORY_MIB
    return options


def _check_architecture(options):
    if options.arch not in ARCHITECTURES:
        raise Failure(f"unknown architecture '{options.arch}': use {' or '.join(ARCHITECTURES)}")
    find_emulator(options.arch)  # before anything is downloaded for it


def _check_directories(options):
    """What the guest has to see must not lie where it has file systems of its own."""
    try:
        options.directory = os.getcwd()
    except FileNotFoundError:
        raise Failure("the working directory does not exist any more") from None
    paths = [options.directory, options.build, options.profile or "/"]
    if options.driver == "kernel":
        paths.append(kernel_module.module_path(options.arch))
    paths += [os.path.realpath(place) for place in paths if place.startswith("/")]
    for place in paths:
        if _is_below(place, _HIDDEN):
            raise Failure(f"the guest cannot see {place}: "
                          f"it has its own {', '.join(_HIDDEN[:-1])} and {_HIDDEN[-1]}")
    options.host_tmp = any(_is_below(place, ("/tmp",)) for place in paths)


def _is_below(place, directories):
    return any(place == directory or place.startswith(directory + "/") for directory in directories)


def _check_build(options):
    preset = _PRESETS[options.arch]
    if options.build is None:
        options.build = os.path.join(PROJECT, "build", preset)
    elif os.path.dirname(os.path.realpath(options.build)) == os.path.join(PROJECT, "build"):
        preset = os.path.basename(os.path.realpath(options.build))
    options.build = os.path.abspath(options.build)
    options.how_to_build = f"build it with: cmake --preset {preset} && cmake --build --preset {preset}"
    options.agent = os.path.join(options.build, "bin", "handset-agent")
    try:
        with open(options.agent, "rb") as file:
            header = file.read(_ELF_MACHINE_OFFSET + 2)
    except OSError:
        raise Failure(f"no handset-agent in {options.build}/bin; "
                      f"{options.how_to_build}") from None
    machine = int.from_bytes(header[_ELF_MACHINE_OFFSET:], "little")
    if machine != _ELF_MACHINES[options.arch]:
        _refuse_build(options, machine)
    phone = os.path.join(options.build, "bin", "phone")
    if options.profile is not None and not os.path.exists(phone):
        raise Failure(f"no phone in {options.build}/bin; {options.how_to_build}")


def _refuse_build(options, machine):
    for arch, number in _ELF_MACHINES.items():
        if number == machine:
            raise Failure(f"{options.build} is built for {arch}, not for {options.arch}: give "
                          f"--arch {arch}, or with --build the directory of an "
                          f"{options.arch} build")
    raise Failure(f"{options.agent} is no program for {options.arch}; {options.how_to_build}")


def _check_profile(options):
    if options.profile == "off":
        options.profile = None
        return
    built_in = built_in_profiles()
    if options.profile in built_in:
        return
    if not os.path.isfile(options.profile):
        raise Failure(f"no profile '{options.profile}': use {', '.join(built_in)}, off, or a file")
    options.profile = os.path.abspath(options.profile)


def _check_results(options):
    _check_files(options)
    if options.out is not None:
        options.out = os.path.abspath(options.out)
        try:
            os.makedirs(options.out, exist_ok=True)
        except OSError as error:
            raise Failure(f"--out {options.out}: {error.strerror}") from None


def _check_files(options):
    """The files to be written, some of them by handset/run alone."""
    for name in ("timing", "picture", "trace"):
        file = getattr(options, name, None)
        if file is None:
            continue
        if not os.path.isdir(os.path.dirname(file) or "."):
            raise Failure(f"--{name} {file}: its directory does not exist")
        if os.path.isdir(file):
            raise Failure(f"--{name} {file}: a directory is there; give a file")
        if name == "picture" and not file.endswith((".svg", ".png")):
            raise Failure(f"--picture {file}: a picture's name ends in .svg or .png")


def _is_sanitized(build):
    try:
        with open(os.path.join(build, "CMakeCache.txt"), encoding="utf-8") as cache:
            return any(line.startswith("QVX_SANITIZE:") and line.rstrip()[-1] != "="
                       for line in cache)
    except OSError:
        return False
