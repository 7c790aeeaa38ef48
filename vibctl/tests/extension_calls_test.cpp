// SPDX-License-Identifier: Apache-2.0
//
// Words in, calls of IZelVibrator out: every form of argument that the standard interface has not.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "vibctl/find_method.h"
#include "vibctl/tests/prepared_call.h"

namespace vibctl {
namespace {

using aidl::android::hardware::vibrator::Effect;
using aidl::vendor::quorvan::hardware::vibrator::IZelVibratorDefault;
using aidl::vendor::quorvan::hardware::vibrator::ZelAmplitudeType;
using aidl::vendor::quorvan::hardware::vibrator::ZelFifoType;
using aidl::vendor::quorvan::hardware::vibrator::ZelFolderStatus;
using aidl::vendor::quorvan::hardware::vibrator::ZelHapticEnginePacket;
using aidl::vendor::quorvan::hardware::vibrator::ZelHybridHapticEnginePacket;
using aidl::vendor::quorvan::hardware::vibrator::ZelHybridHapticEnginePacketType;
using aidl::vendor::quorvan::hardware::vibrator::ZelPlaybackPacket;
using ::testing::_;
using ::testing::DoAll;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SaveArg;
using ::testing::SetArgPointee;

class MockZelVibrator : public IZelVibratorDefault {
  public:
    using Status = ndk::ScopedAStatus;
    MOCK_METHOD(Status, setAmplitude, (int32_t), (override));
    MOCK_METHOD(Status, setFolderStatus, (ZelFolderStatus), (override));
    MOCK_METHOD(Status, performHapticEngine, (const std::vector<ZelHapticEnginePacket>&, int32_t),
                (override));
    MOCK_METHOD(Status, performPrebakedHapticPattern, (int32_t, int32_t, bool), (override));
    MOCK_METHOD(Status, getAmplitudeList, (ZelAmplitudeType, std::vector<int32_t>*), (override));
    MOCK_METHOD(Status, perform, (Effect, int32_t, const Callback&, int32_t*), (override));
    MOCK_METHOD(Status, performPlaybackEngine,
                (const std::vector<ZelPlaybackPacket>&, bool, int32_t), (override));
    MOCK_METHOD(Status, performFifoHapticEngine, (ZelFifoType), (override));
    MOCK_METHOD(Status, performHybridHapticEngine,
                (const std::vector<ZelHybridHapticEnginePacket>&, int32_t), (override));
    MOCK_METHOD(Status, supportsHasFeature, (bool*), (override));
    MOCK_METHOD(Status, hasFeature, (const std::string&, bool*), (override));
};

class ExtensionCall : public ::testing::Test {
  protected:
    Outcome call(const std::vector<std::string>& words) {
        return makeCall("ext", words, *mVibrator, nullptr);
    }

