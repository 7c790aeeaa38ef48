// SPDX-License-Identifier: Apache-2.0
package android.os;

/** Told by the service manager whether anyone but itself refers to a registered service. */
oneway interface IClientCallback {
    void onClients(IBinder registered, boolean hasClients);
}
