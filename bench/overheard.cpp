// SPDX-License-Identifier: Apache-2.0
#include "bench/overheard.h"

#include <sys/ioctl.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cstdarg>
#include <cstring>

namespace bench {
namespace {

Overheard* listener = nullptr;

template <typename Handle>
void forEachCommand(binder_uintptr_t begin, binder_size_t size, const Handle& handle) {
    const auto* bytes = reinterpret_cast<const uint8_t*>(begin);  // NOLINT
    for (size_t at = 0; at + 4 <= size;) {
        uint32_t command = 0;
        memcpy(&command, bytes + at, sizeof(command));
        binder_transaction_data data{};
        if (_IOC_SIZE(command) == sizeof(data)) memcpy(&data, bytes + at + 4, sizeof(data));
        handle(command, data);
        at += sizeof(command) + _IOC_SIZE(command);
    }
}

template <typename Value>
std::vector<Value> copied(binder_uintptr_t begin, binder_size_t bytes) {
    const auto* values = reinterpret_cast<const Value*>(begin);  // NOLINT
    return {values, values + bytes / sizeof(Value)};
}

int exchangeAloud(int fd, binder_write_read* exchange) {
    forEachCommand(exchange->write_buffer, exchange->write_size,
                   [](uint32_t command, const binder_transaction_data& data) {
                       if (command != BC_TRANSACTION) return;
                       listener->request = copied<uint8_t>(data.data.ptr.buffer, data.data_size);
                       listener->offsets =
                               copied<binder_size_t>(data.data.ptr.offsets, data.offsets_size);
                   });
    const auto status = static_cast<int>(syscall(SYS_ioctl, fd, BINDER_WRITE_READ, exchange));
    forEachCommand(exchange->read_buffer, exchange->read_consumed,
                   [](uint32_t command, const binder_transaction_data& data) {
                       if (command == BR_REPLY) listener->replySize = data.data_size;
                   });
    return status;
}

}  // namespace

Overheard overhear(const std::function<void()>& call) {
    Overheard overheard;
    listener = &overheard;
    call();
    listener = nullptr;
    return overheard;
}

}  // namespace bench

extern "C" int ioctl(int fd, unsigned long request, ...) noexcept {
    va_list arguments;
    va_start(arguments, request);
    void* const argument = va_arg(arguments, void*);
    va_end(arguments);
    if (bench::listener == nullptr || request != BINDER_WRITE_READ)
        return static_cast<int>(syscall(SYS_ioctl, fd, request, argument));
    return bench::exchangeAloud(fd, static_cast<binder_write_read*>(argument));
}
