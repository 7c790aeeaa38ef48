// SPDX-License-Identifier: Apache-2.0
//
// A service manager of a few lines.
#include "platform/libbinder_ndk/tests/guest/small_manager.h"

#include <errno.h>

#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <aidl/android/os/BnServiceManager.h>
#include <android/binder_process.h>
#include <binder_context_manager.h>
#include <gtest/gtest.h>

namespace binder_test {
namespace {

using aidl::android::os::BnServiceManager;
using aidl::android::os::IClientCallback;
using aidl::android::os::IServiceCallback;
using aidl::android::os::ServiceDebugInfo;
using ndk::ScopedAStatus;
using ndk::SpAIBinder;
using std::string;

ScopedAStatus unsupported() {
    return ScopedAStatus::fromExceptionCode(EX_UNSUPPORTED_OPERATION);
}

class SmallManager : public BnServiceManager {
  public:
    ScopedAStatus getService(const string& name, SpAIBinder* service) override {
        return checkService(name, service);
    }
    ScopedAStatus checkService(const string& name, SpAIBinder* service) override {
        const auto found = mServices.find(name);
        if (found != mServices.end()) *service = found->second;
        return ScopedAStatus::ok();
    }
    ScopedAStatus addService(const string& name, const SpAIBinder& service, bool allowIsolated,
                             int32_t dumpPriority) override {
        if (allowIsolated || dumpPriority != DUMP_FLAG_PRIORITY_DEFAULT)
            return ScopedAStatus::fromExceptionCode(EX_ILLEGAL_ARGUMENT);
        mServices[name] = service;
        const auto [first, last] = mWaiting.equal_range(name);
        for (auto waiting = first; waiting != last; ++waiting)
            waiting->second->onRegistration(name, service);
        return ScopedAStatus::ok();
    }
    ScopedAStatus registerForNotifications(
            const string& name, const std::shared_ptr<IServiceCallback>& callback) override {
        mWaiting.emplace(name, callback);
        return ScopedAStatus::ok();
    }
    ScopedAStatus unregisterForNotifications(const string&,
                                             const std::shared_ptr<IServiceCallback>&) override {
        return ScopedAStatus::ok();
    }

    // What no test needs.
    using Strings = std::vector<string>;
    ScopedAStatus listServices(int32_t, Strings*) override { return unsupported(); }
    ScopedAStatus isDeclared(const string&, bool*) override { return unsupported(); }
    ScopedAStatus getDeclaredInstances(const string&, Strings*) override { return unsupported(); }
    ScopedAStatus updatableViaApex(const string&, std::optional<string>*) override {
        return unsupported();
    }
    ScopedAStatus registerClientCallback(const string&, const SpAIBinder&,
                                         const std::shared_ptr<IClientCallback>&) override {
        return unsupported();
    }
    ScopedAStatus tryUnregisterService(const string&, const SpAIBinder&) override {
        return unsupported();
    }
    ScopedAStatus getServiceDebugInfo(std::vector<ServiceDebugInfo>*) override {
        return unsupported();
    }

  private:
    std::map<string, SpAIBinder> mServices;
    std::multimap<string, std::shared_ptr<IServiceCallback>> mWaiting;
};

}  // namespace

void serveSmallManager(const std::function<void()>& ready) {
    const SpAIBinder manager = ndk::SharedRefBase::make<SmallManager>()->asBinder();
    ABinderProcess_setThreadPoolMaxThreadCount(0);
    ASSERT_EQ(STATUS_OK, ABinderProcess_becomeContextManager(manager.get()));
    EXPECT_EQ(-EBUSY, ABinderProcess_becomeContextManager(manager.get()));
    ready();
    ABinderProcess_joinThreadPool();
}

}  // namespace binder_test
