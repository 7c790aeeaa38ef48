// SPDX-License-Identifier: Apache-2.0
#include "handset/common/raw_binder.h"

#include <fcntl.h>
#include <linux/android/binder.h>
#include <sys/ioctl.h>
#include <sys/mman.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstring>

namespace handset {
namespace {

constexpr size_t kMapSize = size_t{256} * 1024;
constexpr uint32_t kCheckService = 2;  // android.os.IServiceManager
constexpr uint32_t kPing = 0x5f504e47;

template <typename T>
void append(std::vector<uint8_t>* bytes, const T& value) {
    const auto* first = reinterpret_cast<const uint8_t*>(&value);
    bytes->insert(bytes->end(), first, first + sizeof(value));
}

template <typename T>
T load(const uint8_t* from) {
    T value;
    memcpy(&value, from, sizeof(value));
    return value;
}

}  // namespace

RequestBytes& RequestBytes::int32(int32_t value) {
    append(&mData, value);
    return *this;
}

RequestBytes& RequestBytes::word(uint32_t value) {
    append(&mData, value);
    return *this;
}

RequestBytes& RequestBytes::string16(std::string_view ascii) {
    int32(static_cast<int32_t>(ascii.size()));
    for (const char unit : ascii) append(&mData, static_cast<uint16_t>(unit));
    append(&mData, uint16_t{0});
    while (mData.size() % 4 != 0) mData.push_back(0);
    return *this;
}

RequestBytes& RequestBytes::nullString16() {
    return int32(-1);
}

RequestBytes& RequestBytes::token(std::string_view descriptor) {
    append(&mData, uint32_t{0x80000000});
    append(&mData, uint32_t{0xffffffff});
    append(&mData, uint32_t{0x53595354});
    return string16(descriptor);
}

RequestBytes& RequestBytes::nullBinder() {
    append(&mData, uint32_t{0x73622a85});
    append(&mData, uint32_t{0x113});
    append(&mData, uint64_t{0});
    append(&mData, uint64_t{0});
    append(&mData, uint32_t{1});
    return *this;
}

RequestBytes& RequestBytes::binder(uint64_t key, uint32_t stability) {
    mOffsets.push_back(mData.size());
    flat_binder_object object{};
    object.hdr.type = BINDER_TYPE_BINDER;
    object.flags = 0x113;
    object.binder = key;
    object.cookie = key;
    append(&mData, object);
    return word(stability);
}

RequestBytes& RequestBytes::bytes(size_t count, uint8_t value) {
    mData.insert(mData.end(), count, value);
    return *this;
}

int32_t RawReply::word(size_t offset) const {
    return offset + 4 <= data.size() ? load<int32_t>(data.data() + offset) : 0;
}

std::vector<uint32_t> RawReply::words() const {
    std::vector<uint32_t> words(data.size() / sizeof(uint32_t));
    memcpy(words.data(), data.data(), words.size() * sizeof(uint32_t));
    return words;
}

RawBinder::RawBinder() : mFd(open("/dev/binder", O_RDWR | O_CLOEXEC)) {
    if (!mFd.ok()) return;
    mMap = mmap(nullptr, kMapSize, PROT_READ, MAP_PRIVATE | MAP_NORESERVE, mFd.get(), 0);
    if (mMap == MAP_FAILED) mFd.reset();
}

RawBinder::~RawBinder() {
    if (mFd.ok()) munmap(mMap, kMapSize);
}

RawReply RawBinder::transact(uint32_t handle, uint32_t code, const std::vector<uint8_t>& data,
                             const std::vector<uint64_t>& offsets) {
    binder_transaction_data request{};
    request.target.handle = handle;
    request.code = code;
    request.flags = TF_ACCEPT_FDS;
    request.data_size = data.size();
    request.offsets_size = offsets.size() * sizeof(uint64_t);
    request.data.ptr.buffer = reinterpret_cast<binder_uintptr_t>(data.data());
    request.data.ptr.offsets = reinterpret_cast<binder_uintptr_t>(offsets.data());

    std::vector<uint8_t> out = std::move(mPending);
    mPending.clear();
    append(&out, uint32_t{BC_TRANSACTION});
    append(&out, request);

    size_t sent = 0;
    for (;;) {
        std::array<uint8_t, 256> in;
        binder_write_read exchange{};
        exchange.write_size = out.size() - sent;
        exchange.write_buffer = reinterpret_cast<binder_uintptr_t>(out.data() + sent);
        exchange.read_size = in.size();
        exchange.read_buffer = reinterpret_cast<binder_uintptr_t>(in.data());
        if (ioctl(mFd.get(), BINDER_WRITE_READ, &exchange) < 0) {
            if (errno == EINTR) continue;
            return {};
        }
        sent += exchange.write_consumed;

        for (size_t at = 0; at + 4 <= exchange.read_consumed;) {
            const auto command = load<uint32_t>(in.data() + at);
            const uint8_t* payload = in.data() + at + 4;
            at += 4 + _IOC_SIZE(command);
            if (std::optional<RawReply> reply = answered(command, payload)) return *reply;
        }
        if (sent == out.size() && !mPending.empty()) {
            out = std::move(mPending);
            mPending.clear();
            sent = 0;
        }
    }
}

RawReply RawBinder::transact(uint32_t handle, uint32_t code, const RequestBytes& request) {
    return transact(handle, code, request.data(), request.offsets());
}

// The reply, when the command is one; what the driver wants to hear back is left pending.
std::optional<RawReply> RawBinder::answered(uint32_t command, const uint8_t* payload) {
    switch (command) {
        case BR_DEAD_REPLY:
            return RawReply{RawReply::Kind::kDead, 0, {}, {}};
        case BR_FAILED_REPLY:
            return RawReply{RawReply::Kind::kFailed, 0, {}, {}};
        case BR_INCREFS:
        case BR_ACQUIRE:
            append(&mPending, uint32_t{command == BR_INCREFS ? BC_INCREFS_DONE : BC_ACQUIRE_DONE});
            append(&mPending, load<binder_ptr_cookie>(payload));
            return std::nullopt;
        case BR_REPLY:
            break;
        default:
            return std::nullopt;
    }

    // The driver gives addresses as numbers.
    // NOLINTBEGIN(performance-no-int-to-ptr)
    const auto answer = load<binder_transaction_data>(payload);
    const auto* bytes = reinterpret_cast<const uint8_t*>(answer.data.ptr.buffer);
    RawReply reply;
    reply.kind =
            (answer.flags & TF_STATUS_CODE) != 0 ? RawReply::Kind::kStatus : RawReply::Kind::kData;
    reply.data.assign(bytes, bytes + answer.data_size);
    if (reply.kind == RawReply::Kind::kStatus) reply.status = reply.word(0);
    const auto* listed = reinterpret_cast<const binder_size_t*>(answer.data.ptr.offsets);
    // NOLINTEND(performance-no-int-to-ptr)
    for (size_t i = 0; i < answer.offsets_size / sizeof(binder_size_t); ++i) {
        const auto object = load<flat_binder_object>(bytes + listed[i]);
        if (object.hdr.type != BINDER_TYPE_HANDLE) continue;
        // Acquired before the buffer is freed: the buffer's own reference goes with it.
        append(&mPending, uint32_t{BC_ACQUIRE});
        append(&mPending, object.handle);
        reply.handles.push_back(object.handle);
    }
    append(&mPending, uint32_t{BC_FREE_BUFFER});
    append(&mPending, answer.data.ptr.buffer);
    return reply;
}

bool RawBinder::pingServiceManager() {
    return transact(0, kPing, RequestBytes()).kind == RawReply::Kind::kData;
}

std::optional<uint32_t> RawBinder::checkService(std::string_view name) {
    const RawReply reply =
            transact(0, kCheckService,
                     RequestBytes().token("android.os.IServiceManager").string16(name).data());
    if (reply.handles.empty()) return std::nullopt;
    return reply.handles.front();
}

}  // namespace handset
