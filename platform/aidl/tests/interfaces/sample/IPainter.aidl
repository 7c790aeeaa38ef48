// SPDX-License-Identifier: Apache-2.0
package sample;

import sample.Color;
import sample.IListener;
import sample.Point;
import sample.Shape;

@Descriptor(value="sample.painting.IPainter")
interface IPainter {
    const int LIMIT = (1 << 4) - 1;
    const byte LOWEST = -128;
    const long MASK = 0x7fffffffffffffff & ~1;
    const String NAME = "a \"painter\"\n";

    int add(int a, int b) = 10;
    oneway void poke(int value) = 0;
    void fill(out int[] values) = 2;
    void move(inout Point point, in Point by) = 3;
    @nullable String echo(@nullable String text) = 4;
    Shape reshape(in Shape shape, out Point[] corners) = 5;
    Color mix(Color first, in Color[] others) = 6;
    boolean listen(IListener listener) = 7;
    IBinder wrap(IBinder binder) = 8;
    ParcelFileDescriptor pass(in ParcelFileDescriptor file) = 9;
    String[] split(String text, char at) = 16777114;
}
