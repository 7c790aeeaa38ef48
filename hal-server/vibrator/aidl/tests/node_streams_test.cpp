// SPDX-License-Identifier: Apache-2.0
//
// The long-lived streams: how they are opened, what each access sends, and how they fail.
#include <cerrno>
#include <fstream>
#include <string>

#include "tests/service_test.h"

namespace aidl::android::hardware::vibrator {
namespace {

using fake::Access;
using fake::Operation;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::IsSupersetOf;

const std::string kAsp = kLegacy + "asp_enable";
const std::string kFallIndex = kLegacy + "gpio1_fall_index";

class NodeStreams : public ServiceTest {
  protected:
    NodeStreams() {
        addLegacyClass();
        kernel.addNode(kAsp, "0\n");
        for (const char* leaf : {"gpio1_fall_index", "gpio1_fall_dig_scale", "gpio1_rise_index",
                                 "gpio1_rise_dig_scale"}) {
            kernel.addNode(kLegacy + leaf);
        }
        kernel.addNode(kLegacy + "vibe_state", "0\n", Access::kReadOnly);
    }
};

TEST_F(NodeStreams, AreOpenedWithoutCreatingOrTruncatingAndClosedAtTheEnd) {
    {
        const HwApi hwApi;
        EXPECT_EQ(kernel.openDescriptors(), 6U);
        EXPECT_THAT(kernel.calls(),
                    IsSupersetOf({"fopen /sys/class/timed_output/vibrator/asp_enable r+",
                                  "fopen /sys/class/timed_output/vibrator/gpio1_fall_index r+",
                                  "fopen /sys/class/timed_output/vibrator/gpio1_fall_dig_scale r+",
                                  "fopen /sys/class/timed_output/vibrator/gpio1_rise_index r+",
                                  "fopen /sys/class/timed_output/vibrator/gpio1_rise_dig_scale r+",
                                  "fopen /sys/class/timed_output/vibrator/vibe_state r"}));
        kernel.clear();
    }
    EXPECT_EQ(kernel.openDescriptors(), 0U);
    EXPECT_THAT(kernel.writes(), IsEmpty());
}

TEST_F(NodeStreams, EachAccessorWritesItsOwnNode) {
    const auto hwApi = makeHwApi();
    EXPECT_TRUE(hwApi->setAspEnable(true));
    EXPECT_TRUE(hwApi->setAspEnable(false));
    EXPECT_TRUE(hwApi->setGpioFallIndex(1));
    EXPECT_TRUE(hwApi->setGpioFallScale(20));
    EXPECT_TRUE(hwApi->setGpioRiseIndex(300));
    EXPECT_TRUE(hwApi->setGpioRiseScale(4294967295U));
    EXPECT_THAT(kernel.calls(),
                ElementsAre("write /sys/class/timed_output/vibrator/asp_enable \"1\\n\"",
                            "write /sys/class/timed_output/vibrator/asp_enable \"0\\n\"",
                            "write /sys/class/timed_output/vibrator/gpio1_fall_index \"1\\n\"",
                            "write /sys/class/timed_output/vibrator/gpio1_fall_dig_scale \"20\\n\"",
                            "write /sys/class/timed_output/vibrator/gpio1_rise_index \"300\\n\"",
                            "write /sys/class/timed_output/vibrator/gpio1_rise_dig_scale "
                            "\"4294967295\\n\""));
    EXPECT_THAT(log.lines(), IsEmpty());
}

TEST_F(NodeStreams, AspEnableIsReadFromTheStartEveryTime) {
    const auto hwApi = makeHwApi();
    bool enabled = true;
    EXPECT_TRUE(hwApi->getAspEnable(&enabled));
    EXPECT_FALSE(enabled);
    kernel.addNode(kAsp, "1\n");
    EXPECT_TRUE(hwApi->getAspEnable(&enabled));
    EXPECT_TRUE(enabled);
    kernel.addNode(kAsp, "0");  // without newline, so that reading meets the end
    EXPECT_TRUE(hwApi->getAspEnable(&enabled));
    EXPECT_FALSE(enabled);
    EXPECT_TRUE(hwApi->hasAspEnable());
}

TEST_F(NodeStreams, ValueIsWrittenInOnePieceAfterAReadToo) {
    const auto hwApi = makeHwApi();
    bool enabled = false;
    EXPECT_TRUE(hwApi->getAspEnable(&enabled));
    EXPECT_TRUE(hwApi->setAspEnable(true));
    EXPECT_THAT(kernel.writes(),
                ElementsAre("/sys/class/timed_output/vibrator/asp_enable \"1\\n\""));
    EXPECT_TRUE(hwApi->getAspEnable(&enabled));
    EXPECT_TRUE(enabled);
}

TEST_F(NodeStreams, TextThatIsNoBooleanFailsAndTheNextReadIsFree) {
    const auto hwApi = makeHwApi();
    kernel.addNode(kAsp, "off\n");
    bool enabled = false;
    errno = 0;
    EXPECT_FALSE(hwApi->getAspEnable(&enabled));
    EXPECT_THAT(log.lines(),
                ElementsAre("E Failed to read /sys/class/timed_output/vibrator/asp_enable (0): "
                            "Success"));
    kernel.addNode(kAsp, "1\n");
    EXPECT_TRUE(hwApi->getAspEnable(&enabled));
    EXPECT_TRUE(enabled);
}

TEST_F(NodeStreams, FailedReadNamesTheWholeNodeAndErrno) {
    const auto hwApi = makeHwApi();
    kernel.addFault({.path = kAsp, .operation = Operation::kRead, .error = EIO});
    bool enabled = false;
    EXPECT_FALSE(hwApi->getAspEnable(&enabled));
    EXPECT_THAT(log.lines(),
                ElementsAre("E Failed to read /sys/class/timed_output/vibrator/asp_enable (5): "
                            "Input/output error"));
    EXPECT_THAT(log.tags(), ElementsAre("QvxVibrator-HAL-AIDL-CORE"));
}

TEST_F(NodeStreams, FailedWriteNamesTheWholeNodeAndErrno) {
    const auto hwApi = makeHwApi();
    kernel.addFault({.path = kFallIndex, .operation = Operation::kWrite, .error = EIO});
    EXPECT_FALSE(hwApi->setGpioFallIndex(3));
    EXPECT_THAT(log.lines(),
                ElementsAre("E Failed to write /sys/class/timed_output/vibrator/gpio1_fall_index "
                            "(5): Input/output error"));
}

TEST_F(NodeStreams, RefusedValueIsNotSentAgain) {
    {
        const auto hwApi = makeHwApi();
        kernel.addFault({.path = kFallIndex, .operation = Operation::kWrite, .error = EIO});
        EXPECT_FALSE(hwApi->setGpioFallIndex(3));
        EXPECT_TRUE(hwApi->setGpioFallIndex(4));
        kernel.addFault({.path = kAsp, .operation = Operation::kWrite, .error = EIO});
        EXPECT_FALSE(hwApi->setAspEnable(true));
    }
    EXPECT_THAT(kernel.writes(),
                ElementsAre("/sys/class/timed_output/vibrator/gpio1_fall_index \"4\\n\""));
}

TEST_F(NodeStreams, MissingNodeIsLoggedFromItsEleventhCharacter) {
    kernel.removeNode(kAsp);
    kernel.addNode(kFallIndex, "", Access::kReadOnly);
    const HwApi hwApi;
    EXPECT_THAT(log.lines(), IsSupersetOf({
                                     "E Failed to open /timed_output/vibrator/asp_enable (2): No "
                                     "such file or directory",
                                     "E Failed to open /timed_output/vibrator/gpio1_fall_index "
                                     "(13): Permission denied",
                             }));
}

TEST_F(NodeStreams, FailedStreamStaysFailed) {
    kernel.removeNode(kAsp);
    kernel.removeNode(kFallIndex);
    const auto hwApi = makeHwApi();
    kernel.addNode(kAsp);
    kernel.addNode(kFallIndex);
    bool enabled = false;
    for (int round = 0; round < 2; ++round) {
        EXPECT_FALSE(hwApi->hasAspEnable());
        EXPECT_FALSE(hwApi->getAspEnable(&enabled));
        EXPECT_FALSE(hwApi->setAspEnable(true));
        EXPECT_FALSE(hwApi->setGpioFallIndex(1));
    }
    EXPECT_THAT(kernel.calls(), IsEmpty());
    EXPECT_EQ(log.lines().size(), 6U);
}

TEST_F(NodeStreams, StreamThatIsOpenAlreadyIsMarkedFailed) {
    const auto hwApi = makeHwApi();
    std::ifstream stream;
    hwApi->HwApiopen(kLegacy + "vibe_state", &stream);
    EXPECT_TRUE(stream.good());
    errno = 0;
    hwApi->HwApiopen(kLegacy + "vibe_state", &stream);
    EXPECT_TRUE(stream.fail());
    EXPECT_THAT(log.lines(),
                ElementsAre("E Failed to open /timed_output/vibrator/vibe_state (0): Success"));
}

TEST_F(NodeStreams, DebugSaysNothing) {
    const auto hwApi = makeHwApi();
    hwApi->debug(1);
    EXPECT_THAT(log.lines(), IsEmpty());
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
