// SPDX-License-Identifier: Apache-2.0
package vendor.quorvan.hardware.vibrator;

import android.hardware.vibrator.Effect;
import android.hardware.vibrator.IVibratorCallback;
import vendor.quorvan.hardware.vibrator.ZelAmplitudeType;
import vendor.quorvan.hardware.vibrator.ZelFifoType;
import vendor.quorvan.hardware.vibrator.ZelFolderStatus;
import vendor.quorvan.hardware.vibrator.ZelFolderTentModeStatus;
import vendor.quorvan.hardware.vibrator.ZelFrequencyType;
import vendor.quorvan.hardware.vibrator.ZelHapticEnginePacket;
import vendor.quorvan.hardware.vibrator.ZelHybridHapticEnginePacket;
import vendor.quorvan.hardware.vibrator.ZelPlaybackPacket;

/**
 * The vendor's own requests to the vibration motor, beside those of the platform's IVibrator. This
 * is version 4 of the interface.
 *
 * It has no name at the service manager: a client gets the platform's IVibrator/default and asks
 * that binder for its extension. The service serves one call at a time and keeps no state between
 * calls; what a call sets is kept by the driver.
 *
 * Who may call: user ids 0 (root) and 1000 (system). Any other caller is refused, and nothing is
 * read, written or played for it. A refusal is no exception, except in supportsHasFeature and
 * hasFeature, which raise EX_SECURITY; elsewhere a method with a result answers false, 0 or an
 * empty list, and a method without one returns as if it had worked.
 *
 * The supports methods never raise an exception for a caller who is let in, supportsHasFeature
 * included. Where a feature word is named with one of them, the answer is whether the driver's
 * functions node lists a word that contains it (so FIFO_HAPTIC_ENGINE also stands for
 * HAPTIC_ENGINE); only when that node cannot be read does what stands behind "else" decide.
 *
 * Amplitudes are on a scale of 1 (the weakest) to 10000 (the strongest).
 *
 * A request that a method refuses with EX_ILLEGAL_ARGUMENT has touched no node. EX_ILLEGAL_STATE
 * tells that the driver lacks the node or failed; what was written before the failure stays. Where
 * the motor is driven through the force-feedback input device, of all nodes named here only
 * event_cmd, functions and the intensity tables are in use.
 */
@VintfStability
interface IZelVibrator {
    /**
     * Tells whether setAmplitude works. Feature word INTENSITY, else the node intensity or the
     * force-feedback input device.
     *
     * @return false for a refused caller too.
     */
    boolean supportsAmplitudeControl();

    /**
     * Tells whether setForceTouchAmplitude works. Feature word FORCE_TOUCH_INTENSITY, else the node
     * force_touch_intensity.
     *
     * @return false for a refused caller too.
     */
    boolean supportsForceTouchAmplitudeControl();

    /**
     * Tells whether setFrequencyType works. Feature word MULTI_FREQUENCY, else the node multi_freq.
     *
     * @return false for a refused caller too.
     */
    boolean supportsFrequencyControl();

    /**
     * Tells whether the motor takes haptic-engine packets. Feature word HAPTIC_ENGINE, else the
     * node haptic_engine or the force-feedback input device (where performHapticEngine plays
     * nothing).
     *
     * @return false for a refused caller too.
     */
    boolean supportsHapticEngine();

    /**
     * Tells whether the driver holds patterns for performPrebakedHapticPattern. Feature word
     * INDEX_HAPTIC_PATTERN, else the node cp_trigger_index or the force-feedback input device.
     *
     * @return false for a refused caller too.
     */
    boolean supportsPrebakedHapticPattern();

    /**
     * Tells whether setFolderStatus works: whether the text of the node event_cmd holds at least
     * one of the letters D, F, L, O. The letters are looked for one by one, not as a word, and the
     * text's last character is not looked at (it is the driver's newline).
     *
     * @return false for a refused caller, and when the node cannot be read.
     */
    boolean supportsFolderStatusSetting();

    /**
     * Tells whether the motor plays the vendor's enhanced haptic patterns. Feature word
     * ENHANCED_HAPTIC_ENGINE, else the motor type LINEAR_1040, else, without a motor type node, the
     * node haptic_engine.
     *
     * @return false for a refused caller too.
     */
    boolean supportsEnhancedQuorvanHapticPattern();

    /**
     * Sets the amplitude of vibrations to come. Starts none.
     *
     * @param amplitude 1 to 10000.
     * @throws EX_ILLEGAL_ARGUMENT when the amplitude is outside its range.
     * @throws EX_ILLEGAL_STATE when the driver did not take it.
     */
    void setAmplitude(int amplitude);

