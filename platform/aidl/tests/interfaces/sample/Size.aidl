// SPDX-License-Identifier: Apache-2.0
package sample;

@Backing(type="long")
enum Size {
    SMALL = 1,
    LARGE = 0x100000000L,
}
