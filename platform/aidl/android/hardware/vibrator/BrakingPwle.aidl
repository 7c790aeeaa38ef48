// SPDX-License-Identifier: Apache-2.0
package android.hardware.vibrator;

import android.hardware.vibrator.Braking;

/** One stretch of IVibrator.composePwle in which the motor comes to rest. Since version 2. */
@VintfStability
parcelable BrakingPwle {
    /** One of IVibrator.getSupportedBraking. */
    Braking braking;

    /** Length of the stretch, in milliseconds: 0 to IVibrator.getPwlePrimitiveDurationMax. */
    int duration;
}
