// SPDX-License-Identifier: Apache-2.0
//
// A local binder that says it is of some interface, keeps the words of every call and answers with
// words it was given. A proxy made for it shows what a generated proxy sends and how it takes the
// answer; no binder driver is needed, as calls of local binders are plain function calls.
#pragma once

#include <memory>

#include <android/binder_ibinder.h>
#include <android/binder_interface_utils.h>

#include "platform/aidl/tests/words.h"

class RecordingBinder {
  public:
    explicit RecordingBinder(const char* descriptor);

    // A proxy of class PROXY for this binder.
    template <typename PROXY>
    std::shared_ptr<PROXY> proxy() const {
        return ndk::SharedRefBase::make<PROXY>(mBinder);
    }

    // The last call: its code and what follows the interface token.
    transaction_code_t code = 0;
    Words request;
    int calls = 0;

    // What the next calls get: the status, and the reply when it is STATUS_OK.
    binder_status_t status = STATUS_OK;
    Words reply;

  private:
    static binder_status_t onTransact(AIBinder* binder, transaction_code_t code, const AParcel* in,
                                      AParcel* out);

    ndk::SpAIBinder mBinder;
};
