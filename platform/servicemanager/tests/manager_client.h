// SPDX-License-Identifier: Apache-2.0
//
// A client of the service manager that can make every call of its interface, also those that the
// public functions do not offer. For use in a process of its own.
#pragma once

#include <atomic>
#include <functional>
#include <optional>
#include <string>
#include <vector>

#include <android/binder_auto_utils.h>
#include <android/binder_ibinder.h>

namespace client {

// Transaction codes of android.os.IServiceManager.
enum Code : transaction_code_t {
    kGetService = 1,
    kCheckService = 2,
    kAddService = 3,
    kListServices = 4,
    kRegisterForNotifications = 5,
    kUnregisterForNotifications = 6,
    kIsDeclared = 7,
    kGetDeclaredInstances = 8,
    kUpdatableViaApex = 9,
    kRegisterClientCallback = 10,
    kTryUnregisterService = 11,
    kGetServiceDebugInfo = 12,
};

struct DebugInfo {
    std::string name;
    int32_t pid;
};

// A local object that does nothing.
ndk::SpAIBinder makeObject();

// The same with VINTF stability.
ndk::SpAIBinder makeVintfObject();

// A local object of android.os.IServiceCallback. Counts its calls, and keeps what came last.
// Calls are served by the thread pool, which this starts.
struct RegistrationCallback {
    std::atomic<int> calls{0};
    std::string name;
    ndk::SpAIBinder service;
    ndk::SpAIBinder binder;

    RegistrationCallback();
};

// A local object of android.os.IClientCallback, served by the thread pool, which this starts.
struct ClientCallback {
    explicit ClientCallback(std::function<void(bool hasClients)> onClients);

    const std::function<void(bool hasClients)> onClients;
    ndk::SpAIBinder binder;
};

// The manager's own object, as it stands under its name.
ndk::SpAIBinder manager();

// Every function below returns the exception code of the reply, EX_TRANSACTION_FAILED for a failed
// transaction, and fails the test for anything unreadable.
int32_t find(Code code, const std::string& name, ndk::SpAIBinder& service);
int32_t add(const std::string& name, const ndk::SpAIBinder& service, bool allowIsolated = false,
            int32_t dumpPriority = 8);
int32_t list(int32_t dumpPriority, std::vector<std::string>& names);
int32_t notify(Code code, const std::string& name, const ndk::SpAIBinder& callback);
int32_t isDeclared(const std::string& name, bool& declared);
int32_t getDeclaredInstances(const std::string& interface, std::vector<std::string>& instances);
int32_t updatableViaApex(const std::string& name, std::optional<std::string>& apex);
int32_t registerClientCallback(const std::string& name, const ndk::SpAIBinder& service,
                               const ndk::SpAIBinder& callback);
int32_t tryUnregister(const std::string& name, const ndk::SpAIBinder& service);
int32_t debugInfo(std::vector<DebugInfo>& infos);

}  // namespace client
