// SPDX-License-Identifier: Apache-2.0
//
// A registry whose host is a fake.
#pragma once

#include <map>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "platform/servicemanager/service_registry.h"

// The registry compares objects and never looks into them; for these tests any memory is one.
struct AIBinder {};

namespace servicemanager {

// Records what the registry asks for.
class FakeHost final : public ObjectHost {
  public:
    struct Notice {
        Object callback;
        std::string name;
        Object service;

        bool operator==(const Notice& other) const = default;
    };
    struct ClientNotice {
        Object callback;
        Object service;
        bool hasClients;

        bool operator==(const ClientNotice& other) const = default;
    };

    bool isRemote(const Object& object) override { return local.count(object) == 0; }

    bool watch(const Object& object) override {
        if (dead.count(object) != 0) return false;
        ++watches[object];
        return true;
    }

    void unwatch(const Object& object) override { --watches[object]; }

    void notifyRegistration(const std::vector<Object>& callbacks, const std::string& name,
                            const Object& service) override {
        for (const Object& callback : callbacks) notices.push_back({callback, name, service});
    }

    void notifyClients(const std::vector<Object>& callbacks, const std::string& /*name*/,
                       const Object& service, bool hasClients) override {
        for (const Object& callback : callbacks) {
            clientNotices.push_back({callback, service, hasClients});
        }
    }

    std::optional<uint32_t> countHolders(const Object& object) override {
        const auto count = holders.find(object);
        return count == holders.end() ? std::nullopt : std::optional(count->second);
    }

    std::set<Object> local;
    std::set<Object> dead;
    std::map<Object, int> watches;
    std::map<Object, uint32_t> holders;
    std::vector<Notice> notices;
    std::vector<ClientNotice> clientNotices;
};

inline Object makeObject() {
    return std::make_shared<AIBinder>();
}

inline constexpr Caller kSystem{.pid = 100, .uid = 1000};
inline constexpr Caller kIsolated{.pid = 200, .uid = 90001};

class ServiceRegistryTest : public ::testing::Test {
  protected:
    Verdict add(const std::string& name, const Object& object, const Caller& caller = kSystem) {
        return mRegistry.addService(caller, {.name = name, .object = object, .dumpPriority = 8});
    }

    FakeHost mHost;
    std::set<std::string> mDeclared;
    std::set<std::pair<uid_t, std::string>> mForbidden;
    ServiceRegistry mRegistry{
            mHost,
            {.isDeclared = [this](const std::string& name) { return mDeclared.count(name) != 0; },
             .mayRegister =
                     [this](uid_t user, const std::string& name) {
                         return mForbidden.count({user, name}) == 0;
                     }}};
    const Object mObject = makeObject();
    const Object mOther = makeObject();
    const Object mCallback = makeObject();
};

}  // namespace servicemanager
