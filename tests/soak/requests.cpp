// SPDX-License-Identifier: Apache-2.0
#include "tests/soak/requests.h"

#include <atomic>

#include <android-base/strings.h>
#include <android/binder_ibinder.h>
#include <android/binder_manager.h>

namespace qvx::test {
namespace {

using namespace aidl::android::hardware::vibrator;
using namespace aidl::vendor::quorvan::hardware::vibrator;
using namespace std::string_view_literals;

using handset::RawBinder;
using handset::RawReply;
using handset::RequestBytes;

constexpr int32_t kFailedTransaction = -2147483646;

Answer answerOf(const ndk::ScopedAStatus& status, int64_t value = 0) {
    if (status.getExceptionCode() == EX_TRANSACTION_FAILED) return {status.getStatus(), 0, 0};
    return {0, status.getExceptionCode(), status.isOk() ? value : 0};
}

// The answer of a method without arguments, by what it returns.
template <auto Method, typename Interface, typename Value>
Answer get(Interface& interface) {
    Value value{};
    const ndk::ScopedAStatus status = (interface.*Method)(&value);
    return answerOf(status, static_cast<int64_t>(value));
}

std::vector<CompositeEffect> clicks(size_t count, int32_t delayMs) {
    CompositeEffect click;
    click.delayMs = delayMs;
    click.primitive = CompositePrimitive::CLICK;
    click.scale = 1.0F;
    return {count, click};
}

RequestBytes token() {
    return RequestBytes().token("android.hardware.vibrator.IVibrator");
}

class Counter : public BnVibratorCallback {
  public:
    ndk::ScopedAStatus onComplete() override {
        ++calls;
        return ndk::ScopedAStatus::ok();
    }

