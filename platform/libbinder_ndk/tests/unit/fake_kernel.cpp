// SPDX-License-Identifier: Apache-2.0
//
// The driver of the unit tests.
#include "platform/libbinder_ndk/tests/unit/fake_kernel.h"

#include <cstring>

#include <gtest/gtest.h>

#include "platform/libbinder_ndk/src/kernel.h"

namespace binder_test {

using binder_ndk::Parcel;

FakeKernel* FakeKernel::current = nullptr;

FakeKernel::FakeKernel() {
    current = this;
}

FakeKernel::~FakeKernel() {
    EXPECT_EQ(0, buffersHeld) << "every received buffer is given back exactly once";
    current = nullptr;
}

Buffer::Buffer(const std::vector<uint32_t>& dataWords, std::vector<binder_size_t> list)
    : data(dataWords.size() * 4), offsets(std::move(list)) {
    if (!data.empty()) std::memcpy(data.data(), dataWords.data(), data.size());
}

std::vector<uint32_t> words(const Parcel& parcel) {
    EXPECT_EQ(0U, parcel.size() % 4);
    std::vector<uint32_t> result(parcel.size() / 4);
    if (!result.empty()) std::memcpy(result.data(), parcel.data(), parcel.size());
    return result;
}

std::vector<uint32_t> words(const AParcel* parcel) {
    return words(**parcel);
}

void FakeKernel::deliver(Buffer buffer, Parcel* parcel) {
    buffers.push_back(std::make_unique<Buffer>(std::move(buffer)));
    ++buffersHeld;
    const Buffer& kept = *buffers.back();
    parcel->adopt(kept.data.data(), kept.data.size(), kept.offsets.data(), kept.offsets.size(),
                  binder_ndk::kernel::freeBuffer);
}

}  // namespace binder_test

namespace binder_ndk::kernel {

using binder_test::Buffer;
using binder_test::FakeKernel;
using binder_test::SentTransaction;

binder_status_t transact(uint32_t handle, uint32_t code, const Parcel& request, Parcel* reply,
                         uint32_t flags) {
    FakeKernel& kernel = *FakeKernel::current;
    kernel.sent.push_back({handle,
                           code,
                           flags,
                           binder_test::words(request),
                           {request.offsets(), request.offsets() + request.offsetCount()}});
    if (kernel.answer == nullptr) return STATUS_OK;
    Buffer buffer;
    const binder_status_t status = kernel.answer(kernel.sent.back(), &buffer);
    if (status == STATUS_OK) kernel.deliver(std::move(buffer), reply);
    return status;
}

void acquire(uint32_t handle) {
    FakeKernel::current->commands.push_back("acquire " + std::to_string(handle));
}

void release(uint32_t handle) {
    FakeKernel::current->commands.push_back("release " + std::to_string(handle));
}

void requestDeathNotification(uint32_t handle, uint64_t cookie) {
    FakeKernel::current->commands.push_back("request " + std::to_string(handle));
    FakeKernel::current->deathCookie = cookie;
}

void clearDeathNotification(uint32_t handle, uint64_t /*cookie*/) {
    FakeKernel::current->commands.push_back("clear " + std::to_string(handle));
}

void freeBuffer(const uint8_t* /*buffer*/) {
    --FakeKernel::current->buffersHeld;
}

}  // namespace binder_ndk::kernel
