# SPDX-License-Identifier: Apache-2.0
"""bench/compare: when a count is too high, and that the document shows the table that is kept."""

import importlib.machinery
import importlib.util
import pathlib
import unittest

PROJECT = pathlib.Path(__file__).resolve().parent.parent.parent
LOADER = importlib.machinery.SourceFileLoader("compare", str(PROJECT / "bench" / "compare"))
compare = importlib.util.module_from_spec(importlib.util.spec_from_loader("compare", LOADER))
LOADER.exec_module(compare)

TABLE = """\
 ratio     median       99 %  call
  1.00      10000      12000  ping, bare loop
  1.20      12000      15000  ping, AIBinder_ping
"""


class Compare(unittest.TestCase):
    def test_reads_the_median_of_each_call(self):
        self.assertEqual(compare.medians(TABLE),
                         {"ping, bare loop": 10000, "ping, AIBinder_ping": 12000})

    def test_takes_two_percent_more_and_anything_less(self):
        self.assertEqual(compare.costlier({"a": 10000, "b": 5000}, {"a": 10200, "b": 10}), [])

    def test_names_what_costs_more(self):
        self.assertEqual(compare.costlier({"a": 10000}, {"a": 10201}),
                         ["a: 10201 instructions, 10000 before"])

    def test_names_a_call_of_one_table_alone(self):
        self.assertEqual(compare.costlier({"a": 1, "b": 1}, {"a": 1, "c": 1}),
                         ["b: in one table alone", "c: in one table alone"])

    def test_document_shows_the_table_that_is_kept(self):
        document = compare.DOCUMENT.read_text("utf-8")
        kept = compare.KEPT.read_text("ascii")
        self.assertIn(kept, document)
        self.assertIn(TABLE, compare.with_table(document, TABLE))


if __name__ == "__main__":
    unittest.main()
