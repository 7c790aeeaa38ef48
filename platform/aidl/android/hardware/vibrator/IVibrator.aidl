// SPDX-License-Identifier: Apache-2.0
package android.hardware.vibrator;

import android.hardware.vibrator.Braking;
import android.hardware.vibrator.CompositeEffect;
import android.hardware.vibrator.CompositePrimitive;
import android.hardware.vibrator.Effect;
import android.hardware.vibrator.EffectStrength;
import android.hardware.vibrator.IVibratorCallback;
import android.hardware.vibrator.PrimitivePwle;

/**
 * One vibration motor, as the platform sees it. This is version 2 of the interface.
 *
 * The methods getCapabilities, off, on and getSupportedEffects work on every motor. Every other
 * group of methods belongs to a bit of getCapabilities, named with the method; without the bit it
 * raises EX_UNSUPPORTED_OPERATION. A value outside its stated range raises EX_ILLEGAL_ARGUMENT; a
 * motor that could not be driven raises EX_ILLEGAL_STATE.
 *
 * What happens when a vibration is requested while another one runs is undefined: call off first.
 *
 * Wherever a callback is taken, null means that the caller wants no notice of the end. A callback
 * that the motor cannot serve raises EX_UNSUPPORTED_OPERATION.
 */
@VintfStability
interface IVibrator {
    /** on takes a callback. */
    const int CAP_ON_CALLBACK = 1;

    /** perform takes a callback. */
    const int CAP_PERFORM_CALLBACK = 2;

    /** setAmplitude works while external control is off. */
    const int CAP_AMPLITUDE_CONTROL = 4;

    /** setExternalControl works. */
    const int CAP_EXTERNAL_CONTROL = 8;

    /** setAmplitude works while external control is on. */
    const int CAP_EXTERNAL_AMPLITUDE_CONTROL = 16;

    /** compose, with a callback, and its four queries work. */
    const int CAP_COMPOSE_EFFECTS = 32;

    /** alwaysOnEnable, alwaysOnDisable and getSupportedAlwaysOnEffects work. */
    const int CAP_ALWAYS_ON_CONTROL = 64;

    /** getResonantFrequency works. Since version 2. */
    const int CAP_GET_RESONANT_FREQUENCY = 128;

    /** getQFactor works. Since version 2. */
    const int CAP_GET_Q_FACTOR = 256;

    /**
     * getFrequencyResolution, getFrequencyMinimum and getBandwidthAmplitudeMap work. Since
     * version 2.
     */
    const int CAP_FREQUENCY_CONTROL = 512;

    /** composePwle, with a callback, and its three queries work. Since version 2. */
    const int CAP_COMPOSE_PWLE_EFFECTS = 1024;

    /**
     * Tells what this motor can do.
     *
     * @return the sum of the CAP_ bits that hold; 0 when the motor can only be switched on and off.
     */
    int getCapabilities();

    /**
     * Stops the running vibration. A callback still waiting for its end is completed.
     *
     * @throws EX_ILLEGAL_STATE when the motor could not be switched off.
     */
    void off();

    /**
     * Switches the motor on.
     *
     * @param timeoutMs how long to vibrate, in milliseconds.
     * @param callback told when the time is over; may be null. Needs CAP_ON_CALLBACK.
     * @throws EX_UNSUPPORTED_OPERATION when a callback is given and cannot be served.
     * @throws EX_ILLEGAL_STATE when the motor could not be switched on.
     */
    void on(int timeoutMs, IVibratorCallback callback);

    /**
     * Plays a predefined effect.
     *
     * @param effect one of getSupportedEffects. Any number may arrive here.
     * @param strength a supported effect is supported at each of the three strengths.
     * @param callback told when the effect is over; may be null. Needs CAP_PERFORM_CALLBACK.
     * @return how long the effect lasts, in milliseconds; above 0.
     * @throws EX_UNSUPPORTED_OPERATION when the effect, the strength or a callback is not
     *     supported; always when getSupportedEffects is empty.
     * @throws EX_ILLEGAL_STATE when the motor did not take the effect.
     */
    int perform(Effect effect, EffectStrength strength, IVibratorCallback callback);

    /**
     * Lists the effects that perform plays.
     *
     * @return the effects, each once; empty when there is none.
     */
    Effect[] getSupportedEffects();

    /**
     * Sets how strong the motor vibrates, for a vibration that runs and for those to come. Needs
     * CAP_AMPLITUDE_CONTROL, or CAP_EXTERNAL_AMPLITUDE_CONTROL while external control is on.
     *
     * @param amplitude share of the full strength: above 0.0, up to and including 1.0.
     * @throws EX_UNSUPPORTED_OPERATION when the amplitude cannot be set at present.
     * @throws EX_ILLEGAL_ARGUMENT when the amplitude is outside its range.
     * @throws EX_ILLEGAL_STATE when the motor did not take the amplitude.
     */
    void setAmplitude(float amplitude);

    /**
     * Hands the motor to a source outside this interface, such as the audio path, or takes it back.
     * A motor taken back is off. Needs CAP_EXTERNAL_CONTROL.
     *
     * @param enabled true hands over, false takes back.
     * @throws EX_UNSUPPORTED_OPERATION when the motor has no external control.
     */
    void setExternalControl(boolean enabled);

