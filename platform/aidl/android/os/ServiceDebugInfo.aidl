// SPDX-License-Identifier: Apache-2.0
package android.os;

/** A registered service and the process that registered it. */
parcelable ServiceDebugInfo {
    @utf8InCpp String name;
    int debugPid;
}
