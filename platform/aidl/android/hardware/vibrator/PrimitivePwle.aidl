// SPDX-License-Identifier: Apache-2.0
package android.hardware.vibrator;

import android.hardware.vibrator.ActivePwle;
import android.hardware.vibrator.BrakingPwle;

/** One entry of IVibrator.composePwle: either a ramp or braking. Since version 2. */
@VintfStability
union PrimitivePwle {
    /** A ramp of amplitude and frequency. */
    ActivePwle active;

    /** The motor comes to rest. */
    BrakingPwle braking;
}
