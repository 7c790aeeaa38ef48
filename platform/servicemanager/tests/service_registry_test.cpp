// SPDX-License-Identifier: Apache-2.0
//
// Who may register what, who finds it, who is told, and what a death takes away.
#include "platform/servicemanager/service_registry.h"

#include <map>
#include <optional>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

// The registry compares objects and never looks into them; for these tests any memory is one.
struct AIBinder {};

namespace servicemanager {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

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

Object makeObject() {
    return std::make_shared<AIBinder>();
}

constexpr Caller kSystem{.pid = 100, .uid = 1000};
constexpr Caller kIsolated{.pid = 200, .uid = 90001};

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

using AddService = ServiceRegistryTest;

TEST_F(AddService, StoresTheObjectUnderItsName) {
    EXPECT_EQ(add("foo", mObject).exception, EX_NONE);
    EXPECT_EQ(mRegistry.find(kSystem, "foo"), mObject);
}

TEST_F(AddService, RefusesAppsFirst) {
    const Verdict verdict = mRegistry.addService({.pid = 1, .uid = 10123}, {.name = "!"});
    EXPECT_EQ(verdict.exception, EX_SECURITY);
    EXPECT_EQ(verdict.reason, "apps may not register services");
}

TEST_F(AddService, RefusesANameThatIsNotTheUsersBeforeANullObject) {
    mForbidden = {{1000, "foo"}};
    const Verdict verdict = add("foo", nullptr);
    EXPECT_EQ(verdict.exception, EX_SECURITY);
    EXPECT_EQ(verdict.reason, "no rule lets this user register the name");
    EXPECT_TRUE(add("foo", mObject, {.pid = 1, .uid = 0}).ok());
    EXPECT_TRUE(add("bar", mObject).ok());
}

TEST_F(AddService, NeverReplacesALivingServiceOfAnotherUser) {
    add("foo", mObject);
    for (const uid_t uid : {uid_t{0}, uid_t{1001}}) {
        const Verdict verdict = add("foo", mOther, {.pid = 1, .uid = uid});
        EXPECT_EQ(verdict.exception, EX_SECURITY);
        EXPECT_EQ(verdict.reason, "a living service of another user has the name");
    }
    EXPECT_EQ(mRegistry.find(kSystem, "foo"), mObject);
    mRegistry.objectDied(mObject.get());
    EXPECT_TRUE(add("foo", mOther, {.pid = 1, .uid = 1001}).ok());
}

TEST_F(AddService, RefusesANullObjectBeforeABadName) {
    const Verdict verdict = add("!", nullptr);
    EXPECT_EQ(verdict.exception, EX_ILLEGAL_ARGUMENT);
    EXPECT_EQ(verdict.reason, "no binder given");
}

TEST_F(AddService, RefusesABadNameBeforeAskingTheManifests) {
    const Verdict verdict = mRegistry.addService(
            kSystem, {.name = "a b", .object = mObject, .requiresDeclaration = true});
    EXPECT_EQ(verdict.exception, EX_ILLEGAL_ARGUMENT);
    EXPECT_EQ(verdict.reason, "the name is not 1 to 127 of a-z A-Z 0-9 _ - . /");
}

TEST_F(AddService, RefusesAnUndeclaredVintfObjectBeforeLinkingToItsDeath) {
    mHost.dead.insert(mObject);
    const Verdict verdict = mRegistry.addService(
            kSystem, {.name = "a.IFoo/x", .object = mObject, .requiresDeclaration = true});
    EXPECT_EQ(verdict.exception, EX_ILLEGAL_ARGUMENT);
    EXPECT_EQ(verdict.reason, "a VINTF-stable service must be declared in a manifest");
}

TEST_F(AddService, AcceptsADeclaredVintfObject) {
    mDeclared.insert("a.IFoo/x");
    EXPECT_TRUE(mRegistry
                        .addService(kSystem, {.name = "a.IFoo/x",
                                              .object = mObject,
                                              .requiresDeclaration = true})
                        .ok());
}

TEST_F(AddService, AcceptsAnUndeclaredObjectOfAnotherLevel) {
    EXPECT_TRUE(add("a.IFoo/x", mObject).ok());
}

TEST_F(AddService, RefusesADeadObject) {
    mHost.dead.insert(mObject);
    EXPECT_EQ(add("foo", mObject).exception, EX_ILLEGAL_STATE);
    EXPECT_EQ(mRegistry.find(kSystem, "foo"), nullptr);
}

TEST_F(AddService, DoesNotWatchALocalObject) {
    mHost.local.insert(mObject);
    EXPECT_TRUE(add("manager", mObject).ok());
    EXPECT_THAT(mHost.watches, IsEmpty());
}

TEST_F(AddService, ReplacesAnOlderOneAndStopsWatchingIt) {
    add("foo", mObject);
    EXPECT_TRUE(add("foo", mOther, {.pid = 7, .uid = 1000}).ok());
    EXPECT_EQ(mRegistry.find(kSystem, "foo"), mOther);
    EXPECT_EQ(mHost.watches[mObject], 0);
    EXPECT_EQ(mHost.watches[mOther], 1);
    EXPECT_EQ(mRegistry.debugInfo().at(0).pid, 7);
}

TEST_F(AddService, WatchesAnObjectOnceHoweverManyNamesItHas) {
    add("foo", mObject);
    add("foo", mObject);
    add("bar", mObject);
    EXPECT_EQ(mHost.watches[mObject], 1);
    add("foo", mOther);
    EXPECT_EQ(mHost.watches[mObject], 1);
    add("bar", mOther);
    EXPECT_EQ(mHost.watches[mObject], 0);
}

TEST_F(AddService, ARefusedOneLeavesTheOlderInPlace) {
    add("foo", mObject);
    EXPECT_FALSE(add("foo", mOther, {.pid = 1, .uid = 10000}).ok());
    EXPECT_EQ(mRegistry.find(kSystem, "foo"), mObject);
}

using Find = ServiceRegistryTest;

TEST_F(Find, AnUnknownNameIsNull) {
    EXPECT_EQ(mRegistry.find(kSystem, "foo"), nullptr);
    EXPECT_EQ(mRegistry.find(kSystem, ""), nullptr);
}

TEST_F(Find, AnIsolatedCallerSeesOnlyWhatAllowsIt) {
    add("closed", mObject);
    mRegistry.addService(kSystem, {.name = "open", .object = mOther, .allowIsolated = true});
    EXPECT_EQ(mRegistry.find(kIsolated, "closed"), nullptr);
    EXPECT_EQ(mRegistry.find(kIsolated, "open"), mOther);
}

TEST_F(Find, AnAppSeesEverything) {
    add("closed", mObject);
    EXPECT_EQ(mRegistry.find({.pid = 1, .uid = 10123}, "closed"), mObject);
}

using ListServices = ServiceRegistryTest;

TEST_F(ListServices, GivesNamesInByteOrderWhosePriorityMatches) {
    const std::pair<const char*, int32_t> services[] = {
            {"b", 1}, {"a", 8}, {"B", 2}, {"c", 9}, {"zero", 0}};
    for (const auto& [name, priority] : services) {
        mRegistry.addService(kSystem, {.name = name, .object = mObject, .dumpPriority = priority});
    }
    EXPECT_THAT(mRegistry.list(15), ElementsAre("B", "a", "b", "c"));
    EXPECT_THAT(mRegistry.list(1), ElementsAre("b", "c"));
    EXPECT_THAT(mRegistry.list(8), ElementsAre("a", "c"));
    EXPECT_THAT(mRegistry.list(0), IsEmpty());
}

using Notifications = ServiceRegistryTest;

TEST_F(Notifications, TellAtOnceWhenTheNameIsRegistered) {
    add("foo", mObject);
    EXPECT_TRUE(mRegistry.registerForNotifications(kSystem, "foo", mCallback).ok());
    EXPECT_THAT(mHost.notices, ElementsAre(FakeHost::Notice{mCallback, "foo", mObject}));
}

TEST_F(Notifications, TellAtEachLaterRegistrationOfTheName) {
    EXPECT_TRUE(mRegistry.registerForNotifications(kSystem, "foo", mCallback).ok());
    EXPECT_THAT(mHost.notices, IsEmpty());
    add("bar", mObject);
    EXPECT_THAT(mHost.notices, IsEmpty());
    add("foo", mObject);
    add("foo", mOther);
    EXPECT_THAT(mHost.notices, ElementsAre(FakeHost::Notice{mCallback, "foo", mObject},
                                           FakeHost::Notice{mCallback, "foo", mOther}));
}

TEST_F(Notifications, StopWhenUnregistered) {
    mRegistry.registerForNotifications(kSystem, "foo", mCallback);
    EXPECT_TRUE(mRegistry.unregisterForNotifications("foo", mCallback).ok());
    EXPECT_EQ(mHost.watches[mCallback], 0);
    add("foo", mObject);
    EXPECT_THAT(mHost.notices, IsEmpty());
}

TEST_F(Notifications, RefuseABadNameBeforeANullCallback) {
    EXPECT_EQ(mRegistry.registerForNotifications(kSystem, "", nullptr).exception,
              EX_ILLEGAL_ARGUMENT);
    EXPECT_EQ(mRegistry.registerForNotifications(kSystem, "a b", mCallback).exception,
              EX_ILLEGAL_ARGUMENT);
    EXPECT_EQ(mRegistry.registerForNotifications(kSystem, "foo", nullptr).exception,
              EX_NULL_POINTER);
}

TEST_F(Notifications, RefuseADeadOrLocalCallback) {
    mHost.dead.insert(mCallback);
    EXPECT_EQ(mRegistry.registerForNotifications(kSystem, "foo", mCallback).exception,
              EX_ILLEGAL_STATE);
    mHost.local.insert(mOther);
    EXPECT_EQ(mRegistry.registerForNotifications(kSystem, "foo", mOther).exception,
              EX_ILLEGAL_STATE);
    add("foo", mObject);
    EXPECT_THAT(mHost.notices, IsEmpty());
}

TEST_F(Notifications, AnUnknownCallbackCannotBeUnregistered) {
    EXPECT_EQ(mRegistry.unregisterForNotifications("foo", mCallback).exception, EX_ILLEGAL_STATE);
    mRegistry.registerForNotifications(kSystem, "foo", mCallback);
    EXPECT_EQ(mRegistry.unregisterForNotifications("foo", mOther).exception, EX_ILLEGAL_STATE);
    EXPECT_EQ(mRegistry.unregisterForNotifications("bar", mCallback).exception, EX_ILLEGAL_STATE);
}

TEST_F(Notifications, ACallbackMayWaitForSeveralNames) {
    mRegistry.registerForNotifications(kSystem, "foo", mCallback);
    mRegistry.registerForNotifications(kSystem, "bar", mCallback);
    EXPECT_EQ(mHost.watches[mCallback], 1);
    mRegistry.unregisterForNotifications("foo", mCallback);
    EXPECT_EQ(mHost.watches[mCallback], 1);
    add("bar", mObject);
    EXPECT_THAT(mHost.notices, ElementsAre(FakeHost::Notice{mCallback, "bar", mObject}));
}

TEST_F(Notifications, AreLimitedForEachUser) {
    for (int i = 0; i < 1000; ++i) {
        ASSERT_TRUE(mRegistry.registerForNotifications(kSystem, "foo", mCallback).ok()) << i;
    }
    const Verdict verdict = mRegistry.registerForNotifications(kSystem, "bar", mOther);
    EXPECT_EQ(verdict.exception, EX_ILLEGAL_STATE);
    EXPECT_EQ(verdict.reason, "the user has as many callbacks as one may have");
    EXPECT_EQ(mHost.watches[mOther], 0);
    EXPECT_TRUE(mRegistry.registerForNotifications({.pid = 1, .uid = 1001}, "bar", mOther).ok());
    mRegistry.objectDied(mCallback.get());
    EXPECT_TRUE(mRegistry.registerForNotifications(kSystem, "bar", mOther).ok());
}

using ClientCallback = ServiceRegistryTest;

TEST_F(ClientCallback, IsAcceptedFromTheProcessThatRegistered) {
    add("foo", mObject);
    EXPECT_TRUE(mRegistry.registerClientCallback(kSystem, "foo", mObject, mCallback).ok());
    EXPECT_EQ(mHost.watches[mCallback], 1);
}

TEST_F(ClientCallback, OfAnUnknownServiceIsAnIllegalArgument) {
    EXPECT_EQ(mRegistry.registerClientCallback(kSystem, "foo", mObject, mCallback).exception,
              EX_ILLEGAL_ARGUMENT);
}

TEST_F(ClientCallback, FromAnotherProcessIsUnsupportedWhateverTheBinder) {
    add("foo", mObject);
    EXPECT_EQ(mRegistry.registerClientCallback({.pid = 101, .uid = 1000}, "foo", mOther, mCallback)
                      .exception,
              EX_UNSUPPORTED_OPERATION);
}

TEST_F(ClientCallback, WithAnotherBinderIsAnIllegalArgument) {
    add("foo", mObject);
    EXPECT_EQ(mRegistry.registerClientCallback(kSystem, "foo", mOther, mCallback).exception,
              EX_ILLEGAL_ARGUMENT);
}

TEST_F(ClientCallback, ThatIsDeadIsAnIllegalState) {
    add("foo", mObject);
    mHost.dead.insert(mCallback);
    EXPECT_EQ(mRegistry.registerClientCallback(kSystem, "foo", mObject, mCallback).exception,
              EX_ILLEGAL_STATE);
}

using TryUnregister = ServiceRegistryTest;

TEST_F(TryUnregister, OfAnUnknownServiceIsAnIllegalState) {
    EXPECT_EQ(mRegistry.tryUnregisterService(kSystem, "foo", mObject).exception, EX_ILLEGAL_STATE);
}

TEST_F(TryUnregister, FromAnotherProcessIsUnsupportedWhateverTheBinder) {
    add("foo", mObject);
    EXPECT_EQ(mRegistry.tryUnregisterService({.pid = 101, .uid = 1000}, "foo", mOther).exception,
              EX_UNSUPPORTED_OPERATION);
}

TEST_F(TryUnregister, WithAnotherBinderIsAnIllegalState) {
    add("foo", mObject);
    const Verdict verdict = mRegistry.tryUnregisterService(kSystem, "foo", mOther);
    EXPECT_EQ(verdict.exception, EX_ILLEGAL_STATE);
    EXPECT_EQ(verdict.reason, "another binder is registered under this name");
}

TEST_F(TryUnregister, TakesTheNameAwayWhenNobodyElseHoldsTheService) {
    add("foo", mObject);
    mHost.holders[mObject] = 2;
    EXPECT_TRUE(mRegistry.tryUnregisterService(kSystem, "foo", mObject).ok());
    EXPECT_EQ(mRegistry.find(kSystem, "foo"), nullptr);
    EXPECT_EQ(mHost.watches[mObject], 0);
}

TEST_F(TryUnregister, IsRefusedWhileAClientMayHoldTheService) {
    add("foo", mObject);
    EXPECT_EQ(mRegistry.tryUnregisterService(kSystem, "foo", mObject).reason,
              "the service may have clients")
            << "the driver does not say";
    mHost.holders[mObject] = 3;
    EXPECT_EQ(mRegistry.tryUnregisterService(kSystem, "foo", mObject).exception, EX_ILLEGAL_STATE);
    mHost.holders[mObject] = 2;
    EXPECT_EQ(mRegistry.find(kSystem, "foo"), mObject) << "handed out";
    EXPECT_EQ(mRegistry.tryUnregisterService(kSystem, "foo", mObject).exception, EX_ILLEGAL_STATE);
    EXPECT_EQ(mRegistry.find(kSystem, "foo"), mObject);
}

TEST_F(TryUnregister, LeavesTheClientCallbackForTheServicesReturn) {
    add("foo", mObject);
    mRegistry.registerClientCallback(kSystem, "foo", mObject, mCallback);
    mHost.holders[mObject] = 2;
    EXPECT_TRUE(mRegistry.tryUnregisterService(kSystem, "foo", mObject).ok());
    add("foo", mObject);
    mRegistry.checkClients();
    EXPECT_THAT(mHost.clientNotices, ElementsAre(FakeHost::ClientNotice{mCallback, mObject, true}));
}

class Clients : public ServiceRegistryTest {
  protected:
    using Notice = FakeHost::ClientNotice;

