// SPDX-License-Identifier: Apache-2.0
#include "tests/faults/requests.h"

#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <iterator>
#include <regex>
#include <thread>
#include <type_traits>
#include <utility>

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

template <typename Value>
std::string textOf(const Value& value) {
    if constexpr (std::is_enum_v<Value>) {
        return std::to_string(static_cast<int64_t>(value));
    } else {
        return std::to_string(value);
    }
}

template <typename Value>
std::string textOf(const std::vector<Value>& values) {
    std::string text;
    for (const Value& value : values) text += textOf(value) + " ";
    return text;
}

// A request without an out-value, and one with.
template <typename Call>
auto plain(Call call) {
    return [call](Phone& phone) -> Answer { return {call(phone).getExceptionCode(), ""}; };
}

template <typename Value, typename Call>
auto with(Call call) {
    return [call](Phone& phone) -> Answer {
        Value value = {};
        const binder_exception_t exception = call(phone, &value).getExceptionCode();
        return {exception, textOf(value)};
    };
}

hal::CompositeEffect click(int32_t delayMs) {
    return {.delayMs = delayMs, .primitive = hal::CompositePrimitive::CLICK, .scale = 1.0F};
}

vendor::ZelHapticEnginePacket packet() {
    return {.time = 7, .intensity = 10000, .frequency = 2050};
}

vendor::ZelHybridHapticEnginePacket hybridPacket() {
    return {.time = 5, .intensity = 5000, .value = 3};
}

vendor::ZelPlaybackPacket playbackPacket() {
    return {.patternIndex = 5, .level = 100};
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
    extension.reset();
    standard.reset();  // closes the motor
    hal::inputFD = -1;
}

void Phone::settle() {
    while (threadsOfProcess() > mThreads) std::this_thread::yield();
}

