// SPDX-License-Identifier: Apache-2.0
//
// The driver's commands as the library reads them, in any order that the driver's rules allow, with
// unknown ones and failures in between; and what the library writes, held against the same rules.
// Every buffer is given back exactly once, no reference is lost, and nothing is touched that has been
// given back.
//
// An input is one choice after another: of what the process does, and of what the driver says next.
#include <linux/android/binder.h>

#include <cerrno>
#include <cstring>
#include <map>
#include <memory>
#include <vector>

#include <android/binder_process.h>
#include <binder_context_manager.h>

#include "fuzz/input.h"
#include "platform/libbinder_ndk/src/binder.h"
#include "platform/libbinder_ndk/src/driver.h"
#include "platform/libbinder_ndk/src/kernel.h"
#include "platform/libbinder_ndk/src/parcel.h"
#include "platform/libbinder_ndk/src/remote_binder.h"

namespace {

using binder_ndk::LocalBinder;
using binder_ndk::Parcel;
using fuzz::Input;
using fuzz::require;

// What the thread waits for, innermost last.
enum class Wait { kSent, kReply };

struct Buffer {
    std::unique_ptr<uint8_t[]> data;
    std::vector<binder_size_t> offsets;
};

Input input;
std::vector<Wait> waits;
std::map<uint64_t, Buffer> buffers;         // given out, by address
std::map<uint32_t, int> references;         // strong ones, by handle
std::map<uint32_t, uint64_t> deathCookies;  // by handle
bool isAcquired = false;                    // the own object, by the driver
int acknowledgements = 0;                   // of that, due

binder_status_t onTransact(AIBinder* binder, transaction_code_t code, const AParcel* in,
                           AParcel* out) {
    switch (code % 4) {
        case 0: {
            AIBinder* read = nullptr;
            const binder_status_t status = AParcel_readStrongBinder(in, &read);
            if (read != nullptr) AIBinder_decStrong(read);
            return status;
        }
        case 1:
            return AParcel_writeStrongBinder(out, binder);
        case 2: {
            const Parcel request;
            Parcel reply;
            return binder_ndk::kernel::transact(3, code, request, &reply, code & TF_ONE_WAY);
        }
        default:
            return STATUS_BAD_VALUE;
    }
}

LocalBinder* ownObject() {
    static const AIBinder_Class* const kClass = AIBinder_Class_define(
            "own", [](void* self) { return self; }, [](void*) {}, onTransact);
    static AIBinder* const kObject = AIBinder_new(kClass, nullptr);
    return kObject->asLocal();
}

// ---- What the library writes ----

template <typename T>
T take(const uint8_t*& at, const uint8_t* end) {
    T value;
    require(static_cast<size_t>(end - at) >= sizeof value);
    std::memcpy(&value, at, sizeof value);
    at += sizeof value;
    return value;
}

// What the driver copies: every byte of it, and the objects where the list says.
void requireReadable(const binder_transaction_data& transaction) {
    const auto* const data =
            reinterpret_cast<const uint8_t*>(transaction.data.ptr.buffer);  // NOLINT
    const auto* const offsets =
            reinterpret_cast<const binder_size_t*>(transaction.data.ptr.offsets);  // NOLINT
    std::vector<uint8_t> copy(data, data + transaction.data_size);
    for (size_t i = 0; i < transaction.offsets_size / sizeof *offsets; ++i) {
        require(offsets[i] + sizeof(flat_binder_object) <= copy.size());
    }
}

void obey(uint32_t command, const uint8_t*& at, const uint8_t* end) {
    switch (command) {
        case BC_TRANSACTION:
        case BC_REPLY: {
            const auto transaction = take<binder_transaction_data>(at, end);
            requireReadable(transaction);
            const bool isAnswered =
                    command == BC_TRANSACTION && (transaction.flags & TF_ONE_WAY) == 0;
            waits.push_back(isAnswered ? Wait::kReply : Wait::kSent);
            break;
        }
        case BC_FREE_BUFFER:
            require(buffers.erase(take<binder_uintptr_t>(at, end)) == 1);
            break;
        case BC_ACQUIRE:
            ++references[take<uint32_t>(at, end)];
            break;
        case BC_RELEASE:
            require(--references[take<uint32_t>(at, end)] >= 0);
            break;
        case BC_INCREFS:
        case BC_DECREFS:
            take<uint32_t>(at, end);
            break;
        case BC_INCREFS_DONE:
        case BC_ACQUIRE_DONE:
            require(take<binder_ptr_cookie>(at, end).cookie == ownObject()->cookie());
            require(--acknowledgements >= 0);
            break;
        case BC_REQUEST_DEATH_NOTIFICATION: {
            const auto asked = take<binder_handle_cookie>(at, end);
            require(deathCookies.emplace(uint32_t{asked.handle}, uint64_t{asked.cookie}).second);
            break;
        }
        case BC_CLEAR_DEATH_NOTIFICATION: {
            const auto asked = take<binder_handle_cookie>(at, end);
            require(deathCookies[uint32_t{asked.handle}] == asked.cookie);
            deathCookies.erase(uint32_t{asked.handle});
            break;
        }
        case BC_DEAD_BINDER_DONE:
            take<binder_uintptr_t>(at, end);
            break;
        default:
            require(command == BC_ENTER_LOOPER);
    }
}

// ---- What the driver says ----

// The buffer that the driver fills; it is large enough for a few small commands and one large one.
class Read {
  public:
    explicit Read(const binder_write_read& exchange)
        : mBegin(reinterpret_cast<uint8_t*>(exchange.read_buffer)), mSize(exchange.read_size) {}

