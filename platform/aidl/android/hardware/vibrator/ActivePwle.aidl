// SPDX-License-Identifier: Apache-2.0
package android.hardware.vibrator;

/**
 * One ramp of IVibrator.composePwle: amplitude and frequency each go in a straight line from their
 * start to their end. A start that differs from where the entry before ended is a jump. Since
 * version 2.
 */
@VintfStability
parcelable ActivePwle {
    /** Amplitude at the start: 0.0 to 1.0, at most what the motor reaches at that frequency. */
    float startAmplitude;

    /** Frequency at the start, in hertz, within the band of IVibrator.getBandwidthAmplitudeMap. */
    float startFrequency;

    /** Amplitude at the end: 0.0 to 1.0, at most what the motor reaches at that frequency. */
    float endAmplitude;

    /** Frequency at the end, in hertz, within the band of IVibrator.getBandwidthAmplitudeMap. */
    float endFrequency;

    /** Length of the ramp, in milliseconds: 0 to IVibrator.getPwlePrimitiveDurationMax. */
    int duration;
}
