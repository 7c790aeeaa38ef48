// SPDX-License-Identifier: Apache-2.0
//
// Node input and output: exact calls, bytes, results and log lines, and every way to fail.
#include <cerrno>
#include <string>

#include "tests/service_test.h"

namespace aidl::android::hardware::vibrator {
namespace {

using fake::Access;
using fake::Operation;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

constexpr char kNode[] = "/sys/class/leds/vibrator/node";

class NodeIo : public ServiceTest {
  protected:
    const std::shared_ptr<HwApi> hwApi = makeHwApi();
};

using WriteNode = NodeIo;

TEST_F(WriteNode, OpensWritesOnceAndCloses) {
    kernel.addNode(kNode);
    EXPECT_TRUE(hwApi->writeNode(kNode, 500));
    EXPECT_THAT(kernel.calls(), ElementsAre("open /sys/class/leds/vibrator/node O_RDWR",
                                            "write /sys/class/leds/vibrator/node \"500\\n\"",
                                            "close /sys/class/leds/vibrator/node"));
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: >> writeNode node:/leds/vibrator/node val:500",
                                         "I HW_API: << writeNode node OK : 4"));
    EXPECT_THAT(log.tags(), ElementsAre("QvxVibrator-HAL-AIDL-CORE"));
}

TEST_F(WriteNode, NegativeValueWritesItsSign) {
    kernel.addNode(kNode);
    EXPECT_TRUE(hwApi->writeNode(kNode, -5));
    EXPECT_EQ(kernel.text(kNode), "-5\n");
    EXPECT_THAT(log.lines(), Contains("I HW_API: << writeNode node OK : 3"));
}

TEST_F(WriteNode, SmallestAndLargestValuesFit) {
    kernel.addNode(kNode);
    EXPECT_TRUE(hwApi->writeNode(kNode, -2147483647 - 1));
    EXPECT_EQ(kernel.text(kNode), "-2147483648\n");
    EXPECT_TRUE(hwApi->writeNode(kNode, 2147483647));
    EXPECT_EQ(kernel.text(kNode), "2147483647\n");
}

TEST_F(WriteNode, MissingNodeFailsWithItsWholePathAndErrno) {
    EXPECT_FALSE(hwApi->writeNode(kNode, 1));
    EXPECT_THAT(kernel.calls(), ElementsAre("open /sys/class/leds/vibrator/node O_RDWR = ENOENT"));
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: >> writeNode node:/leds/vibrator/node val:1",
                                         "I HW_API: node: /sys/class/leds/vibrator/nodeerrno: 2"));
}

TEST_F(WriteNode, NodeThatCannotBeReadIsRefused) {
    kernel.addNode(kNode, "", Access::kWriteOnly);
    EXPECT_FALSE(hwApi->writeNode(kNode, 1));
    EXPECT_THAT(log.lines(), Contains("I HW_API: node: /sys/class/leds/vibrator/nodeerrno: 13"));
}

TEST_F(WriteNode, EmptyPathFailsAndPrintsNothingOfIt) {
    EXPECT_FALSE(hwApi->writeNode("", 1));
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: >> writeNode node: val:1", "I HW_API: node: errno: 2"));
}

TEST_F(WriteNode, InterruptedOpenAndWriteAreRepeated) {
    kernel.addNode(kNode);
    kernel.addFault({.path = kNode, .operation = Operation::kOpen, .error = EINTR, .times = 2});
    kernel.addFault({.path = kNode, .operation = Operation::kWrite, .error = EINTR, .times = 2});
    EXPECT_TRUE(hwApi->writeNode(kNode, 7));
    EXPECT_THAT(kernel.calls(), ElementsAre("open /sys/class/leds/vibrator/node O_RDWR = EINTR",
                                            "open /sys/class/leds/vibrator/node O_RDWR = EINTR",
                                            "open /sys/class/leds/vibrator/node O_RDWR",
                                            "write /sys/class/leds/vibrator/node \"7\\n\" = EINTR",
                                            "write /sys/class/leds/vibrator/node \"7\\n\" = EINTR",
                                            "write /sys/class/leds/vibrator/node \"7\\n\"",
                                            "close /sys/class/leds/vibrator/node"));
}

