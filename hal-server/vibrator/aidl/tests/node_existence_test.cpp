// SPDX-License-Identifier: Apache-2.0
//
// Whether a node exists, which is whether it opens with the access asked for.
#include <cerrno>

#include "tests/service_test.h"

namespace aidl::android::hardware::vibrator {
namespace {

using fake::Access;
using fake::Operation;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

constexpr char kPresentNode[] = "/sys/class/leds/vibrator/node";

class NodeExists : public ServiceTest {
  protected:
    const std::shared_ptr<HwApi> hwApi = makeHwApi();
};

TEST_F(NodeExists, ReadWriteNodeExistsForEveryAccess) {
    kernel.addNode(kPresentNode);
    EXPECT_TRUE(hwApi->isNodeExist(kPresentNode));
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: isNodeExist node:/leds/vibrator/node", "I HW_API: true"));
    log.clear();
    EXPECT_TRUE(hwApi->isNodeExistForRead(kPresentNode));
    EXPECT_TRUE(hwApi->isNodeExistForWrite(kPresentNode));
    EXPECT_THAT(log.lines(), IsEmpty());
    EXPECT_THAT(kernel.calls(), ElementsAre("open /sys/class/leds/vibrator/node O_RDWR",
                                            "close /sys/class/leds/vibrator/node",
                                            "open /sys/class/leds/vibrator/node O_RDONLY",
                                            "close /sys/class/leds/vibrator/node",
                                            "open /sys/class/leds/vibrator/node O_WRONLY",
                                            "close /sys/class/leds/vibrator/node"));
}

TEST_F(NodeExists, ReadOnlyNodeExistsForReadingOnly) {
    kernel.addNode(kPresentNode, "1\n", Access::kReadOnly);
    EXPECT_FALSE(hwApi->isNodeExist(kPresentNode));
    EXPECT_TRUE(hwApi->isNodeExistForRead(kPresentNode));
    EXPECT_FALSE(hwApi->isNodeExistForWrite(kPresentNode));
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: isNodeExist node:/leds/vibrator/node", "I HW_API: false",
                            "I HW_API: isNodeExistForWrite node:/sys/class/leds/vibrator/node - "
                            "false"));
}

TEST_F(NodeExists, WriteOnlyNodeExistsForWritingOnly) {
    kernel.addNode(kPresentNode, "", Access::kWriteOnly);
    EXPECT_FALSE(hwApi->isNodeExist(kPresentNode));
    EXPECT_FALSE(hwApi->isNodeExistForRead(kPresentNode));
    EXPECT_TRUE(hwApi->isNodeExistForWrite(kPresentNode));
    EXPECT_THAT(log.lines(),
                ElementsAre("I HW_API: isNodeExist node:/leds/vibrator/node", "I HW_API: false",
                            "I HW_API: isNodeExistForRead node:/sys/class/leds/vibrator/node - "
                            "false"));
}

TEST_F(NodeExists, InterruptedOpensAreRepeated) {
    kernel.addNode(kPresentNode);
    kernel.addFault(
            {.path = kPresentNode, .operation = Operation::kOpen, .error = EINTR, .times = 2});
    EXPECT_TRUE(hwApi->isNodeExist(kPresentNode));
    kernel.addFault(
            {.path = kPresentNode, .operation = Operation::kOpen, .error = EINTR, .times = 2});
    EXPECT_TRUE(hwApi->isNodeExistForRead(kPresentNode));
    kernel.addFault(
            {.path = kPresentNode, .operation = Operation::kOpen, .error = EINTR, .times = 2});
    EXPECT_TRUE(hwApi->isNodeExistForWrite(kPresentNode));
}

TEST_F(NodeExists, EachOperationAsksForItsNodeAndAccess) {
    THE_DEVICE_HAPTIC_ENGINE = "/sys/class/a/haptic";
    THE_DEVICE_MOTOR_TYPE = "/sys/class/a/type";
    THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES = "/sys/class/a/waves";
    THE_DEVICE_HAPTIC_ENGINE_INDEX = "/sys/class/a/index";
    EXPECT_FALSE(hwApi->isVibratorNodeExist());
    EXPECT_FALSE(hwApi->isVibratorActiveNodeExist());
    EXPECT_FALSE(hwApi->isVibratorDurationNodeExist());
    EXPECT_FALSE(hwApi->isVibratorStateNodeExist());
    EXPECT_FALSE(hwApi->isHapticEngineNodeExist());
    EXPECT_FALSE(hwApi->isMotorTypeNodeExist());
    EXPECT_FALSE(hwApi->isNumWavesNodeExist());
    EXPECT_FALSE(hwApi->isPrebakedHapticPatternExist());
    EXPECT_THAT(kernel.calls(),
                ElementsAre("open /sys/class/timed_output/vibrator/enable O_RDWR = ENOENT",
                            "open /sys/class/leds/vibrator/activate O_RDWR = ENOENT",
                            "open /sys/class/leds/vibrator/duration O_RDWR = ENOENT",
                            "open /sys/class/leds/vibrator/state O_RDWR = ENOENT",
                            "open /sys/class/a/haptic O_RDWR = ENOENT",
                            "open /sys/class/a/type O_RDONLY = ENOENT",
                            "open /sys/class/a/waves O_RDONLY = ENOENT",
                            "open /sys/class/a/index O_RDWR = ENOENT"));
}

TEST_F(NodeExists, EachOperationSaysYesWhereItsNodeIs) {
    for (const char* path :
         {"/sys/class/timed_output/vibrator/enable", "/sys/class/leds/vibrator/activate",
          "/sys/class/leds/vibrator/duration", "/sys/class/leds/vibrator/state",
          "/sys/class/a/haptic", "/sys/class/a/index"}) {
        kernel.addNode(path);
    }
    kernel.addNode("/sys/class/a/type", "", Access::kReadOnly);
    kernel.addNode("/sys/class/a/waves", "", Access::kReadOnly);
    THE_DEVICE_HAPTIC_ENGINE = "/sys/class/a/haptic";
    THE_DEVICE_MOTOR_TYPE = "/sys/class/a/type";
    THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES = "/sys/class/a/waves";
    THE_DEVICE_HAPTIC_ENGINE_INDEX = "/sys/class/a/index";
    EXPECT_TRUE(hwApi->isVibratorNodeExist());
    EXPECT_TRUE(hwApi->isVibratorActiveNodeExist());
    EXPECT_TRUE(hwApi->isVibratorDurationNodeExist());
    EXPECT_TRUE(hwApi->isVibratorStateNodeExist());
    EXPECT_TRUE(hwApi->isHapticEngineNodeExist());
    EXPECT_TRUE(hwApi->isMotorTypeNodeExist());
    EXPECT_TRUE(hwApi->isNumWavesNodeExist());
    EXPECT_TRUE(hwApi->isPrebakedHapticPatternExist());
}

}  // namespace
}  // namespace aidl::android::hardware::vibrator
