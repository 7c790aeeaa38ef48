// SPDX-License-Identifier: Apache-2.0
//
// What a hostile server can answer, to every call that the library and generated code make of it.
//
// An input is a choice of the call, then one reply after another:
//
//   call | reply ...     reply: flags | object count | u16 size | data
//
// Flags: 1 a status instead of data, 2 the driver's failure, 4 the server's death. The driver
// itself vouches for the objects, so each listed one stands at a place of its own and is a handle
// or a descriptor.
#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <aidl/android/os/IServiceManager.h>
#include <android/binder_auto_utils.h>
#include <android/binder_ibinder.h>
#include <android/binder_manager.h>
#include <android/binder_parcel.h>

#include "fuzz/input.h"
#include "platform/libbinder_ndk/src/binder.h"
#include "platform/libbinder_ndk/src/kernel.h"
#include "platform/libbinder_ndk/src/parcel.h"
#include "platform/libbinder_ndk/src/remote_binder.h"

namespace {

using aidl::android::os::IServiceManager;
using aidl::android::os::ServiceDebugInfo;
using binder_ndk::Parcel;
using fuzz::Input;
using ndk::SpAIBinder;

struct Buffer {
    std::vector<uint8_t> data;
    std::vector<binder_size_t> offsets;
};

Input input;
std::vector<std::unique_ptr<Buffer>> buffers;
int held = 0;

constexpr uint8_t kStatus = 1;
constexpr uint8_t kFailure = 2;
constexpr uint8_t kDeath = 4;
constexpr size_t kObjectSize = sizeof(flat_binder_object);

// As the driver would have it: in order, apart, of a kind it hands over.
void placeObjects(Buffer* buffer, uint8_t count) {
    size_t free = 0;
    for (uint8_t i = 0; i < count; ++i) {
        const size_t offset = free + size_t{input.byte()} % 32 * 4;
        if (offset + kObjectSize > buffer->data.size()) return;
        flat_binder_object object = {};
        const uint8_t kind = input.byte();
        object.hdr.type = (kind & 1) != 0 ? BINDER_TYPE_FD : BINDER_TYPE_HANDLE;
        // Neither the service manager's handle nor a descriptor that is open.
        object.handle = object.hdr.type == BINDER_TYPE_FD ? 0x7fffff00 : 1U + kind / 64;
        std::memcpy(buffer->data.data() + offset, &object, kObjectSize);
        buffer->offsets.push_back(offset);
        free = offset + kObjectSize;
    }
}

void callServiceManager(IServiceManager& manager, uint8_t which) {
    SpAIBinder binder;
    std::vector<std::string> names;
    std::vector<ServiceDebugInfo> infos;
    std::optional<std::string> package;
    bool declared = false;
    switch (which % 8) {
        case 0:
            manager.getService("a", &binder);
            break;
        case 1:
            manager.listServices(15, &names);
            break;
        case 2:
            manager.isDeclared("a", &declared);
            break;
        case 3:
            manager.getDeclaredInstances("a", &names);
            break;
        case 4:
            manager.updatableViaApex("a", &package);
            break;
        case 5:
            manager.getServiceDebugInfo(&infos);
            break;
        case 6:
            manager.tryUnregisterService("a", manager.asBinder());
            break;
        default:
            manager.registerForNotifications("a", nullptr);
    }
    // What came may itself be asked.
    SpAIBinder extension;
    if (binder.get() != nullptr) AIBinder_getExtension(binder.get(), extension.getR());
}

void callObject(uint8_t which) {
    const SpAIBinder object(binder_ndk::strongProxy(5));
    SpAIBinder extension;
    std::unique_ptr<AIBinder_DeathRecipient, decltype(&AIBinder_DeathRecipient_delete)> recipient(
            AIBinder_DeathRecipient_new([](void*) {}), AIBinder_DeathRecipient_delete);
    const char* const arguments[] = {"-a"};
    switch (which % 4) {
        case 0:
            AIBinder_getExtension(object.get(), extension.getR());
            break;
        case 1:
            IServiceManager::fromBinder(object);
            break;
        case 2:
            AIBinder_dump(object.get(), 1, const_cast<const char**>(arguments), 1);
            break;
        default:
            AIBinder_linkToDeath(object.get(), recipient.get(), nullptr);
            AIBinder_ping(object.get());
    }
}

}  // namespace

namespace binder_ndk::kernel {

binder_status_t transact(uint32_t /*handle*/, uint32_t /*code*/, const Parcel& /*request*/,
                         Parcel* reply, uint32_t flags) {
    if ((flags & TF_ONE_WAY) != 0) return STATUS_OK;
    const uint8_t choice = input.byte();
    const uint8_t objects = input.byte();
    const size_t size = input.byte() | size_t{input.byte()} << 8;
    auto buffer = std::make_unique<Buffer>();
    const size_t length = std::min(size, input.left);
    buffer->data.assign(input.at, input.at + length);
    input.at += length;
    input.left -= length;
    if ((choice & kFailure) != 0) return STATUS_FAILED_TRANSACTION;
    if ((choice & kDeath) != 0) return STATUS_DEAD_OBJECT;
    if ((choice & kStatus) != 0) {
        int32_t status = 0;
        if (length >= sizeof status) std::memcpy(&status, buffer->data.data(), sizeof status);
        return status;
    }
    placeObjects(buffer.get(), objects % 4);
    reply->adopt(buffer->data.data(), length, buffer->offsets.data(), buffer->offsets.size(),
                 freeBuffer);
    ++held;
    buffers.push_back(std::move(buffer));
    return STATUS_OK;
}

void acquire(uint32_t /*handle*/) {}
void release(uint32_t /*handle*/) {}
void requestDeathNotification(uint32_t /*handle*/, uint64_t /*cookie*/) {}
void clearDeathNotification(uint32_t /*handle*/, uint64_t /*cookie*/) {}
void freeBuffer(const uint8_t* /*buffer*/) {
    --held;
}

}  // namespace binder_ndk::kernel

extern "C" int LLVMFuzzerInitialize(int* /*argc*/, char*** /*argv*/) {
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    input = {data, size};
    const uint8_t call = input.byte();
    if ((call & 0x80) != 0) {
        callObject(call & 0x7f);
    } else {
        // A new one each time: an earlier input may have declared the last one dead.
        const auto manager =
                IServiceManager::fromBinder(SpAIBinder(binder_ndk::newServiceManagerProxy()));
        callServiceManager(*manager, call);
    }
    // Every buffer is given back exactly once.
    if (held != 0) std::abort();
    buffers.clear();
    return 0;
}
