// SPDX-License-Identifier: Apache-2.0
//
// Receives parcels with objects anywhere: in the list and not there, listed and of another kind, on
// top of each other, beyond the end; reads them in any order and copies parts of them. No descriptor
// and no reference is lost or dropped twice.
//
// An input is the number of objects, for each its offset and its kind, a size, the data, and then one
// reading after another.
#include <linux/android/binder.h>

#include <cstring>
#include <map>
#include <string>
#include <vector>

#include <android/binder_auto_utils.h>
#include <android/binder_parcel.h>
#include <android/binder_parcel_utils.h>

#include "fuzz/input.h"
#include "platform/libbinder_ndk/src/binder.h"
#include "platform/libbinder_ndk/src/kernel.h"
#include "platform/libbinder_ndk/src/parcel.h"

namespace {

using fuzz::Input;
using fuzz::require;

constexpr size_t kObjectSize = sizeof(flat_binder_object);

std::map<uint32_t, int> references;  // by handle
int buffersHeld = 0;

// An object of this process, which others may have been given.
binder_ndk::LocalBinder* ownObject() {
    static const AIBinder_Class* const kClass = AIBinder_Class_define(
            "own", [](void* self) { return self; }, [](void*) {},
            [](AIBinder*, transaction_code_t, const AParcel*, AParcel*) -> binder_status_t {
                return STATUS_OK;
            });
    static AIBinder* const kObject = AIBinder_new(kClass, nullptr);
    return kObject->asLocal();
}

// What the driver vouches for: an object that it lists is this process's own, a handle it has given
// out or a descriptor. The last kind is one that no driver has yet.
flat_binder_object objectOf(uint8_t kind) {
    flat_binder_object object = {};
    switch (kind % 4) {
        case 0:
            object.hdr.type = BINDER_TYPE_BINDER;
            object.binder = ownObject()->key();
            object.cookie = ownObject()->cookie();
            break;
        case 1:
            object.hdr.type = BINDER_TYPE_HANDLE;
            object.handle = 1U + kind / 64;
            break;
        case 2:
            object.hdr.type = BINDER_TYPE_FD;
            object.handle = 0x7fffff00;  // none that is open
            break;
        default:
            object.hdr.type = BINDER_TYPE_PTR;
    }
    return object;
}

struct Received {
    std::vector<uint8_t> data;
    std::vector<binder_size_t> offsets;
};

Received receive(Input& input) {
    Received received;
    std::vector<uint8_t> kinds;
    for (int left = input.byte() % 6; left > 0; --left) {
        received.offsets.push_back(input.byte() * (input.byte() % 2 == 0 ? 4U : 1U));
        kinds.push_back(input.byte());
    }
    const size_t size = input.byte() * 2U;
    received.data.resize(size);
    const std::string_view bytes = input.bytes(size);
    std::copy(bytes.begin(), bytes.end(), received.data.begin());
    // Backwards: the first of those on top of each other is whole.
    for (size_t i = kinds.size(); i-- > 0;) {
        const flat_binder_object object = objectOf(kinds[i]);
        if (received.offsets[i] + kObjectSize > size) continue;
        std::memcpy(received.data.data() + received.offsets[i], &object, kObjectSize);
    }
    return received;
}

bool areApart(const Received& received) {
    size_t free = 0;
    for (const binder_size_t offset : received.offsets) {
        if (offset < free || offset % 4 != 0 || offset + kObjectSize > received.data.size()) {
            return false;
        }
        free = offset + kObjectSize;
    }
    return true;
}

void readNext(Input& input, const AParcel* parcel, AParcel* copy) {
    ndk::SpAIBinder binder;
    ndk::ScopedFileDescriptor descriptor;
    std::string text;
    std::vector<int32_t> numbers;
    std::vector<std::string> texts;
    int64_t number = 0;
    switch (input.byte() % 8) {
        case 0:
            AParcel_readStrongBinder(parcel, binder.getR());
            break;
        case 1:
            AParcel_readParcelFileDescriptor(parcel, descriptor.getR());
            break;
        case 2:
            AParcel_readInt64(parcel, &number);
            break;
        case 3:
            ndk::AParcel_readString(parcel, &text);
            break;
        case 4:
            ndk::AParcel_readVector(parcel, &numbers);
            break;
        case 5:
            ndk::AParcel_readVector(parcel, &texts);
            break;
        case 6:
            AParcel_setDataPosition(parcel, input.byte() * 2);
            break;
        default: {
            const size_t start = input.byte() * 2U;
            (*copy)->append(**parcel, start, input.byte() * 2U);
        }
    }
}

}  // namespace

namespace binder_ndk::kernel {

binder_status_t transact(uint32_t /*handle*/, uint32_t /*code*/, const Parcel& /*request*/,
                         Parcel* /*reply*/, uint32_t /*flags*/) {
    return STATUS_DEAD_OBJECT;
}
void acquire(uint32_t handle) {
    ++references[handle];
}
void release(uint32_t handle) {
    require(--references[handle] >= 0);
}
void requestDeathNotification(uint32_t /*handle*/, uint64_t /*cookie*/) {}
void clearDeathNotification(uint32_t /*handle*/, uint64_t /*cookie*/) {}
void freeBuffer(const uint8_t* /*buffer*/) {
    --buffersHeld;
}

}  // namespace binder_ndk::kernel

extern "C" int LLVMFuzzerInitialize(int* /*argc*/, char*** /*argv*/) {
    ownObject();
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    Input input{data, size};
    const Received received = receive(input);
    {
        const ndk::ScopedAParcel parcel(AParcel_create());
        const ndk::ScopedAParcel copy(AParcel_create());
        ++buffersHeld;
        (*parcel.get())
                ->adopt(received.data.data(), received.data.size(), received.offsets.data(),
                        received.offsets.size(), binder_ndk::kernel::freeBuffer);
        require((*parcel.get())->offsetCount() == 0 || areApart(received));
        while (input.left > 0) readNext(input, parcel.get(), copy.get());
    }
    require(buffersHeld == 0);
    require(ownObject()->strongCount() == 1);
    for (const auto& [handle, count] : references) require(count == 0);
    return 0;
}
