// SPDX-License-Identifier: Apache-2.0
//
// What becomes of a service and who is told of it, over the kernel's binder: registrations, lazy
// services, deaths.
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <string>
#include <vector>

#include <android/binder_manager.h>
#include <android/binder_process.h>
#include <gmock/gmock.h>

#include "handset/common/raw_binder.h"
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

// The process that has registered a name; 0 when none has. Asking is no use of the service.
pid_t registrantOf(const std::string& name) {
    std::vector<ServiceDebugInfo> infos;
    EXPECT_EQ(ask(&IServiceManager::getServiceDebugInfo, &infos), EX_NONE);
    for (const ServiceDebugInfo& info : infos) {
        if (info.name == name) return info.debugPid;
    }
    return 0;
}

TEST_F(LazyServices, AreStartedForAClientLeaveAfterItAndComeAgain) {
    for (int round = 0; round < 2; ++round) {
        SCOPED_TRACE(round);
        inProcess(kApp, [] {
            ABinderProcess_startThreadPool();  // to be told on
            const ndk::SpAIBinder found(AServiceManager_waitForService("test.lazy"));
            ASSERT_NE(found.get(), nullptr);
            struct stat process {};
            const std::string path = "/proc/" + std::to_string(registrantOf("test.lazy"));
            EXPECT_EQ(stat(path.c_str(), &process), 0);
            EXPECT_EQ(process.st_uid, kSystem);
            // Clients are counted every five seconds; the second count is the first that tells.
            sleep(11);
            EXPECT_EQ(AIBinder_ping(found.get()), STATUS_OK);
        });
        inProcess(kApp, [] {
            const pid_t service = registrantOf("test.lazy");
            EXPECT_NE(service, 0);
            EXPECT_TRUE(eventually([] { return registrantOf("test.lazy") == 0; }));
            EXPECT_TRUE(eventually([service] { return kill(service, 0) != 0 && errno == ESRCH; }));
        });
    }
}

TEST_F(LazyServices, AreStartedByAskingForThemWithGetServiceAlone) {
    const auto isStarted = [this](const char* name) {
        return mManager.log().find(std::string("\"") + name + "\" is started for pid ") !=
               std::string::npos;
    };
    ndk::SpAIBinder found;
    inProcess(kApp, [&] {
        EXPECT_EQ(ask(&IServiceManager::checkService, "test.never", &found), EX_NONE);
        EXPECT_EQ(ask(&IServiceManager::getService, "test.own", &found), EX_NONE);
    });
    inProcess(kIsolated, [] {
        // It may not find the manager's own object, but its handle.
        const handset::RawReply reply = handset::RawBinder().transact(
                0, IServiceManager::TRANSACTION_getService,
                handset::RequestBytes().token("android.os.IServiceManager").string16("test.never"));
        EXPECT_EQ(reply.words()[0], 0u) << "no exception";
    });
    EXPECT_FALSE(isStarted("test.never"));
    EXPECT_FALSE(isStarted("test.own")) << "no rule has a program for it";
    // However often: one process.
    inProcess(kApp, [&] {
        for (int i = 0; i < 100; ++i) {
            EXPECT_EQ(ask(&IServiceManager::getService, "test.never", &found), EX_NONE);
            EXPECT_EQ(found.get(), nullptr);
        }
    });
    EXPECT_TRUE(isStarted("test.never"));
    const std::string failure =
            "cannot run /no/such/program as user 1000: No such file or directory";
    EXPECT_TRUE(eventually([&] { return mManager.log().find(failure) != std::string::npos; }));
    EXPECT_EQ(mManager.log().find(failure), mManager.log().rfind(failure));
    EXPECT_TRUE(mManager.answers());
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
