// SPDX-License-Identifier: Apache-2.0
//
// The AIBinder functions that are the same for local objects and proxies: classes, references,
// order.
#include "platform/libbinder_ndk/src/binder.h"

#include <new>

#include <binder_context_manager.h>

#include "platform/libbinder_ndk/src/call_context.h"
#include "platform/libbinder_ndk/src/log.h"
#include "platform/libbinder_ndk/src/remote_binder.h"
#include "platform/libbinder_ndk/src/utf.h"

using namespace binder_ndk;

namespace {

// Objects may refer to their class at any time, so classes are never freed; they stay in a list,
// the last defined first.
std::atomic<AIBinder_Class*> lastClass{nullptr};

// Asks an object that has no class yet, hence a proxy.
bool isOfClass(AIBinder* binder, const AIBinder_Class* clazz) {
    const std::u16string descriptor = binder->asRemote()->descriptor();
    if (descriptor == clazz->descriptor16) return true;
    logError("a remote object of interface '%s' is not one of '%s'",
             utf16ToUtf8(descriptor).c_str(), clazz->descriptor.c_str());
    return false;
}

}  // namespace

void AIBinder::decStrong() {
    // References that are certainly not the last are counted down without asking the object.
    int32_t count = mStrong.load(std::memory_order_relaxed);
    while (count > 1) {
        if (mStrong.compare_exchange_weak(count, count - 1, std::memory_order_release,
                                          std::memory_order_relaxed))
            return;
    }
    if (count < 1) fatal("a binder without strong references was released again");
    if (dropStrong()) decWeak();
}

bool AIBinder::attemptIncStrong() {
    int32_t count = mStrong.load(std::memory_order_relaxed);
    while (count > 0) {
        if (mStrong.compare_exchange_weak(count, count + 1, std::memory_order_acq_rel,
                                          std::memory_order_relaxed))
            return true;
    }
    return false;
}

void AIBinder::decWeak() {
    if (mWeak.fetch_sub(1, std::memory_order_acq_rel) == 1) delete this;
}

AIBinder_Class* AIBinder_Class_define(const char* interfaceDescriptor,
                                      AIBinder_Class_onCreate onCreate,
                                      AIBinder_Class_onDestroy onDestroy,
                                      AIBinder_Class_onTransact onTransact) {
    if (interfaceDescriptor == nullptr || onCreate == nullptr || onDestroy == nullptr ||
        onTransact == nullptr) {
        return nullptr;
    }
    auto* const clazz =
            new AIBinder_Class{interfaceDescriptor, utf8ToUtf16Lossy(interfaceDescriptor), onCreate,
                               onDestroy, onTransact};
    clazz->previous = lastClass.load(std::memory_order_relaxed);
    while (!lastClass.compare_exchange_weak(clazz->previous, clazz, std::memory_order_release))
        continue;
    return clazz;
}

void AIBinder_Class_setOnDump(AIBinder_Class* clazz, AIBinder_onDump onDump) {
    if (clazz == nullptr) fatal("AIBinder_Class_setOnDump: the class is null");
    clazz->onDump = onDump;
}

void AIBinder_Class_setHandleShellCommand(AIBinder_Class* clazz,
                                          AIBinder_handleShellCommand handleShellCommand) {
    if (clazz == nullptr) fatal("AIBinder_Class_setHandleShellCommand: the class is null");
    clazz->handleShellCommand = handleShellCommand;
}

const char* AIBinder_Class_getDescriptor(const AIBinder_Class* clazz) {
    if (clazz == nullptr) fatal("AIBinder_Class_getDescriptor: the class is null");
    return clazz->descriptor.c_str();
}

bool AIBinder_isRemote(const AIBinder* binder) {
    return binder != nullptr && const_cast<AIBinder*>(binder)->asRemote() != nullptr;
}

bool AIBinder_isAlive(const AIBinder* binder) {
    if (binder == nullptr) return false;
    const RemoteBinder* const remote = const_cast<AIBinder*>(binder)->asRemote();
    return remote == nullptr || remote->isAlive();
}

void AIBinder_incStrong(AIBinder* binder) {
    if (binder != nullptr) binder->incStrong();
}

void AIBinder_decStrong(AIBinder* binder) {
    if (binder == nullptr) {
        logError("AIBinder_decStrong: the binder is null");
        return;
    }
    binder->decStrong();
}

int32_t AIBinder_debugGetRefCount(AIBinder* binder) {
    return binder != nullptr ? binder->strongCount() : -1;
}

bool AIBinder_associateClass(AIBinder* binder, const AIBinder_Class* clazz) {
    if (binder == nullptr || clazz == nullptr) return false;

    const AIBinder_Class* current = binder->clazz.load(std::memory_order_acquire);
    if (current == nullptr) {
        // What a caller hands over is taken on trust: its process could keep this thread waiting for
        // the answer, or nest calls in it. An object of another interface refuses the calls itself.
        if (!CallContext::current().isServing() && !isOfClass(binder, clazz)) return false;
        if (binder->clazz.compare_exchange_strong(current, clazz)) return true;
    }
    if (current == clazz) return true;
    if (current->descriptor == clazz->descriptor) {
        logError("two classes are defined as '%s', and this object is of the other one",
                 clazz->descriptor.c_str());
    } else {
        logError("an object of class '%s' cannot become one of '%s'", current->descriptor.c_str(),
                 clazz->descriptor.c_str());
    }
    return false;
}

const AIBinder_Class* AIBinder_getClass(AIBinder* binder) {
    return binder != nullptr ? binder->clazz.load(std::memory_order_acquire) : nullptr;
}

bool AIBinder_lt(const AIBinder* lhs, const AIBinder* rhs) {
    return reinterpret_cast<uintptr_t>(lhs) < reinterpret_cast<uintptr_t>(rhs);
}

AIBinder_Weak* AIBinder_Weak_new(AIBinder* binder) {
    if (binder == nullptr) return nullptr;
    binder->incWeak();
    return new AIBinder_Weak{binder};
}

void AIBinder_Weak_delete(AIBinder_Weak* weakBinder) {
    if (weakBinder == nullptr) return;
    weakBinder->binder->decWeak();
    delete weakBinder;
}

AIBinder* AIBinder_Weak_promote(AIBinder_Weak* weakBinder) {
    if (weakBinder == nullptr || !weakBinder->binder->attemptIncStrong()) return nullptr;
    return weakBinder->binder;
}

AIBinder_Weak* AIBinder_Weak_clone(const AIBinder_Weak* weak) {
    return weak != nullptr ? AIBinder_Weak_new(weak->binder) : nullptr;
}

bool AIBinder_Weak_lt(const AIBinder_Weak* lhs, const AIBinder_Weak* rhs) {
    if (lhs == nullptr || rhs == nullptr) return lhs == nullptr && rhs != nullptr;
    return AIBinder_lt(lhs->binder, rhs->binder);
}
