// SPDX-License-Identifier: Apache-2.0
//
// What a call came to: the JSON line, the line for people, the exit status.
#include "vibctl/outcome.h"

#include <limits>

#include <aidl/android/hardware/vibrator/Effect.h>
#include <gtest/gtest.h>

namespace vibctl {
namespace {

using aidl::android::hardware::vibrator::Effect;

Outcome outcomeWith(const std::string& result, const std::string& text) {
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

Outcome lost(binder_status_t status) {
    Outcome outcome = exceptionOf(EX_TRANSACTION_FAILED);
    outcome.status = status;
    return outcome;
}

TEST(JsonLine, HasItsKeysInOrder) {
    EXPECT_EQ(jsonLine("std", "perform", outcomeWith("60", "60 ms")),
              R"({"iface":"std","method":"perform","exception":0,"status":0,"message":"",)"
              R"("result":60,"callback":null,"us":412,"name":"EX_NONE","text":"ok, 60 ms"})");
}

TEST(JsonLine, OfACallWithoutResultHasNull) {
    EXPECT_EQ(jsonLine("ext", "setAmplitude", outcomeWith("null", "")),
              R"({"iface":"ext","method":"setAmplitude","exception":0,"status":0,"message":"",)"
              R"("result":null,"callback":null,"us":412,"name":"EX_NONE","text":"ok"})");
}

TEST(JsonLine, OfAnExceptionHasItsCodeAndMessage) {
    EXPECT_EQ(jsonLine("std", "on", exceptionOf(EX_ILLEGAL_STATE, "so \"not\"")),
              R"({"iface":"std","method":"on","exception":-5,"status":0,)"
              R"("message":"so \"not\"","result":null,"callback":null,"us":7,)"
              R"("name":"EX_ILLEGAL_STATE","text":"EX_ILLEGAL_STATE: so \"not\"; the driver )"
              R"(refused: see phone log, on a board logcat"})");
}

TEST(JsonLine, OfATransportFailureHasTheStatus) {
    EXPECT_EQ(jsonLine("std", "off", lost(STATUS_DEAD_OBJECT)),
              R"({"iface":"std","method":"off","exception":-129,"status":-32,"message":"",)"
              R"("result":null,"callback":null,"us":7,"name":"EX_TRANSACTION_FAILED",)"
              R"("text":"EX_TRANSACTION_FAILED STATUS_DEAD_OBJECT; see vibctl doctor"})");
}

TEST(JsonLine, OfACompletionHasMillisecondsOrTimeout) {
    Outcome outcome = outcomeWith("null", "");
    outcome.completion = {Completion::Kind::kCompleted, 72};
    EXPECT_EQ(jsonLine("std", "compose", outcome),
              R"({"iface":"std","method":"compose","exception":0,"status":0,"message":"",)"
              R"("result":null,"callback":72,"us":412,"name":"EX_NONE",)"
              R"("text":"ok, completed after 72 ms"})");
    outcome.completion = {Completion::Kind::kTimedOut, 5000};
    EXPECT_EQ(jsonLine("std", "compose", outcome),
              R"({"iface":"std","method":"compose","exception":0,"status":0,"message":"",)"
              R"("result":null,"callback":"timeout","us":412,"name":"EX_NONE",)"
              R"("text":"ok, not completed within 5000 ms"})");
}

TEST(JsonLine, SaysWhatANumberMeans) {
    EXPECT_EQ(jsonLine("std", "getCapabilities", outcomeWith("4", "4 (AMPLITUDE_CONTROL)")),
              R"({"iface":"std","method":"getCapabilities","exception":0,"status":0,"message":"",)"
              R"("result":4,"callback":null,"us":412,"name":"EX_NONE",)"
              R"_("text":"ok, 4 (AMPLITUDE_CONTROL)"})_");
}

TEST(JsonLine, OfWrongUsageHasNoExceptionAndNullForWhatIsMissing) {
    EXPECT_EQ(jsonLine("", "", wrongUsage("no command given")),
              R"({"iface":null,"method":null,"exception":null,"status":null,)"
              R"("message":"no command given","result":null,"callback":null,"us":0,"name":null,)"
              R"("text":"no command given"})");
}

TEST(JsonLine, OfAMissingServiceIsATransportFailure) {
    EXPECT_EQ(
            jsonLine("ext", "perform", noService("it is not registered")),
            R"({"iface":"ext","method":"perform","exception":-129,"status":-2,)"
            R"("message":"it is not registered","result":null,"callback":null,"us":0,)"
            R"("name":"EX_TRANSACTION_FAILED","text":"it is not registered; see vibctl doctor"})");
}

TEST(JsonLine, StaysOnOneLineAndInAsciiWhateverTheMessage) {
    EXPECT_EQ(jsonLine("std", "off", exceptionOf(EX_PARCELABLE, "a\nb\xff")),
              R"({"iface":"std","method":"off","exception":-9,"status":0,"message":"a\nb\ufffd",)"
              R"("result":null,"callback":null,"us":7,"name":"EX_PARCELABLE",)"
              R"("text":"EX_PARCELABLE: a\nb\ufffd"})");
}

TEST(JsonResult, OfEveryType) {
    EXPECT_EQ(jsonOf(true), "true");
    EXPECT_EQ(jsonOf(std::numeric_limits<int32_t>::min()), "-2147483648");
    EXPECT_EQ(jsonOf(std::string("ea87")), "\"ea87\"");
    EXPECT_EQ(jsonOf(Effect::HEAVY_CLICK), "5");
    EXPECT_EQ(jsonOf(std::vector<int32_t>{0, 3000, 10000}), "[0,3000,10000]");
    EXPECT_EQ(jsonOf(std::vector<Effect>{Effect::CLICK, Effect::TICK}), "[0,2]");
    EXPECT_EQ(jsonOf(std::vector<Effect>{}), "[]");
    EXPECT_EQ(jsonOf(std::vector<float>{0.1F, 1.0F}), "[0.1,1.0]");
}

TEST(JsonResult, OfAFloatIsTheShortestThatTellsItApart) {
    EXPECT_EQ(jsonOf(0.1F), "0.1");
    EXPECT_EQ(jsonOf(150.0F), "150.0");
    EXPECT_EQ(jsonOf(0.98256F), "0.98256");
}

TEST(JsonResult, OfAFloatThatJsonHasNoNumberForIsAString) {
    EXPECT_EQ(jsonOf(std::numeric_limits<float>::quiet_NaN()), "\"nan\"");
    EXPECT_EQ(jsonOf(std::numeric_limits<float>::infinity()), "\"inf\"");
    EXPECT_EQ(jsonOf(-std::numeric_limits<float>::infinity()), "\"-inf\"");
}

TEST(HumanLine, OfSuccess) {
    EXPECT_EQ(humanLine("perform", outcomeWith("60", "60 ms")), "perform: ok, 60 ms");
    EXPECT_EQ(humanLine("off", outcomeWith("null", "")), "off: ok");
}

TEST(HumanLine, OfAnExceptionSaysWhereToLookNext) {
    EXPECT_EQ(humanLine("on", exceptionOf(EX_ILLEGAL_STATE)),
              "on: EX_ILLEGAL_STATE; the driver refused: see phone log, on a board logcat");
    EXPECT_EQ(humanLine("on", exceptionOf(EX_ILLEGAL_ARGUMENT, "too long")),
              "on: EX_ILLEGAL_ARGUMENT: too long; an argument was refused: see phone log, on a "
              "board logcat");
    EXPECT_EQ(humanLine("compose", exceptionOf(EX_UNSUPPORTED_OPERATION)),
              "compose: EX_UNSUPPORTED_OPERATION; this phone does not offer it: see vibctl info");
    EXPECT_EQ(humanLine("hasFeature", exceptionOf(EX_SECURITY)),
              "hasFeature: EX_SECURITY; the caller may not; the extension answers users 0 and "
              "1000");
    Outcome specific = exceptionOf(EX_SERVICE_SPECIFIC);
    specific.serviceError = 5;
    EXPECT_EQ(humanLine("on", specific), "on: EX_SERVICE_SPECIFIC 5");
}

TEST(HumanLine, OfATransportFailureNamesTheDoctor) {
    EXPECT_EQ(humanLine("on", lost(STATUS_DEAD_OBJECT)),
              "on: EX_TRANSACTION_FAILED STATUS_DEAD_OBJECT; see vibctl doctor");
    EXPECT_EQ(humanLine("on", noAnswer(std::chrono::milliseconds(1500))),
              "on: EX_TRANSACTION_FAILED STATUS_TIMED_OUT: no answer within 1.5 s; see vibctl "
              "doctor");
}

TEST(HumanLine, OfACompletion) {
    Outcome outcome = outcomeWith("null", "");
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
    EXPECT_EQ(exitStatusOf(outcomeWith("60", "")), Exit::kOk);
    EXPECT_EQ(exitStatusOf(exceptionOf(EX_SECURITY)), Exit::kException);
    EXPECT_EQ(exitStatusOf(exceptionOf(EX_SERVICE_SPECIFIC)), Exit::kException);
    EXPECT_EQ(exitStatusOf(lost(STATUS_DEAD_OBJECT)), Exit::kNoService);
    EXPECT_EQ(static_cast<int>(Exit::kOk), 0);
    EXPECT_EQ(static_cast<int>(Exit::kException), 1);
    EXPECT_EQ(static_cast<int>(Exit::kUsage), 2);
    EXPECT_EQ(static_cast<int>(Exit::kNoService), 3);
}

TEST(ExitStatus, OfACallbackThatDidNotComeIsItsOwn) {
    Outcome outcome = outcomeWith("null", "");
    outcome.completion = {Completion::Kind::kTimedOut, 5000};
    EXPECT_EQ(exitStatusOf(outcome), Exit::kNoCallback);
    EXPECT_EQ(static_cast<int>(Exit::kNoCallback), 4);
}

TEST(ExitStatus, TellsWrongUsageFromAMissingService) {
    EXPECT_EQ(exitStatusOf(wrongUsage("x")), Exit::kUsage);
    EXPECT_EQ(exitStatusOf(noService("x")), Exit::kNoService);
    EXPECT_EQ(exitStatusOf(noAnswer(std::chrono::seconds(5))), Exit::kNoService);
}

TEST(OutcomeOf, TakesCodeStatusAndMessage) {
    const Outcome refused = outcomeOf(ndk::ScopedAStatus::fromExceptionCodeWithMessage(
            EX_UNSUPPORTED_OPERATION, "no such motor"));
    EXPECT_EQ(refused.exception, EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(refused.status, STATUS_OK);
    EXPECT_EQ(refused.message, "no such motor");
    const Outcome unknown = outcomeOf(ndk::ScopedAStatus::fromStatus(STATUS_UNKNOWN_TRANSACTION));
    EXPECT_EQ(unknown.exception, EX_TRANSACTION_FAILED);
    EXPECT_EQ(unknown.status, STATUS_UNKNOWN_TRANSACTION);
    const Outcome specific = outcomeOf(ndk::ScopedAStatus::fromServiceSpecificError(5));
    EXPECT_EQ(specific.serviceError, 5);
}

}  // namespace
}  // namespace vibctl
