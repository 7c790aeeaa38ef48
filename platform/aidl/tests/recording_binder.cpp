// SPDX-License-Identifier: Apache-2.0
//
// See recording_binder.h.
#include "platform/aidl/tests/recording_binder.h"

RecordingBinder::RecordingBinder(const char* descriptor) {
    const AIBinder_Class* const clazz = AIBinder_Class_define(
            descriptor, [](void* recorder) { return recorder; }, [](void*) {}, onTransact);
    mBinder.set(AIBinder_new(clazz, this));
}

binder_status_t RecordingBinder::onTransact(AIBinder* binder, transaction_code_t code,
                                            const AParcel* in, AParcel* out) {
    auto* const recorder = static_cast<RecordingBinder*>(AIBinder_getUserData(binder));
    ++recorder->calls;
    recorder->code = code;
    recorder->request = wordsOf(in, AParcel_getDataPosition(in));
    if (recorder->status == STATUS_OK) writeWords(out, recorder->reply);
    return recorder->status;
}