    std::shared_ptr<MockZelVibrator> mVibrator = ndk::SharedRefBase::make<MockZelVibrator>();
};

TEST(ExtensionTable, HasEveryMethodInOrder) {
    std::vector<std::string> names;
    for (const auto& method : extensionMethods()) names.emplace_back(method.name);
    EXPECT_THAT(names,
                ElementsAre("supportsAmplitudeControl", "supportsForceTouchAmplitudeControl",
                            "supportsFrequencyControl", "supportsHapticEngine",
                            "supportsPrebakedHapticPattern", "supportsFolderStatusSetting",
                            "supportsEnhancedQuorvanHapticPattern", "setAmplitude",
                            "setForceTouchAmplitude", "setFrequencyType", "setFolderStatus",
                            "getNumberOfPrebakedHapticPattern", "performHapticEngine",
                            "performPrebakedHapticPattern", "getAmplitudeList", "perform",
                            "performPlaybackEngine", "supportsFifoHapticEngine",
                            "supportsHybridHapticEngine", "supportsEnhancedHybridHapticPattern",
                            "performFifoHapticEngine", "performHybridHapticEngine",
                            "supportsFolderTentModeStatusSetting", "setFolderTentModeStatus",
                            "supportsHasFeature", "hasFeature", "getInterfaceVersion",
                            "getInterfaceHash"));
}

TEST(ExtensionTable, NamesAsManyParametersAsTheMethodTakes) {
    for (const auto& method : extensionMethods()) {
        EXPECT_EQ(method.parameterNames().size(), method.accepted().size()) << method.name;
    }
}

TEST_F(ExtensionCall, PassesANegativeNumber) {
    EXPECT_CALL(*mVibrator, setAmplitude(-1)).WillOnce(answerOk());
    call({"setAmplitude", "-1"});
}

TEST_F(ExtensionCall, PassesAnyNumberAsAnEnumerator) {
    EXPECT_CALL(*mVibrator, setFolderStatus(static_cast<ZelFolderStatus>(2))).WillOnce(answerOk());
    call({"setFolderStatus", "2"});
    EXPECT_CALL(*mVibrator, performFifoHapticEngine(static_cast<ZelFifoType>(25)))
            .WillOnce(answerOk());
    call({"performFifoHapticEngine", "25"});
}

TEST_F(ExtensionCall, PassesTheAmplitudeFirstAndThenThePackets) {
    std::vector<ZelHapticEnginePacket> packets;
    EXPECT_CALL(*mVibrator, performHapticEngine(_, 10000))
            .WillOnce(DoAll(SaveArg<0>(&packets), answerOk()));
    call({"performHapticEngine", "10000", "7,10000,2050,0", "-1,-2,-3,-4"});
    ASSERT_EQ(packets.size(), 2u);
    EXPECT_EQ(packets[0].time, 7);
    EXPECT_EQ(packets[0].intensity, 10000);
    EXPECT_EQ(packets[0].frequency, 2050);
    EXPECT_EQ(packets[0].overdrive, 0);
    EXPECT_EQ(packets[1].time, -1);
    EXPECT_EQ(packets[1].intensity, -2);
    EXPECT_EQ(packets[1].frequency, -3);
    EXPECT_EQ(packets[1].overdrive, -4);
}

TEST_F(ExtensionCall, PassesNoPacketsAtAll) {
    EXPECT_CALL(*mVibrator, performHapticEngine(IsEmpty(), 1)).WillOnce(answerOk());
    call({"performHapticEngine", "1"});
}

TEST_F(ExtensionCall, PassesHybridPackets) {
    std::vector<ZelHybridHapticEnginePacket> packets;
    EXPECT_CALL(*mVibrator, performHybridHapticEngine(_, 10000))
            .WillOnce(DoAll(SaveArg<0>(&packets), answerOk()));
    call({"performHybridHapticEngine", "10000", "5,5000,1,3,170", "1,2,7,4,5"});
    ASSERT_EQ(packets.size(), 2u);
    EXPECT_EQ(packets[0].time, 5);
    EXPECT_EQ(packets[0].intensity, 5000);
    EXPECT_EQ(packets[0].type, static_cast<ZelHybridHapticEnginePacketType>(1));
    EXPECT_EQ(packets[0].value, 3);
    EXPECT_EQ(packets[0].frequency, 170);
    EXPECT_EQ(packets[1].type, static_cast<ZelHybridHapticEnginePacketType>(7));
}

TEST_F(ExtensionCall, PassesRepeatCountAndPlaybackPackets) {
    std::vector<ZelPlaybackPacket> packets;
    EXPECT_CALL(*mVibrator, performPlaybackEngine(_, true, -3))
            .WillOnce(DoAll(SaveArg<0>(&packets), answerOk()));
    call({"performPlaybackEngine", "true", "-3", "5,80,10"});
    ASSERT_EQ(packets.size(), 1u);
    EXPECT_EQ(packets[0].patternIndex, 5);
    EXPECT_EQ(packets[0].level, 80);
    EXPECT_EQ(packets[0].option, 10);
}

TEST_F(ExtensionCall, PassesThreeScalars) {
    EXPECT_CALL(*mVibrator, performPrebakedHapticPattern(5, 8000, false)).WillOnce(answerOk());
    call({"performPrebakedHapticPattern", "5", "8000", "false"});
}

TEST_F(ExtensionCall, PassesAnEffectOfTheStandardInterface) {
    EXPECT_CALL(*mVibrator, perform(Effect::TICK, 10000, Callback(), _))
            .WillOnce(DoAll(SetArgPointee<3>(12), answerOk()));
    EXPECT_EQ(humanLine("perform", call({"perform", "TICK", "10000"})), "perform: ok, 12 ms");
}

TEST_F(ExtensionCall, PassesATextAndReportsABoolean) {
    EXPECT_CALL(*mVibrator, hasFeature("HAPTIC_ENGINE", _))
            .WillOnce(DoAll(SetArgPointee<1>(true), answerOk()));
    const Outcome outcome = call({"hasFeature", "HAPTIC_ENGINE"});
    EXPECT_EQ(outcome.result, "true");
    EXPECT_EQ(outcome.text, "true");
    EXPECT_CALL(*mVibrator, hasFeature("", _)).WillOnce([](auto&&...) {
        return ndk::ScopedAStatus::fromExceptionCode(EX_ILLEGAL_ARGUMENT);
    });
    EXPECT_EQ(call({"hasFeature", ""}).exception, EX_ILLEGAL_ARGUMENT);
}

TEST_F(ExtensionCall, ReportsAListOfIntegers) {
    EXPECT_CALL(*mVibrator, getAmplitudeList(static_cast<ZelAmplitudeType>(0), _))
            .WillOnce(DoAll(SetArgPointee<1>(std::vector<int32_t>{0, 3000, 10000}), answerOk()));
    const Outcome outcome = call({"getAmplitudeList", "0"});
    EXPECT_EQ(outcome.result, "[0,3000,10000]");
    EXPECT_EQ(outcome.text, "0 3000 10000");
}

TEST_F(ExtensionCall, AFalseAnswerIsAResultAllTheSame) {
    EXPECT_CALL(*mVibrator, supportsHasFeature(_))
            .WillOnce(DoAll(SetArgPointee<0>(false), answerOk()));
    EXPECT_EQ(call({"supportsHasFeature"}).result, "false");
}

}  // namespace
}  // namespace vibctl
