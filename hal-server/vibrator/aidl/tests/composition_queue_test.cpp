// SPDX-License-Identifier: Apache-2.0
//
// A composition on a phone with sysfs nodes: its string goes to the driver's pattern queue, from
// which no callback ever comes; and what becomes of it when the driver fails.
#include <cerrno>
#include <memory>
#include <string>
#include <vector>

#include "tests/composition_test.h"

namespace aidl::android::hardware::vibrator {
namespace {

using fake::Fault;
using fake::Operation;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::ElementsAreArray;
using ::testing::Not;
using Primitive = CompositePrimitive;

// A phone of the LED class. A click at full scale after 50 ms is "50,1.10000,0" in the queue.
class QueuedComposition : public VibratorTest {
  protected:
    QueuedComposition() {
        kernel.addNode(kLeds + "cp_trigger_index");
        kernel.addNode(kLeds + "cp_trigger_queue", "unset");
    }

    // The base's callback fails the test when it is called.
    ndk::ScopedAStatus composeClick(Vibrator& vibrator) const {
        return vibrator.compose({after(50, Primitive::CLICK)}, callback);
    }
};

TEST_F(QueuedComposition, GoesToTheQueueWithoutATerminatingZeroAndIsStarted) {
    const auto vibrator = makeVibrator();
    EXPECT_TRUE(composeClick(*vibrator).isOk());
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /sys/class/leds/vibrator/cp_trigger_index O_RDWR",
                            "write /sys/class/leds/vibrator/cp_trigger_index \"65534\\n\"",
                            "close /sys/class/leds/vibrator/cp_trigger_index",
                            "open /sys/class/leds/vibrator/cp_trigger_queue O_RDWR",
                            "write /sys/class/leds/vibrator/cp_trigger_queue \"50,1.10000,0\"",
                            "close /sys/class/leds/vibrator/cp_trigger_queue",
                            "open /sys/class/leds/vibrator/state O_RDWR",
                            "write /sys/class/leds/vibrator/state \"1\\n\"",
                            "close /sys/class/leds/vibrator/state",
                            "open /sys/class/leds/vibrator/duration O_RDWR",
                            "write /sys/class/leds/vibrator/duration \"1000\\n\"",
                            "close /sys/class/leds/vibrator/duration",
                            "open /sys/class/leds/vibrator/activate O_RDWR",
                            "write /sys/class/leds/vibrator/activate \"1\\n\"",
                            "close /sys/class/leds/vibrator/activate"));
    EXPECT_EQ(kernel.text(kLeds + "cp_trigger_queue").size(), 12U);
}

TEST_F(QueuedComposition, IsLoggedFromItsSizeToItsEnd) {
    const auto vibrator = makeVibrator();
    EXPECT_TRUE(composeClick(*vibrator).isOk());
    EXPECT_THAT(
            log.lines(),
            ElementsAre("E V_2_0: Vibrator compose : 1 size", "E  delayMs : 50",
                        "E V_2_0: 50,1.10000,", "E V_2_0: Vibrator getPrimitiveDuration ",
                        "E  durationMs : 20", "E  totaldelay : 50 totalDuration : 20",
                        "E V_2_0: Effect cmd : 50,1.10000,", "E V_2_0: Effect cmd : 50,1.10000,0",
                        "I HW_API: >> writeNode node:/leds/vibrator/cp_trigger_index val:65534",
                        "I HW_API: << writeNode node OK : 6", "E V_2_0: ret : 12",
                        "I HW_API: do_on for timeoutMs: 1000",
                        "I HW_API: >> writeNode node:/leds/vibrator/state val:1",
                        "I HW_API: << writeNode node OK : 2",
                        "I HW_API: >> writeNode node:/leds/vibrator/duration val:1000",
                        "I HW_API: << writeNode node OK : 5",
                        "I HW_API: >> writeNode node:/leds/vibrator/activate val:1",
                        "I HW_API: << writeNode node OK : 2",
                        "E V_2_0: zelPerformPrebakedHapticPattern end"));
}

TEST_F(QueuedComposition, StartsNoWorkerAndLetsGoOfTheCallback) {
    const auto vibrator = makeVibrator();
    EXPECT_TRUE(composeClick(*vibrator).isOk());
    EXPECT_EQ(callback.use_count(), 1);
    EXPECT_THAT(kernel.calls(), Not(Contains("sleep 70 ms")));
}

TEST_F(QueuedComposition, OfTheLegacyClassGoesToItsNodes) {
    addLegacyClass();
    kernel.addNode(kLegacy + "cp_trigger_index");
    kernel.addNode(kLegacy + "cp_trigger_queue");
    // Switched to the platform's numbering, which its queue does not use.
    kernel.addNode(kLegacy + "use_kyp_index");
    const auto vibrator = makeVibrator();
    EXPECT_TRUE(useKypIndex);
    EXPECT_TRUE(composeClick(*vibrator).isOk());
    EXPECT_THAT(kernel.writes(),
                ElementsAre("/sys/class/timed_output/vibrator/cp_trigger_index \"65534\\n\"",
                            "/sys/class/timed_output/vibrator/cp_trigger_queue \"50,1.10000,0\"",
                            "/sys/class/timed_output/vibrator/enable \"1000\\n\""));
}

