// SPDX-License-Identifier: Apache-2.0
//
// The composite waveform compiler: every token, every refusal, the bytes of the driver's layout.
#include <algorithm>
#include <cstdint>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "HwApi.h"
#include "tests/allocation_counter.h"
#include "tests/log_capture.h"

namespace aidl::android::hardware::vibrator {
namespace {

using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::IsEmpty;
using testing::internal::CaptureStderr;
using testing::internal::CaptureStdout;
using testing::internal::GetCapturedStderr;
using testing::internal::GetCapturedStdout;

using Bytes = std::vector<uint8_t>;

constexpr int kInvalidWaveform = -22;
// Written behind the output buffer, to show that nothing is written past its end.
constexpr uint8_t kUntouched = 0xa5;

struct Outcome {
    int result = 0;
    Bytes bytes;          // as many as the result says
    std::string printed;  // on standard output
};

Outcome compile(std::string text) {
    Bytes buffer(1152, 0);
    buffer.insert(buffer.end(), 64, kUntouched);
    const LogCapture log;
    CaptureStdout();
    CaptureStderr();
    Outcome outcome;
    const AllocationCounter allocations;
    outcome.result = HwApi::wt_type10_comp_str_to_bin(text.data(), buffer.data());
    EXPECT_EQ(allocations.taken(), 0U) << text;
    outcome.printed = GetCapturedStdout();
    EXPECT_EQ(GetCapturedStderr(), "");
    EXPECT_THAT(log.lines(), IsEmpty());
    EXPECT_EQ(Bytes(buffer.begin() + 1152, buffer.end()), Bytes(64, kUntouched));
    if (outcome.result > 0) outcome.bytes.assign(buffer.begin(), buffer.begin() + outcome.result);
    return outcome;
}

void expectBytes(const std::string& text, const Bytes& expected) {
    const Outcome outcome = compile(text);
    EXPECT_EQ(outcome.result, static_cast<int>(expected.size())) << text;
    EXPECT_EQ(outcome.bytes, expected) << text;
    EXPECT_EQ(outcome.printed, "") << text;
}

void expectRefusal(const std::string& text, const std::string& message) {
    const Outcome outcome = compile(text);
    EXPECT_EQ(outcome.result, kInvalidWaveform) << text;
    EXPECT_EQ(outcome.printed, message) << text;
}

std::string repeated(const std::string& piece, int count) {
    std::string text;
    for (int i = 0; i < count; ++i) text += piece;
    return text;
}

TEST(CompositeWaveform, LoopOfOneEntryIsTwelveBytes) {
    expectBytes("5.100, 10, ~", {0, 0, 1, 0xff, 0, 0x64, 5, 0, 0, 0, 0, 0x0a});
}

TEST(CompositeWaveform, DurationIsInQuarterMillisecondsWithItsFlag) {
    expectBytes("1.50.20", {0, 0, 1, 0, 0, 50, 1, 0, 0, 8, 0, 0, 0, 0, 0, 0x50});
}

TEST(CompositeWaveform, InnerLoopOfOneSectionKeepsTheCountOnly) {
    expectBytes("!!, 3.80, 50, 2!!", {0, 0, 1, 0, 0, 80, 3, 2, 0, 0, 0, 50});
}

TEST(CompositeWaveform, InnerLoopOfTwoSectionsMarksFirstAndLast) {
    expectBytes("!!,1.10,2.20,3!!",
                {0, 0, 2, 0, 0, 10, 1, 0xff, 0, 0, 0, 0, 0, 20, 2, 3, 0, 0, 0, 0});
}

TEST(CompositeWaveform, InnerLoopAfterContentStartsASectionOfItsOwn) {
    expectBytes("1.10,!!,2.20,3!!,4.40", {0, 0,  3, 0,              //
                                          0, 10, 1, 0, 0, 0, 0, 0,  //
                                          0, 20, 2, 3, 0, 0, 0, 0,  //
                                          0, 40, 4, 0, 0, 0, 0, 0});
}

TEST(CompositeWaveform, WaveformAndPauseShareASection) {
    expectBytes("1.100,50", {0, 0, 1, 0, 0, 100, 1, 0, 0, 0, 0, 50});
}

TEST(CompositeWaveform, PauseBeforeAWaveformIsASectionOfItsOwn) {
    expectBytes("50,1.100", {0, 0, 2, 0, 0, 0, 0, 0, 0, 0, 0, 50, 0, 100, 1, 0, 0, 0, 0, 0});
}

TEST(CompositeWaveform, TwoPausesTakeTwoSections) {
    expectBytes("10,300", {0, 0, 2, 0, 0, 0, 0, 0, 0, 0, 0, 10, 0, 0, 0, 0, 0, 0, 1, 0x2c});
}

TEST(CompositeWaveform, OuterLoopCountIsKept) {
    expectBytes("3!,1.10", {0, 0, 1, 3, 0, 10, 1, 0, 0, 0, 0, 0});
}

TEST(CompositeWaveform, CountsAreKeptToEightBits) {
    expectBytes("258!,1.10", {0, 0, 1, 2, 0, 10, 1, 0, 0, 0, 0, 0});
    expectBytes("!!,1.10,259!!", {0, 0, 1, 0, 0, 10, 1, 3, 0, 0, 0, 0});
}

TEST(CompositeWaveform, EntryIndexIsKeptToEightBits) {
    expectBytes("300.10", {0, 0, 1, 0, 0, 10, 44, 0, 0, 0, 0, 0});
}

TEST(CompositeWaveform, EmptyTextIsAHeader) {
    expectBytes("", {0, 0, 0, 0});
    expectBytes(" ,\n, ", {0, 0, 0, 0});
}

TEST(CompositeWaveform, CommasSpacesAndLineFeedsSeparate) {
    expectBytes("1.10\n20 2.30", {0, 0, 2, 0, 0, 10, 1, 0, 0, 0, 0, 20, 0, 30, 2, 0, 0, 0, 0, 0});
}

TEST(CompositeWaveform, SeparatorsInAnyNumberAreOne) {
    expectBytes(repeated(", \n", 100000) + "1.10" + repeated("\n ,", 100000),
                {0, 0, 1, 0, 0, 10, 1, 0, 0, 0, 0, 0});
}

TEST(CompositeWaveform, TrailingCommaIsNoToken) {
    expectBytes("50,1.100,", {0, 0, 2, 0, 0, 0, 0, 0, 0, 0, 0, 50, 0, 100, 1, 0, 0, 0, 0, 0});
}

TEST(CompositeWaveform, OwnLengthIsPassedOn) {
    expectBytes("1.50.65535", {0, 0, 1, 0, 0, 50, 1, 0, 0, 8, 0, 0, 0, 0, 0xff, 0xff});
}

TEST(CompositeWaveform, LongestDurationIsAccepted) {
    expectBytes("1.50.16383", {0, 0, 1, 0, 0, 50, 1, 0, 0, 8, 0, 0, 0, 0, 0xff, 0xfc});
}

TEST(CompositeWaveform, DurationZeroCarriesNoFlag) {
    expectBytes("1.50.0", {0, 0, 1, 0, 0, 50, 1, 0, 0, 0, 0, 0});
}

TEST(CompositeWaveform, EntryZeroNeedsADuration) {
    expectRefusal("0.50", "Invalid waveform index: 0\n");
    expectBytes("0.50.10", {0, 0, 1, 0, 0, 50, 0, 0, 0, 8, 0, 0, 0, 0, 0, 40});
}

TEST(CompositeWaveform, FourthNumberIsIgnored) {
    expectBytes("1.50.20.99999", {0, 0, 1, 0, 0, 50, 1, 0, 0, 8, 0, 0, 0, 0, 0, 0x50});
}

TEST(CompositeWaveform, SecondOuterLoopIsRefused) {
    expectRefusal("~, ~", "Duplicate outer loop specifier\n");
    expectRefusal("3!, ~", "Duplicate outer loop specifier\n");
    expectRefusal("~, 3!", "Duplicate outer loop specifier\n");
    expectRefusal("2!,0!", "Duplicate outer loop specifier\n");
}

TEST(CompositeWaveform, OuterLoopNeedsACount) {
    expectRefusal("0!", "Failed to get outer loop specifier\n");
    expectRefusal("!", "Failed to get outer loop specifier\n");
    expectRefusal("x!", "Failed to get outer loop specifier\n");
}

TEST(CompositeWaveform, InnerLoopsMustBePaired) {
    expectRefusal("2!!", "Error: Inner loop stop with no start\n");
    expectRefusal("!!, 1.10", "Inner loop never terminated\n");
    expectRefusal("!!, 1.10, !!", "Nested inner loop specifier not allowed\n");
}

TEST(CompositeWaveform, InnerLoopNeedsACount) {
    expectRefusal("!!,1.10,0!!", "Failed to get inner loop repeat value\n");
    expectRefusal("!!,1.10,!!!", "Failed to get inner loop repeat value\n");
}

TEST(CompositeWaveform, WaveformNeedsTwoNumbers) {
    expectRefusal("1.", "Failed to parse waveform\n");
    expectRefusal(".5", "Failed to parse waveform\n");
    expectRefusal("a.b", "Failed to parse waveform\n");
    expectRefusal("1..5", "Failed to parse waveform\n");
}

TEST(CompositeWaveform, AmplitudeIsOneToHundred) {
    expectRefusal("1.0", "Invalid waveform amplitude: 0\n");
    expectRefusal("1.101", "Invalid waveform amplitude: 101\n");
    expectBytes("1.1", {0, 0, 1, 0, 0, 1, 1, 0, 0, 0, 0, 0});
}

TEST(CompositeWaveform, TooLongADurationIsRefused) {
    expectRefusal("1.50.16384", "Duration too long: 16384 ms\n");
    expectRefusal("1.50.65534", "Duration too long: 65534 ms\n");
    EXPECT_EQ(compile("1.50.4294967296").result, kInvalidWaveform);
    EXPECT_EQ(compile("1.50.99999999999999999999").result, kInvalidWaveform);
}

TEST(CompositeWaveform, PauseIsOneToTenThousand) {
    expectRefusal("0", "Failed to get inner loop repeat value\n");
    expectRefusal("x", "Failed to get inner loop repeat value\n");
    expectRefusal("10001", "Delay 10001 too long\n");
    expectBytes("10000", {0, 0, 1, 0, 0, 0, 0, 0, 0, 0, 0x27, 0x10});
}

TEST(CompositeWaveform, NumbersAreReadAsTheCLibraryReadsThem) {
    // White space and a sign may precede the digits, and what follows them is not looked at.
    expectBytes("\t7x", {0, 0, 1, 0, 0, 0, 0, 0, 0, 0, 0, 7});
    expectBytes("+7", {0, 0, 1, 0, 0, 0, 0, 0, 0, 0, 0, 7});
    expectBytes("0007", {0, 0, 1, 0, 0, 0, 0, 0, 0, 0, 0, 7});
    expectBytes("1.+50x.20", {0, 0, 1, 0, 0, 50, 1, 0, 0, 0, 0, 0});
    // A negative number wraps: -18446744073709551609 is 7.
    expectBytes("-18446744073709551609", {0, 0, 1, 0, 0, 0, 0, 0, 0, 0, 0, 7});
    expectRefusal("18446744073709551610", "Delay 18446744073709551610 too long\n");
    expectRefusal("18446744073709551615", "Delay 18446744073709551615 too long\n");
    expectRefusal("18446744073709551616", "Delay 18446744073709551615 too long\n");
    expectRefusal("-18446744073709551617", "Delay 18446744073709551615 too long\n");
    expectRefusal("--7", "Failed to get inner loop repeat value\n");
    expectRefusal("0x10", "Failed to get inner loop repeat value\n");
}

TEST(CompositeWaveform, BytesThatAreNoCharactersArePartOfATokenOnly) {
    expectRefusal("\x80\xff", "Failed to get inner loop repeat value\n");
    expectBytes("1.10\xff", {0, 0, 1, 0, 0, 10, 1, 0, 0, 0, 0, 0});
    expectRefusal("\xff!", "Failed to get outer loop specifier\n");
}

TEST(CompositeWaveform, TildeWithCompanyIsNoLoopForEver) {
    expectRefusal("~~", "Failed to get inner loop repeat value\n");
    expectRefusal("0~", "Failed to get inner loop repeat value\n");
    expectRefusal("~!", "Failed to get outer loop specifier\n");
    expectRefusal("~.5", "Failed to parse waveform\n");
}

TEST(CompositeWaveform, OuterLoopOf256IsNoneAndMayBeGivenAgain) {
    expectBytes("256!,1.10,~", {0, 0, 1, 0xff, 0, 10, 1, 0, 0, 0, 0, 0});
}

TEST(CompositeWaveform, OuterLoopMayStandAnywhere) {
    expectBytes("1.10,~,2.20", {0, 0, 2, 0xff, 0, 10, 1, 0, 0, 0, 0, 0, 0, 20, 2, 0, 0, 0, 0, 0});
}

TEST(CompositeWaveform, EmptyInnerLoopIsASectionOfItsOwn) {
    expectBytes("!!,2!!", {0, 0, 1, 0, 0, 0, 0, 2, 0, 0, 0, 0});
}

TEST(CompositeWaveform, InnerLoopsMayFollowEachOther) {
    expectBytes("!!,1.10,2!!,!!,2.20,3!!",
                {0, 0, 2, 0, 0, 10, 1, 2, 0, 0, 0, 0, 0, 20, 2, 3, 0, 0, 0, 0});
}

TEST(CompositeWaveform, FailedInnerLoopCountIsTheOnlyMessage) {
    expectRefusal("!!,x!!", "Failed to get inner loop repeat value\n");
}

TEST(CompositeWaveform, NegativePauseIsRefused) {
    expectRefusal("-5", "Delay 18446744073709551611 too long\n");
}

TEST(CompositeWaveform, SpecifiersAreLookedForInTheFirstTwentyCharacters) {
    // The point is the 21st character, so this is a pause, and far too long.
    expectRefusal("11111111111111111111.50", "Delay 11111111111111111111 too long\n");
    expectRefusal("99999999999999999999.50", "Delay 18446744073709551615 too long\n");
    // The exclamation mark is the 21st, the point the 2nd: a waveform.
    expectBytes("1.50.000000000000010!", {0, 0, 1, 0, 0, 50, 1, 0, 0, 8, 0, 0, 0, 0, 0, 40});
    // A doubled one is found anywhere.
    expectRefusal("1.50.00000000000000000010!!", "Error: Inner loop stop with no start\n");
}

TEST(CompositeWaveform, AnErrorEndsTheCompilation) {
    expectRefusal("~,~,0,x,2!!", "Duplicate outer loop specifier\n");
}

TEST(CompositeWaveform, HundredFortyThreeSectionsFillTheBufferButForAWord) {
    const Outcome outcome = compile(repeated("1.10,", 143));
    EXPECT_EQ(outcome.result, 4 + 143 * 8);
    EXPECT_EQ(outcome.bytes[2], 143);
}

TEST(CompositeWaveform, BufferHolds287WordsHoweverLongTheText) {
    for (const int sections : {144, 145, 200, 255}) {
        const Outcome outcome = compile(repeated("1.10.5,20,", sections));
        EXPECT_EQ(outcome.result, 4 + 287 * 4) << sections;
        EXPECT_EQ(outcome.bytes[2], sections);
        EXPECT_EQ(outcome.printed, "");
    }
}

TEST(CompositeWaveform, TwoHundredEightySevenWordsAreWholeSectionsAndTwoThirdsOfOne) {
    // 95 sections of three words are 285; of the 96th the first two words remain.
    const Outcome outcome = compile(repeated("1.10.5,", 95) + "2.20.7,30");
    ASSERT_EQ(outcome.result, 1152);
    EXPECT_THAT(Bytes(outcome.bytes.end() - 12, outcome.bytes.end()),
                ElementsAre(0, 0, 0, 20, 0, 20, 2, 0, 0, 8, 0, 30));
}

TEST(CompositeWaveform, WritingStopsAtTheLastWordThatFits) {
    // 144 sections of two words are one word too many: the last section's second word is left out.
    const Outcome outcome = compile(repeated("1.10,20,", 144));
    EXPECT_EQ(outcome.result, 1152);
    EXPECT_EQ(outcome.bytes[2], 144);
    EXPECT_THAT(Bytes(outcome.bytes.end() - 8, outcome.bytes.end()),
                ElementsAre(0, 0, 0, 20, 0, 10, 1, 0));
}

TEST(CompositeWaveform, SectionsWithDurationStopAtTheLastWordThatFitsToo) {
    const Outcome outcome = compile(repeated("1.10.5,", 96));
    EXPECT_EQ(outcome.result, 1152);
    EXPECT_EQ(outcome.bytes[2], 96);
    EXPECT_THAT(Bytes(outcome.bytes.end() - 8, outcome.bytes.end()),
                ElementsAre(0, 10, 1, 0, 0, 8, 0, 0));
}

TEST(CompositeWaveform, TwoHundredFiftySixSectionsCountAsZero) {
    const Outcome outcome = compile(repeated("1.10,", 256));
    EXPECT_EQ(outcome.result, 1152);
    EXPECT_EQ(outcome.bytes[2], 0);
    EXPECT_EQ(outcome.printed, "");
}

TEST(CompositeWaveform, TwoHundredFiftySeventhSectionHasNoPlace) {
    expectRefusal(repeated("1.10,", 257), "");
    expectRefusal(repeated("10,", 257), "");
    expectRefusal(repeated("1.10,", 256) + "!!", "");
}

TEST(CompositeWaveform, InnerLoopMayEndOnTheLastSection) {
    const Outcome outcome = compile(repeated("1.10,", 255) + "!!,2.20,3!!");
    EXPECT_EQ(outcome.result, 1152);
    EXPECT_EQ(outcome.bytes[2], 0);
    for (const char* further : {"4.40", "50", "!!"}) {
        expectRefusal(repeated("1.10,", 255) + "!!,2.20,3!!," + further, "");
    }
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
