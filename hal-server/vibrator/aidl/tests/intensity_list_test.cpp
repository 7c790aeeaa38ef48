// SPDX-License-Identifier: Apache-2.0
//
// The driver's intensity lists: which node is read, and what becomes of its string.
#include <cerrno>
#include <string>
#include <vector>

#include "tests/force_feedback_phone.h"
#include "tests/service_test.h"

namespace aidl::android::hardware::vibrator {
namespace {

using fake::Access;
using fake::Operation;
using ::testing::Contains;
using ::testing::ElementsAre;

class IntensityList : public ServiceTest {
  protected:
    IntensityList() { addLedsClass(); }

    // The list that the node's string gives, or -1 alone for a failure.
    std::vector<int> listOf(const std::string& text) {
        kernel.addNode(kInfo + "intensities", text, Access::kReadOnly);
        const auto hwApi = makeHwApi();
        std::vector<int> list;
        return hwApi->getDynamicIntensityList(true, list) ? list : std::vector<int>{-1};
    }
};

TEST_F(IntensityList, NumbersStandBetweenCommas) {
    EXPECT_THAT(listOf("100,200, 300\n"), ElementsAre(100, 200, 300));
    EXPECT_THAT(log.lines(),
                ElementsAre("I V_2_0: [getDynamicIntensityList]isDefaultType: 1",
                            "I HW_API: >> readNodeAsString "
                            "node:/vib_info_class/vib_support_info/intensities",
                            "I HW_API: << readNodeAsString success - length: 12",
                            "I V_2_0: [getDynamicIntensityList]raw value: 100,200, 300",
                            "I V_2_0: [getDynamicIntensityList]list size: 3"));
}

TEST_F(IntensityList, TextAfterANumberIsIgnored) {
    EXPECT_THAT(listOf("100mV,-5x, 7 8"), ElementsAre(100, -5, 7));
}

TEST_F(IntensityList, PieceWithoutDigitsIsSkippedAndTheOrderKept) {
    EXPECT_THAT(listOf("1,,x2, ,3,"), ElementsAre(1, 3));
}

TEST_F(IntensityList, NumberIsDecimalAndEndsAtTheFirstOtherCharacter) {
    EXPECT_THAT(listOf("0x10,010,+5,1e3,1.9,- 6,--7,\t\n 8"), ElementsAre(0, 10, 5, 1, 1, 8));
}

TEST_F(IntensityList, TextEndsAtAZeroByte) {
    EXPECT_THAT(listOf(std::string("1,2\0,3\n", 8)), ElementsAre(1, 2));
}

TEST_F(IntensityList, LongListIsCutAfter511Bytes) {
    // 127 pieces of four characters, and three more of the next.
    std::string text;
    for (int i = 0; i < 200; ++i) text += "123,";
    std::vector<int> expected(128, 123);
    EXPECT_EQ(listOf(text), expected);
    text.replace(508, 3, "4567");
    expected.back() = 456;
    EXPECT_EQ(listOf(text), expected);
}

TEST_F(IntensityList, NumberBeyond32BitsIsSkipped) {
    EXPECT_THAT(listOf("2147483648,5,-2147483649,2147483647,-2147483648,99999999999999999999999"),
                ElementsAre(5, 2147483647, -2147483647 - 1));
}

TEST_F(IntensityList, ListWithoutANumberFails) {
    EXPECT_THAT(listOf("none,at,all"), ElementsAre(-1));
    EXPECT_EQ(log.lines().back(), "I V_2_0: [getDynamicIntensityList]Fail - empty list");
}

TEST_F(IntensityList, EmptyNodeFails) {
    EXPECT_THAT(listOf(" \n"), ElementsAre(-1));
    EXPECT_EQ(log.lines().back(), "I V_2_0: [getDynamicIntensityList]Fail - empty value");
}

TEST_F(IntensityList, ValuesAreAppendedToWhatTheListHeld) {
    kernel.addNode(kInfo + "intensities", "x\n", Access::kReadOnly);
    const auto hwApi = makeHwApi();
    std::vector<int> list = {9};
    EXPECT_TRUE(hwApi->getDynamicIntensityList(true, list));
    EXPECT_EQ(log.lines().back(), "I V_2_0: [getDynamicIntensityList]list size: 1");
    kernel.addNode(kInfo + "intensities", "1,2\n", Access::kReadOnly);
    EXPECT_TRUE(hwApi->getDynamicIntensityList(true, list));
    EXPECT_THAT(list, ElementsAre(9, 1, 2));
}

TEST_F(IntensityList, EmptyNodeFailsWhateverTheListHeld) {
    kernel.addNode(kInfo + "intensities", "\n", Access::kReadOnly);
    const auto hwApi = makeHwApi();
    std::vector<int> list = {9};
    EXPECT_FALSE(hwApi->getDynamicIntensityList(true, list));
    EXPECT_THAT(list, ElementsAre(9));
    EXPECT_EQ(log.lines().back(), "I V_2_0: [getDynamicIntensityList]Fail - empty value");
}

TEST_F(IntensityList, FailedReadIsAnEmptyValue) {
    kernel.addNode(kInfo + "intensities", "1,2\n", Access::kReadOnly);
    const auto hwApi = makeHwApi();
    kernel.addFault({.path = kInfo + "intensities", .operation = Operation::kRead, .error = EIO});
    std::vector<int> list;
    EXPECT_FALSE(hwApi->getDynamicIntensityList(true, list));
    EXPECT_EQ(log.lines().back(), "I V_2_0: [getDynamicIntensityList]Fail - empty value");
}

TEST_F(ForceFeedbackPhone, IntensityListsAreThoseOfTheInformationClass) {
    kernel.addNode(kInfo + "intensities", "1,2\n", Access::kReadOnly);
    kernel.addNode(kInfo + "haptic_intensities", "3\n", Access::kReadOnly);
    const auto hwApi = makeHwApi();
    std::vector<int> list;
    EXPECT_TRUE(hwApi->isDynamicIntensityNodeExist());
    EXPECT_TRUE(hwApi->getDynamicIntensityList(true, list));
    EXPECT_TRUE(hwApi->getDynamicIntensityList(false, list));
    EXPECT_THAT(list, ElementsAre(1, 2, 3));
}

TEST_F(IntensityList, TypeChoosesTheNodeAndTheInformationClassComesFirst) {
    kernel.addNode(kInfo + "intensities", "1\n", Access::kReadOnly);
    kernel.addNode(kInfo + "haptic_intensities", "2\n", Access::kReadOnly);
    kernel.addNode(kLeds + "intensities", "3\n", Access::kReadOnly);
    kernel.addNode(kLeds + "haptic_intensities", "4\n", Access::kReadOnly);
    const auto hwApi = makeHwApi();
    std::vector<int> list;
    EXPECT_TRUE(hwApi->getDynamicIntensityList(true, list));
    EXPECT_TRUE(hwApi->getDynamicIntensityList(false, list));
    kernel.removeNode(kInfo + "intensities");
    kernel.removeNode(kInfo + "haptic_intensities");
    EXPECT_TRUE(hwApi->getDynamicIntensityList(true, list));
    EXPECT_TRUE(hwApi->getDynamicIntensityList(false, list));
    EXPECT_THAT(list, ElementsAre(1, 2, 3, 4));
    EXPECT_THAT(log.lines(), Contains("I V_2_0: [getDynamicIntensityList]isDefaultType: 0"));
}

TEST_F(IntensityList, WithoutANodeNothingIsRead) {
    const auto hwApi = makeHwApi();
    std::vector<int> list;
    EXPECT_FALSE(hwApi->getDynamicIntensityList(true, list));
    EXPECT_EQ(kernel.calls().back(), "open  O_RDONLY = ENOENT");
    EXPECT_EQ(log.lines().back(), "I V_2_0: [getDynamicIntensityList]Fail - empty value");
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