    /**
     * Sets the amplitude of the feedback that the force-touch sensor gives. Starts no vibration.
     *
     * @param amplitude 1 to 10000.
     * @throws EX_ILLEGAL_ARGUMENT when the amplitude is outside its range.
     * @throws EX_ILLEGAL_STATE when the driver did not take it.
     */
    void setForceTouchAmplitude(int amplitude);

    /**
     * Chooses the frequency of vibrations to come. Starts none.
     *
     * @param type its number, 0 to 4, is what the driver gets.
     * @throws EX_ILLEGAL_ARGUMENT when the number is not one of ZelFrequencyType.
     * @throws EX_ILLEGAL_STATE when the driver did not take it.
     */
    void setFrequencyType(ZelFrequencyType type);

    /**
     * Tells the driver whether the foldable device is open or closed. Starts no vibration.
     *
     * @param status OPEN sends the text FOLDER_OPEN, CLOSED sends FOLDER_CLOSE, each with a
     *     newline, to the node event_cmd.
     * @throws EX_ILLEGAL_ARGUMENT when the number is not one of ZelFolderStatus.
     * @throws EX_ILLEGAL_STATE when the driver did not take the whole text.
     */
    void setFolderStatus(ZelFolderStatus status);

    /**
     * Tells how many patterns the driver holds for performPrebakedHapticPattern.
     *
     * @return the number in the first 7 characters of the node num_waves, 0 when there is no number
     *     in it, -1 when reading failed; 0 for a refused caller.
     * @throws EX_UNSUPPORTED_OPERATION when there is no such node.
     */
    int getNumberOfPrebakedHapticPattern();

    /**
     * Plays a sequence of packets on the haptic engine.
     *
     * With the force-feedback input device a correct request is answered with success and nothing
     * is played.
     *
     * @param packets the packets in the order of playing, at most 339. An empty list is sent to the
     *     driver as it is.
     * @param amplitude 1 to 10000; each packet's intensity is scaled by amplitude / 10000.
     * @throws EX_ILLEGAL_ARGUMENT when there are more than 339 packets or the amplitude is outside
     *     its range.
     * @throws EX_ILLEGAL_STATE when the driver did not take all packets.
     */
    void performHapticEngine(in ZelHapticEnginePacket[] packets, int amplitude);

    /**
     * Plays a pattern that the driver holds.
     *
     * @param patternIndex number of the pattern. 0 played once only leaves amplitude and number in
     *     the driver and switches nothing on; 0 repeated cannot be played on the force-feedback
     *     input device.
     * @param amplitude 1 to 10000. Where the driver has a queue of patterns, a repeated one enters
     *     it with amplitude / 100, rounded down.
     * @param repeat false plays the pattern once, true hands it to the driver as a repeating one.
     * @throws EX_ILLEGAL_ARGUMENT when the amplitude is outside its range.
     * @throws EX_ILLEGAL_STATE when the driver did not take the request, and for pattern 0 repeated
     *     on the force-feedback input device.
     */
    void performPrebakedHapticPattern(int patternIndex, int amplitude, boolean repeat);

    /**
     * Lists the amplitude steps that the motor offers: as the driver's intensity tables give them,
     * or, where it has none, as they were chosen for the type of motor.
     *
     * @param type which of the two lists.
     * @return the steps as the driver gives them, or ascending from 0 to at most 10000; empty for a
     *     refused caller.
     * @throws EX_ILLEGAL_ARGUMENT when the number is not one of ZelAmplitudeType.
     * @throws EX_ILLEGAL_STATE when the driver's table cannot be read or the motor is not known.
     * @throws EX_UNSUPPORTED_OPERATION when there are no steps for this type of motor.
     */
    int[] getAmplitudeList(ZelAmplitudeType type);

    /**
     * Plays a predefined effect of the platform at an amplitude of the caller's choice.
     *
     * The arguments are examined in this order: callback, effect, amplitude.
     *
     * @param effect CLICK, DOUBLE_CLICK, TICK or HEAVY_CLICK.
     * @param amplitude 1 to 10000.
     * @param callback must be null: the end of an effect is not reported.
     * @return how long the effect lasts, in milliseconds; 0 for a refused caller.
     * @throws EX_UNSUPPORTED_OPERATION when the motor plays no effects, a callback is given, or the
     *     effect is another one.
     * @throws EX_ILLEGAL_ARGUMENT when the amplitude is outside its range.
     * @throws EX_ILLEGAL_STATE when the driver did not take the effect.
     */
    int perform(Effect effect, int amplitude, IVibratorCallback callback);

