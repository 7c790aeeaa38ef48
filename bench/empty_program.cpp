// SPDX-License-Identifier: Apache-2.0
//
// The least that a program with the service's libraries can do: it starts, says so with a byte on its
// standard output, and ends. With a name it also registers an object under that name, as the service
// does, and prints how many instructions that took, in a guest whose clock counts them.
#include <unistd.h>

#include <chrono>
#include <cstdio>

#include <android/binder_ibinder.h>
#include <android/binder_manager.h>
#include <android/binder_process.h>

namespace {

int64_t now() {
    return std::chrono::nanoseconds(std::chrono::steady_clock::now().time_since_epoch()).count();
}

int registerObject(const char* name) {
    const int64_t start = now();
    const AIBinder_Class* const clazz = AIBinder_Class_define(
            "bench.IEmpty", [](void* args) { return args; }, [](void* /*data*/) {},
            [](AIBinder*, transaction_code_t, const AParcel*, AParcel*) -> binder_status_t {
                return STATUS_UNKNOWN_TRANSACTION;
            });
    ABinderProcess_setThreadPoolMaxThreadCount(0);
    AIBinder* const object = AIBinder_new(clazz, nullptr);
    if (AServiceManager_addService(object, name) != EX_NONE) return 1;
    std::printf("%lld\n", static_cast<long long>(now() - start));
    return 0;
}

}  // namespace

int main(int argc, char** argv) {
    if (argc > 1) return registerObject(argv[1]);
    return write(STDOUT_FILENO, "x", 1) == 1 ? 0 : 1;
}
