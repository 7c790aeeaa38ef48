// SPDX-License-Identifier: Apache-2.0
//
// Small text files.
#include "handset/phone/text_file.h"

#include <gtest/gtest.h>

#include "handset/driver/tests/test_files.h"

namespace handset {
namespace {

class TextFile : public testing::Test {
  protected:
    std::string lastLine(const std::string& content) {
        EXPECT_TRUE(replaceTextFile(mPath, content));
        return lastLineOf(mPath);
    }

    TemporaryDir mDirectory;
    std::string mPath = fileIn(mDirectory, "text");
};

TEST_F(TextFile, TheLastLineIsTheLastThatIsNotEmpty) {
    EXPECT_EQ(lastLine(""), "");
    EXPECT_EQ(lastLine("one"), "one");
    EXPECT_EQ(lastLine("one\ntwo\n"), "two");
    EXPECT_EQ(lastLine("one\ntwo\n\n \n"), "two");
    EXPECT_EQ(lastLine("\n\n"), "");
}

TEST_F(TextFile, TheLastLineOfALongFileIsFoundAtItsEnd) {
    EXPECT_EQ(lastLine(std::string(100000, 'x') + "\nlast\n"), "last");
}

TEST_F(TextFile, AFileThatIsNotThereHasNoLastLine) {
    EXPECT_EQ(lastLineOf(fileIn(mDirectory, "nothing")), "");
}

}  // namespace
}  // namespace handset
