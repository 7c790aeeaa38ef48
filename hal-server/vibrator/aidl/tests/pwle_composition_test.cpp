// SPDX-License-Identifier: Apache-2.0
//
// Piecewise-linear compositions: the guard that refuses them all, and what lies behind it, which
// is reached through a service that offers a size.
#include <cmath>
#include <cstddef>
#include <cstring>
#include <limits>
#include <memory>
#include <sstream>
#include <string>
#include <type_traits>
#include <vector>

#include "standard/PwleComposition.h"
#include "tests/composition_test.h"

namespace aidl::android::hardware::vibrator {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

using Entries = std::vector<PrimitivePwle>;

PrimitivePwle ramp(float startAmplitude, float startFrequency, float endAmplitude,
                   float endFrequency, int32_t durationMs) {
    ActivePwle active;
    active.startAmplitude = startAmplitude;
    active.startFrequency = startFrequency;
    active.endAmplitude = endAmplitude;
    active.endFrequency = endFrequency;
    active.duration = durationMs;
    return active;
}

// Half amplitude at 150 Hz throughout.
PrimitivePwle level(int32_t durationMs) {
    return ramp(0.5F, 150.0F, 0.5F, 150.0F, durationMs);
}

PrimitivePwle brake(int32_t braking, int32_t durationMs) {
    BrakingPwle entry;
    entry.braking = static_cast<Braking>(braking);
    entry.duration = durationMs;
    return entry;
}

// The string behind its header; "refused" for a list that is out of range.
std::string segmentsOf(const Entries& entries) {
    constexpr std::string_view kHeader = "S:0,WF:4,RP:0,WT:0";
    const auto sequence = buildPwleSequence(entries);
    if (!sequence) return "refused";
    if (sequence->text.substr(0, kHeader.size()) != kHeader) return "no header: " + sequence->text;
    return sequence->text.substr(kHeader.size());
}

TEST(PwleSegment, ActiveDefaultsFollowTheSegmentsNumber) {
    std::ostringstream text;
    constructActiveDefaults(text, 3);
    EXPECT_EQ(text.str(), ",C3:1,B3:0,AR3:0,V3:0");
}

TEST(PwleSegment, ActiveHasLengthLevelFrequencyAndTheDefaults) {
    std::ostringstream text;
    constructActiveSegment(text, 12, 100, 0.5F, 150.0F);
    EXPECT_EQ(text.str(), ",T12:100,L12:0.5,F12:150,C12:1,B12:0,AR12:0,V12:0");
}

TEST(PwleSegment, BrakingIsAtRestAndSaysHow) {
    std::ostringstream text;
    constructBrakingSegment(text, 0, 20, Braking::CLAB);
    constructBrakingSegment(text, 1, 0, Braking::NONE);
    EXPECT_EQ(text.str(),
              ",T0:20,L0:0,F0:0,C0:0,B0:1,AR0:0,V0:0,T1:0,L1:0,F1:0,C1:0,B1:0,AR1:0,V1:0");
}

struct Sequence {
    const char* name;
    Entries entries;
    const char* text;
    int64_t totalMs;
};

class PwleSequenceOf : public ::testing::TestWithParam<Sequence> {};

TEST_P(PwleSequenceOf, IsTheHeaderAndItsSegments) {
    const auto sequence = buildPwleSequence(GetParam().entries);
    ASSERT_TRUE(sequence.has_value());
    EXPECT_EQ(sequence->text, GetParam().text);
    EXPECT_EQ(sequence->totalMs, GetParam().totalMs);
}

const Sequence kSequences[] = {
        {"NoEntries", {}, "S:0,WF:4,RP:0,WT:0", 0},
        {"OneLevel",
         {level(100)},
         "S:0,WF:4,RP:0,WT:0,T0:0,L0:0.5,F0:150,C0:1,B0:0,AR0:0,V0:0"
         ",T1:100,L1:0.5,F1:150,C1:1,B1:0,AR1:0,V1:0",
         100},
        {"SecondLevelWithoutALeadIn",
         {level(100), level(50)},
         "S:0,WF:4,RP:0,WT:0,T0:0,L0:0.5,F0:150,C0:1,B0:0,AR0:0,V0:0"
         ",T1:100,L1:0.5,F1:150,C1:1,B1:0,AR1:0,V1:0"
         ",T2:50,L2:0.5,F2:150,C2:1,B2:0,AR2:0,V2:0",
         150},
        {"RampGoesToItsEnd",
         {ramp(0.25F, 140.0F, 0.75F, 160.0F, 30)},
         "S:0,WF:4,RP:0,WT:0,T0:0,L0:0.25,F0:140,C0:1,B0:0,AR0:0,V0:0"
         ",T1:30,L1:0.75,F1:160,C1:1,B1:0,AR1:0,V1:0",
         30},
        {"RampThatGoesOnWhereTheLastEnded",
         {ramp(0.25F, 140.0F, 0.75F, 160.0F, 30), ramp(0.75F, 160.0F, 0.0F, 150.0F, 40)},
         "S:0,WF:4,RP:0,WT:0,T0:0,L0:0.25,F0:140,C0:1,B0:0,AR0:0,V0:0"
         ",T1:30,L1:0.75,F1:160,C1:1,B1:0,AR1:0,V1:0"
         ",T2:40,L2:0,F2:150,C2:1,B2:0,AR2:0,V2:0",
         70},
        {"LeadInToAnotherAmplitude",
         {level(10), ramp(0.25F, 150.0F, 0.5F, 150.0F, 10)},
         "S:0,WF:4,RP:0,WT:0,T0:0,L0:0.5,F0:150,C0:1,B0:0,AR0:0,V0:0"
         ",T1:10,L1:0.5,F1:150,C1:1,B1:0,AR1:0,V1:0"
         ",T2:0,L2:0.25,F2:150,C2:1,B2:0,AR2:0,V2:0"
         ",T3:10,L3:0.5,F3:150,C3:1,B3:0,AR3:0,V3:0",
         20},
        {"LeadInToAnotherFrequency",
         {level(10), ramp(0.5F, 145.0F, 0.5F, 150.0F, 10)},
         "S:0,WF:4,RP:0,WT:0,T0:0,L0:0.5,F0:150,C0:1,B0:0,AR0:0,V0:0"
         ",T1:10,L1:0.5,F1:150,C1:1,B1:0,AR1:0,V1:0"
         ",T2:0,L2:0.5,F2:145,C2:1,B2:0,AR2:0,V2:0"
         ",T3:10,L3:0.5,F3:150,C3:1,B3:0,AR3:0,V3:0",
         20},
        {"BrakingTakesTwoSegments",
         {brake(1, 20)},
         "S:0,WF:4,RP:0,WT:0,T0:0,L0:0,F0:0,C0:0,B0:1,AR0:0,V0:0"
         ",T1:20,L1:0,F1:0,C1:0,B1:1,AR1:0,V1:0",
         20},
        {"LeadInAfterBraking",
         {level(10), brake(0, 20), level(30)},
         "S:0,WF:4,RP:0,WT:0,T0:0,L0:0.5,F0:150,C0:1,B0:0,AR0:0,V0:0"
         ",T1:10,L1:0.5,F1:150,C1:1,B1:0,AR1:0,V1:0"
         ",T2:0,L2:0,F2:0,C2:0,B2:0,AR2:0,V2:0,T3:20,L3:0,F3:0,C3:0,B3:0,AR3:0,V3:0"
         ",T4:0,L4:0.5,F4:150,C4:1,B4:0,AR4:0,V4:0"
         ",T5:30,L5:0.5,F5:150,C5:1,B5:0,AR5:0,V5:0",
         60},
};

INSTANTIATE_TEST_SUITE_P(Pwle, PwleSequenceOf, ::testing::ValuesIn(kSequences),
                         [](const auto& sequence) { return sequence.param.name; });

TEST(PwleText, FloatsHaveSixSignificantDigits) {
    EXPECT_EQ(segmentsOf({ramp(0.12345678F, 140.12345F, 0.00001F, 159.99999F, 1)}),
              ",T0:0,L0:0.123457,F0:140.123,C0:1,B0:0,AR0:0,V0:0"
              ",T1:1,L1:1e-05,F1:160,C1:1,B1:0,AR1:0,V1:0");
}

TEST(PwleText, NotANumberIsInRangeAndAlwaysGetsALeadIn) {
    const PrimitivePwle unknown = ramp(kNan, kNan, kNan, kNan, 1);
    EXPECT_EQ(segmentsOf({unknown, unknown}),
              ",T0:0,L0:nan,F0:nan,C0:1,B0:0,AR0:0,V0:0,T1:1,L1:nan,F1:nan,C1:1,B1:0,AR1:0,V1:0"
              ",T2:0,L2:nan,F2:nan,C2:1,B2:0,AR2:0,V2:0,T3:1,L3:nan,F3:nan,C3:1,B3:0,AR3:0,V3:0");
}

TEST(PwleText, LengthOfARampIsTakenAs16Bits) {
    for (const auto& [durationMs, text] :
         {std::pair(16383, "16383"), std::pair(0, "0"), std::pair(-1, "65535"),
          std::pair(-65536 + 100, "100"), std::pair(kIntMin, "0")}) {
        EXPECT_EQ(segmentsOf({level(durationMs)}),
                  std::string(",T0:0,L0:0.5,F0:150,C0:1,B0:0,AR0:0,V0:0,T1:") + text +
                          ",L1:0.5,F1:150,C1:1,B1:0,AR1:0,V1:0");
    }
}

TEST(PwleText, LengthOfBrakingIsTakenWhole) {
    for (const auto& [durationMs, text] :
         {std::pair(16383, "16383"), std::pair(-1, "-1"), std::pair(kIntMin, "-2147483648")}) {
        EXPECT_EQ(segmentsOf({brake(0, durationMs)}),
                  std::string(",T0:0,L0:0,F0:0,C0:0,B0:0,AR0:0,V0:0,T1:") + text +
                          ",L1:0,F1:0,C1:0,B1:0,AR1:0,V1:0");
    }
}

TEST(PwleTotal, CountsNegativeLengthsInFullAndDoesNotOverflow) {
    EXPECT_EQ(buildPwleSequence({level(kIntMin), brake(0, kIntMin), level(kIntMin)})->totalMs,
              -6442450944);
    EXPECT_EQ(buildPwleSequence({level(100), brake(0, -30)})->totalMs, 70);
    EXPECT_EQ(buildPwleSequence(Entries(200000, level(16383)))->totalMs, 3276600000);
}

// An entry whose union holds neither kind, as one from a client with a newer interface might: the
// tag is the byte behind the larger kind.
PrimitivePwle ofUnknownKind() {
    static_assert(std::is_trivially_copyable_v<PrimitivePwle>);
    static_assert(sizeof(ActivePwle) > sizeof(BrakingPwle));
    PrimitivePwle entry = level(100);
    const unsigned char tag = 7;
    memcpy(reinterpret_cast<std::byte*>(&entry) + sizeof(ActivePwle), &tag, sizeof(tag));
    return entry;
}

TEST(PwleText, EntryOfAnUnknownKindIsSkippedAndLeavesTheRampWhereItWas) {
    ASSERT_EQ(static_cast<int>(ofUnknownKind().getTag()), 7);
    EXPECT_EQ(segmentsOf({ofUnknownKind()}), "");
    EXPECT_EQ(segmentsOf({level(100), ofUnknownKind(), level(50)}),
              ",T0:0,L0:0.5,F0:150,C0:1,B0:0,AR0:0,V0:0"
              ",T1:100,L1:0.5,F1:150,C1:1,B1:0,AR1:0,V1:0"
              ",T2:50,L2:0.5,F2:150,C2:1,B2:0,AR2:0,V2:0");
}

struct Bound {
    const char* name;
    PrimitivePwle entry;
    bool accepted;
};

constexpr float kLeastFloat = std::numeric_limits<float>::denorm_min();
constexpr float kMaxAmplitude = 0.98256F;
const float kOverMaxAmplitude = std::nextafter(kMaxAmplitude, 1.0F);
const float kUnder140Hz = std::nextafter(140.0F, 0.0F);
const float kOver160Hz = std::nextafter(160.0F, 200.0F);

const Bound kBounds[] = {
        {"LargestStartAmplitude", ramp(kMaxAmplitude, 150, 0, 150, 1), true},
        {"StartAmplitudeAboveIt", ramp(kOverMaxAmplitude, 150, 0, 150, 1), false},
        {"StartAmplitudeOfTheNextDigit", ramp(0.98257F, 150, 0, 150, 1), false},
        {"LargestEndAmplitude", ramp(0, 150, kMaxAmplitude, 150, 1), true},
        {"EndAmplitudeAboveIt", ramp(0, 150, kOverMaxAmplitude, 150, 1), false},
        {"EndAmplitudeOfTheNextDigit", ramp(0, 150, 0.98257F, 150, 1), false},
        {"LeastAmplitudes", ramp(0.0F, 150, 0.0F, 150, 1), true},
        {"NegativeZeroAmplitudes", ramp(-0.0F, 150, -0.0F, 150, 1), true},
        {"StartAmplitudeBelowZero", ramp(-kLeastFloat, 150, 0, 150, 1), false},
        {"EndAmplitudeBelowZero", ramp(0, 150, -kLeastFloat, 150, 1), false},
        {"InfiniteStartAmplitude", ramp(kInfinity, 150, 0, 150, 1), false},
        {"InfiniteEndAmplitude", ramp(0, 150, kInfinity, 150, 1), false},
        {"LeastFrequencies", ramp(0, 140.0F, 0, 140.0F, 1), true},
        {"StartFrequencyBelow140", ramp(0, kUnder140Hz, 0, 150, 1), false},
        {"EndFrequencyBelow140", ramp(0, 150, 0, kUnder140Hz, 1), false},
        {"LargestFrequencies", ramp(0, 160.0F, 0, 160.0F, 1), true},
        {"StartFrequencyAbove160", ramp(0, kOver160Hz, 0, 150, 1), false},
        {"EndFrequencyAbove160", ramp(0, 150, 0, kOver160Hz, 1), false},
        {"InfiniteEndFrequency", ramp(0, 150, 0, kInfinity, 1), false},
        {"LongestRamp", level(16383), true},
        {"RampPastTheLongest", level(16384), false},
        {"LongestRampThereIs", level(kIntMax), false},
        {"RampThatWould16BitsFit", level(65536), false},
        {"NegativeRamp", level(-1), true},
        {"MostNegativeRamp", level(kIntMin), true},
        {"LongestBraking", brake(0, 16383), true},
        {"BrakingPastTheLongest", brake(0, 16384), false},
        {"LongestBrakingThereIs", brake(0, kIntMax), false},
        {"NegativeBraking", brake(0, -1), true},
        {"MostNegativeBraking", brake(0, kIntMin), true},
        {"BrakingOfKindOne", brake(1, 1), true},
        {"BrakingOfKindTwo", brake(2, 1), false},
        {"BrakingOfANegativeKind", brake(-1, 1), false},
        {"BrakingOfTheMostNegativeKind", brake(kIntMin, 1), false},
};

// A service that offers a size, and says in the same breath that it does not.
class OfferingSize : public Vibrator {
  public:
    OfferingSize(std::shared_ptr<HwApi> hwApi, int32_t size)
        : Vibrator(std::move(hwApi)), mSize(size) {}

