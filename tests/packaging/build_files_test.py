# SPDX-License-Identifier: Apache-2.0
"""The Android.bp files against the directories they build, and against the build that runs here."""

import pathlib
import re
import unittest

import blueprint
import project

TESTS = project.HAL / "tests"
DIRECTORIES = {name: project.ROOT / name for name in (
    "hal-server/vibrator/aidl", "hal-server/vibrator/aidl/default",
    "hal-server/vibrator/aidl/tests", "hal-server/vibrator/aidl/fuzz", "platform/aidl", "vibctl")}

# The kinds of module in use and their properties; a property that the build does not know ends it.
COMMON = {"name", "defaults", "vendor", "cpp_std", "cflags", "cppflags", "srcs", "shared_libs",
          "static_libs"}
PROPERTIES = {
    "package": {"default_applicable_licenses"},
    "cc_defaults": COMMON,
    "cc_library_static": COMMON | {"export_include_dirs"},
    "cc_binary": COMMON | {"include_dirs", "relative_install_path", "init_rc", "vintf_fragments"},
    "cc_test": COMMON | {"test_suites"},
    "cc_fuzz": COMMON | {"corpus"},
    "aidl_interface": {"name", "owner", "vendor_available", "srcs", "stability", "imports",
                       "backend", "unstable", "versions"},
}

# What the platform's own build files define.
PLATFORM_LIBRARIES = {"libbase", "liblog", "libbinder_ndk", "libgmock", "fmtlib", "libjsoncpp",
                      "libtinyxml2",
                      "android.hardware.vibrator-V2-ndk_platform"}

# Headers of the service's tests by which a test puts a kernel of its own under the service.
FAKES = re.compile(r"fake_|interposed_|service_test\.h|vibrator_test\.h|log_capture\.h")


def uses_fakes(path, seen=None):
    """Whether a test includes one of those headers, itself or through another header of the tests."""
    seen = set() if seen is None else seen
    for quote, name in project.includes(path):
        header = project.HAL / name
        if FAKES.search(name):
            return True
        if quote == '"' and header.is_file() and header not in seen:
            seen.add(header)
            if uses_fakes(header, seen):
                return True
    return False


