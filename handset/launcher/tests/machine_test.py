# SPDX-License-Identifier: Apache-2.0
"""QEMU's command line and what is shown of a guest's console."""

import types
import unittest

import launcher_path  # noqa: F401
import machine
from failure import Failure


class KernelParameters(unittest.TestCase):
    def parameters(self, path="/build/bin/handset-agent", host_tmp=False, out=None, join=None):
        options = types.SimpleNamespace(agent=path, host_tmp=host_tmp, out=out)
        return machine._kernel_parameters(machine.TARGETS["amd64"], options, join)

    def test_path_with_a_space_is_quoted(self):
        self.assertIn(' handset_agent="/my build/bin/handset-agent" ',
                      self.parameters("/my build/bin/handset-agent"))

    def test_say_which_file_systems_are_wanted(self):
        self.assertTrue(self.parameters().endswith("handset_host_tmp=0 handset_out_export=0 "
                                                   "handset_join=0"))
        self.assertTrue(self.parameters(host_tmp=True, out="/x", join="/y")
                        .endswith("handset_host_tmp=1 handset_out_export=1 handset_join=1"))

    def test_path_with_a_quotation_mark_is_refused(self):
        with self.assertRaisesRegex(Failure, "cannot be told of this path"):
            self.parameters('/a"b/handset-agent')

    def test_path_longer_than_the_kernel_takes_is_refused(self):
        with self.assertRaisesRegex(Failure, "path is too long for a guest"):
            self.parameters("/" + "x" * 2000)


class Export(unittest.TestCase):
    def test_comma_in_a_path_is_doubled(self):
        self.assertEqual(machine._export("out", "/a,b", "readonly=off")[1],
                         "local,id=out,path=/a,,b,security_model=none,readonly=off,"
                         "multidevs=remap")


class Console(unittest.TestCase):
    def console(self, text):
        guest = machine.Machine.__new__(machine.Machine)
        guest._console_text = bytearray(text)
        return guest

    def test_last_words_are_the_last_lines_without_empty_ones(self):
        self.assertEqual(self.console(b"one\r\ntwo\r\n\r\nthree\r\n").last_words(2),
                         ["two", "three"])

    def test_last_words_of_a_panic_end_with_its_message(self):
        console = self.console(b"mount: no such device\n[ 1.0] Kernel panic - not syncing: x\n"
                               b"[ 1.1] Call Trace:\n[ 1.2]  <TASK>\n")
        self.assertEqual(console.last_words(2),
                         ["mount: no such device", "[ 1.0] Kernel panic - not syncing: x"])

    def test_faults_are_found_among_other_lines(self):
        found = machine._FAULT.search
        self.assertTrue(found("[    9.1] BUG: kernel NULL pointer dereference, address: 0"))
        self.assertTrue(found("[    9.1] Oops: 0002 [#1] PREEMPT SMP NOPTI"))
        self.assertTrue(found("[    9.1] Internal error: Oops: 96000004 [#1] SMP"))
        self.assertFalse(found("[    9.1] binder: 12:12 ioctl 40046207 7ffd returned -16"))
        self.assertFalse(found("the program printed BUG: itself"))


if __name__ == "__main__":
    unittest.main()
