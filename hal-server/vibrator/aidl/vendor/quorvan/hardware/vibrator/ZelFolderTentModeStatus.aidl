// SPDX-License-Identifier: Apache-2.0
package vendor.quorvan.hardware.vibrator;

/** State of a foldable device's tent mode, for IZelVibrator.setFolderTentModeStatus. */
@VintfStability
@Backing(type="int")
enum ZelFolderTentModeStatus {
    /** The driver is told FOLDER_TENT_OPEN. */
    OPEN = 0,
    /** The driver is told FOLDER_TENT_CLOSE. */
    CLOSED = 1,
}
