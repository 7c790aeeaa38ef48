// SPDX-License-Identifier: Apache-2.0
//
// A local object and what its tests know of it.
#pragma once

#include <string>
#include <vector>

#include <android/binder_auto_utils.h>
#include <gtest/gtest.h>

#include "platform/libbinder_ndk/src/binder.h"
#include "platform/libbinder_ndk/src/call_context.h"
#include "platform/libbinder_ndk/tests/unit/fake_kernel.h"

namespace binder_test {

struct State {
    int created = 0;
    int destroyed = 0;
    int calls = 0;
    std::vector<std::string> arguments;
    binder_status_t answer = STATUS_OK;
};

inline void* onCreate(void* args) {
    ++static_cast<State*>(args)->created;
    return args;
}

inline void onDestroy(void* state) {
    ++static_cast<State*>(state)->destroyed;
}

inline State& stateOf(AIBinder* binder) {
    return *static_cast<State*>(AIBinder_getUserData(binder));
}

inline binder_status_t onTransact(AIBinder* binder, transaction_code_t code, const AParcel* in,
                                  AParcel* out) {
    ++stateOf(binder).calls;
    int32_t number = 0;
    if (const auto status = AParcel_readInt32(in, &number); status != STATUS_OK) return status;
    AParcel_writeInt32(out, number + static_cast<int32_t>(code));
    return stateOf(binder).answer;
}

inline binder_status_t keepArguments(AIBinder* binder, const char** args, uint32_t count) {
    stateOf(binder).arguments.assign(args, args + count);
    return stateOf(binder).answer;
}

inline AIBinder_Class* defineClass(const char* descriptor = "test.ILocal") {
    return AIBinder_Class_define(descriptor, onCreate, onDestroy, onTransact);
}

class LocalBinder : public testing::Test {
  protected:
    ~LocalBinder() override { binder_ndk::CallContext::current() = {}; }

    // A raw transaction as the driver would deliver it.
    binder_status_t deliver(uint32_t code, const std::vector<uint32_t>& request = {},
                            std::vector<binder_size_t> offsets = {}) {
        binder_ndk::Parcel in;
        binder_ndk::Parcel out;
        mKernel.deliver(Buffer(request, std::move(offsets)), &in);
        const auto status = mBinder->transact(code, in, &out, 0);
        mReply = words(out);
        return status;
    }

    FakeKernel mKernel;
    State mState;
    AIBinder_Class* const mClass = defineClass();
    ndk::SpAIBinder mOwner{AIBinder_new(mClass, &mState)};
    AIBinder* const mBinder = mOwner.get();
    std::vector<uint32_t> mReply;
};

}  // namespace binder_test
