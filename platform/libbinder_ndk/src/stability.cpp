// SPDX-License-Identifier: Apache-2.0
//
// Stability marks and checks.
#include "platform/libbinder_ndk/src/stability.h"

#include <android/binder_stability.h>
#include <binder_context_manager.h>

#include "platform/libbinder_ndk/src/binder.h"
#include "platform/libbinder_ndk/src/log.h"

namespace binder_ndk {
namespace {

constexpr uint32_t kWireVersionMask = 0xff;

// A level's bits: who may rely on it.
constexpr uint32_t levelOf(uint32_t word) {
    return word >> 24;
}

bool isDeclared(uint32_t level) {
    return level == levelOf(kVendorStabilityWord) || level == levelOf(kSystemStabilityWord) ||
           level == levelOf(kVintfStabilityWord);
}

// Sets the word unless another is set; false then.
bool setWord(AIBinder* binder, uint32_t word) {
    uint32_t current = 0;
    return binder->stability.compare_exchange_strong(current, word) || current == word;
}

void mark(AIBinder* binder, uint32_t word) {
    if (binder == nullptr || binder->asLocal() == nullptr)
        fatal("only a local binder can be marked with a stability");
    if (!setWord(binder, word))
        fatal("a binder of stability 0x%x cannot be marked 0x%x", binder->stability.load(), word);
}

void downgrade(AIBinder* binder, uint32_t word) {
    if (binder == nullptr || binder->asLocal() == nullptr)
        fatal("only a local binder's stability can be lowered");
    binder->stability = word;
}

}  // namespace

uint32_t stabilityWordForSending(AIBinder* binder) {
    uint32_t current = 0;
    if (binder->stability.compare_exchange_strong(current, kSystemStabilityWord))
        return kSystemStabilityWord;
    return current;
}

binder_status_t acceptStabilityWord(AIBinder* binder, uint32_t word) {
    if ((word & kWireVersionMask) < 1) {
        logError("a binder came with stability 0x%x, which has no wire version", word);
        return STATUS_BAD_TYPE;
    }
    if (binder == nullptr) return levelOf(word) == 0 ? STATUS_OK : STATUS_BAD_TYPE;
    if (!isDeclared(levelOf(word))) {
        logError("a binder came with unknown stability 0x%x", word);
        return STATUS_BAD_TYPE;
    }
    if (!setWord(binder, word)) {
        logError("a binder of stability 0x%x came back with 0x%x", binder->stability.load(), word);
        return STATUS_BAD_TYPE;
    }
    return STATUS_OK;
}

void markServiceManagerStability(AIBinder* proxy) {
    setWord(proxy, kSystemStabilityWord);
}

bool mayCall(const AIBinder* binder, uint32_t flags) {
    const uint32_t required = levelOf((flags & FLAG_PRIVATE_VENDOR) != 0 ? kVendorStabilityWord
                                                                         : kSystemStabilityWord);
    const uint32_t word = binder->stability.load();
    if ((levelOf(word) & required) == required) return true;
    logError("a binder of stability 0x%x cannot be called from code of level 0x%x", word, required);
    return false;
}

}  // namespace binder_ndk

using namespace binder_ndk;

void AIBinder_markVendorStability(AIBinder* binder) {
    mark(binder, kVendorStabilityWord);
}

void AIBinder_markSystemStability(AIBinder* binder) {
    mark(binder, kSystemStabilityWord);
}

void AIBinder_markVintfStability(AIBinder* binder) {
    mark(binder, kVintfStabilityWord);
}

void AIBinder_forceDowngradeToVendorStability(AIBinder* binder) {
    downgrade(binder, kVendorStabilityWord);
}

void AIBinder_forceDowngradeToSystemStability(AIBinder* binder) {
    downgrade(binder, kSystemStabilityWord);
}

bool AIBinder_requiresVintfDeclaration(AIBinder* binder) {
    return binder != nullptr && levelOf(binder->stability.load()) == levelOf(kVintfStabilityWord);
}
