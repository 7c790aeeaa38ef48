// SPDX-License-Identifier: Apache-2.0
package sample;

import sample.Color;
import sample.Point;
import sample.Size;

/** Every kind of list. */
parcelable Lists {
    boolean[] flags;
    byte[] bytes;
    char[] letters;
    int[] numbers;
    long[] bigs;
    float[] ratios;
    double[] precises;
    String[] texts;
    Color[] colors;
    Size[] sizes;
    Point[] points;
    List<String> names;
}