    ndk::ScopedAStatus getPwleCompositionSizeMax(int32_t* _aidl_return) override {
        *_aidl_return = mSize;
        return ndk::ScopedAStatus::fromExceptionCode(EX_UNSUPPORTED_OPERATION);
    }

  private:
    const int32_t mSize;
};

class ComposePwle : public VibratorTest {
  protected:
    std::shared_ptr<Vibrator> makeVibratorWithSize(int32_t size) {
        auto vibrator = ndk::SharedRefBase::make<OfferingSize>(makeHwApi(), size);
        log.clear();
        return vibrator;
    }

    // The exception, once an accepted composition has been notified.
    binder_exception_t outcomeOf(Vibrator& vibrator, const Entries& entries) {
        const auto completion = ndk::SharedRefBase::make<CountingCallback>();
        const ndk::ScopedAStatus status = vibrator.composePwle(entries, completion);
        EXPECT_TRUE(!status.isOk() || completion->waitForCall());
        return status.getExceptionCode();
    }
};

TEST_F(ComposePwle, EveryListIsRefusedBecauseNoSizeIsOffered) {
    const auto vibrator = makeVibrator();
    const std::vector<Entries> lists = {{},
                                        {level(100)},
                                        {brake(0, 5)},
                                        {level(kIntMax)},
                                        {ofUnknownKind()},
                                        Entries(1000, level(1))};
    for (const Entries& entries : lists) {
        log.clear();
        EXPECT_EQ(exceptionOf(vibrator->composePwle(entries, callback)), EX_ILLEGAL_ARGUMENT);
        EXPECT_THAT(log.lines(), ElementsAre("E V_2_0: [getPwleCompositionSizeMax]unsupported"));
    }
    EXPECT_EQ(callback.use_count(), 1);
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_F(ComposePwle, ListsUpToTheOfferedSizeAreAccepted) {
    const auto vibrator = makeVibratorWithSize(2);
    EXPECT_EQ(outcomeOf(*vibrator, {}), EX_ILLEGAL_ARGUMENT);
    EXPECT_EQ(outcomeOf(*vibrator, {level(1)}), EX_NONE);
    EXPECT_EQ(outcomeOf(*vibrator, {level(1), level(1)}), EX_NONE);
    EXPECT_EQ(outcomeOf(*vibrator, {level(1), level(1), level(1)}), EX_ILLEGAL_ARGUMENT);
}

TEST_F(ComposePwle, NegativeSizeOffersNothing) {
    const auto vibrator = makeVibratorWithSize(-1);
    EXPECT_EQ(outcomeOf(*vibrator, {level(1)}), EX_ILLEGAL_ARGUMENT);
}

TEST_F(ComposePwle, IsNotifiedAfterItsLengthAndReachesNoNode) {
    const auto vibrator = makeVibratorWithSize(10);
    EXPECT_EQ(outcomeOf(*vibrator, {level(100), brake(1, 20), level(30)}), EX_NONE);
    EXPECT_THAT(kernel.calls(), ElementsAre("sleep 150 ms"));
    EXPECT_THAT(log.lines(), ElementsAre("I Starting composePwle on another thread",
                                         "I Notifying compose PWLE complete"));
    EXPECT_THAT(log.tags(), ElementsAre("QvxVibrator-HAL-AIDL-CORE"));
}

TEST_F(ComposePwle, NegativeTotalIsNotSleptAtAll) {
    const auto vibrator = makeVibratorWithSize(10);
    EXPECT_EQ(outcomeOf(*vibrator, {level(100), brake(1, kIntMin)}), EX_NONE);
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

class PwleBound : public ComposePwle, public ::testing::WithParamInterface<Bound> {};

TEST_P(PwleBound, IsKeptWithoutALine) {
    const auto vibrator = makeVibratorWithSize(2);
    if (GetParam().accepted) {
        EXPECT_EQ(outcomeOf(*vibrator, {level(1), GetParam().entry}), EX_NONE);
    } else {
        EXPECT_EQ(outcomeOf(*vibrator, {level(1), GetParam().entry}), EX_ILLEGAL_ARGUMENT);
        EXPECT_THAT(log.lines(), IsEmpty());
    }
}

INSTANTIATE_TEST_SUITE_P(Pwle, PwleBound, ::testing::ValuesIn(kBounds),
                         [](const auto& bound) { return bound.param.name; });

}  // namespace
}  // namespace aidl::android::hardware::vibrator