void Phone::build() {
    const auto hwApi = std::make_shared<hal::HwApi>();
    standard = ndk::SharedRefBase::make<hal::Vibrator>(hwApi);
    extension = ndk::SharedRefBase::make<vendor::Vibrator>(hwApi);
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

const std::vector<Request>& requests() {
    using S = hal::Vibrator;
    using E = vendor::Vibrator;
    using hal::Effect;
    using hal::EffectStrength;
    using Effects = std::vector<Effect>;
    using Primitives = std::vector<hal::CompositePrimitive>;
    using Numbers = std::vector<int32_t>;
    const auto query = [](ndk::ScopedAStatus (E::*method)(bool*)) {
        return with<bool>([method](Phone& phone, bool* value) {
            return (phone.extension.get()->*method)(value);
        });
    };
    const auto declined = [](ndk::ScopedAStatus (S::*method)(float*)) {
        return with<float>([method](Phone& phone, float* value) {
            return (phone.standard.get()->*method)(value);
        });
    };
    const auto perform = [](Effect effect) {
        return with<int32_t>([effect](Phone& phone, int32_t* value) {
            return phone.standard->perform(effect, EffectStrength::STRONG, nullptr, value);
        });
    };
    const auto performExtended = [](Effect effect) {
        return with<int32_t>([effect](Phone& phone, int32_t* value) {
            return phone.extension->perform(effect, 5000, nullptr, value);
        });
    };
    const auto pattern = [](int32_t index, bool repeat) {
        return plain([=](Phone& phone) {
            return phone.extension->performPrebakedHapticPattern(index, 5000, repeat);
        });
    };
#define PLAIN(call) plain([](Phone& phone) { return phone.call; })
#define WITH(Type, call) with<Type>([](Phone& phone, Type* value) { return phone.call; })
    static const std::vector<Request> kRequests = {
            {"std getCapabilities", WITH(int32_t, standard->getCapabilities(value))},
            {"std off", PLAIN(standard->off())},
            {"std on", PLAIN(standard->on(500, nullptr))},
            {"std perform CLICK", perform(Effect::CLICK)},
            {"std perform DOUBLE_CLICK", perform(Effect::DOUBLE_CLICK)},
            {"std perform TICK", perform(Effect::TICK)},
            {"std perform HEAVY_CLICK", perform(Effect::HEAVY_CLICK)},
            {"std getSupportedEffects", WITH(Effects, standard->getSupportedEffects(value))},
            {"std setAmplitude", PLAIN(standard->setAmplitude(0.5F))},
            {"std setExternalControl", PLAIN(standard->setExternalControl(true))},
            {"std getCompositionDelayMax", WITH(int32_t, standard->getCompositionDelayMax(value))},
            {"std getCompositionSizeMax", WITH(int32_t, standard->getCompositionSizeMax(value))},
            {"std getSupportedPrimitives",
             WITH(Primitives, standard->getSupportedPrimitives(value))},
            {"std getPrimitiveDuration",
             WITH(int32_t, standard->getPrimitiveDuration(hal::CompositePrimitive::CLICK, value))},
            {"std compose", PLAIN(standard->compose({click(0), click(20)}, nullptr))},
            {"std getSupportedAlwaysOnEffects",
             WITH(Effects, standard->getSupportedAlwaysOnEffects(value))},
            {"std alwaysOnEnable",
             PLAIN(standard->alwaysOnEnable(1, Effect::CLICK, EffectStrength::LIGHT))},
            {"std alwaysOnDisable", PLAIN(standard->alwaysOnDisable(1))},
            {"std getResonantFrequency", declined(&S::getResonantFrequency)},
            {"std getQFactor", declined(&S::getQFactor)},
            {"std getFrequencyResolution", declined(&S::getFrequencyResolution)},
            {"std getFrequencyMinimum", declined(&S::getFrequencyMinimum)},
            {"std composePwle", PLAIN(standard->composePwle({}, nullptr))},

            {"ext supportsAmplitudeControl", query(&E::supportsAmplitudeControl)},
            {"ext supportsForceTouchAmplitudeControl",
             query(&E::supportsForceTouchAmplitudeControl)},
            {"ext supportsFrequencyControl", query(&E::supportsFrequencyControl)},
            {"ext supportsHapticEngine", query(&E::supportsHapticEngine)},
            {"ext supportsPrebakedHapticPattern", query(&E::supportsPrebakedHapticPattern)},
            {"ext supportsFolderStatusSetting", query(&E::supportsFolderStatusSetting)},
            {"ext supportsEnhancedQuorvanHapticPattern",
             query(&E::supportsEnhancedQuorvanHapticPattern)},
            {"ext setAmplitude", PLAIN(extension->setAmplitude(5000))},
            {"ext setForceTouchAmplitude", PLAIN(extension->setForceTouchAmplitude(5000))},
            {"ext setFrequencyType",
             PLAIN(extension->setFrequencyType(static_cast<vendor::ZelFrequencyType>(4)))},
            {"ext setFolderStatus",
             PLAIN(extension->setFolderStatus(static_cast<vendor::ZelFolderStatus>(1)))},
            {"ext getNumberOfPrebakedHapticPattern",
             WITH(int32_t, extension->getNumberOfPrebakedHapticPattern(value))},
            {"ext performHapticEngine", PLAIN(extension->performHapticEngine({packet()}, 10000))},
            {"ext performPrebakedHapticPattern once", pattern(5, false)},
            {"ext performPrebakedHapticPattern chosen", pattern(0, false)},
            {"ext performPrebakedHapticPattern repeat", pattern(5, true)},
            {"ext getAmplitudeList",
             WITH(Numbers, extension->getAmplitudeList(vendor::ZelAmplitudeType{}, value))},
            {"ext perform CLICK", performExtended(Effect::CLICK)},
            {"ext perform DOUBLE_CLICK", performExtended(Effect::DOUBLE_CLICK)},
            {"ext perform TICK", performExtended(Effect::TICK)},
            {"ext performPlaybackEngine",
             PLAIN(extension->performPlaybackEngine({playbackPacket()}, true, 2))},
            {"ext supportsFifoHapticEngine", query(&E::supportsFifoHapticEngine)},
            {"ext supportsHybridHapticEngine", query(&E::supportsHybridHapticEngine)},
            {"ext supportsEnhancedHybridHapticPattern",
             query(&E::supportsEnhancedHybridHapticPattern)},
            {"ext performFifoHapticEngine",
             PLAIN(extension->performFifoHapticEngine(static_cast<vendor::ZelFifoType>(25)))},
            {"ext performHybridHapticEngine",
             PLAIN(extension->performHybridHapticEngine({hybridPacket()}, 10000))},
            {"ext supportsFolderTentModeStatusSetting",
             query(&E::supportsFolderTentModeStatusSetting)},
            {"ext setFolderTentModeStatus",
             PLAIN(extension->setFolderTentModeStatus(
                     static_cast<vendor::ZelFolderTentModeStatus>(1)))},
            {"ext supportsHasFeature", query(&E::supportsHasFeature)},
            {"ext hasFeature", WITH(bool, extension->hasFeature("INTENSITY", value))},
    };
#undef PLAIN
#undef WITH
    return kRequests;
}

}  // namespace faults
