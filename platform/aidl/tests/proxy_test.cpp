// SPDX-License-Identifier: Apache-2.0
//
// What generated proxies send, and what they make of the answer.
#include <aidl/android/hardware/vibrator/BpVibrator.h>
#include <aidl/android/hardware/vibrator/BpVibratorCallback.h>
#include <aidl/sample/BpListener.h>
#include <aidl/sample/BpPainter.h>
#include <aidl/vendor/quorvan/hardware/vibrator/BpZelVibrator.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/aidl/tests/recording_binder.h"

namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

using namespace aidl::android::hardware::vibrator;          // NOLINT(google-build-using-namespace)
using namespace aidl::vendor::quorvan::hardware::vibrator;  // NOLINT(google-build-using-namespace)
using aidl::sample::BpListener;
using aidl::sample::BpPainter;
using aidl::sample::Color;
using aidl::sample::Point;
using aidl::sample::Shape;

class VibratorProxy : public ::testing::Test {
  protected:
    RecordingBinder binder{"android.hardware.vibrator.IVibrator"};
    std::shared_ptr<BpVibrator> vibrator = binder.proxy<BpVibrator>();
};

TEST_F(VibratorProxy, OnWithoutCallbackSendsTheNullObject) {
    binder.reply = {0};
    EXPECT_TRUE(vibrator->on(100, nullptr).isOk());
    EXPECT_EQ(binder.code, 3U);
    EXPECT_THAT(binder.request, ElementsAre(0x64, 0x73622a85, 0x113, 0, 0, 0, 0, 1));
}

TEST_F(VibratorProxy, PerformSendsEnumerationsAsOneWordEach) {
    binder.reply = {0, 60};
    int32_t milliseconds = -1;
    EXPECT_TRUE(vibrator->perform(Effect::CLICK, EffectStrength::STRONG, nullptr, &milliseconds)
                        .isOk());
    EXPECT_EQ(milliseconds, 60);
    EXPECT_EQ(binder.code, 4U);
    EXPECT_THAT(binder.request, ElementsAre(0, 2, 0x73622a85, 0x113, 0, 0, 0, 0, 1));
}

TEST_F(VibratorProxy, ComposeSendsCountPresenceAndSize) {
    binder.reply = {0};
    CompositeEffect effect;
    effect.delayMs = 50;
    effect.primitive = CompositePrimitive::CLICK;
    effect.scale = 1.0f;
    EXPECT_TRUE(vibrator->compose({effect}, nullptr).isOk());
    EXPECT_EQ(binder.code, 12U);
    EXPECT_THAT(binder.request,
                ElementsAre(1, 1, 0x10, 0x32, 1, 0x3f800000, 0x73622a85, 0x113, 0, 0, 0, 0, 1));
}

TEST_F(VibratorProxy, ComposePwleSendsTagsWithoutSizeOfTheUnion) {
    binder.reply = {0};
    ActivePwle active;
    active.startAmplitude = active.endAmplitude = 0.5f;
    active.startFrequency = active.endFrequency = 150.0f;
    active.duration = 100;
    BrakingPwle braking;
    braking.braking = Braking::CLAB;
    braking.duration = 20;
    EXPECT_TRUE(vibrator->composePwle({active, braking}, nullptr).isOk());
    EXPECT_EQ(binder.code, 24U);
    EXPECT_THAT(binder.request,
                ElementsAre(2,                                                              //
                            1, 0, 1, 0x18, 0x3f000000, 0x43160000, 0x3f000000, 0x43160000,  //
                            0x64,                                                           //
                            1, 1, 1, 0xc, 1, 0x14,                                          //
                            0x73622a85, 0x113, 0, 0, 0, 0, 1));
}

TEST_F(VibratorProxy, ReadsAListOfEnumerations) {
    binder.reply = {0, 4, 0, 1, 2, 5};
    std::vector<Effect> effects = {Effect::POP};
    EXPECT_TRUE(vibrator->getSupportedEffects(&effects).isOk());
    EXPECT_THAT(effects, ElementsAre(Effect::CLICK, Effect::DOUBLE_CLICK, Effect::TICK,
                                     Effect::HEAVY_CLICK));
    EXPECT_THAT(binder.request, IsEmpty());
}

