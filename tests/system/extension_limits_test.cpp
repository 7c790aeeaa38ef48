// SPDX-License-Identifier: Apache-2.0
//
// The ends of what a client can send to the vendor's interface: the largest lists, the smallest and
// largest integers, and lists that are null. The service answers each and goes on.
#include <memory>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "handset/common/raw_binder.h"
#include "tests/system/extension_calls.h"

namespace qvx::test {
namespace {

using handset::RawBinder;
using handset::RawReply;
using handset::RequestBytes;

using nlohmann::json;
using testing::ElementsAre;
using testing::IsEmpty;

constexpr const char* kMin = "-2147483648";
constexpr const char* kMax = "2147483647";

// One phone for all tests of a suite: bringing one up takes longer than any of them.
class ExtensionLimits : public testing::Test {
  protected:
    static void SetUpTestSuite() { mPhone = std::make_unique<Phone>("leds"); }
    static void TearDownTestSuite() { mPhone.reset(); }

    void SetUp() override {
        ASSERT_EQ(mPhone->up().status, 0) << mPhone->up().out << mPhone->up().err;
        mPhone->reset();
        mPid = mPhone->servicePid();
    }

    // The service is the one that was there before, and it answers.
    void TearDown() override {
        EXPECT_EQ(mPhone->servicePid(), mPid);
        EXPECT_EQ(mPhone->call({"ext", "supportsAmplitudeControl"})["result"], true);
    }

    // The exception of a call with so many packets.
    json callWithPackets(std::vector<std::string> words, size_t count,
                         const std::string& packet) const {
        words.insert(words.begin(), "ext");
        words.insert(words.end(), count, packet);
        return mPhone->call(words)["exception"];
    }

