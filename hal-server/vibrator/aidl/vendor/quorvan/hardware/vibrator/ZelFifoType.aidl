// SPDX-License-Identifier: Apache-2.0
package vendor.quorvan.hardware.vibrator;

/**
 * Patterns of the driver's FIFO, for IZelVibrator.performFifoHapticEngine. What each number plays
 * is decided by the driver; the service only passes the number on.
 */
@VintfStability
@Backing(type="int")
enum ZelFifoType {
    /** The driver's FIFO pattern 0. */
    PATTERN_0 = 0,
    /** The driver's FIFO pattern 1. */
    PATTERN_1 = 1,
    /** The driver's FIFO pattern 2. */
    PATTERN_2 = 2,
    /** The driver's FIFO pattern 3. */
    PATTERN_3 = 3,
    /** The driver's FIFO pattern 4. */
    PATTERN_4 = 4,
    /** The driver's FIFO pattern 5. */
    PATTERN_5 = 5,
    /** The driver's FIFO pattern 6. */
    PATTERN_6 = 6,
    /** The driver's FIFO pattern 7. */
    PATTERN_7 = 7,
    /** The driver's FIFO pattern 8. */
    PATTERN_8 = 8,
    /** The driver's FIFO pattern 9. */
    PATTERN_9 = 9,
    /** The driver's FIFO pattern 10. */
    PATTERN_10 = 10,
    /** The driver's FIFO pattern 11. */
    PATTERN_11 = 11,
    /** The driver's FIFO pattern 12. */
    PATTERN_12 = 12,
    /** The driver's FIFO pattern 13. */
    PATTERN_13 = 13,
    /** The driver's FIFO pattern 14. */
    PATTERN_14 = 14,
    /** The driver's FIFO pattern 15. */
    PATTERN_15 = 15,
    /** The driver's FIFO pattern 16. */
    PATTERN_16 = 16,
    /** The driver's FIFO pattern 17. */
    PATTERN_17 = 17,
    /** The driver's FIFO pattern 18. */
    PATTERN_18 = 18,
    /** The driver's FIFO pattern 19. */
    PATTERN_19 = 19,
    /** The driver's FIFO pattern 20. */
    PATTERN_20 = 20,
    /** The driver's FIFO pattern 21. */
    PATTERN_21 = 21,
    /** The driver's FIFO pattern 22. */
    PATTERN_22 = 22,
    /** The driver's FIFO pattern 23. */
    PATTERN_23 = 23,
    /** The driver's FIFO pattern 24. */
    PATTERN_24 = 24,
    /** The driver's FIFO pattern 25. */
    PATTERN_25 = 25,
}
