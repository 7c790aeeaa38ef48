// SPDX-License-Identifier: Apache-2.0
//
// Patterns, sequences and designs as calls at their times, and what is said about files that are
// none.
#include <android-base/file.h>
#include <fmt/format.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "vibctl/play/plan.h"

namespace vibctl {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;

constexpr Offers kNothing;
constexpr Offers kAmplitude{.amplitude = true};
constexpr Offers kCompositions{.amplitude = true, .compositions = true};
constexpr Offers kPackets{.amplitude = true, .compositions = true, .packets = true};

// "0.5 ms std on 100" for each call.
std::vector<std::string> linesOf(const Plan& plan) {
    std::vector<std::string> lines;
    for (const TimedCall& call : plan.calls) {
        lines.push_back(fmt::format("{} ms {} {}", static_cast<double>(call.at.count()) / 1000,
                                    call.iface, fmt::join(call.words, " ")));
    }
    return lines;
}

std::vector<std::string> patternAs(const Pattern& pattern, const Offers& offers) {
    Plan plan;
    const Problem problem = planPattern(pattern, offers, plan);
    EXPECT_FALSE(problem) << *problem;
    return linesOf(plan);
}

std::string patternProblem(const Pattern& pattern) {
    Plan plan;
    return planPattern(pattern, kAmplitude, plan).value_or("no problem");
}

std::vector<std::string> ahapAs(const std::string& text, const Offers& offers) {
    Plan plan;
    const Problem problem = planAhap(text, offers, plan);
    EXPECT_FALSE(problem) << *problem;
    return linesOf(plan);
}

std::string ahapProblem(const std::string& text) {
    Plan plan;
    return planAhap(text, kNothing, plan).value_or("no problem");
}

std::string sequenceProblem(const std::string& text) {
    Plan plan;
    return planSequence(text, plan).value_or("no problem");
}

// Transients at the times, each of this intensity and sharpness.
std::string transients(const std::vector<double>& times, double intensity, double sharpness) {
    std::string events;
    for (const double time : times) {
        events += fmt::format(
                R"({}{{"Event":{{"Time":{},"EventType":"HapticTransient","EventParameters":[)"
                R"({{"ParameterID":"HapticIntensity","ParameterValue":{}}},)"
                R"({{"ParameterID":"HapticSharpness","ParameterValue":{}}}]}}}})",
                events.empty() ? "" : ",\n", time, intensity, sharpness);
    }
    return R"({"Version":1.0,"Pattern":[)" + events + "]}";
}

constexpr const char* kRamp =
        R"({"Version": 1.0, "Pattern": [
            {"Event": {"Time": 0.1, "EventType": "HapticContinuous", "EventDuration": 0.06,
                       "EventParameters": []}},
            {"ParameterCurve": {"ParameterID": "HapticIntensityControl", "Time": 0.1,
                "ParameterCurveControlPoints": [{"Time": 0, "ParameterValue": 0.2},
                                                {"Time": 0.04, "ParameterValue": 1}]}}]})";

TEST(PatternPlan, AlternatesPausesAndVibrations) {
    EXPECT_THAT(patternAs({{"0", "100", "50", "200"}, "", 1}, kNothing),
                ElementsAre("0 ms std on 100", "150 ms std on 200"));
}

TEST(PatternPlan, TakesAmplitudesAndRepeats) {
    EXPECT_THAT(
            patternAs({{"0", "100", "50", "200"}, "0,1,0,0.5", 2}, kAmplitude),
            ElementsAre("0 ms std setAmplitude 1", "0 ms std on 100", "150 ms std setAmplitude 0.5",
                        "150 ms std on 200", "350 ms std setAmplitude 1", "350 ms std on 100",
                        "500 ms std setAmplitude 0.5", "500 ms std on 200"));
}

TEST(PatternPlan, WithoutAmplitudeControlSaysWhatIsLost) {
    Plan plan;
    EXPECT_FALSE(planPattern({{"100"}, "0.5", 1}, kNothing, plan));
    EXPECT_THAT(linesOf(plan), ElementsAre("0 ms std on 100"));
    EXPECT_THAT(plan.notes, ElementsAre("amplitudes are lost: the phone has no amplitude control"));
}