TEST_F(WriteNode, ShortWriteFailsAndIsNotCompleted) {
    kernel.addNode(kNode);
    kernel.addFault({.path = kNode, .operation = Operation::kWrite, .limit = 2});
    EXPECT_FALSE(hwApi->writeNode(kNode, 500));
    EXPECT_THAT(kernel.calls(), ElementsAre("open /sys/class/leds/vibrator/node O_RDWR",
                                            "write /sys/class/leds/vibrator/node \"500\\n\" = 2",
                                            "close /sys/class/leds/vibrator/node"));
    EXPECT_THAT(log.lines(), Contains("I HW_API: << writeNode node UNKNOWN_ERROR : 4 , 2"));
}

TEST_F(WriteNode, FailedWriteIsLoggedAsMinusOneAndTheNodeClosed) {
    kernel.addNode(kNode);
    kernel.addFault({.path = kNode, .operation = Operation::kWrite, .error = EIO});
    EXPECT_FALSE(hwApi->writeNode(kNode, 500));
    EXPECT_THAT(kernel.calls(), Contains("close /sys/class/leds/vibrator/node"));
    EXPECT_THAT(log.lines(), Contains("I HW_API: << writeNode node UNKNOWN_ERROR : 4 , -1"));
}

using WriteNodeByString = NodeIo;

TEST_F(WriteNodeByString, OpensForWritingOnly) {
    kernel.addNode(kNode, "", Access::kWriteOnly);
    EXPECT_TRUE(hwApi->writeNodeByStringOnlyForWriting(kNode, "1"));
    EXPECT_THAT(kernel.calls(), ElementsAre("open /sys/class/leds/vibrator/node O_WRONLY",
                                            "write /sys/class/leds/vibrator/node \"1\\n\"",
                                            "close /sys/class/leds/vibrator/node"));
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: >> writeNodeByStringOnlyForWriting "
                                         "node:/leds/vibrator/node val:1",
                                         "I HW_API: << writeNode node OK : 2"));
}

TEST_F(WriteNodeByString, EmptyTextWritesALineFeed) {
    kernel.addNode(kNode);
    EXPECT_TRUE(hwApi->writeNodeByStringOnlyForWriting(kNode, ""));
    EXPECT_EQ(kernel.text(kNode), "\n");
}

TEST_F(WriteNodeByString, StringEndsAtItsFirstZeroByte) {
    kernel.addNode(kNode);
    EXPECT_TRUE(hwApi->writeNodeByStringOnlyForWriting(kNode, std::string("on\0off", 6)));
    EXPECT_EQ(kernel.text(kNode), "on\n");
}

TEST_F(WriteNodeByString, EighteenCharactersFit) {
    kernel.addNode(kNode);
    EXPECT_TRUE(hwApi->writeNodeByStringOnlyForWriting(kNode, "123456789012345678"));
    EXPECT_EQ(kernel.text(kNode), "123456789012345678\n");
    EXPECT_THAT(log.lines(), Contains("I HW_API: << writeNode node OK : 19"));
}

TEST_F(WriteNodeByString, NineteenCharactersAreRefusedWithoutTouchingTheNode) {
    kernel.addNode(kNode);
    EXPECT_FALSE(hwApi->writeNodeByStringOnlyForWriting(kNode, "1234567890123456789"));
    EXPECT_THAT(kernel.calls(), IsEmpty());
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: >> writeNodeByStringOnlyForWriting "
                                         "node:/leds/vibrator/node val:1234567890123456789",
                                         "I HW_API: << writeNode node UNKNOWN_ERROR : 20 , 0"));
}

TEST_F(WriteNodeByString, MissingNodeFailsWithItsWholePathAndErrno) {
    EXPECT_FALSE(hwApi->writeNodeByStringOnlyForWriting(kNode, "1"));
    EXPECT_THAT(log.lines(), Contains("I HW_API: node: /sys/class/leds/vibrator/nodeerrno: 2"));
}

TEST_F(WriteNodeByString, InterruptedCallsAreRepeated) {
    kernel.addNode(kNode);
    kernel.addFault({.path = kNode, .operation = Operation::kOpen, .error = EINTR});
    kernel.addFault({.path = kNode, .operation = Operation::kWrite, .error = EINTR});
    EXPECT_TRUE(hwApi->writeNodeByStringOnlyForWriting(kNode, "on"));
    EXPECT_EQ(kernel.text(kNode), "on\n");
}

