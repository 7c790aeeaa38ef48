// SPDX-License-Identifier: Apache-2.0
//
// What the service's process holds: one thread while nothing is under way, and no descriptor but
// binder, its six streams and the motor's input device.
#include <chrono>
#include <filesystem>
#include <string>
#include <thread>
#include <vector>

#include <android-base/file.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "handset/common/raw_binder.h"
#include "tests/support/phone_control.h"
#include "tests/support/process_view.h"

namespace qvx::test {
namespace {

using handset::RawBinder;
using handset::RawReply;
using handset::RequestBytes;
using testing::ElementsAre;
using testing::UnorderedElementsAre;

// Whether the address sanitizer watches the service: it holds freed memory back, to catch its use.
bool keepsFreedMemory(const Phone& phone) {
    std::string maps;
    android::base::ReadFileToString("/proc/" + std::to_string(phone.servicePid()) + "/maps", &maps);
    return maps.find("libasan") != std::string::npos;
}

// What the descriptors beyond the three standard ones refer to.
std::vector<std::string> openFiles(const Phone& phone) {
    const std::string directory = "/proc/" + std::to_string(phone.servicePid()) + "/fd/";
    std::vector<std::string> files;
    for (const std::string& number : entriesOf(phone.servicePid(), "fd")) {
        if (std::stoi(number) <= 2) continue;
        files.push_back(std::filesystem::read_symlink(directory + number));
    }
    return files;
}

size_t threadsOf(const Phone& phone) {
    return entriesOf(phone.servicePid(), "task").size();
}

TEST(Footprint, OnTheLedClassIsOneThreadBinderAndSixStreams) {
    const Phone phone("leds");
    ASSERT_EQ(phone.up().status, 0) << phone.up().err;
    EXPECT_EQ(threadsOf(phone), 1U);
    for (const char* effect : {"CLICK", "TICK"}) phone.call({"std", "perform", effect, "STRONG"});
    phone.call({"std", "on", "500"});
    phone.call({"ext", "performPlaybackEngine", "false", "0", "5,100,0"});
    EXPECT_EQ(threadsOf(phone), 1U);
    EXPECT_THAT(openFiles(phone),
                UnorderedElementsAre("/dev/binder", "/sys/class/leds/vibrator/asp_enable",
                                     "/sys/class/leds/vibrator/gpio1_fall_index",
                                     "/sys/class/leds/vibrator/gpio1_fall_dig_scale",
                                     "/sys/class/leds/vibrator/gpio1_rise_index",
                                     "/sys/class/leds/vibrator/gpio1_rise_dig_scale",
                                     "/sys/class/leds/vibrator/vibe_state"));
}

TEST(Footprint, OnForceFeedbackIsOneThreadBinderAndTheMotor) {
    const Phone phone("ff");
    ASSERT_EQ(phone.up().status, 0) << phone.up().err;
    EXPECT_THAT(openFiles(phone), ElementsAre("/dev/binder")) << "before the motor's first use";
    phone.call({"std", "on", "500"});
    phone.call({"std", "compose", "0,CLICK,1.0"});
    EXPECT_THAT(openFiles(phone),
                UnorderedElementsAre("/dev/binder", testing::StartsWith("/dev/input/event")));
    // The worker of the composition is gone when that is over.
    for (int i = 0; i < 100 && threadsOf(phone) > 1; ++i) {
        std::this_thread::sleep_for(std::chrono::milliseconds(20));
    }
    EXPECT_EQ(threadsOf(phone), 1U);
}

TEST(Footprint, WithoutAMotorIsBinderAlone) {
    const Phone phone("none");
    phone.call({"std", "on", "500"});
    EXPECT_THAT(openFiles(phone), ElementsAre("/dev/binder"));
    EXPECT_EQ(threadsOf(phone), 1U);
}

TEST(Footprint, FallsBackAfterRequestsOfAMegabyte) {
    const Phone phone("leds");
    RawBinder client;
    const auto service = client.checkService("android.hardware.vibrator.IVibrator/default");
    ASSERT_TRUE(service.has_value());
    // compose with as many elements as a request can hold, and with fewer in between, which may stay
    // in the heap where the large ones go back at once.
    for (const int count : {44000, 10000, 30000, 20000, 7000, 25000, 12000, 44000}) {
        RequestBytes request = RequestBytes().token("android.hardware.vibrator.IVibrator");
        request.int32(count);
        for (int i = 0; i < count; ++i) request.int32(1).int32(16).int32(0).int32(1).int32(0);
        EXPECT_EQ(client.transact(*service, 12, request.nullBinder()).kind, RawReply::Kind::kData);
    }
    EXPECT_GT(privateMemory(phone.servicePid()), 0);
    if (keepsFreedMemory(phone)) return;
    EXPECT_LT(privateMemory(phone.servicePid()), 3 * 1024);
}

}  // namespace
}  // namespace qvx::test