TEST(PatternPlan, RefusesWhatIsNoStep) {
    EXPECT_EQ(patternProblem({{"0", "-5"}, "", 1}),
              "step \"-5\" is not an integer from 0 to 600000");
    EXPECT_EQ(patternProblem({{"0", "100"}, "0", 1}), "--amplitudes has 1 numbers for 2 steps");
    EXPECT_EQ(patternProblem({{"0", "100"}, "0,1.5", 1}),
              "--amplitudes \"1.5\" is not a number from 0 to 1");
}

TEST(SequencePlan, HasACallOnEachLine) {
    Plan plan;
    EXPECT_FALSE(
            planSequence("{\"at\": 0, \"method\": \"on\", \"args\": [100]}\n\n"
                         "{\"at\": 2.5, \"iface\": \"ext\", \"method\": \"hasFeature\", "
                         "\"args\": [\"A B\"]}\n"
                         "{\"method\": \"setExternalControl\", \"args\": [true]}\n",
                         plan));
    EXPECT_THAT(linesOf(plan), ElementsAre("0 ms std on 100", "2.5 ms ext hasFeature A B",
                                           "2.5 ms std setExternalControl true"));
}

TEST(SequencePlan, SaysWhoCallsAndWhetherThereIsACallback) {
    Plan plan;
    EXPECT_FALSE(
            planSequence("{\"method\": \"off\", \"uid\": 1000}\n"
                         "{\"method\": \"on\", \"args\": [5], \"callback\": true}\n",
                         plan));
    ASSERT_EQ(plan.calls.size(), 2U);
    EXPECT_EQ(plan.calls[0].uid, 1000U);
    EXPECT_EQ(plan.calls[0].callback, std::nullopt);
    EXPECT_EQ(plan.calls[1].uid, std::nullopt);
    EXPECT_EQ(plan.calls[1].callback, true);
}

TEST(SequencePlan, NamesTheLineAndTheKeyThatIsWrong) {
    EXPECT_EQ(sequenceProblem(""), "no call in it");
    EXPECT_EQ(sequenceProblem("{\"method\": \"off\"}\n{\"method\" \"off\"}\n"),
              "line 2: Missing ':' after object member name");
    EXPECT_EQ(sequenceProblem("[]"), "line 1: an object is accepted");
    EXPECT_EQ(sequenceProblem("\n{\"methd\": \"off\"}"),
              "line 2: unknown key \"methd\"; accepted are at, iface, method, args, callback, "
              "uid");
    EXPECT_EQ(sequenceProblem("{\"at\": 5, \"method\": \"off\"}\n{\"at\": 4, \"method\": \"off\"}"),
              "line 2: at: a number from 5 to 86400000 is accepted");
    EXPECT_EQ(sequenceProblem("{\"iface\": \"sdt\", \"method\": \"off\"}"),
              "line 1: iface: \"sdt\" is neither std nor ext");
    EXPECT_EQ(sequenceProblem("{\"method\": \"preform\"}"),
              "line 1: method: std: unknown method \"preform\"; did you mean perform");
    EXPECT_THAT(sequenceProblem("{\"method\": \"on\", \"args\": [\"soon\"]}"),
                HasSubstr("line 1: args: std on: TIMEOUT_MS \"soon\" is not an integer"));
    EXPECT_EQ(sequenceProblem("{\"method\": \"off\", \"uid\": -1}"),
              "line 1: uid: a number from 0 to 4294967294 is accepted");
    EXPECT_EQ(sequenceProblem("{\"method\": \"on\", \"args\": [1], \"callback\": 1}"),
              "line 1: callback: true and false are accepted");
    EXPECT_THAT(sequenceProblem("{\"method\": \"off\", \"callback\": true}"),
                HasSubstr("line 1: args: std off: takes no --callback"));
    EXPECT_EQ(sequenceProblem("{\"method\": \"on\", \"args\": [[1]]}"),
              "line 1: args: strings, numbers and booleans are accepted");
}

TEST(AhapPlan, BecomesPacketsWhereTheyAreOffered) {
    EXPECT_THAT(ahapAs(transients({0.1, 0.3}, 0.5, 1), kPackets),
                ElementsAre("100 ms ext performHapticEngine 10000 20,5000,2500,0 180,0,2500,0 "
                            "20,5000,2500,0"));
    EXPECT_THAT(ahapAs(kRamp, kPackets),
                ElementsAre("100 ms ext performHapticEngine 10000 20,2000,2000,0 20,6000,2000,0 "
                            "20,10000,2000,0"));
}

