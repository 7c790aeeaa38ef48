# SPDX-License-Identifier: Apache-2.0
"""The SELinux policy: that it compiles, what it grants, and that every path in the code has a label
through which the service reaches it as it needs to."""

import pathlib
import re
import tempfile
import unittest

import project
import security_policy

DOMAIN = "hal_vibrator_quorvan"
PROGRAM = "hal_vibrator_quorvan_exec"

ENTER = {"search"}
READ = {"open", "read"}
READ_WRITE = {"open", "read", "write"}
# The C library asks for the attributes of what it opens as a stream.
STREAM = {"open", "read", "write", "getattr"}

# Everything that the policy grants to the service beyond what every process may do.
GRANTED = {
    (PROGRAM, "file"): {"entrypoint", "open", "read", "execute", "getattr", "map"},
    ("init", "process"): {"sigchld"},
    ("servicemanager", "binder"): {"call", "transfer"},
    ("hal_vibrator_client", "binder"): {"call", "transfer"},
    ("hal_vibrator_client", "fd"): {"use"},
    ("sysfs", "dir"): ENTER,
    ("sysfs", "lnk_file"): {"read"},
    ("sysfs_vibrator_timed_output", "dir"): ENTER,
    ("sysfs_vibrator_timed_output", "file"): STREAM,
    ("sysfs_vibrator_leds", "dir"): ENTER,
    ("sysfs_vibrator_leds", "file"): STREAM,
    ("sysfs_vibrator", "file"): READ_WRITE,
    ("sysfs_vibrator_info", "dir"): ENTER,
    ("sysfs_vibrator_info", "file"): READ,
    ("sysfs_vibrator_inputff", "dir"): ENTER,
    ("sysfs_vibrator_inputff", "file"): READ_WRITE,
    ("proc", "dir"): ENTER,
    ("proc_input_devices", "file"): READ,
    ("device", "dir"): ENTER,
    ("input_device", "dir"): ENTER,
    ("input_device", "chr_file"): {"open", "read", "write", "ioctl"},
    ("efs_file", "dir"): ENTER,
    ("vibrator_calibration_file", "file"): READ,
}

# What the stand-in for the platform grants to every process, under the domain's own name where it
# is about itself.
OF_EVERY_PROCESS = {
    (DOMAIN, "process"): {"fork", "sigchld", "sigkill", "sigstop", "signull", "signal", "getsched",
                          "setsched"},
    ("binder_device", "chr_file"): {"open", "read", "write", "getattr", "ioctl", "map"},
}

# The paths that the code names: the type each must have, and what the service does there. One
# that ends in a slash stands for what the code puts behind it.
REACHED = {
    "/sys/class/timed_output/vibrator/": ("sysfs_vibrator_timed_output", "file", STREAM),
    "/sys/class/timed_output/vibrator/enable": ("sysfs_vibrator", "file", READ_WRITE),
    "/sys/class/timed_output/vibrator/use_kyp_index":
        ("sysfs_vibrator_timed_output", "file", READ_WRITE),
    "/sys/class/leds/vibrator/": ("sysfs_vibrator_leds", "file", STREAM),
    "/sys/class/leds/vibrator/activate": ("sysfs_vibrator_leds", "file", READ_WRITE),
    "/sys/class/leds/vibrator/duration": ("sysfs_vibrator_leds", "file", READ_WRITE),
    "/sys/class/leds/vibrator/state": ("sysfs_vibrator_leds", "file", READ_WRITE),
    "/sys/class/vib_info_class/vib_support_info/functions": ("sysfs_vibrator_info", "file", READ),
    "/sys/class/vib_info_class/vib_support_info/intensities": ("sysfs_vibrator_info", "file", READ),
    "/sys/class/vib_info_class/vib_support_info/haptic_intensities":
        ("sysfs_vibrator_info", "file", READ),
    "/sys/class/qvx_vib_inputff/control/event_cmd": ("sysfs_vibrator_inputff", "file", READ_WRITE),
    "/sys/class/qvx_vib_inputff/control/f0_stored": ("sysfs_vibrator_inputff", "file", READ_WRITE),
    "/sys/class/qvx_vib_inputff/control/use_kyp_index":
        ("sysfs_vibrator_inputff", "file", READ_WRITE),
    "/proc/bus/input/devices": ("proc_input_devices", "file", READ),
    "/dev/input/": ("input_device", "chr_file", READ_WRITE | {"ioctl"}),
    "/efs/FactoryApp/vibrator_calibration": ("vibrator_calibration_file", "file", READ),
}

