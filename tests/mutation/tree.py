# SPDX-License-Identifier: Apache-2.0
"""A copy of the project with a build of the service's unit tests, in which one mutant lives at a
time."""

import json
import os
import pathlib
import re
import resource
import shlex
import shutil
import signal
import subprocess
import time

PROJECT = pathlib.Path(__file__).resolve().parent.parent.parent
SERVICE = pathlib.Path("hal-server/vibrator/aidl/default")
PROGRAMS = ("service_test", "service_entry_test")
MEMORY = 4 << 30  # bytes that a mutant's tests may map


class Tree:
    """Stands below `directory`, and is taken up again by the next run."""

    def __init__(self, directory):
        self.source = directory / "source"
        self._build = directory / "build"
        self._scratch = directory / "scratch"
        self._links = {}
        self._environment = dict(os.environ)
        self._seconds = 60.0  # that a mutant's tests may run

    def prepare(self):
        """Brings the copy up to date, builds it and sees that its tests pass; ValueError says what
        went wrong."""
        self._scratch.mkdir(parents=True, exist_ok=True)
        self._copy()
        self._run("cmake", "-S", self.source, "-B", self._build, "-G", "Ninja",
                  "-DCMAKE_BUILD_TYPE=Debug", "-DCMAKE_CXX_FLAGS_DEBUG=-O0 -w",
                  "-DCMAKE_SUPPRESS_REGENERATION=ON",
                  "-DCMAKE_C_COMPILER=clang", "-DCMAKE_CXX_COMPILER=clang++",
                  "-DCMAKE_EXE_LINKER_FLAGS=-fuse-ld=lld", "-DQVX_TEST_SUITES=service",
                  "-DQVX_COMPONENTS=platform/libbinder_ndk;platform/aidl;hal-server/vibrator/aidl",
                  f"-DCMAKE_PROJECT_INCLUDE={self.source}/tests/mutation/precompiled.cmake")
        self._run("ninja", "-j1", *PROGRAMS)
        self._environment["CCACHE_DISABLE"] = "1"  # no mutant comes a second time
        # What tests share with the service, inline in a header, is to come from the service.
        archive = next(self._build.rglob("libqvx_vibrator.a")).relative_to(self._build)
        command = self._run("ninja", "-t", "commands", "-s", f"bin/{PROGRAMS[0]}")
        self._links[PROGRAMS[0]] = re.sub(
            r"(?= \S+\.o )", f" -Wl,--whole-archive {archive} -Wl,--no-whole-archive", command,
            count=1)
        started = time.monotonic()
        for program in PROGRAMS:
            failed = self._failing_test(program)
            if failed:
                raise ValueError(f"without a change, {failed} fails")
        self._seconds = 5 + 3 * (time.monotonic() - started)

    def compile_arguments(self):
        """The compiler's arguments for each of the service's sources."""
        compiler = shutil.which("clang++")
        arguments = {}
        for entry in json.loads(self._run("ninja", "-t", "compdb")):
            file, words = pathlib.Path(entry["file"]), shlex.split(entry["command"])
            if file.is_relative_to(self.source / SERVICE) and compiler in words:
                arguments[file] = words[words.index(compiler) + 1:words.index("-MD")]
        return arguments

    def killer(self, file, changed, first):
        """The test that notices the change, one of `first` if any of those does; None when none
        does, "" when the change does not compile."""
        (self.source / file).write_bytes(changed)
        program = PROGRAMS[file.name == "main.cpp"]
        try:
            if program in self._links:
                self._run("ninja", "qvx_vibrator")
                self._run("sh", "-c", self._links[program])
            else:
                self._run("ninja", program)
        except ValueError:
            return ""
        failed = self._failing_test(program, ":".join(first)) if first else None
        failed = failed or self._failing_test(program, "-" + ":".join(first))
        if failed is None and file.suffix == ".h":
            failed = self._failing_test_built_anew(program, file)
        return failed

    def _failing_test_built_anew(self, program, file):
        """What only tests use of a header shows when they are built with it, which takes long."""
        try:
            self._run("ninja", program)
            return self._failing_test(program)
        except ValueError:
            return "the build"
        finally:
            self.restore(file)
            self._run("ninja", program)

    def restore(self, file):
        """Takes the file's mutants back."""
        shutil.copy(PROJECT / file, self.source / file)

    def _failing_test(self, program, chosen="-"):
        """The first of the chosen tests that fails; None when all pass. A mutant may do whatever it
        likes, for so long and in so much memory."""
        def limit():
            resource.setrlimit(resource.RLIMIT_CPU, (int(self._seconds), int(self._seconds)))
            resource.setrlimit(resource.RLIMIT_AS, (MEMORY, MEMORY))
            resource.setrlimit(resource.RLIMIT_FSIZE, (1 << 24, 1 << 24))
            resource.setrlimit(resource.RLIMIT_CORE, (0, 0))

        output = self._scratch / "output"
        with output.open("wb") as file, subprocess.Popen(
                [self._build / "bin" / program, "--gtest_fail_fast", f"--gtest_filter={chosen}"],
                cwd=self._scratch, stdin=subprocess.DEVNULL, stdout=file, stderr=file,
                preexec_fn=limit, start_new_session=True) as tests:
            try:
                if tests.wait(10 * self._seconds) == 0:
                    return None
            except subprocess.TimeoutExpired:
                os.killpg(tests.pid, signal.SIGKILL)
        # After a test that failed come those that are skipped; after one that crashed comes nothing.
        text = output.read_text("utf-8", "replace")
        names = (re.findall(r"\[  FAILED  \] (\S+?\.[^\s,]+)", text)[:1] or
                 re.findall(r"\[ RUN      \] (\S+)", text)[-1:])
        return names[0] if names else "the program"

    def _copy(self):
        """Only what differs, so that what was built of the rest is still good."""
        wanted = set()
        for directory, names, files in os.walk(PROJECT):
            names[:] = [name for name in names if name not in (".git", "build", "__pycache__")]
            wanted.update(pathlib.Path(directory, name).relative_to(PROJECT) for name in files)
        for name in wanted:
            copy = self.source / name
            if not copy.exists() or copy.read_bytes() != (PROJECT / name).read_bytes():
                copy.parent.mkdir(parents=True, exist_ok=True)
                shutil.copy(PROJECT / name, copy)
        for path in [path for path in self.source.rglob("*") if path.is_file()]:
            if path.relative_to(self.source) not in wanted:
                path.unlink()

    def _run(self, *command):
        """The command's output."""
        directory = None if command[0] == "cmake" else self._build
        done = subprocess.run(command, cwd=directory, env=self._environment, text=True,
                              stdin=subprocess.DEVNULL, capture_output=True, check=False)
        if done.returncode != 0:
            raise ValueError(f"{command[0]} failed\n{(done.stdout + done.stderr)[-4000:]}")
        return done.stdout
