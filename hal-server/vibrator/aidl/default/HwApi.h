// SPDX-License-Identifier: Apache-2.0
//
// The hardware layer: everything the service does to the vibrator driver.
//
// The one HwApi object of the process is built at start-up, decides which of three drivers this
// phone has (the legacy timed_output class, the LED class or a force-feedback input device) and
// then serves both binder services on that driver. What both of them do to it in their own words
// (queued strings, packets, stored patterns) is written once, beside the operations in hwapi/:
//
//   NodeIo.cpp            writing, reading and testing nodes
//   DriverWriter.h        what is done to the driver in more than one place
//   NodeStreams.cpp       the streams of the audio and GPIO nodes
//   Probing.cpp           choosing the device class and its node paths
//   BasicControl.cpp      on, off, amplitude, caller check
//   MotorType.cpp         what motor this is
//   Capabilities.cpp      what the driver offers
//   Effects.cpp           the platform's predefined effects
//   HapticEngine.cpp      packet sequences
//   PrebakedPatterns.cpp  patterns that the driver or the motor's wavetable holds
//   ForceFeedback.cpp     the force-feedback input device
//   Dump.cpp              what dumpsys shows
//   CompositeWaveform.h   the compiler of composite waveforms
//   WavetableUpload.cpp   composite waveforms for that device
//
// Failures are values: false, -1, 0 or an empty string, after one log line. Unless an operation says
// otherwise nothing throws, nothing is retried except an interrupted system call, and nothing
// already written is undone.
//
// Threads: calls come from the binder thread and from short-lived worker threads. There are no
// locks; every node access opens a descriptor of its own, and what is promised is the order of one
// caller's writes. The process-wide values at the end are written by the constructor alone, except the
// force-feedback descriptor.
#pragma once

#include <cstdint>
#include <fstream>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include <aidl/android/hardware/vibrator/Effect.h>
#include <aidl/android/hardware/vibrator/EffectStrength.h>

#include "hwapi/CompositeWaveform.h"

struct ff_effect;  // <linux/input.h>

namespace aidl::android::hardware::vibrator {

// How effects are played; getMotorPerformMethod() chooses.
inline constexpr int32_t PERFORM_NONE = 0;            // not at all: requests fail
inline constexpr int32_t PERFORM_PREBAKED_INDEX = 1;  // by the index of a stored pattern
inline constexpr int32_t PERFORM_HAPTIC_ENGINE = 2;   // by packets
inline constexpr int32_t PERFORM_AMPLITUDE = 3;       // as timed vibration at an amplitude

// What a driver may offer. The value is the position of the driver's word in FEATURE_NAMES.
enum qvx_features : int32_t {
    INTENSITY = 0,
    FORCE_TOUCH_INTENSITY = 1,
    MULTI_FREQUENCY = 2,
    HAPTIC_ENGINE = 3,
    INDEX_HAPTIC_PATTERN = 4,
    KYPINDEX_HAPTIC_PATTERN = 5,
    ENHANCED_HAPTIC_ENGINE = 6,
    FIFO_HAPTIC_ENGINE = 7,
    HYBRID_HAPTIC_ENGINE = 8,
    ENHANCED_HYBRID_HAPTIC_ENGINE = 9,
    CAPABILITY_EXTERNAL_CONTROL = 10,
    COMMON_INPUTFF_INTERFACE = 11,
    PRIMITIVE_EFFECT_COMPOSE = 12,
};

// One step of a haptic-engine sequence. Time, frequency and overdrive are the driver's own units.
struct HapticEnginePacket {
    int32_t time;
    int32_t intensity;  // 0 to 10000, scaled by the request's amplitude before it is sent
    int32_t frequency;
    int32_t overdrive;
};

// Create it with std::make_shared: a double click keeps the object alive until its second pulse.
//
// The order of the virtual operations is fixed; so are the strings passed by value.
class HwApi : public std::enable_shared_from_this<HwApi> {
  public:
    // Probes the driver, fills the process-wide values below and opens the six streams. Never
    // fails: what is missing is logged, and the operations that need it fail later.
    HwApi();
    HwApi(const HwApi&) = delete;
    HwApi& operator=(const HwApi&) = delete;

    // Closes the streams; writes nothing to the driver.
    virtual ~HwApi();

