# SPDX-License-Identifier: Apache-2.0
"""bench/compare: when a count is too high, and that the document shows the table that is kept; the plot
beside it."""

import importlib.machinery
import importlib.util
import pathlib
import sys
import unittest

PROJECT = pathlib.Path(__file__).resolve().parent.parent.parent
sys.path.insert(0, str(PROJECT / "bench"))
import figures_document  # noqa: E402  (found through the line above)

TABLE = """\
ratio   median     99 %    floor     trip   driver   logger     ours  request
 1.00    10000    12000    10000    10000        0        0        0  legacy std off
 0.96    12000    15000    12500    10000     1000     1500     -500  ff std setAmplitude
"""


def loaded(name):
    """A command of bench/ as a module."""
    loader = importlib.machinery.SourceFileLoader(name, str(PROJECT / "bench" / name))
    module = importlib.util.module_from_spec(importlib.util.spec_from_loader(name, loader))
    loader.exec_module(module)
    return module


compare = loaded("compare")
growth_plot = loaded("growth_plot")


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

    def test_tells_the_largest_difference_either_way(self):
        self.assertEqual(compare.largest_difference({"a": 10000, "b": 1000, "c": 100},
                                                    {"a": 10150, "b": 975, "c": 101, "d": 7}),
                         "3 medians beside those of the last commit: 2 differ by more than 1%, "
                         "most b by 2.50%")

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


class Plot(unittest.TestCase):
    def test_draws_each_thing_that_grows(self):
        self.assertEqual(growth_plot.series(" size   median  of\n    1    20  clients\n"
                                            "    8   160  clients\n    2    7  names, one\n"),
                         {"clients": [(1, 20), (8, 160)], "names, one": [(2, 7)]})

    def test_in_the_document_is_of_the_table_there(self):
        self.assertEqual(growth_plot.drawn(figures_document.table("growth_figures")),
                         growth_plot.PICTURE.read_bytes())


if __name__ == "__main__":
    unittest.main()
