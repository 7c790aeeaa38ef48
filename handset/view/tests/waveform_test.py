# SPDX-License-Identifier: Apache-2.0
"""What the driver is handed to play, taken apart."""

import math
import unittest

import view_path  # noqa: F401
import waveform
from waveform import Piece


class Packets(unittest.TestCase):
    def test_play_one_after_the_other(self):
        program = waveform.packets("8 7 10000 2050 0 20 3000 1700 1\n")
        self.assertEqual(program.pieces, (Piece(1.0, 7, "packet 2050"),
                                          Piece(0.3, 20, "packet 1700 overdrive")))
        self.assertEqual(program.times, 1)

    def test_that_are_fewer_than_announced_are_refused(self):
        for text in ("8 7 10000 2050 0\n", "", "3 1 2 3\n"):
            with self.assertRaises(ValueError, msg=text):
                waveform.packets(text)

    def test_of_the_hybrid_kind_name_a_pattern(self):
        program = waveform.hybrid("8 5 5000 #3 170 9 10000 2 171\n")
        self.assertEqual(program.pieces, (Piece(0.5, 5, "packet #3 170"),
                                          Piece(1.0, 9, "packet 2 171")))


class Queue(unittest.TestCase):
    def test_of_one_pattern_repeats_for_ever(self):
        program = waveform.queue("10.67, 10, 0~\0")
        self.assertEqual(program.pieces, (Piece(0.67, 50, "pattern 10"), Piece(0, 10)))
        self.assertEqual(program.times, math.inf)

    def test_repeats_as_often_as_it_says(self):
        program = waveform.queue("5.100,2!\0")
        self.assertEqual(program.pieces, (Piece(1.0, 50, "pattern 5", known=False),))
        self.assertEqual(program.times, 2)

    def test_of_a_composition_has_levels_of_ten_thousand(self):
        program = waveform.queue("50,1.10000,124.5000,0")
        self.assertEqual(program.pieces, (Piece(0, 50), Piece(1.0, 20, "pattern 1"),
                                          Piece(0.5, 300, "pattern 124")))
        self.assertEqual(program.times, 1)


class Composite(unittest.TestCase):
    def test_of_one_section_repeats_for_ever(self):
        program = waveform.composite(bytes.fromhex("000001ff" "00640500" "0000000a"))
        self.assertEqual(program.pieces, (Piece(1.0, 50, "pattern 5", known=False), Piece(0, 10)))
        self.assertEqual(program.times, math.inf)

    def test_with_a_duration_counts_quarter_milliseconds(self):
        program = waveform.composite(bytes.fromhex("00000100" "00320100" "00080000" "00000050"))
        self.assertEqual(program.pieces, (Piece(0.5, 20, "pattern 1"),))

    def test_with_a_duration_of_its_own_length_has_that(self):
        program = waveform.composite(bytes.fromhex("00000100" "00642900" "00080000" "0000ffff"))
        self.assertEqual(program.pieces, (Piece(1.0, 20, "pattern 41"),))

    def test_repeats_an_inner_loop(self):
        # 1.100, !!, 41.50, 7, 1.100, 2!!, the whole 3 times
        program = waveform.composite(bytes.fromhex(
            "00000303" "00640100" "00000000" "003229ff" "00000007" "00640102" "00000000"))
        inner = (Piece(0.5, 20, "pattern 41"), Piece(0, 7), Piece(1.0, 20, "pattern 1"))
        self.assertEqual(program.pieces, (Piece(1.0, 20, "pattern 1"),) + inner * 2)
        self.assertEqual(program.times, 3)

    def test_with_a_loop_that_is_one_section_repeats_that(self):
        program = waveform.composite(bytes.fromhex("00000100" "00500302" "00000032"))
        self.assertEqual(program.pieces, (Piece(0.8, 50, "pattern 3", False), Piece(0, 50)) * 2)

    def test_knows_primitives_by_the_platform_s_numbers(self):
        program = waveform.composite(bytes.fromhex("00000200" "00640a00" "00000000"
                                                   "00648c00" "00000000"), platform_numbers=True)
        self.assertEqual([piece.ms for piece in program.pieces], [20, 300])

    def test_that_ends_early_is_refused(self):
        for data in ("000002ff" "00640500" "0000000a", "0000", "00000100" "0064"):
            with self.assertRaises(ValueError, msg=data):
                waveform.composite(bytes.fromhex(data))


if __name__ == "__main__":
    unittest.main()