    template <typename... Payload>
    void say(uint32_t command, const Payload&... payload) {
        add(command);
        (add(payload), ...);
    }

    size_t used() const { return mUsed; }
    bool hasRoom() const { return mSize - mUsed >= kLargest; }

  private:
    static constexpr size_t kLargest = 4 + sizeof(binder_transaction_data_secctx);

    template <typename T>
    void add(const T& value) {
        require(mSize - mUsed >= sizeof value);
        std::memcpy(mBegin + mUsed, &value, sizeof value);
        mUsed += sizeof value;
    }

    uint8_t* mBegin;
    size_t mSize;
    size_t mUsed = 0;
};

binder_transaction_data transactionData() {
    const size_t size = input.byte() & ~3U;
    const uint8_t objects = input.byte();
    Buffer buffer{std::make_unique<uint8_t[]>(size + 1), {}};
    const std::string_view bytes = input.bytes(size);
    std::copy(bytes.begin(), bytes.end(), buffer.data.get());
    for (size_t i = 0, at = 0; i < objects % 4U; ++i, at += sizeof(flat_binder_object) + 4) {
        if (at + sizeof(flat_binder_object) > size) break;
        flat_binder_object object = {};
        object.hdr.type = (objects & 8) != 0 ? BINDER_TYPE_FD : BINDER_TYPE_HANDLE;
        object.handle = (objects & 8) != 0 ? 0x7fffff00U : 1U + objects / 64;
        std::memcpy(buffer.data.get() + at, &object, sizeof object);
        buffer.offsets.push_back(at);
    }
    binder_transaction_data transaction = {};
    transaction.flags = objects & (TF_ONE_WAY | TF_CLEAR_BUF);
    if ((objects & 16) == 0) {
        transaction.target.ptr = ownObject()->key();
        transaction.cookie = ownObject()->cookie();
    }
    transaction.code = input.byte();
    transaction.sender_pid = 1;
    transaction.data_size = size;
    transaction.offsets_size = buffer.offsets.size() * sizeof(binder_size_t);
    transaction.data.ptr.buffer = reinterpret_cast<binder_uintptr_t>(buffer.data.get());
    transaction.data.ptr.offsets = reinterpret_cast<binder_uintptr_t>(buffer.offsets.data());
    buffers.emplace(transaction.data.ptr.buffer, std::move(buffer));
    return transaction;
}

void refer(Read& read, bool acquire) {
    if (isAcquired == acquire) return;
    const binder_ptr_cookie object{ownObject()->key(), ownObject()->cookie()};
    read.say(acquire ? BR_INCREFS : BR_RELEASE, object);
    read.say(acquire ? BR_ACQUIRE : BR_DECREFS, object);
    isAcquired = acquire;
    if (acquire) acknowledgements += 2;
}

// Ends the innermost wait.
void end() {
    if (!waits.empty()) waits.pop_back();
}

// The next command; true when it ends a wait or takes the thread elsewhere, and so the reading.
bool sayNext(Read& read) {
    const uint8_t choice = input.byte();
    const bool awaitsReply = !waits.empty() && waits.back() == Wait::kReply;
    switch (choice % 16) {
        case 0:
        case 1:
            read.say(choice / 16 % 2 == 0 ? BR_TRANSACTION_COMPLETE : BR_ONEWAY_SPAM_SUSPECT);
            if (awaitsReply) return false;
            end();
            return true;
        case 2:
        case 3:
            if (!awaitsReply) return false;
            read.say(BR_REPLY, transactionData());
            end();
            return true;
        case 4:
            read.say(choice / 16 % 2 == 0 ? BR_DEAD_REPLY : BR_FAILED_REPLY);
            end();
            return true;
        case 5:
        case 6:
            if (!waits.empty() && !awaitsReply) return false;
            read.say(BR_TRANSACTION, transactionData());
            return true;
        case 7: {
            if (!waits.empty() && !awaitsReply) return false;
            binder_transaction_data_secctx transaction = {};
            transaction.transaction_data = transactionData();
            static constexpr char kContext[] = "u:r:somebody:s0";
            transaction.secctx = reinterpret_cast<binder_uintptr_t>(kContext);
            read.say(BR_TRANSACTION_SEC_CTX, transaction);
            return true;
        }
        case 8:
            refer(read, true);
            return false;
        case 9:
            refer(read, false);
            return false;
        case 10: {
            const auto watched = deathCookies.find(1U + choice / 64);
            read.say(BR_DEAD_BINDER,
                     binder_uintptr_t{watched != deathCookies.end() ? watched->second : choice});
            return false;
        }
        case 11:
            read.say(BR_CLEAR_DEATH_NOTIFICATION_DONE, binder_uintptr_t{choice});
            return false;
        case 12:
            read.say(choice / 16 % 2 == 0 ? BR_SPAWN_LOOPER : BR_NOOP);
            return false;
        case 13:
            read.say(BR_ERROR, static_cast<int32_t>(input.word() | 1));
            end();
            return true;
        case 14:  // one that there is not, with a payload of four bytes
            read.say(_IOR('r', 100, uint32_t), input.word());
            end();
            return true;
        default:
            read.say(BR_FINISHED);
            end();
            return true;
    }
}

void actNext() {
    const uint8_t choice = input.byte();
    const uint32_t handle = 1U + choice / 64;
    Parcel request;
    Parcel reply;
    switch (choice % 4) {
        case 0:
            ABinderProcess_handlePolledCommands();
            break;
        case 1:
            request.writeStrongBinder(ownObject());
            [[fallthrough]];
        case 2:
            binder_ndk::kernel::transact(handle, choice, request, &reply,
                                         choice & uint32_t{TF_ONE_WAY});
            break;
        default: {
            static AIBinder_DeathRecipient* const kRecipient =
                    AIBinder_DeathRecipient_new([](void*) {});
            AIBinder* const proxy = binder_ndk::strongProxy(handle);
            AIBinder_linkToDeath(proxy, kRecipient, nullptr);
            AIBinder_ping(proxy);
            AIBinder_decStrong(proxy);
        }
    }
}

}  // namespace

