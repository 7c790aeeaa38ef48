// SPDX-License-Identifier: Apache-2.0
//
// The composite waveform compiler's steps, called by themselves.
#include <cstdint>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "HwApi.h"

namespace aidl::android::hardware::vibrator {
namespace {

using testing::ElementsAre;
using testing::internal::CaptureStdout;
using testing::internal::GetCapturedStdout;

using Bytes = std::vector<uint8_t>;

constexpr int kInvalid = -22;
constexpr uint8_t kGuard = 0xa5;  // what nothing is written over

TEST(CompositeOperations, ToBufferWritesWholeWordsOnly) {
    wt_type10_comp comp{};
    comp.nsections = 1;
    comp.sections[0].wvfrm = {5, 100, 0};
    comp.sections[0].delay = 10;
    Bytes out(16, kGuard);
    EXPECT_EQ(HwApi::wt_type10_comp_to_buffer(&comp, 11, out.data()), 8);
    EXPECT_THAT(Bytes(out.begin(), out.begin() + 9), ElementsAre(0, 0, 1, 0, 0, 100, 5, 0, kGuard));
    EXPECT_EQ(HwApi::wt_type10_comp_to_buffer(&comp, 4, out.data()), 4);
    EXPECT_EQ(HwApi::wt_type10_comp_to_buffer(&comp, 3, out.data()), 0);
}

TEST(CompositeOperations, DecodeAppliesOneTokenOfTheGivenKind) {
    wt_type10_comp comp{};
    char entry[] = "7.25";
    char pause[] = "30";
    EXPECT_EQ(HwApi::wt_type10_comp_decode(&comp, WT_TYPE10_COMP_WAVEFORM, entry), 0);
    EXPECT_EQ(HwApi::wt_type10_comp_decode(&comp, WT_TYPE10_COMP_DELAY, pause), 0);
    EXPECT_EQ(comp.nsections, 0);
    EXPECT_EQ(comp.sections[0].wvfrm.index, 7);
    EXPECT_EQ(comp.sections[0].wvfrm.amplitude, 25);
    EXPECT_EQ(comp.sections[0].delay, 30);
}

TEST(CompositeOperations, DecodeRefusesAnUnknownKindAndALoopThatEndsBehindTheLastPlace) {
    wt_type10_comp comp{};
    char token[] = "2!!";
    EXPECT_EQ(HwApi::wt_type10_comp_decode(&comp, static_cast<wt_type10_comp_specifier>(6), token),
              kInvalid);
    comp.nsections = 256;
    comp.inner_loop_open = true;
    EXPECT_EQ(HwApi::wt_type10_comp_decode(&comp, WT_TYPE10_COMP_INNER_LOOP_END, token), kInvalid);
    EXPECT_EQ(comp.nsections, 256);
}

TEST(CompositeOperations, NumbersOfAWaveformMayHaveWhiteSpaceBeforeThem) {
    wt_type10_comp_wvfrm waveform{};
    char token[] = " 7. \t25";
    EXPECT_EQ(HwApi::wt_type10_comp_waveform_get(token, &waveform), 0);
    EXPECT_EQ(waveform.index, 7);
    EXPECT_EQ(waveform.amplitude, 25);
    EXPECT_EQ(waveform.duration, 0);
}

TEST(CompositeOperations, FailedWaveformLeavesTheResultAlone) {
    wt_type10_comp_wvfrm waveform{9, 8, 7};
    char token[] = "1.0";
    CaptureStdout();
    EXPECT_EQ(HwApi::wt_type10_comp_waveform_get(token, &waveform), kInvalid);
    EXPECT_EQ(GetCapturedStdout(), "Invalid waveform amplitude: 0\n");
    EXPECT_EQ(waveform.index, 9);
    EXPECT_EQ(waveform.amplitude, 8);
    EXPECT_EQ(waveform.duration, 7);
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
