# SPDX-License-Identifier: Apache-2.0
"""bench/compare: when a count is too high, and that the document shows the table that is kept."""

import importlib.machinery
import importlib.util
import pathlib
import sys
import unittest

PROJECT = pathlib.Path(__file__).resolve().parent.parent.parent
sys.path.insert(0, str(PROJECT / "bench"))
import figures_document  # noqa: E402  (found through the line above)

LOADER = importlib.machinery.SourceFileLoader("compare", str(PROJECT / "bench" / "compare"))
compare = importlib.util.module_from_spec(importlib.util.spec_from_loader("compare", LOADER))
LOADER.exec_module(compare)

TABLE = """\
ratio   median     99 %    floor     trip   driver   logger     ours  request
 1.00    10000    12000    10000    10000        0        0        0  legacy std off
 0.96    12000    15000    12500    10000     1000     1500     -500  ff std setAmplitude
"""


class Compare(unittest.TestCase):
    def test_reads_the_median_of_each_request(self):
        self.assertEqual(compare.medians(TABLE),
                         {"legacy std off": 10000, "ff std setAmplitude": 12000})

    def test_takes_two_percent_more_and_anything_less(self):
        self.assertEqual(compare.costlier({"a": 10000, "b": 5000}, {"a": 10200, "b": 10}), [])

    def test_names_what_costs_more(self):
        self.assertEqual(compare.costlier({"a": 10000}, {"a": 10201}),
                         ["a: 10201 instructions, 10000 before"])

    def test_believes_the_lower_of_two_runs(self):
        self.assertEqual(compare.lower({"a": 10300, "b": 20000, "c": 7}, {"a": 10010, "b": 20900}),
                         {"a": 10010, "b": 20000, "c": 7})

    def test_names_a_call_of_one_table_alone(self):
        self.assertEqual(compare.costlier({"a": 1, "b": 1}, {"a": 1, "c": 1}),
                         ["b: in one table alone", "c: in one table alone"])

    def test_document_shows_the_table_that_is_kept(self):
        document = figures_document.DOCUMENT.read_text("utf-8")
        kept = compare.KEPT.read_text("ascii")
        self.assertIn(kept, document)
        self.assertIn(TABLE, figures_document.with_table(document, "bench/compare", TABLE))
        with self.assertRaises(ValueError):
            figures_document.with_table(document, "no such table", TABLE)


if __name__ == "__main__":
    unittest.main()
