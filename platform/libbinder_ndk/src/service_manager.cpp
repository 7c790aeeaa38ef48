// SPDX-License-Identifier: Apache-2.0
// The AServiceManager functions: a client of android.os.IServiceManager on handle 0.
#include <android/binder_manager.h>
#include <unistd.h>

#include <chrono>
#include <condition_variable>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>
#include <thread>
#include <utility>

#include "binder.h"
#include "log.h"
#include "parcel.h"
#include "remote_binder.h"
#include "stability.h"
#include "status.h"
#include "token.h"
#include "utf.h"

using namespace binder_ndk;

namespace {

using namespace std::chrono_literals;

enum Method : uint32_t {
    kGetService = 1,
    kCheckService = 2,
    kAddService = 3,
    kRegisterForNotifications = 5,
    kUnregisterForNotifications = 6,
    kIsDeclared = 7,
    kGetDeclaredInstances = 8,
    kUpdatableViaApex = 9,
};

constexpr int32_t kDefaultDumpPriority = 8;
constexpr auto kManagerRetryInterval = 1000ms;
constexpr auto kServiceRetryInterval = 1000ms;
constexpr auto kServiceTimeout = 5000ms;

// The proxy of the service manager; waits for it without limit. The library's reference is kept for
// good.
AIBinder* serviceManager() {
    static AIBinder* const manager = [] {
        for (;;) {
            if (AIBinder* const proxy = strongProxy(0); proxy != nullptr) {
                markServiceManagerStability(proxy);
                return proxy;
            }
            logWarning("waiting for the service manager");
            std::this_thread::sleep_for(kManagerRetryInterval);
        }
    }();
    return manager;
}

// One call of the service manager: arguments in, then call(), then results out.
class Call {
  public:
    explicit Call(Method method) : method_(method) {
        status_ = writeInterfaceToken(request_, u"android.os.IServiceManager");
    }

    Call& text(const char* utf8) {
        if (status_ == STATUS_OK) status_ = request_.writeString16(utf8ToUtf16Lossy(utf8));
        return *this;
    }
    Call& binder(AIBinder* object) {
        if (status_ == STATUS_OK) status_ = request_.writeStrongBinder(object);
        return *this;
    }
    Call& word(int32_t value) {
        if (status_ == STATUS_OK) status_ = request_.write(value);
        return *this;
    }

    // Sends it. The exception that came back, EX_TRANSACTION_FAILED when the call itself failed.
    binder_exception_t call() {
        AIBinder* const manager = serviceManager();
        if (status_ == STATUS_OK) status_ = manager->transact(method_, request_, &reply_, 0);
        AStatus answer;
        if (status_ == STATUS_OK) status_ = readStatusHeader(reply_, &answer);
        if (status_ != STATUS_OK) {
            logError("the service manager cannot be asked: status %d", status_);
            return EX_TRANSACTION_FAILED;
        }
        if (answer.exception != EX_NONE) {
            logWarning("the service manager refuses: exception %d, %s", answer.exception,
                       answer.message.c_str());
        }
        return knownException(answer.exception);
    }

    Parcel& reply() { return reply_; }

  private:
    const Method method_;
    binder_status_t status_ = STATUS_OK;
    Parcel request_;
    Parcel reply_;
};

// kGetService or kCheckService. False when the service manager answers with an error; `*service`
// is one strong reference or null.
bool lookUp(Method method, const char* instance, AIBinder** service) {
    Call call(method);
    *service = nullptr;
    return call.text(instance).call() == EX_NONE &&
           call.reply().readStrongBinder(service) == STATUS_OK;
}

// A boolean answer about `instance`; an error is false.
bool ask(Method method, const char* instance) {
    Call call(method);
    int32_t answer = 0;
    return call.text(instance).call() == EX_NONE && call.reply().read(&answer) == STATUS_OK &&
           answer != 0;
}

// An android.os.IServiceCallback that waits to be told of a registration.
class Waiter {
  public:
    Waiter() : binder_(AIBinder_new(callbackClass(), this)) {}
    ~Waiter() {
        // A notice may still be on its way: it finds the state, not this object.
        AIBinder_decStrong(binder_);
    }
    Waiter(const Waiter&) = delete;
    Waiter& operator=(const Waiter&) = delete;

    AIBinder* binder() const { return binder_; }

    // The service, one strong reference, or null after a second.
    AIBinder* wait() {
        std::unique_lock<std::mutex> lock(state_->mutex);
        state_->registered.wait_for(lock, kServiceRetryInterval,
                                    [&] { return state_->service != nullptr; });
        return std::exchange(state_->service, nullptr);
    }

  private:
    struct State {
        std::mutex mutex;
        std::condition_variable registered;
        AIBinder* service = nullptr;  // guarded by mutex

        ~State() {
            if (service != nullptr) AIBinder_decStrong(service);
        }
    };
    using SharedState = std::shared_ptr<State>;