TEST_F(QueuedComposition, InterruptedCallsAreRepeated) {
    const auto vibrator = makeVibrator();
    for (const Operation operation : {Operation::kOpen, Operation::kWrite}) {
        kernel.addFault({.path = kLeds + "cp_trigger_queue",
                         .operation = operation,
                         .error = EINTR,
                         .times = 2});
    }
    EXPECT_TRUE(composeClick(*vibrator).isOk());
    EXPECT_EQ(kernel.text(kLeds + "cp_trigger_queue"), "50,1.10000,0");
    EXPECT_THAT(log.lines(), Contains("E V_2_0: ret : 12"));
    EXPECT_EQ(log.lines().back(), "E V_2_0: zelPerformPrebakedHapticPattern end");
}

TEST_F(QueuedComposition, OnAPhoneWithoutAMotorFails) {
    for (const char* leaf : {"state", "duration", "activate"}) kernel.removeNode(kLeds + leaf);
    const auto vibrator = makeVibrator();
    EXPECT_EQ(exceptionOf(composeClick(*vibrator)), EX_ILLEGAL_STATE);
    EXPECT_THAT(linesAfter(log.lines(), "E V_2_0: Effect cmd : 50,1.10000,0"),
                ElementsAre("I HW_API: >> writeNode node: val:65534", "I HW_API: node: errno: 2",
                            "E V_2_0: compose write 0xFFFE fail"));
}

// A fault of a sysfs node: what is logged from the first node on, and what the nodes took.
struct QueueFailure {
    const char* name;
    Fault fault;
    Lines lines;
    Lines writes;
};

class FailedQueue : public QueuedComposition, public ::testing::WithParamInterface<QueueFailure> {};

TEST_P(FailedQueue, IsAnIllegalStateAndNothingMoreIsTried) {
    const auto vibrator = makeVibrator();
    kernel.addFault(GetParam().fault);
    EXPECT_EQ(exceptionOf(composeClick(*vibrator)), EX_ILLEGAL_STATE);
    EXPECT_THAT(linesAfter(log.lines(),
                           "I HW_API: >> writeNode node:/leds/vibrator/cp_trigger_index val:65534"),
                ElementsAreArray(GetParam().lines));
    EXPECT_THAT(kernel.writes(), ElementsAreArray(GetParam().writes));
    EXPECT_EQ(callback.use_count(), 1);
}

const std::string kIndexWrite = "/sys/class/leds/vibrator/cp_trigger_index \"65534\\n\"";
const std::string kQueueWrite = "/sys/class/leds/vibrator/cp_trigger_queue \"50,1.10000,0\"";
constexpr char kIndexOk[] = "I HW_API: << writeNode node OK : 6";
constexpr char kRepeatError[] = "E V_2_0: zelPerformPrebakedHapticPattern repeat error";

const QueueFailure kQueueFailures[] = {
        {"IndexCannotBeOpened",
         {.path = kLeds + "cp_trigger_index", .error = EACCES},
         {"I HW_API: node: /sys/class/leds/vibrator/cp_trigger_indexerrno: 13",
          "E V_2_0: compose write 0xFFFE fail"},
         {}},
        {"IndexWriteFails",
         {.path = kLeds + "cp_trigger_index", .operation = Operation::kWrite, .error = EIO},
         {"I HW_API: << writeNode node UNKNOWN_ERROR : 6 , -1",
          "E V_2_0: compose write 0xFFFE fail"},
         {}},
        {"IndexWriteIsShort",
         {.path = kLeds + "cp_trigger_index", .operation = Operation::kWrite, .limit = 5},
         {"I HW_API: << writeNode node UNKNOWN_ERROR : 6 , 5",
          "E V_2_0: compose write 0xFFFE fail"},
         {"/sys/class/leds/vibrator/cp_trigger_index \"65534\""}},
        {"QueueCannotBeOpened",
         {.path = kLeds + "cp_trigger_queue", .error = EACCES},
         {kIndexOk, "E V_2_0: compose is fail: 13"},
         {kIndexWrite}},
        {"QueueIsMissing",
         {.path = kLeds + "cp_trigger_queue", .error = ENOENT},
         {kIndexOk, "E V_2_0: compose is fail: 2"},
         {kIndexWrite}},
        {"QueueWriteIsShort",
         {.path = kLeds + "cp_trigger_queue", .operation = Operation::kWrite, .limit = 11},
         {kIndexOk, "E V_2_0: ret : 11", kRepeatError},
         {kIndexWrite, "/sys/class/leds/vibrator/cp_trigger_queue \"50,1.10000,\""}},
        {"QueueTakesNothing",
         {.path = kLeds + "cp_trigger_queue", .operation = Operation::kWrite, .limit = 0},
         {kIndexOk, "E V_2_0: ret : 0", kRepeatError},
         {kIndexWrite, "/sys/class/leds/vibrator/cp_trigger_queue \"\""}},
        {"QueueWriteFails",
         {.path = kLeds + "cp_trigger_queue", .operation = Operation::kWrite, .error = EIO},
         {kIndexOk, "E V_2_0: ret : -1", kRepeatError},
         {kIndexWrite}},
        {"StartFails",
         {.path = kLeds + "state", .operation = Operation::kWrite, .error = EIO},
         {kIndexOk, "E V_2_0: ret : 12", "I HW_API: do_on for timeoutMs: 1000",
          "I HW_API: >> writeNode node:/leds/vibrator/state val:1",
          "I HW_API: << writeNode node UNKNOWN_ERROR : 2 , -1",
          "I HW_API: Vibrator on THE_DEVICE_STATE error",
          "E V_2_0: zelPerformPrebakedHapticPattern on Trigger fail"},
         {kIndexWrite, kQueueWrite}},
};

INSTANTIATE_TEST_SUITE_P(Compose, FailedQueue, ::testing::ValuesIn(kQueueFailures),
                         [](const auto& failure) { return failure.param.name; });

}  // namespace
}  // namespace aidl::android::hardware::vibrator
