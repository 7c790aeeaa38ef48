// SPDX-License-Identifier: Apache-2.0
#include "tests/faults/phones.h"

#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <iterator>
#include <memory>
#include <regex>
#include <thread>
#include <utility>
#include <vector>

#include "tests/fake_motor.h"

namespace faults {
namespace {

namespace hal = aidl::android::hardware::vibrator;
namespace vendor = aidl::vendor::quorvan::hardware::vibrator;

// The class's own nodes without those that a phone of the kind lacks.
void addNodes(fake::FakeKernel& kernel, const std::string& directory,
              const std::vector<std::string>& lacking) {
    static constexpr struct {
        const char* leaf;
        const char* text;
    } kNodes[] = {
            {"intensity", "0\n"},
            {"force_touch_intensity", "0\n"},
            {"multi_freq", "0\n"},
            {"haptic_engine", "0\n"},
            {"cp_trigger_index", "0\n"},
            {"cp_trigger_queue", "0\n"},
            {"num_waves", "7\n"},
            {"motor_type", "LINEAR_1040\n"},
            {"event_cmd", "FOLDER TENT\n"},
            {"intensities", "100,200\n"},
            {"haptic_intensities", "100,200\n"},
            {"asp_enable", "0\n"},
            {"gpio1_fall_index", "0\n"},
            {"gpio1_fall_dig_scale", "0\n"},
            {"gpio1_rise_index", "0\n"},
            {"gpio1_rise_dig_scale", "0\n"},
            {"vibe_state", "0\n"},
            {"fifo", "0\n"},
            {"hybrid_haptic_engine", "0\n"},
    };
    for (const auto& [leaf, text] : kNodes) {
        if (std::find(lacking.begin(), lacking.end(), leaf) == lacking.end()) {
            kernel.addNode(directory + leaf, text);
        }
    }
}

ptrdiff_t threadsOfProcess() {
    const std::filesystem::directory_iterator tasks("/proc/self/task");
    return std::distance(begin(tasks), end(tasks));
}

// Why a request may be ok although one of its calls went wrong. Each rule is for requests and calls
// that hold a match, and only beside a call of the clean run that does; the first that fits counts.
struct Allowance {
    const char* requests;
    const char* calls;
    const char* beside;
    unsigned ways;
    const char* because;
};

// clang-format off
constexpr char kStart[] = "/(enable|activate|duration|state) ";
constexpr Allowance kAllowances[] = {
    {"", "^event ", "", kLies, "the input core takes whole events"},
    {"", "^read ", "", kIsShort, "a node that gives less has given what it has"},
    {"^std get|^ext supports|^ext hasFeature|^ext getAmplitudeList", "^open ", "", kFails,
     "a query: a node that does not open counts as missing"},
    {"^std get|^ext supports|^ext hasFeature", "^read ", "", kFails,
     "a query: a list that cannot be read counts as empty"},
    {"^ext getNumberOfPrebakedHapticPattern", "^(open|read) ", "", kFails,
     "the driver's number is passed on as it is read"},
    {"perform DOUBLE_CLICK", kStart, "^sleep 70 ms", kFails | kIsShort,
     "the pulses are played on a thread whose calls are not answered"},
    {"^ext performHybridHapticEngine", "^write .*/hybrid_haptic_engine ", "", kFails | kIsShort,
     "a driver that takes less has said so in its own log"},
    {"perform (TICK|HEAVY_CLICK)|HapticEngine", kStart, "^write .*haptic_engine ", kFails | kIsShort,
     "the driver has taken the packets; its answer to the start is not looked at"},
};
// clang-format on

bool holds(const std::string& text, const char* pattern) {
    return std::regex_search(text, std::regex(pattern));
}

}  // namespace

std::string nameOf(PhoneClass phoneClass) {
    static constexpr const char* kNames[] = {"legacy",         "leds",           "leds-packets",
                                             "leds-amplitude", "force-feedback", "none"};
    return kNames[static_cast<size_t>(phoneClass)];
}

Phone::Phone(PhoneClass phoneClass) : mThreads(threadsOfProcess()) {
    for (const char* leaf : {"functions", "intensities", "haptic_intensities"}) {
        kernel.addNode(kInfo + leaf,
                       std::string(leaf) == "functions"
                               ? "INTENSITY PRIMITIVE_EFFECT_COMPOSE CAPABILITY_EXTERNAL_CONTROL\n"
                               : "100,200\n",
                       fake::Access::kReadOnly);
    }
    switch (phoneClass) {
        case PhoneClass::kLegacy:
            addLegacyClass();
            kernel.addNode(kLegacy + "use_kyp_index");
            addNodes(kernel, kLegacy, {});
            break;
        case PhoneClass::kLeds:
            addLedsClass();
            addNodes(kernel, kLeds, {});
            break;
        case PhoneClass::kLedsPackets:
            addLedsClass();
            addNodes(kernel, kLeds, {"cp_trigger_index"});
            break;
        case PhoneClass::kLedsAmplitude:
            addLedsClass();
            addNodes(kernel, kLeds, {"cp_trigger_index", "haptic_engine", "motor_type"});
            break;
        case PhoneClass::kForceFeedback:
            kernel.addNode("/proc/bus/input/devices",
                           "N: Name=\"qvx_vibrator_inputff\"\nH: Handlers=event7 \n\n",
                           fake::Access::kReadOnly);
            for (const char* leaf : {"use_kyp_index", "event_cmd", "f0_stored"}) {
                kernel.addNode("/sys/class/qvx_vib_inputff/control/" + std::string(leaf),
                               "FOLDER\n");
            }
            kernel.addNode("/efs/FactoryApp/vibrator_calibration", "137\n",
                           fake::Access::kReadOnly);
            kernel.addDevice("/dev/input/event7", std::make_shared<fake::FakeMotor>());
            break;
        case PhoneClass::kNone:
            break;
    }
}

Phone::~Phone() {
    settle();
    services.extension.reset();
    services.standard.reset();  // closes the motor
    hal::inputFD = -1;
}

void Phone::settle() {
    while (threadsOfProcess() > mThreads) std::this_thread::yield();
}

void Phone::build() {
    const auto hwApi = std::make_shared<hal::HwApi>();
    services.standard = ndk::SharedRefBase::make<hal::Vibrator>(hwApi);
    services.extension = ndk::SharedRefBase::make<vendor::Vibrator>(hwApi);
}

const char* allowedBecause(const char* request, const std::vector<std::string>& calls,
                           size_t position, Way way) {
    for (const Allowance& rule : kAllowances) {
        if ((rule.ways & way) != 0 && holds(request, rule.requests) &&
            holds(calls[position], rule.calls) &&
            std::any_of(calls.begin(), calls.end(),
                        [&](const std::string& call) { return holds(call, rule.beside); })) {
            return rule.because;
        }
    }
    return nullptr;
}

}  // namespace faults
