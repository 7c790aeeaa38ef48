// SPDX-License-Identifier: Apache-2.0
//
// A service "test.lazy" that runs only while it has clients: it registers, serves, and ends when the
// last of them has gone.
#include <cstdlib>

#include <android/binder_ibinder.h>
#include <android/binder_manager.h>
#include <android/binder_process.h>

int main() {
    // The one thread that serves hears of the clients, too.
    ABinderProcess_setThreadPoolMaxThreadCount(0);
    const AIBinder_Class* const clazz = AIBinder_Class_define(
            "test.Lazy", [](void* self) { return self; }, [](void*) {},
            [](AIBinder*, transaction_code_t, const AParcel*, AParcel*) -> binder_status_t {
                return STATUS_UNKNOWN_TRANSACTION;
            });
    AIBinder* const service = AIBinder_new(clazz, nullptr);
    if (AServiceManager_registerLazyService(service, "test.lazy") != STATUS_OK) {
        return EXIT_FAILURE;
    }
    ABinderProcess_joinThreadPool();
    return EXIT_FAILURE;
}