TEST(AhapPlan, OfTransientsBecomesCompositions) {
    EXPECT_THAT(ahapAs(transients({0, 0.1}, 0.5, 0.2), kCompositions),
                ElementsAre("0 ms std compose 0,LOW_TICK,0.5 80,LOW_TICK,0.5"));
    EXPECT_THAT(ahapAs(transients({0, 2}, 1, 0.8), kCompositions),
                ElementsAre("0 ms std compose 0,CLICK,1", "2000 ms std compose 0,CLICK,1"));
    std::vector<double> eleven;
    for (int i = 0; i < 11; ++i) eleven.push_back(i * 0.02);
    EXPECT_THAT(ahapAs(transients(eleven, 1, 0.8), kCompositions),
                ElementsAre("0 ms std compose 0,CLICK,1 0,CLICK,1 0,CLICK,1 0,CLICK,1 0,CLICK,1 "
                            "0,CLICK,1 0,CLICK,1 0,CLICK,1 0,CLICK,1 0,CLICK,1",
                            "200 ms std compose 0,CLICK,1"));
}

TEST(AhapPlan, ElseBecomesStepsOfAmplitudeAndDuration) {
    EXPECT_THAT(ahapAs(kRamp, kCompositions),
                ElementsAre("100 ms std setAmplitude 0.2", "100 ms std on 60",
                            "120 ms std setAmplitude 0.6", "140 ms std setAmplitude 1"));
    EXPECT_THAT(ahapAs(transients({0, 0.1}, 0.5, 0.2), kNothing),
                ElementsAre("0 ms std on 20", "100 ms std on 20"));
}

TEST(AhapPlan, ExplainsWhatBecameOfEachEvent) {
    Plan plan;
    EXPECT_FALSE(planAhap(transients({0, 0.01}, 0.5, 0.2), kNothing, plan));
    EXPECT_THAT(plan.notes,
                ElementsAre("line 1: transient at 0 ms, intensity 0.5, sharpness 0.2: on and off: "
                            "its intensity is lost, cut off at 10 ms by the next event",
                            "line 2: transient at 10 ms, intensity 0.5, sharpness 0.2: on and off: "
                            "its intensity is lost"));
    plan = {};
    EXPECT_FALSE(planAhap(transients({0, 0.01}, 0.5, 0.2), kCompositions, plan));
    EXPECT_EQ(plan.notes.back(),
              "line 2: transient at 10 ms, intensity 0.5, sharpness 0.2: LOW_TICK, 10 ms late");
}

TEST(AhapPlan, NamesTheLineAndTheKeyThatIsWrong) {
    EXPECT_EQ(ahapProblem("{\n\"Pattern\": [}\n"),
              "line 2: Syntax error: value, object or array expected.");
    EXPECT_EQ(ahapProblem("{\n\"Patern\": []}"),
              "line 2: unknown key \"Patern\"; accepted are Version, Metadata, Pattern");
    EXPECT_EQ(ahapProblem("{\"Pattern\": []}"), "Pattern: at least one event is accepted");
    EXPECT_EQ(ahapProblem("{\"Pattern\": [\n{\"Event\": {\"EventType\": \"Buzz\"}}]}"),
              "line 2: EventType: HapticTransient, HapticContinuous, AudioCustom and "
              "AudioContinuous are accepted");
    EXPECT_EQ(ahapProblem("{\"Pattern\": [{\"Event\": {\"EventType\": \"HapticContinuous\",\n"
                          "\"EventDuration\": \"long\"}}]}"),
              "line 2: EventDuration: a number from 0 to 60 is accepted");
}

TEST(Ahap, IsToldFromASequence) {
    EXPECT_TRUE(isAhap("{\"Version\": 1, \"Pattern\": []}"));
    EXPECT_FALSE(isAhap("{\"at\": 0, \"method\": \"off\"}\n{\"at\": 1, \"method\": \"off\"}\n"));
}

}  // namespace
}  // namespace vibctl
