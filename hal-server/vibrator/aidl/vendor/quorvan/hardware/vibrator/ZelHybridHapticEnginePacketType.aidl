// SPDX-License-Identifier: Apache-2.0
package vendor.quorvan.hardware.vibrator;

/** How the value of a ZelHybridHapticEnginePacket is written to the driver. */
@VintfStability
@Backing(type="int")
enum ZelHybridHapticEnginePacketType {
    /** As a bare number, such as 3. */
    PLAIN = 0,
    /** As a number behind a number sign, such as #3. */
    PREFIXED = 1,
}