    // What the callbacks are told by one count that finds this many holders.
    std::vector<Notice> count(uint32_t holders) {
        mHost.holders[mObject] = holders;
        mHost.clientNotices.clear();
        mRegistry.checkClients();
        return mHost.clientNotices;
    }
};

TEST_F(Clients, AreToldOfWhenTheFirstComesAndWhenTheLastGoes) {
    add("foo", mObject);
    mRegistry.registerClientCallback(kSystem, "foo", mObject, mCallback);
    EXPECT_THAT(count(1), IsEmpty());
    EXPECT_THAT(count(2), ElementsAre(Notice{mCallback, mObject, true}));
    EXPECT_THAT(count(3), IsEmpty());
    EXPECT_THAT(count(1), ElementsAre(Notice{mCallback, mObject, false}));
    EXPECT_THAT(count(1), IsEmpty());
}

TEST_F(Clients, ThatAreGoneBeforeTheNextCountAreToldOfAllTheSame) {
    add("foo", mObject);
    mRegistry.registerClientCallback(kSystem, "foo", mObject, mCallback);
    mRegistry.find(kSystem, "foo");
    EXPECT_THAT(count(1), ElementsAre(Notice{mCallback, mObject, true}));
    EXPECT_THAT(count(1), ElementsAre(Notice{mCallback, mObject, false}));
}

TEST_F(Clients, ThatWaitedForTheServiceCount) {
    mRegistry.registerForNotifications(kSystem, "foo", mOther);
    add("foo", mObject);
    mRegistry.registerClientCallback(kSystem, "foo", mObject, mCallback);
    EXPECT_THAT(count(1), ElementsAre(Notice{mCallback, mObject, true}));
}

TEST_F(Clients, AreToldOfAtOnceToACallbackThatComesLater) {
    add("foo", mObject);
    mRegistry.registerClientCallback(kSystem, "foo", mObject, mCallback);
    count(2);
    mHost.clientNotices.clear();
    mRegistry.registerClientCallback(kSystem, "foo", mObject, mOther);
    EXPECT_THAT(mHost.clientNotices, ElementsAre(Notice{mOther, mObject, true}));
}

TEST_F(Clients, AreNotToldOfWhereTheDriverDoesNotCount) {
    add("foo", mObject);
    mRegistry.registerClientCallback(kSystem, "foo", mObject, mCallback);
    mRegistry.find(kSystem, "foo");
    mRegistry.checkClients();
    EXPECT_THAT(mHost.clientNotices, IsEmpty());
}

TEST_F(Clients, AreCountedAsLongAsACallbackWaits) {
    EXPECT_FALSE(mRegistry.hasClientCallbacks());
    add("foo", mObject);
    mRegistry.registerClientCallback(kSystem, "foo", mObject, mCallback);
    EXPECT_TRUE(mRegistry.hasClientCallbacks());
    mRegistry.objectDied(mCallback.get());
    EXPECT_FALSE(mRegistry.hasClientCallbacks());
}

using DebugInfo = ServiceRegistryTest;

TEST_F(DebugInfo, GivesEachServiceWithTheProcessThatRegisteredIt) {
    add("foo", mObject, {.pid = 12, .uid = 0});
    add("bar", mObject, {.pid = 34, .uid = 0});
    const std::vector<ServiceDebugInfo> infos = mRegistry.debugInfo();
    ASSERT_EQ(infos.size(), 2u);
    EXPECT_EQ(infos[0].name, "bar");
    EXPECT_EQ(infos[0].pid, 34);
    EXPECT_EQ(infos[1].name, "foo");
    EXPECT_EQ(infos[1].pid, 12);
}

using ObjectDied = ServiceRegistryTest;

TEST_F(ObjectDied, TakesEveryNameOfTheObject) {
    add("foo", mObject);
    add("bar", mObject);
    add("other", mOther);
    EXPECT_THAT(mRegistry.objectDied(mObject.get()), ElementsAre("bar", "foo"));
    EXPECT_THAT(mRegistry.list(15), ElementsAre("other"));
    EXPECT_EQ(mObject.use_count(), 2) << "one here, one in the host's record";
}

TEST_F(ObjectDied, LeavesTheServiceThatReplacedIt) {
    add("foo", mObject);
    add("foo", mOther);
    EXPECT_THAT(mRegistry.objectDied(mObject.get()), IsEmpty());
    EXPECT_EQ(mRegistry.find(kSystem, "foo"), mOther);
}

TEST_F(ObjectDied, TakesCallbacksWithoutTellingAnyone) {
    mRegistry.registerForNotifications(kSystem, "foo", mCallback);
    mRegistry.registerForNotifications(kSystem, "foo", mOther);
    mRegistry.objectDied(mCallback.get());
    EXPECT_THAT(mHost.notices, IsEmpty());
    EXPECT_EQ(mRegistry.unregisterForNotifications("foo", mCallback).exception, EX_ILLEGAL_STATE);
    add("foo", mObject);
    EXPECT_THAT(mHost.notices, ElementsAre(FakeHost::Notice{mOther, "foo", mObject}));
}

TEST_F(ObjectDied, OfAnUnknownObjectChangesNothing) {
    add("foo", mObject);
    EXPECT_THAT(mRegistry.objectDied(mOther.get()), IsEmpty());
    EXPECT_EQ(mRegistry.find(kSystem, "foo"), mObject);
}

}  // namespace
}  // namespace servicemanager
