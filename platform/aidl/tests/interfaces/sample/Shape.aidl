// SPDX-License-Identifier: Apache-2.0
package sample;

import sample.Color;
import sample.Point;

union Shape {
    const String KIND = "shape";

    int id = 7;
    String name;
    Point point;
    Color[] colors;
    @nullable Point maybe;
    Color color;
}
