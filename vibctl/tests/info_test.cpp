// SPDX-License-Identifier: Apache-2.0
//
// What is asked for the overview, and how the answers stand on one screen.
#include "vibctl/info.h"

#include <android-base/strings.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "vibctl/methods.h"

namespace vibctl {
namespace {

using aidl::android::hardware::vibrator::CompositePrimitive;
using aidl::android::hardware::vibrator::IVibratorDefault;
using aidl::vendor::quorvan::hardware::vibrator::IZelVibratorDefault;
using aidl::vendor::quorvan::hardware::vibrator::ZelAmplitudeType;
using ::testing::HasSubstr;
using ::testing::Not;
using ::testing::StartsWith;

using Status = ndk::ScopedAStatus;

Status unsupported() {
    return Status::fromExceptionCode(EX_UNSUPPORTED_OPERATION);
}

// Offers amplitude control, a click and nothing else.
class Standard : public IVibratorDefault {
    Status getCapabilities(int32_t* result) override {
        *result = 4;
        return Status::ok();
    }
    Status getPrimitiveDuration(CompositePrimitive primitive, int32_t* result) override {
        *result = 20;
        return primitive == CompositePrimitive::CLICK ? Status::ok() : unsupported();
    }
    Status getQFactor(float*) override { return unsupported(); }
    Status off() override {
        ADD_FAILURE() << "the motor was turned off";
        return Status::ok();
    }
};

class Extension : public IZelVibratorDefault {
    Status supportsHapticEngine(bool* result) override {
        *result = true;
        return Status::ok();
    }
    Status supportsFrequencyControl(bool* result) override {
        *result = false;
        return Status::ok();
    }
    Status getAmplitudeList(ZelAmplitudeType, std::vector<int32_t>* result) override {
        *result = {0, 5000, 10000};
        return Status::ok();
    }
    Status supportsHasFeature(bool*) override { return Status::fromExceptionCode(EX_SECURITY); }
};

Outcome ask(const std::string& iface, const Call& call) {
    if (iface == "std") return call(*ndk::SharedRefBase::make<Standard>(), nullptr);
    return call(*ndk::SharedRefBase::make<Extension>(), nullptr);
}

TEST(Info, HasALineForEachAnswerAndOneForAllThatIsNotOffered) {
    const Outcome outcome = askEverything(ask);
    EXPECT_EQ(outcome.exception, EX_NONE);
    EXPECT_THAT(outcome.text, StartsWith("std\n  getCapabilities                  4 "
                                         "(AMPLITUDE_CONTROL)\n"));
    EXPECT_THAT(outcome.text, HasSubstr("\n  getPrimitiveDuration             CLICK 20 ms\n"));
    EXPECT_THAT(outcome.text, HasSubstr("\n  getAmplitudeList                 "));
    EXPECT_THAT(outcome.text, HasSubstr(" 0 5000 10000"));
    EXPECT_THAT(outcome.text, HasSubstr("\n  true                             "
                                        "supportsHapticEngine\n"));
    EXPECT_THAT(outcome.text, HasSubstr("\n  supportsHasFeature               EX_SECURITY\n"));
    EXPECT_THAT(outcome.text, HasSubstr("supportsFrequencyControl"));
    EXPECT_THAT(outcome.text, Not(HasSubstr("\n  getQFactor")));
    EXPECT_THAT(outcome.text, HasSubstr("getQFactor"));
}

TEST(Info, HasNoLineOfMoreThanAHundredColumns) {
    const std::string text = askEverything(ask).text;
    EXPECT_THAT(text, HasSubstr("\n                                   "));
    for (const std::string& line : android::base::Split(text, "\n")) {
        EXPECT_LE(line.size(), 100u) << line;
    }
}

TEST(Info, IsAnObjectForPrograms) {
    const std::string result = askEverything(ask).result;
    EXPECT_THAT(result, StartsWith(R"({"std":{"getCapabilities":4,)"));
    EXPECT_THAT(result,
                HasSubstr(R"("getPrimitiveDuration":{"NOOP":null,"CLICK":20,"THUD":null,)"));
    EXPECT_THAT(result, HasSubstr(R"(},"ext":{"supportsAmplitudeControl":null,)"));
    EXPECT_THAT(result, HasSubstr(R"("supportsHapticEngine":true,)"));
}

TEST(Info, EndsWithTheCallThatDoesNotGetThrough) {
    int calls = 0;
    const Outcome outcome = askEverything([&calls](const std::string&, const Call&) {
        ++calls;
        return noAnswer(std::chrono::seconds(5));
    });
    EXPECT_EQ(calls, 1);
    EXPECT_EQ(outcome.status, STATUS_TIMED_OUT);
}

}  // namespace
}  // namespace vibctl