    /**
     * Tells the longest delay in front of a primitive in compose. Needs CAP_COMPOSE_EFFECTS.
     *
     * @return milliseconds.
     */
    int getCompositionDelayMax();

    /**
     * Tells how many entries one compose call may carry. Needs CAP_COMPOSE_EFFECTS.
     *
     * @return number of entries.
     */
    int getCompositionSizeMax();

    /**
     * Lists the primitives that compose plays. Needs CAP_COMPOSE_EFFECTS.
     *
     * @return the primitives, each once.
     */
    CompositePrimitive[] getSupportedPrimitives();

    /**
     * Tells how long a primitive lasts, its delay not counted. Needs CAP_COMPOSE_EFFECTS.
     *
     * @param primitive one of getSupportedPrimitives.
     * @return milliseconds.
     * @throws EX_UNSUPPORTED_OPERATION when the primitive is not supported.
     */
    int getPrimitiveDuration(CompositePrimitive primitive);

    /**
     * Plays primitives one after another. Needs CAP_COMPOSE_EFFECTS.
     *
     * @param composite the entries in the order of playing, at most getCompositionSizeMax of them.
     * @param callback told when the last entry is over; may be null.
     * @throws EX_ILLEGAL_ARGUMENT when there are too many entries, or a delay or scale is outside
     *     its range.
     * @throws EX_UNSUPPORTED_OPERATION when a primitive is not supported.
     * @throws EX_ILLEGAL_STATE when the motor did not take the composition.
     */
    void compose(in CompositeEffect[] composite, IVibratorCallback callback);

    /**
     * Lists the effects that alwaysOnEnable takes. Needs CAP_ALWAYS_ON_CONTROL.
     *
     * @return the effects, each once.
     */
    Effect[] getSupportedAlwaysOnEffects();

    /**
     * Binds an effect to a hardware trigger, such as a pressure sensor, so that it plays without
     * the processor. A binding that the trigger had before is replaced. Needs
     * CAP_ALWAYS_ON_CONTROL.
     *
     * @param id number of the trigger; device specific.
     * @param effect one of getSupportedAlwaysOnEffects.
     * @param strength a supported effect is supported at each of the three strengths.
     * @throws EX_UNSUPPORTED_OPERATION when the effect or the strength is not supported.
     */
    void alwaysOnEnable(int id, Effect effect, EffectStrength strength);

    /**
     * Releases the binding of a hardware trigger. Needs CAP_ALWAYS_ON_CONTROL.
     *
     * @param id number of the trigger, as given to alwaysOnEnable.
     * @throws EX_UNSUPPORTED_OPERATION when the motor has no always-on control.
     */
    void alwaysOnDisable(int id);

    /**
     * Tells the motor's resonant frequency. Needs CAP_GET_RESONANT_FREQUENCY. Since version 2.
     *
     * @return hertz; above 0.
     */
    float getResonantFrequency();

    /**
     * Tells the motor's Q factor, a number without unit. Needs CAP_GET_Q_FACTOR. Since version 2.
     *
     * @return the factor; above 0.
     */
    float getQFactor();

    /**
     * Tells the distance between neighbouring entries of getBandwidthAmplitudeMap. Needs
     * CAP_FREQUENCY_CONTROL. Since version 2.
     *
     * @return hertz; above 0.
     */
    float getFrequencyResolution();

    /**
     * Tells the lowest frequency that the motor plays: that of the first entry of
     * getBandwidthAmplitudeMap. Needs CAP_FREQUENCY_CONTROL. Since version 2.
     *
     * @return hertz; above 0, at most the resonant frequency.
     */
    float getFrequencyMinimum();

    /**
     * Tells how strong the motor can be over its band. Entry n belongs to the frequency
     * minimum + n x resolution; the last entry marks the highest frequency, and the resonant
     * frequency lies inside. Needs CAP_FREQUENCY_CONTROL. Since version 2.
     *
     * @return for each frequency the largest amplitude, 0.0 to 1.0; never empty.
     */
    float[] getBandwidthAmplitudeMap();

    /**
     * Tells the longest duration of one entry of composePwle. Needs CAP_COMPOSE_PWLE_EFFECTS. Since
     * version 2.
     *
     * @return milliseconds; above 0.
     */
    int getPwlePrimitiveDurationMax();

    /**
     * Tells how many entries one composePwle call may carry. Needs CAP_COMPOSE_PWLE_EFFECTS. Since
     * version 2.
     *
     * @return number of entries; above 0.
     */
    int getPwleCompositionSizeMax();

    /**
     * Lists the ways of braking that composePwle takes. Needs CAP_COMPOSE_PWLE_EFFECTS. Since
     * version 2.
     *
     * @return the ways, each once; Braking.NONE is among them.
     */
    Braking[] getSupportedBraking();

    /**
     * Plays a piecewise-linear envelope: ramps of amplitude and frequency, and stretches of
     * braking. Needs CAP_COMPOSE_PWLE_EFFECTS. Since version 2.
     *
     * @param composite the entries in the order of playing: at least one, at most
     *     getPwleCompositionSizeMax.
     * @param callback told when the last entry is over; may be null.
     * @throws EX_UNSUPPORTED_OPERATION when the motor cannot play envelopes.
     * @throws EX_ILLEGAL_ARGUMENT when the list is empty or too long, or a field of an entry is
     *     outside its range.
     */
    void composePwle(in PrimitivePwle[] composite, IVibratorCallback callback);
}
