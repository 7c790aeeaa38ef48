// SPDX-License-Identifier: Apache-2.0
//
// Composite waveforms on the force-feedback device: what is compiled, uploaded and started, and
// that the process's effect record is its own again afterwards, whatever happened.
#include <cerrno>
#include <cstdio>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "hwapi/DriverWriter.h"
#include "tests/allocation_counter.h"
#include "tests/force_feedback_phone.h"
#include "tests/sequence.h"

namespace aidl::android::hardware::vibrator {
namespace {

using fake::Operation;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::internal::CaptureStdout;
using ::testing::internal::GetCapturedStdout;

TEST(KypIndex, KeepsZeroAndHundredAndMovesTheOthers) {
    const std::pair<int32_t, int32_t> kPairs[] = {
            {0, 0},     {1, 10},    {2, 11},    {10, 19},   {50, 59},   {91, 100},
            {99, 108},  {100, 100}, {101, 110}, {117, 126}, {118, 127}, {119, 135},
            {120, 136}, {121, 137}, {122, 138}, {123, 139}, {124, 140}, {125, 134},
            {126, 135}, {255, 264}, {-1, 8},    {-9, 0},    {-10, -1},
    };
    for (const auto& [index, expected] : kPairs) EXPECT_EQ(toKypIndex(index), expected) << index;
}

TEST(KypIndex, WrapsAtTheEndsOfItsType) {
    EXPECT_EQ(toKypIndex(2147483647), -2147483640);
    EXPECT_EQ(toKypIndex(2147483638), 2147483647);
    EXPECT_EQ(toKypIndex(-2147483647 - 1), -2147483639);
}

class WavetableUpload : public ForceFeedbackPhone {
  protected:
    const std::shared_ptr<HwApi> hwApi = makeHwApi();
};

TEST_F(WavetableUpload, EntryIsLoopedAtFullAmplitude) {
    EXPECT_TRUE(hwApi->setAndTriggerOwt(5, 0));
    EXPECT_THAT(kernel.calls(), ElementsAre("open /dev/input/event7 O_RDWR",
                                            "upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 "
                                            "custom=\"00 00 01 ff 00 64 05 00 00 00 00 0a\"",
                                            "event type=21 code=0 value=1"));
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: [setAndTriggerOwt]str: 5.100, 10, ~",
                            "I HW_API: [setAndTriggerOwt]num_bytes: 12",
                            "I HW_API: [uploadForceFeedbackeffect]Input Node File Open: "
                            "/dev/input/event7",
                            "I HW_API: [uploadForceFeedbackeffect]ioctl success ,uploaded effect "
                            "with ID: 0",
                            "I HW_API: [triggerForceFeedbackVibration]on: 1"));
    EXPECT_THAT(log.tags(), ElementsAre("QvxVibrator-HAL-AIDL-CORE"));
    EXPECT_TRUE(recordHoldsTheIndexPair());
}

TEST_F(WavetableUpload, RecordIsTheOneOfPlainVibrationButForLengthAndData) {
    EXPECT_TRUE(hwApi->setForceFeedbackDuration(500));
    EXPECT_TRUE(hwApi->setAndTriggerOwt(5, 0));
    EXPECT_EQ(motor->records[1],
              Bytes({0x51, 0, 0xff, 0xff, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0x5d, 0, 0, 0,
                     0,    0, 0,    0,    0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 6,    0, 0, 0}));
    EXPECT_NE(motor->customData[1], forceFeedbackEffect.indexPair);
    EXPECT_TRUE(recordHoldsTheIndexPair());
    EXPECT_EQ(forceFeedbackEffect.record.replay.length, 0);
}

TEST_F(WavetableUpload, SecondArgumentDoesNotMatter) {
    EXPECT_TRUE(hwApi->setAndTriggerOwt(5, 77));
    EXPECT_THAT(log.lines(), ::testing::Contains("I HW_API: [setAndTriggerOwt]str: 5.100, 10, ~"));
}

TEST_F(WavetableUpload, EntryIsTranslatedOnADriverSwitchedToThePlatformsNumbers) {
    useKypIndex = true;
    EXPECT_TRUE(hwApi->setAndTriggerOwt(119, 0));
    EXPECT_EQ(log.line(0), "I HW_API: [setAndTriggerOwt]kyp index transform");
    EXPECT_EQ(log.line(1), "I HW_API: [setAndTriggerOwt]str: 135.100, 10, ~");
    EXPECT_EQ(kernel.calls()[1],
              "upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 "
              "custom=\"00 00 01 ff 00 64 87 00 00 00 00 0a\"");
    log.clear();
    EXPECT_TRUE(hwApi->setAndTriggerOwt(100, 0));
    EXPECT_EQ(log.line(0), "I HW_API: [setAndTriggerOwt]kyp index transform");
    EXPECT_EQ(log.line(1), "I HW_API: [setAndTriggerOwt]str: 100.100, 10, ~");
}

