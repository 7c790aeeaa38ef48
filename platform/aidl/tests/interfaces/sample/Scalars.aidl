// SPDX-License-Identifier: Apache-2.0
package sample;

import sample.Color;
import sample.Size;

/** One field of every type that is no container. */
parcelable Scalars {
    boolean flag;
    byte small;
    char letter;
    int number;
    long big;
    float ratio;
    double precise;
    String text;
    Color color;
    Size size;
}