namespace binder_ndk {

Driver::Driver() = default;

Driver& Driver::instance() {
    static auto* const kDriver = new Driver;
    return *kDriver;
}

bool Driver::isForkedCopy() {
    return false;
}

int Driver::writeRead(binder_write_read& exchange) const {
    const auto* at = reinterpret_cast<const uint8_t*>(exchange.write_buffer);  // NOLINT
    const uint8_t* const last = at + exchange.write_size;
    while (at < last) {
        const auto command = take<uint32_t>(at, last);
        obey(command, at, last);
    }
    exchange.write_consumed = exchange.write_size;
    if (exchange.read_size == 0) return 0;
    if (input.left == 0 && !waits.empty()) {
        end();
        return -ECONNREFUSED;
    }
    Read read(exchange);
    while (input.left > 0 && read.hasRoom() && !sayNext(read)) {
    }
    exchange.read_consumed = read.used();
    return 0;
}

bool Driver::setMaxThreads(uint32_t /*count*/) const {
    return true;
}
int Driver::becomeContextManager() const {
    return 0;
}
int Driver::countStrongReferences(uint32_t /*handle*/, uint32_t* /*count*/) const {
    return -EINVAL;
}
void Driver::exitThread() const {}

}  // namespace binder_ndk

extern "C" int LLVMFuzzerInitialize(int* /*argc*/, char*** /*argv*/) {
    require(ABinderProcess_becomeContextManager(ownObject()) == STATUS_OK);
    int descriptor = -1;
    require(ABinderProcess_setupPolling(&descriptor) == STATUS_OK);
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    input = {data, size};
    while (input.left > 0) actNext();
    // The driver lets go of what it holds; whatever is still queued reaches it.
    const uint8_t letGo[] = {9};
    input = {letGo, sizeof letGo};
    ABinderProcess_handlePolledCommands();
    require(waits.empty());
    require(buffers.empty());
    require(acknowledgements == 0);
    require(ownObject()->strongCount() == 2);  // the harness's and the service manager's
    for (const auto& [handle, count] : references) require(count == 0);
    return 0;
}
