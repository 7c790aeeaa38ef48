// SPDX-License-Identifier: Apache-2.0
package sample;

import sample.Color;
import sample.IListener;
import sample.Point;
import sample.Shape;

/** Everything that may be null. */
parcelable Nullables {
    @nullable String text;
    @nullable Point point;
    @nullable Shape shape;
    @nullable int[] numbers;
    @nullable String[] texts;
    @nullable Color[] colors;
    @nullable Point[] points;
    @nullable IListener listener;
    @nullable IBinder binder;
    @nullable ParcelFileDescriptor file;
}