    static const AIBinder_Class* callbackClass() {
        static const AIBinder_Class* const clazz = AIBinder_Class_define(
                "android.os.IServiceCallback",
                [](void* waiter) -> void* {
                    return new SharedState(static_cast<Waiter*>(waiter)->state_);
                },
                [](void* state) { delete static_cast<SharedState*>(state); }, onTransact);
        return clazz;
    }

    // onRegistration(String name, IBinder binder), oneway
    static binder_status_t onTransact(AIBinder* binder, transaction_code_t code, const AParcel* in,
                                      AParcel* /*out*/) {
        if (code != FIRST_CALL_TRANSACTION) return STATUS_UNKNOWN_TRANSACTION;
        std::u16string_view name;
        AIBinder* service = nullptr;
        if (!(*in)->readString16(&name)) return STATUS_UNEXPECTED_NULL;
        if (const auto status = (*in)->readStrongBinder(&service); status != STATUS_OK)
            return status;
        State& state = **static_cast<SharedState*>(AIBinder_getUserData(binder));
        const std::lock_guard<std::mutex> lock(state.mutex);
        std::swap(state.service, service);
        if (service != nullptr) service->decStrong();
        state.registered.notify_all();
        return STATUS_OK;
    }

    const SharedState state_ = std::make_shared<State>();
    AIBinder* const binder_;
};

}  // namespace

binder_exception_t AServiceManager_addService(AIBinder* binder, const char* instance) {
    if (binder == nullptr || instance == nullptr) return EX_ILLEGAL_ARGUMENT;
    constexpr int32_t kNoIsolatedCallers = 0;
    return Call(kAddService)
            .text(instance)
            .binder(binder)
            .word(kNoIsolatedCallers)
            .word(kDefaultDumpPriority)
            .call();
}

AIBinder* AServiceManager_checkService(const char* instance) {
    if (instance == nullptr) return nullptr;
    AIBinder* service = nullptr;
    lookUp(kCheckService, instance, &service);
    return service;
}

AIBinder* AServiceManager_getService(const char* instance) {
    if (instance == nullptr) return nullptr;
    const auto start = std::chrono::steady_clock::now();
    for (;;) {
        if (AIBinder* const service = AServiceManager_checkService(instance); service != nullptr)
            return service;
        if (std::chrono::steady_clock::now() - start >= kServiceTimeout) break;
        logInfo("waiting for service '%s'", instance);
        std::this_thread::sleep_for(kServiceRetryInterval);
    }
    logWarning("service '%s' did not start", instance);
    return nullptr;
}

AIBinder* AServiceManager_waitForService(const char* instance) {
    if (instance == nullptr) return nullptr;
    AIBinder* service = nullptr;
    if (!lookUp(kGetService, instance, &service) || service != nullptr) return service;

    Waiter waiter;
    if (Call(kRegisterForNotifications).text(instance).binder(waiter.binder()).call() != EX_NONE)
        return nullptr;
    while (service == nullptr) {
        service = waiter.wait();
        if (service != nullptr) break;
        logWarning("waited one second for service '%s'", instance);
        // Without a thread to be told on, only asking helps.
        if (!lookUp(kGetService, instance, &service)) break;
    }
    Call(kUnregisterForNotifications).text(instance).binder(waiter.binder()).call();
    return service;
}

bool AServiceManager_isDeclared(const char* instance) {
    return instance != nullptr && ask(kIsDeclared, instance);
}

void AServiceManager_forEachDeclaredInstance(const char* interface, void* context,
                                             void (*callback)(const char*, void*)) {
    if (interface == nullptr || callback == nullptr)
        fatal("AServiceManager_forEachDeclaredInstance: interface and callback may not be null");
    Call call(kGetDeclaredInstances);
    int32_t count = 0;
    if (call.text(interface).call() != EX_NONE || call.reply().read(&count) != STATUS_OK) return;
    std::u16string_view name;
    for (int32_t i = 0; i < count && call.reply().readString16(&name); ++i)
        callback(utf16ToUtf8(name).c_str(), context);
}

bool AServiceManager_isUpdatableViaApex(const char* instance) {
    if (instance == nullptr) return false;
    Call call(kUpdatableViaApex);
    std::u16string_view package;
    return call.text(instance).call() == EX_NONE && call.reply().readString16(&package);
}

// ---- Lazy services: kept running for good, so there is nothing to do but to register them. ----

binder_status_t AServiceManager_registerLazyService(AIBinder* binder, const char* instance) {
    if (binder == nullptr || instance == nullptr) return STATUS_UNEXPECTED_NULL;
    return AServiceManager_addService(binder, instance) == EX_NONE ? STATUS_OK
                                                                   : STATUS_UNKNOWN_ERROR;
}

void AServiceManager_forceLazyServicesPersist(bool /*persist*/) {}

void AServiceManager_setActiveServicesCallback(bool (* /*callback*/)(bool, void*),
                                               void* /*context*/) {}

bool AServiceManager_tryUnregister() {
    return false;
}

void AServiceManager_reRegister() {}
