// SPDX-License-Identifier: Apache-2.0
//
// A force-feedback motor that fails: what the client is told, what is tried again, and what the
// next request finds.
#include <filesystem>
#include <iterator>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/phone_control.h"
#include "tests/system/force_feedback_journal.h"

namespace qvx::test {
namespace {

using nlohmann::json;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

// A phone whose motor is /dev/input/event9.
json profile() {
    json profile = builtInProfile("ff");
    profile["motor"]["event"] = 9;
    return profile;
}

json motorFault(const char* op, json what, int times = 1) {
    what["node"] = "motor";
    what["op"] = op;
    what["times"] = times;
    return what;
}

TEST(MotorFault, FailedOpenIsTriedAgainByTheNextRequest) {
    const Phone phone(profile());
    phone.reset();
    phone.fault(motorFault("open", {{"errno", "EACCES"}}));
    EXPECT_EQ(phone.call({"std", "on", "500"})["exception"], kIllegalState);
    EXPECT_EQ(phone.call({"std", "on", "500"})["exception"], 0);
    EXPECT_THAT(motorRequests(phone), ElementsAre("open motor O_RDWR = EACCES", "open motor O_RDWR",
                                                  "upload 500 00000000", "event 0 1"));
    EXPECT_THAT(phone.log(),
                HasSubstr("HW_API: [uploadForceFeedbackeffect]open fail: /dev/input/event9 "
                          ",errno: 13\n"));
}

TEST(MotorFault, FailedOpenForAnEventIsLoggedUnderTheEventsName) {
    const Phone phone(profile());
    phone.fault(motorFault("open", {{"errno", "ENXIO"}}));
    EXPECT_EQ(phone.call({"std", "setAmplitude", "0.5"})["exception"], kIllegalState);
    EXPECT_THAT(phone.log(),
                HasSubstr("HW_API: [writeInputEvent]open fail: /dev/input/event9 ,errno: 6\n"));
}

TEST(MotorFault, FailedUploadStartsNothingAndLeavesNoEffect) {
    const Phone phone(profile());
    phone.reset();
    phone.fault(motorFault("upload", {{"errno", "ENOSPC"}}));
    EXPECT_EQ(phone.call({"std", "on", "500"})["exception"], kIllegalState);
    EXPECT_EQ(phone.call({"std", "on", "250"})["exception"], 0);
    EXPECT_THAT(motorRequests(phone),
                ElementsAre("open motor O_RDWR", "upload 500 00000000 = ENOSPC",
                            "upload 250 00000000", "event 0 1"));
    EXPECT_THAT(phone.log(), HasSubstr("HW_API: [uploadForceFeedbackeffect]ioctl fail: "
                                       "/dev/input/event9 ,errno: 28\n"));
}

TEST(MotorFault, FailedEraseUploadsNothingAndIsTriedAgain) {
    const Phone phone(profile());
    phone.call({"std", "on", "500"});
    phone.reset();
    phone.fault(motorFault("erase", {{"errno", "EIO"}}));
    EXPECT_EQ(phone.call({"std", "on", "250"})["exception"], kIllegalState);
    EXPECT_EQ(phone.call({"std", "off"})["exception"], 0);
    EXPECT_EQ(phone.call({"std", "on", "250"})["exception"], 0);
    EXPECT_THAT(motorRequests(phone), ElementsAre("erase 0 = EIO", "event 0 0", "erase 0",
                                                  "upload 250 00000000", "event 0 1"));
    EXPECT_THAT(phone.log(), HasSubstr("HW_API: [uploadForceFeedbackeffect]Clear Memory - ioctl "
                                       "fail: /dev/input/event9 ,errno: 5\n"));
}

TEST(MotorFault, FailedEventKeepsTheUploadedEffect) {
    const Phone phone(profile());
    phone.reset();
    phone.fault(motorFault("write", {{"errno", "EIO"}}));
    EXPECT_EQ(phone.call({"std", "on", "500"})["exception"], kIllegalState);
    EXPECT_EQ(phone.call({"std", "off"})["exception"], 0);
    EXPECT_THAT(motorRequests(phone), ElementsAre("open motor O_RDWR", "upload 500 00000000",
                                                  "event 0 1 = EIO", "event 0 0"));
    EXPECT_THAT(phone.log(),
                HasSubstr("HW_API: [writeInputEvent]write fail: /dev/input/event9 ,errno: 5\n"));
}

TEST(MotorFault, ShortEventIsNoFailure) {
    const Phone phone(profile());
    phone.fault(motorFault("write", {{"short", 0}}));
    EXPECT_EQ(phone.call({"std", "setAmplitude", "0.5"})["exception"], 0);
    EXPECT_THAT(phone.log(), Not(HasSubstr("fail")));
}

TEST(MotorFault, FailedGainIsIllegalState) {
    const Phone phone(profile());
    phone.fault(motorFault("write", {{"errno", "EIO"}}));
    EXPECT_EQ(phone.call({"std", "setAmplitude", "0.5"})["exception"], kIllegalState);
    EXPECT_EQ(phone.call({"std", "setAmplitude", "0.5"})["exception"], 0);
}

TEST(MotorFault, InterruptedCallsAreRepeated) {
    const Phone phone(profile());
    phone.reset();
    phone.fault(motorFault("open", {{"errno", "EINTR"}}, 2));
    phone.fault(motorFault("upload", {{"errno", "EINTR"}}, 2));
    phone.fault(motorFault("write", {{"errno", "EINTR"}}, 2));
    phone.fault(motorFault("erase", {{"errno", "EINTR"}}, 2));
    EXPECT_EQ(phone.call({"std", "on", "500"})["exception"], 0);
    EXPECT_EQ(phone.call({"std", "on", "250"})["exception"], 0);
    EXPECT_THAT(
            motorRequests(phone),
            ElementsAre("open motor O_RDWR = EINTR", "open motor O_RDWR = EINTR",
                        "open motor O_RDWR", "upload 500 00000000 = EINTR",
                        "upload 500 00000000 = EINTR", "upload 500 00000000", "event 0 1 = EINTR",
                        "event 0 1 = EINTR", "event 0 1", "erase 0 = EINTR", "erase 0 = EINTR",
                        "erase 0", "upload 250 00000000", "event 0 1"));
}

TEST(MotorFault, SlowMotorIsWaitedFor) {
    const Phone phone(profile());
    phone.reset();
    phone.fault(motorFault("upload", {{"delay", 300}}));
    const json answer = phone.call({"std", "on", "500"});
    EXPECT_EQ(answer["exception"], 0);
    EXPECT_GE(answer["us"].get<int64_t>(), 300000);
    EXPECT_THAT(motorRequests(phone),
                ElementsAre("open motor O_RDWR", "upload 500 00000000", "event 0 1"));
}

TEST(MotorFault, WaveformThatFailsLeavesPlainVibrationAsItWas) {
    for (const char* op : {"upload", "write"}) {
        const Phone phone(profile());
        phone.reset();
        phone.fault(motorFault(op, {{"errno", "EIO"}}));
        EXPECT_EQ(phone.call({"std", "compose", "0,CLICK,1.0"})["exception"], kIllegalState) << op;
        phone.reset();
        EXPECT_EQ(phone.call({"std", "on", "500"})["exception"], 0);
        const std::vector<std::string> requests = motorRequests(phone);
        ASSERT_GE(requests.size(), 2U);
        EXPECT_THAT(std::vector(requests.end() - 2, requests.end()),
                    ElementsAre("upload 500 00000000", "event 0 1"));
    }
}

TEST(MotorFault, MotorUnpluggedWhileItPlaysFailsEveryLaterRequestAndNothingElse) {
    const Phone phone(profile());
    const int pid = phone.servicePid();
    EXPECT_EQ(phone.call({"std", "on", "5000"})["exception"], 0);
    phone.reset();
    phone.fault(motorFault("write", {{"unplug", true}}));
    EXPECT_EQ(phone.call({"std", "off"})["exception"], kIllegalState);
    EXPECT_EQ(phone.call({"std", "on", "500"})["exception"], kIllegalState);
    EXPECT_EQ(phone.call({"std", "setAmplitude", "0.5"})["exception"], kIllegalState);
    EXPECT_EQ(phone.call({"std", "compose", "0,CLICK,1.0"})["exception"], kIllegalState);
    EXPECT_EQ(phone.call({"std", "getCapabilities"})["result"], 60);
    EXPECT_EQ(phone.servicePid(), pid);
    EXPECT_THAT(phone.log(),
                HasSubstr("HW_API: [writeInputEvent]write fail: /dev/input/event9 ,errno: 19\n"));
    EXPECT_THAT(phone.log(), HasSubstr("HW_API: [uploadForceFeedbackeffect]Clear Memory - ioctl "
                                       "fail: /dev/input/event9 ,errno: 19\n"));
}

TEST(MotorFault, MotorUnpluggedBeforeItsFirstUseCannotBeOpened) {
    json unplugged = profile();
    unplugged["faults"] = json::array({motorFault("open", {{"unplug", true}})});
    const Phone phone(unplugged);
    ASSERT_EQ(phone.up().status, 0) << phone.up().out << phone.up().err;
    EXPECT_EQ(phone.call({"std", "on", "500"})["exception"], kIllegalState);
    EXPECT_EQ(phone.call({"std", "on", "500"})["exception"], kIllegalState);
    EXPECT_THAT(motorRequests(phone), ElementsAre("unplug motor", "open motor O_RDWR = ENODEV",
                                                  "open motor O_RDWR = ENODEV"));
}

size_t openDescriptors(int pid) {
    return static_cast<size_t>(std::distance(
            std::filesystem::directory_iterator("/proc/" + std::to_string(pid) + "/fd"), {}));
}

TEST(MotorFault, NoDescriptorIsLostOverTwentyFailures) {
    const Phone phone(profile());
    const size_t before = openDescriptors(phone.servicePid());
    phone.fault(motorFault("open", {{"errno", "EACCES"}}, 10));
    phone.fault(motorFault("upload", {{"errno", "EIO"}}, 10));
    for (int i = 0; i < 20; ++i) {
        EXPECT_EQ(phone.call({"std", "on", "500"})["exception"], kIllegalState);
    }
    EXPECT_EQ(phone.call({"std", "on", "500"})["exception"], 0);
    EXPECT_EQ(openDescriptors(phone.servicePid()), before + 1);  // the motor's
}

struct ListCase {
    const char* name;
    std::string list;
    bool found;
};

const std::string kName = "N: Name=\"qvx_vibrator_inputff\"\n";
const std::string kHandlers = "H: Handlers=event9 \n";

const ListCase kLists[] = {
        {"SeveralBlocks",
         "N: Name=\"keyboard\"\nH: Handlers=kbd event0 \n\n" + kName + "P: Phys=\n" + kHandlers +
                 "\nN: Name=\"mouse\"\nH: Handlers=event1 \n\n",
         true},
        {"NameInAnotherBlock", "N: Name=\"keyboard\"\n" + kHandlers + "\n" + kName + "\n", false},
        {"BlockWithoutHandlers", kName + "B: FF=1\n\n" + kHandlers + "\n", false},
        {"TrailingBlanks", kName + "H: Handlers=event9 \t  \n\n", true},
        {"PieceOfALongLine", kName + "B:" + std::string(1021, 'x') + kHandlers + "\n", true},
        {"PieceThatIsALineFeed", kName + "B:" + std::string(1021, 'x') + "\n" + kHandlers + "\n",
         false},
        {"EmptyList", "", false},
};

class TrickyInputDevices : public testing::TestWithParam<ListCase> {};

TEST_P(TrickyInputDevices, LeadToTheMotorOrToNone) {
    json tricky = profile();
    tricky["input_devices"] = GetParam().list;
    const Phone phone(tricky);
    ASSERT_EQ(phone.up().status, 0) << phone.up().out << phone.up().err;
    const json answer = phone.call({"std", "on", "500"});
    if (GetParam().found) {
        EXPECT_EQ(answer["exception"], 0);
        EXPECT_THAT(motorRequests(phone),
                    ElementsAre("open motor O_RDWR", "upload 500 00000000", "event 0 1"));
        EXPECT_THAT(phone.log(), HasSubstr("HW_API: THE_DEVICE_FF: /dev/input/event9\n"));
    } else {
        EXPECT_EQ(answer["exception"], kIllegalState);
        EXPECT_THAT(motorRequests(phone), IsEmpty());
    }
}

INSTANTIATE_TEST_SUITE_P(Lists, TrickyInputDevices, testing::ValuesIn(kLists),
                         [](const auto& tested) { return tested.param.name; });

TEST(TrickyInputDevice, LineFeedThatIsMissingCostsTheNodesLastDigit) {
    json tricky = profile();
    tricky["motor"]["event"] = 19;
    tricky["input_devices"] = kName + "H: Handlers=event19";
    const Phone phone(tricky);
    EXPECT_EQ(phone.call({"std", "on", "500"})["exception"], kIllegalState);
    EXPECT_THAT(phone.log(), HasSubstr("HW_API: THE_DEVICE_FF: /dev/input/event1\n"));
}

}  // namespace
}  // namespace qvx::test
