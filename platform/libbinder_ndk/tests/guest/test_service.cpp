// SPDX-License-Identifier: Apache-2.0
//
// The service the tests call.
#include "platform/libbinder_ndk/tests/guest/test_service.h"

#include <sys/prctl.h>
#include <unistd.h>

#include <atomic>
#include <chrono>
#include <filesystem>
#include <mutex>
#include <thread>

#include <android/binder_manager.h>
#include <android/binder_parcel_utils.h>
#include <android/binder_process.h>
#include <gtest/gtest.h>

namespace binder_test {
namespace {

using Answer = std::function<int32_t(int32_t)>;

std::atomic<int32_t> liveObjects{0};
std::atomic<int32_t> deaths{0};
std::atomic<int> sleeping{0};
std::atomic<bool> overlapped{false};

std::mutex stateMutex;  // guards the two below
std::vector<int32_t> remembered;
std::vector<ndk::SpAIBinder> kept;

const AIBinder_Class* objectClass() {
    static const AIBinder_Class* const clazz = AIBinder_Class_define(
            "test.IObject",
            [](void* args) {
                ++liveObjects;
                return args;
            },
            [](void*) { --liveObjects; },
            [](AIBinder*, transaction_code_t, const AParcel*, AParcel*) -> binder_status_t {
                return STATUS_UNKNOWN_TRANSACTION;
            });
    return clazz;
}

binder_status_t callBack(const AParcel* in, AParcel* out) {
    ndk::SpAIBinder callback;
    int32_t value = 0;
    if (const auto status = AParcel_readStrongBinder(in, callback.getR()); status != STATUS_OK)
        return status;
    if (const auto status = AParcel_readInt32(in, &value); status != STATUS_OK) return status;
    if (!AIBinder_associateClass(callback.get(), callbackClass())) return STATUS_BAD_VALUE;
    binder_status_t status = STATUS_OK;
    const auto reply = call(
            callback, FIRST_CALL_TRANSACTION, [&](AParcel* to) { AParcel_writeInt32(to, value); },
            &status);
    if (status != STATUS_OK) return status;
    int32_t answer = 0;
    if (const auto read = AParcel_readInt32(reply.get(), &answer); read != STATUS_OK) return read;
    return AParcel_writeInt32(out, answer);
}

binder_status_t sleepFor(const AParcel* in) {
    int32_t milliseconds = 0;
    if (const auto status = AParcel_readInt32(in, &milliseconds); status != STATUS_OK)
        return status;
    if (++sleeping > 1) overlapped = true;
    std::this_thread::sleep_for(std::chrono::milliseconds(milliseconds));
    --sleeping;
    return STATUS_OK;
}

binder_status_t keep(const AParcel* in) {
    ndk::SpAIBinder binder;
    if (const auto status = AParcel_readStrongBinder(in, binder.getR()); status != STATUS_OK)
        return status;
    const std::lock_guard<std::mutex> lock(stateMutex);
    kept.push_back(binder);
    return STATUS_OK;
}

binder_status_t watch(const AParcel* in) {
    static AIBinder_DeathRecipient* const recipient =
            AIBinder_DeathRecipient_new([](void* /*cookie*/) { ++deaths; });
    ndk::SpAIBinder binder;
    if (const auto status = AParcel_readStrongBinder(in, binder.getR()); status != STATUS_OK)
        return status;
    {
        const std::lock_guard<std::mutex> lock(stateMutex);
        kept.push_back(binder);
    }
    return AIBinder_linkToDeath(binder.get(), recipient, nullptr);
}

binder_status_t writeTo(const AParcel* in) {
    ndk::ScopedFileDescriptor fd;
    if (const auto status = ndk::AParcel_readRequiredParcelFileDescriptor(in, &fd);
        status != STATUS_OK) {
        return status;
    }
    return write(fd.get(), "hello", 5) == 5 ? STATUS_OK : STATUS_UNKNOWN_ERROR;
}

binder_status_t echoBinder(const AParcel* in, AParcel* out) {
    ndk::SpAIBinder binder;
    if (const auto status = AParcel_readStrongBinder(in, binder.getR()); status != STATUS_OK)
        return status;
    return AParcel_writeStrongBinder(out, binder.get());
}

binder_status_t isOwn(const AParcel* in, AParcel* out) {
    ndk::SpAIBinder binder;
    if (const auto status = AParcel_readStrongBinder(in, binder.getR()); status != STATUS_OK)
        return status;
    return AParcel_writeBool(out, AIBinder_getClass(binder.get()) == objectClass());
}

binder_status_t onTransact(AIBinder* /*binder*/, transaction_code_t code, const AParcel* in,
                           AParcel* out) {
    int32_t number = 0;
    switch (code) {
        case kEcho:
            if (const auto status = AParcel_readInt32(in, &number); status != STATUS_OK)
                return status;
            return AParcel_writeInt32(out, number);
        case kCaller:
            AParcel_writeInt32(out, static_cast<int32_t>(AIBinder_getCallingUid()));
            return AParcel_writeInt32(out, AIBinder_getCallingPid());
        case kCallBack:
            return callBack(in, out);
        case kRemember: {
            if (const auto status = AParcel_readInt32(in, &number); status != STATUS_OK)
                return status;
            const std::lock_guard<std::mutex> lock(stateMutex);
            remembered.push_back(number);
            return STATUS_OK;
        }
        case kRemembered: {
            const std::lock_guard<std::mutex> lock(stateMutex);
            return ndk::AParcel_writeVector(out, remembered);
        }
        case kKeep:
            return keep(in);
        case kDropKept: {
            std::vector<ndk::SpAIBinder> dropped;
            const std::lock_guard<std::mutex> lock(stateMutex);
            dropped.swap(kept);
            return STATUS_OK;
        }
        case kGiveObject: {
            const ndk::SpAIBinder object(AIBinder_new(objectClass(), nullptr));
            return AParcel_writeStrongBinder(out, object.get());
        }
        case kLiveObjects:
            return AParcel_writeInt32(out, liveObjects);
        case kDie:
            _exit(0);
        case kSleep:
            return sleepFor(in);
        case kWatch:
            return watch(in);
        case kDeaths:
            return AParcel_writeInt32(out, deaths);
        case kDescriptors:
            return AParcel_writeInt32(out, countDescriptors());
        case kWriteTo:
            return writeTo(in);
        case kEchoBytes: {
            std::vector<uint8_t> bytes;
            if (const auto status = ndk::AParcel_readVector(in, &bytes); status != STATUS_OK)
                return status;
            return ndk::AParcel_writeVector(out, bytes);
        }
        case kEchoBinder:
            return echoBinder(in, out);
        case kIsOwn:
            return isOwn(in, out);
        case kAnswerStatus:
            if (const auto status = AParcel_readInt32(in, &number); status != STATUS_OK)
                return status;
            AParcel_writeInt32(out, 12345);  // dropped: a status travels alone
            return number;
        case kOverlaps:
            return AParcel_writeBool(out, overlapped);
        case kThreadName: {
            char name[16] = {};
            prctl(PR_GET_NAME, name);
            return ndk::AParcel_writeString(out, std::string(name));
        }
        case kAssociate: {
            ndk::SpAIBinder binder;
            const binder_status_t status = AParcel_readStrongBinder(in, binder.getR());
            if (status != STATUS_OK) return status;
            return AIBinder_associateClass(binder.get(), callbackClass()) ? STATUS_OK
                                                                          : STATUS_BAD_VALUE;
        }
        default:
            return STATUS_UNKNOWN_TRANSACTION;
    }
}

binder_status_t onDump(AIBinder* /*binder*/, int fd, const char** args, uint32_t numArgs) {
    std::string text = "dump:";
    for (uint32_t i = 0; i < numArgs; ++i) text += std::string(" ") + args[i];
    return write(fd, text.data(), text.size()) == static_cast<ssize_t>(text.size())
                   ? STATUS_OK
                   : STATUS_BAD_VALUE;
}

binder_status_t onCallback(AIBinder* binder, transaction_code_t code, const AParcel* in,
                           AParcel* out) {
    if (code != FIRST_CALL_TRANSACTION) return STATUS_UNKNOWN_TRANSACTION;
    int32_t number = 0;
    if (const auto status = AParcel_readInt32(in, &number); status != STATUS_OK) return status;
    return AParcel_writeInt32(out, (*static_cast<Answer*>(AIBinder_getUserData(binder)))(number));
}

}  // namespace

const AIBinder_Class* serviceClass() {
    static const AIBinder_Class* const clazz = [] {
        AIBinder_Class* const defined = AIBinder_Class_define(
                kServiceDescriptor, [](void* args) { return args; }, [](void*) {}, onTransact);
        AIBinder_Class_setOnDump(defined, onDump);
        return defined;
    }();
    return clazz;
}

const AIBinder_Class* callbackClass() {
    static const AIBinder_Class* const clazz = AIBinder_Class_define(
            kCallbackDescriptor,
            [](void* answer) -> void* { return new Answer(*static_cast<Answer*>(answer)); },
            [](void* answer) { delete static_cast<Answer*>(answer); }, onCallback);
    return clazz;
}

ndk::SpAIBinder makeService() {
    return ndk::SpAIBinder(AIBinder_new(serviceClass(), nullptr));
}

ndk::SpAIBinder makeCallback(std::function<int32_t(int32_t)> answer) {
    return ndk::SpAIBinder(AIBinder_new(callbackClass(), &answer));
}

void serve(const std::string& name, const std::function<void()>& ready) {
    const ndk::SpAIBinder service = makeService();
    const ndk::SpAIBinder extension = makeCallback([](int32_t number) { return -number; });
    ASSERT_EQ(STATUS_OK, AIBinder_setExtension(service.get(), extension.get()));
    ABinderProcess_setThreadPoolMaxThreadCount(0);
    ASSERT_EQ(EX_NONE, AServiceManager_addService(service.get(), name.c_str()));
    ready();
    ABinderProcess_joinThreadPool();
}

int countDescriptors() {
    int count = 0;
    for ([[maybe_unused]] const auto& entry : std::filesystem::directory_iterator("/proc/self/fd"))
        ++count;
    return count;
}

std::string testName() {
    return testing::UnitTest::GetInstance()->current_test_info()->name();
}

Process startService() {
    return Process(kSystem, [](const Process::Ready& ready) { serve(testName(), ready); });
}

void callService(uid_t uid, const std::function<void(const ndk::SpAIBinder& binder)>& body) {
    const Process service = startService();
    inProcess(uid, [&] { body(find(testName())); });
}

ndk::SpAIBinder find(const std::string& name) {
    ndk::SpAIBinder service(AServiceManager_checkService(name.c_str()));
    EXPECT_NE(nullptr, service.get()) << "service " << name;
    EXPECT_TRUE(AIBinder_associateClass(service.get(), serviceClass()));
    return service;
}

ndk::ScopedAParcel call(const ndk::SpAIBinder& binder, transaction_code_t code,
                        const std::function<void(AParcel*)>& write, binder_status_t* status,
                        binder_flags_t flags) {
    AParcel* in = nullptr;
    ndk::ScopedAParcel out;
    binder_status_t result = AIBinder_prepareTransaction(binder.get(), &in);
    if (result == STATUS_OK) {
        if (write != nullptr) write(in);
        result = AIBinder_transact(binder.get(), code, &in, out.getR(), flags);
    }
    if (status != nullptr) {
        *status = result;
    } else {
        EXPECT_EQ(STATUS_OK, result) << "code " << code;
    }
    return out;
}

int32_t callForInt(const ndk::SpAIBinder& binder, transaction_code_t code,
                   const std::function<void(AParcel*)>& write) {
    const auto reply = call(binder, code, write);
    int32_t number = -1;
    if (reply.get() == nullptr) return number;
    EXPECT_EQ(STATUS_OK, AParcel_readInt32(reply.get(), &number)) << "code " << code;
    return number;
}

int32_t echo(const ndk::SpAIBinder& binder, int32_t value) {
    return callForInt(binder, kEcho, [&](AParcel* to) { AParcel_writeInt32(to, value); });
}

}  // namespace binder_test
