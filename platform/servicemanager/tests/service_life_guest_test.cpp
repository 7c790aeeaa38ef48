// SPDX-License-Identifier: Apache-2.0
//
// What becomes of a service and who is told of it, over the kernel's binder: registrations, lazy
// services, deaths.
#include <unistd.h>

#include <string>
#include <vector>

#include <android/binder_manager.h>
#include <gmock/gmock.h>

#include "platform/servicemanager/tests/service_manager_test.h"

namespace {

using namespace client;  // NOLINT(google-build-using-namespace)
using processes::as;
using processes::eventually;
using processes::Server;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::Not;

using Notifications = ServiceManagerTest;

TEST_F(Notifications, TellAtOnceAndAtEveryLaterRegistration) {
    as(kSystem, [] {
        RegistrationCallback callback;
        const ndk::SpAIBinder first = makeObject();
        const ndk::SpAIBinder second = makeObject();
        EXPECT_EQ(add("test.service", first), EX_NONE);
        EXPECT_EQ(notify(kRegisterForNotifications, "test.service", callback.binder), EX_NONE);
        EXPECT_TRUE(eventually([&] { return callback.calls == 1; }));
        EXPECT_EQ(callback.name, "test.service");
        EXPECT_EQ(callback.service.get(), first.get());
        EXPECT_EQ(add("test.service", second), EX_NONE);
        EXPECT_TRUE(eventually([&] { return callback.calls == 2; }));
        EXPECT_EQ(callback.service.get(), second.get());
    });
}

TEST_F(Notifications, StopWhenUnregistered) {
    as(kSystem, [] {
        RegistrationCallback stopped;
        RegistrationCallback witness;
        EXPECT_EQ(notify(kRegisterForNotifications, "test.service", stopped.binder), EX_NONE);
        EXPECT_EQ(notify(kRegisterForNotifications, "test.service", witness.binder), EX_NONE);
        EXPECT_EQ(notify(kUnregisterForNotifications, "test.service", stopped.binder), EX_NONE);
        EXPECT_EQ(notify(kUnregisterForNotifications, "test.service", stopped.binder),
                  EX_ILLEGAL_STATE);
        EXPECT_EQ(add("test.service", makeObject()), EX_NONE);
        EXPECT_TRUE(eventually([&] { return witness.calls == 1; }));
        EXPECT_EQ(stopped.calls, 0);
    });
}

TEST_F(Notifications, RefuseBadNamesNullsAndTheManagerItself) {
    as(kSystem, [] {
        RegistrationCallback callback;
        EXPECT_EQ(notify(kRegisterForNotifications, "a b", callback.binder), EX_ILLEGAL_ARGUMENT);
        EXPECT_EQ(notify(kRegisterForNotifications, "test.service", nullptr), EX_NULL_POINTER);
        EXPECT_EQ(notify(kUnregisterForNotifications, "test.service", nullptr), EX_NULL_POINTER);
        EXPECT_EQ(notify(kUnregisterForNotifications, "test.service", callback.binder),
                  EX_ILLEGAL_STATE);
        EXPECT_EQ(notify(kRegisterForNotifications, "test.service", manager()), EX_ILLEGAL_STATE);
    });
}

TEST_F(Notifications, AnObjectOfAnotherInterfaceIsAcceptedAndHarmless) {
    as(kSystem, [] {
        const ndk::SpAIBinder object = makeObject();
        EXPECT_EQ(notify(kRegisterForNotifications, "test.service", object), EX_NONE);
        // Told after the other, so that nothing is left unread when it has been told.
        RegistrationCallback witness;
        EXPECT_EQ(notify(kRegisterForNotifications, "test.service", witness.binder), EX_NONE);
        EXPECT_EQ(add("test.service", object), EX_NONE);
        EXPECT_TRUE(eventually([&] { return witness.calls == 1; }));
        EXPECT_EQ(notify(kUnregisterForNotifications, "test.service", object), EX_NONE);
    });
    EXPECT_TRUE(mManager.answers());
}

TEST_F(Notifications, OfADeadClientAreForgotten) {
    {
        const Server client(kSystem, [] {
            static RegistrationCallback callback;
            EXPECT_EQ(notify(kRegisterForNotifications, "test.service", callback.binder), EX_NONE);
        });
    }
    as(kSystem, [] { EXPECT_EQ(add("test.service", makeObject()), EX_NONE); });
    EXPECT_TRUE(mManager.answers());
}

using LazyServices = ServiceManagerTest;

TEST_F(LazyServices, MayAskAboutTheirOwnClientsOnly) {
    const Server server(kSystem, [] { EXPECT_EQ(add("test.other", makeObject()), EX_NONE); });
    as(kSystem, [] {
        const ndk::SpAIBinder object = makeObject();
        const ndk::SpAIBinder callback = makeObject();
        EXPECT_EQ(add("test.own", object), EX_NONE);
        EXPECT_EQ(registerClientCallback("test.own", object, callback), EX_NONE);
        EXPECT_EQ(registerClientCallback("test.own", callback, callback), EX_ILLEGAL_ARGUMENT);
        EXPECT_EQ(registerClientCallback("test.none", object, callback), EX_ILLEGAL_ARGUMENT);
        EXPECT_EQ(registerClientCallback("test.other", object, callback), EX_UNSUPPORTED_OPERATION);
        EXPECT_EQ(registerClientCallback("test.own", object, manager()), EX_ILLEGAL_STATE);
        EXPECT_EQ(registerClientCallback("test.own", nullptr, callback), EX_NULL_POINTER);
        EXPECT_EQ(registerClientCallback("test.own", object, nullptr), EX_NULL_POINTER);
    });
}

TEST_F(LazyServices, MayTakeTheirOwnNameAwayOnly) {
    const Server server(kSystem, [] { EXPECT_EQ(add("test.other", makeObject()), EX_NONE); });
    as(kSystem, [] {
        const ndk::SpAIBinder object = makeObject();
        EXPECT_EQ(add("test.own", object), EX_NONE);
        EXPECT_EQ(tryUnregister("test.own", makeObject()), EX_ILLEGAL_STATE);
        EXPECT_EQ(tryUnregister("test.none", object), EX_ILLEGAL_STATE);
        EXPECT_EQ(tryUnregister("test.other", object), EX_UNSUPPORTED_OPERATION);
        EXPECT_EQ(tryUnregister("test.own", nullptr), EX_NULL_POINTER);
        EXPECT_EQ(tryUnregister("test.own", object), EX_NONE);
        EXPECT_EQ(AServiceManager_checkService("test.own"), nullptr);
    });
}

TEST_F(LazyServices, MayNotLeaveWhileClientsMayBeThere) {
    as(kSystem, [] {
        const ndk::SpAIBinder object = makeObject();
        EXPECT_EQ(add("test.own", object), EX_NONE);
        const ndk::SpAIBinder found(AServiceManager_checkService("test.own"));
        EXPECT_EQ(tryUnregister("test.own", object), EX_ILLEGAL_STATE);
    });
}

// What a lazy service does: it leaves, name first, when its last client has gone.
void serveLazily() {
    static const ndk::SpAIBinder object = makeObject();
    static const ClientCallback callback([](bool hasClients) {
        if (!hasClients && tryUnregister("test.lazy", object) == EX_NONE) _exit(0);
    });
    EXPECT_EQ(add("test.lazy", object), EX_NONE);
    EXPECT_EQ(registerClientCallback("test.lazy", object, callback.binder), EX_NONE);
}

TEST_F(LazyServices, StayForAClientLeaveAfterItAndComeAgain) {
    for (int round = 0; round < 2; ++round) {
        SCOPED_TRACE(round);
        Server service(kSystem, serveLazily);
        as(kApp, [] {
            const ndk::SpAIBinder found(AServiceManager_checkService("test.lazy"));
            // Clients are counted every five seconds; the second count is the first that tells.
            sleep(11);
            EXPECT_EQ(AIBinder_ping(found.get()), STATUS_OK);
        });
        EXPECT_TRUE(eventually([&service] { return service.hasEnded(); }));
        as(kApp, [] { EXPECT_EQ(AServiceManager_checkService("test.lazy"), nullptr); });
    }
}

using DebugInfos = ServiceManagerTest;

TEST_F(DebugInfos, NameTheProcessThatRegistered) {
    const Server server(kSystem, [] { EXPECT_EQ(add("test.service", makeObject()), EX_NONE); });
    as(kSystem, [&server] {
        std::vector<DebugInfo> infos;
        EXPECT_EQ(debugInfo(infos), EX_NONE);
        ASSERT_EQ(infos.size(), 2u);
        EXPECT_EQ(infos[0].name, "manager");
        EXPECT_EQ(infos[1].name, "test.service");
        EXPECT_EQ(infos[1].pid, server.pid());
    });
}

using Death = ServiceManagerTest;

TEST_F(Death, OfAServiceTakesAllItsNames) {
    Server server(kRoot, [] {
        const ndk::SpAIBinder object = makeObject();
        EXPECT_EQ(add("test.one", object), EX_NONE);
        EXPECT_EQ(add("test.two", object), EX_NONE);
    });
    as(kApp, [] {
        std::vector<std::string> names;
        EXPECT_EQ(list(15, names), EX_NONE);
        EXPECT_THAT(names, ElementsAre("manager", "test.one", "test.two"));
    });
    server.kill();
    as(kApp, [] {
        EXPECT_TRUE(eventually([] {
            std::vector<std::string> names;
            EXPECT_EQ(list(15, names), EX_NONE);
            return names == std::vector<std::string>{"manager"};
        }));
    });
    EXPECT_THAT(mManager.log(), HasSubstr("\"test.one\" is gone: its process has died\n"));
}

TEST_F(Death, OfAReplacedServiceLeavesItsSuccessor) {
    Server first(kSystem, [] { EXPECT_EQ(add("test.service", makeObject()), EX_NONE); });
    const Server second(kSystem, [] { EXPECT_EQ(add("test.service", makeObject()), EX_NONE); });
    first.kill();
    as(kSystem, [] {
        // A second name that dies with its process marks the moment when notices have come.
        const ndk::SpAIBinder found(AServiceManager_checkService("test.service"));
        EXPECT_NE(found.get(), nullptr);
        EXPECT_EQ(AIBinder_ping(found.get()), STATUS_OK);
    });
    EXPECT_THAT(mManager.log(), Not(HasSubstr("is gone")));
}

TEST_F(Death, OfManyClientsInARowHarmsNothing) {
    for (int i = 0; i < 50; ++i) {
        as(kSystem, [] { EXPECT_EQ(add("test.service", makeObject()), EX_NONE); });
    }
    as(kSystem, [] {
        EXPECT_TRUE(
                eventually([] { return AServiceManager_checkService("test.service") == nullptr; }));
    });
    EXPECT_TRUE(mManager.answers());
}

}  // namespace
