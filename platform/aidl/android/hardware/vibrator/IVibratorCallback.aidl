// SPDX-License-Identifier: Apache-2.0
package android.hardware.vibrator;

/** Implemented by a client that wants to know when its vibration has ended. */
@VintfStability
interface IVibratorCallback {
    /**
     * The vibration that this callback was given with is over: played to its end or switched off.
     * The call does not wait for the client.
     */
    oneway void onComplete();
}
