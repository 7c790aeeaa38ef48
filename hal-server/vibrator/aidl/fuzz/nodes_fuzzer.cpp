// SPDX-License-Identifier: Apache-2.0
//
// Lets every node hold anything, and reads it with each of the operations that make something of a
// node's contents, probing among them. The sanitizers watch the memory; what the harness checks itself
// is that a result is one of those promised.
//
// An input is a byte that chooses the operation, a byte for how much a read gives at most (its low six
// bits, 0 for as much as is asked for; its highest bit: the read after the last one fails), then the
// contents.
#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cctype>
#include <cerrno>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <string>
#include <vector>

#include <android-base/logging.h>
#include <log/log.h>

#include "HwApi.h"
#include "Vibrator_vendor.h"
#include "driver/SystemCalls.h"

namespace hal = aidl::android::hardware::vibrator;
namespace extension = aidl::vendor::quorvan::hardware::vibrator;

namespace {

constexpr uint8_t kFailsBit = 0x80;
constexpr uint8_t kStepBits = 0x3f;
constexpr int kFeatures = 13;
constexpr int kMotors = 13;

struct Contents {
    const uint8_t* data = nullptr;
    size_t size = 0;
    size_t position = 0;
    size_t step = 0;  // 0: none
    bool fails = false;
} contents;

void require(bool condition) {
    if (!condition) std::abort();
}

std::string text() {
    return {reinterpret_cast<const char*>(contents.data), contents.size};
}

bool isTrimmed(const std::string& string) {
    const auto isSpace = [](char c) { return std::isspace(static_cast<unsigned char>(c)) != 0; };
    return string.empty() || (!isSpace(string.front()) && !isSpace(string.back()));
}

void readDevices(hal::HwApi& hardware) {
    for (const char key : {'H', 'S', 'X'}) {
        char* const value = hardware.get_input_field_value(key);
        require(value == nullptr || key != 'X');
        std::free(value);
        std::string line = text();
        if (line.empty()) continue;
        std::free(hardware.parse_field(line.data(), key));
    }
}

void readLists(hal::HwApi& hardware) {
    for (const bool isDefault : {true, false}) {
        std::vector<int> list;
        require(hardware.getDynamicIntensityList(isDefault, list) == !list.empty());
    }
}

void askExtension() {
    const auto vendor =
            ndk::SharedRefBase::make<extension::Vibrator>(std::make_shared<hal::HwApi>());
    std::vector<int32_t> list;
    int32_t number = 0;
    bool answer = false;
    vendor->getAmplitudeList(extension::ZelAmplitudeType::DEFAULT, &list);
    vendor->getNumberOfPrebakedHapticPattern(&number);
    vendor->supportsFolderStatusSetting(&answer);
    vendor->supportsFolderTentModeStatusSetting(&answer);
    vendor->hasFeature(text(), &answer);
}

}  // namespace

// Every node is there and holds the input; whatever is written is taken.
namespace aidl::android::hardware::vibrator::kernel {

::android::base::unique_fd open(const char* /*path*/, int /*flags*/) {
    contents.position = 0;
    return ::android::base::unique_fd(::open("/dev/null", O_RDWR | O_CLOEXEC));
}

ssize_t read(int /*descriptor*/, void* buffer, size_t size) {
    const size_t left = contents.size - contents.position;
    if (left == 0 && contents.fails) {
        errno = EIO;
        return -1;
    }
    size_t count = std::min(left, size);
    if (contents.step != 0) count = std::min(count, contents.step);
    if (count > 0) memcpy(buffer, contents.data + contents.position, count);
    contents.position += count;
    return static_cast<ssize_t>(count);
}

ssize_t write(int /*descriptor*/, const void* /*data*/, size_t size) {
    return static_cast<ssize_t>(size);
}

int ioctl(int /*descriptor*/, unsigned long /*request*/, void* /*argument*/) {
    return 0;
}

int ioctl(int /*descriptor*/, unsigned long /*request*/, int /*argument*/) {
    return 0;
}

std::optional<ssize_t> writeOnce(const char* /*node*/, int /*flags*/, const void* data,
                                 size_t size) {
    return write(-1, data, size);
}

}  // namespace aidl::android::hardware::vibrator::kernel

extern "C" int LLVMFuzzerInitialize(int* /*argc*/, char*** /*argv*/) {
    android::base::SetLogger([](android::base::LogId, android::base::LogSeverity, const char*,
                                const char*, unsigned, const char*) {});
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    if (size < 2) return 0;
    contents = {data + 2, size - 2, 0, size_t{data[1]} & kStepBits, (data[1] & kFailsBit) != 0};
    static auto* const kHardware = new hal::HwApi;
    switch (data[0] % 8) {
        case 0: {
            const int value = kHardware->readNode("node");
            require(value > -1000000 && value < 10000000);
            break;
        }
        case 1: {
            const std::string value = kHardware->readNodeAsString("node");
            require(value.size() <= 511 && isTrimmed(value));
            break;
        }
        case 2: {
            const int motor = kHardware->getMotorIndex();
            require(motor >= 0 && motor < kMotors);
            break;
        }
        case 3:
            readLists(*kHardware);
            break;
        case 4:
            for (int i = 0; i < kFeatures; ++i) {
                const int answer = kHardware->hasFeature(static_cast<hal::qvx_features>(i));
                require(answer == 0 || answer == 1);  // the list can be opened
            }
            break;
        case 5:
            readDevices(*kHardware);
            break;
        case 6:
            require(kHardware->rtrim(text()).size() <= contents.size);
            hal::HwApi();  // probes
            break;
        default:
            askExtension();
    }
    return 0;
}
