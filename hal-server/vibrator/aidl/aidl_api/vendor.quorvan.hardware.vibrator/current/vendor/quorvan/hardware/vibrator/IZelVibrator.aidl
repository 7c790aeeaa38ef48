// SPDX-License-Identifier: Apache-2.0
// One version of this type as `aidl --dumpapi` wrote it. A numbered version is what its users were
// built against: the version's hash covers every byte, so it is never edited, only followed by the
// next. Change the source beside aidl_api/ instead.

package vendor.quorvan.hardware.vibrator;
@VintfStability
interface IZelVibrator {
  boolean supportsAmplitudeControl();
  boolean supportsForceTouchAmplitudeControl();
  boolean supportsFrequencyControl();
  boolean supportsHapticEngine();
  boolean supportsPrebakedHapticPattern();
  boolean supportsFolderStatusSetting();
  boolean supportsEnhancedQuorvanHapticPattern();
  void setAmplitude(int amplitude);
  void setForceTouchAmplitude(int amplitude);
  void setFrequencyType(vendor.quorvan.hardware.vibrator.ZelFrequencyType type);
  void setFolderStatus(vendor.quorvan.hardware.vibrator.ZelFolderStatus status);
  int getNumberOfPrebakedHapticPattern();
  void performHapticEngine(in vendor.quorvan.hardware.vibrator.ZelHapticEnginePacket[] packets, int amplitude);
  void performPrebakedHapticPattern(int patternIndex, int amplitude, boolean repeat);
  int[] getAmplitudeList(vendor.quorvan.hardware.vibrator.ZelAmplitudeType type);
  int perform(android.hardware.vibrator.Effect effect, int amplitude, android.hardware.vibrator.IVibratorCallback callback);
  void performPlaybackEngine(in vendor.quorvan.hardware.vibrator.ZelPlaybackPacket[] packets, boolean repeat, int repeatCnt);
  boolean supportsFifoHapticEngine();
  boolean supportsHybridHapticEngine();
  boolean supportsEnhancedHybridHapticPattern();
  void performFifoHapticEngine(vendor.quorvan.hardware.vibrator.ZelFifoType type);
  void performHybridHapticEngine(in vendor.quorvan.hardware.vibrator.ZelHybridHapticEnginePacket[] packets, int amplitude);
  boolean supportsFolderTentModeStatusSetting();
  void setFolderTentModeStatus(vendor.quorvan.hardware.vibrator.ZelFolderTentModeStatus status);
  boolean supportsHasFeature();
  boolean hasFeature(String featureName);
}