TEST_F(WriteNodeByString, ShortWriteFails) {
    kernel.addNode(kNode);
    kernel.addFault({.path = kNode, .operation = Operation::kWrite, .limit = 1});
    EXPECT_FALSE(hwApi->writeNodeByStringOnlyForWriting(kNode, "on"));
    EXPECT_THAT(log.lines(), Contains("I HW_API: << writeNode node UNKNOWN_ERROR : 3 , 1"));
}

using ReadNode = NodeIo;

TEST_F(ReadNode, OpensReadsOnceAndCloses) {
    kernel.addNode(kNode, "500\n");
    EXPECT_EQ(hwApi->readNode(kNode), 500);
    EXPECT_THAT(kernel.calls(), ElementsAre("open /sys/class/leds/vibrator/node O_RDONLY",
                                            "read /sys/class/leds/vibrator/node 7 \"500\\n\"",
                                            "close /sys/class/leds/vibrator/node"));
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: >> readNode node:/leds/vibrator/node",
                                         "I HW_API: << readNode done"));
}

TEST_F(ReadNode, NineDigitsGiveTheFirstSeven) {
    kernel.addNode(kNode, "123456789");
    EXPECT_EQ(hwApi->readNode(kNode), 1234567);
}

TEST_F(ReadNode, LettersGiveZero) {
    kernel.addNode(kNode, "abc\n");
    EXPECT_EQ(hwApi->readNode(kNode), 0);
    EXPECT_THAT(log.lines(), Contains("I HW_API: << readNode done"));
}

TEST_F(ReadNode, EmptyNodeGivesZero) {
    kernel.addNode(kNode, "");
    EXPECT_EQ(hwApi->readNode(kNode), 0);
}

TEST_F(ReadNode, NumberIsScannedPastBlanksAndUpToOtherText) {
    kernel.addNode(kNode, " \t-42x");
    EXPECT_EQ(hwApi->readNode(kNode), -42);
}

TEST_F(ReadNode, ReadOnlyNodeIsReadable) {
    kernel.addNode(kNode, "3\n", Access::kReadOnly);
    EXPECT_EQ(hwApi->readNode(kNode), 3);
}

TEST_F(ReadNode, MissingNodeGivesMinusOne) {
    EXPECT_EQ(hwApi->readNode(kNode), -1);
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: >> readNode node:/leds/vibrator/node",
                            "I HW_API: node: /sys/class/leds/vibrator/node open failed. errno: 2"));
}

TEST_F(ReadNode, FailedReadGivesMinusOneAndClosesTheNode) {
    kernel.addNode(kNode);
    kernel.addFault({.path = kNode, .operation = Operation::kRead, .error = EIO});
    EXPECT_EQ(hwApi->readNode(kNode), -1);
    EXPECT_THAT(kernel.calls(), ElementsAre("open /sys/class/leds/vibrator/node O_RDONLY",
                                            "read /sys/class/leds/vibrator/node 7 = EIO",
                                            "close /sys/class/leds/vibrator/node"));
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: >> readNode node:/leds/vibrator/node",
                            "I HW_API: node: /sys/class/leds/vibrator/noderead failed. errno: 5"));
}

TEST_F(ReadNode, InterruptedOpenAndReadAreRepeated) {
    kernel.addNode(kNode, "8\n");
    kernel.addFault({.path = kNode, .operation = Operation::kOpen, .error = EINTR});
    kernel.addFault({.path = kNode, .operation = Operation::kRead, .error = EINTR, .times = 2});
    EXPECT_EQ(hwApi->readNode(kNode), 8);
}

TEST_F(ReadNode, ShortReadIsNotContinued) {
    kernel.addNode(kNode, "500\n");
    kernel.addFault({.path = kNode, .operation = Operation::kRead, .limit = 2});
    EXPECT_EQ(hwApi->readNode(kNode), 50);
}

using ReadNodeAsString = NodeIo;

TEST_F(ReadNodeAsString, GivesTheWordWithoutBlanksAround) {
    kernel.addNode(kNode, "  LINEAR_INDEX\n");
    EXPECT_EQ(hwApi->readNodeAsString(kNode), "LINEAR_INDEX");
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /sys/class/leds/vibrator/node O_RDONLY",
                            "read /sys/class/leds/vibrator/node 511 \"  LINEAR_INDEX\\n\"",
                            "close /sys/class/leds/vibrator/node"));
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: >> readNodeAsString node:/leds/vibrator/node",
                                         "I HW_API: << readNodeAsString success - length: 12"));
}