    // Whether the audio stream switch was opened.
    virtual bool hasAspEnable();
    // Reads the switch from its start ("0" or "1") into `out`; false when that fails.
    virtual bool getAspEnable(bool* out);
    // Each writes the value in decimal and a newline; false when that fails.
    virtual bool setAspEnable(bool value);
    virtual bool setGpioFallIndex(uint32_t value);
    virtual bool setGpioFallScale(uint32_t value);
    virtual bool setGpioRiseIndex(uint32_t value);
    virtual bool setGpioRiseScale(uint32_t value);

    // Has nothing to say; `fd` is not written.
    virtual void debug(int fd);

    // Writes the value in decimal and a newline, opening the node read-write. False when the
    // node cannot be opened or takes less than the whole string.
    virtual bool writeNode(std::string node, int value);
    // The same with a string of at most 18 characters, opening the node write-only. A longer one is
    // refused: false, with the node left alone. The string ends at its first zero byte.
    virtual bool writeNodeByStringOnlyForWriting(std::string node, std::string value);
    // The number that the node's first seven characters begin with; 0 when they are no number, -1
    // when the node cannot be opened or read.
    virtual int readNode(std::string node);
    // The node's first 511 bytes without white space at either end; empty when the node cannot be
    // opened or read.
    virtual std::string readNodeAsString(std::string node);

    // Whether the node can be opened read-write, read-only or write-only. A node that exists but
    // refuses that access counts as missing.
    virtual bool isNodeExist(std::string node);
    virtual bool isNodeExistForRead(std::string node);
    virtual bool isNodeExistForWrite(std::string node);
    virtual bool isVibratorNodeExist();          // TIMED_OUTPUT_ENABLE, read-write
    virtual bool isVibratorActiveNodeExist();    // LEDS_ACTIVATE, read-write
    virtual bool isVibratorDurationNodeExist();  // LEDS_DURATION, read-write
    virtual bool isVibratorStateNodeExist();     // LEDS_STATE, read-write
    virtual bool isHapticEngineNodeExist();      // THE_DEVICE_HAPTIC_ENGINE, read-write
    virtual bool isMotorTypeNodeExist();         // THE_DEVICE_MOTOR_TYPE, read-only
    virtual bool isNumWavesNodeExist();          // THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES, read-only
    // Whether both intensity lists are readable, in the information or the device class.
    virtual bool isDynamicIntensityNodeExist();
    virtual bool isPrebakedHapticPatternExist();  // THE_DEVICE_HAPTIC_ENGINE_INDEX, read-write
    // Whether the amplitude can be set: always on force feedback, else by the intensity node.
    virtual bool isAmplitudeControlExist();

    // Whether the driver's duration node says 1 or more. Always false on force feedback, which has
    // no such node.
    virtual bool isVibrating();
    // Whether a caller of this user id may use the privileged interface: root and system.
    virtual bool checkClientUID(int uid);

    // The motor index (MOTOR_TYPE_NAMES) that the motor_type node names; 0 when it cannot be read
    // or names no known motor.
    virtual int getMotorIndex();
    // The motor index guessed from the nodes that exist, for drivers without a motor_type node.
    virtual int getMotorIndexbyMethod();

    // Starts a vibration of `timeoutMs` milliseconds, passed on unchecked; false when a write
    // fails. On the LED class the writes before the failing one stand.
    virtual bool do_on(int timeoutMs);
    // Stops the vibration; false when the write fails.
    virtual bool do_off();

    // Whether the motor can play enhanced patterns: LINEAR_1040 alone can, and a driver without a
    // motor_type node when it has a haptic engine.
    virtual bool supportsEnhancedQuorvanHapticPattern();
    // The PERFORM_ value for the nodes that exist.
    virtual int getMotorPerformMethod();

    // The amplitude for a strength: 3400, 6700 or 10000; 0 for any other value.
    virtual int setPerformAmplitude(EffectStrength strength);
    // Plays two pulses of 10 and 15 ms, 70 ms apart, on a thread of its own and returns at once.
    // Throws std::system_error when no thread can be had.
    virtual void performEffect_DOUBLE_CLICK();
    // Plays the effect at the amplitude (1 to 10000) and sets `durationMs` to its length; false
    // when the effect is not offered or the driver refuses. See Effects.cpp for the lengths.
    virtual bool preparePerform(Effect effect, int amplitude, int& durationMs);
    // Plays the stored pattern once or, with `repeat`, over and over; amplitude 1 to 10000.
    virtual bool performPrebakedHapticPattern(int patternIndex, int amplitude, bool repeat);
    // Sends at most 339 packets, their intensities scaled by amplitude / 10000 (amplitude 1 to
    // 10000), and starts the motor; false when refused or not taken whole.
    virtual bool performHapticEngine(const std::vector<HapticEnginePacket>& packets, int amplitude);

