// SPDX-License-Identifier: Apache-2.0
//
// Sends any bytes as a request to the two services: through the binder library's parcels into the
// generated stubs and on into the service methods, which stand on a driver that agrees to
// everything. The sanitizers watch the memory; what the harness checks itself is that the answer is
// one of those the services promise.
//
// An input is a byte that chooses the service (its highest bit), the device class (the next: force
// feedback) and the method, then the request's 32-bit words, least significant byte first. Two words stand for what bytes cannot be: "BIND" for
// a binder of the client, "NULL" for none. The services are built once: nothing they keep may
// depend on the requests before.
#include <fcntl.h>
#include <linux/input.h>
#include <sys/ioctl.h>
#include <sys/mman.h>
#include <sys/syscall.h>
#include <time.h>
#include <unistd.h>

#include <algorithm>
#include <cstdarg>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <iterator>
#include <memory>
#include <string>

#include <aidl/android/hardware/vibrator/BnVibratorCallback.h>
#include <android-base/logging.h>
#include <android/binder_auto_utils.h>
#include <android/binder_ibinder.h>
#include <android/binder_parcel.h>

#include "HwApi.h"
#include "Vibrator.h"
#include "Vibrator_vendor.h"

namespace hal = aidl::android::hardware::vibrator;
namespace extension = aidl::vendor::quorvan::hardware::vibrator;

namespace {

constexpr uint32_t kBinder = 0x444e4942;  // "BIND"
constexpr uint32_t kNull = 0x4c4c554e;    // "NULL"

constexpr uint8_t kExtensionBit = 0x80;
constexpr uint8_t kForceFeedbackBit = 0x40;
// The methods that every interface has besides its own stand at the end of the codes.
constexpr uint8_t kLastMethod = 0x3f;
constexpr transaction_code_t kLastCode = 0x00ffffff;
constexpr uint8_t kCommonMethods = 4;

constexpr binder_exception_t kPromised[] = {EX_NONE, EX_SECURITY, EX_ILLEGAL_ARGUMENT,
                                            EX_ILLEGAL_STATE, EX_UNSUPPORTED_OPERATION};

void require(bool condition) {
    if (!condition) std::abort();
}

// The node of the posture commands, a file in memory: a read of it must give something.
class EventCmd {
  public:
    EventCmd() { reset(); }

    std::string path() const { return "/proc/self/fd/" + std::to_string(mFile); }

    void reset() const {
        constexpr char kWords[] = "FOLDER TENT\n";
        require(ftruncate(mFile, 0) == 0 && pwrite(mFile, kWords, sizeof(kWords) - 1, 0) > 0);
    }

  private:
    const int mFile = memfd_create("event_cmd", MFD_CLOEXEC);
};

// A driver that has every node and takes every value, and a motor without threads of its own. The
// calls that go to the kernel lead to /dev/null, which takes everything as well; the motor's ioctl
// is below.
class AgreeableHardware : public hal::HwApi {
  public:
    AgreeableHardware() {
        for (std::string* const node :
             {&hal::THE_DEVICE_FF, &hal::THE_DEVICE_INTENSITY,
              &hal::THE_DEVICE_FORCE_TOUCH_INTENSITY, &hal::THE_DEVICE_MULTI_FREQ,
              &hal::THE_DEVICE_HAPTIC_ENGINE, &hal::THE_DEVICE_HAPTIC_ENGINE_INDEX,
              &hal::THE_DEVICE_HAPTIC_PLAYBACK_QUEUE, &hal::THE_DEVICE_FIFO_HAPTIC_ENGINE,
              &hal::THE_DEVICE_HYBRID_HAPTIC_ENGINE}) {
            *node = "/dev/null";
        }
        hal::THE_DEVICE_EVENT_CMD = eventCmd.path();
        initForceFeedbackEffect();
    }

