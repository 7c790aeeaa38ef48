// SPDX-License-Identifier: Apache-2.0
package android.hardware.vibrator;

/** How strong a predefined effect is played. */
@VintfStability
@Backing(type="byte")
enum EffectStrength {
    /** The weakest. */
    LIGHT = 0,
    /** Between the two others. */
    MEDIUM = 1,
    /** The strongest. */
    STRONG = 2,
}