    static inline std::unique_ptr<Phone> mPhone;
    int mPid = 0;
};

TEST_F(ExtensionLimits, PacketListsEndAt339) {
    std::string zeros = "1356";
    for (int i = 0; i < 1356; ++i) zeros += " 0";
    EXPECT_EQ(callWithPackets({"performHapticEngine", "1"}, 339, "0,0,0,0"), 0);
    EXPECT_EQ(callWithPackets({"performHybridHapticEngine", "1"}, 339, "0,0,0,0,0"), 0);
    EXPECT_THAT(mPhone->writes(),
                ElementsAre("haptic_engine " + zeros + "\n", "state 1\n", "duration 1\n",
                            "activate 1\n", "hybrid_haptic_engine " + zeros + "\n", "state 1\n",
                            "duration 1\n", "activate 1\n"));
    mPhone->reset();
    EXPECT_EQ(callWithPackets({"performHapticEngine", "1"}, 340, "0,0,0,0"), kIllegalArgument);
    EXPECT_EQ(callWithPackets({"performHybridHapticEngine", "1"}, 340, "0,0,0,0,0"),
              kIllegalArgument);
    EXPECT_THAT(journalInWords(*mPhone), IsEmpty());
}

TEST_F(ExtensionLimits, TenThousandPacketsAreAnIllegalArgument) {
    EXPECT_EQ(callWithPackets({"performHapticEngine", "5000"}, 10000, "7,10000,2050,0"),
              kIllegalArgument);
    EXPECT_EQ(callWithPackets({"performHybridHapticEngine", "5000"}, 10000, "5,5000,1,3,170"),
              kIllegalArgument);
    EXPECT_EQ(callWithPackets({"performPlaybackEngine", "true", "0"}, 10000, "5,100,0"),
              kIllegalArgument);
    EXPECT_THAT(journalInWords(*mPhone), IsEmpty());
}

TEST_F(ExtensionLimits, PlaybackTakesOneTo200Packets) {
    EXPECT_EQ(callWithPackets({"performPlaybackEngine", "true", "0"}, 200, "1,2,3"), 0);
    std::string text;
    for (int i = 0; i < 200; ++i) text += "1.2,3,";
    EXPECT_EQ(mPhone->writes()[1], "cp_trigger_queue " + text + "~" + '\0');
    mPhone->reset();
    EXPECT_EQ(callWithPackets({"performPlaybackEngine", "true", "0"}, 201, "1,2,3"),
              kIllegalArgument);
    EXPECT_EQ(callWithPackets({"performPlaybackEngine", "true", "0"}, 0, ""), kIllegalArgument);
    EXPECT_THAT(journalInWords(*mPhone), IsEmpty());
}

TEST_F(ExtensionLimits, EndsOfTheIntegersOutsideARangeAreIllegalArguments) {
    for (const std::string number : {kMin, kMax}) {
        for (const std::string& words :
             {"setAmplitude " + number, "setForceTouchAmplitude " + number,
              "setFrequencyType " + number, "setFolderStatus " + number,
              "setFolderTentModeStatus " + number, "performFifoHapticEngine " + number,
              "performHapticEngine " + number, "performHybridHapticEngine " + number,
              "performPrebakedHapticPattern 1 " + number + " false",
              "performPrebakedHapticPattern 1 " + number + " true", "perform CLICK " + number,
              "getAmplitudeList " + number}) {
            EXPECT_EQ(mPhone->call(extensionCall(words))["exception"], kIllegalArgument) << words;
        }
    }
    EXPECT_EQ(mPhone->call(
                      extensionCall("performPlaybackEngine true -2147483648 1,2,3"))["exception"],
              kIllegalArgument);
    EXPECT_THAT(journalInWords(*mPhone), IsEmpty());
}

TEST_F(ExtensionLimits, EndsOfTheIntegersWithinPacketsAreWrittenCutOrWhole) {
    const std::string both = std::string(kMin) + "," + kMax;
    EXPECT_EQ(mPhone->call({"ext", "performHapticEngine", "9999",
                            std::string(kMin) + "," + both + ",5"})["exception"],
              0);
    EXPECT_EQ(mPhone->call({"ext", "performHybridHapticEngine", "10000",
                            both + "," + kMax + "," + both})["exception"],
              0);
    EXPECT_EQ(mPhone->call({"ext", "performPlaybackEngine", "true", kMax,
                            both + "," + kMin})["exception"],
              0);
    EXPECT_EQ(mPhone->call(
                      {"ext", "performPrebakedHapticPattern", kMin, "10000", "true"})["exception"],
              0);
    EXPECT_EQ(
            mPhone->call({"ext", "performPrebakedHapticPattern", kMax, "1", "false"})["exception"],
            0);
    EXPECT_THAT(
            mPhone->writes(),
            ElementsAre("haptic_engine 4 -21474836-214748 2147483645\n", "state 1\n",
                        "duration 1\n", "activate 1\n",
                        // The type is none of the two, so the value is left out.
                        "hybrid_haptic_engine 4 -21474836-1 21474836\n", "state 1\n",
                        "duration 1\n", "activate 1\n", "cp_trigger_index 65534\n",
                        std::string("cp_trigger_queue "
                                    "-2147483648.2147483647,-2147483648,2147483647!") +
                                '\0',
                        "state 1\n", "duration 1000\n", "activate 1\n", "cp_trigger_index 65534\n",
                        std::string("cp_trigger_queue -2147483648.100, 10, 0~") + '\0', "state 1\n",
                        "duration 1000\n", "activate 1\n", "intensity 1\n",
                        "cp_trigger_index 2147483647\n", "state 1\n", "duration 1000\n",
                        "activate 1\n"));
}

TEST_F(ExtensionLimits, EffectsOutsideTheEnumerationAreNotOffered) {
    for (const char* effect : {kMin, kMax, "-1", "3", "4", "22"}) {
        EXPECT_EQ(mPhone->call({"ext", "perform", effect, "5000"})["exception"], -7) << effect;
    }
    EXPECT_THAT(journalInWords(*mPhone), IsEmpty());
}

TEST_F(ExtensionLimits, LongFeatureNamesAreLookedUp) {
    const json answer = mPhone->call({"ext", "hasFeature", std::string(100000, 'H')});
    EXPECT_EQ(answer["exception"], 0);
    EXPECT_EQ(answer["result"], false);
    EXPECT_EQ(mPhone->call({"ext", "hasFeature", ""})["exception"], kIllegalArgument);
}

// Below the level of a client library, which would not send these.
class MalformedExtensionRequest : public ExtensionLimits {
  protected:
    static constexpr const char* kDescriptor = "vendor.quorvan.hardware.vibrator.IZelVibrator";
    static constexpr uint32_t kExtensionTransaction = 0x5f455854;  // '_EXT'
    static constexpr uint32_t kPerformHapticEngine = 13;
    static constexpr uint32_t kPerformPlaybackEngine = 17;
    static constexpr uint32_t kPerformHybridHapticEngine = 22;
    static constexpr uint32_t kHasFeature = 26;