    /**
     * Plays a sequence of patterns that the driver holds, each at its own level.
     *
     * @param packets the patterns in the order of playing: 1 to 200.
     * @param repeat whether repeatCnt counts; false plays the sequence once.
     * @param repeatCnt with repeat, the number of repetitions given to the driver: 0 or more, 0
     *     meaning without end. Not looked at without repeat.
     * @throws EX_ILLEGAL_ARGUMENT when there are no packets or more than 200, or repeat is given
     *     with a negative count.
     * @throws EX_ILLEGAL_STATE when the driver did not take the whole sequence.
     */
    void performPlaybackEngine(in ZelPlaybackPacket[] packets, boolean repeat, int repeatCnt);

    /**
     * Tells whether performFifoHapticEngine works. Feature word FIFO_HAPTIC_ENGINE, else the node
     * fifo.
     *
     * @return false for a refused caller too.
     */
    boolean supportsFifoHapticEngine();

    /**
     * Tells whether performHybridHapticEngine works. Feature word HYBRID_HAPTIC_ENGINE, else the
     * node hybrid_haptic_engine.
     *
     * @return false for a refused caller too.
     */
    boolean supportsHybridHapticEngine();

    /**
     * Tells whether the motor plays enhanced hybrid patterns. Feature word
     * ENHANCED_HYBRID_HAPTIC_ENGINE, else motor type number 11.
     *
     * @return false for a refused caller too.
     */
    boolean supportsEnhancedHybridHapticPattern();

    /**
     * Plays one of the driver's FIFO patterns. The driver starts it as soon as it has the number.
     *
     * @param type number of the pattern, 0 to 25.
     * @throws EX_ILLEGAL_ARGUMENT when the number is not one of ZelFifoType.
     * @throws EX_ILLEGAL_STATE when the driver did not take it.
     */
    void performFifoHapticEngine(ZelFifoType type);

    /**
     * Plays a sequence of hybrid packets on the haptic engine.
     *
     * A driver that takes only a part of the sequence, or none of it, after the node was opened is
     * not reported: the call succeeds, and nothing is switched on.
     *
     * @param packets the packets in the order of playing, at most 339. An empty list is sent to the
     *     driver as it is.
     * @param amplitude 1 to 10000; each packet's intensity is scaled by amplitude / 10000.
     * @throws EX_ILLEGAL_ARGUMENT when there are more than 339 packets or the amplitude is outside
     *     its range.
     * @throws EX_ILLEGAL_STATE when the node hybrid_haptic_engine cannot be opened.
     */
    void performHybridHapticEngine(in ZelHybridHapticEnginePacket[] packets, int amplitude);

    /**
     * Tells whether setFolderTentModeStatus works: whether the text of the node event_cmd holds at
     * least one of the letters E, N, T, looked for as in supportsFolderStatusSetting.
     *
     * @return false for a refused caller, and when the node cannot be read.
     */
    boolean supportsFolderTentModeStatusSetting();

    /**
     * Tells the driver whether the foldable device's tent mode is open or closed. Starts no
     * vibration.
     *
     * @param status OPEN sends the text FOLDER_TENT_OPEN, CLOSED sends FOLDER_TENT_CLOSE, each with
     *     a newline, to the node event_cmd.
     * @throws EX_ILLEGAL_ARGUMENT when the number is not one of ZelFolderTentModeStatus.
     * @throws EX_ILLEGAL_STATE when the driver did not take the whole text.
     */
    void setFolderTentModeStatus(ZelFolderTentModeStatus status);

    /**
     * Tells whether hasFeature works: whether the driver's functions node can be read.
     *
     * @return true when it can.
     * @throws EX_SECURITY when the caller is neither root nor system.
     */
    boolean supportsHasFeature();

    /**
     * Tells whether the driver's functions node lists a word. Unlike the supports methods it
     * compares whole words, separated by single spaces, letter by letter, within the node's first
     * 511 bytes.
     *
     * @param featureName the word, for example HAPTIC_ENGINE; not empty.
     * @return true when the word is listed.
     * @throws EX_SECURITY when the caller is neither root nor system.
     * @throws EX_ILLEGAL_ARGUMENT when the word is empty.
     * @throws EX_UNSUPPORTED_OPERATION when the functions node cannot be read.
     */
    boolean hasFeature(String featureName);
}
