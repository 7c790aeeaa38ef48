// SPDX-License-Identifier: Apache-2.0
package android.hardware.vibrator;

import android.hardware.vibrator.IVibrator;
import android.hardware.vibrator.IVibratorCallback;

/**
 * All motors of a device, and vibrations that start on several of them at once. Since version 2.
 *
 * A synchronised vibration has three steps: prepareSynced names the motors, each of them is then
 * given its vibration through IVibrator (which holds it back), and triggerSynced starts them all.
 * What a motor may be given, and how it may be mixed with others, belongs to bits of
 * getCapabilities; without CAP_SYNC the three methods raise EX_UNSUPPORTED_OPERATION.
 */
@VintfStability
interface IVibratorManager {
    /** prepareSynced, triggerSynced and cancelSynced work. */
    const int CAP_SYNC = 1;

    /** A prepared motor may be given IVibrator.on. */
    const int CAP_PREPARE_ON = 2;

    /** A prepared motor may be given IVibrator.perform. */
    const int CAP_PREPARE_PERFORM = 4;

    /** A prepared motor may be given IVibrator.compose. */
    const int CAP_PREPARE_COMPOSE = 8;

    /** Motors given IVibrator.on may be started together with motors given something else. */
    const int CAP_MIXED_TRIGGER_ON = 16;

    /** Motors given IVibrator.perform may be started together with motors given something else. */
    const int CAP_MIXED_TRIGGER_PERFORM = 32;

    /** Motors given IVibrator.compose may be started together with motors given something else. */
    const int CAP_MIXED_TRIGGER_COMPOSE = 64;

    /** triggerSynced takes a callback. */
    const int CAP_TRIGGER_CALLBACK = 128;

    /**
     * Tells what this manager can do.
     *
     * @return the sum of the CAP_ bits that hold.
     */
    int getCapabilities();

    /**
     * Lists the motors.
     *
     * @return the number of each motor, each once; the numbers stay the same.
     */
    int[] getVibratorIds();

    /**
     * Gives access to one motor.
     *
     * @param vibratorId one of getVibratorIds.
     * @return the motor's interface.
     * @throws EX_ILLEGAL_ARGUMENT when there is no motor of that number.
     */
    IVibrator getVibrator(int vibratorId);

    /**
     * Begins a synchronised vibration. Needs CAP_SYNC.
     *
     * @param vibratorIds the motors that take part: at least one, each of getVibratorIds.
     * @throws EX_UNSUPPORTED_OPERATION when motors cannot be synchronised.
     * @throws EX_ILLEGAL_ARGUMENT when the list is empty or names no motor of this device.
     * @throws EX_ILLEGAL_STATE when a synchronised vibration was begun already.
     */
    void prepareSynced(in int[] vibratorIds);

    /**
     * Starts what was prepared. Needs CAP_SYNC.
     *
     * @param callback told when all motors are done; may be null. Needs CAP_TRIGGER_CALLBACK.
     * @throws EX_UNSUPPORTED_OPERATION when the callback or the mixture of requests is not
     *     supported.
     */
    void triggerSynced(IVibratorCallback callback);

    /** Gives up what was prepared; harmless when nothing was. Needs CAP_SYNC. */
    void cancelSynced();
}
