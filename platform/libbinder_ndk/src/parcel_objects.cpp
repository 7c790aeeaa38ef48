// SPDX-License-Identifier: Apache-2.0
//
// A parcel's objects: binders and file descriptors.
#include <fcntl.h>
#include <unistd.h>

#include <algorithm>

#include "platform/libbinder_ndk/src/binder.h"
#include "platform/libbinder_ndk/src/log.h"
#include "platform/libbinder_ndk/src/parcel.h"
#include "platform/libbinder_ndk/src/remote_binder.h"
#include "platform/libbinder_ndk/src/stability.h"

namespace binder_ndk {
namespace {

constexpr size_t kObjectSize = sizeof(flat_binder_object);
static_assert(kObjectSize == 24);

// Accepts descriptors; scheduled normally at nice 19. The driver reads them when it first sees the
// object, a receiver does not.
constexpr uint32_t kBinderFlags = FLAT_BINDER_FLAG_ACCEPTS_FDS | 0x13;
constexpr uint32_t kDescriptorFlags = FLAT_BINDER_FLAG_ACCEPTS_FDS | 0x7f;
static_assert(kBinderFlags == 0x113 && kDescriptorFlags == 0x17f);

bool isKnownType(uint32_t type) {
    return type == BINDER_TYPE_BINDER || type == BINDER_TYPE_HANDLE || type == BINDER_TYPE_FD;
}

flat_binder_object describe(AIBinder* binder) {
    flat_binder_object object = {};
    object.hdr.type = BINDER_TYPE_BINDER;
    object.flags = kBinderFlags;
    if (binder == nullptr) return object;
    if (const RemoteBinder* const remote = binder->asRemote(); remote != nullptr) {
        object.hdr.type = BINDER_TYPE_HANDLE;
        object.binder = 0;  // the handle's upper half travels too
        object.handle = remote->handle();
    } else {
        LocalBinder* const local = binder->asLocal();
        if (local->requestingSid()) object.flags |= FLAT_BINDER_FLAG_TXN_SECURITY_CTX;
        object.binder = local->key();
        object.cookie = local->cookie();
    }
    return object;
}

int descriptorOf(const flat_binder_object& object) {
    return static_cast<int>(object.handle);
}

}  // namespace

void Parcel::adopt(const uint8_t* data, size_t size, const binder_size_t* offsets,
                   size_t offsetCount, ReleaseBuffer release) {
    reset();
    // Never written through while mAdopted is set.
    mData = const_cast<uint8_t*>(data);  // NOLINT(cppcoreguidelines-pro-type-const-cast)
    mSize = size;
    mCapacity = size;
    mAdopted = true;
    mRelease = release;
    if (!adoptOffsets(offsets, offsetCount)) {
        logError("a received parcel of %zu bytes has a bad object list, which is dropped", size);
        closeDescriptors();
        mAdoptedOffsets = nullptr;
        mAdoptedOffsetCount = 0;
    }
}

// Takes over as much of the list as is in order; false when that is not all of it, or not all of it
// is of a known kind.
bool Parcel::adoptOffsets(const binder_size_t* offsets, size_t count) {
    mAdoptedOffsets = offsets;
    bool known = true;
    size_t free = 0;
    for (size_t i = 0; i < count; ++i) {
        const binder_size_t offset = offsets[i];
        if (offset < free || offset % 4 != 0 || mSize < kObjectSize || offset > mSize - kObjectSize)
            return false;
        known = known && isKnownType(objectAt(offset).hdr.type);
        free = offset + kObjectSize;
        mAdoptedOffsetCount = i + 1;
    }
    return known;
}

void Parcel::closeDescriptors() const {
    for (size_t i = 0; i < offsetCount(); ++i) {
        const flat_binder_object object = objectAt(offsets()[i]);
        // A received descriptor is always ours; one written here only when it was given away.
        if (object.hdr.type == BINDER_TYPE_FD && (mAdopted || object.cookie != 0))
            close(descriptorOf(object));
    }
}

flat_binder_object Parcel::objectAt(size_t offset) const {
    flat_binder_object object;
    std::memcpy(&object, mData + offset, kObjectSize);
    return object;
}

bool Parcel::isObjectAt(size_t offset) const {
    const binder_size_t* const end = offsets() + offsetCount();
    return std::binary_search(offsets(), end, static_cast<binder_size_t>(offset));
}

bool Parcel::touchesObject(size_t begin, size_t end) const {
    const size_t count = offsetCount();
    if (count == 0) return false;
    // The first object that ends after `begin`.
    const binder_size_t* const last = offsets() + count;
    const binder_size_t* const next = std::partition_point(
            offsets(), last, [&](binder_size_t offset) { return offset + kObjectSize <= begin; });
    return next != last && *next < end;
}

void Parcel::listObject(size_t offset, AIBinder* held) {
    const auto at = std::lower_bound(mOffsets.begin(), mOffsets.end(), offset);
    mHeld.insert(mHeld.begin() + (at - mOffsets.begin()), held);
    mOffsets.insert(at, offset);
}

binder_status_t Parcel::writeObject(const flat_binder_object& object, AIBinder* held) {
    if (const auto status = writeBytes(&object, kObjectSize); status != STATUS_OK) return status;
    listObject(mPosition - kObjectSize, held);
    return STATUS_OK;
}

binder_status_t Parcel::writeStrongBinder(AIBinder* binder) {
    const flat_binder_object object = describe(binder);
    if (binder == nullptr) {
        // A null is plain data: the driver has nothing to translate in it.
        if (const auto status = writeBytes(&object, kObjectSize); status != STATUS_OK)
            return status;
        return write(kUndeclaredStabilityWord);
    }
    // The receiver acquires it while this parcel lives, so the parcel holds a reference till then.
    binder->incStrong();
    if (const auto status = writeObject(object, binder); status != STATUS_OK) {
        binder->decStrong();
        return status;
    }
    return write(stabilityWordForSending(binder));
}

binder_status_t Parcel::writeFileDescriptor(int fd, bool owned) {
    flat_binder_object object = {};
    object.hdr.type = BINDER_TYPE_FD;
    object.flags = kDescriptorFlags;
    object.binder = 0;
    object.handle = static_cast<uint32_t>(fd);
    object.cookie = owned ? 1 : 0;
    return writeObject(object, nullptr);
}

bool Parcel::takeObject(flat_binder_object* object, size_t* offset) const {
    if (available() < kObjectSize) return false;
    *offset = mPosition;
    *object = objectAt(mPosition);
    mPosition += kObjectSize;
    return true;
}

binder_status_t Parcel::readStrongBinder(AIBinder** binder) const {
    flat_binder_object object;
    size_t offset = 0;
    if (!takeObject(&object, &offset)) return STATUS_BAD_TYPE;

    AIBinder* read = nullptr;  // one strong reference
    if (isObjectAt(offset)) {
        if (object.hdr.type == BINDER_TYPE_BINDER) {
            read = LocalBinder::fromCookie(object.cookie);
            if (read != nullptr) read->incStrong();
        } else if (object.hdr.type == BINDER_TYPE_HANDLE) {
            read = strongProxy(object.handle);
        } else {
            return STATUS_BAD_TYPE;
        }
    } else if (object.hdr.type != BINDER_TYPE_BINDER || object.binder != 0 || object.cookie != 0) {
        logWarning("bytes at offset %zu of a parcel pose as an object", offset);
        return STATUS_BAD_TYPE;
    }

    uint32_t word = 0;
    binder_status_t status = this->read(&word);
    if (status == STATUS_OK) status = acceptStabilityWord(read, word);
    if (status != STATUS_OK) {
        if (read != nullptr) read->decStrong();
        return status;
    }
    *binder = read;
    return STATUS_OK;
}

binder_status_t Parcel::readFileDescriptor(int* fd) const {
    flat_binder_object object;
    size_t offset = 0;
    if (!takeObject(&object, &offset) || !isObjectAt(offset) || object.hdr.type != BINDER_TYPE_FD)
        return STATUS_BAD_TYPE;
    *fd = descriptorOf(object);
    return STATUS_OK;
}

binder_status_t Parcel::acquireCopy(const Parcel& from, size_t fromOffset,
                                    flat_binder_object* object, AIBinder** held) const {
    *object = from.objectAt(fromOffset);
    *held = nullptr;
    if (object->hdr.type == BINDER_TYPE_FD) {
        const int copy = fcntl(descriptorOf(*object), F_DUPFD_CLOEXEC, 0);
        if (copy < 0) return STATUS_BAD_VALUE;
        object->handle = static_cast<uint32_t>(copy);
        object->cookie = 1;
        return STATUS_OK;
    }
    if (object->hdr.type == BINDER_TYPE_HANDLE) {
        *held = strongProxy(object->handle);
    } else {
        *held = LocalBinder::fromCookie(object->cookie);
        if (*held != nullptr) (*held)->incStrong();
    }
    return *held != nullptr ? STATUS_OK : STATUS_BAD_TYPE;
}

binder_status_t Parcel::append(const Parcel& from, size_t start, size_t length) {
    if (start > from.size() || length > from.size() - start) return STATUS_BAD_VALUE;
    if (length == 0) return STATUS_OK;

    const size_t base = mPosition;
    uint8_t* to = nullptr;
    if (const auto status = reserve(length, &to); status != STATUS_OK) return status;
    // `from` may be this parcel, whose memory may just have moved: it is asked only now.
    std::memmove(to, from.data() + start, length);

    const binder_size_t* const last = from.offsets() + from.offsetCount();
    const std::vector<binder_size_t> objects(std::lower_bound(from.offsets(), last, start), last);
    binder_status_t status = STATUS_OK;
    for (const binder_size_t fromOffset : objects) {
        if (fromOffset + kObjectSize > start + length) break;
        flat_binder_object object = {};
        AIBinder* held = nullptr;
        if (status == STATUS_OK) status = acquireCopy(from, fromOffset, &object, &held);
        // After a failure the remaining objects are blanked: as plain data they would tell
        // addresses.
        if (status != STATUS_OK) object = {};
        const size_t offset = base + (fromOffset - start);
        std::memcpy(mData + offset, &object, kObjectSize);
        if (status == STATUS_OK) listObject(offset, held);
    }
    return status;
}

}  // namespace binder_ndk
