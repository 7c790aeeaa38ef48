// SPDX-License-Identifier: Apache-2.0
//
// The process's entry: what it asks of the platform, in which order, and how it ends. The entry is
// the service's own main, compiled under another name; the binder library's process and service
// manager functions are replaced by the ones below, which remember their arguments.
#include <algorithm>
#include <string>
#include <vector>

#include <android/binder_ibinder.h>
#include <android/binder_manager.h>
#include <android/binder_process.h>

#include "tests/service_test.h"

int serviceMain();

namespace {

using ::testing::ElementsAre;

// What the platform answers, and what it was asked.
struct Platform {
    binder_status_t extensionStatus = STATUS_OK;
    binder_exception_t registrationStatus = EX_NONE;
    fake::FakeKernel* kernel = nullptr;
    std::vector<std::string> requests;
    AIBinder* extended = nullptr;
    AIBinder* extension = nullptr;
    AIBinder* registered = nullptr;

    void note(const std::string& request) {
        requests.push_back(request + (kernel->calls().empty() ? " before" : " after") + " probing");
    }
};

Platform* platform = nullptr;

}  // namespace

extern "C" {

bool ABinderProcess_setThreadPoolMaxThreadCount(uint32_t count) {
    platform->note("threads " + std::to_string(count));
    return true;
}

binder_status_t AIBinder_setExtension(AIBinder* binder, AIBinder* extension) {
    platform->note("extend");
    platform->extended = binder;
    platform->extension = extension;
    return platform->extensionStatus;
}

binder_exception_t AServiceManager_addService(AIBinder* binder, const char* instance) {
    platform->note(std::string("register ") + instance);
    platform->registered = binder;
    return platform->registrationStatus;
}

void ABinderProcess_joinThreadPool() {
    platform->note("join");
}

}  // extern "C"

namespace {

class Entry : public ServiceTest {
  protected:
    Entry() {
        requests.kernel = &kernel;
        platform = &requests;
    }

    Platform requests;
};

TEST_F(Entry, ProbesExtendsRegistersAndJoinsInThisOrder) {
    serviceMain();
    EXPECT_THAT(requests.requests,
                ElementsAre("threads 0 before probing", "extend after probing",
                            "register android.hardware.vibrator.IVibrator/default after probing",
                            "join after probing"));
}

TEST_F(Entry, ExtensionIsAttachedToTheBinderThatIsRegistered) {
    serviceMain();
    EXPECT_NE(requests.registered, nullptr);
    EXPECT_EQ(requests.extended, requests.registered);
    EXPECT_NE(requests.extension, nullptr);
    EXPECT_NE(requests.extension, requests.registered);
}

TEST_F(Entry, OneHardwareLayerIsProbedForBothServices) {
    serviceMain();
    const std::vector<std::string> calls = kernel.calls();
    EXPECT_EQ(std::count(calls.begin(), calls.end(),
                         "open /sys/class/timed_output/vibrator/enable O_RDWR = ENOENT"),
              1);
}

TEST_F(Entry, ReturnFromThePoolIsAFailure) {
    EXPECT_EQ(serviceMain(), 1);
}

TEST_F(Entry, ServicesAreBuiltStandardFirstAndNothingElseIsLoggedAfterProbing) {
    serviceMain();
    const std::vector<std::string> lines = log.lines();
    ASSERT_GE(lines.size(), 4U);
    EXPECT_THAT(
            std::vector<std::string>(lines.end() - 4, lines.end()),
            ElementsAre("I HW_API: getMotorPerformMethod type : 0", "E V_2_0: Vibrator::Vibrator()",
                        "I V_4_0: Vibrator::Vendor Vibrator()", "E V_2_0: Vibrator::~Vibrator()"));
    EXPECT_THAT(log.tags(), ElementsAre("QvxVibrator-HAL-AIDL-CORE", "QvxVibrator-HAL-AIDL-EXT"));
}

// Fatal lines go to standard error, where a death test looks for them.
class EntryDeathTest : public Entry {
  protected:
    EntryDeathTest() {
        GTEST_FLAG_SET(death_test_style, "fast");
        log.release();
    }
};

TEST_F(EntryDeathTest, RefusedExtensionAbortsAtItsLine) {
    requests.extensionStatus = STATUS_INVALID_OPERATION;
    EXPECT_DEATH(
            serviceMain(),
            "main\\.cpp:42\\] Check failed: STATUS_OK == "
            "AIBinder_setExtension\\(vibBinder\\.get\\(\\), cvib->asBinder\\(\\)\\.get\\(\\)\\)");
}

TEST_F(EntryDeathTest, RefusedRegistrationAbortsAtItsLine) {
    requests.registrationStatus = EX_SECURITY;
    EXPECT_DEATH(serviceMain(),
                 "main\\.cpp:45\\] Check failed: STATUS_OK == "
                 "AServiceManager_addService\\(vibBinder\\.get\\(\\), instance\\.c_str\\(\\)\\)");
}

}  // namespace
