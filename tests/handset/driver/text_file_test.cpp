// SPDX-License-Identifier: Apache-2.0
// Small text files.
#include "phone/text_file.h"

#include <gtest/gtest.h>

#include "temporary_folder.h"

namespace handset {
namespace {

class TextFile : public testing::Test {
  protected:
    std::string lastLine(const std::string& content) {
        EXPECT_FALSE(replaceTextFile(path_, content));
        return lastLineOf(path_);
    }

    TemporaryFolder folder_;
    std::string path_ = folder_.file("text");
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
    EXPECT_EQ(lastLineOf(folder_.file("nothing")), "");
    EXPECT_EQ(readTextFile(folder_.file("nothing")), std::nullopt);
}

TEST_F(TextFile, FoldersAreMadeWithTheirParents) {
    EXPECT_FALSE(makeFolders(folder_.file("a/b/c")));
    EXPECT_TRUE(std::filesystem::is_directory(folder_.file("a/b/c")));
    EXPECT_FALSE(makeFolders(folder_.file("a/b/c")));
    EXPECT_EQ(makeFolders("/proc/none/a")->text, "/proc/none: No such file or directory");
}

}  // namespace
}  // namespace handset
