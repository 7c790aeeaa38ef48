// SPDX-License-Identifier: Apache-2.0
//
// Who may register what, who finds it, and what a death takes away.
#include "platform/servicemanager/tests/service_registry_test.h"

#include <gmock/gmock.h>

namespace servicemanager {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

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
