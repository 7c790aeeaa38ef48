// SPDX-License-Identifier: Apache-2.0
package android.hardware.vibrator;

import android.hardware.vibrator.CompositePrimitive;

/** One entry of IVibrator.compose: a pause, then a primitive. */
@VintfStability
parcelable CompositeEffect {
    /** Pause before the primitive, in milliseconds: 0 to IVibrator.getCompositionDelayMax. */
    int delayMs;

    /** What is played after the pause. */
    CompositePrimitive primitive = CompositePrimitive.NOOP;

    /**
     * Strength of the primitive: 0.0 (the weakest that the motor plays) to 1.0 (the strongest).
     * Not looked at for CompositePrimitive.NOOP.
     */
    float scale;
}