# Named in the code and never opened: the service gets no access.
UNREACHED = {"/sys/class/qvx/vib/dc_pmic": "sysfs"}

# What log lines leave out of a path.
CUT_OFF = {"/sys/class"}


def paths_in_the_code():
    return {literal for path in project.service_files(".cpp", ".h")
            for literal in project.string_literals(path)
            if re.match(r"/(sys|proc|dev|efs|data|vendor|mnt)/", literal)}


class Policy(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        directory = tempfile.TemporaryDirectory()
        cls.addClassCleanup(directory.cleanup)
        cls.directory = pathlib.Path(directory.name)
        cls.policy = security_policy.compile_text(security_policy.source(), cls.directory)

    def label(self, path):
        """The type of what a path of the code names; a node's class link is followed."""
        if path.startswith("/sys/class/"):
            device = path.replace("/sys/class/", "/devices/virtual/")
            return security_policy.genfs_label(self.policy, "sysfs", device)
        if path.startswith("/proc/"):
            return security_policy.genfs_label(self.policy, "proc", path.removeprefix("/proc"))
        return security_policy.file_label(path)


class Grants(Policy):
    def test_are_exactly_what_the_service_does(self):
        granted = security_policy.rules(self.policy, DOMAIN)
        self.assertEqual(granted, GRANTED | OF_EVERY_PROCESS)

    def test_of_input_devices_only_effects_are_uploaded_and_removed(self):
        # EVIOCSFF and EVIOCRMFF of <linux/input.h>: type 'E', numbers 0x80 and 0x81.
        self.assertEqual(security_policy.ioctl_rules(self.policy, DOMAIN),
                         {("input_device", "chr_file"): {0x4580, 0x4581}})

    def test_domain_is_a_vibrator_service_and_nothing_more(self):
        self.assertEqual(security_policy.attributes(self.policy, DOMAIN),
                         {"domain", "halserverdomain", "hal_vibrator", "hal_vibrator_server"})
        self.assertEqual(security_policy.attributes(self.policy, PROGRAM),
                         {"exec_type", "vendor_file_type", "file_type"})

    def test_no_node_type_is_open_to_others(self):
        ours = {target for target, _ in GRANTED if target.startswith(
            ("sysfs_vibrator_", "proc_input_devices", "vibrator_calibration"))}
        self.assertEqual(len(ours), 6)
        for name in ours:
            with self.subTest(name):
                for other in ("system_server", "init", "servicemanager"):
                    self.assertFalse([target for target, _ in
                                      security_policy.rules(self.policy, other, indirect=True)
                                      if target == name])

    def test_registering_and_being_called_come_with_being_a_vibrator_service(self):
        granted = security_policy.rules(self.policy, DOMAIN, indirect=True)
        self.assertEqual(granted[("hal_vibrator_service", "service_manager")], {"add", "find"})
        clients = security_policy.rules(self.policy, "system_server", indirect=True)
        self.assertEqual(clients[("hal_vibrator_server", "binder")], {"call", "transfer"})
        self.assertEqual(clients[(DOMAIN, "binder")], {"transfer"})

    def test_init_starts_the_program_in_its_domain(self):
        init = security_policy.rules(self.policy, "init")
        self.assertEqual(init[(DOMAIN, "process")], {"transition"})
        (transition,) = [rule for rule in self.policy.terules()
                         if str(rule.ruletype) == "type_transition"]
        self.assertEqual((str(transition.source), str(transition.target), str(transition.default)),
                         ("init", PROGRAM, DOMAIN))


class Labels(Policy):
    def test_every_path_in_the_code_is_accounted_for(self):
        self.assertEqual(paths_in_the_code(), set(REACHED) | set(UNREACHED) | CUT_OFF)

    def test_every_path_has_a_type_that_the_service_may_use_so(self):
        for path, (label, kind, access) in REACHED.items():
            with self.subTest(path):
                self.assertEqual(self.label(path), label)
                self.assertLessEqual(access, GRANTED[(label, kind)])

    def test_grants_on_files_are_all_used(self):
        used = {(label, kind): set() for label, kind, _ in REACHED.values()}
        for label, kind, access in REACHED.values():
            used[(label, kind)] |= access
        granted = {key: access for key, access in GRANTED.items()
                   if key[1] in ("file", "chr_file") and key[0] != PROGRAM}
        self.assertEqual(used, granted)

    def test_nodes_that_are_left_alone_stay_the_platforms(self):
        for path, label in UNREACHED.items():
            with self.subTest(path):
                self.assertEqual(self.label(path), label)
                self.assertNotIn((label, "file"), GRANTED)

    def test_every_node_of_a_class_is_covered(self):
        for directory in ("/sys/class/timed_output/vibrator/", "/sys/class/leds/vibrator/"):
            for leaf in ("intensity", "motor_type", "cp_trigger_queue", "vibe_state"):
                with self.subTest(directory + leaf):
                    self.assertEqual(self.label(directory + leaf), REACHED[directory][0])

    def test_program_of_the_init_script_has_the_programs_type(self):
        for path in (f"/vendor/bin/hw/{project.PROGRAM}",
                     f"/system/vendor/bin/hw/{project.PROGRAM}"):
            with self.subTest(path):
                self.assertEqual(security_policy.file_label(path), PROGRAM)
        self.assertEqual(security_policy.file_label(f"/vendor/bin/hw/{project.PROGRAM}x"),
                         "vendor_file")

    def test_contexts_name_types_of_the_policy(self):
        types = security_policy.types(self.policy)
        for directory in (project.POLICY, security_policy.PLATFORM):
            for name in ("file_contexts", "service_contexts"):
                for pattern, label in security_policy.read_contexts(directory / name):
                    with self.subTest(pattern):
                        self.assertIn(label, types)

    def test_registered_name_is_labelled_once(self):
        # The lookup of the whole phone fails when a name has two lines.
        lines = [line for directory in (project.POLICY, security_policy.PLATFORM)
                 for line in security_policy.read_contexts(directory / "service_contexts")]
        self.assertEqual(lines, [("android.hardware.vibrator.IVibrator/default",
                                  "hal_vibrator_service")])


class Mistakes(Policy):
    """That the checks above see what they are there for."""

    def compile_with(self, line):
        text = security_policy.source().replace("role r;", f"{line}\nrole r;", 1)
        return security_policy.compile_text(text, self.directory)

    def test_additional_rule_is_seen(self):
        policy = self.compile_with(f"allow {DOMAIN} sysfs:file read;")
        self.assertEqual(security_policy.rules(policy, DOMAIN)[("sysfs", "file")], {"read"})

    def test_unknown_type_does_not_compile(self):
        with self.assertRaisesRegex(security_policy.CompileError, "sysfs_vibrators"):
            self.compile_with(f"allow {DOMAIN} sysfs_vibrators:file read;")

    def test_what_the_platform_forbids_does_not_compile(self):
        for rule in (f"allow {DOMAIN} vendor_shell_exec:file execute_no_trans;",
                     f"allow {DOMAIN} sysfs:file write;",
                     f"allow {DOMAIN} system_server:process ptrace;",
                     "allow system_server hal_vibrator_service:service_manager add;"):
            with self.subTest(rule), self.assertRaisesRegex(security_policy.CompileError,
                                                            "neverallow"):
                self.compile_with(rule)


if __name__ == "__main__":
    unittest.main()