TEST_F(ReadNodeAsString, EveryKindOfWhiteSpaceIsTrimmedAndInnerOnesKept) {
    kernel.addNode(kNode, " \t\n\v\f\ra b \t\n\v\f\r");
    EXPECT_EQ(hwApi->readNodeAsString(kNode), "a b");
}

TEST_F(ReadNodeAsString, EveryOtherCharacterIsKept) {
    for (const char* const text : {"~a~", "!a!", "\"a\"",
                                   "\x01"
                                   "a\x7f",
                                   "\ba\x0e"}) {
        kernel.addNode(kNode, text);
        EXPECT_EQ(hwApi->readNodeAsString(kNode), text);
        EXPECT_EQ(hwApi->rtrim(text), text);
    }
}

TEST_F(ReadNodeAsString, LongNodeGivesItsFirst511Bytes) {
    kernel.addNode(kNode, std::string(600, 'x'));
    EXPECT_EQ(hwApi->readNodeAsString(kNode), std::string(511, 'x'));
}

TEST_F(ReadNodeAsString, CutComesBeforeTheTrim) {
    kernel.addNode(kNode, std::string(509, 'x') + "  yy");
    EXPECT_EQ(hwApi->readNodeAsString(kNode), std::string(509, 'x'));
}

TEST_F(ReadNodeAsString, TextEndsAtTheFirstZeroByte) {
    kernel.addNode(kNode, std::string("ab \0cd", 6));
    EXPECT_EQ(hwApi->readNodeAsString(kNode), "ab");
}

TEST_F(ReadNodeAsString, WhiteSpaceOnlyAndEmptyNodesGiveAnEmptyText) {
    kernel.addNode(kNode, " \n");
    EXPECT_EQ(hwApi->readNodeAsString(kNode), "");
    kernel.addNode(kNode, "");
    EXPECT_EQ(hwApi->readNodeAsString(kNode), "");
    EXPECT_THAT(log.lines(),
                Contains("I HW_API: << readNodeAsString success - length: 0").Times(2));
}

TEST_F(ReadNodeAsString, MissingNodeGivesAnEmptyText) {
    EXPECT_EQ(hwApi->readNodeAsString(kNode), "");
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: >> readNodeAsString node:/leds/vibrator/node",
                            "I HW_API: readNodeAsString node: /sys/class/leds/vibrator/node "
                            "open failed. errno: 2"));
}

TEST_F(ReadNodeAsString, FailedReadGivesAnEmptyTextAndClosesTheNode) {
    kernel.addNode(kNode);
    kernel.addFault({.path = kNode, .operation = Operation::kRead, .error = EIO});
    EXPECT_EQ(hwApi->readNodeAsString(kNode), "");
    EXPECT_THAT(kernel.calls(), Contains("close /sys/class/leds/vibrator/node"));
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: >> readNodeAsString node:/leds/vibrator/node",
                            "I HW_API: readNodeAsString node: /sys/class/leds/vibrator/node"
                            "read failed. errno: 5"));
}

TEST_F(ReadNodeAsString, InterruptedOpenAndReadAreRepeated) {
    kernel.addNode(kNode, "on\n");
    kernel.addFault({.path = kNode, .operation = Operation::kOpen, .error = EINTR, .times = 3});
    kernel.addFault({.path = kNode, .operation = Operation::kRead, .error = EINTR, .times = 3});
    EXPECT_EQ(hwApi->readNodeAsString(kNode), "on");
}

using Rtrim = NodeIo;

TEST_F(Rtrim, CutsWhiteSpaceAtTheEndOnly) {
    EXPECT_EQ(hwApi->rtrim("a b \t\n"), "a b");
    EXPECT_EQ(hwApi->rtrim("event5 \n\r\t\f\v"), "event5");
    EXPECT_EQ(hwApi->rtrim("  a"), "  a");
    EXPECT_EQ(hwApi->rtrim(" \n\t"), "");
    EXPECT_EQ(hwApi->rtrim(""), "");
}

TEST_F(NodeIo, LogCallsKeepErrno) {
    errno = ENOSPC;
    kernel.addNode(kNode, "1\n", Access::kReadOnly);
    EXPECT_TRUE(hwApi->isNodeExistForRead(kNode));
    EXPECT_EQ(errno, ENOSPC);
    EXPECT_FALSE(hwApi->isNodeExist(kNode));
    EXPECT_EQ(errno, EACCES);
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
