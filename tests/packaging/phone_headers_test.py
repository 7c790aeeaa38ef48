# SPDX-License-Identifier: Apache-2.0
"""The service includes only what a phone has, and compiles for a phone's processor with nothing
else within reach: clang, the C++ library of a phone, the binder and logging headers. The directories
with the generated headers of both interfaces come in QVX_GENERATED_HEADERS, separated by ":"."""

import concurrent.futures
import os
import pathlib
import subprocess
import tempfile
import unittest

import project

C_LIBRARY = pathlib.Path("/usr/aarch64-linux-gnu/include")  # with the kernel's headers
CXX_LIBRARY = pathlib.Path("/usr/lib/llvm-14/include/c++/v1")
BINDER = project.ROOT / "platform/libbinder_ndk/include"
LOGGING = pathlib.Path("/usr/include/android")

# The binder headers that the phone's vendor code may use, the logging headers, the system's.
PLATFORM_HEADERS = {
    "android-base/file.h", "android-base/logging.h", "android-base/unique_fd.h", "log/log.h",
    "android/binder_auto_utils.h", "android/binder_ibinder.h", "android/binder_manager.h",
    "android/binder_process.h", "android/binder_status.h",
}
SYSTEM_HEADERS = {"fcntl.h", "linux/input.h", "sys/ioctl.h", "sys/types.h", "unistd.h"}

# The C++ library's headers that the service uses; none that its language version lacks.
CXX_HEADERS = set("""
    algorithm array cerrno charconv chrono cinttypes climits cstdarg cstddef cstdint cstdio cstdlib cstring
    fstream functional ios iterator limits map memory optional ostream set sstream string string_view
    system_error thread utility vector""".split())


class Includes(unittest.TestCase):
    def test_are_on_the_list_of_what_a_phone_has(self):
        allowed = PLATFORM_HEADERS | SYSTEM_HEADERS | CXX_HEADERS
        own = set(project.service_names(".h"))
        for path in project.service_files(".cpp", ".h"):
            for quote, name in project.includes(path):
                with self.subTest(f"{path.name}: {name}"):
                    if quote == '"':
                        self.assertIn(name, own)
                    elif name.startswith("aidl/"):
                        self.assertRegex(name, r"^aidl/(android|vendor/quorvan)/hardware/vibrator/"
                                               r"\w+\.h$")
                    else:
                        self.assertIn(name, allowed)

    def test_list_names_headers_that_are_there(self):
        for name in PLATFORM_HEADERS:
            self.assertTrue((BINDER / name).is_file() or (LOGGING / name).is_file(), name)
        for name in SYSTEM_HEADERS:
            self.assertTrue((C_LIBRARY / name).is_file(), name)
        for name in CXX_HEADERS:
            self.assertTrue((CXX_LIBRARY / name).is_file(), name)


class Compiling(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        directory = tempfile.TemporaryDirectory()
        cls.addClassCleanup(directory.cleanup)
        # The logging headers alone: beside them Debian keeps headers that a phone lacks.
        logging = pathlib.Path(directory.name)
        (logging / "android").mkdir()
        for name in ("android-base", "log", "android/log.h"):
            (logging / name).symlink_to(LOGGING / name)
        resources = subprocess.run(["clang++", "-print-resource-dir"], capture_output=True,
                                   text=True, check=True).stdout.strip()
        system = [CXX_LIBRARY, f"{resources}/include", C_LIBRARY, logging]
        generated = os.environ["QVX_GENERATED_HEADERS"].split(":")
        cls.command = [
            "clang++", "--target=aarch64-linux-gnu", "-std=c++17", "-fexceptions", "-fsyntax-only",
            "-Wall", "-Wextra", "-Werror", "-D__ANDROID_API__=31", "-D__ANDROID_VENDOR__",
            "-nostdinc", "-nostdinc++", *(f"-isystem{each}" for each in system),
            f"-I{project.SERVICE}", f"-I{BINDER}", *(f"-I{each}" for each in generated)]

    def compile(self, *files, text=None):
        """What clang says; empty when it is content."""
        done = subprocess.run([*self.command, *map(str, files)], input=text, capture_output=True,
                              text=True, check=False)
        return done.stderr if done.returncode != 0 else ""

    def test_every_source_compiles_with_a_phones_headers(self):
        sources = project.service_files(".cpp")
        self.assertGreater(len(sources), 20)
        with concurrent.futures.ThreadPoolExecutor(os.cpu_count()) as pool:
            for path, complaint in zip(sources, pool.map(self.compile, sources)):
                with self.subTest(path.name):
                    self.assertEqual(complaint, "")

    def test_other_headers_are_out_of_reach(self):
        for name in ("gtest/gtest.h", "CLI/CLI.hpp", "binder_context_manager.h", "kernel.h",
                     "fmt/format.h", "nlohmann/json.hpp"):
            with self.subTest(name):
                self.assertIn("file not found",
                              self.compile("-xc++", "-", text=f"#include <{name}>\n"))
        self.assertEqual(self.compile("-xc++", "-", text="#include <android-base/logging.h>\n"), "")

    def test_headers_bring_what_a_phones_bring(self):
        for name, use in (("binder_to_string.h", "std::stringstream stream;"),
                          ("binder_auto_utils.h", "void f(int i) { assert(i); }"),
                          ("binder_interface_utils.h", "void f(int i) { assert(i); }")):
            with self.subTest(name):
                self.assertEqual(self.compile("-xc++", "-",
                                              text=f"#include <android/{name}>\n{use}\n"), "")

    def test_lists_that_a_phones_headers_cannot_carry_do_not_compile(self):
        text = ("#include <android/binder_parcel_utils.h>\n"
                "enum class Number : int32_t {{ ONE }};\n"
                "void f(AParcel* parcel, std::vector<{}> list) {{ ndk::{}; }}\n")
        for call in ("AParcel_writeVector(parcel, list)", "AParcel_readVector(parcel, &list)"):
            self.assertEqual(self.compile("-xc++", "-", text=text.format("int32_t", call)), "")
            for element in ("int8_t", "Number"):
                with self.subTest(f"{call} of {element}"):
                    self.assertNotEqual(
                        self.compile("-xc++", "-", text=text.format(element, call)), "")

    def test_generated_code_compiles_with_a_phones_headers(self):
        sources = [path for directory in os.environ["QVX_GENERATED_HEADERS"].split(":")
                   for path in (pathlib.Path(directory).parent / "src").rglob("*.cpp")]
        self.assertGreater(len(sources), 20)
        with concurrent.futures.ThreadPoolExecutor(os.cpu_count()) as pool:
            for path, complaint in zip(sources, pool.map(self.compile, sources)):
                with self.subTest(path.name):
                    self.assertEqual(complaint, "")


if __name__ == "__main__":
    unittest.main()
