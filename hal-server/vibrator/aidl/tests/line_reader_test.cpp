// SPDX-License-Identifier: Apache-2.0
//
// Line reading: what a line is, at every edge of the 1024-byte buffer.
#include <cerrno>
#include <string>
#include <vector>

#include "driver/LineReader.h"
#include "tests/service_test.h"

namespace aidl::android::hardware::vibrator {
namespace {

using fake::Operation;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

constexpr char kFile[] = "/sys/class/test/list";

class LineReaderTest : public ServiceTest {
  protected:
    std::vector<std::string> linesOf(const std::string& text) {
        kernel.addNode(kFile, text);
        LineReader reader(kFile);
        std::vector<std::string> lines;
        char line[LineReader::kLineSize];
        while (reader.next(line)) lines.emplace_back(line);
        return lines;
    }
};

TEST_F(LineReaderTest, MissingFileIsNotOpen) {
    EXPECT_FALSE(LineReader("/sys/class/test/missing").isOpen());
}

TEST_F(LineReaderTest, ClosesItsFileOnceAndOnDemand) {
    kernel.addNode(kFile);
    {
        LineReader reader(kFile);
        EXPECT_TRUE(reader.isOpen());
        reader.close();
        EXPECT_FALSE(reader.isOpen());
    }
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /sys/class/test/list O_RDONLY", "close /sys/class/test/list"));
}

TEST_F(LineReaderTest, EmptyFileHasNoLine) {
    EXPECT_THAT(linesOf(""), IsEmpty());
}

TEST_F(LineReaderTest, LinesKeepTheirLineFeeds) {
    EXPECT_THAT(linesOf("one\n\nthree\n"), ElementsAre("one\n", "\n", "three\n"));
}

TEST_F(LineReaderTest, LastLineMayLackItsLineFeed) {
    EXPECT_THAT(linesOf("one\ntwo"), ElementsAre("one\n", "two"));
}

TEST_F(LineReaderTest, LineOf1023CharactersIsWhole) {
    const std::string line = std::string(1022, 'x') + "\n";
    EXPECT_THAT(linesOf(line + "next\n"), ElementsAre(line, "next\n"));
}

TEST_F(LineReaderTest, LongerLineComesInPiecesOf1023) {
    EXPECT_THAT(linesOf(std::string(1023, 'x') + "\nnext\n"),
                ElementsAre(std::string(1023, 'x'), "\n", "next\n"));
    EXPECT_THAT(linesOf(std::string(2500, 'y') + "\n"),
                ElementsAre(std::string(1023, 'y'), std::string(1023, 'y'),
                            std::string(454, 'y') + "\n"));
}

TEST_F(LineReaderTest, LineMayArriveInSeveralReads) {
    kernel.addFault({.path = kFile, .operation = Operation::kRead, .limit = 2, .times = 0});
    EXPECT_THAT(linesOf("one\ntwo\n"), ElementsAre("one\n", "two\n"));
}

TEST_F(LineReaderTest, InterruptedReadIsRepeated) {
    kernel.addFault({.path = kFile, .operation = Operation::kRead, .error = EINTR, .times = 2});
    EXPECT_THAT(linesOf("one\n"), ElementsAre("one\n"));
}

TEST_F(LineReaderTest, FailedReadEndsTheFileAndLosesThePartialLine) {
    kernel.addFault({.path = kFile, .operation = Operation::kRead, .limit = 6});
    kernel.addFault({.path = kFile, .operation = Operation::kRead, .error = EIO});
    EXPECT_THAT(linesOf("one\ntwo\nthree\n"), ElementsAre("one\n"));
}

TEST_F(LineReaderTest, FailedReadIsNotTriedAgain) {
    kernel.addNode(kFile, "one\n");
    kernel.addFault({.path = kFile, .operation = Operation::kRead, .error = EIO});
    LineReader reader(kFile);
    char line[LineReader::kLineSize];
    EXPECT_FALSE(reader.next(line));
    EXPECT_FALSE(reader.next(line));
    EXPECT_THAT(kernel.calls(), ElementsAre("open /sys/class/test/list O_RDONLY",
                                            "read /sys/class/test/list 1024 = EIO"));
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
