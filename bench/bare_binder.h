// SPDX-License-Identifier: Apache-2.0
//
// The least that a client and a service can be: straight to the kernel's binder driver, with nothing
// in between.
#pragma once

#include <linux/android/binder.h>

#include <cstdint>
#include <functional>
#include <vector>

namespace bench {

// A client's calls: one ioctl each, the last reply's buffer freed with the next request.
class BareClient {
  public:
    // Takes the open driver `fd`, which stays the caller's, a handle known there, and a request: its
    // bytes and where in them objects stand.
    BareClient(int fd, uint32_t handle, uint32_t code, std::vector<uint8_t> data,
               std::vector<binder_size_t> offsets = {});

    // False when the call failed.
    bool call();

  private:
    struct __attribute__((packed)) Out {
        uint32_t freeCommand = BC_FREE_BUFFER;
        binder_uintptr_t buffer = 0;
        uint32_t transactionCommand = BC_TRANSACTION;
        binder_transaction_data transaction{};
    };

    int mFd;
    std::vector<uint8_t> mData;
    std::vector<binder_size_t> mOffsets;
    Out mOut;
};

// The open driver of a device, mapped; -1 when there is none.
int openBareBinder(const char* device);

// Serves as the context manager of `fd`: `work` is called with a request's code and returns the size
// of the reply, which is zeros, 4096 bytes at most. The request's buffer is freed with the reply. Returns
// when the driver fails.
void serveBare(int fd, const std::function<size_t(uint32_t code)>& work);

}  // namespace bench
