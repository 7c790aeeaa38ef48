// SPDX-License-Identifier: Apache-2.0
//
// A driver that fails: what the client is told, what was written before, and that the service loses
// no descriptor over it.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/phone_control.h"
#include "tests/support/process_view.h"

namespace qvx::test {
namespace {

using nlohmann::json;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

constexpr const char* kState = "/sys/class/leds/vibrator/state";
constexpr const char* kDuration = "/sys/class/leds/vibrator/duration";
constexpr const char* kActivate = "/sys/class/leds/vibrator/activate";

TEST(NodeFault, InterruptedOpenAndWriteAreRepeated) {
    const Phone phone("leds");
    phone.reset();
    phone.fault({{"node", kState}, {"op", "open"}, {"errno", "EINTR"}, {"times", 2}});
    phone.fault({{"node", kDuration}, {"op", "write"}, {"errno", "EINTR"}, {"times", 3}});
    EXPECT_EQ(phone.call({"std", "on", "500"})["exception"], 0);
    EXPECT_THAT(phone.writes(), ElementsAre("state 1\n", "duration 500\n", "duration 500\n",
                                            "duration 500\n", "duration 500\n", "activate 1\n"));
}

TEST(NodeFault, FailedWriteStopsTheSequenceAndUndoesNothing) {
    const Phone phone("leds");
    phone.reset();
    phone.fault({{"node", kDuration}, {"op", "write"}, {"errno", "EIO"}, {"times", 1}});
    EXPECT_EQ(phone.call({"std", "on", "500"})["exception"], kIllegalState);
    EXPECT_THAT(phone.writes(), ElementsAre("state 1\n", "duration 500\n"));
    EXPECT_THAT(phone.log(), HasSubstr("HW_API: << writeNode node UNKNOWN_ERROR : 4 , -1\n"));
    EXPECT_THAT(phone.log(), HasSubstr("HW_API: Vibrator on THE_DEVICE_DURATION error\n"));
}

TEST(NodeFault, ShortWriteIsAFailure) {
    const Phone phone("leds");
    phone.reset();
    phone.fault({{"node", kActivate}, {"op", "write"}, {"short", 1}, {"times", 1}});
    EXPECT_EQ(phone.call({"std", "on", "500"})["exception"], kIllegalState);
    EXPECT_THAT(phone.writes(), ElementsAre("state 1\n", "duration 500\n", "activate 1\n"));
    EXPECT_THAT(phone.log(), HasSubstr("HW_API: << writeNode node UNKNOWN_ERROR : 2 , 1\n"));
}

TEST(NodeFault, RefusedOpenWritesNothing) {
    const Phone phone("leds");
    phone.reset();
    phone.fault({{"node", kState}, {"op", "open"}, {"errno", "EACCES"}, {"times", 1}});
    EXPECT_EQ(phone.call({"std", "on", "500"})["exception"], kIllegalState);
    EXPECT_THAT(phone.writes(), IsEmpty());
    EXPECT_THAT(phone.log(), HasSubstr("HW_API: node: /sys/class/leds/vibrator/stateerrno: 13\n"));
}

TEST(NodeFault, NoDescriptorIsLostOverTwentyFailures) {
    const Phone phone("leds");
    phone.call({"std", "on", "500"});
    const size_t before = entriesOf(phone.servicePid(), "fd").size();
    phone.fault({{"node", kDuration}, {"op", "write"}, {"errno", "EIO"}});
    for (int i = 0; i < 20; ++i) {
        EXPECT_EQ(phone.call({"std", "on", "500"})["exception"], kIllegalState);
    }
    EXPECT_EQ(entriesOf(phone.servicePid(), "fd").size(), before);
}

}  // namespace
}  // namespace qvx::test
