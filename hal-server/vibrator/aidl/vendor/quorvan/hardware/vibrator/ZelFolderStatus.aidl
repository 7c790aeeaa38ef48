// SPDX-License-Identifier: Apache-2.0
package vendor.quorvan.hardware.vibrator;

/** Posture of a foldable device, for IZelVibrator.setFolderStatus. */
@VintfStability
@Backing(type="int")
enum ZelFolderStatus {
    /** The device is unfolded. */
    OPEN = 0,
    /** The device is folded. */
    CLOSED = 1,
}
