// SPDX-License-Identifier: Apache-2.0
//
// Bytes in messages and in JSON.
#include "handset/driver/printable.h"

#include <string>
#include <string_view>

#include <gtest/gtest.h>

namespace handset {
namespace {

using std::string_view_literals::operator""sv;

// What a journal line shows of a write's bytes.
std::string shown(std::string_view bytes) {
    nlohmann::ordered_json object;
    putBytes(object, "data", "hex", bytes);
    return object.dump();
}

TEST(PutBytes, Utf8StandsAsItIs) {
    EXPECT_EQ(shown(""), R"({"data":""})");
    EXPECT_EQ(shown("5.100, 10, 0~"), R"({"data":"5.100, 10, 0~"})");
    EXPECT_EQ(shown("gr\xc3\xbc\xc3\x9f"), "{\"data\":\"gr\xc3\xbc\xc3\x9f\"}");
    EXPECT_EQ(shown("a\x7f"), "{\"data\":\"a\x7f\"}");
    EXPECT_EQ(shown("\xf4\x8f\xbf\xbf"), "{\"data\":\"\xf4\x8f\xbf\xbf\"}");
}

TEST(PutBytes, ControlCharactersAreEscaped) {
    EXPECT_EQ(shown("500\n"), R"({"data":"500\n"})");
    EXPECT_EQ(shown("\t\r"), R"({"data":"\t\r"})");
    EXPECT_EQ(shown("a\0b\x1f"sv), R"({"data":"a\u0000b\u001f"})");
    EXPECT_EQ(shown(R"(say "no" \ yes)"), R"({"data":"say \"no\" \\ yes"})");
}

TEST(PutBytes, AnythingElseIsLowerCaseDigits) {
    EXPECT_EQ(shown("ab\xff\0Z"sv), R"({"hex":"6162ff005a"})");
    EXPECT_EQ(shown("\x80"), R"({"hex":"80"})");
    EXPECT_EQ(shown("abc\xc3"), R"({"hex":"616263c3"})");
    EXPECT_EQ(shown("\xc3("), R"({"hex":"c328"})");
    EXPECT_EQ(shown("\xc0\xaf"), R"({"hex":"c0af"})");              // overlong
    EXPECT_EQ(shown("\xed\xa0\x80"), R"({"hex":"eda080"})");        // a surrogate
    EXPECT_EQ(shown("\xf4\x90\x80\x80"), R"({"hex":"f4908080"})");  // above U+10FFFF
}

TEST(Printable, ControlCharactersBecomeQuestionMarks) {
    EXPECT_EQ(printable("a\nb\tc\x7f"), "a?b?c?");
    EXPECT_EQ(printable("gr\xc3\xbc\xc3\x9f"), "gr\xc3\xbc\xc3\x9f");
}

TEST(Printable, ATextThatIsNotUtf8IsReducedToAscii) {
    EXPECT_EQ(printable("a\xff\xc3\xbc~"), "a???~");
}

}  // namespace
}  // namespace handset
