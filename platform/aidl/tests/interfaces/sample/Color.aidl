// SPDX-License-Identifier: Apache-2.0
package sample;

/** Without @Backing an enumeration is a byte. */
enum Color {
    RED,
    GREEN = 1 << 2,
    BLUE,
    CRIMSON = RED,
    DARK = -128,
}