TEST_F(WavetableUpload, ExtremeEntriesAreOfOneByteInTheDriversLayout) {
    EXPECT_TRUE(hwApi->setAndTriggerOwt(-2147483647 - 1, 0));
    EXPECT_TRUE(hwApi->setAndTriggerOwt(2147483647, 0));
    EXPECT_EQ(kernel.calls()[1],
              "upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 "
              "custom=\"00 00 01 ff 00 64 00 00 00 00 00 0a\"");
    EXPECT_EQ(kernel.calls()[4],
              "upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 "
              "custom=\"00 00 01 ff 00 64 ff 00 00 00 00 0a\"");
}

TEST_F(WavetableUpload, TextIsPlayedAsItStandsAndNeverTranslated) {
    useKypIndex = true;
    EXPECT_TRUE(hwApi->setAndTriggerOwt_primitve("50, 1.100.20"));
    EXPECT_THAT(kernel.calls(), ElementsAre("open /dev/input/event7 O_RDWR",
                                            "upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 "
                                            "custom=\"00 00 02 00 00 00 00 00 00 00 00 32 "
                                            "00 64 01 00 00 08 00 00 00 00 00 50\"",
                                            "event type=21 code=0 value=1"));
    EXPECT_EQ(log.line(0), "I HW_API: [setAndTriggerOwt_primitve]str: 50, 1.100.20");
    EXPECT_EQ(log.line(1), "I HW_API: [setAndTriggerOwt_primitve]num_bytes: 24");
}

TEST_F(WavetableUpload, EmptyTextIsAHeader) {
    EXPECT_TRUE(hwApi->setAndTriggerOwt_primitve(""));
    EXPECT_EQ(log.line(0), "I HW_API: [setAndTriggerOwt_primitve]str: ");
    EXPECT_EQ(log.line(1), "I HW_API: [setAndTriggerOwt_primitve]num_bytes: 4");
    EXPECT_EQ(kernel.calls()[1],
              "upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 custom=\"00 00 00 00\"");
}

TEST_F(WavetableUpload, LongestWaveformIs576Values) {
    std::string text;
    for (int i = 0; i < 144; ++i) text += "1.10,20,";
    EXPECT_TRUE(hwApi->setAndTriggerOwt_primitve(text));
    EXPECT_EQ(log.line(1), "I HW_API: [setAndTriggerOwt_primitve]num_bytes: 1152");
    EXPECT_EQ(motor->records[0][36], 0x40);
    EXPECT_EQ(motor->records[0][37], 0x02);
}

TEST_F(WavetableUpload, CallersTextStaysWhole) {
    const std::string text = "50,1.100,";
    EXPECT_TRUE(hwApi->setAndTriggerOwt_primitve(text));
    EXPECT_EQ(text, "50,1.100,");
}

TEST_F(WavetableUpload, RefusedTextIsNotUploadedAndTheRecordNeverTouched) {
    EXPECT_TRUE(hwApi->setForceFeedbackDuration(500));
    kernel.clear();
    log.clear();
    CaptureStdout();
    EXPECT_FALSE(hwApi->setAndTriggerOwt_primitve("1.101"));
    EXPECT_EQ(GetCapturedStdout(), "Invalid waveform amplitude: 101\n");
    EXPECT_THAT(kernel.calls(), IsEmpty());
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: [setAndTriggerOwt_primitve]str: 1.101",
                                         "I HW_API: [setAndTriggerOwt_primitve]num_bytes: -22"));
    EXPECT_TRUE(recordHoldsTheIndexPair());
    EXPECT_EQ(forceFeedbackEffect.record.replay.length, 500);
    EXPECT_EQ(forceFeedbackEffect.record.id, 0);
}

TEST_F(WavetableUpload, EntryZeroIsRefusedByTheCompiler) {
    CaptureStdout();
    EXPECT_FALSE(hwApi->setAndTriggerOwt(0, 0));
    EXPECT_EQ(GetCapturedStdout(), "Invalid waveform index: 0\n");
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: [setAndTriggerOwt]str: 0.100, 10, ~",
                                         "I HW_API: [setAndTriggerOwt]num_bytes: -22"));
    EXPECT_TRUE(recordHoldsTheIndexPair());
}

TEST_F(WavetableUpload, FailedOpenRestoresTheRecordAndStartsNothing) {
    kernel.removeNode(kMotorNode);
    EXPECT_FALSE(hwApi->setAndTriggerOwt(5, 0));
    EXPECT_THAT(kernel.calls(), ElementsAre("open /dev/input/event7 O_RDWR = ENOENT"));
    EXPECT_TRUE(recordHoldsTheIndexPair());
    EXPECT_EQ(forceFeedbackEffect.record.replay.length, 0);
}