class BuildFiles(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        cls.files = {name: blueprint.read(directory / "Android.bp")
                     for name, directory in DIRECTORIES.items()}
        cls.modules = [module for modules in cls.files.values() for module in modules]
        cls.directory_of = {module.name: DIRECTORIES[name] for name, modules in cls.files.items()
                         for module in modules if module.name}

    def joined(self, name):
        (module,) = [each for each in self.modules if each.name == name]
        return blueprint.with_defaults(module, self.modules)

    def of_kind(self, kind):
        return [self.joined(each.name) for each in self.modules if each.kind == kind]


    def generated_libraries(self):
        """The libraries that the interfaces here become, with the directory of their package."""
        packages = {}
        for interface in self.of_kind("aidl_interface"):
            (pattern,) = interface["srcs"]
            if interface["backend"]["ndk"]["enabled"]:
                # An unstable interface has one version, which its library does not name.
                for version in [f"-V{number}" for number in interface.get("versions", [])] or [""]:
                    library = f"{interface['name']}{version}-ndk_platform"
                    packages[library] = pattern.rsplit("/", 1)[0]
        return packages


class EveryModule(BuildFiles):
    def test_every_build_file_is_looked_at(self):
        found = {str(path.parent.relative_to(project.ROOT)) for directory in (
            "hal-server", "tests", "fuzz", "platform", "vibctl", "handset", "bench")
            for path in (project.ROOT / directory).rglob("Android.bp")}
        self.assertEqual(found, set(DIRECTORIES))

    def test_kinds_and_properties_are_known(self):
        for module in self.modules:
            with self.subTest(module.name):
                self.assertIn(module.kind, PROPERTIES)
                self.assertLessEqual(set(module.properties), PROPERTIES[module.kind])

    def test_names_are_given_and_unique(self):
        names = [module.name for module in self.modules if module.kind != "package"]
        self.assertNotIn(None, names)
        self.assertEqual(len(names), len(set(names)))

    def test_every_file_states_its_licence(self):
        for name, modules in self.files.items():
            with self.subTest(name):
                self.assertEqual(modules[0].kind, "package")
                self.assertEqual(modules[0].properties,
                                 {"default_applicable_licenses": ["Android-Apache-2.0"]})
        self.assertIn("Apache License", project.text(project.ROOT / "LICENSE"))

    def test_sources_exist(self):
        for module in self.modules:
            directory = self.directory_of.get(module.name)
            for key in ("srcs", "init_rc", "vintf_fragments", "corpus"):
                for pattern in module.properties.get(key, []):
                    with self.subTest(f"{module.name}: {pattern}"):
                        self.assertTrue(list(directory.glob(pattern)))

    def test_libraries_exist(self):
        generated = set(self.generated_libraries())
        built = {module.name for module in self.modules if module.kind == "cc_library_static"}
        for module in self.modules:
            with self.subTest(module.name):
                self.assertLessEqual(set(module.properties.get("static_libs", [])),
                                     built | PLATFORM_LIBRARIES)
                self.assertLessEqual(set(module.properties.get("shared_libs", [])),
                                     generated | PLATFORM_LIBRARIES)


class Service(BuildFiles):
    def setUp(self):
        self.program = self.joined(project.PROGRAM)
        self.library = self.joined("libqvx_vibrator")

    def test_program_is_where_its_init_script_starts_it(self):
        self.assertIs(self.program["vendor"], True)
        self.assertEqual(self.program["relative_install_path"], "hw")
        self.assertEqual(self.program["init_rc"], [f"{project.PROGRAM}.rc"])

    def test_every_fragment_is_installed(self):
        # The handset installs every .xml file beside the service; so must the phone.
        self.assertEqual(project.service_names(".xml"),
                         self.program["vintf_fragments"])

    def test_sources_are_all_there_is(self):
        sources = project.service_names(".cpp")
        self.assertEqual(self.program["srcs"], ["main.cpp"])
        self.assertEqual(self.program["static_libs"], ["libqvx_vibrator"])
        self.assertEqual(sorted(self.library["srcs"] + ["main.cpp"]), sorted(sources))

    def test_sources_are_those_of_the_build_here(self):
        words = project.cmake_words(project.SERVICE / "CMakeLists.txt", "add_library(qvx_vibrator ")
        self.assertEqual(self.library["srcs"], words[1:])

    def test_libraries_are_those_of_the_code(self):
        self.assertEqual(self.program["shared_libs"], [
            f"{project.STANDARD_PACKAGE}-V{project.standard_version()}-ndk_platform", "libbase",
            "libbinder_ndk", "liblog",
            f"{project.EXTENSION_PACKAGE}-V{project.extension_version()}-ndk_platform"])

    def test_language_is_that_of_the_build_here(self):
        self.assertEqual(self.library["cpp_std"], "c++17")
        self.assertIn("CXX_STANDARD 17", project.text(project.SERVICE / "CMakeLists.txt"))

    def test_exceptions_are_on_while_the_code_catches_any(self):
        catches = any(re.search(r"\bcatch \(", project.code(path))
                      for path in project.service_files(".cpp", ".h"))
        self.assertEqual("-fexceptions" in self.library["cppflags"], catches)

    def test_warnings_are_errors(self):
        self.assertEqual(self.library["cflags"], ["-Wall", "-Wextra", "-Werror"])


class Client(BuildFiles):
    def setUp(self):
        self.program = self.joined("vibctl")

    def test_sources_are_those_of_the_build_here(self):
        build = DIRECTORIES["vibctl"] / "CMakeLists.txt"
        words = (project.cmake_words(build, "add_library(vibctl_core ")[1:] +
                 project.cmake_words(build, "add_executable(vibctl "))
        self.assertEqual(self.program["srcs"], sorted(words))

    def test_includes_nothing_that_the_tree_lacks(self):
        libraries = r"(aidl|android|android-base|fmt|json)/|(log/log|tinyxml2)\.h$"
        for name in self.program["srcs"]:
            for quote, header in project.includes(DIRECTORIES["vibctl"] / name):
                with self.subTest(f"{name}: {header}"):
                    if quote == '"':
                        self.assertTrue(header.startswith("vibctl/"))
                    elif "/" in header or header == "tinyxml2.h":
                        self.assertRegex(header, rf"^(sys/|linux/|{libraries})")

    def test_interfaces_that_it_includes_come_from_its_libraries(self):
        packages = {"android.hardware.vibrator-V2-ndk_platform": "android/hardware/vibrator",
                    **self.generated_libraries()}
        linked = {packages.get(library) for library in self.program["shared_libs"]}
        included = {header.removeprefix("aidl/").rsplit("/", 1)[0]
                    for path in DIRECTORIES["vibctl"].rglob("*")
                    if path.suffix in (".cpp", ".h") and "tests" not in path.parts
                    for _, header in project.includes(path) if header.startswith("aidl/")}
        self.assertEqual(included, linked - {None})

    def test_version_is_that_of_the_build_here(self):
        version = project.cmake_words(project.ROOT / "CMakeLists.txt", "project(qvx-vibrator ")[1]
        self.assertIn(f"-DVIBCTL_VERSION={version}", self.program["cflags"])


class Interface(BuildFiles):
    def setUp(self):
        self.interface = self.joined(project.EXTENSION_PACKAGE)
        self.files_of_package = project.aidl_files(project.HAL, project.EXTENSION_PACKAGE)

    def test_every_file_belongs_to_it(self):
        (pattern,) = self.interface["srcs"]
        self.assertEqual(sorted(project.HAL.glob(pattern)), self.files_of_package)
        self.assertGreater(len(self.files_of_package), 1)
        for path in self.files_of_package:
            with self.subTest(path.name):
                self.assertRegex(project.code(path),
                                 rf"(?m)^package {re.escape(project.EXTENSION_PACKAGE)};$")

    def test_stability_is_that_of_its_types(self):
        self.assertEqual(self.interface["stability"], "vintf")
        for path in self.files_of_package:
            with self.subTest(path.name):
                self.assertIn("@VintfStability", project.code(path))

    def test_imports_are_those_of_its_types(self):
        used = set().union(*map(project.aidl_imports, self.files_of_package))
        self.assertEqual(used - {project.EXTENSION_PACKAGE}, {project.STANDARD_PACKAGE})
        self.assertEqual(self.interface["imports"],
                         [f"{project.STANDARD_PACKAGE}-V{project.standard_version()}"])

    def test_versions_are_what_was_frozen(self):
        frozen = sorted((path.name for path in project.FROZEN.iterdir() if path.name != "current"),
                        key=int)
        self.assertEqual(self.interface["versions"], frozen)
        self.assertEqual(frozen[-1], str(project.extension_version()))

    def test_service_can_use_it(self):
        self.assertIs(self.interface["vendor_available"], True)
        self.assertIs(self.interface["backend"]["ndk"]["enabled"], True)


class TestsAndFuzzers(BuildFiles):
    def test_unit_tests_need_no_kernel_of_their_own(self):
        (tests,) = self.of_kind("cc_test")
        for name in tests["srcs"]:
            with self.subTest(name):
                self.assertFalse(uses_fakes(TESTS / name))

    def test_a_fake_is_recognised(self):
        self.assertTrue(uses_fakes(TESTS / "probing_test.cpp"))

    def test_every_fuzzer_of_the_service_is_built(self):
        headers = set(project.service_names(".h"))
        fuzzers = {path.name for path in (project.HAL / "fuzz").glob("*_fuzzer.cpp")
                   if headers & {name for _, name in project.includes(path)}}
        self.assertIn("composite_fuzzer.cpp", fuzzers)
        self.assertEqual({source for each in self.of_kind("cc_fuzz") for source in each["srcs"]},
                         fuzzers)

    def test_fuzzers_start_from_their_corpus(self):
        for fuzzer in self.of_kind("cc_fuzz"):
            with self.subTest(fuzzer["name"]):
                stem = pathlib.Path(fuzzer["srcs"][0]).stem.removesuffix("_fuzzer")
                self.assertEqual(fuzzer["corpus"], [f"{stem}_corpus/*"])


if __name__ == "__main__":
    unittest.main()