    bool writeNode(std::string /*node*/, int /*value*/) override { return true; }
    bool writeNodeByStringOnlyForWriting(std::string /*node*/, std::string /*value*/) override {
        return true;
    }
    int readNode(std::string /*node*/) override { return 1; }
    std::string readNodeAsString(std::string /*node*/) override { return "100,LINEAR_1040"; }
    bool isNodeExist(std::string /*node*/) override { return true; }
    bool isNodeExistForRead(std::string /*node*/) override { return true; }
    bool isNodeExistForWrite(std::string /*node*/) override { return true; }
    int hasFeature(hal::qvx_features /*feature*/) override { return 1; }
    void performEffect_DOUBLE_CLICK() override {}

    const EventCmd eventCmd;
};

class Callback : public hal::BnVibratorCallback {
  public:
    ndk::ScopedAStatus onComplete() override { return ndk::ScopedAStatus::ok(); }
};

struct Services {
    std::shared_ptr<AgreeableHardware> hardware = std::make_shared<AgreeableHardware>();
    ndk::SpAIBinder standard = ndk::SharedRefBase::make<hal::Vibrator>(hardware)->asBinder();
    ndk::SpAIBinder vendor = ndk::SharedRefBase::make<extension::Vibrator>(hardware)->asBinder();
    ndk::SpAIBinder callback = ndk::SharedRefBase::make<Callback>()->asBinder();
};

Services& services() {
    static auto* const kServices = new Services;
    return *kServices;
}

transaction_code_t codeOf(uint8_t choice) {
    const uint8_t method = choice & kLastMethod;
    const uint8_t fromEnd = kLastMethod - method;
    return fromEnd < kCommonMethods ? kLastCode - fromEnd : FIRST_CALL_TRANSACTION + method;
}

void writeWords(const uint8_t* data, size_t size, AParcel* parcel) {
    for (; size >= sizeof(uint32_t); data += sizeof(uint32_t), size -= sizeof(uint32_t)) {
        uint32_t word = 0;
        memcpy(&word, data, sizeof(word));
        if (word == kBinder) {
            AParcel_writeStrongBinder(parcel, services().callback.get());
        } else if (word == kNull) {
            AParcel_writeStrongBinder(parcel, nullptr);
        } else {
            AParcel_writeInt32(parcel, static_cast<int32_t>(word));
        }
    }
}

}  // namespace

extern "C" {

// A motor that takes every effect.
int ioctl(int descriptor, unsigned long request, ...) noexcept {
    va_list arguments;
    va_start(arguments, request);
    void* const argument = va_arg(arguments, void*);
    va_end(arguments);
    if (request == EVIOCSFF) {
        static_cast<ff_effect*>(argument)->id = 0;
        return 0;
    }
    if (request == EVIOCRMFF) return 0;
    return static_cast<int>(syscall(SYS_ioctl, descriptor, request, argument));
}

// Completions come at once.
int nanosleep(const timespec* /*duration*/, timespec* /*remaining*/) {
    return 0;
}

}  // extern "C"

extern "C" int LLVMFuzzerInitialize(int* /*argc*/, char*** /*argv*/) {
    // The services log every call.
    android::base::SetLogger([](android::base::LogId, android::base::LogSeverity, const char*,
                                const char*, unsigned, const char*) {});
    services();
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    if (size == 0) return 0;
    hal::useForceFeedback = (data[0] & kForceFeedbackBit) != 0;
    hal::motorPerformMethod =
            hal::useForceFeedback ? hal::PERFORM_PREBAKED_INDEX : hal::PERFORM_HAPTIC_ENGINE;
    services().hardware->eventCmd.reset();
    AIBinder* const binder =
            ((data[0] & kExtensionBit) != 0 ? services().vendor : services().standard).get();
    AParcel* request = nullptr;
    require(AIBinder_prepareTransaction(binder, &request) == STATUS_OK);
    writeWords(data + 1, size - 1, request);

    ndk::ScopedAParcel reply;
    if (AIBinder_transact(binder, codeOf(data[0]), &request, reply.getR(), 0) != STATUS_OK) {
        return 0;  // no such method, or a request that is not what the method takes
    }
    ndk::ScopedAStatus status;
    require(AParcel_readStatusHeader(reply.get(), status.getR()) == STATUS_OK);
    require(std::find(std::begin(kPromised), std::end(kPromised), status.getExceptionCode()) !=
            std::end(kPromised));
    return 0;
}
