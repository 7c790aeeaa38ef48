// SPDX-License-Identifier: Apache-2.0
// Asking the service manager, over the binder driver's own protocol (linux/android/binder.h).
#include "phone/binder_probe.h"

#include <fcntl.h>
#include <linux/android/binder.h>
#include <sys/ioctl.h>
#include <sys/mman.h>

#include <array>
#include <cerrno>
#include <cstdint>
#include <cstring>
#include <string>

namespace handset {
namespace {

constexpr const char* kDevice = "/dev/binder";
constexpr size_t kAreaSize = 65536;

// IServiceManager of API 31.
constexpr std::string_view kInterface = "android.os.IServiceManager";
constexpr unsigned kCheckService = 2;

template <typename Value>
void append(std::string& out, const Value& value) {
    out.append(reinterpret_cast<const char*>(&value), sizeof value);
}

/// A String16: the count of code units, the units with a terminating zero, padding to four bytes.
void appendString16(std::string& parcel, std::string_view text) {
    append(parcel, static_cast<int32_t>(text.size()));
    for (const char c : text) append(parcel, static_cast<char16_t>(c));
    append(parcel, char16_t{0});
    while (parcel.size() % 4 != 0) parcel += '\0';
}

std::string checkServiceParcel(std::string_view name) {
    std::string parcel;
    append(parcel, uint32_t{0x80000000});  // strict-mode policy
    append(parcel, int32_t{-1});           // work source: none
    append(parcel, uint32_t{B_PACK_CHARS('S', 'Y', 'S', 'T')});
    appendString16(parcel, kInterface);
    appendString16(parcel, name);
    return parcel;
}

bool isFailure(uint32_t command) {
    return command == BR_DEAD_REPLY || command == BR_FAILED_REPLY || command == BR_ERROR;
}

}  // namespace

BinderProbe::BinderProbe() : device_(open(kDevice, O_RDWR | O_CLOEXEC)) {
    if (!device_) return;
    void* area = mmap(nullptr, kAreaSize, PROT_READ, MAP_PRIVATE | MAP_NORESERVE, device_.get(), 0);
    if (area != MAP_FAILED) area_ = area;
}

BinderProbe::~BinderProbe() {
    if (area_ != nullptr) munmap(area_, kAreaSize);
}

bool BinderProbe::isRegistered(std::string_view name) {
    return ask(kCheckService, checkServiceParcel(name)) == Answer::kWithObject;
}

BinderProbe::Answer BinderProbe::ask(unsigned code, std::string_view parcel) {
    binder_transaction_data transaction{};
    transaction.code = code;
    transaction.data_size = parcel.size();
    transaction.data.ptr.buffer = reinterpret_cast<binder_uintptr_t>(parcel.data());
    std::string commands;
    append(commands, uint32_t{BC_TRANSACTION});
    append(commands, transaction);

    std::array<char, 512> returned;
    binder_write_read exchange{};
    exchange.write_size = commands.size();
    exchange.write_buffer = reinterpret_cast<binder_uintptr_t>(commands.data());
    exchange.read_buffer = reinterpret_cast<binder_uintptr_t>(returned.data());
    while (true) {
        exchange.read_size = returned.size();
        exchange.read_consumed = 0;
        if (ioctl(device_.get(), BINDER_WRITE_READ, &exchange) != 0) {
            if (errno == EINTR) continue;
            return Answer::kNone;
        }
        for (size_t at = 0; at + sizeof(uint32_t) <= exchange.read_consumed;) {
            uint32_t command = 0;
            memcpy(&command, returned.data() + at, sizeof command);
            at += sizeof command;
            if (isFailure(command)) return Answer::kNone;
            if (command == BR_REPLY) {
                memcpy(&transaction, returned.data() + at, sizeof transaction);
                giveBack(transaction.data.ptr.buffer);
                if ((transaction.flags & TF_STATUS_CODE) != 0) return Answer::kNone;
                return transaction.offsets_size > 0 ? Answer::kWithObject : Answer::kPlain;
            }
            at += _IOC_SIZE(command);
        }
    }
}

void BinderProbe::giveBack(unsigned long long buffer) {
    std::string commands;
    append(commands, uint32_t{BC_FREE_BUFFER});
    append(commands, binder_uintptr_t{buffer});
    binder_write_read exchange{};
    exchange.write_size = commands.size();
    exchange.write_buffer = reinterpret_cast<binder_uintptr_t>(commands.data());
    ioctl(device_.get(), BINDER_WRITE_READ, &exchange);
}

}  // namespace handset