    void SetUp() override {
        ExtensionLimits::SetUp();
        const std::optional<uint32_t> service =
                mBinder.checkService("android.hardware.vibrator.IVibrator/default");
        ASSERT_TRUE(service.has_value());
        const RawReply reply = mBinder.transact(*service, kExtensionTransaction, RequestBytes());
        ASSERT_EQ(reply.handles.size(), 1U);
        mExtension = reply.handles.front();
    }

    void TearDown() override {
        EXPECT_THAT(journalInWords(*mPhone), IsEmpty());
        ExtensionLimits::TearDown();
    }

    static RequestBytes token() { return RequestBytes().token(kDescriptor); }

    void expectStatus(uint32_t code, const RequestBytes& request, int32_t status) {
        const RawReply reply = mBinder.transact(mExtension, code, request.data());
        EXPECT_EQ(reply.kind, RawReply::Kind::kStatus);
        EXPECT_EQ(reply.status, status);
    }

    RawBinder mBinder;
    uint32_t mExtension = 0;
};

TEST_F(MalformedExtensionRequest, NullListIsNoMemory) {
    for (const uint32_t code : {kPerformHapticEngine, kPerformHybridHapticEngine}) {
        expectStatus(code, token().int32(-1).int32(5000), -12);
    }
    expectStatus(kPerformPlaybackEngine, token().int32(-1).int32(0).int32(0), -12);
}

TEST_F(MalformedExtensionRequest, ListLengthBelowMinusOneIsBadValue) {
    for (const uint32_t code :
         {kPerformHapticEngine, kPerformHybridHapticEngine, kPerformPlaybackEngine}) {
        expectStatus(code, token().int32(-2).int32(5000), -22);
    }
}

TEST_F(MalformedExtensionRequest, NullPacketIsUnexpectedNull) {
    for (const uint32_t code :
         {kPerformHapticEngine, kPerformHybridHapticEngine, kPerformPlaybackEngine}) {
        expectStatus(code, token().int32(1).int32(0).int32(5000), -2147483640);
    }
}

TEST_F(MalformedExtensionRequest, NullNameIsUnexpectedNull) {
    expectStatus(kHasFeature, token().int32(-1), -2147483640);
}

TEST_F(MalformedExtensionRequest, MissingAmplitudeIsNotEnoughData) {
    expectStatus(kPerformHapticEngine, token().int32(0), -61);
}

TEST_F(MalformedExtensionRequest, StandardDescriptorIsBadType) {
    expectStatus(kPerformHapticEngine,
                 RequestBytes().token("android.hardware.vibrator.IVibrator").int32(0).int32(5000),
                 -2147483647);
}

TEST_F(MalformedExtensionRequest, CodePastTheLastMethodIsUnknown) {
    expectStatus(27, token(), -74);
}

}  // namespace
}  // namespace qvx::test