    // Sets the drive amplitude, 1 to 10000; false outside that range or when the write fails.
    virtual bool setAmplitude(int amplitude);

    // Compiles a composite waveform string, uploads it and starts it. Force feedback only.
    virtual bool setAndTriggerOwt_primitve(std::string text);

    // Appends the driver's intensity list (true) or haptic intensity list (false) to `list`; false
    // when there is none or `list` stays empty. A piece that is no 32-bit number is left out.
    virtual bool getDynamicIntensityList(bool isDefaultType, std::vector<int>& list);

    // The string after "Handlers=" (key 'H') or "Sysfs=" (key 'S') in a line of the input-device
    // list, whose last character is cut off in place; null for another key or a line without it.
    // The caller releases the string with free().
    virtual char* parse_field(char* line, char key);

    // 1 when the driver lists the feature's word, also as a part of a longer word; 0 when not; -1
    // when its list cannot be opened. Compare with 1: -1 is not a yes.
    virtual int hasFeature(qvx_features feature);

    // The field (key as for parse_field) of the motor's block in the input-device list; null when
    // there is none. The caller releases the string with free().
    virtual char* get_input_field_value(char key);

    // The string without white space at its end.
    virtual std::string rtrim(const std::string& text);

    // Puts the process's one effect record and event back to their first state.
    virtual void initForceFeedbackEffect();
    // Sends the effect record to the driver, after removing the effect it holds of this process.
    virtual bool uploadForceFeedbackeffect();
    // Chooses the stored effect (0: plain timed vibration) and uploads the record.
    virtual bool setForceFeedbackIndex(int index);
    // Sets the playing time in milliseconds and uploads the record; nothing to do, and true, while
    // a stored effect is chosen.
    virtual bool setForceFeedbackDuration(int durationMs);
    // Sends the gain, on the amplitude scale 1 to 10000.
    virtual bool setForceFeedbackAmplitude(int gain);
    // Starts or stops the uploaded effect.
    virtual bool triggerForceFeedbackVibration(bool on);
    // Writes the prepared event to the input device.
    virtual bool writeInputEvent();

    // Plays one wavetable entry in a loop, at full amplitude with pauses of 10 ms. The second
    // argument is not used. Force feedback only.
    bool setAndTriggerOwt(int index, int unused);

    // Which of the platform's predefined effects are played; the list is in the order of their
    // numbers.
    static bool isPlayed(Effect effect);
    static std::vector<Effect> playedEffects();

    // Sends the amplitude, 1 to 10000, to whatever takes it on this device class.
    bool sendAmplitude(int amplitude);

    // Closes the force-feedback device if it is open. inputFD keeps its value: this is for the end.
    static void closeInputDevice();

    // The composite waveform compiler: hwapi/CompositeWaveform.h has the grammar and the layout.
    //
    // Compiles `text`, cutting it up, into `out`, which holds WT_TYPE10_COMP_BUFFER_SIZE zero bytes.
    // Returns the number of bytes written, a multiple of 4 from 4 on, or -EINVAL.
    static int wt_type10_comp_str_to_bin(char* text, uint8_t* out);

    // Applies one token, of the kind given, to the composite. Returns 0 or -EINVAL.
    static int wt_type10_comp_decode(wt_type10_comp* comp, wt_type10_comp_specifier kind,
                                     char* token);

    // Parses a waveform token. Returns 0, or -EINVAL with `out` left alone.
    static int wt_type10_comp_waveform_get(char* token, wt_type10_comp_wvfrm* out);

    // Writes the binary layout of `nsections` sections into `size` bytes at `out`, as many whole words
    // as fit. Returns the number of bytes written.
    static int wt_type10_comp_to_buffer(wt_type10_comp* comp, int size, void* out);

    // Writes to `fd` what was chosen at start-up and what the driver offers now, for people who bring
    // up a phone. Only for root, system and shell; false for others and when `fd` takes no more. Logs
    // nothing.
    bool dump(int uid, int fd);

