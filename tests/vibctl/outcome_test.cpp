// SPDX-License-Identifier: Apache-2.0
//
// What a call came to: the JSON line, the line for people, the exit status.
#include "outcome.h"

#include <limits>

#include <aidl/android/hardware/vibrator/Effect.h>
#include <gtest/gtest.h>

namespace vibctl {
namespace {

using aidl::android::hardware::vibrator::Effect;

Outcome outcomeWith(const nlohmann::ordered_json& result, const std::string& text) {
    Outcome outcome;
    outcome.result = result;
    outcome.text = text;
    outcome.microseconds = 412;
    return outcome;
}

Outcome exceptionOf(binder_exception_t exception, const std::string& message = "") {
    Outcome outcome;
    outcome.exception = exception;
    outcome.message = message;
    outcome.microseconds = 7;
    return outcome;
}

Outcome transportFailure(binder_status_t status) {
    Outcome outcome = exceptionOf(EX_TRANSACTION_FAILED);
    outcome.status = status;
    return outcome;
}

TEST(JsonLine, HasItsKeysInOrder) {
    EXPECT_EQ(jsonLine("std", "perform", outcomeWith(60, "60 ms")),
              R"({"iface":"std","method":"perform","exception":0,"status":0,"message":"",)"
              R"("result":60,"callback":null,"us":412})");
}

TEST(JsonLine, OfACallWithoutResultHasNull) {
    EXPECT_EQ(jsonLine("ext", "setAmplitude", outcomeWith(nullptr, "")),
              R"({"iface":"ext","method":"setAmplitude","exception":0,"status":0,"message":"",)"
              R"("result":null,"callback":null,"us":412})");
}

TEST(JsonLine, OfAnExceptionHasItsCodeAndMessage) {
    EXPECT_EQ(jsonLine("std", "on", exceptionOf(EX_ILLEGAL_STATE, "so \"not\"")),
              R"({"iface":"std","method":"on","exception":-5,"status":0,)"
              R"("message":"so \"not\"","result":null,"callback":null,"us":7})");
}

TEST(JsonLine, OfATransportFailureHasTheStatus) {
    EXPECT_EQ(jsonLine("std", "off", transportFailure(STATUS_DEAD_OBJECT)),
              R"({"iface":"std","method":"off","exception":-129,"status":-32,"message":"",)"
              R"("result":null,"callback":null,"us":7})");
}

TEST(JsonLine, OfACompletionHasMillisecondsOrTimeout) {
    Outcome outcome = outcomeWith(nullptr, "");
    outcome.completion = {Completion::Kind::kCompleted, 72};
    EXPECT_EQ(jsonLine("std", "compose", outcome),
              R"({"iface":"std","method":"compose","exception":0,"status":0,"message":"",)"
              R"("result":null,"callback":72,"us":412})");
    outcome.completion = {Completion::Kind::kTimedOut, 5000};
    EXPECT_EQ(jsonLine("std", "compose", outcome),
              R"({"iface":"std","method":"compose","exception":0,"status":0,"message":"",)"
              R"("result":null,"callback":"timeout","us":412})");
}

TEST(JsonLine, StaysOnOneLineAndInUtf8WhateverTheMessage) {
    EXPECT_EQ(jsonLine("std", "off", exceptionOf(EX_SECURITY, "a\nb\xff")),
              R"({"iface":"std","method":"off","exception":-1,"status":0,)"
              "\"message\":\"a\\nb\xef\xbf\xbd\",\"result\":null,\"callback\":null,\"us\":7}");
}

TEST(JsonResult, OfEveryType) {
    EXPECT_EQ(jsonOf(true).dump(), "true");
    EXPECT_EQ(jsonOf(std::numeric_limits<int32_t>::min()).dump(), "-2147483648");
    EXPECT_EQ(jsonOf(std::string("ea87")).dump(), "\"ea87\"");
    EXPECT_EQ(jsonOf(Effect::HEAVY_CLICK).dump(), "5");
    EXPECT_EQ(jsonOf(std::vector<int32_t>{0, 3000, 10000}).dump(), "[0,3000,10000]");
    EXPECT_EQ(jsonOf(std::vector<Effect>{Effect::CLICK, Effect::TICK}).dump(), "[0,2]");
    EXPECT_EQ(jsonOf(std::vector<Effect>{}).dump(), "[]");
    EXPECT_EQ(jsonOf(std::vector<float>{0.1F, 1.0F}).dump(), "[0.1,1.0]");
}

TEST(JsonResult, OfAFloatIsTheShortestThatTellsItApart) {
    EXPECT_EQ(jsonOf(0.1F).dump(), "0.1");
    EXPECT_EQ(jsonOf(150.0F).dump(), "150.0");
    EXPECT_EQ(jsonOf(0.98256F).dump(), "0.98256");
}

TEST(JsonResult, OfAFloatThatJsonHasNoNumberForIsAText) {
    EXPECT_EQ(jsonOf(std::numeric_limits<float>::quiet_NaN()).dump(), "\"nan\"");
    EXPECT_EQ(jsonOf(std::numeric_limits<float>::infinity()).dump(), "\"inf\"");
    EXPECT_EQ(jsonOf(-std::numeric_limits<float>::infinity()).dump(), "\"-inf\"");
}

TEST(HumanLine, OfSuccess) {
    EXPECT_EQ(humanLine("perform", outcomeWith(60, "60 ms")), "perform: ok, 60 ms");
    EXPECT_EQ(humanLine("off", outcomeWith(nullptr, "")), "off: ok");
}

TEST(HumanLine, OfAnException) {
    EXPECT_EQ(humanLine("on", exceptionOf(EX_ILLEGAL_STATE)), "on: EX_ILLEGAL_STATE");
    EXPECT_EQ(humanLine("on", exceptionOf(EX_ILLEGAL_ARGUMENT, "too long")),
              "on: EX_ILLEGAL_ARGUMENT: too long");
    Outcome specific = exceptionOf(EX_SERVICE_SPECIFIC);
    specific.serviceError = 5;
    EXPECT_EQ(humanLine("on", specific), "on: EX_SERVICE_SPECIFIC 5");
}

TEST(HumanLine, OfATransportFailure) {
    EXPECT_EQ(humanLine("on", transportFailure(STATUS_DEAD_OBJECT)),
              "on: EX_TRANSACTION_FAILED STATUS_DEAD_OBJECT");
}

TEST(HumanLine, OfACompletion) {
    Outcome outcome = outcomeWith(nullptr, "");
    outcome.completion = {Completion::Kind::kCompleted, 72};
    EXPECT_EQ(humanLine("compose", outcome), "compose: ok, completed after 72 ms");
    outcome.completion = {Completion::Kind::kTimedOut, 5000};
    EXPECT_EQ(humanLine("compose", outcome), "compose: ok, not completed within 5000 ms");
}

TEST(HumanResult, OfEveryType) {
    EXPECT_EQ(textOf(true, Show::kPlain), "true");
    EXPECT_EQ(textOf(false, Show::kPlain), "false");
    EXPECT_EQ(textOf(10, Show::kPlain), "10");
    EXPECT_EQ(textOf(60, Show::kMilliseconds), "60 ms");
    EXPECT_EQ(textOf(150.5F, Show::kHertz), "150.5 Hz");
    EXPECT_EQ(textOf(std::string(), Show::kPlain), "empty");
    EXPECT_EQ(textOf(std::vector<Effect>{Effect::CLICK, static_cast<Effect>(99)}, Show::kPlain),
              "CLICK 99");
    EXPECT_EQ(textOf(std::vector<int32_t>{0, 3000}, Show::kPlain), "0 3000");
    EXPECT_EQ(textOf(std::vector<Effect>{}, Show::kPlain), "none");
}

TEST(HumanResult, NamesCapabilities) {
    EXPECT_EQ(textOf(0, Show::kCapabilities), "0");
    EXPECT_EQ(textOf(4, Show::kCapabilities), "4 (AMPLITUDE_CONTROL)");
    EXPECT_EQ(textOf(60, Show::kCapabilities),
              "60 (AMPLITUDE_CONTROL EXTERNAL_CONTROL EXTERNAL_AMPLITUDE_CONTROL COMPOSE_EFFECTS)");
    EXPECT_EQ(textOf(2047, Show::kCapabilities),
              "2047 (ON_CALLBACK PERFORM_CALLBACK AMPLITUDE_CONTROL EXTERNAL_CONTROL "
              "EXTERNAL_AMPLITUDE_CONTROL COMPOSE_EFFECTS ALWAYS_ON_CONTROL GET_RESONANT_FREQUENCY "
              "GET_Q_FACTOR FREQUENCY_CONTROL COMPOSE_PWLE_EFFECTS)");
    EXPECT_EQ(textOf(2052, Show::kCapabilities), "2052 (AMPLITUDE_CONTROL 0x800)");
}

TEST(ExitStatus, FollowsTheOutcome) {
    EXPECT_EQ(exitStatusOf(outcomeWith(60, "")), Exit::kOk);
    EXPECT_EQ(exitStatusOf(exceptionOf(EX_SECURITY)), Exit::kException);
    EXPECT_EQ(exitStatusOf(exceptionOf(EX_SERVICE_SPECIFIC)), Exit::kException);
    EXPECT_EQ(exitStatusOf(transportFailure(STATUS_DEAD_OBJECT)), Exit::kNoService);
    EXPECT_EQ(static_cast<int>(Exit::kOk), 0);
    EXPECT_EQ(static_cast<int>(Exit::kException), 1);
    EXPECT_EQ(static_cast<int>(Exit::kUsage), 2);
    EXPECT_EQ(static_cast<int>(Exit::kNoService), 3);
}

TEST(ExitStatus, ATimeoutOfTheCallbackIsNoFailureOfTheCall) {
    Outcome outcome = outcomeWith(nullptr, "");
    outcome.completion = {Completion::Kind::kTimedOut, 5000};
    EXPECT_EQ(exitStatusOf(outcome), Exit::kOk);
}

TEST(OutcomeOf, TakesCodeStatusAndMessage) {
    const Outcome refused = outcomeOf(ndk::ScopedAStatus::fromExceptionCodeWithMessage(
            EX_UNSUPPORTED_OPERATION, "no such motor"));
    EXPECT_EQ(refused.exception, EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(refused.status, STATUS_OK);
    EXPECT_EQ(refused.message, "no such motor");
    const Outcome lost = outcomeOf(ndk::ScopedAStatus::fromStatus(STATUS_UNKNOWN_TRANSACTION));
    EXPECT_EQ(lost.exception, EX_TRANSACTION_FAILED);
    EXPECT_EQ(lost.status, STATUS_UNKNOWN_TRANSACTION);
    const Outcome specific = outcomeOf(ndk::ScopedAStatus::fromServiceSpecificError(5));
    EXPECT_EQ(specific.serviceError, 5);
}

}  // namespace
}  // namespace vibctl
