// SPDX-License-Identifier: Apache-2.0
#include "bench/bare_binder.h"

#include <fcntl.h>
#include <sys/ioctl.h>
#include <sys/mman.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstddef>
#include <cstring>
#include <utility>

namespace bench {
namespace {

constexpr size_t kMapSize = size_t{1} << 20;

// Writes `size` bytes and calls `take` with each command read and its payload until it says that it
// has what it wants. False when the driver fails.
template <typename Take>
bool exchange(int fd, void* bytes, size_t size, const Take& take) {
    binder_write_read exchanged{};
    exchanged.write_size = size;
    exchanged.write_buffer = reinterpret_cast<binder_uintptr_t>(bytes);
    for (bool done = false; !done;) {
        std::array<uint8_t, 256> in;
        exchanged.read_size = in.size();
        exchanged.read_buffer = reinterpret_cast<binder_uintptr_t>(in.data());
        exchanged.read_consumed = 0;
        if (ioctl(fd, BINDER_WRITE_READ, &exchanged) < 0) return false;
        exchanged.write_size = exchanged.write_consumed = 0;
        for (size_t at = 0; at + 4 <= exchanged.read_consumed;) {
            uint32_t command = 0;
            memcpy(&command, in.data() + at, sizeof(command));
            done = take(command, in.data() + at + sizeof(command));
            at += sizeof(command) + _IOC_SIZE(command);
        }
    }
    return true;
}

}  // namespace

BareClient::BareClient(int fd, uint32_t handle, uint32_t code, std::vector<uint8_t> data,
                       std::vector<binder_size_t> offsets)
    : mFd(fd), mData(std::move(data)), mOffsets(std::move(offsets)) {
    mOut.transaction.target.handle = handle;
    mOut.transaction.code = code;
    mOut.transaction.data_size = mData.size();
    mOut.transaction.data.ptr.buffer = reinterpret_cast<binder_uintptr_t>(mData.data());
    mOut.transaction.offsets_size = mOffsets.size() * sizeof(binder_size_t);
    mOut.transaction.data.ptr.offsets = reinterpret_cast<binder_uintptr_t>(mOffsets.data());
}

bool BareClient::call() {
    // The first call has nothing to free.
    const size_t skipped = mOut.buffer == 0 ? offsetof(Out, transactionCommand) : 0;
    bool isAnswered = false;
    const bool isDone =
            exchange(mFd, reinterpret_cast<uint8_t*>(&mOut) + skipped, sizeof(mOut) - skipped,
                     [&](uint32_t command, const uint8_t* payload) {
                         if (command == BR_DEAD_REPLY || command == BR_FAILED_REPLY) return true;
                         if (command != BR_REPLY) return false;
                         binder_transaction_data reply;
                         memcpy(&reply, payload, sizeof(reply));
                         mOut.buffer = reply.data.ptr.buffer;
                         return isAnswered = true;
                     });
    return isDone && isAnswered;
}

int openBareBinder(const char* device) {
    const int fd = open(device, O_RDWR | O_CLOEXEC);
    if (fd < 0) return -1;
    void* const map = mmap(nullptr, kMapSize, PROT_READ, MAP_PRIVATE | MAP_NORESERVE, fd, 0);
    return map == MAP_FAILED ? -1 : fd;
}

void serveBare(int fd, const std::function<size_t(uint32_t code)>& work) {
    struct __attribute__((packed)) {
        uint32_t freeCommand = BC_FREE_BUFFER;
        binder_uintptr_t buffer = 0;
        uint32_t replyCommand = BC_REPLY;
        binder_transaction_data reply{};
    } out;
    static uint8_t zeros[4096];
    out.reply.data.ptr.buffer = reinterpret_cast<binder_uintptr_t>(zeros);
    int32_t unused = 0;
    // The last one may not be forgotten yet.
    while (ioctl(fd, BINDER_SET_CONTEXT_MGR, &unused) != 0) {
        if (errno != EBUSY) return;
        usleep(1000);
    }
    const auto take = [&](uint32_t command, const uint8_t* payload) {
        if (command != BR_TRANSACTION) return false;
        binder_transaction_data request;
        memcpy(&request, payload, sizeof(request));
        out.buffer = request.data.ptr.buffer;
        out.reply.data_size = work(request.code);
        return true;
    };
    uint32_t enter = BC_ENTER_LOOPER;
    bool isDriverThere = exchange(fd, &enter, sizeof(enter), take);
    while (isDriverThere) isDriverThere = exchange(fd, &out, sizeof(out), take);
}

}  // namespace bench