    std::atomic<int> calls = 0;
};

// What is the same whatever the phone, by a client of good manners and by others; the first kQuiet
// of them cost no look at the driver and little else.
// clang-format off
#define QUIET_EVERYWHERE \
    {"compose of eleven", [](Client& c, int) { return answerOf(c.standard().compose(clicks(11, 0), nullptr)); }, {0, -3}, ""}, \
    {"composePwle", [](Client& c, int) { return answerOf(c.standard().composePwle({}, nullptr)); }, {0, -3}, ""}, \
    {"alwaysOn", [](Client& c, int n) { return answerOf(c.standard().alwaysOnEnable(n, Effect::CLICK, EffectStrength::LIGHT)); }, {0, -7}, ""}, \
    {"extension amplitude 0", [](Client& c, int) { return answerOf(c.extension().setAmplitude(0)); }, {0, -3}, "", true}, \
    {"getCompositionDelayMax", [](Client& c, int) { return get<&IVibrator::getCompositionDelayMax, IVibrator, int32_t>(c.standard()); }, {0, 0, 1000}, ""}, \
    {"no token", [](Client& c, int) { return c.sendRaw(3, RequestBytes()); }, {-2147483647}, ""}, \
    {"noise", [](Client& c, int n) { return c.sendRaw(4, RequestBytes().bytes(static_cast<size_t>(n), 0xa5)); }, {-2147483647}, ""}, \
    {"unknown code", [](Client& c, int n) { return c.sendRaw(1000U + static_cast<uint32_t>(n), token()); }, {-74}, ""}, \
    {"null array", [](Client& c, int) { return c.sendRaw(12, token().int32(-1).nullBinder()); }, {-12}, ""}, \
    {"array beyond memory", [](Client& c, int) { return c.sendRaw(12, token().int32(0x7fffffff)); }, {-61}, ""}, \
    {"missing integer", [](Client& c, int) { return c.sendRaw(3, token()); }, {-61}, ""}, \
    {"silent callback", [](Client& c, int n) { return c.sendRaw(3, token().int32(n).binder(1, 0x3f000001)); }, {0, -7}, ""}

#define THE_SAME_EVERYWHERE \
    {"340 packets", [](Client& c, int) { return answerOf(c.extension().performHapticEngine(std::vector<ZelHapticEnginePacket>(340), 1)); }, {0, -3}, "", true}, \
    {"amplitude 7", [](Client& c, int) { return answerOf(c.standard().setAmplitude(7.0F)); }, {0, -3}, ""}, \
    {"long tail", [](Client& c, int) { return c.sendRaw(7, token().int32(1).bytes(200000, 0xa5)); }, {}, ""}, \
    {"getCapabilities", [](Client& c, int) { return get<&IVibrator::getCapabilities, IVibrator, int32_t>(c.standard()); }, {0, 0, 60}, ""}, \
    {"supportsAmplitudeControl", [](Client& c, int) { return get<&IZelVibrator::supportsAmplitudeControl, IZelVibrator, bool>(c.extension()); }, {0, 0, 1}, "", true}, \
    {"posture", [](Client& c, int) { return answerOf(c.extension().setFolderStatus(ZelFolderStatus::CLOSED)); }, {}, "write event_cmd FOLDER_CLOSE\n", true}

constexpr Request kLeds[] = {
    QUIET_EVERYWHERE,
    THE_SAME_EVERYWHERE,
    {"on", [](Client& c, int n) { return answerOf(c.standard().on(n, nullptr)); }, {},
     "write state 1\n|write duration {}\n|write activate 1\n"},
    {"off", [](Client& c, int) { return answerOf(c.standard().off()); }, {}, "write activate 0\n"},
    {"perform", [](Client& c, int) { int32_t ms = 0; const auto s = c.standard().perform(Effect::HEAVY_CLICK, EffectStrength::STRONG, nullptr, &ms); return answerOf(s, ms); }, {0, 0, 110},
     "write intensity 10000\n|write cp_trigger_index 23\n|write state 1\n|write duration 1000\n|write activate 1\n"},
    {"setAmplitude", [](Client& c, int) { return answerOf(c.standard().setAmplitude(0.5F)); }, {}, "write intensity 5000\n"},
    {"compose", [](Client& c, int n) { return answerOf(c.standard().compose(clicks(1, n), c.callback())); }, {},
     "write cp_trigger_index 65534\n|write cp_trigger_queue {},1.10000,0|write state 1\n|write duration 1000\n|write activate 1\n"},
    {"extension setAmplitude", [](Client& c, int n) { return answerOf(c.extension().setAmplitude(n)); }, {}, "write intensity {}\n", true},
    {"setForceTouchAmplitude", [](Client& c, int n) { return answerOf(c.extension().setForceTouchAmplitude(n)); }, {}, "write force_touch_intensity {}\n", true},
    {"performHapticEngine", [](Client& c, int n) { return answerOf(c.extension().performHapticEngine({ZelHapticEnginePacket{n, 10000, 2050, 0}}, 5000)); }, {},
     "write haptic_engine 4 {} 5000 2050 0\n|write state 1\n|write duration 1\n|write activate 1\n", true, 1},
    {"performHybridHapticEngine", [](Client& c, int n) { return answerOf(c.extension().performHybridHapticEngine({ZelHybridHapticEnginePacket{n, 5000, ZelHybridHapticEnginePacketType{1}, 3, 170}}, 10000)); }, {},
     "write hybrid_haptic_engine 4 {} 5000 #3 170\n|write state 1\n|write duration 1\n|write activate 1\n", true, 1},
    {"performPrebakedHapticPattern", [](Client& c, int n) { return answerOf(c.extension().performPrebakedHapticPattern(23, n, false)); }, {},
     "write intensity {}\n|write cp_trigger_index 23\n|write state 1\n|write duration 1000\n|write activate 1\n", true},
    {"performPlaybackEngine", [](Client& c, int n) { return answerOf(c.extension().performPlaybackEngine({ZelPlaybackPacket{n, 100, 0}}, false, 0)); }, {},
     "write cp_trigger_index 65534\n|write cp_trigger_queue {}.100\0|write state 1\n|write duration 1000\n|write activate 1\n"sv, true},
    {"performFifoHapticEngine", [](Client& c, int) { return answerOf(c.extension().performFifoHapticEngine(ZelFifoType::PATTERN_25)); }, {}, "write fifo 25\n", true},
};

// Each plays a stored effect: whether a plain vibration is uploaded depends on what was before.
constexpr Request kForceFeedback[] = {
    QUIET_EVERYWHERE,
    THE_SAME_EVERYWHERE,
    {"perform", [](Client& c, int) { int32_t ms = 0; const auto s = c.standard().perform(Effect::CLICK, EffectStrength::STRONG, nullptr, &ms); return answerOf(s, ms); }, {0, 0, 60},
     "event 96 10000|upload 0 00000a00|event 0 1"},
    {"setAmplitude", [](Client& c, int) { return answerOf(c.standard().setAmplitude(0.5F)); }, {}, "event 96 5000"},
    {"compose", [](Client& c, int) { return answerOf(c.standard().compose(clicks(1, 50), c.callback())); }, {},
     "upload 0 00000200000000000000003200640a0000000000|event 0 1", false, 99, true},
    {"extension setAmplitude", [](Client& c, int n) { return answerOf(c.extension().setAmplitude(n)); }, {}, "event 96 {}", true},
    {"performHapticEngine", [](Client& c, int n) { return answerOf(c.extension().performHapticEngine({ZelHapticEnginePacket{n, 10000, 2050, 0}}, 5000)); }, {}, "", true},
    {"performPrebakedHapticPattern", [](Client& c, int n) { return answerOf(c.extension().performPrebakedHapticPattern(23, n, false)); }, {},
     "event 96 {}|upload 0 00001700|event 0 1", true},
};
// clang-format on

}  // namespace

bool Client::connect() {
    const ndk::SpAIBinder binder(AServiceManager_checkService(kService));
    ndk::SpAIBinder extension;
    if (binder.get() == nullptr ||
        AIBinder_getExtension(binder.get(), extension.getR()) != STATUS_OK) {
        return false;
    }
    mStandard = IVibrator::fromBinder(binder);
    mExtension = IZelVibrator::fromBinder(extension);
    mRaw = std::make_unique<RawBinder>();
    mRawService = mRaw->checkService(kService);
    return mStandard != nullptr && mExtension != nullptr && mRawService;
}

Answer Client::sendRaw(uint32_t code, const RequestBytes& request) {
    if (!mRawService) return {kDead};
    const RawReply reply = mRaw->transact(*mRawService, code, request);
    switch (reply.kind) {
        case RawReply::Kind::kData:
            return {0, reply.word(0)};
        case RawReply::Kind::kStatus:
            return {reply.status};
        case RawReply::Kind::kDead:
            return {kDead};
        default:
            return {kFailedTransaction};
    }
}

std::shared_ptr<IVibratorCallback> Client::callback() {
    if (mCallback == nullptr) mCallback = ndk::SharedRefBase::make<Counter>();
    return mCallback;
}

int Client::told() const {
    return mCallback == nullptr ? 0 : static_cast<Counter&>(*mCallback).calls.load();
}

std::vector<std::string> journalOf(const Request& request, int number) {
    if (request.journal.empty()) return {};
    return android::base::Split(
            android::base::StringReplace(request.journal, "{}", std::to_string(number), true), "|");
}

std::span<const Request> requestsOf(const std::string& profile) {
    if (profile == "ff") return kForceFeedback;
    return kLeds;
}

}  // namespace qvx::test