TEST_F(VibratorProxy, ExceptionEndsTheReplyAndLeavesResultsAlone) {
    binder.reply = {0xfffffffd, 3, 0x00610062, 0x00000064, 0};
    int32_t capabilities = 17;
    const auto status = vibrator->getCapabilities(&capabilities);
    EXPECT_EQ(status.getExceptionCode(), EX_ILLEGAL_ARGUMENT);
    EXPECT_STREQ(status.getMessage(), "bad");
    EXPECT_EQ(capabilities, 17);
}

TEST_F(VibratorProxy, ServiceSpecificErrorIsReadWithItsNumber) {
    binder.reply = {0xfffffff8, 0, 0, 0, 5};
    EXPECT_EQ(vibrator->off().getServiceSpecificError(), 5);
}

TEST_F(VibratorProxy, ReplyThatEndsTooEarlyIsATransportError) {
    binder.reply = {0};
    int32_t capabilities = 0;
    const auto status = vibrator->getCapabilities(&capabilities);
    EXPECT_EQ(status.getExceptionCode(), EX_TRANSACTION_FAILED);
    EXPECT_EQ(status.getStatus(), STATUS_NOT_ENOUGH_DATA);

    binder.reply = {};
    EXPECT_EQ(vibrator->off().getStatus(), STATUS_NOT_ENOUGH_DATA);
}

TEST_F(VibratorProxy, FailedTransactionIsATransportError) {
    binder.status = STATUS_DEAD_OBJECT;
    EXPECT_EQ(vibrator->off().getStatus(), STATUS_DEAD_OBJECT);
    binder.status = STATUS_UNKNOWN_TRANSACTION;
    EXPECT_EQ(vibrator->off().getStatus(), STATUS_UNKNOWN_TRANSACTION);
}

TEST_F(VibratorProxy, VersionIsAskedOnce) {
    binder.reply = {0, 2};
    int32_t version = 0;
    EXPECT_TRUE(vibrator->getInterfaceVersion(&version).isOk());
    EXPECT_EQ(version, 2);
    EXPECT_EQ(binder.code, 0x00ffffffU);
    version = 0;
    EXPECT_TRUE(vibrator->getInterfaceVersion(&version).isOk());
    EXPECT_EQ(version, 2);
    EXPECT_EQ(binder.calls, 1);
}

TEST_F(VibratorProxy, VersionThatCouldNotBeReadIsAskedAgain) {
    binder.status = STATUS_FAILED_TRANSACTION;
    int32_t version = 0;
    EXPECT_FALSE(vibrator->getInterfaceVersion(&version).isOk());
    binder.status = STATUS_OK;
    binder.reply = {0, 3};
    EXPECT_TRUE(vibrator->getInterfaceVersion(&version).isOk());
    EXPECT_EQ(version, 3);
}

TEST_F(VibratorProxy, HashIsAskedOnce) {
    binder.reply = {0, 2, 0x00620061, 0};
    std::string hash;
    EXPECT_TRUE(vibrator->getInterfaceHash(&hash).isOk());
    EXPECT_EQ(hash, "ab");
    EXPECT_EQ(binder.code, 0x00fffffeU);
    hash.clear();
    EXPECT_TRUE(vibrator->getInterfaceHash(&hash).isOk());
    EXPECT_EQ(hash, "ab");
    EXPECT_EQ(binder.calls, 1);
}

TEST(CallbackProxy, OnCompleteSendsNothingAndReadsNothing) {
    RecordingBinder binder("android.hardware.vibrator.IVibratorCallback");
    binder.reply = {0xfffffff9, 0, 0, 0};  // not looked at
    EXPECT_TRUE(binder.proxy<BpVibratorCallback>()->onComplete().isOk());
    EXPECT_EQ(binder.code, 1U);
    EXPECT_THAT(binder.request, IsEmpty());
}

TEST(CallbackProxy, OnewayCallStillTellsThatItWasNotSent) {
    RecordingBinder binder("sample.IListener");
    binder.status = STATUS_DEAD_OBJECT;
    EXPECT_EQ(binder.proxy<BpListener>()->onDone(1).getStatus(), STATUS_DEAD_OBJECT);
}

TEST(ExtensionProxy, HybridPacketsAreParcelablesWithSize) {
    RecordingBinder binder("vendor.quorvan.hardware.vibrator.IZelVibrator");
    binder.reply = {0};
    ZelHybridHapticEnginePacket packet;
    packet.time = 5;
    packet.intensity = 5000;
    packet.type = static_cast<ZelHybridHapticEnginePacketType>(1);
    packet.value = 3;
    packet.frequency = 170;
    EXPECT_TRUE(binder.proxy<BpZelVibrator>()->performHybridHapticEngine({packet}, 10000).isOk());
    EXPECT_EQ(binder.code, 22U);
    EXPECT_THAT(binder.request, ElementsAre(1, 1, 24, 5, 5000, 1, 3, 170, 10000));
}

