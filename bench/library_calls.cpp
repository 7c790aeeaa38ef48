// SPDX-License-Identifier: Apache-2.0
#include "bench/library_calls.h"

#include <unistd.h>

#include <chrono>
#include <functional>
#include <thread>

#include <android/binder_auto_utils.h>
#include <android/binder_manager.h>
#include <android/binder_parcel_utils.h>
#include <android/binder_process.h>

#include "bench/bare_binder.h"
#include "bench/overheard.h"

namespace bench {
namespace {

using std::chrono::milliseconds;

constexpr const char* kName = "bench.ICalls/default";

enum Method : transaction_code_t { kString = 1, kNumbers, kBinder };

binder_status_t serve(AIBinder* /*binder*/, transaction_code_t code, const AParcel* in,
                      AParcel* out) {
    std::string text;
    std::vector<int32_t> numbers;
    ndk::SpAIBinder binder;
    const binder_status_t status = code == kString    ? ndk::AParcel_readString(in, &text)
                                   : code == kNumbers ? ndk::AParcel_readVector(in, &numbers)
                                                      : AParcel_readStrongBinder(in, binder.getR());
    if (status != STATUS_OK) return status;
    return AParcel_writeStatusHeader(out, ndk::ScopedAStatus::ok().get());
}

const AIBinder_Class* callsClass() {
    static const AIBinder_Class* const clazz = AIBinder_Class_define(
            "bench.ICalls", [](void* args) { return args; }, [](void* /*data*/) {}, serve);
    return clazz;
}

ndk::SpAIBinder find() {
    for (int tries = 0; tries < 5000; ++tries) {
        ndk::SpAIBinder service(AServiceManager_checkService(kName));
        if (service.get() != nullptr && AIBinder_associateClass(service.get(), callsClass()))
            return service;
        std::this_thread::sleep_for(milliseconds(2));
    }
    fail("the service of the calls is not registered");
}

using Write = std::function<binder_status_t(AParcel*)>;

// As a generated client calls.
void call(AIBinder* service, Method method, const Write& write) {
    ndk::ScopedAParcel in;
    ndk::ScopedAParcel out;
    ndk::ScopedAStatus outcome;
    if (AIBinder_prepareTransaction(service, in.getR()) != STATUS_OK ||
        write(in.get()) != STATUS_OK ||
        AIBinder_transact(service, method, in.getR(), out.getR(), 0) != STATUS_OK ||
        AParcel_readStatusHeader(out.get(), outcome.getR()) != STATUS_OK || !outcome.isOk()) {
        fail("a call failed");
    }
}

}  // namespace

pid_t startLibraryService() {
    return inChild(kNoLog, [] {
        const ndk::SpAIBinder service(AIBinder_new(callsClass(), nullptr));
        ABinderProcess_setThreadPoolMaxThreadCount(0);
        if (AServiceManager_addService(service.get(), kName) == EX_NONE)
            ABinderProcess_joinThreadPool();
    });
}

std::vector<LibraryCall> countLibraryCalls(pid_t libraryService, int calls) {
    const std::string text(100, 'x');
    const std::vector<int32_t> numbers(1000, 7);
    const ndk::SpAIBinder object(AIBinder_new(callsClass(), nullptr));
    const struct {
        const char* name;
        Method method;
        Write write;
    } kinds[] = {
            {"a call with a string of 100 characters", kString,
             [&](AParcel* to) { return ndk::AParcel_writeString(to, text); }},
            {"a call with an array of 1,000 ints", kNumbers,
             [&](AParcel* to) { return ndk::AParcel_writeVector(to, numbers); }},
            {"a call with a binder", kBinder,
             [&](AParcel* to) { return AParcel_writeStrongBinder(to, object.get()); }},
    };

    const ndk::SpAIBinder service = find();
    std::vector<LibraryCall> counted;
    for (const auto& kind : kinds) {
        const auto ask = [&] { call(service.get(), kind.method, kind.write); };
        ask();
        const Overheard said = overhear(ask);
        const pid_t bareService =
                startBareService([] { return true; }, [&](uint32_t) { return said.replySize; });
        const int fd = connectBare();
        BareClient bare(fd, 0, kind.method, said.request, said.offsets);
        LibraryCall row = {kind.name, {}, {}};
        for (int i = 0; i < calls; ++i) {
            row.library.measure(ask);
            row.bare.measure([&] { bare.call(); });
        }
        counted.push_back(std::move(row));
        close(fd);
        endChild(bareService);
    }
    endChild(libraryService);
    return counted;
}

}  // namespace bench
