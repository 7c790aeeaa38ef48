// SPDX-License-Identifier: Apache-2.0
package sample;

/** No fields at all. */
parcelable Nothing {
}
