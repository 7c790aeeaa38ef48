// SPDX-License-Identifier: Apache-2.0
//
// Who is told of a registration, and of clients that come and go.
#include <gmock/gmock.h>

#include "platform/servicemanager/tests/service_registry_test.h"

namespace servicemanager {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

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

}  // namespace
}  // namespace servicemanager
