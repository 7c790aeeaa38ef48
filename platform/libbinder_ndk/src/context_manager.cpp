// SPDX-License-Identifier: Apache-2.0
//
// Becoming the service manager.
#include "platform/libbinder_ndk/src/context_manager.h"

#include <errno.h>

#include <atomic>
#include <cstring>

#include <binder_context_manager.h>

#include "platform/libbinder_ndk/src/binder.h"
#include "platform/libbinder_ndk/src/driver.h"
#include "platform/libbinder_ndk/src/log.h"
#include "platform/libbinder_ndk/src/remote_binder.h"

namespace binder_ndk {
namespace {

std::atomic<AIBinder*> managerObject{nullptr};

}  // namespace

AIBinder* contextManagerObject() {
    return managerObject.load(std::memory_order_acquire);
}

}  // namespace binder_ndk

using namespace binder_ndk;

binder_status_t ABinderProcess_becomeContextManager(AIBinder* binder) {
    if (binder == nullptr) return STATUS_UNEXPECTED_NULL;
    if (binder->asLocal() == nullptr) return STATUS_INVALID_OPERATION;

    // Before the driver is told: the first call may come at once.
    AIBinder* none = nullptr;
    binder->incStrong();
    if (!managerObject.compare_exchange_strong(none, binder)) {
        binder->decStrong();
        return -EBUSY;
    }
    const int error = Driver::instance().becomeContextManager();
    if (error == 0) return STATUS_OK;

    logError("cannot become the service manager: %s%s", std::strerror(-error),
             error == -EBUSY   ? "; there is one already"
             : error == -EPERM ? "; an earlier one ran as another user"
                               : "");
    managerObject = nullptr;
    binder->decStrong();
    return error;
}

binder_status_t AIBinder_countHolders(AIBinder* binder, uint32_t* count) {
    if (binder == nullptr || count == nullptr) return STATUS_UNEXPECTED_NULL;
    const RemoteBinder* const proxy = binder->asRemote();
    if (proxy == nullptr) return STATUS_INVALID_OPERATION;
    return Driver::instance().countStrongReferences(proxy->handle(), count);
}
