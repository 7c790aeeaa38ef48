// SPDX-License-Identifier: Apache-2.0
//
// What the services tell those who bring up a phone.
#include <sys/mman.h>
#include <unistd.h>

#include <array>
#include <memory>
#include <string>

#include "tests/extension_test.h"
#include "tests/force_feedback_phone.h"
#include "tests/vibrator_test.h"

namespace aidl::android::hardware::vibrator {
namespace {

using ::testing::HasSubstr;
using ::testing::IsEmpty;

// What the service writes when this user asks, and the status.
template <typename Service>
std::pair<binder_status_t, std::string> dump(Service& service, uid_t uid) {
    const CallingUid caller(uid);
    const int file = memfd_create("dump", MFD_CLOEXEC);
    const binder_status_t status = service.dump(file, nullptr, 0);
    std::array<char, 8192> text = {};
    const ssize_t size = pread(file, text.data(), text.size(), 0);
    close(file);
    return {status, std::string(text.data(), static_cast<size_t>(size))};
}

using Dump = VibratorTest;

TEST_F(Dump, TellsOfAPhoneOfTheLedClass) {
    kernel.addNode(kLeds + "intensity");
    kernel.addNode(kLeds + "motor_type", "LINEAR_1040\n", fake::Access::kReadOnly);
    kernel.addNode(kLeds + "event_cmd", "", fake::Access::kWriteOnly);
    kernel.addNode(kInfo + "functions", "INTENSITY\nPRIMITIVE_EFFECT_COMPOSE\n",
                   fake::Access::kReadOnly);
    const auto [status, text] = dump(*makeVibrator(), 2000);
    EXPECT_EQ(status, STATUS_OK);
    EXPECT_EQ(text,
              "device classes, as found at start-up:\n"
              "  timed_output: no, No such file or directory\n"
              "  leds: chosen\n"
              "  force feedback: not looked for\n"
              "perform method: amplitude\n"
              "motor type: LINEAR_1040\n"
              "platform's pattern numbers: no\n"
              "capabilities: amplitude-control compose-effects\n"
              "features: INTENSITY PRIMITIVE_EFFECT_COMPOSE\n"
              "nodes:\n"
              "  /sys/class/timed_output/vibrator/enable: No such file or directory\n"
              "  /sys/class/leds/vibrator/activate: read-write\n"
              "  /sys/class/leds/vibrator/duration: read-write\n"
              "  /sys/class/leds/vibrator/state: read-write\n"
              "  /sys/class/vib_info_class/vib_support_info/functions: read-only\n"
              "  /sys/class/vib_info_class/vib_support_info/intensities: No such file or "
              "directory\n"
              "  /sys/class/vib_info_class/vib_support_info/haptic_intensities: No such file or "
              "directory\n"
              "  /sys/class/leds/vibrator/intensity: read-write\n"
              "  /sys/class/leds/vibrator/force_touch_intensity: No such file or directory\n"
              "  /sys/class/leds/vibrator/multi_freq: No such file or directory\n"
              "  /sys/class/leds/vibrator/haptic_engine: No such file or directory\n"
              "  /sys/class/leds/vibrator/cp_trigger_index: No such file or directory\n"
              "  /sys/class/leds/vibrator/cp_trigger_queue: No such file or directory\n"
              "  /sys/class/leds/vibrator/num_waves: No such file or directory\n"
              "  /sys/class/leds/vibrator/motor_type: read-only\n"
              "  /sys/class/leds/vibrator/event_cmd: write-only\n"
              "  /sys/class/leds/vibrator/intensities: No such file or directory\n"
              "  /sys/class/leds/vibrator/haptic_intensities: No such file or directory\n"
              "  /sys/class/leds/vibrator/fifo: No such file or directory\n"
              "  /sys/class/leds/vibrator/hybrid_haptic_engine: No such file or directory\n");
}

TEST_F(Dump, NamesEveryPerformMethod) {
    kernel.addNode(kLeds + "haptic_engine");
    EXPECT_THAT(dump(*makeVibrator(), 0).second, HasSubstr("\nperform method: haptic engine\n"));
    kernel.addNode(kLeds + "cp_trigger_index");
    EXPECT_THAT(dump(*makeVibrator(), 0).second, HasSubstr("\nperform method: prebaked index\n"));
}

TEST_F(Dump, TakesNoListedFeatureForAnother) {
    kernel.addNode(kInfo + "functions", "INTENSITY\n", fake::Access::kReadOnly);
    EXPECT_THAT(dump(*makeVibrator(), 0).second,
                HasSubstr("\ncapabilities:\nfeatures: INTENSITY\n"));
}

TEST_F(Dump, LogsAndWritesNothing) {
    const auto vibrator = makeVibrator();
    dump(*vibrator, 0);
    EXPECT_THAT(log.lines(), IsEmpty());
    EXPECT_THAT(kernel.writes(), IsEmpty());
}

TEST_F(Dump, IsForRootSystemAndShellOnly) {
    const auto vibrator = makeVibrator();
    for (const uid_t uid : {0, 1000, 2000}) EXPECT_EQ(dump(*vibrator, uid).first, STATUS_OK) << uid;
    kernel.clear();
    for (const uid_t uid : {1, 999, 1001, 1999, 2001, 10000}) {
        const auto [status, text] = dump(*vibrator, uid);
        EXPECT_EQ(status, STATUS_PERMISSION_DENIED) << uid;
        EXPECT_EQ(text, "") << uid;
    }
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_F(Dump, SaysThatTheLegacyClassWonOrThatThereIsNone) {
    addLegacyClass();
    EXPECT_THAT(dump(*makeVibrator(), 0).second, HasSubstr("  timed_output: chosen\n"
                                                           "  leds: not looked for\n"
                                                           "  force feedback: not looked for\n"
                                                           "perform method: none\n"
                                                           "motor type: unknown\n"));
    kernel.removeNode(kLegacy + "enable");
    kernel.removeNode(kLeds + "state");
    EXPECT_THAT(dump(*makeVibrator(), 0).second,
                HasSubstr("  timed_output: no, No such file or directory\n"
                          "  leds: no, No such file or directory\n"
                          "  force feedback: no, the input-device list names no such motor\n"));
}

TEST_F(Dump, OfTheExtensionIsTheSame) {
    const auto hwApi = makeHwApi();
    const auto standard = ndk::SharedRefBase::make<Vibrator>(hwApi);
    const auto extension =
            ndk::SharedRefBase::make<::aidl::vendor::quorvan::hardware::vibrator::Vibrator>(hwApi);
    EXPECT_EQ(dump(*extension, 0), dump(*standard, 0));
    EXPECT_EQ(dump(*extension, 1001).first, STATUS_PERMISSION_DENIED);
}

using DumpOnForceFeedback = ForceFeedbackPhone;

TEST_F(DumpOnForceFeedback, TellsThePatternNumbersAndExternalControl) {
    kernel.addNode(kControl + "use_kyp_index");
    kernel.addNode(kInfo + "functions", "CAPABILITY_EXTERNAL_CONTROL\n", fake::Access::kReadOnly);
    EXPECT_THAT(dump(*ndk::SharedRefBase::make<Vibrator>(makeHwApi()), 0).second,
                HasSubstr("platform's pattern numbers: yes\n"
                          "capabilities: amplitude-control external-control "
                          "external-amplitude-control\n"
                          "features: CAPABILITY_EXTERNAL_CONTROL\n"));
}

TEST_F(DumpOnForceFeedback, TellsTheUploadedEffect) {
    const auto hwApi = makeHwApi();
    const auto vibrator = ndk::SharedRefBase::make<Vibrator>(hwApi);
    EXPECT_THAT(dump(*vibrator, 0).second, HasSubstr("  force feedback: chosen\n"
                                                     "perform method: prebaked index\n"
                                                     "motor type: unknown\n"
                                                     "platform's pattern numbers: no\n"
                                                     "capabilities: amplitude-control\n"
                                                     "features:\n"
                                                     "uploaded effect: none\n"));
    ASSERT_TRUE(hwApi->do_on(500));
    EXPECT_THAT(dump(*vibrator, 0).second, HasSubstr("uploaded effect: id 0, index 0, 500 ms\n"));
    EXPECT_THAT(dump(*vibrator, 0).second, HasSubstr("  /dev/input/event7: read-write\n"));
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
