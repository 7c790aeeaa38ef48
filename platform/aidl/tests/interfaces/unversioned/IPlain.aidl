// SPDX-License-Identifier: Apache-2.0
package unversioned;

/** An interface without version. */
interface IPlain {
    void nothing();
}
