// SPDX-License-Identifier: Apache-2.0
//
// The extension's questions for a word of the client's choice in the driver's feature list.
#include <cerrno>
#include <string>

#include "tests/extension_test.h"

namespace aidl::vendor::quorvan::hardware::vibrator {
namespace {

using fake::Access;
using fake::Operation;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

constexpr char kOpensTheList[] =
        "open /sys/class/vib_info_class/vib_support_info/functions O_RDONLY";

class SupportsHasFeature : public ExtensionTest {
  protected:
    SupportsHasFeature() { addLedsClass(); }
};

TEST_F(SupportsHasFeature, IsYesWithAReadableListAndLogsNoName) {
    kernel.addNode(kFunctions, "", Access::kReadOnly);
    EXPECT_TRUE(ask(*makeExtension(), &Vibrator::supportsHasFeature, true));
    EXPECT_THAT(kernel.calls(), ElementsAre(kOpensTheList, "close " + kFunctions));
    EXPECT_THAT(log.lines(), ElementsAre("I V_4_0: [supportsHasFeature]result: 1"));
}

TEST_F(SupportsHasFeature, IsNoWithoutAListAndStillOk) {
    EXPECT_FALSE(ask(*makeExtension(), &Vibrator::supportsHasFeature, false));
    EXPECT_THAT(log.lines(), ElementsAre("I HW_API: isNodeExistForRead node:/sys/class/"
                                         "vib_info_class/vib_support_info/functions - false",
                                         "I V_4_0: [supportsHasFeature]result: 0"));
}

TEST_F(SupportsHasFeature, IsNoWithAListThatOnlyTakesWrites) {
    kernel.addNode(kFunctions, "INTENSITY\n", Access::kWriteOnly);
    EXPECT_FALSE(ask(*makeExtension(), &Vibrator::supportsHasFeature, false));
}

TEST_F(SupportsHasFeature, InterruptedOpenIsRepeated) {
    kernel.addNode(kFunctions, "INTENSITY\n", Access::kReadOnly);
    const auto extension = makeExtension();
    kernel.addFault(
            {.path = kFunctions, .operation = Operation::kOpen, .error = EINTR, .times = 3});
    EXPECT_TRUE(ask(*extension, &Vibrator::supportsHasFeature, true));
}

class HasFeatureByName : public ExtensionTest {
  protected:
    HasFeatureByName() { addLedsClass(); }

    // The exception's number; the result, which begins as the other answer, goes to `result`.
    binder_exception_t look(const std::string& name, bool expected) {
        result = !expected;
        return exceptionOf(makeExtension()->hasFeature(name, &result));
    }

    bool finds(const std::string& name, const std::string& list, bool expected) {
        kernel.addNode(kFunctions, list, Access::kReadOnly);
        EXPECT_EQ(look(name, expected), EX_NONE);
        return result;
    }

