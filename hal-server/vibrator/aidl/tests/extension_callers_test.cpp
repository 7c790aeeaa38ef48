// SPDX-License-Identifier: Apache-2.0
//
// Who may call the extension: root and the system user, and what everybody else gets from each
// method.
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include "tests/extension_test.h"

namespace aidl::vendor::quorvan::hardware::vibrator {
namespace {

using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;

// The exception's number, and after a space the result.
std::string answer(const ndk::ScopedAStatus& status) {
    return std::to_string(exceptionOf(status));
}

std::string answer(const ndk::ScopedAStatus& status, bool result) {
    return answer(status) + (result ? " true" : " false");
}

std::string answer(const ndk::ScopedAStatus& status, int32_t result) {
    return answer(status) + ' ' + std::to_string(result);
}

std::string answer(const ndk::ScopedAStatus& status, const std::vector<int32_t>& result) {
    return answer(status) + (result.empty() ? " empty" : " not empty");
}

// The results begin as something else than a refusal's, to see that it sets them.
template <ndk::ScopedAStatus (Vibrator::*query)(bool*)>
std::string ask(Vibrator& extension) {
    bool result = true;
    const ndk::ScopedAStatus status = (extension.*query)(&result);
    return answer(status, result);
}

std::string countPatterns(Vibrator& extension) {
    int32_t count = 77;
    const ndk::ScopedAStatus status = extension.getNumberOfPrebakedHapticPattern(&count);
    return answer(status, count);
}

std::string listAmplitudes(Vibrator& extension) {
    std::vector<int32_t> list;
    const ndk::ScopedAStatus status = extension.getAmplitudeList(ZelAmplitudeType::DEFAULT, &list);
    return answer(status, list);
}

std::string performClick(Vibrator& extension) {
    int32_t durationMs = 77;
    const ndk::ScopedAStatus status =
            extension.perform(core::Effect::CLICK, 5000, nullptr, &durationMs);
    return answer(status, durationMs);
}

std::string lookUp(Vibrator& extension) {
    bool result = true;
    const ndk::ScopedAStatus status = extension.hasFeature("INTENSITY", &result);
    return answer(status, result);
}

struct Method {
    const char* name;
    std::string (*call)(Vibrator& extension);  // with arguments that are good
    const char* refusal;                       // its answer
    std::vector<std::string> lines;            // that it logs before the refusal
    const char* prefix;                        // of the refusal's own line
};

const Method kMethods[] = {
        {"supportsAmplitudeControl",
         ask<&Vibrator::supportsAmplitudeControl>,
         "0 false",
         {"I V_4_0: supportsAmplitudeControl"},
         ""},
        {"supportsForceTouchAmplitudeControl",
         ask<&Vibrator::supportsForceTouchAmplitudeControl>,
         "0 false",
         {"I V_4_0: supportsForceTouchAmplitudeControl"},
         ""},
        {"supportsFrequencyControl",
         ask<&Vibrator::supportsFrequencyControl>,
         "0 false",
         {"I V_4_0: supportsFrequencyControl"},
         ""},
        {"supportsHapticEngine",
         ask<&Vibrator::supportsHapticEngine>,
         "0 false",
         {"I V_4_0: supportsHapticEngine"},
         ""},
        {"supportsPrebakedHapticPattern",
         ask<&Vibrator::supportsPrebakedHapticPattern>,
         "0 false",
         {"I V_4_0: supportsPrebakedHapticPattern"},
         ""},
        {"supportsFolderStatusSetting",
         ask<&Vibrator::supportsFolderStatusSetting>,
         "0 false",
         {"I V_4_0: supportsFolderStatusSetting"},
         ""},
        {"supportsEnhancedQuorvanHapticPattern",
         ask<&Vibrator::supportsEnhancedQuorvanHapticPattern>,
         "0 false",
         {"I V_4_0: supportsEnhancedQuorvanHapticPattern"},
         ""},
        {"setAmplitude",
         [](Vibrator& extension) { return answer(extension.setAmplitude(5000)); },
         "0",
         {"I V_4_0: setAmplitude 5000"},
         ""},
        {"setForceTouchAmplitude",
         [](Vibrator& extension) { return answer(extension.setForceTouchAmplitude(5000)); },
         "0",
         {"I V_4_0: setForceTouchAmplitude 5000"},
         ""},
        {"setFrequencyType",
         [](Vibrator& extension) {
             return answer(extension.setFrequencyType(ZelFrequencyType::FREQUENCY_3));
         },
         "0",
         {"I V_4_0: setFrequencyType3"},
         ""},
        {"setFolderStatus",
         [](Vibrator& extension) {
             return answer(extension.setFolderStatus(ZelFolderStatus::CLOSED));
         },
         "0",
         {"I V_4_0: setFolderStatus1"},
         ""},
        {"getNumberOfPrebakedHapticPattern",
         countPatterns,
         "0 0",
         {"I V_4_0: getNumberOfPrebakedHapticPattern"},
         ""},
        {"performHapticEngine",
         [](Vibrator& extension) { return answer(extension.performHapticEngine({}, 5000)); },
         "0",
         {"I V_4_0: performHapticEngine"},
         ""},
        {"performPrebakedHapticPattern",
         [](Vibrator& extension) {
             return answer(extension.performPrebakedHapticPattern(7, 5000, true));
         },
         "0",
         {"I V_4_0: performPrebakedHapticPattern 7 : 5000 : 1"},
         ""},
        {"getAmplitudeList", listAmplitudes, "0 empty", {"I V_4_0: getAmplitudeList"}, ""},
        {"perform", performClick, "0 0", {"I V_4_0: perform for QVX"}, ""},
        {"performPlaybackEngine",
         [](Vibrator& extension) {
             return answer(extension.performPlaybackEngine({ZelPlaybackPacket()}, false, 0));
         },
         "0",
         {"I V_4_0: performPlaybackEngine"},
         ""},
        {"supportsFifoHapticEngine",
         ask<&Vibrator::supportsFifoHapticEngine>,
         "0 false",
         {"I V_4_0: supportsFifoHapticEngine"},
         ""},
        {"supportsHybridHapticEngine",
         ask<&Vibrator::supportsHybridHapticEngine>,
         "0 false",
         {"I V_4_0: supportsHybridHapticEngine"},
         ""},
        {"supportsEnhancedHybridHapticPattern",
         ask<&Vibrator::supportsEnhancedHybridHapticPattern>,
         "0 false",
         {"I V_4_0: supportsEnhancedHybridHapticPattern"},
         ""},
        {"performFifoHapticEngine",
         [](Vibrator& extension) {
             return answer(extension.performFifoHapticEngine(ZelFifoType::PATTERN_25));
         },
         "0",
         {"I V_4_0: performFifoHapticEngine"},
         ""},
        {"performHybridHapticEngine",
         [](Vibrator& extension) { return answer(extension.performHybridHapticEngine({}, 5000)); },
         "0",
         {"I V_4_0: performHybridHapticEngine"},
         ""},
        {"supportsFolderTentModeStatusSetting",
         ask<&Vibrator::supportsFolderTentModeStatusSetting>,
         "0 false",
         {"I V_4_0: supportsFolderTentModeStatusSetting"},
         ""},
        {"setFolderTentModeStatus",
         [](Vibrator& extension) {
             return answer(extension.setFolderTentModeStatus(ZelFolderTentModeStatus::OPEN));
         },
         "0",
         {"I V_4_0: setFolderTentModeStatus0"},
         ""},
        {"supportsHasFeature",
         ask<&Vibrator::supportsHasFeature>,
         "-1 false",
         {},
         "[supportsHasFeature]Fail - "},
        {"hasFeature",
         lookUp,
         "-1 false",
         {"I V_4_0: [hasFeature]featureName: INTENSITY ,length: 9"},
         "[hasFeature]Fail - "},
};

// A phone on which every method has something to do.
class ExtensionCaller : public ExtensionTest {
  protected:
    ExtensionCaller() {
        addLedsClass();
        addNodes(kLeds, {"intensity", "force_touch_intensity", "multi_freq", "haptic_engine",
                         "cp_trigger_index", "cp_trigger_queue", "num_waves", "motor_type",
                         "event_cmd", "fifo", "hybrid_haptic_engine"});
        kernel.addNode(kInfo + "functions", "INTENSITY", fake::Access::kReadOnly);
        kernel.addNode(kInfo + "intensities", "0,10000\n", fake::Access::kReadOnly);
        kernel.addNode(kInfo + "haptic_intensities", "0,5000\n", fake::Access::kReadOnly);
    }
};

class ExtensionCallerOf : public ExtensionCaller, public testing::WithParamInterface<Method> {};

TEST_P(ExtensionCallerOf, OtherUsersAreLoggedAndRefusedAndTheDriverLeftAlone) {
    const Method& method = GetParam();
    const auto extension = makeExtension();
    for (const int uid : {1, 999, 1001, 2000, 10123, 1010123, 2147483647}) {
        log.clear();
        const CallingUid caller(static_cast<uid_t>(uid));
        EXPECT_EQ(method.call(*extension), method.refusal) << uid;
        std::vector<std::string> lines = method.lines;
        lines.push_back(std::string("I V_4_0: ") + method.prefix + "Pemission denied (" +
                        std::to_string(uid) + ")");
        EXPECT_EQ(log.lines(), lines) << uid;
        EXPECT_THAT(log.tags(), ElementsAre("QvxVibrator-HAL-AIDL-EXT")) << uid;
    }
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_P(ExtensionCallerOf, RootAndSystemReachTheDriver) {
    const auto extension = makeExtension();
    for (const uid_t uid : {0U, 1000U}) {
        kernel.clear();
        log.clear();
        const CallingUid caller(uid);
        EXPECT_THAT(GetParam().call(*extension), testing::StartsWith("0")) << uid;
        EXPECT_THAT(log.lines(), Not(Contains(HasSubstr("Pemission denied")))) << uid;
        EXPECT_THAT(kernel.calls(), Not(IsEmpty())) << uid;
    }
}

INSTANTIATE_TEST_SUITE_P(Methods, ExtensionCallerOf, testing::ValuesIn(kMethods), rowName<Method>);

TEST_F(ExtensionCaller, WhoIsRefusedIsNotToldOfBadArguments) {
    const auto extension = makeExtension();
    const CallingUid shell(2000);
    EXPECT_TRUE(extension->setAmplitude(0).isOk());
    EXPECT_TRUE(extension->setForceTouchAmplitude(10001).isOk());
    EXPECT_TRUE(extension->setFrequencyType(static_cast<ZelFrequencyType>(5)).isOk());
    EXPECT_TRUE(extension->setFolderStatus(static_cast<ZelFolderStatus>(2)).isOk());
    EXPECT_TRUE(
            extension->setFolderTentModeStatus(static_cast<ZelFolderTentModeStatus>(-1)).isOk());
    EXPECT_TRUE(extension->performHapticEngine(std::vector<ZelHapticEnginePacket>(340), 0).isOk());
    EXPECT_TRUE(
            extension->performHybridHapticEngine(std::vector<ZelHybridHapticEnginePacket>(340), 0)
                    .isOk());
    EXPECT_TRUE(extension->performFifoHapticEngine(static_cast<ZelFifoType>(26)).isOk());
    EXPECT_TRUE(extension->performPrebakedHapticPattern(0, 0, true).isOk());
    EXPECT_TRUE(extension->performPlaybackEngine({}, true, -1).isOk());
    int32_t durationMs = 77;
    EXPECT_TRUE(extension->perform(core::Effect::THUD, 0, callback, &durationMs).isOk());
    EXPECT_EQ(durationMs, 0);
    std::vector<int32_t> list = {5};
    EXPECT_TRUE(extension->getAmplitudeList(static_cast<ZelAmplitudeType>(2), &list).isOk());
    EXPECT_THAT(list, IsEmpty());
    bool result = true;
    EXPECT_EQ(exceptionOf(extension->hasFeature("", &result)), EX_SECURITY);
    EXPECT_FALSE(result);
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_F(ExtensionCaller, WhoIsRefusedMayPassANullVectorAndNothingIsTouched) {
    const auto extension = makeExtension();
    const CallingUid shell(2000);
    EXPECT_TRUE(extension->getAmplitudeList(ZelAmplitudeType::DEFAULT, nullptr).isOk());
    EXPECT_THAT(log.lines(),
                ElementsAre("I V_4_0: getAmplitudeList", "I V_4_0: Pemission denied (2000)"));
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

// The caller check is the hardware layer's, asked with the caller's own number.
class OneUserOnly : public core::HwApi {
  public:
    bool checkClientUID(int uid) override { return uid == 4711; }
};

TEST_F(ExtensionCaller, IsJudgedByTheHardwareLayer) {
    const auto extension = makeExtension(std::make_shared<OneUserOnly>());
    EXPECT_TRUE(extension->setAmplitude(1).isOk());
    EXPECT_THAT(kernel.writes(), IsEmpty());
    const CallingUid chosen(4711);
    EXPECT_TRUE(extension->setAmplitude(2).isOk());
    EXPECT_THAT(kernel.writes(), ElementsAre("/sys/class/leds/vibrator/intensity \"2\\n\""));
}

TEST_F(ExtensionCaller, ConstructionAndDestructionLeaveTheDriverAlone) {
    const auto hwApi = makeHwApi();
    auto extension = ndk::SharedRefBase::make<Vibrator>(hwApi);
    EXPECT_EQ(hwApi.use_count(), 2);
    EXPECT_THAT(log.lines(), ElementsAre("I V_4_0: Vibrator::Vendor Vibrator()"));
    EXPECT_THAT(log.tags(), ElementsAre("QvxVibrator-HAL-AIDL-EXT"));
    extension.reset();
    EXPECT_EQ(hwApi.use_count(), 1);
    EXPECT_EQ(log.lines().size(), 1U);
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

}  // namespace
}  // namespace aidl::vendor::quorvan::hardware::vibrator
