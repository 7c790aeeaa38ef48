// SPDX-License-Identifier: Apache-2.0
package sample;

/** Field names that generated code might use itself. */
parcelable Awkward {
    int status;
    int parcel;
    int start;
    int size;
    int end;
    int rhs;
    int os;
}
