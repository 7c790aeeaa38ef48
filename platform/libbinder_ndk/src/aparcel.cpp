// SPDX-License-Identifier: Apache-2.0
//
// The AParcel functions for the parcel itself, scalars, objects and the status header.
#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <utility>

#include <android/binder_parcel.h>
#include <android/binder_parcel_platform.h>

#include "platform/libbinder_ndk/src/parcel.h"
#include "platform/libbinder_ndk/src/status.h"

using namespace binder_ndk;

AParcel* AParcel_create() {
    return new AParcel(nullptr);
}

void AParcel_delete(AParcel* parcel) {
    delete parcel;
}

binder_status_t AParcel_reset(AParcel* parcel) {
    (*parcel)->reset();
    return STATUS_OK;
}

int32_t AParcel_getDataSize(const AParcel* parcel) {
    return static_cast<int32_t>(std::max((*parcel)->size(), (*parcel)->position()));
}

int32_t AParcel_getDataPosition(const AParcel* parcel) {
    return static_cast<int32_t>((*parcel)->position());
}

binder_status_t AParcel_setDataPosition(const AParcel* parcel, int32_t position) {
    if (position < 0) return STATUS_BAD_VALUE;
    (*parcel)->setPosition(static_cast<size_t>(position));
    return STATUS_OK;
}

binder_status_t AParcel_appendFrom(const AParcel* from, AParcel* to, int32_t start, int32_t size) {
    if (start < 0 || size < 0) return STATUS_BAD_VALUE;
    return knownStatus(
            (*to)->append(**from, static_cast<size_t>(start), static_cast<size_t>(size)));
}

bool AParcel_getAllowFds(const AParcel* /*parcel*/) {
    return true;
}

void AParcel_markSensitive(const AParcel* parcel) {
    (*parcel)->markSensitive();
}

// ---- Scalars. What is narrower than a word travels as one. ----

binder_status_t AParcel_writeInt32(AParcel* parcel, int32_t value) {
    return knownStatus((*parcel)->write(value));
}

binder_status_t AParcel_writeUint32(AParcel* parcel, uint32_t value) {
    return knownStatus((*parcel)->write(value));
}

binder_status_t AParcel_writeInt64(AParcel* parcel, int64_t value) {
    return knownStatus((*parcel)->write(value));
}

binder_status_t AParcel_writeUint64(AParcel* parcel, uint64_t value) {
    return knownStatus((*parcel)->write(value));
}

binder_status_t AParcel_writeFloat(AParcel* parcel, float value) {
    return knownStatus((*parcel)->write(value));
}

binder_status_t AParcel_writeDouble(AParcel* parcel, double value) {
    return knownStatus((*parcel)->write(value));
}

binder_status_t AParcel_writeBool(AParcel* parcel, bool value) {
    return knownStatus((*parcel)->write<int32_t>(value ? 1 : 0));
}

binder_status_t AParcel_writeChar(AParcel* parcel, char16_t value) {
    return knownStatus((*parcel)->write<uint32_t>(value));
}

binder_status_t AParcel_writeByte(AParcel* parcel, int8_t value) {
    return knownStatus((*parcel)->write<int32_t>(value));
}

binder_status_t AParcel_readInt32(const AParcel* parcel, int32_t* value) {
    return knownStatus((*parcel)->read(value));
}

binder_status_t AParcel_readUint32(const AParcel* parcel, uint32_t* value) {
    return knownStatus((*parcel)->read(value));
}

binder_status_t AParcel_readInt64(const AParcel* parcel, int64_t* value) {
    return knownStatus((*parcel)->read(value));
}

binder_status_t AParcel_readUint64(const AParcel* parcel, uint64_t* value) {
    return knownStatus((*parcel)->read(value));
}

binder_status_t AParcel_readFloat(const AParcel* parcel, float* value) {
    return knownStatus((*parcel)->read(value));
}

binder_status_t AParcel_readDouble(const AParcel* parcel, double* value) {
    return knownStatus((*parcel)->read(value));
}

binder_status_t AParcel_readBool(const AParcel* parcel, bool* value) {
    uint32_t word = 0;
    const binder_status_t status = (*parcel)->read(&word);
    *value = word != 0;
    return knownStatus(status);
}

binder_status_t AParcel_readChar(const AParcel* parcel, char16_t* value) {
    uint32_t word = 0;
    const binder_status_t status = (*parcel)->read(&word);
    *value = static_cast<char16_t>(word & 0xffff);
    return knownStatus(status);
}

binder_status_t AParcel_readByte(const AParcel* parcel, int8_t* value) {
    uint32_t word = 0;
    const binder_status_t status = (*parcel)->read(&word);
    *value = static_cast<int8_t>(word & 0xff);
    return knownStatus(status);
}

// ---- Objects ----

binder_status_t AParcel_writeStrongBinder(AParcel* parcel, AIBinder* binder) {
    return (*parcel)->writeStrongBinder(binder);
}

binder_status_t AParcel_readStrongBinder(const AParcel* parcel, AIBinder** binder) {
    return knownStatus((*parcel)->readStrongBinder(binder));
}

// A descriptor in a parcelable's clothes: present, no second descriptor to talk back over, the
// descriptor. Null is a single zero.
binder_status_t AParcel_writeParcelFileDescriptor(AParcel* parcel, int fd) {
    if (fd == -1) return knownStatus((*parcel)->write<int32_t>(0));
    if (fd < 0) return STATUS_UNKNOWN_ERROR;

    const int copy = fcntl(fd, F_DUPFD_CLOEXEC, 0);
    if (copy < 0) return knownStatus(-errno);
    binder_status_t status = (*parcel)->write<int32_t>(1);
    if (status == STATUS_OK) status = (*parcel)->write<int32_t>(0);
    if (status == STATUS_OK) status = (*parcel)->writeFileDescriptor(copy, true);
    if (status != STATUS_OK) close(copy);
    return knownStatus(status);
}

binder_status_t AParcel_readParcelFileDescriptor(const AParcel* parcel, int* fd) {
    int32_t present = 0;
    if (const auto status = (*parcel)->read(&present); status != STATUS_OK)
        return knownStatus(status);
    if (present == 0) {
        *fd = -1;
        return STATUS_OK;
    }
    int32_t hasCommunicationChannel = 0;
    if (const auto status = (*parcel)->read(&hasCommunicationChannel); status != STATUS_OK)
        return knownStatus(status);
    int sent = -1;
    if (const auto status = (*parcel)->readFileDescriptor(&sent); status != STATUS_OK)
        return knownStatus(status);
    if (hasCommunicationChannel != 0) {
        int unused = -1;
        if (const auto status = (*parcel)->readFileDescriptor(&unused); status != STATUS_OK)
            return knownStatus(status);
    }
    const int copy = fcntl(sent, F_DUPFD_CLOEXEC, 0);
    if (copy < 0) return STATUS_BAD_VALUE;
    *fd = copy;
    return STATUS_OK;
}

// ---- The outcome that opens a reply ----

binder_status_t AParcel_writeStatusHeader(AParcel* parcel, const AStatus* status) {
    return knownStatus(writeStatusHeader(**parcel, *status));
}

binder_status_t AParcel_readStatusHeader(const AParcel* parcel, AStatus** status) {
    AStatus read;
    const binder_status_t result = knownStatus(readStatusHeader(**parcel, &read));
    if (result != STATUS_OK) return result;
    *status = read.exception == EX_NONE ? AStatus_newOk() : new AStatus(std::move(read));
    return STATUS_OK;
}