    // Opens the stream on mPath + `name` without creating or truncating anything: read-write (the
    // write streams too) or read-only. A stream that is open already, or cannot be opened, stays
    // failed and is logged.
    void HwApiopen(const std::string& name, std::fstream* stream);
    void HwApiopen(const std::string& name, std::ofstream* stream);
    void HwApiopen(const std::string& name, std::ifstream* stream);

  private:
    // Sends `record` to the driver, after removing the effect that it holds of this process, and
    // keeps the new effect's id as the process's.
    bool upload(ff_effect& record);
    // Compiles `text`, cutting it up, and plays it. `operation` begins the log lines.
    bool playComposite(const char* operation, char* text);

    std::string describeChoice() const;

    void selectTimedOutput();
    void selectLeds();
    void selectForceFeedback();
    void switchToKypIndex(const char* node);
    void restoreCalibration();
    void openStreams();

    template <typename Stream>
    void openStream(const std::string& name, std::ios::openmode mode, Stream* stream);
    bool get(bool* value, std::fstream* stream);
    bool set(bool value, std::fstream* stream);
    bool set(uint32_t value, std::ofstream* stream);
    bool writeNumber(uint32_t value, std::ostream* stream);

    std::fstream mAspEnable;
    std::ofstream mGpioFallIndex;
    std::ofstream mGpioFallScale;
    std::ofstream mGpioRiseIndex;
    std::ofstream mGpioRiseScale;
    std::ifstream mVibState;
    int mTimedOutputError = 0;  // why each class was not chosen, as errno
    int mLedsError = 0;
    std::string mPath;                              // before every stream's node name; empty here
    std::map<const std::ios*, std::string> mNames;  // stream to node name, for failure messages
};

// Node paths of the chosen device class. Empty: this device class has no such node, or no device
// was found; every access to an empty path then fails as a missing node does.
extern std::string THE_DEVICE_FF;                       // event device of the force-feedback motor
extern std::string THE_DEVICE_INTENSITY;                // amplitude, 1 to 10000
extern std::string THE_DEVICE_FORCE_TOUCH_INTENSITY;    // amplitude of force-touch feedback
extern std::string THE_DEVICE_MULTI_FREQ;               // frequency type
extern std::string THE_DEVICE_HAPTIC_ENGINE;            // packet string
extern std::string THE_DEVICE_HAPTIC_ENGINE_INDEX;      // index of a prebaked pattern
extern std::string THE_DEVICE_HAPTIC_PLAYBACK_QUEUE;    // queue string
extern std::string THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES;  // number of prebaked patterns
extern std::string THE_DEVICE_MOTOR_TYPE;               // name of the motor's type
extern std::string THE_DEVICE_EVENT_CMD;                // commands, such as postures
extern std::string THE_DEVICE_PATTERN_LENGTH;           // duration of a prebaked pattern
extern std::string THE_DEVICE_EXT_CONTROL;              // external control; left to the driver
extern std::string THE_DEVICE_CAL_INTENSITIES;          // intensity list
extern std::string THE_DEVICE_CAL_HAPTIC_INTENSITIES;   // haptic intensity list
extern std::string THE_DEVICE_FIFO_HAPTIC_ENGINE;       // number of a FIFO pattern
extern std::string THE_DEVICE_HYBRID_HAPTIC_ENGINE;     // hybrid packet string
extern std::string THE_DEVICE_ASP_ENABLE;               // audio stream switch
extern std::string THE_DEVICE_GPIO1_FALL_INDEX;         // pattern and scale of the falling edge
extern std::string THE_DEVICE_GPIO1_FALL_DIG_SCALE;
extern std::string THE_DEVICE_GPIO1_RISE_INDEX;  // pattern and scale of the rising edge
extern std::string THE_DEVICE_GPIO1_RISE_DIG_SCALE;
extern std::string THE_DEVICE_VIB_STATE;  // what the driver is doing

inline bool useLedsClass = false;      // the LED class was chosen
inline bool useForceFeedback = false;  // the force-feedback input device was chosen
inline bool useKypIndex = false;       // the driver was asked for the platform's pattern numbers
inline int32_t motorPerformMethod = PERFORM_NONE;  // one of the PERFORM_ values

// Descriptor of the force-feedback input device; -1 until an upload or event opens it.
inline int inputFD = -1;

}  // namespace aidl::android::hardware::vibrator
