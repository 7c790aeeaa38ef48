// SPDX-License-Identifier: Apache-2.0
package sample;

import sample.Color;

/** Fields with a default of their own. */
parcelable Defaults {
    const int BASE = 40;

    boolean flag = true;
    byte small = -1;
    char letter = 'q';
    int number = BASE + 2;
    long big = -0x7fffffffffffffff - 1;
    float ratio = 0.5f;
    double precise = -2.5;
    String text = "say \"hi\"";
    Color color = Color.BLUE;
    int[] numbers = {1, 2, 3};
    byte[] bytes = {-1, 127};
    Color[] colors = {Color.GREEN};
}
