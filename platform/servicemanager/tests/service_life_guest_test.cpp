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
using processes::serve;
using qvx::test::eventually;
using qvx::test::inProcess;
using qvx::test::Process;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::Not;

constexpr auto kRegister = &IServiceManager::registerForNotifications;
constexpr auto kUnregister = &IServiceManager::unregisterForNotifications;
constexpr auto kWatchClients = &IServiceManager::registerClientCallback;
constexpr auto kLeave = &IServiceManager::tryUnregisterService;

using Notifications = ServiceManagerTest;

TEST_F(Notifications, TellAtOnceAndAtEveryLaterRegistration) {
    inProcess(kSystem, [] {
        const auto callback = ndk::SharedRefBase::make<RegistrationCallback>();
        const ndk::SpAIBinder first = makeObject();
        const ndk::SpAIBinder second = makeObject();
        EXPECT_EQ(add("test.service", first), EX_NONE);
        EXPECT_EQ(ask(kRegister, "test.service", callback), EX_NONE);
        EXPECT_TRUE(eventually([&] { return callback->calls == 1; }));
        EXPECT_EQ(callback->name, "test.service");
        EXPECT_EQ(callback->service.get(), first.get());
        EXPECT_EQ(add("test.service", second), EX_NONE);
        EXPECT_TRUE(eventually([&] { return callback->calls == 2; }));
        EXPECT_EQ(callback->service.get(), second.get());
    });
}

TEST_F(Notifications, StopWhenUnregistered) {
    inProcess(kSystem, [] {
        const auto stopped = ndk::SharedRefBase::make<RegistrationCallback>();
        const auto witness = ndk::SharedRefBase::make<RegistrationCallback>();
        EXPECT_EQ(ask(kRegister, "test.service", stopped), EX_NONE);
        EXPECT_EQ(ask(kRegister, "test.service", witness), EX_NONE);
        EXPECT_EQ(ask(kUnregister, "test.service", stopped), EX_NONE);
        EXPECT_EQ(ask(kUnregister, "test.service", stopped), EX_ILLEGAL_STATE);
        EXPECT_EQ(add("test.service", makeObject()), EX_NONE);
        EXPECT_TRUE(eventually([&] { return witness->calls == 1; }));
        EXPECT_EQ(stopped->calls, 0);
    });
}

TEST_F(Notifications, RefuseBadNamesNullsAndTheManagerItself) {
    inProcess(kSystem, [] {
        const auto callback = ndk::SharedRefBase::make<RegistrationCallback>();
        EXPECT_EQ(ask(kRegister, "a b", callback), EX_ILLEGAL_ARGUMENT);
        EXPECT_EQ(ask(kRegister, "test.service", nullptr), EX_NULL_POINTER);
        EXPECT_EQ(ask(kUnregister, "test.service", nullptr), EX_NULL_POINTER);
        EXPECT_EQ(ask(kUnregister, "test.service", callback), EX_ILLEGAL_STATE);
        EXPECT_EQ(ask(kRegister, "test.service", asServiceCallback(manager()->asBinder())),
                  EX_ILLEGAL_STATE);
    });
}

TEST_F(Notifications, AnObjectOfAnotherInterfaceIsAcceptedAndHarmless) {
    inProcess(kSystem, [] {
        const ndk::SpAIBinder object = makeObject();
        EXPECT_EQ(ask(kRegister, "test.service", asServiceCallback(object)), EX_NONE);
        // Told after the other, so that nothing is left unread when it has been told.
        const auto witness = ndk::SharedRefBase::make<RegistrationCallback>();
        EXPECT_EQ(ask(kRegister, "test.service", witness), EX_NONE);
        EXPECT_EQ(add("test.service", object), EX_NONE);
        EXPECT_TRUE(eventually([&] { return witness->calls == 1; }));
        EXPECT_EQ(ask(kUnregister, "test.service", asServiceCallback(object)), EX_NONE);
    });
    EXPECT_TRUE(mManager.answers());
}

TEST_F(Notifications, OfADeadClientAreForgotten) {
    {
        const Process client = serve(kSystem, [] {
            static const auto callback = ndk::SharedRefBase::make<RegistrationCallback>();
            EXPECT_EQ(ask(kRegister, "test.service", callback), EX_NONE);
        });
    }
    inProcess(kSystem, [] { EXPECT_EQ(add("test.service", makeObject()), EX_NONE); });
    EXPECT_TRUE(mManager.answers());
}

using LazyServices = ServiceManagerTest;

TEST_F(LazyServices, MayAskAboutTheirOwnClientsOnly) {
    const Process server =
            serve(kSystem, [] { EXPECT_EQ(add("test.other", makeObject()), EX_NONE); });
    inProcess(kSystem, [] {
        const ndk::SpAIBinder object = makeObject();
        const ndk::SpAIBinder other = makeObject();
        const auto callback = asClientCallback(other);
        EXPECT_EQ(add("test.own", object), EX_NONE);
        EXPECT_EQ(ask(kWatchClients, "test.own", object, callback), EX_NONE);
        EXPECT_EQ(ask(kWatchClients, "test.own", other, callback), EX_ILLEGAL_ARGUMENT);
        EXPECT_EQ(ask(kWatchClients, "test.none", object, callback), EX_ILLEGAL_ARGUMENT);
        EXPECT_EQ(ask(kWatchClients, "test.other", object, callback), EX_UNSUPPORTED_OPERATION);
        EXPECT_EQ(ask(kWatchClients, "test.own", object, asClientCallback(manager()->asBinder())),
                  EX_ILLEGAL_STATE);
        EXPECT_EQ(ask(kWatchClients, "test.own", object, nullptr), EX_NULL_POINTER);
    });
}

