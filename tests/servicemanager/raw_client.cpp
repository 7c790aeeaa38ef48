// SPDX-License-Identifier: Apache-2.0
//
// A client that talks to the binder driver itself: see raw_client.h.
#include "raw_client.h"

#include <linux/android/binder.h>
#include <sys/ioctl.h>
#include <sys/mman.h>

#include <cerrno>
#include <cstring>

#include <fcntl.h>
#include <unistd.h>

namespace raw {

namespace {

constexpr size_t kMappingSize = size_t{128} * 1024;
constexpr uint32_t kPing = 0x5f504e47;

template <typename T>
void append(std::vector<uint8_t>& bytes, const T& value) {
    const auto* first = reinterpret_cast<const uint8_t*>(&value);
    bytes.insert(bytes.end(), first, first + sizeof(value));
}

template <typename T>
T take(const uint8_t*& position) {
    T value;
    std::memcpy(&value, position, sizeof(value));
    position += sizeof(value);
    return value;
}

}  // namespace

Body Body::withToken(std::string_view interface) {
    Body body;
    body.word(0x80000000).word(0xffffffff).word(0x53595354).text(interface);
    return body;
}

Body& Body::word(uint32_t value) {
    append(bytes, value);
    return *this;
}

Body& Body::text(std::string_view ascii) {
    word(static_cast<uint32_t>(ascii.size()));
    for (const char c : ascii) append(bytes, static_cast<uint16_t>(c));
    append(bytes, uint16_t{0});
    if (bytes.size() % 4 != 0) append(bytes, uint16_t{0});
    return *this;
}

Body& Body::nullText() {
    return word(0xffffffff);
}

Body& Body::nullBinder() {
    flat_binder_object object{};
    object.hdr.type = BINDER_TYPE_BINDER;
    object.flags = 0x113;
    append(bytes, object);
    return word(1);
}

Body& Body::binder(uint64_t key, uint32_t stability) {
    offsets.push_back(bytes.size());
    flat_binder_object object{};
    object.hdr.type = BINDER_TYPE_BINDER;
    object.flags = 0x113;
    object.binder = key;
    object.cookie = key;
    append(bytes, object);
    return word(stability);
}

Binder::Binder() : mDescriptor(open("/dev/binder", O_RDWR | O_CLOEXEC)) {
    if (mDescriptor < 0) return;
    void* mapping = mmap(nullptr, kMappingSize, PROT_READ, MAP_PRIVATE, mDescriptor, 0);
    if (mapping != MAP_FAILED) mMapping = mapping;
}

Binder::~Binder() {
    if (mMapping != nullptr) munmap(mMapping, kMappingSize);
    if (mDescriptor >= 0) close(mDescriptor);
}

bool Binder::pingManager() {
    return callManager(kPing, {}).kind == Reply::Kind::kData;
}

Reply Binder::callManager(uint32_t code, const Body& body) {
    binder_transaction_data transaction{};
    transaction.target.handle = 0;
    transaction.code = code;
    transaction.flags = TF_ACCEPT_FDS;
    transaction.data_size = body.bytes.size();
    transaction.offsets_size = body.offsets.size() * sizeof(uint64_t);
    transaction.data.ptr.buffer = reinterpret_cast<uintptr_t>(body.bytes.data());
    transaction.data.ptr.offsets = reinterpret_cast<uintptr_t>(body.offsets.data());

    std::vector<uint8_t> commands;
    append(commands, uint32_t{BC_TRANSACTION});
    append(commands, transaction);
    std::vector<uint8_t> answers;
    while (writeRead(commands, answers)) {
        commands.clear();
        if (std::optional<Reply> reply = handle(answers, commands)) {
            // What the answers asked for, the reply's buffer above all, goes out before the next.
            if (!commands.empty()) {
                binder_write_read flush{};
                flush.write_size = commands.size();
                flush.write_buffer = reinterpret_cast<uintptr_t>(commands.data());
                ioctl(mDescriptor, BINDER_WRITE_READ, &flush);
            }
            return *reply;
        }
    }
    return {};
}

bool Binder::writeRead(const std::vector<uint8_t>& commands, std::vector<uint8_t>& answers) {
    answers.resize(256);
    binder_write_read exchange{};
    exchange.write_size = commands.size();
    exchange.write_buffer = reinterpret_cast<uintptr_t>(commands.data());
    exchange.read_size = answers.size();
    exchange.read_buffer = reinterpret_cast<uintptr_t>(answers.data());
    while (ioctl(mDescriptor, BINDER_WRITE_READ, &exchange) != 0) {
        if (errno != EINTR) return false;
    }
    answers.resize(exchange.read_consumed);
    return true;
}

std::optional<Reply> Binder::handle(const std::vector<uint8_t>& answers,
                                    std::vector<uint8_t>& commands) {
    const uint8_t* position = answers.data();
    const uint8_t* const end = position + answers.size();
    std::optional<Reply> reply;
    while (position < end) {
        switch (take<uint32_t>(position)) {
            case BR_NOOP:
            case BR_TRANSACTION_COMPLETE:
                break;
            case BR_INCREFS:
                append(commands, uint32_t{BC_INCREFS_DONE});
                append(commands, take<binder_ptr_cookie>(position));
                break;
            case BR_ACQUIRE:
                append(commands, uint32_t{BC_ACQUIRE_DONE});
                append(commands, take<binder_ptr_cookie>(position));
                break;
            case BR_RELEASE:
            case BR_DECREFS:
                take<binder_ptr_cookie>(position);
                break;
            case BR_DEAD_REPLY:
                return Reply{.kind = Reply::Kind::kDead};
            case BR_FAILED_REPLY:
                return Reply{.kind = Reply::Kind::kFailed};
            case BR_REPLY: {
                const auto data = take<binder_transaction_data>(position);
                const auto* words = reinterpret_cast<const uint32_t*>(  // NOLINT
                        static_cast<uintptr_t>(data.data.ptr.buffer));
                reply.emplace();
                if ((data.flags & TF_STATUS_CODE) != 0) {
                    reply->kind = Reply::Kind::kStatus;
                    reply->status = static_cast<int32_t>(words[0]);
                } else {
                    reply->kind = Reply::Kind::kData;
                    reply->words.assign(words, words + data.data_size / sizeof(uint32_t));
                }
                append(commands, uint32_t{BC_FREE_BUFFER});
                append(commands, data.data.ptr.buffer);
                break;
            }
            default:
                return Reply{};
        }
    }
    return reply;
}

}  // namespace raw
