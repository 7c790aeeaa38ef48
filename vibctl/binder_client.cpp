// SPDX-License-Identifier: Apache-2.0
//
// The binder side of the client: see binder_client.h.
#include "binder_client.h"

#include <cerrno>
#include <cstring>
#include <future>
#include <string>
#include <thread>
#include <vector>

#include <unistd.h>

#include <android/binder_ibinder.h>
#include <android/binder_manager.h>
#include <android/binder_parcel_utils.h>
#include <fmt/format.h>

namespace vibctl {

namespace {

// The binder library takes the first that exists, and ends the process when it cannot open it.
constexpr const char* kBinderDevices[] = {"/dev/binder", "/dev/binderfs/binder"};
constexpr std::chrono::seconds kManagerPatience{2};

/// The service manager registers itself, so it is found as any service is.
constexpr const char* kManagerName = "manager";
constexpr transaction_code_t kListServices = FIRST_CALL_TRANSACTION + 3;
constexpr transaction_code_t kGetServiceDebugInfo = FIRST_CALL_TRANSACTION + 11;
constexpr int32_t kEveryDumpPriority = 15;

std::string standardName() {
    return std::string(IVibrator::descriptor) + "/default";
}

/// The service manager is only called, never served here: its class has no behaviour.
const AIBinder_Class* managerClass() {
    static const AIBinder_Class* const clazz = AIBinder_Class_define(
            "android.os.IServiceManager", [](void*) -> void* { return nullptr; }, [](void*) {},
            [](AIBinder*, transaction_code_t, const AParcel*, AParcel*) -> binder_status_t {
                return STATUS_UNKNOWN_TRANSACTION;
            });
    return clazz;
}

ndk::SpAIBinder findStandardService(Problem& problem) {
    ndk::SpAIBinder binder(AServiceManager_checkService(standardName().c_str()));
    if (binder.get() == nullptr) problem = standardName() + " is not registered";
    return binder;
}

/// The call itself, to the service manager's object.
binder_status_t callListServices(AIBinder* manager, std::vector<std::string>& names,
                                 ndk::ScopedAStatus& header) {
    ndk::ScopedAParcel in;
    ndk::ScopedAParcel out;
    binder_status_t status = AIBinder_prepareTransaction(manager, in.getR());
    if (status == STATUS_OK) status = AParcel_writeInt32(in.get(), kEveryDumpPriority);
    if (status == STATUS_OK) {
        status = AIBinder_transact(manager, kListServices, in.getR(), out.getR(), 0);
    }
    if (status == STATUS_OK) status = AParcel_readStatusHeader(out.get(), header.getR());
    if (status == STATUS_OK && header.isOk()) {
        status = ndk::AParcel_readVector(out.get(), &names);
    }
    return status;
}

/// One ServiceDebugInfo: an int that is not 0, the parcelable's size, the name, the process.
binder_status_t readDebugInfo(const AParcel* in, std::string& name, int32_t& pid) {
    int32_t present = 0;
    int32_t size = 0;
    binder_status_t status = AParcel_readInt32(in, &present);
    const int32_t start = AParcel_getDataPosition(in);
    if (status == STATUS_OK) status = AParcel_readInt32(in, &size);
    if (status == STATUS_OK) status = ndk::AParcel_readString(in, &name);
    if (status == STATUS_OK) status = AParcel_readInt32(in, &pid);
    // What a later version adds stands behind.
    return status == STATUS_OK ? AParcel_setDataPosition(in, start + size) : status;
}

}  // namespace

Problem checkDevice(std::string& device) {
    for (const char* candidate : kBinderDevices) {
        device = candidate;
        if (access(candidate, R_OK | W_OK) == 0) return std::nullopt;
        if (errno == ENOENT) continue;
        return fmt::format("cannot open {}: {}", candidate, std::strerror(errno));
    }
    device = kBinderDevices[0];
    return fmt::format("cannot open {}: {}", device, std::strerror(ENOENT));
}

Problem checkManager() {
    // Without a service manager, the first look-up of a process waits for one for ever; a thread
    // of its own does the waiting, and is left behind when it takes too long.
    std::promise<void> answered;
    std::future<void> answer = answered.get_future();
    std::thread([promise = std::move(answered)]() mutable {
        const ndk::SpAIBinder ignored(AServiceManager_checkService(kManagerName));
        promise.set_value();
    }).detach();
    if (answer.wait_for(kManagerPatience) == std::future_status::ready) return std::nullopt;
    return fmt::format("no service manager has answered for {} seconds", kManagerPatience.count());
}

Problem checkBinder() {
    std::string device;
    if (Problem problem = checkDevice(device)) return problem;
    return checkManager();
}

std::shared_ptr<IVibrator> connect(IVibrator*, Problem& problem) {
    const ndk::SpAIBinder binder = findStandardService(problem);
    if (problem) return nullptr;
    std::shared_ptr<IVibrator> service = IVibrator::fromBinder(binder);
    if (service == nullptr) {
        problem = fmt::format("{} is not an {}", standardName(), IVibrator::descriptor);
    }
    return service;
}

std::shared_ptr<IZelVibrator> connect(IZelVibrator*, Problem& problem) {
    const ndk::SpAIBinder binder = findStandardService(problem);
    if (problem) return nullptr;
    ndk::SpAIBinder extension;
    const binder_status_t status = AIBinder_getExtension(binder.get(), extension.getR());
    if (status != STATUS_OK) {
        problem = fmt::format("cannot ask {} for its extension: {}", standardName(),
                              statusName(status));
        return nullptr;
    }
    if (extension.get() == nullptr) {
        problem = standardName() + " has no extension";
        return nullptr;
    }
    std::shared_ptr<IZelVibrator> service = IZelVibrator::fromBinder(extension);
    if (service == nullptr) {
        problem = fmt::format("the extension of {} is not an {}", standardName(),
                              IZelVibrator::descriptor);
    }
    return service;
}

Outcome listServices() {
    using Clock = std::chrono::steady_clock;
    const ndk::SpAIBinder manager(AServiceManager_checkService(kManagerName));
    AIBinder_associateClass(manager.get(), managerClass());
    std::vector<std::string> names;
    ndk::ScopedAStatus header = ndk::ScopedAStatus::ok();
    const Clock::time_point before = Clock::now();
    const binder_status_t status = callListServices(manager.get(), names, header);
    const Clock::duration taken = Clock::now() - before;
    if (status != STATUS_OK) header = ndk::ScopedAStatus::fromStatus(status);

    Outcome outcome = outcomeOf(header);
    outcome.microseconds = std::chrono::duration_cast<std::chrono::microseconds>(taken).count();
    if (outcome.exception == EX_NONE) {
        outcome.result = jsonOf(names);
        outcome.text = textOf(names, Show::kPlain);
    }
    return outcome;
}

pid_t findRegistrant(const std::string& name) {
    const ndk::SpAIBinder manager(AServiceManager_checkService(kManagerName));
    AIBinder_associateClass(manager.get(), managerClass());
    ndk::ScopedAParcel in;
    ndk::ScopedAParcel out;
    ndk::ScopedAStatus header = ndk::ScopedAStatus::ok();
    int32_t count = 0;
    binder_status_t status = AIBinder_prepareTransaction(manager.get(), in.getR());
    if (status == STATUS_OK) {
        status = AIBinder_transact(manager.get(), kGetServiceDebugInfo, in.getR(), out.getR(), 0);
    }
    if (status == STATUS_OK) status = AParcel_readStatusHeader(out.get(), header.getR());
    if (status != STATUS_OK || !header.isOk()) return 0;
    status = AParcel_readInt32(out.get(), &count);
    for (int32_t i = 0; status == STATUS_OK && i < count; ++i) {
        std::string registered;
        int32_t pid = 0;
        status = readDebugInfo(out.get(), registered, pid);
        if (status == STATUS_OK && registered == name) return pid;
    }
    return 0;
}

ndk::ScopedAStatus CompletionCallback::onComplete() {
    const std::lock_guard lock(mMutex);
    if (!mWhen) mWhen = Clock::now();
    mCalled.notify_all();
    return ndk::ScopedAStatus::ok();
}

std::optional<CompletionCallback::Clock::time_point> CompletionCallback::waitFor(
        std::chrono::milliseconds limit) {
    std::unique_lock lock(mMutex);
    mCalled.wait_for(lock, limit, [this] { return mWhen.has_value(); });
    return mWhen;
}

}  // namespace vibctl
