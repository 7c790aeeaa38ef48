// SPDX-License-Identifier: Apache-2.0
package sample;

@FixedSize
parcelable Point {
    int x = 3;
    float y;
}
