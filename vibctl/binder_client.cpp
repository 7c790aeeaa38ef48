// SPDX-License-Identifier: Apache-2.0
//
// The binder side of the client: see binder_client.h.
#include "vibctl/binder_client.h"

#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <string>
#include <vector>

#include <aidl/android/os/IServiceManager.h>
#include <android/binder_ibinder.h>
#include <android/binder_manager.h>
#include <fmt/format.h>

#include "vibctl/deadline.h"

namespace vibctl {

using aidl::android::os::IServiceManager;
using aidl::android::os::ServiceDebugInfo;

namespace {

// The binder library takes the first that exists, and ends the process when it cannot open it.
constexpr const char* kBinderDevices[] = {"/dev/binder", "/dev/binderfs/binder"};
constexpr std::chrono::milliseconds kManagerTimeout{2000};

// The service manager registers itself, so it is found as any service is.
constexpr const char* kManagerName = "manager";

std::shared_ptr<IServiceManager> findManager() {
    return IServiceManager::fromBinder(ndk::SpAIBinder(AServiceManager_checkService(kManagerName)));
}

template <typename I>
Service asInterface(const ndk::SpAIBinder& binder, const std::string& name, Problem& problem) {
    std::shared_ptr<I> service = I::fromBinder(binder);
    if (service == nullptr) problem = fmt::format("{} is not an {}", name, I::descriptor);
    return service;
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

Problem checkManager(std::chrono::milliseconds limit) {
    // Without a service manager, the first look-up of a process waits for one for ever.
    limit = std::min(limit, kManagerTimeout);
    const auto answered = within(limit, [] {
        return ndk::SpAIBinder(AServiceManager_checkService(kManagerName)).get() != nullptr;
    });
    if (answered) return std::nullopt;
    return fmt::format("no service manager has answered for {} s",
                       static_cast<double>(limit.count()) / 1000);
}

Problem checkBinder(std::chrono::milliseconds limit) {
    std::string device;
    if (Problem problem = checkDevice(device)) return problem;
    return checkManager(limit);
}

std::string serviceName() {
    return std::string(IVibrator::descriptor) + "/default";
}

Service connect(const std::string& iface, Problem& problem) {
    const std::string name = serviceName();
    const ndk::SpAIBinder binder(AServiceManager_checkService(name.c_str()));
    if (binder.get() == nullptr) {
        problem = name + " is not registered";
        return nullptr;
    }
    if (iface == "std") return asInterface<IVibrator>(binder, name, problem);
    ndk::SpAIBinder extension;
    const binder_status_t status = AIBinder_getExtension(binder.get(), extension.getR());
    if (status != STATUS_OK) {
        problem = fmt::format("cannot ask {} for its extension: {}", name, statusName(status));
    } else if (extension.get() == nullptr) {
        problem = name + " has no extension";
    }
    if (problem) return nullptr;
    return asInterface<IZelVibrator>(extension, "the extension of " + name, problem);
}

Outcome listServices() {
    std::vector<std::string> names;
    const std::shared_ptr<IServiceManager> manager = findManager();
    if (manager == nullptr) return outcomeOf(ndk::ScopedAStatus::fromStatus(STATUS_DEAD_OBJECT));
    const Clock::time_point before = Clock::now();
    const ndk::ScopedAStatus header =
            manager->listServices(IServiceManager::DUMP_FLAG_PRIORITY_ALL, &names);
    const Clock::duration taken = Clock::now() - before;

    Outcome outcome = outcomeOf(header);
    outcome.microseconds = std::chrono::duration_cast<std::chrono::microseconds>(taken).count();
    if (outcome.exception == EX_NONE) {
        outcome.result = jsonOf(names);
        for (const std::string& name : names) outcome.text += name + "\n";
    }
    return outcome;
}

pid_t findRegistrant(const std::string& name) {
    const std::shared_ptr<IServiceManager> manager = findManager();
    std::vector<ServiceDebugInfo> infos;
    if (manager == nullptr || !manager->getServiceDebugInfo(&infos).isOk()) return 0;
    for (const ServiceDebugInfo& info : infos)
        if (info.name == name) return info.debugPid;
    return 0;
}

}  // namespace vibctl