TEST_F(LazyServices, MayTakeTheirOwnNameAwayOnly) {
    const Process server =
            serve(kSystem, [] { EXPECT_EQ(add("test.other", makeObject()), EX_NONE); });
    inProcess(kSystem, [] {
        const ndk::SpAIBinder object = makeObject();
        EXPECT_EQ(add("test.own", object), EX_NONE);
        EXPECT_EQ(ask(kLeave, "test.own", makeObject()), EX_ILLEGAL_STATE);
        EXPECT_EQ(ask(kLeave, "test.none", object), EX_ILLEGAL_STATE);
        EXPECT_EQ(ask(kLeave, "test.other", object), EX_UNSUPPORTED_OPERATION);
        EXPECT_EQ(ask(kLeave, "test.own", object), EX_NONE);
        EXPECT_EQ(AServiceManager_checkService("test.own"), nullptr);
    });
}

TEST_F(LazyServices, MayNotLeaveWhileClientsMayBeThere) {
    inProcess(kSystem, [] {
        const ndk::SpAIBinder object = makeObject();
        EXPECT_EQ(add("test.own", object), EX_NONE);
        const ndk::SpAIBinder found(AServiceManager_checkService("test.own"));
        EXPECT_EQ(ask(kLeave, "test.own", object), EX_ILLEGAL_STATE);
    });
}

// What a lazy service does: it leaves, name first, when its last client has gone.
void serveLazily() {
    static const ndk::SpAIBinder object = makeObject();
    static const auto callback = ndk::SharedRefBase::make<ClientCallback>([](bool hasClients) {
        if (!hasClients && ask(kLeave, "test.lazy", object) == EX_NONE) _exit(0);
    });
    EXPECT_EQ(add("test.lazy", object), EX_NONE);
    EXPECT_EQ(ask(kWatchClients, "test.lazy", object, callback), EX_NONE);
}

TEST_F(LazyServices, StayForAClientLeaveAfterItAndComeAgain) {
    for (int round = 0; round < 2; ++round) {
        SCOPED_TRACE(round);
        Process service = serve(kSystem, serveLazily);
        inProcess(kApp, [] {
            const ndk::SpAIBinder found(AServiceManager_checkService("test.lazy"));
            // Clients are counted every five seconds; the second count is the first that tells.
            sleep(11);
            EXPECT_EQ(AIBinder_ping(found.get()), STATUS_OK);
        });
        EXPECT_TRUE(eventually([&service] { return service.hasEnded(); }));
        inProcess(kApp, [] { EXPECT_EQ(AServiceManager_checkService("test.lazy"), nullptr); });
    }
}

using DebugInfos = ServiceManagerTest;

TEST_F(DebugInfos, NameTheProcessThatRegistered) {
    const Process server =
            serve(kSystem, [] { EXPECT_EQ(add("test.service", makeObject()), EX_NONE); });
    inProcess(kSystem, [&server] {
        std::vector<ServiceDebugInfo> infos;
        EXPECT_EQ(ask(&IServiceManager::getServiceDebugInfo, &infos), EX_NONE);
        ASSERT_EQ(infos.size(), 2u);
        EXPECT_EQ(infos[0].name, "manager");
        EXPECT_EQ(infos[1].name, "test.service");
        EXPECT_EQ(infos[1].debugPid, server.pid());
    });
}

using Death = ServiceManagerTest;

TEST_F(Death, OfAServiceTakesAllItsNames) {
    Process server = serve(kRoot, [] {
        const ndk::SpAIBinder object = makeObject();
        EXPECT_EQ(add("test.one", object), EX_NONE);
        EXPECT_EQ(add("test.two", object), EX_NONE);
    });
    inProcess(kApp, [] {
        std::vector<std::string> names;
        EXPECT_EQ(ask(&IServiceManager::listServices, 15, &names), EX_NONE);
        EXPECT_THAT(names, ElementsAre("manager", "test.one", "test.two"));
    });
    server.kill();
    inProcess(kApp, [] {
        EXPECT_TRUE(eventually([] {
            std::vector<std::string> names;
            EXPECT_EQ(ask(&IServiceManager::listServices, 15, &names), EX_NONE);
            return names == std::vector<std::string>{"manager"};
        }));
    });
    EXPECT_THAT(mManager.log(), HasSubstr("\"test.one\" is gone: its process has died\n"));
}

TEST_F(Death, OfAReplacedServiceLeavesItsSuccessor) {
    Process first = serve(kSystem, [] { EXPECT_EQ(add("test.service", makeObject()), EX_NONE); });
    const Process second =
            serve(kSystem, [] { EXPECT_EQ(add("test.service", makeObject()), EX_NONE); });
    first.kill();
    inProcess(kSystem, [] {
        // A second name that dies with its process marks the moment when notices have come.
        const ndk::SpAIBinder found(AServiceManager_checkService("test.service"));
        EXPECT_NE(found.get(), nullptr);
        EXPECT_EQ(AIBinder_ping(found.get()), STATUS_OK);
    });
    EXPECT_THAT(mManager.log(), Not(HasSubstr("is gone")));
}

TEST_F(Death, OfManyClientsInARowHarmsNothing) {
    for (int i = 0; i < 50; ++i) {
        inProcess(kSystem, [] { EXPECT_EQ(add("test.service", makeObject()), EX_NONE); });
    }
    inProcess(kSystem, [] {
        EXPECT_TRUE(
                eventually([] { return AServiceManager_checkService("test.service") == nullptr; }));
    });
    EXPECT_TRUE(mManager.answers());
}

}  // namespace