TEST_F(WavetableUpload, FailedUploadRestoresTheRecordAndStartsNothing) {
    kernel.addFault({.path = kMotorNode, .operation = Operation::kIoctl, .error = ENOSPC});
    EXPECT_FALSE(hwApi->setAndTriggerOwt_primitve("5.100, 10, ~"));
    EXPECT_THAT(motor->events, IsEmpty());
    EXPECT_TRUE(recordHoldsTheIndexPair());
    EXPECT_EQ(forceFeedbackEffect.record.id, -1);
}

TEST_F(WavetableUpload, FailedEraseRestoresTheRecordAndUploadsNothing) {
    EXPECT_TRUE(hwApi->setForceFeedbackDuration(500));
    kernel.addFault({.path = kMotorNode, .operation = Operation::kIoctl, .error = EIO});
    EXPECT_FALSE(hwApi->setAndTriggerOwt(5, 0));
    EXPECT_EQ(motor->records.size(), 1U);
    EXPECT_TRUE(recordHoldsTheIndexPair());
    EXPECT_EQ(forceFeedbackEffect.record.id, 0);
}

TEST_F(WavetableUpload, FailedStartRestoresTheRecordAndKeepsTheUploadedEffect) {
    kernel.addFault({.path = kMotorNode, .operation = Operation::kWrite, .error = EIO});
    EXPECT_FALSE(hwApi->setAndTriggerOwt(5, 0));
    EXPECT_TRUE(recordHoldsTheIndexPair());
    EXPECT_EQ(forceFeedbackEffect.record.id, 0);
}

struct Path {
    const char* name;
    const char* text;
    std::optional<Operation> failing;
};

class WavetableUploadPath : public WavetableUpload, public ::testing::WithParamInterface<Path> {
  protected:
    void play() {
        CaptureStdout();
        EXPECT_EQ(hwApi->setAndTriggerOwt_primitve(GetParam().text),
                  std::string(GetParam().name) == "Success");
        GetCapturedStdout();
        // What the test itself keeps of the calls.
        kernel.clear();
        log.clear();
        motor->forget();
    }
};

TEST_P(WavetableUploadPath, KeepsNothingOnTheHeap) {
    if (GetParam().failing) {
        kernel.addFault(
                {.path = kMotorNode, .operation = *GetParam().failing, .error = EIO, .times = 0});
    }
    play();
    play();
    sequence::forget();
    const AllocationCounter counter;
    play();
    sequence::forget();
    EXPECT_EQ(counter.held(), 0);
    EXPECT_TRUE(recordHoldsTheIndexPair());
}

INSTANTIATE_TEST_SUITE_P(Paths, WavetableUploadPath,
                         ::testing::Values(Path{"Success", "5.100, 10, ~", std::nullopt},
                                           Path{"CompileFailure", "5.101, 10, ~", std::nullopt},
                                           Path{"OpenFailure", "5.100, 10, ~", Operation::kOpen},
                                           Path{"UploadFailure", "5.100, 10, ~", Operation::kIoctl},
                                           Path{"TriggerFailure", "5.100, 10, ~",
                                                Operation::kWrite}),
                         [](const auto& tested) { return tested.param.name; });

TEST_F(WavetableUpload, PlainVibrationAfterAWaveformSendsTheIndexPair) {
    EXPECT_TRUE(hwApi->setAndTriggerOwt(5, 0));
    kernel.clear();
    EXPECT_TRUE(hwApi->do_on(500));
    EXPECT_THAT(kernel.calls(),
                ElementsAre("erase id=0",
                            "upload id=-1 type=0x51 waveform=0x5d length=500 delay=0 "
                            "custom=\"00 00 00 00\"",
                            "event type=21 code=0 value=1"));
}

TEST_F(WavetableUpload, ChosenIndexOutlivesAWaveform) {
    EXPECT_TRUE(hwApi->setForceFeedbackIndex(23));
    EXPECT_TRUE(hwApi->setAndTriggerOwt(5, 0));
    EXPECT_EQ(forceFeedbackEffect.indexPair[1], 23);
}

TEST_F(WavetableUpload, LoopedPatternSetsItsGainAndPlaysItsEntry) {
    EXPECT_TRUE(hwApi->performPrebakedHapticPattern(23, 6700, true));
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /dev/input/event7 O_RDWR", "event type=21 code=96 value=6700",
                            "upload id=-1 type=0x51 waveform=0x5d length=0 delay=0 "
                            "custom=\"00 00 01 ff 00 64 17 00 00 00 00 0a\"",
                            "event type=21 code=0 value=1"));
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
