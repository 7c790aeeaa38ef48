// SPDX-License-Identifier: Apache-2.0
//
// A driver for the unit tests: records what the library asks for and answers as it is told.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "platform/libbinder_ndk/src/parcel.h"

namespace binder_test {

// 32-bit words of a parcel, the form wire formats are written down in.
std::vector<uint32_t> words(const binder_ndk::Parcel& parcel);
std::vector<uint32_t> words(const AParcel* parcel);

struct SentTransaction {
    uint32_t handle;
    uint32_t code;
    uint32_t flags;
    std::vector<uint32_t> words;
    std::vector<uint64_t> offsets;
};

// A received buffer with its offset list, as the driver maps it.
struct Buffer {
    std::vector<uint8_t> data;
    std::vector<binder_size_t> offsets;

    Buffer() = default;
    explicit Buffer(const std::vector<uint32_t>& dataWords, std::vector<binder_size_t> list = {});
};

// One at a time; made anew for every test.
class FakeKernel {
  public:
    FakeKernel();
    ~FakeKernel();
    FakeKernel(const FakeKernel&) = delete;
    FakeKernel& operator=(const FakeKernel&) = delete;

    // What the other side answers; default: STATUS_OK and an empty reply.
    std::function<binder_status_t(const SentTransaction&, Buffer* reply)> answer;

    std::vector<SentTransaction> sent;
    // Commands but transactions, as "acquire 5", "release 5", "request 5", "clear 5", in order.
    std::vector<std::string> commands;
    // The cookie of the last death request.
    uint64_t deathCookie = 0;
    // Buffers handed out and not yet given back.
    int buffersHeld = 0;

    // Has `parcel` adopt a buffer that counts as held.
    void deliver(Buffer buffer, binder_ndk::Parcel* parcel);
    // As above into a parcel of the C interface.
    void deliver(Buffer buffer, AParcel* parcel) { deliver(std::move(buffer), &**parcel); }

    static FakeKernel* current;
    std::vector<std::unique_ptr<Buffer>> buffers;
};

}  // namespace binder_test
