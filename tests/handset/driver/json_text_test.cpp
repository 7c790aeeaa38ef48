// SPDX-License-Identifier: Apache-2.0
// Text as JSON.
#include "driver/json_text.h"

#include <gtest/gtest.h>

#include <string>
#include <string_view>

#include "driver/one_line.h"

namespace handset {
namespace {

using std::string_view_literals::operator""sv;

std::string jsonString(std::string_view text) {
    fmt::memory_buffer out;
    appendJsonString(out, text);
    return fmt::to_string(out);
}

std::string hexString(std::string_view bytes) {
    fmt::memory_buffer out;
    appendHexString(out, bytes);
    return fmt::to_string(out);
}

TEST(JsonText, PlainTextStandsAsItIs) {
    EXPECT_EQ(jsonString(""), R"("")");
    EXPECT_EQ(jsonString("5.100, 10, 0~"), R"("5.100, 10, 0~")");
    EXPECT_EQ(jsonString("gr\xc3\xbc\xc3\x9f"), "\"gr\xc3\xbc\xc3\x9f\"");
    EXPECT_EQ(jsonString("a\x7f"), "\"a\x7f\"");
}

TEST(JsonText, ControlCharactersAreEscaped) {
    EXPECT_EQ(jsonString("500\n"), R"("500\n")");
    EXPECT_EQ(jsonString("\t\r"), R"("\t\r")");
    EXPECT_EQ(jsonString("a\0b\x1f"sv), R"("a\u0000b\u001f")");
    EXPECT_EQ(jsonString(R"(say "no" \ yes)"), R"("say \"no\" \\ yes")");
}

TEST(JsonText, BytesBecomeLowerCaseDigits) {
    EXPECT_EQ(hexString(""), R"("")");
    EXPECT_EQ(hexString("\x00\xff\x0aZ"sv), R"("00ff0a5a")");
}

TEST(JsonText, WellFormedUtf8IsText) {
    EXPECT_TRUE(isUtf8(""));
    EXPECT_TRUE(isUtf8("plain\0text"sv));
    EXPECT_TRUE(isUtf8("\xc3\xbc"));
    EXPECT_TRUE(isUtf8("\xe2\x82\xac"));
    EXPECT_TRUE(isUtf8("\xf0\x9f\x93\xb3"));
    EXPECT_TRUE(isUtf8("\xf4\x8f\xbf\xbf"));
}

TEST(JsonText, AnythingElseIsNot) {
    EXPECT_FALSE(isUtf8("\xff"));
    EXPECT_FALSE(isUtf8("\x80"));
    EXPECT_FALSE(isUtf8("abc\xc3"));
    EXPECT_FALSE(isUtf8("\xc3("));
    EXPECT_FALSE(isUtf8("\xc0\xaf"));          // overlong
    EXPECT_FALSE(isUtf8("\xe0\x80\xaf"));      // overlong
    EXPECT_FALSE(isUtf8("\xed\xa0\x80"));      // a surrogate
    EXPECT_FALSE(isUtf8("\xf4\x90\x80\x80"));  // above U+10FFFF
}

TEST(OneLine, ControlCharactersBecomeQuestionMarks) {
    EXPECT_EQ(oneLine("a\nb\tc\x7f"), "a?b?c?");
    EXPECT_EQ(oneLine("gr\xc3\xbc\xc3\x9f"), "gr\xc3\xbc\xc3\x9f");
}

TEST(OneLine, ATextThatIsNotUtf8IsReducedToAscii) {
    EXPECT_EQ(oneLine("a\xff\xc3\xbc~"), "a???~");
}

}  // namespace
}  // namespace handset
