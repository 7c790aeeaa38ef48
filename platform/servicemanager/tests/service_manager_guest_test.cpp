// SPDX-License-Identifier: Apache-2.0
//
// The service manager over the kernel's binder: every method with every rule, asked by clients of
// several users through the library.
#include <string>
#include <vector>

#include <android/binder_manager.h>
#include <gmock/gmock.h>

#include "handset/common/raw_binder.h"
#include "platform/servicemanager/tests/service_manager_test.h"
#include "tests/support/kernel_log.h"

namespace {

using namespace client;  // NOLINT(google-build-using-namespace)
using processes::serve;
using qvx::test::eventually;
using qvx::test::inProcess;
using qvx::test::Process;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

constexpr const char* kVibrator = "android.hardware.vibrator.IVibrator/default";

// The service of an ended process has left its name free.
void awaitFree(const char* name) {
    EXPECT_TRUE(eventually([name] { return AServiceManager_checkService(name) == nullptr; }));
}

using ContextManager = ServiceManagerTest;

TEST_F(ContextManager, RegistersItself) {
    inProcess(kSystem, [] {
        const ndk::SpAIBinder found(AServiceManager_checkService("manager"));
        EXPECT_NE(found.get(), nullptr);
        EXPECT_TRUE(AIBinder_isRemote(found.get()));
    });
}

TEST_F(ContextManager, ASecondOneSaysWhyAndEndsWithStatus1) {
    const qvx::test::ExpectBinderComplaints expected;
    std::string output;
    EXPECT_EQ(processes::runManager(kRoot, output), 1);
    EXPECT_THAT(output, HasSubstr("servicemanager: cannot become the context manager: "
                                  "another service manager is running\n"));
    EXPECT_TRUE(mManager.answers());
}

TEST(AnotherUsersContextManager, SaysWhyAndEndsWithStatus1) {
    {
        const qvx::test::FakeRoot root;
        const processes::Manager first(root.path());
    }
    const qvx::test::ExpectBinderComplaints expected;
    std::string output;
    EXPECT_EQ(processes::runManager(kSystem, output), 1);
    EXPECT_THAT(output, HasSubstr("servicemanager: cannot become the context manager: "
                                  "only the user who ran the first one may\n"));
}

using AddService = ServiceManagerTest;

TEST_F(AddService, IsOpenToRootAndToTheUsersOfARule) {
    for (const uid_t uid : {kRoot, kSystem, uid_t{2000}, uid_t{9999}, uid_t{101000}}) {
        inProcess(uid, [] {
            awaitFree("test.service");
            const ndk::SpAIBinder object = makeObject();
            EXPECT_EQ(AServiceManager_addService(object.get(), "test.service"), EX_NONE);
            const ndk::SpAIBinder found(AServiceManager_checkService("test.service"));
            EXPECT_EQ(found.get(), object.get());
        });
    }
}

TEST_F(AddService, IsClosedToUsersWithoutARule) {
    inProcess(kSystem, [] { EXPECT_EQ(add("test.unruly", makeObject()), EX_SECURITY); });
    inProcess(1001, [] { EXPECT_EQ(add("test.service", makeObject()), EX_SECURITY); });
    EXPECT_THAT(mManager.log(),
                HasSubstr(", uid 1001: no rule lets this user register the name\n"));
}

// With a rule, without one and as root: whoever asks for the name gets the first service's process.
TEST_F(AddService, OfAnotherUserNeverReplacesALivingVibrator) {
    const Process vibrator =
            serve(kSystem, [] { EXPECT_EQ(add(kVibrator, makeObject()), EX_NONE); });
    for (const uid_t uid : {uid_t{1001}, uid_t{1002}, kRoot}) {
        inProcess(uid, [] { EXPECT_EQ(add(kVibrator, makeObject()), EX_SECURITY); });
    }
    inProcess(kApp, [&vibrator] {
        const ndk::SpAIBinder found(AServiceManager_checkService(kVibrator));
        EXPECT_EQ(AIBinder_ping(found.get()), STATUS_OK);
        std::vector<ServiceDebugInfo> infos;
        EXPECT_EQ(ask(&IServiceManager::getServiceDebugInfo, &infos), EX_NONE);
        ASSERT_EQ(infos.size(), 2u);
        EXPECT_EQ(infos[0].name, kVibrator);
        EXPECT_EQ(infos[0].debugPid, vibrator.pid());
    });
}

TEST_F(AddService, IsClosedToApps) {
    for (const uid_t uid : {uid_t{10000}, kApp, uid_t{65534}, kIsolated, uid_t{110000}}) {
        inProcess(uid, [] {
            EXPECT_EQ(AServiceManager_addService(makeObject().get(), "test.service"), EX_SECURITY);
        });
    }
    EXPECT_THAT(mManager.log(), HasSubstr("servicemanager: addService \"test.service\" refused to "
                                          "pid "));
    EXPECT_THAT(mManager.log(), HasSubstr(", uid 10123: apps may not register services\n"));
}

TEST_F(AddService, RefusesBadNames) {
    inProcess(kRoot, [] {
        const ndk::SpAIBinder object = makeObject();
        EXPECT_EQ(add("", object), EX_ILLEGAL_ARGUMENT);
        EXPECT_EQ(add("a b", object), EX_ILLEGAL_ARGUMENT);
        EXPECT_EQ(add("caf\xc3\xa9", object), EX_ILLEGAL_ARGUMENT);
        EXPECT_EQ(add(std::string("a\0b", 3), object), EX_ILLEGAL_ARGUMENT);
        EXPECT_EQ(add(std::string(128, 'a'), object), EX_ILLEGAL_ARGUMENT);
        EXPECT_EQ(add(std::string(127, 'a'), object), EX_NONE);
        EXPECT_EQ(add("a-Z_0.9/x", object), EX_NONE);
    });
}

TEST_F(AddService, ShowsAHostileNameOnOneLineOfTheLog) {
    inProcess(kRoot, [] { EXPECT_EQ(add("a\nb", makeObject()), EX_ILLEGAL_ARGUMENT); });
    EXPECT_THAT(mManager.log(), HasSubstr("addService \"a\\nb\" refused to pid "));
}

TEST_F(AddService, AnswersANullBinderWithNullPointer) {
    for (const auto& [uid, name] : {std::pair(kSystem, "test.service"), std::pair(kApp, "")}) {
        inProcess(uid, [name = name] {
            const handset::RawReply reply =
                    handset::RawBinder().transact(0, IServiceManager::TRANSACTION_addService,
                                                  handset::RequestBytes()
                                                          .token("android.os.IServiceManager")
                                                          .string16(name)
                                                          .nullBinder()
                                                          .word(0)
                                                          .word(8));
            EXPECT_THAT(reply.words(), ElementsAre(0xfffffffc, 0, 0, 0)) << "EX_NULL_POINTER";
        });
    }
}

constexpr const char* kManifest =
        "<manifest version=\"1.0\" type=\"device\"><hal format=\"aidl\"><name>test.pack</name>"
        "<fqname>IFoo/default</fqname><fqname>IFoo/another</fqname></hal>"
        "<hal format=\"aidl\" updatable-via-apex=\"com.test\"><name>test.pack</name>"
        "<fqname>IBar/default</fqname></hal></manifest>";

TEST_F(AddService, WantsAVintfObjectDeclared) {
    inProcess(kSystem, [] {
        EXPECT_EQ(add("test.pack.IFoo/default", makeVintfObject()), EX_ILLEGAL_ARGUMENT);
        EXPECT_EQ(add("test.pack.IFoo/default", makeObject()), EX_NONE);
    });
    EXPECT_THAT(mManager.log(), HasSubstr("a VINTF-stable service must be declared in a manifest"));
    mRoot.put("/vendor/etc/vintf/manifest/test.xml", kManifest);
    inProcess(kSystem, [] {
        EXPECT_EQ(add("test.pack.IFoo/default", makeVintfObject()), EX_NONE);
        EXPECT_EQ(add("test.pack.IFoo/other", makeVintfObject()), EX_ILLEGAL_ARGUMENT);
    });
}

TEST_F(AddService, NamesAFaultyManifestInTheLog) {
    mRoot.put("/vendor/etc/vintf/manifest/test.xml", "<manifest");
    inProcess(kSystem, [] {
        EXPECT_EQ(add("test.pack.IFoo/default", makeVintfObject()), EX_ILLEGAL_ARGUMENT);
    });
    EXPECT_THAT(mManager.log(), HasSubstr("servicemanager: manifest " +
                                          mRoot.at("/vendor/etc/vintf/manifest/test.xml") +
                                          " is passed over: line 1: "));
}

TEST_F(AddService, ReplacesAnOlderOneOfTheName) {
    inProcess(kSystem, [] {
        const ndk::SpAIBinder first = makeObject();
        const ndk::SpAIBinder second = makeObject();
        EXPECT_EQ(add("test.service", first), EX_NONE);
        EXPECT_EQ(add("test.service", second), EX_NONE);
        const ndk::SpAIBinder found(AServiceManager_checkService("test.service"));
        EXPECT_EQ(found.get(), second.get());
    });
}

using FindService = ServiceManagerTest;

TEST_F(FindService, AnUnknownNameIsNullInAnOkReplyAtOnce) {
    inProcess(kApp, [] {
        for (const auto method : {&IServiceManager::getService, &IServiceManager::checkService}) {
            ndk::SpAIBinder found;
            EXPECT_EQ(ask(method, "test.unknown", &found), EX_NONE);
            EXPECT_EQ(found.get(), nullptr);
            EXPECT_EQ(ask(method, "", &found), EX_NONE);
            EXPECT_EQ(found.get(), nullptr);
        }
    });
}

TEST_F(FindService, IsOpenToAppsAndLimitedForIsolatedOnes) {
    const Process server = serve(kRoot, [] {
        EXPECT_EQ(add("test.closed", makeObject(), false), EX_NONE);
        EXPECT_EQ(add("test.open", makeObject(), true), EX_NONE);
    });
    for (const auto method : {&IServiceManager::getService, &IServiceManager::checkService}) {
        inProcess(kApp, [method] {
            ndk::SpAIBinder found;
            EXPECT_EQ(ask(method, "test.closed", &found), EX_NONE);
            EXPECT_NE(found.get(), nullptr);
        });
    }
    inProcess(kIsolated, [] {
        EXPECT_EQ(AServiceManager_checkService("test.closed"), nullptr);
        EXPECT_EQ(AServiceManager_checkService("manager"), nullptr);
        const ndk::SpAIBinder found(AServiceManager_checkService("test.open"));
        EXPECT_NE(found.get(), nullptr);
    });
}

using ListServices = ServiceManagerTest;

TEST_F(ListServices, GivesNamesInByteOrderWhosePriorityMatches) {
    inProcess(kRoot, [] {
        const ndk::SpAIBinder object = makeObject();
        EXPECT_EQ(add("b", object, false, 1), EX_NONE);
        EXPECT_EQ(add("a", object, false, 2), EX_NONE);
        EXPECT_EQ(add("B", object, false, 8), EX_NONE);
        std::vector<std::string> names;
        EXPECT_EQ(ask(&IServiceManager::listServices, 15, &names), EX_NONE);
        EXPECT_THAT(names, ElementsAre("B", "a", "b", "manager"));
        EXPECT_EQ(ask(&IServiceManager::listServices, 3, &names), EX_NONE);
        EXPECT_THAT(names, ElementsAre("a", "b"));
        EXPECT_EQ(ask(&IServiceManager::listServices, 16, &names), EX_NONE);
        EXPECT_THAT(names, IsEmpty());
    });
}

using Declarations = ServiceManagerTest;

TEST_F(Declarations, ComeFromTheManifests) {
    mRoot.put("/odm/etc/vintf/manifest.xml", kManifest);
    inProcess(kApp, [] {
        bool declared = false;
        EXPECT_EQ(ask(&IServiceManager::isDeclared, "test.pack.IFoo/default", &declared), EX_NONE);
        EXPECT_TRUE(declared);
        EXPECT_EQ(ask(&IServiceManager::isDeclared, "test.pack.IFoo/other", &declared), EX_NONE);
        EXPECT_FALSE(declared);
        EXPECT_EQ(ask(&IServiceManager::isDeclared, "manager", &declared), EX_NONE);
        EXPECT_FALSE(declared);
        EXPECT_TRUE(AServiceManager_isDeclared("test.pack.IBar/default"));

        std::vector<std::string> instances;
        EXPECT_EQ(ask(&IServiceManager::getDeclaredInstances, "test.pack.IFoo", &instances),
                  EX_NONE);
        EXPECT_THAT(instances, ElementsAre("another", "default"));
        EXPECT_EQ(ask(&IServiceManager::getDeclaredInstances, "test.pack.INone", &instances),
                  EX_NONE);
        EXPECT_THAT(instances, IsEmpty());

        std::optional<std::string> apex;
        EXPECT_EQ(ask(&IServiceManager::updatableViaApex, "test.pack.IBar/default", &apex),
                  EX_NONE);
        EXPECT_EQ(apex, "com.test");
        EXPECT_EQ(ask(&IServiceManager::updatableViaApex, "test.pack.IFoo/default", &apex),
                  EX_NONE);
        EXPECT_EQ(apex, std::nullopt);
    });
}

}  // namespace