TEST(ExtensionProxy, TextsTravelAsUtf16) {
    RecordingBinder binder("vendor.quorvan.hardware.vibrator.IZelVibrator");
    binder.reply = {0, 1};
    bool has = false;
    EXPECT_TRUE(binder.proxy<BpZelVibrator>()->hasFeature("FIFO", &has).isOk());
    EXPECT_TRUE(has);
    EXPECT_EQ(binder.code, 26U);
    EXPECT_THAT(binder.request, ElementsAre(4, 0x00490046, 0x004f0046, 0));
}

class PainterProxy : public ::testing::Test {
  protected:
    RecordingBinder binder{"sample.painting.IPainter"};
    std::shared_ptr<BpPainter> painter = binder.proxy<BpPainter>();
};

TEST_F(PainterProxy, OutListSendsOnlyItsSize) {
    binder.reply = {0, 2, 8, 9};
    std::vector<int32_t> values(3, 1);
    EXPECT_TRUE(painter->fill(&values).isOk());
    EXPECT_THAT(values, ElementsAre(8, 9));
    EXPECT_EQ(binder.code, 3U);
    EXPECT_THAT(binder.request, ElementsAre(3));
}

TEST_F(PainterProxy, InoutArgumentTravelsBothWays) {
    binder.reply = {0, 1, 12, 10, 0x40000000};
    Point point;
    Point by;
    point.x = 1;
    point.y = 1.0f;
    by.x = 2;
    EXPECT_TRUE(painter->move(&point, by).isOk());
    EXPECT_EQ(binder.code, 4U);
    EXPECT_THAT(binder.request, ElementsAre(1, 12, 1, 0x3f800000, 1, 12, 2, 0));
    EXPECT_EQ(point.x, 10);
    EXPECT_EQ(point.y, 2.0f);
}

TEST_F(PainterProxy, ReturnValueComesBeforeOutArguments) {
    binder.reply = {0, 1, 5, 0x80, 1, 1, 12, 6, 0};
    Shape reshaped;
    std::vector<Point> corners;
    EXPECT_TRUE(painter->reshape(Shape(4), &corners, &reshaped).isOk());
    EXPECT_THAT(binder.request, ElementsAre(1, 0, 4, 0));
    EXPECT_EQ(reshaped, Shape::make<Shape::color>(Color::DARK));
    ASSERT_EQ(corners.size(), 1U);
    EXPECT_EQ(corners[0].x, 6);
}

TEST_F(PainterProxy, NullTextIsNullOnTheWire) {
    binder.reply = {0, 0xffffffff};
    std::optional<std::string> echoed = "full";
    EXPECT_TRUE(painter->echo(std::nullopt, &echoed).isOk());
    EXPECT_THAT(binder.request, ElementsAre(0xffffffff));
    EXPECT_EQ(echoed, std::nullopt);
}

TEST_F(PainterProxy, ByteEnumerationsArePackedInListsAndAWordAlone) {
    binder.reply = {0, 0xffffff80};
    Color mixed = Color::RED;
    EXPECT_TRUE(painter->mix(Color::DARK, {Color::RED, Color::BLUE, Color::DARK}, &mixed).isOk());
    EXPECT_THAT(binder.request, ElementsAre(0xffffff80, 3, 0x00800500));
    EXPECT_EQ(mixed, Color::DARK);
}

TEST_F(PainterProxy, RequiredBinderThatIsNullIsNotSent) {
    ndk::SpAIBinder wrapped;
    EXPECT_EQ(painter->wrap(nullptr, &wrapped).getStatus(), STATUS_UNEXPECTED_NULL);
    EXPECT_EQ(binder.calls, 0);
}

TEST_F(PainterProxy, MethodNumbersDecideTheCodes) {
    binder.reply = {0, 5};
    int32_t sum = 0;
    EXPECT_TRUE(painter->add(2, 3, &sum).isOk());
    EXPECT_EQ(binder.code, 11U);
    EXPECT_TRUE(painter->poke(1).isOk());
    EXPECT_EQ(binder.code, 1U);
    binder.reply = {0, 0};
    std::vector<std::string> parts;
    EXPECT_TRUE(painter->split("", u',', &parts).isOk());
    EXPECT_EQ(binder.code, 16777115U);
}

}  // namespace