    bool result = false;
};

TEST_F(HasFeatureByName, ListedWordIsFoundAndEveryStepLogged) {
    EXPECT_TRUE(finds("HAPTIC_ENGINE", "INTENSITY HAPTIC_ENGINE\n", true));
    EXPECT_THAT(log.lines(),
                ElementsAre("I V_4_0: [hasFeature]featureName: HAPTIC_ENGINE ,length: 13",
                            "I HW_API: >> readNodeAsString "
                            "node:/vib_info_class/vib_support_info/functions",
                            "I HW_API: << readNodeAsString success - length: 23",
                            "I V_4_0: [hasFeature]allFeatures: INTENSITY HAPTIC_ENGINE",
                            "I V_4_0: [hasFeature]result: 1"));
    EXPECT_THAT(kernel.calls(),
                ElementsAre(kOpensTheList, "close " + kFunctions, kOpensTheList,
                            "read " + kFunctions + " 511 \"INTENSITY HAPTIC_ENGINE\\n\"",
                            "close " + kFunctions));
}

TEST_F(HasFeatureByName, OtherWordIsNotFoundAndTheStatusOk) {
    EXPECT_FALSE(finds("MULTI_FREQUENCY", "INTENSITY\n", false));
    EXPECT_EQ(log.lines().back(), "I V_4_0: [hasFeature]result: 0");
}

TEST_F(HasFeatureByName, OnlyWholeWordsAreFound) {
    const std::string list = "HAPTIC_ENGINE FIFO_HAPTIC_ENGINE\n";
    EXPECT_TRUE(finds("HAPTIC_ENGINE", list, true));
    EXPECT_TRUE(finds("FIFO_HAPTIC_ENGINE", list, true));
    EXPECT_FALSE(finds("HAPTIC", list, false));
    EXPECT_FALSE(finds("ENGINE", list, false));
    EXPECT_FALSE(finds("HAPTIC_ENGINE FIFO_HAPTIC_ENGINE", list, false));
    EXPECT_FALSE(finds("HAPTIC_ENGINE ", list, false));
    EXPECT_FALSE(finds(" ", list, false));
    EXPECT_FALSE(finds("HAPTIC_ENGINES", list, false));
    EXPECT_FALSE(finds(std::string("HAPTIC_ENGINE\0", 14), list, false));
    EXPECT_FALSE(finds(std::string(100000, 'H'), list, false));
}

TEST_F(HasFeatureByName, CaseCounts) {
    EXPECT_FALSE(finds("haptic_engine", "HAPTIC_ENGINE\n", false));
    EXPECT_TRUE(finds("haptic_engine", "haptic_engine\n", true));
}

TEST_F(HasFeatureByName, TwoBlanksHideNothing) {
    EXPECT_TRUE(finds("B", "A  B", true));
    EXPECT_TRUE(finds("A", "  A  B  ", true));
}

TEST_F(HasFeatureByName, OnlyBlanksPartWords) {
    EXPECT_FALSE(finds("HAPTIC_ENGINE", "INTENSITY\nHAPTIC_ENGINE\n", false));
    EXPECT_FALSE(finds("HAPTIC_ENGINE", "INTENSITY\tHAPTIC_ENGINE\n", false));
    EXPECT_TRUE(finds("INTENSITY\nHAPTIC_ENGINE", "INTENSITY\nHAPTIC_ENGINE\n", true));
}

TEST_F(HasFeatureByName, ListIsReadUpTo511Bytes) {
    EXPECT_TRUE(finds("WORD", std::string(506, 'X') + " WORD", true));
    EXPECT_FALSE(finds("WORD", std::string(507, 'X') + " WORD", false));
    EXPECT_TRUE(finds("WOR", std::string(507, 'X') + " WORD", true));
}

TEST_F(HasFeatureByName, EmptyNameIsAnIllegalArgumentAndLeavesTheListAlone) {
    kernel.addNode(kFunctions, "A  B", Access::kReadOnly);
    EXPECT_EQ(look("", false), EX_ILLEGAL_ARGUMENT);
    EXPECT_FALSE(result);
    EXPECT_THAT(log.lines(), ElementsAre("I V_4_0: [hasFeature]featureName:  ,length: 0",
                                         "I V_4_0: [hasFeature]Fail - featureName Param is Empty"));
    EXPECT_THAT(kernel.calls(), IsEmpty());
}

TEST_F(HasFeatureByName, WithoutAListIsNotOffered) {
    EXPECT_EQ(look("INTENSITY", false), EX_UNSUPPORTED_OPERATION);
    EXPECT_FALSE(result);
    EXPECT_THAT(log.lines(), ElementsAre("I V_4_0: [hasFeature]featureName: INTENSITY ,length: 9",
                                         "I HW_API: isNodeExistForRead node:/sys/class/"
                                         "vib_info_class/vib_support_info/functions - false",
                                         "I V_4_0: [hasFeature]Not Supported Function"));
}

TEST_F(HasFeatureByName, EmptyListIsNoWithoutALine) {
    for (const char* list : {"", "\n", " \n\t "}) {
        EXPECT_FALSE(finds("INTENSITY", list, false));
        EXPECT_EQ(log.lines().back(), "I V_4_0: [hasFeature]allFeatures: ");
    }
}

TEST_F(HasFeatureByName, ListThatOpensAndCannotBeReadIsNoWithoutALine) {
    kernel.addFault({.path = kFunctions, .operation = Operation::kRead, .error = EIO});
    EXPECT_FALSE(finds("INTENSITY", "INTENSITY", false));
    EXPECT_THAT(log.lines(),
                ElementsAre("I V_4_0: [hasFeature]featureName: INTENSITY ,length: 9",
                            "I HW_API: >> readNodeAsString "
                            "node:/vib_info_class/vib_support_info/functions",
                            "I HW_API: readNodeAsString node: /sys/class/vib_info_class/"
                            "vib_support_info/functionsread failed. errno: 5",
                            "I V_4_0: [hasFeature]allFeatures: "));
}

TEST_F(HasFeatureByName, NameOfManyLinesIsLoggedAsOneRecord) {
    EXPECT_EQ(look(std::string(100000, '\n'), false), EX_UNSUPPORTED_OPERATION);
    EXPECT_EQ(log.lines().size(), 3U);
    EXPECT_EQ(log.line(0),
              "I V_4_0: [hasFeature]featureName: " + std::string(100000, ' ') + " ,length: 100000");
}

TEST_F(HasFeatureByName, InterruptedCallsAreRepeated) {
    kernel.addNode(kFunctions, "INTENSITY", Access::kReadOnly);
    const auto extension = makeExtension();
    kernel.addFault(
            {.path = kFunctions, .operation = Operation::kOpen, .error = EINTR, .times = 2});
    kernel.addFault({.path = kFunctions, .operation = Operation::kRead, .error = EINTR});
    EXPECT_TRUE(extension->hasFeature("INTENSITY", &result).isOk());
    EXPECT_TRUE(result);
}

}  // namespace
}  // namespace aidl::vendor::quorvan::hardware::vibrator
